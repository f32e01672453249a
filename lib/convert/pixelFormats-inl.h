// Pixels of all layouts to and from words of the 32-bit layout.
//
// A source loads a block of pixels as vectors of words, a destination stores such
// vectors.  There are one, two or four of them.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_PIXEL_WORDS_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_PIXEL_WORDS_INL_H
#undef QUILLON_PIXEL_WORDS_INL_H
#else
#define QUILLON_PIXEL_WORDS_INL_H
#endif

#include "hwy/highway.h"

#include "convert/pixelFormats.h"
#include "legacy/kernels-inl.h"
#include "legacy/narrowing-inl.h"
#include "legacy/packed24-inl.h"
#include "legacy/streaming-inl.h"

#include <bit>
#include <type_traits>

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {

template <class D>
HWY_INLINE hn::Vec<D> masked(D d, hn::Vec<D> v, uint32_t mask) {
    return hn::And(v, hn::Set(d, static_cast<hn::TFromD<D>>(mask)));
}

// ---- Sources ------------------------------------------------------------

// One vector after the other; Source loads one.
template <class Source>
struct Singly {
    template <bool kOpaque, class D, size_t kVectors>
    HWY_INLINE static void load(D d, const uint8_t *src, const uint32_t *palette,
                                hn::Vec<D> (&words)[kVectors]) {
        for (size_t v = 0; v < kVectors; ++v) {
            words[v] = Source::word(d, src + v * kLanes<D> * Source::kBytes, palette);
            if constexpr (kOpaque)
                words[v] = hn::Or(words[v], hn::Set(d, 0xFF000000));
        }
    }
};

// A product with 8.25, rounded down, repeats the top bits of a channel of five bits
// in the three new ones; 4.0625 does so for six bits.  In lanes of 16 bits, because
// those hold twice as many pixels: blue and green of a word, and red.
struct Halves15 {
    template <class D>
    HWY_INLINE static hn::Vec<D> low(D d, hn::Vec<D> p) {
        const auto blue = hn::MulHigh(hn::ShiftLeft<11>(p), hn::Set(d, 264));
        const auto green = hn::Mul(masked(d, p, 0x03E0), hn::Set(d, 66));
        return hn::Or(masked(d, green, 0xFF00), blue);
    }
    template <class D>
    HWY_INLINE static hn::Vec<D> high(D d, hn::Vec<D> p) {
        return hn::MulHigh(masked(d, p, 0x7C00), hn::Set(d, 528));
    }
};

struct Halves16 {
    template <class D>
    HWY_INLINE static hn::Vec<D> low(D d, hn::Vec<D> p) {
        const auto blue = hn::MulHigh(hn::ShiftLeft<11>(p), hn::Set(d, 264));
        const auto green = hn::Mul(masked(d, hn::ShiftRight<1>(p), 0x03F0), hn::Set(d, 65));
        return hn::Or(masked(d, green, 0xFF00), blue);
    }
    template <class D>
    HWY_INLINE static hn::Vec<D> high(D d, hn::Vec<D> p) {
        return hn::MulHigh(masked(d, p, 0xF800), hn::Set(d, 264));
    }
};

template <class Halves>
struct From16Bits {
    static constexpr size_t kBytes = 2;
    static constexpr bool kHasAlpha = false;

    template <bool kOpaque, class D, size_t kVectors>
    HWY_INLINE static void load(D d, const uint8_t *src, const uint32_t * /*palette*/,
                                hn::Vec<D> (&words)[kVectors]) {
        if constexpr (kVectors == 1) {
            const hn::Rebind<uint16_t, D> d16;
            const auto p = hn::LoadU(d16, reinterpret_cast<const uint16_t *>(src));
            const auto high = hn::PromoteTo(d, redOf<kOpaque>(d16, p));
            words[0] = hn::Or(hn::PromoteTo(d, Halves::low(d16, p)), hn::ShiftLeft<16>(high));
        } else {
            const hn::Repartition<uint16_t, D> d16;
            for (size_t v = 0; v < kVectors; v += 2) {
                const auto p = loadDealt(d16, src + v * kLanes<D> * kBytes);
                interleave(d, Halves::low(d16, p), redOf<kOpaque>(d16, p), words[v], words[v + 1]);
            }
        }
    }

private:
    template <bool kOpaque, class D>
    HWY_INLINE static hn::Vec<D> redOf(D d, hn::Vec<D> p) {
        const auto red = Halves::high(d, p);
        return kOpaque ? hn::Or(red, hn::Set(d, 0xFF00)) : red;
    }
};
using From15 = From16Bits<Halves15>;
using From16 = From16Bits<Halves16>;

struct From24 : Singly<From24> {
    static constexpr size_t kBytes = 3;
    static constexpr bool kHasAlpha = false;

    template <class D>
    HWY_INLINE static hn::Vec<D> word(D d, const uint8_t *src, const uint32_t * /*palette*/) {
        return load24(d, src);
    }
};

struct From32 : Singly<From32> {
    static constexpr size_t kBytes = 4;
    static constexpr bool kHasAlpha = true;

    template <class D>
    HWY_INLINE static hn::Vec<D> word(D d, const uint8_t *src, const uint32_t * /*palette*/) {
        return hn::LoadU(d, reinterpret_cast<const uint32_t *>(src));
    }
};

// The lanes of a gather that are masked out keep what the register held, so that
// the processor waits for that even where there are none.  A compiler that sees
// that there are none leaves any register, at worst the last result; hence a mask
// that is computed, of indices that are never negative.
template <class D, class Index>
HWY_INLINE hn::Vec<D> gathered(D d, const uint32_t *palette, Index index) {
#if HWY_TARGET == HWY_AVX3
    if constexpr (kLanes<D> == 16) {
        const __m512i zero = _mm512_setzero_si512();
        const __mmask16 all = _mm512_cmpge_epi32_mask(index.raw, zero);
        return hn::Vec<D>{_mm512_mask_i32gather_epi32(zero, all, index.raw, palette, 4)};
    }
#elif HWY_TARGET == HWY_AVX2
    if constexpr (kLanes<D> == 8)
        return hn::Vec<D>{_mm256_mask_i32gather_epi32(_mm256_setzero_si256(),
                                                      reinterpret_cast<const int *>(palette),
                                                      index.raw, hn::Not(index).raw, 4)};
#endif
    return hn::GatherIndex(d, palette, index);
}

struct FromIndex : Singly<FromIndex> {
    static constexpr size_t kBytes = 1;
    static constexpr bool kHasAlpha = true;

    template <class D>
    HWY_INLINE static hn::Vec<D> word(D d, const uint8_t *src, const uint32_t *palette) {
        // A gather of less than four lanes would look up the lanes that are not
        // there, too.
        constexpr size_t n = kLanes<D>;
        if constexpr (n == 1) {
            return hn::Set(d, palette[src[0]]);
        } else if constexpr (n == 2) {
            const hn::Repartition<uint64_t, D> d64;
            return hn::BitCast(d, hn::Set(d64, palette[src[0]] | uint64_t{palette[src[1]]} << 32));
        } else {
            const hn::Rebind<int32_t, D> index;
            const hn::Rebind<uint8_t, D> d8;
            return gathered(d, palette, hn::PromoteTo(index, hn::LoadU(d8, src)));
        }
    }
};

// ---- Destinations -------------------------------------------------------

// Through the caches, by a caller that begins with a cache line.
struct ToWholeLines : ThroughCaches {};

// A narrower layout is a weighted sum of the bytes of a word.  The bits that
// survive, what each byte counts in a sum of two, what each of those sums counts,
// and how far above the pixel the result lies: those who share a distance share
// their code.
struct Weights {
    uint32_t mask, bytes, pairs;
};
inline constexpr int kShiftTo16Bits = 3;
inline constexpr Weights kWeights15 = {0xF8F8F8, 0x202001, 0x00200001};
inline constexpr Weights kWeights16 = {0xF8FCF8, 0x404001, 0x00200001};

inline constexpr int kShiftToSmall = 6;
constexpr Weights weightsOfSmall(size_t depth) {
    Weights weights = {0, 0, 0x00010001};
    for (const uint8_t mask : RasterSmallMasks[depth]) { // red first
        const int width = std::bit_width(mask);
        weights.mask = weights.mask << 8 | uint32_t{mask} << (8 - width);
        weights.bytes = weights.bytes << 8 | 1U << (width + kShiftToSmall - 8);
    }
    return weights;
}

template <int kShift, class D, size_t kVectors>
HWY_INLINE void narrow(D d, const hn::Vec<D> (&words)[kVectors], const Weights &weights,
                       hn::Vec<D> (&pixels)[kVectors]) {
    for (size_t v = 0; v < kVectors; ++v) {
        const auto bits = masked(d, words[v], weights.mask);
        const auto sum = weighed(d, bits, weights.bytes, weights.pairs);
        pixels[v] = hn::ShiftRight<kShift>(sum);
    }
}

struct ToSmall {
    static constexpr size_t kBytes = 1;
    static constexpr bool kHasAlpha = false;

    template <class Stores, class D, size_t kVectors>
    HWY_INLINE static void store(D d, const hn::Vec<D> (&words)[kVectors], uint8_t *dst,
                                 const Weights &weights) {
        hn::Vec<D> pixels[kVectors];
        narrow<kShiftToSmall>(d, words, weights, pixels);
        if constexpr (kVectors == 4) {
            const hn::Repartition<uint8_t, D> d8;
            Stores::store(d8, packed8(d8, pixels), dst);
        } else if constexpr (kVectors == 2) {
            const hn::Repartition<uint8_t, D> d8;
            const hn::Half<decltype(d8)> half;
            const hn::Vec<D> twice[4] = {pixels[0], pixels[1], pixels[0], pixels[1]};
            Stores::store(half, hn::LowerHalf(half, packed8(d8, twice)), dst);
        } else {
            const hn::Rebind<uint8_t, D> d8;
            Stores::store(d8, hn::TruncateTo(d8, pixels[0]), dst);
        }
    }
};

struct To16Bits {
    static constexpr size_t kBytes = 2;
    static constexpr bool kHasAlpha = false;

    template <class Stores, class D, size_t kVectors>
    HWY_INLINE static void store(D d, const hn::Vec<D> (&words)[kVectors], uint8_t *dst,
                                 const Weights &weights) {
        hn::Vec<D> pixels[kVectors];
        narrow<kShiftTo16Bits>(d, words, weights, pixels);
        if constexpr (kVectors == 1) {
            const hn::Rebind<uint16_t, D> d16;
            Stores::store(d16, hn::TruncateTo(d16, pixels[0]), dst);
        } else {
            const hn::Repartition<uint16_t, D> d16;
            for (size_t v = 0; v < kVectors; v += 2)
                Stores::store(d16, packed16(d16, pixels[v], pixels[v + 1]),
                              dst + v * kLanes<D> * kBytes);
        }
    }
};

struct To24 {
    static constexpr size_t kBytes = 3;
    static constexpr bool kHasAlpha = false;

    template <class Stores, class D, size_t kVectors>
    HWY_INLINE static void store(D d, const hn::Vec<D> (&words)[kVectors], uint8_t *dst,
                                 const Weights & /*weights*/) {
        // Vectors across two lines would cost more than pieces of vectors do.
        if constexpr (kVectors == 4 && !std::is_same<Stores, ThroughCaches>())
            store24<Stores>(d, words, dst);
        else
            for (size_t v = 0; v < kVectors; ++v)
                store24(d, words[v], dst + v * kLanes<D> * kBytes);
    }
};

struct To32 {
    static constexpr size_t kBytes = 4;
    static constexpr bool kHasAlpha = true;

    template <class Stores, class D, size_t kVectors>
    HWY_INLINE static void store(D d, const hn::Vec<D> (&words)[kVectors], uint8_t *dst,
                                 const Weights & /*weights*/) {
        for (size_t v = 0; v < kVectors; ++v)
            Stores::store(d, words[v], dst + v * kLanes<D> * kBytes);
    }
};

} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
