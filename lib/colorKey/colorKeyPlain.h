// The colour key pixel by pixel: for processors without vectors, and for rows that
// are short or whose overlap makes the order of the pixels count.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>

namespace quillon {

// Whether a pixel of the key surface has the key colour.  Narrow pixels are
// compared with the whole key.
template <class KeyPixel>
constexpr bool matchesKey(KeyPixel pixel, uint32_t key) {
    const uint32_t ignored = sizeof(KeyPixel) == 4 ? 0xFF000000 : 0;
    return ((pixel ^ key) & ~ignored) == 0;
}

template <class KeyPixel>
void composeRowPlain(uint8_t *dst, const uint8_t *background, const uint8_t *overlay,
                     const uint8_t *keys, size_t width, uint32_t key) {
    for (size_t x = 0; x < width; ++x) {
        KeyPixel keyPixel;
        uint32_t over, under;
        std::memcpy(&keyPixel, keys + sizeof(KeyPixel) * x, sizeof(KeyPixel));
        std::memcpy(&over, overlay + 4 * x, 4);
        std::memcpy(&under, background + 4 * x, 4);
        const uint32_t pixel = matchesKey(keyPixel, key) ? over : under;
        std::memcpy(dst + 4 * x, &pixel, 4);
    }
}

} // namespace quillon
