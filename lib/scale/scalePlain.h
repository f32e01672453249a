// The scaler pixel by pixel, for processors without vectors.
//
// All arithmetic is on the four 8-bit channels of a pixel alike.  Weights have 8
// bits; every product is truncated by itself, and the results depend on it.
#pragma once

#include "scale/scaleKernels.h"

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>

namespace quillon {

inline uint32_t pixelAt(const uint8_t *row, size_t index) {
    uint32_t pixel;
    std::memcpy(&pixel, row + 4 * index, sizeof(pixel));
    return pixel;
}
inline void putPixel(uint8_t *row, size_t index, uint32_t pixel) {
    std::memcpy(row + 4 * index, &pixel, sizeof(pixel));
}

// Two pixels by weights that sum to 255.
inline uint32_t blendPixels(uint32_t a, uint32_t b, uint32_t weightB) {
    uint32_t blended = 0;
    for (uint32_t shift = 0; shift < 32; shift += 8) {
        const uint32_t sum = (a >> shift & 0xFF) * (255 - weightB) + (b >> shift & 0xFF) * weightB;
        blended |= sum >> 8 << shift;
    }
    return blended;
}

// A weighted sum of pixels, and its average.
struct PlainSum {
    uint32_t channels[4] = {};

    // The weight is at most 256, which counts the pixel whole.
    void add(uint32_t pixel, uint32_t weight) {
        for (uint32_t &channel : channels) {
            channel += (pixel & 0xFF) * weight >> 8;
            pixel >>= 8;
        }
    }
    uint32_t average(uint32_t normaliser) const {
        uint32_t pixel = 0;
        for (uint32_t i = 0; i < 4; ++i)
            pixel |= (channels[i] * normaliser >> 16 & 0xFF) << 8 * i;
        return pixel;
    }
};

// ---- Horizontal pass ------------------------------------------------------

// Also where positions wrap and come back into the source.
inline void nearestRowPlain(const ScaleAxis &axis, uint8_t *dst, const uint8_t *src) {
    uint32_t x = axis.start;
    for (size_t i = 0; i < axis.dstSize; ++i, x += axis.step)
        putPixel(dst, i, pixelAt(src, std::min(x >> 16, axis.srcSize - 1)));
}

// Positions in front of the first pixel are negative.  Both ends keep the values of
// the source.
inline void linearRowPlain(const ScaleAxis &axis, uint8_t *dst, const uint8_t *src) {
    uint32_t x = axis.start;
    size_t i = 0;
    for (; i < axis.dstSize && x >> 31 != 0; ++i, x += axis.step)
        putPixel(dst, i, pixelAt(src, 0));
    for (; i < axis.dstSize && x < axis.lastPosition(); ++i, x += axis.step) {
        const size_t left = x >> 16;
        const uint32_t weight = (x & 0xFFFF) >> 8;
        putPixel(dst, i, blendPixels(pixelAt(src, left), pixelAt(src, left + 1), weight));
    }
    for (; i < axis.dstSize; ++i)
        putPixel(dst, i, pixelAt(src, axis.srcSize - 1));
}

// The average of the step that begins at x, of which the last source pixel is never
// a part.
inline uint32_t boxPixelPlain(const ScaleAxis &axis, const uint8_t *src, uint32_t x) {
    const uint32_t end = std::min(x + axis.step, axis.lastPosition());
    PlainSum sum;
    while (x != end) {
        const uint32_t covered = std::min(kScaleOne - (x & 0xFFFF), end - x);
        sum.add(pixelAt(src, x >> 16), covered >> 8);
        x += covered;
    }
    return sum.average(axis.normaliser);
}

inline void boxRowPlain(const ScaleAxis &axis, uint8_t *dst, const uint8_t *src) {
    uint32_t x = axis.start;
    size_t i = 0;
    for (; i < axis.dstSize && x < axis.lastPosition(); ++i, x += axis.step)
        putPixel(dst, i, boxPixelPlain(axis, src, x));
    for (; i < axis.dstSize; ++i)
        putPixel(dst, i, pixelAt(src, axis.srcSize - 1));
}

inline void scaleRowPlain(const ScaleAxis &axis, uint8_t *dst, const uint8_t *src) {
    switch (axis.method) {
    case ScaleMethod::kNearest:
        return nearestRowPlain(axis, dst, src);
    case ScaleMethod::kLinear:
        return linearRowPlain(axis, dst, src);
    case ScaleMethod::kBox:
        return boxRowPlain(axis, dst, src);
    }
}

// ---- Vertical pass --------------------------------------------------------

inline void blendRowsPlain(uint8_t *dst, const uint8_t *upper, const uint8_t *lower,
                           uint32_t lowerWeight, size_t width) {
    for (size_t i = 0; i < width; ++i)
        putPixel(dst, i, blendPixels(pixelAt(upper, i), pixelAt(lower, i), lowerWeight));
}

inline void averageRowsPlain(uint8_t *dst, const ScaleTap *taps, size_t tapCount,
                             uint32_t normaliser, size_t width) {
    for (size_t i = 0; i < width; ++i) {
        PlainSum sum;
        for (size_t tap = 0; tap < tapCount; ++tap)
            sum.add(pixelAt(taps[tap].pixels, i), taps[tap].weights & 0xFF);
        putPixel(dst, i, sum.average(normaliser));
    }
}

// Both passes at once for averages of two by two.
inline void quarterRowPlain(const ScaleAxis &axis, uint8_t *dst, const uint8_t *upper,
                            const uint8_t *lower) {
    const auto horizontal = [&](const uint8_t *src, uint32_t x) {
        return x < axis.lastPosition() ? boxPixelPlain(axis, src, x)
                                       : pixelAt(src, axis.srcSize - 1);
    };
    uint32_t x = axis.start;
    for (size_t i = 0; i < axis.dstSize; ++i) {
        PlainSum sum;
        sum.add(horizontal(upper, x), 255);
        sum.add(horizontal(lower, x), 255);
        putPixel(dst, i, sum.average(kScaleOne / 2));
        x = std::min(x, axis.lastPosition()) + axis.step;
    }
}

} // namespace quillon
