// Packed pixels of three bytes, to and from words of four.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_PACKED24_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_PACKED24_INL_H
#undef QUILLON_PACKED24_INL_H
#else
#define QUILLON_PACKED24_INL_H
#endif

#include "hwy/highway.h"

#include "legacy/kernels-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {

// Within each 16 bytes: three bytes a pixel to four, and back.
HWY_ALIGN constexpr uint8_t kSpreadBytes[16] = {0, 1, 2, 0x80, 3, 4,  5,  0x80,
                                                6, 7, 8, 0x80, 9, 10, 11, 0x80};
HWY_ALIGN constexpr uint8_t kPackBytes[16] = {0,  1,  2,  4,  5,    6,    8,    9,
                                              10, 12, 13, 14, 0x80, 0x80, 0x80, 0x80};
// The same where the second 16 bytes begin with the last word of the first 12.
HWY_ALIGN constexpr uint8_t kSpreadLateBytes[32] = {
    0, 1, 2, 0x80, 3, 4, 5, 0x80, 6,  7,  8,  0x80, 9,  10, 11, 0x80,
    4, 5, 6, 0x80, 7, 8, 9, 0x80, 10, 11, 12, 0x80, 13, 14, 15, 0x80};
// Across groups of 16 bytes: three words a group to four.
HWY_ALIGN constexpr uint32_t kSpreadWords[16] = {0, 1, 2, 2, 3, 4, 5, 5, 6, 7, 8, 8, 9, 10, 11, 11};

// And back: the words of the groups in their order, from kFirst on and round the
// vector.  The words they leave free repeat the zeros behind the first group.
template <size_t kWords, size_t kFirst>
struct PackWords {
    alignas(64) uint32_t words[kWords] = {};
    constexpr PackWords() {
        for (uint32_t &word : words)
            word = 3;
        for (size_t i = 0; i < kWords / 4 * 3; ++i)
            words[(kFirst + i) % kWords] = static_cast<uint32_t>(i / 3 * 4 + i % 3);
    }
};
template <size_t kWords, size_t kFirst>
inline constexpr PackWords<kWords, kFirst> kPackWords;

// Exactly three bytes a pixel are read.
template <class D>
HWY_INLINE hn::Vec<D> load24([[maybe_unused]] D d, const uint8_t *src) {
    constexpr size_t n = kLanes<D>;
    if constexpr (n == 1) {
        uint16_t low;
        hwy::CopyBytes<2>(src, &low);
        return hn::Set(d, low | uint32_t{src[2]} << 16);
    } else {
#if HWY_TARGET != HWY_SCALAR
        const hn::Repartition<uint8_t, D> d8;
        const hn::Half<decltype(d8)> half;
#if HWY_TARGET == HWY_AVX3
        if constexpr (n == 16) {
            const hn::Vec<D> bytes{_mm512_maskz_loadu_epi32(0x0FFF, src)};
            const auto v = hn::TableLookupLanes(bytes, hn::SetTableIndices(d, kSpreadWords));
            return hn::BitCast(
                d, hn::TableLookupBytesOr0(hn::BitCast(d8, v), hn::LoadDup128(d8, kSpreadBytes)));
        } else
#endif
            if constexpr (n == 8) {
            const auto v = hn::Combine(d8, hn::LoadU(half, src + 8), hn::LoadU(half, src));
            return hn::BitCast(d, hn::TableLookupBytesOr0(v, hn::Load(d8, kSpreadLateBytes)));
        } else {
            const hn::Half<decltype(half)> quarter;
            const auto rest = hn::ZeroExtendVector(half, hn::LoadU(quarter, src + 2 * n));
            const auto v = hn::Combine(d8, rest, hn::LoadU(half, src));
            return hn::BitCast(d, hn::TableLookupBytesOr0(v, hn::LoadDup128(d8, kSpreadBytes)));
        }
#endif
    }
}

#if HWY_TARGET != HWY_SCALAR
// The packed words of v from word kFirst on and round the vector.
template <size_t kFirst, class D>
HWY_INLINE hn::Vec<D> packed24(D d, hn::Vec<D> v) {
    constexpr size_t n = kLanes<D>;
    const hn::Repartition<uint8_t, D> d8;
    const auto groups =
        hn::BitCast(d, hn::TableLookupBytesOr0(hn::BitCast(d8, v), hn::LoadDup128(d8, kPackBytes)));
    if constexpr (n <= 4 && kFirst == 0)
        return groups;
    else
        return hn::TableLookupLanes(groups, hn::SetTableIndices(d, kPackWords<n, kFirst>.words));
}

// The first kCount words of a, and then those of b.
template <size_t kCount, class D>
HWY_INLINE hn::Vec<D> firstThen(D d, hn::Vec<D> a, hn::Vec<D> b) {
#if HWY_TARGET == HWY_AVX2
    if constexpr (kLanes<D> == 8)
        return hn::Vec<D>{_mm256_blend_epi32(b.raw, a.raw, (1 << kCount) - 1)};
#endif
    return hn::IfThenElse(hn::FirstN(d, kCount), a, b);
}
#endif

// Exactly three bytes a pixel are written.
template <class D>
HWY_INLINE void store24([[maybe_unused]] D d, hn::Vec<D> v, uint8_t *dst) {
    constexpr size_t n = kLanes<D>;
    if constexpr (n == 1) {
        const uint32_t pixel = hn::GetLane(v);
        hwy::CopyBytes<2>(&pixel, dst);
        dst[2] = static_cast<uint8_t>(pixel >> 16);
    } else {
#if HWY_TARGET != HWY_SCALAR
        const hn::Repartition<uint8_t, D> d8;
        const hn::Half<decltype(d8)> half;
        const hn::Half<decltype(half)> quarter;
        const auto bytes = hn::BitCast(d8, packed24<0>(d, v));
        hn::StoreU(hn::LowerHalf(half, bytes), half, dst);
        hn::StoreU(hn::LowerHalf(quarter, hn::UpperHalf(half, bytes)), quarter, dst + 2 * n);
#endif
    }
}

#if HWY_TARGET != HWY_SCALAR
// Four vectors of words as three, which Stores stores.
template <class Stores, class D>
HWY_INLINE void store24(D d, const hn::Vec<D> (&v)[4], uint8_t *dst) {
    constexpr size_t n = kLanes<D>;
    const auto a = packed24<0>(d, v[0]);
    const auto b = packed24<n / 4 * 3>(d, v[1]);
    const auto c = packed24<n / 4 * 2>(d, v[2]);
    const auto e = packed24<n / 4>(d, v[3]);
    Stores::store(d, firstThen<n / 4 * 3>(d, a, b), dst);
    Stores::store(d, firstThen<n / 4 * 2>(d, b, c), dst + 4 * n);
    Stores::store(d, firstThen<n / 4>(d, c, e), dst + 8 * n);
}
#endif

} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
