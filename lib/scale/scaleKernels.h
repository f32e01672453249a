// Resampling of 32-bit pixels: what the entry hands to the kernels.
//
// Source positions and steps are 16.16 fixed point, 32 bits of which the low 16
// are the fraction, and wrap.  Both axes are described alike, and each goes its
// own way: columns in the row kernels, rows in what calls them.
#pragma once

#include "legacy/surface.h"

#include <algorithm>
#include <bit>
#include <cstddef>
#include <cstdint>

namespace quillon {

constexpr uint32_t kScaleOne = 0x10000; // one source pixel

enum class ScaleMethod {
    kNearest, // the pixel of the position
    kLinear,  // two neighbours blended; steps below one pixel
    kBox      // an average over the step; steps above one pixel
};

struct ScaleAxis {
    ScaleMethod method;
    uint32_t start;      // position of the first pixel to write; linear: half a pixel less
    uint32_t step;       // from one written pixel to the next; not 0
    uint32_t normaliser; // 65536 * scale factor, for averages
    uint32_t srcSize;    // 1 to 32767
    uint32_t dstSize;    // pixels to write; not 0

    // The position of the last source pixel.  What lies there or behind it is
    // always a copy of that pixel.
    uint32_t lastPosition() const { return (srcSize - 1) << 16; }

    // Whether the pixels are averages of two each.
    bool isHalf() const {
        return method == ScaleMethod::kBox && step == 2 * kScaleOne && normaliser == kScaleOne / 2;
    }
};

struct ScaleJob {
    DstRows dst; // the first pixel to write
    SrcRows src; // the first pixel of the source
    ScaleAxis x, y;

    // Averages of two by two pixels are made without rows between.
    bool isQuarter() const { return x.isHalf() && y.isHalf(); }
};

// How many of the positions start, start + step, ... lie before end.
inline uint32_t stepsBefore(uint64_t start, uint64_t end, uint32_t step) {
    return start < end ? static_cast<uint32_t>((end - start - 1) / step + 1) : 0;
}

// The most source rows that one destination row is averaged from.
constexpr size_t kScaleMaxTaps = 32;

// A source row after the horizontal pass.
struct RasterScaleRowSlot {
    uint8_t *pixels;
    uint32_t rowIndex;
};
constexpr uint32_t kScaleNoRow = 0xFFFFFFFF;

// The row cache: a slot for every source row that one destination row can need,
// so that none is made twice.  Row r goes to slot 1 + r % (slots - 1), the divisor
// being a power of two, row 0 to slot 0: a position that wraps comes back to row 0
// in the midst of a span, and must not take the place of a row of that span.
struct ScaleCacheShape {
    static constexpr size_t kAlignment = 64;

    explicit ScaleCacheShape(const ScaleJob &job)
        : slots(job.y.method == ScaleMethod::kNearest || job.isQuarter()
                    ? 0
                    : 1 + std::bit_ceil(
                              std::min<size_t>(((job.y.step + 0xFFFF) >> 16) + 1, kScaleMaxTaps))),
          rowBytes((size_t{job.x.dstSize} * 4 + kAlignment - 1) / kAlignment * kAlignment) {}

    // The slots and then, aligned, their rows.
    size_t bytes() const {
        return slots == 0 ? 0 : slots * (sizeof(RasterScaleRowSlot) + rowBytes) + kAlignment - 1;
    }

    size_t slots; // none where every row goes straight to the destination
    size_t rowBytes;
};

// Writes the rectangle.  cache is a block of ScaleCacheShape(job).bytes(), not
// looked at where there are no slots.
void RasterScaleRect(const ScaleJob &job, void *cache);

} // namespace quillon
