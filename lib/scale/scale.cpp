// Resampling of 32-bit images, and the map of source coordinates to those of the
// scaled image.
#include <quillon/raster.h>

#include "copy/copyRows.h"
#include "core/extended.h"
#include "core/surface.h"
#include "scale/scaleAxis.h"
#include "scale/scaleKernels.h"

#include <hearth/hearth.h>

#include <bit>
#include <cmath>
#include <cstdlib>

namespace quillon {
namespace {

constexpr uint32_t kMaxSize = 32767;
constexpr double kMinScale = 1.0 / 32767; // refused itself
constexpr double kMaxScale = 65536;       // with more, the step would be 0

// NaN fails both comparisons.
bool isValidScale(double scale) {
    return scale > kMinScale && scale <= kMaxScale;
}

// Out of line, as it is seldom needed and takes a frame of its own.
[[gnu::noinline]] uint32_t extendedStepOf(double scale) {
    return (Extended(kScaleOne) / Extended(scale)).truncated();
}

// 65536 / scale, rounded to a 64-bit significand and truncated; its low 32 bits.
uint32_t stepOf(double scale) {
    // The quotient of doubles is below 2^32 and off by 2^-22 at most: truncation
    // gives another number than it should only next to whole numbers.  Powers of
    // two divide exactly.
    const double quotient = kScaleOne / scale;
    const auto whole = static_cast<uint64_t>(quotient);
    const double fraction = quotient - static_cast<double>(whole);
    const bool isPowerOfTwo = std::bit_cast<uint64_t>(scale) << 12 == 0;
    if (isPowerOfTwo || (fraction > 0x1p-20 && fraction < 1 - 0x1p-20))
        return static_cast<uint32_t>(whole);
    return extendedStepOf(scale);
}

// The axis of the destination pixels from first to end, of which there is one at
// least.
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
        // A power of two: the product is exact before it is truncated.
        axis.normaliser = static_cast<uint32_t>(scale * kScaleOne);
    } else {
        axis.method = ScaleMethod::kLinear;
        axis.start -= kScaleOne / 2;
    }
    return axis;
}

// False when there is no memory for the row cache; nothing is written then.
bool scaleRect(const ScaleJob &job) {
    const ScaleCacheShape shape(job);
    if (shape.slotCount == 0) {
        scaleRows(job, nullptr);
        return true;
    }
    void *cache = UtilSafeMalloc0(shape.bytes());
    if (cache == nullptr)
        return false;
    scaleRows(job, cache);
    std::free(cache);
    return true;
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
    const ScaleJob job = {
        {advance(dstBuffer, static_cast<uint64_t>(dstOffset)), dstLineIncrement},
        {srcBuffer, srcLineIncrement},
        makeAxis(scaleX, filter != 0, left, right, srcWidth),
        makeAxis(scaleY, filter != 0, top, bottom, srcHeight),
    };
    if (!job.x.isCopy() || !job.y.isCopy())
        return scaleRect(job) ? 1 : 0;

    const SrcRows src = {
        pixelAddress(srcBuffer, srcLineIncrement, 4, job.x.start >> 16, job.y.start >> 16),
        srcLineIncrement};
    copyRows(job.dst, src, job.dstExtent(), RowOrder::kDownward);
    return 1;
}

void Raster_ScaleSrcCoordinates(Rect *rect, uint32_t srcWidth, uint32_t srcHeight, double scaleX,
                                double scaleY) {
    // Extended has no infinity and no NaN.
    if (!std::isfinite(scaleX) || !std::isfinite(scaleY))
        return;
    scaleRange(rect->left, rect->right, srcWidth, scaleX);
    scaleRange(rect->top, rect->bottom, srcHeight, scaleY);
}
