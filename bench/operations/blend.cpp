#include "operations.h"

namespace quillon::bench {

void addBlends(Plan &plan) {
    const auto blend = [](const Buffer &dst, const Buffer &src) {
        Raster_AlphaBlendOver(dst.data, 0, 0, dst.stride, src.data, 0, 0, src.stride, dst.width,
                              dst.height);
    };
    plan.add("blend noise", "blend", Traffic::Change, {{32, noise}, {32, noise}}, blend);
    // The destination is not written where transparent, and not read where opaque.
    plan.add("blend interface", "blend", Traffic::None, {{32, noise}, {32, interfacePixels}},
             blend);
}

} // namespace quillon::bench
