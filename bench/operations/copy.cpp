#include "operations.h"

#include <cstring>

namespace quillon::bench {
namespace {

// Within one surface of 32 bits.
void addScroll(Plan &plan, const char *name, uint32_t fromY, uint32_t toX, uint32_t toY) {
    const Area &area = plan.area;
    if (area.width <= toX || area.height <= fromY + toY)
        return;
    const uint32_t width = area.width - toX, height = area.height - fromY - toY;
    const auto scroll = [=](const Buffer &dst) {
        Raster_RectCopy(dst.data, dst.stride, dst.data, dst.stride, 4, 0, fromY, toX, toY, width,
                        height);
    };
    const auto moveRows = [=](const Buffer &dst) {
        for (uint32_t i = 0; i < height; ++i) {
            const uint32_t y = fromY < toY ? height - 1 - i : i;
            std::memmove(dst.row(toY + y) + size_t{4} * toX, dst.row(fromY + y), size_t{4} * width);
        }
    };
    plan.add(text("scroll ", name), "scroll", Traffic::None, {{32, noise}}, scroll)
        .contenders.push_back({"memmove", prepare(moveRows)});
}

} // namespace

void addCopies(Plan &plan) {
    for (const uint32_t bits : {8U, 16U, 24U, 32U})
        plan.add(text("copy ", bits), "copy", Traffic::Write, {{bits, noise}, {bits, noise}},
                 [bytes = static_cast<int32_t>(bits / 8)](const Buffer &dst, const Buffer &src) {
                     Raster_RectCopy(dst.data, dst.stride, src.data, src.stride, bytes, 0, 0, 0, 0,
                                     dst.width, dst.height);
                 });
    addScroll(plan, "up", 8, 0, 0);
    addScroll(plan, "down", 0, 0, 8);
    addScroll(plan, "right", 0, 3, 0);
}

} // namespace quillon::bench
