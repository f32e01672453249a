// Pixels of three bytes, to and from 32-bit lanes.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_SIMD_RGB24_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_SIMD_RGB24_INL_H
#undef QUILLON_SIMD_RGB24_INL_H
#else
#define QUILLON_SIMD_RGB24_INL_H
#endif

#include "hwy/highway.h"

#include "simd/access-inl.h"
#include "simd/target-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
#if QUILLON_HAS_VECTORS

// Within a block: three bytes a pixel to four, and back.
HWY_ALIGN constexpr uint8_t kSpreadBytes[16] = {0, 1, 2, 0x80, 3, 4,  5,  0x80,
                                                6, 7, 8, 0x80, 9, 10, 11, 0x80};
HWY_ALIGN constexpr uint8_t kPackBytes[16] = {0,  1,  2,  4,  5,    6,    8,    9,
                                              10, 12, 13, 14, 0x80, 0x80, 0x80, 0x80};
// The same where the second block begins with the last 4 bytes of the first 12.
HWY_ALIGN constexpr uint8_t kSpreadLateBytes[32] = {
    0, 1, 2, 0x80, 3, 4, 5, 0x80, 6,  7,  8,  0x80, 9,  10, 11, 0x80,
    4, 5, 6, 0x80, 7, 8, 9, 0x80, 10, 11, 12, 0x80, 13, 14, 15, 0x80};
// Across blocks: 12 bytes a block to 16, as 32-bit indices.
HWY_ALIGN constexpr uint32_t kSpreadWords[16] = {0, 1, 2, 2, 3, 4, 5, 5, 6, 7, 8, 8, 9, 10, 11, 11};

// And back: the 12 bytes of the blocks in their order, from index kFirst on and
// round the vector.  What they leave free repeats the zeros behind the first block.
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
HWY_INLINE hn::Vec<D> loadRgb24(D d, const uint8_t *src) {
    constexpr size_t n = kLanes<D>;
    const hn::Repartition<uint8_t, D> d8;
    if constexpr (n == 1) {
        uint16_t low;
        hwy::CopyBytes<2>(src, &low);
        return hn::Set(d, low | uint32_t{src[2]} << 16);
    } else if constexpr (kHasMaskedTails && kBytesOf<D> == kVectorBytes) {
        const auto packed = FirstLanes{n / 4 * 3}.load(d, src);
        const auto spread = hn::TableLookupLanes(packed, hn::SetTableIndices(d, kSpreadWords));
        return hn::BitCast(
            d, hn::TableLookupBytesOr0(hn::BitCast(d8, spread), hn::LoadDup128(d8, kSpreadBytes)));
    } else if constexpr (n > 8) {
        const hn::Half<D> half;
        return hn::Combine(d, loadRgb24(half, src + 3 * (n / 2)), loadRgb24(half, src));
    } else if constexpr (n == 8) {
        const hn::Half<decltype(d8)> half;
        const auto v = hn::Combine(d8, hn::LoadU(half, src + 8), hn::LoadU(half, src));
        return hn::BitCast(d, hn::TableLookupBytesOr0(v, hn::Load(d8, kSpreadLateBytes)));
    } else {
        const hn::Half<decltype(d8)> half;
        const hn::Half<decltype(half)> quarter;
        const auto rest = hn::ZeroExtendVector(half, hn::LoadU(quarter, src + 2 * n));
        const auto v = hn::Combine(d8, rest, hn::LoadU(half, src));
        return hn::BitCast(d, hn::TableLookupBytesOr0(v, hn::LoadDup128(d8, kSpreadBytes)));
    }
}

// The pixels of v packed, from 32-bit index kFirst on and round the vector.
template <size_t kFirst, class D>
HWY_INLINE hn::Vec<D> packRgb24(D d, hn::Vec<D> v) {
    constexpr size_t n = kLanes<D>;
    const hn::Repartition<uint8_t, D> d8;
    const auto blocks =
        hn::BitCast(d, hn::TableLookupBytesOr0(hn::BitCast(d8, v), hn::LoadDup128(d8, kPackBytes)));
    if constexpr (n <= 4 && kFirst == 0)
        return blocks;
    else
        return hn::TableLookupLanes(blocks, hn::SetTableIndices(d, kPackWords<n, kFirst>.words));
}

// The first kCount lanes of a, and then those of b.
template <size_t kCount, class D>
HWY_INLINE hn::Vec<D> firstLanesOf(D d, hn::Vec<D> a, hn::Vec<D> b) {
#if QUILLON_X86_AVX2 && !QUILLON_X86_AVX512
    if constexpr (kLanes<D> == 8)
        return hn::Vec<D>{_mm256_blend_epi32(b.raw, a.raw, (1 << kCount) - 1)};
#endif
    return hn::IfThenElse(hn::FirstN(d, kCount), a, b);
}

// One vector of pixels.  Exactly three bytes a pixel are written.
template <class D>
HWY_INLINE void storeRgb24(D d, hn::Vec<D> v, uint8_t *dst) {
    constexpr size_t n = kLanes<D>;
    if constexpr (n == 1) {
        const uint32_t pixel = hn::GetLane(v);
        hwy::CopyBytes<2>(&pixel, dst);
        dst[2] = static_cast<uint8_t>(pixel >> 16);
    } else if constexpr (kHasMaskedTails && kBytesOf<D> == kVectorBytes) {
        FirstLanes{n / 4 * 3}.store(d, packRgb24<0>(d, v), dst);
    } else {
        const hn::Repartition<uint8_t, D> d8;
        const hn::Half<decltype(d8)> half;
        const hn::Half<decltype(half)> quarter;
        const auto bytes = hn::BitCast(d8, packRgb24<0>(d, v));
        hn::StoreU(hn::LowerHalf(half, bytes), half, dst);
        hn::StoreU(hn::LowerHalf(quarter, hn::UpperHalf(half, bytes)), quarter, dst + 2 * n);
    }
}

// Four vectors of pixels as three.
template <class Access, class D>
HWY_INLINE void storeRgb24(D d, const hn::Vec<D> (&v)[4], uint8_t *dst, Access access) {
    constexpr size_t n = kLanes<D>;
    const auto first = packRgb24<0>(d, v[0]);
    const auto second = packRgb24<n / 4 * 3>(d, v[1]);
    const auto third = packRgb24<n / 4 * 2>(d, v[2]);
    const auto fourth = packRgb24<n / 4>(d, v[3]);
    access.store(d, firstLanesOf<n / 4 * 3>(d, first, second), dst);
    access.store(d, firstLanesOf<n / 4 * 2>(d, second, third), dst + 4 * n);
    access.store(d, firstLanesOf<n / 4>(d, third, fourth), dst + 8 * n);
}

#endif
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
