#include "operations.h"

namespace quillon::bench {
namespace {

uint32_t bitsOf(int32_t depth) {
    return depth <= 8 ? 8 : depth == 15 ? 16 : static_cast<uint32_t>(depth);
}

void addConversion(Plan &plan, int32_t srcDepth, int32_t dstDepth) {
    const bool isIndex = srcDepth == kIndex;
    const std::string family = isIndex ? "index" : "convert";
    plan.add(conversionName(srcDepth, dstDepth), family + (dstDepth <= 8 ? " to small" : ""),
             Traffic::Write, {{bitsOf(dstDepth), noise}, {bitsOf(srcDepth), noise}},
             [=, colors = palette()](const Buffer &dst, const Buffer &src) {
                 Raster_ConvertPixels(dst.data, static_cast<uint32_t>(dst.stride), dstDepth,
                                      src.data, static_cast<uint32_t>(src.stride),
                                      isIndex ? 8 : srcDepth, isIndex, colors, 0, 0, 0, 0,
                                      dst.width, dst.height);
             });
}

} // namespace

void addConversions(Plan &plan) {
    for (const int32_t src : {kIndex, 15, 16, 24, 32})
        for (const int32_t dst : {3, 6, 8, 15, 16, 24, 32})
            if (src != dst)
                addConversion(plan, src, dst);
}

} // namespace quillon::bench
