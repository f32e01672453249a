// One axis of a scaling: the fixed point in which source positions are counted.
//
// Positions and steps are 16.16: 32 bits, the low 16 of which are the fraction.
// They wrap.  Columns and rows are described alike.
#pragma once

#include <cstdint>

namespace quillon {

inline constexpr uint32_t kScaleOne = 0x10000; // one source pixel

enum class ScaleMethod {
    kNearest, // the pixel of the position
    kLinear,  // two neighbours blended; steps below one pixel
    kBox      // an average over the step; steps above one pixel
};

struct ScaleAxis {
    ScaleMethod method;
    uint32_t start;      // position of the first pixel to write; linear: half a pixel less
    uint32_t step;       // from one written pixel to the next; not 0
    uint32_t normaliser; // 65536 * scale factor, below 65536; box only
    uint32_t srcSize;    // 1 to 32767
    uint32_t dstSize;    // pixels to write; not 0

    // The position of the last source pixel.  In a row, all that lies there or
    // behind is a copy of that pixel.
    uint32_t lastPosition() const { return (srcSize - 1) << 16; }

    // Whether every pixel is the average of two whole ones.
    bool isHalf() const {
        return method == ScaleMethod::kBox && step == 2 * kScaleOne && normaliser == kScaleOne / 2;
    }

    // Whether the pixels are those of the source from start on, one by one.
    bool isCopy() const { return step == kScaleOne && uint64_t{start >> 16} + dstSize <= srcSize; }
};

// How many of the positions start, start + step, ... lie before end.
inline uint32_t stepsBefore(uint64_t start, uint64_t end, uint32_t step) {
    return start < end ? static_cast<uint32_t>((end - start - 1) / step + 1) : 0;
}

} // namespace quillon
