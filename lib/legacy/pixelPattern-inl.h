// The bytes of a row of equal pixels.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_PIXEL_PATTERN_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_PIXEL_PATTERN_INL_H
#undef QUILLON_PIXEL_PATTERN_INL_H
#else
#define QUILLON_PIXEL_PATTERN_INL_H
#endif

#include "hwy/highway.h"

#include <cstddef>
#include <cstdint>

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace hn = hwy::HWY_NAMESPACE;

// By vectors of words.  What a pixel size leaves of a pixel repeats every 3 bytes or
// every 4, so that from any byte on it is known what comes.
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
