#include "operations.h"

#include <algorithm>
#include <cmath>

namespace quillon::bench {
namespace {

// The area is that of the destination.
void addScale(Plan &plan, const std::string &filter, double factor) {
    const auto unscaled = [=](uint32_t size) {
        return std::max(static_cast<uint32_t>(std::lround(size / factor)), 1U);
    };
    Area srcArea = plan.area;
    srcArea.width = unscaled(srcArea.width);
    srcArea.height = unscaled(srcArea.height);
    if (srcArea.surfaceWidth != 0)
        srcArea.surfaceWidth = std::max(srcArea.surfaceWidth, srcArea.width);
    plan.add(
        text(filter, " by ", factor), filter, Traffic::None, {{32, noise}, {32, noise, srcArea}},
        [=, isSmooth = filter != "nearest"](const Buffer &dst, const Buffer &src) {
            Raster_Scale(dst.data, dst.stride, dst.width, dst.height, 0, 0, dst.w(), dst.h(),
                         src.data, src.stride, src.width, src.height, factor, factor, isSmooth);
        });
}

} // namespace

void addScaling(Plan &plan) {
    for (const double factor : {3.0, 2.0, 1.5, 0.75, 0.5, 0.3, 0.125})
        addScale(plan, "nearest", factor);
    for (const double factor : {3.0, 2.0, 1.5, 1.1})
        addScale(plan, "linear", factor);
    for (const double factor : {0.9, 0.75, 0.5, 0.3, 0.2, 0.125})
        addScale(plan, "box", factor);
}

} // namespace quillon::bench
