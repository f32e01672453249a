// The bytes of a row of equal pixels, as vectors.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_SIMD_PIXEL_PATTERN_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_SIMD_PIXEL_PATTERN_INL_H
#undef QUILLON_SIMD_PIXEL_PATTERN_INL_H
#else
#define QUILLON_SIMD_PIXEL_PATTERN_INL_H
#endif

#include "hwy/highway.h"

#include "simd/target-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
#if QUILLON_HAS_VECTORS

// A pixel over and over.  Its bytes repeat every 3 bytes or every 4, so that the
// word from any byte on follows from eight of them.
class PixelPattern {
public:
    PixelPattern(uint32_t pixel, int32_t bytesPerPixel)
        : period_(static_cast<size_t>(bytesPerPixel)) {
        if (period_ == 1)
            bytes_ = (pixel & 0xFF) * 0x0101010101010101u;
        else if (period_ == 2)
            bytes_ = (pixel & 0xFFFF) * 0x0001000100010001u;
        else if (period_ == 3)
            bytes_ = (pixel & 0xFFFFFF) * 0x0001000001000001u;
        else
            bytes_ = pixel * 0x0000000100000001u;
    }

    // Whether the bytes from both offsets on are the same.
    HWY_INLINE bool isSameAt(size_t offset, size_t other) const {
        return phase(offset) == phase(other);
    }

    // The vector of 32-bit lanes from the given byte of the row on.
    template <class D>
    HWY_INLINE hn::Vec<D> from(D d, size_t offset) const {
        HWY_ALIGN static constexpr uint32_t kThird[16] = {0, 1, 2, 0, 1, 2, 0, 1,
                                                          2, 0, 1, 2, 0, 1, 2, 0};
        const auto word = hn::Set(d, wordFrom(offset));
        if (period_ != 3)
            return word;
        const auto third = hn::Load(d, kThird);
        const auto rest =
            hn::IfThenElse(hn::Eq(third, hn::Set(d, 1)), hn::Set(d, wordFrom(offset + 4)),
                           hn::Set(d, wordFrom(offset + 8)));
        return hn::IfThenElse(hn::Eq(third, hn::Zero(d)), word, rest);
    }

private:
    HWY_INLINE size_t phase(size_t offset) const {
        return period_ == 3 ? offset % 3 : offset & (period_ - 1);
    }
    HWY_INLINE uint32_t wordFrom(size_t offset) const {
        return static_cast<uint32_t>(bytes_ >> (8 * phase(offset)));
    }
    uint64_t bytes_;
    size_t period_; // in bytes
};

// Three vectors, to be stored in turn: together they hold whole pixels of any size.
template <class D>
struct PatternVectors {
    hn::Vec<D> first, second, third;

    HWY_INLINE PatternVectors(D d, const PixelPattern &pattern, size_t offset)
        : first(pattern.from(d, offset)), second(first), third(first) {
        if (!pattern.isSameAt(0, kBytesOf<D>)) {
            second = pattern.from(d, offset + kBytesOf<D>);
            third = pattern.from(d, offset + 2 * kBytesOf<D>);
        }
    }

    template <size_t kTurn>
    HWY_INLINE hn::Vec<D> get() const {
        return kTurn % 3 == 0 ? first : kTurn % 3 == 1 ? second : third;
    }
};

#endif
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
