#include "operations.h"

namespace quillon::bench {

void addBits(Plan &plan) {
    for (const uint32_t bits : {8U, 16U, 24U, 32U}) {
        const auto bytes = static_cast<int32_t>(bits / 8);
        const Plane dst = {bits, noise};
        const auto expand = [=](const Buffer &to, const Buffer &from) {
            Raster_BitsToPixels(from.data, from.stride, to.data, to.stride, bytes, to.w(),
                                to.height, kForeground, kBackground);
        };
        const auto stencil = [=](const Buffer &to, const Buffer &from) {
            Raster_BitsToPixelsStencil(from.data, from.stride, to.data, to.stride, bytes, to.w(),
                                       to.height, kForeground);
        };
        plan.add(text("bits noise to ", bits), "bits", Traffic::Write, {dst, {1, noise}}, expand);
        plan.add(text("stencil noise to ", bits), "stencil", Traffic::Change, {dst, {1, noise}},
                 stencil);
        // Many cache lines of these have no bit that is set and are not touched.
        plan.add(text("stencil text to ", bits), "stencil", Traffic::None, {dst, {1, textBits}},
                 stencil);
        plan.add(text("stencil sparse to ", bits), "stencil", Traffic::None, {dst, {1, sparseBits}},
                 stencil);
    }
}

} // namespace quillon::bench
