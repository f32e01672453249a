// The blend pixel by pixel: for processors without vectors, and for rows whose
// overlap makes the order of the pixels count.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>

namespace quillon {

// src + dst * (255 - source alpha) / 255 in the colour bytes, at most 255, and the
// alpha of dst.
inline uint32_t blendOverPixel(uint32_t dst, uint32_t src) {
    uint32_t blended = dst & 0xFF000000;
    for (uint32_t shift = 0; shift < 24; shift += 8) {
        const uint32_t under = (dst >> shift & 0xFF) * (255 - (src >> 24)) / 255;
        blended |= std::min((src >> shift & 0xFF) + under, 255u) << shift;
    }
    return blended;
}

// Not to be inlined: it is rare, and would take registers from the kernel.
[[gnu::noinline]] inline void blendOverRowPlain(uint8_t *dst, const uint8_t *src, size_t width) {
    for (size_t i = 0; i < 4 * width; i += 4) {
        uint32_t under, over;
        std::memcpy(&under, dst + i, 4);
        std::memcpy(&over, src + i, 4);
        const uint32_t blended = blendOverPixel(under, over);
        std::memcpy(dst + i, &blended, 4);
    }
}

} // namespace quillon
