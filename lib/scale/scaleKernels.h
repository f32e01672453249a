// What the entry hands to the kernels of the scaler, and the cache of scaled rows.
#pragma once

#include "core/surface.h"
#include "scale/scaleAxis.h"
#include "simd/thresholds.h"

#include <algorithm>
#include <bit>
#include <cstddef>
#include <cstdint>

namespace quillon {

struct ScaleJob {
    DstRows dst; // from the first pixel to write on
    SrcRows src; // from the first pixel of the source on
    ScaleAxis x, y;

    ByteExtent dstExtent() const { return {size_t{4} * x.dstSize, y.dstSize}; }
    ByteExtent srcExtent() const { return {size_t{4} * x.srcSize, y.srcSize}; }
    bool isPrefetched() const { return isPrefetchedScale(srcExtent(), src.stride, dstExtent()); }

    // Whether every pixel is the average of two by two: those are made straight from
    // two source rows.
    bool isQuarter() const { return x.isHalf() && y.isHalf(); }
};

// A source row in the average of a destination row.
struct ScaleTap {
    const uint8_t *pixels; // after the horizontal pass
    uint32_t weights;      // 0 to 255, once for each half
};
inline constexpr size_t kScaleMaxTaps = 32;

// A source row after the horizontal pass.
struct ScaleCacheSlot {
    uint8_t *pixels;
    uint32_t rowIndex;
};
inline constexpr uint32_t kScaleNoRow = 0xFFFFFFFF;

// The row cache has a slot for every source row that one destination row can need,
// so that none is scaled twice.  Row 0 goes to slot 0, any other row r to slot
// 1 + r % (slotCount - 1), the divisor being a power of two: a position that wraps
// comes back to row 0 within a span, and must not take the place of a row
// of that span.
struct ScaleCacheShape {
    static constexpr size_t kAlignment = 64;

    size_t slotCount; // 0 where every row goes straight to the destination
    size_t rowBytes;

    explicit ScaleCacheShape(const ScaleJob &job)
        : slotCount(job.y.method == ScaleMethod::kNearest || job.isQuarter()
                        ? 0
                        : 1 + std::bit_ceil(std::min<size_t>(((job.y.step + 0xFFFF) >> 16) + 1,
                                                             kScaleMaxTaps))),
          rowBytes((size_t{4} * job.x.dstSize + kAlignment - 1) / kAlignment * kAlignment) {}

    // The slots, and behind them, aligned, their rows.
    size_t bytes() const {
        return slotCount * (sizeof(ScaleCacheSlot) + rowBytes) + kAlignment - 1;
    }
};

// Writes the rectangle.  cache is a block of ScaleCacheShape(job).bytes() bytes,
// null where there are no slots.
void scaleRows(const ScaleJob &job, void *cache);

} // namespace quillon
