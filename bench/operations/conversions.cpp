// Raster_ConvertPixels between all layouts.
#include "operations.h"

#include "names.h"
#include <quillon/raster.h>

namespace quillon::bench {
namespace {

uint32_t bitsOf(int32_t depth) {
    return depth <= 8 ? 8 : depth == 15 ? 16 : static_cast<uint32_t>(depth);
}

std::string familyOf(int32_t srcDepth, int32_t dstDepth) {
    if (srcDepth == kIndex)
        return dstDepth <= 8 ? "index to small" : dstDepth == 24 ? "index to 24" : "index";
    if (dstDepth <= 8)
        return "convert to small";
    const bool within24And32 = srcDepth >= 24 && dstDepth >= 24;
    return within24And32 ? "convert 24 and 32" : "convert";
}

void addConversion(Plan &plan, const Area &area, int32_t srcDepth, int32_t dstDepth) {
    const bool indexed = srcDepth == kIndex;
    plan.push_back({conversionName(srcDepth, dstDepth),
                    familyOf(srcDepth, dstDepth),
                    area,
                    {plane(area, bitsOf(dstDepth), noise), plane(area, bitsOf(srcDepth), noise)},
                    Traffic::Write,
                    {{"quillon", Agreement::Exact, [=](const Job &job) -> Work {
                          return [=, dst = job.dst, src = job.src(), colours = palette().data()] {
                              Raster_ConvertPixels(
                                  dst.data, static_cast<uint32_t>(dst.step), dstDepth, src.data,
                                  static_cast<uint32_t>(src.step), indexed ? 8 : srcDepth, indexed,
                                  colours, 0, 0, 0, 0, dst.width, dst.height);
                          };
                      }}}});
}

} // namespace

void addConversions(Plan &plan, const Area &area) {
    for (const int32_t src : {kIndex, 15, 16, 24, 32}) {
        for (const int32_t dst : {3, 6, 8, 15, 16, 24, 32}) {
            if (src != dst)
                addConversion(plan, area, src, dst);
        }
    }
}

} // namespace quillon::bench
