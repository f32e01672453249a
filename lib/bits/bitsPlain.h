// Bits to pixels one by one: for processors without vectors, and for rows too
// short for them.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>

namespace quillon {

template <size_t kBytes>
inline void storePixel(uint8_t *dst, uint32_t pixel) {
    if constexpr (kBytes == 3) {
        std::memcpy(dst, &pixel, 2);
        dst[2] = static_cast<uint8_t>(pixel >> 16);
    } else {
        std::memcpy(dst, &pixel, kBytes);
    }
}

inline bool isBitSet(const uint8_t *bits, size_t i) {
    return (bits[i / 8] << i % 8 & 0x80) != 0;
}

template <size_t kBytes>
void expandRowPlain(uint8_t *dst, const uint8_t *bits, size_t width, uint32_t foreground,
                    uint32_t background) {
    for (size_t i = 0; i < width; ++i)
        storePixel<kBytes>(dst + i * kBytes, isBitSet(bits, i) ? foreground : background);
}

template <size_t kBytes>
void stencilRowPlain(uint8_t *dst, const uint8_t *bits, size_t width, uint32_t pixel) {
    for (size_t i = 0; i < width; ++i)
        if (isBitSet(bits, i))
            storePixel<kBytes>(dst + i * kBytes, pixel);
}

} // namespace quillon
