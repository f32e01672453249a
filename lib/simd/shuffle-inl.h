// Lookups in registers and in memory, and even and odd lanes.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_SIMD_SHUFFLE_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_SIMD_SHUFFLE_INL_H
#undef QUILLON_SIMD_SHUFFLE_INL_H
#else
#define QUILLON_SIMD_SHUFFLE_INL_H
#endif

#include "hwy/highway.h"

#include "simd/target-inl.h"

#include <cstring>

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
#if QUILLON_HAS_VECTORS

// 32-bit lanes by their index in two vectors that lie end to end.  Only the low
// bits of an index count.
template <class D>
HWY_INLINE hn::Vec<D> lookupInTwo(D d, hn::Vec<D> low, hn::Vec<D> high, hn::Vec<D> index) {
    constexpr auto n = static_cast<uint32_t>(kLanes<D>);
#if QUILLON_X86_AVX512
    if constexpr (n == 16)
        return {_mm512_permutex2var_epi32(low.raw, index.raw, high.raw)};
    else if constexpr (n == 8)
        return {_mm256_permutex2var_epi32(low.raw, index.raw, high.raw)};
    else if constexpr (n == 4)
        return {_mm_permutex2var_epi32(low.raw, index.raw, high.raw)};
#elif QUILLON_X86_AVX2
    if constexpr (n == 8) {
        // By the sign bit.
        const auto isHigh = _mm256_castsi256_ps(_mm256_slli_epi32(index.raw, 28));
        const auto a = _mm256_castsi256_ps(_mm256_permutevar8x32_epi32(low.raw, index.raw));
        const auto b = _mm256_castsi256_ps(_mm256_permutevar8x32_epi32(high.raw, index.raw));
        return {_mm256_castps_si256(_mm256_blendv_ps(a, b, isHigh))};
    }
#endif
    const auto lane = hn::IndicesFromVec(d, hn::And(index, hn::Set(d, n - 1)));
    const auto isLow = hn::Eq(hn::And(index, hn::Set(d, n)), hn::Zero(d));
    return hn::IfThenElse(isLow, hn::TableLookupLanes(low, lane), hn::TableLookupLanes(high, lane));
}

// The lanes with even places, or with odd ones, of two vectors that lie end to end.
// Their order is any, the same for both, and laneOrderRestored makes it that of
// memory: where blocks are expensive to cross, one crossing then serves for all
// that is computed from such vectors.
#if QUILLON_X86_AVX2 && !QUILLON_X86_AVX512
namespace detail {
template <int kLanesOfBlock>
HWY_INLINE __m256i selectInBlocks(__m256i low, __m256i high) {
    return _mm256_castps_si256(
        _mm256_shuffle_ps(_mm256_castsi256_ps(low), _mm256_castsi256_ps(high), kLanesOfBlock));
}
} // namespace detail
#endif

template <class D>
HWY_INLINE hn::Vec<D> evenLanesUnordered(D d, hn::Vec<D> low, hn::Vec<D> high) {
    static_assert(sizeof(hn::TFromD<D>) == 4 && kLanes<D> > 1);
#if QUILLON_X86_AVX2 && !QUILLON_X86_AVX512
    if constexpr (kLanes<D> == 8)
        return hn::Vec<D>{detail::selectInBlocks<0x88>(low.raw, high.raw)};
#endif
    return hn::ConcatEven(d, high, low);
}
template <class D>
HWY_INLINE hn::Vec<D> oddLanesUnordered(D d, hn::Vec<D> low, hn::Vec<D> high) {
    static_assert(sizeof(hn::TFromD<D>) == 4 && kLanes<D> > 1);
#if QUILLON_X86_AVX2 && !QUILLON_X86_AVX512
    if constexpr (kLanes<D> == 8)
        return hn::Vec<D>{detail::selectInBlocks<0xDD>(low.raw, high.raw)};
#endif
    return hn::ConcatOdd(d, high, low);
}
template <class D>
HWY_INLINE hn::Vec<D> laneOrderRestored(D /*d*/, hn::Vec<D> v) {
#if QUILLON_X86_AVX2 && !QUILLON_X86_AVX512
    if constexpr (kLanes<D> == 8)
        return hn::Vec<D>{_mm256_permute4x64_epi64(v.raw, 0xD8)};
#endif
    return v;
}

// Words that lie kBytes apart, loaded one by one.  To copy words with this takes 0.6 to 0.9
// of the time of copies one by one, with AVX2.
template <size_t kBytes, class D>
HWY_INLINE hn::Vec<D> loadApart(D d, const uint8_t *from) {
    uint32_t words[kLanes<D>];
    for (size_t lane = 0; lane < kLanes<D>; ++lane)
        std::memcpy(&words[lane], from + lane * kBytes, sizeof(uint32_t));
#if QUILLON_X86_SSSE3
    if constexpr (kLanes<D> == 4)
        return {_mm_setr_epi32(static_cast<int>(words[0]), static_cast<int>(words[1]),
                               static_cast<int>(words[2]), static_cast<int>(words[3]))};
#endif
    return hn::LoadU(d, words);
}

// table[index] of each lane, four or more; no index is negative.
//
// A gather keeps what its register held in the lanes that are masked out, so that
// it waits for that even where there are none.  A compiler that sees that there
// are none leaves any register, at worst the last result; hence a mask that is
// computed.
template <class D, class Index>
HWY_INLINE hn::Vec<D> gather(D d, const uint32_t *table, Index index) {
    static_assert(kLanes<D> >= 4, "shorter gathers would look up lanes that are not there");
#if QUILLON_X86_AVX512
    if constexpr (kLanes<D> == 16) {
        const __m512i zero = _mm512_setzero_si512();
        const __mmask16 all = _mm512_cmpge_epi32_mask(index.raw, zero);
        return hn::Vec<D>{_mm512_mask_i32gather_epi32(zero, all, index.raw, table, 4)};
    }
#elif QUILLON_X86_AVX2
    if constexpr (kLanes<D> == 8)
        return hn::Vec<D>{_mm256_mask_i32gather_epi32(_mm256_setzero_si256(),
                                                      reinterpret_cast<const int *>(table),
                                                      index.raw, hn::Not(index).raw, 4)};
#endif
    return hn::GatherIndex(d, table, index);
}

#endif
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
