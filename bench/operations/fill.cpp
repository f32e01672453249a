#include "operations.h"

namespace quillon::bench {

void addFills(Plan &plan) {
    for (const uint32_t bits : {8U, 16U, 24U, 32U})
        plan.add(text("fill ", bits), "fill", Traffic::Write, {{bits, noise}},
                 [bytes = static_cast<int32_t>(bits / 8)](const Buffer &dst) {
                     Raster_RectFill(dst.data, dst.stride, bytes, kPixel, 0, 0, dst.width,
                                     dst.height);
                 });
    plan.add("alpha fill", "fill", Traffic::Change, {{32, noise}}, [](const Buffer &dst) {
        Raster_RectFillAlpha(dst.data, dst.stride, 0x80, 0, 0, dst.width, dst.height);
    });
}

} // namespace quillon::bench
