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
namespace hn = hwy::HWY_NAMESPACE;

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

// The same without a detour through memory, by vectors of words.
class PixelPattern {
public:
    PixelPattern(uint32_t pixel, int32_t bytesPerPixel) : period(bytesPerPixel == 3 ? 3 : 4) {
        if (bytesPerPixel == 1)
            repeated = (pixel & 0xFF) * 0x0101010101010101u;
        else if (bytesPerPixel == 2)
            repeated = (pixel & 0xFFFF) * 0x0001000100010001u;
        else if (bytesPerPixel == 3)
            repeated = (pixel & 0xFFFFFF) * 0x0001000001000001u;
        else
            repeated = pixel * 0x0000000100000001u;
    }

    // From the given byte of the row on.
    template <class D>
    HWY_INLINE hn::Vec<D> from(D d, size_t offset) const {
        HWY_ALIGN static constexpr uint32_t kThird[16] = {0, 1, 2, 0, 1, 2, 0, 1,
                                                          2, 0, 1, 2, 0, 1, 2, 0};
        const auto third = hn::Load(d, kThird);
        const auto rest = hn::IfThenElse(hn::Eq(third, hn::Set(d, 1)), hn::Set(d, word(offset + 4)),
                                         hn::Set(d, word(offset + 8)));
        return hn::IfThenElse(hn::Eq(third, hn::Zero(d)), hn::Set(d, word(offset)), rest);
    }

private:
    HWY_INLINE uint32_t word(size_t offset) const {
        return static_cast<uint32_t>(repeated >> (8 * (period == 3 ? offset % 3 : offset % 4)));
    }
    uint64_t repeated; // as often as eight bytes have room
    size_t period;     // in bytes, or a multiple of it
};

// Three vectors in turn hold whole pixels of every size.
template <class D>
struct PatternVectors {
    hn::Vec<D> first, second, third;

    HWY_INLINE PatternVectors(D d, const PixelPattern &pattern, size_t offset)
        : first(pattern.from(d, offset)), second(pattern.from(d, offset + kBytes)),
          third(pattern.from(d, offset + 2 * kBytes)) {}

    static constexpr size_t kBytes = 4 * hn::MaxLanes(D());
};

} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
