// The bytes of a row of equal pixels.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_BYTE_PATTERN_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_BYTE_PATTERN_INL_H
#undef QUILLON_BYTE_PATTERN_INL_H
#else
#define QUILLON_BYTE_PATTERN_INL_H
#endif

#include "hwy/highway.h"

#include <cstddef>
#include <cstdint>

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {

// At every pixel size the bytes of a row repeat every 12 bytes, so that any
// stretch of up to kBytes of them can be loaded from the place where it starts
// modulo 12.
template <size_t kBytes>
struct BytePattern {
    uint8_t bytes[(kBytes + 15) / 4 * 4];

    BytePattern(uint32_t pixel, int32_t bytesPerPixel) {
        uint32_t words[3] = {pixel, pixel, pixel};
        if (bytesPerPixel == 1) {
            words[0] = words[1] = words[2] = (pixel & 0xFF) * 0x01010101u;
        } else if (bytesPerPixel == 2) {
            words[0] = words[1] = words[2] = (pixel & 0xFFFF) * 0x00010001u;
        } else if (bytesPerPixel == 3) {
            pixel &= 0xFFFFFF;
            words[0] = pixel | pixel << 24;
            words[1] = pixel >> 8 | pixel << 16;
            words[2] = pixel >> 16 | pixel << 8;
        }
        for (size_t i = 0; i < sizeof(bytes) / 4; ++i)
            hwy::CopyBytes<4>(&words[i % 3], bytes + 4 * i);
    }

    const uint8_t *from(size_t offset) const { return bytes + offset % 12; }
};

} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
