// The scaler's entries: checks, and the fixed point that the kernels work in.

#include "core/extended.h"
#include "legacy/copyRows.h"
#include "scale/scaleKernels.h"
#include <hearth/hearth.h>
#include <quillon/raster.h>

#include <bit>
#include <cmath>
#include <cstdlib>

namespace quillon {
namespace {

constexpr uint32_t kMaxSize = 32767;
constexpr double kMinScale = 1.0 / 32767; // this one is refused, too
constexpr double kMaxScale = 65536;       // with more, a step would be 0

// Not a number fails both comparisons.
bool isValidScale(double scale) {
    return scale > kMinScale && scale <= kMaxScale;
}

// The low 32 bits of 65536 / scale in extended precision.
uint32_t stepOf(double scale) {
    // Less than 2^32, a quotient of doubles is off by 2^-22 at most.  That only
    // shows beside whole numbers, and powers of two divide exactly.
    const double quotient = kScaleOne / scale;
    const auto whole = static_cast<uint64_t>(quotient);
    const double fraction = quotient - static_cast<double>(whole);
    const bool isPowerOfTwo = std::bit_cast<uint64_t>(scale) << 12 == 0;
    if (isPowerOfTwo || (fraction > 0x1p-20 && fraction < 1 - 0x1p-20))
        return static_cast<uint32_t>(whole);
    return (Extended(kScaleOne) / Extended(scale)).truncated();
}

// One axis of the job, for the pixels from first to end.
ScaleAxis makeAxis(double scale, bool isFiltered, int32_t first, int32_t end, uint32_t srcSize) {
    ScaleAxis axis{};
    axis.step = stepOf(scale);
    axis.start = axis.step * static_cast<uint32_t>(first);
    axis.srcSize = srcSize;
    axis.dstSize = static_cast<uint32_t>(end) - static_cast<uint32_t>(first);
    if (!isFiltered || axis.step == kScaleOne) {
        axis.method = ScaleMethod::kNearest;
    } else if (axis.step > kScaleOne) {
        axis.method = ScaleMethod::kBox;
        axis.normaliser = static_cast<uint32_t>(scale * kScaleOne); // exact but for the truncation
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
void scaleRange(int32_t &first, int32_t &end, uint32_t srcSize, double scale) {
    const Extended factor(scale), margin(std::fmax(1.0, scale));
    const uint32_t scaledSize = (Extended(srcSize) * factor).truncated();

    const Extended low = Extended(first) * factor - margin;
    first = low.isNegative() ? 0 : static_cast<int32_t>(low.truncated());

    const double high = std::ceil((Extended(end) * factor + margin).toDouble());
    end = static_cast<int32_t>(high > scaledSize ? scaledSize : Extended(high).truncated());
}

} // namespace
} // namespace quillon

using namespace quillon;

uint32_t Raster_Scale(uint8_t *dstBuffer, int32_t dstLineIncrement, uint32_t dstWidth,
                      uint32_t dstHeight, int32_t left, int32_t top, int32_t right, int32_t bottom,
                      const uint8_t *srcBuffer, int32_t srcLineIncrement, uint32_t srcWidth,
                      uint32_t srcHeight, double scaleX, double scaleY, uint32_t filter) {
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
        const uint8_t *first =
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

void Raster_ScaleSrcCoordinates(Rect *rect, uint32_t srcWidth, uint32_t srcHeight, double scaleX,
                                double scaleY) {
    // Infinite coordinates would be no coordinates.
    if (!std::isfinite(scaleX) || !std::isfinite(scaleY))
        return;
    scaleRange(rect->left, rect->right, srcWidth, scaleX);
    scaleRange(rect->top, rect->bottom, srcHeight, scaleY);
}
