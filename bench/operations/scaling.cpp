// Raster_Scale.  The area is that of the destination.
#include "operations.h"

#include "names.h"
#include <quillon/raster.h>

#include <algorithm>
#include <cmath>

namespace quillon::bench {
namespace {

void addScale(Plan &plan, const Area &area, const std::string &filter, double factor) {
    const auto sourceSize = [factor](uint32_t size) {
        return std::max(static_cast<uint32_t>(std::lround(size / factor)), 1U);
    };
    Area srcArea = area;
    srcArea.width = sourceSize(area.width);
    srcArea.height = sourceSize(area.height);
    srcArea.surfaceWidth = area.surfaceWidth == 0 ? 0 : std::max(area.surfaceWidth, srcArea.width);
    const bool even = factor == 2 || factor == 0.5;
    plan.push_back({scaleName(filter, factor),
                    filter == "nearest" && even ? "nearest by 2"
                    : filter == "box" && even   ? "box by 2"
                                                : filter,
                    area,
                    {plane(area, 32, noise), plane(srcArea, 32, noise)},
                    Traffic::None,
                    {{"quillon", Agreement::Exact, [=](const Job &job) -> Work {
                          return [=, dst = job.dst, src = job.src()] {
                              Raster_Scale(dst.data, dst.line(), dst.width, dst.height, 0, 0,
                                           static_cast<int32_t>(dst.width),
                                           static_cast<int32_t>(dst.height), src.data, src.line(),
                                           src.width, src.height, factor, factor,
                                           filter != "nearest");
                          };
                      }}}});
}

} // namespace

void addScaling(Plan &plan, const Area &area) {
    for (const double factor : kNearestFactors)
        addScale(plan, area, "nearest", factor);
    for (const double factor : kLinearFactors)
        addScale(plan, area, "linear", factor);
    for (const double factor : kBoxFactors)
        addScale(plan, area, "box", factor);
}

} // namespace quillon::bench
