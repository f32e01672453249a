// The scaler's entries: checks, and the fixed point that the kernels work in.

#include "core/extended.h"
#include "hearth.h"
#include "raster.h"
#include "raster/copyRows.h"
#include "raster/rasterScaleKernels.h"

#include <bit>
#include <cmath>
#include <cstdlib>

namespace quillon {
namespace {

constexpr uint32 kMaxSize = 32767;
constexpr double kMinScale = 1.0 / 32767; // this one is refused, too
constexpr double kMaxScale = 65536;       // with more, a step would be 0

// Not a number fails both comparisons.
bool isValidScale(double scale) {
    return scale > kMinScale && scale <= kMaxScale;
}

// The low 32 bits of 65536 / scale in extended precision.
uint32 stepOf(double scale) {
    // Less than 2^32, a quotient of doubles is off by 2^-22 at most.  That only
    // shows beside whole numbers, and powers of two divide exactly.
    const double quotient = kScaleOne / scale;
    const auto whole = static_cast<uint64_t>(quotient);
    const double fraction = quotient - static_cast<double>(whole);
    const bool isPowerOfTwo = std::bit_cast<uint64_t>(scale) << 12 == 0;
    if (isPowerOfTwo || (fraction > 0x1p-20 && fraction < 1 - 0x1p-20))
        return static_cast<uint32>(whole);
    return (Extended(kScaleOne) / Extended(scale)).truncated();
}

// One axis of the job, for the pixels from first to end.
ScaleAxis makeAxis(double scale, bool isFiltered, int32 first, int32 end, uint32 srcSize) {
    ScaleAxis axis{};
    axis.step = stepOf(scale);
    axis.start = axis.step * static_cast<uint32>(first);
    axis.srcSize = srcSize;
    axis.dstSize = static_cast<uint32>(end) - static_cast<uint32>(first);
    if (!isFiltered || axis.step == kScaleOne) {
        axis.method = ScaleMethod::kNearest;
    } else if (axis.step > kScaleOne) {
        axis.method = ScaleMethod::kBox;
        axis.normaliser = static_cast<uint32>(scale * kScaleOne); // exact but for the truncation
    } else {
        axis.method = ScaleMethod::kLinear;
        axis.start -= kScaleOne / 2;
    }
    return axis;
}

// Whether the pixels are those of the source, one by one.
bool isCopy(const ScaleAxis &axis) {
    return axis.step == kScaleOne && uint64_t{axis.start >> 16} + axis.dstSize <= axis.srcSize;
}

// One axis of Raster_ScaleSrcCoordinates.
void scaleRange(int32 &first, int32 &end, uint32 srcSize, double scale) {
    const Extended factor(scale), margin(std::fmax(1.0, scale));
    const uint32 scaledSize = (Extended(srcSize) * factor).truncated();

    const Extended low = Extended(first) * factor - margin;
    first = low.isNegative() ? 0 : static_cast<int32>(low.truncated());

    const double high = std::ceil((Extended(end) * factor + margin).toDouble());
    end = static_cast<int32>(high > scaledSize ? scaledSize : Extended(high).truncated());
}

} // namespace
} // namespace quillon

using namespace quillon;

uint32 Raster_Scale(uint8 *dstBuffer, int32 dstLineIncrement, uint32 dstWidth, uint32 dstHeight,
                    int32 left, int32 top, int32 right, int32 bottom, const uint8 *srcBuffer,
                    int32 srcLineIncrement, uint32 srcWidth, uint32 srcHeight, double scaleX,
                    double scaleY, uint32 filter) {
    if (srcHeight > kMaxSize || srcWidth > kMaxSize || dstHeight > kMaxSize || dstWidth > kMaxSize)
        return 0;
    if (!isValidScale(scaleX) || !isValidScale(scaleY))
        return 0;
    if (left >= right || top >= bottom)
        return 1;
    if (srcHeight == 0 || srcWidth == 0 || dstHeight == 0 || dstWidth == 0)
        return 1;

    const ptrdiff_t dstOffset = ptrdiff_t{dstLineIncrement} * top + ptrdiff_t{4} * left;
    const ScaleJob job{
        {advance(dstBuffer, static_cast<uint64_t>(dstOffset)), dstLineIncrement},
        {srcBuffer, srcLineIncrement},
        makeAxis(scaleX, filter != 0, left, right, srcWidth),
        makeAxis(scaleY, filter != 0, top, bottom, srcHeight),
    };
    if (isCopy(job.x) && isCopy(job.y)) {
        const uint8 *first =
            pixelAddress(srcBuffer, srcLineIncrement, 4, job.x.start >> 16, job.y.start >> 16);
        copyRows(job.dst, {first, srcLineIncrement}, {size_t{job.x.dstSize} * 4, job.y.dstSize},
                 RowOrder::Downwards);
        return 1;
    }
    const ScaleCacheShape shape(job);
    void *cache = shape.slots == 0 ? nullptr : UtilSafeMalloc0(shape.bytes());
    if (cache == nullptr && shape.slots != 0)
        return 0;
    RasterScaleRect(job, cache);
    std::free(cache);
    return 1;
}

void Raster_ScaleSrcCoordinates(Rect *rect, uint32 srcWidth, uint32 srcHeight, double scaleX,
                                double scaleY) {
    // Infinite coordinates would be no coordinates.
    if (!std::isfinite(scaleX) || !std::isfinite(scaleY))
        return;
    scaleRange(rect->left, rect->right, srcWidth, scaleX);
    scaleRange(rect->top, rect->bottom, srcHeight, scaleY);
}
