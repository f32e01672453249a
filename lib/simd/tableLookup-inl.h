// Lookups in tables of 256 entries that stay in vectors.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_SIMD_TABLE_LOOKUP_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_SIMD_TABLE_LOOKUP_INL_H
#undef QUILLON_SIMD_TABLE_LOOKUP_INL_H
#else
#define QUILLON_SIMD_TABLE_LOOKUP_INL_H
#endif

#include "hwy/highway.h"

#include "simd/target-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {

// A table of 256 entries of 1 or 2 bytes.  lookUp reads kUnits indices and writes their
// entries.
template <size_t kEntryBytes>
class LookupTable;

#if QUILLON_X86_AVX512

template <>
class LookupTable<1> {
public:
    static constexpr size_t kUnits = 64;

    HWY_INLINE explicit LookupTable(const uint8_t *entries) {
        for (size_t i = 0; i < 4; ++i)
            pairs_[i] = _mm512_loadu_si512(entries + 64 * i);
    }

    // In lanes of words, which have two indices each and look up pairs of entries.
    template <class C, class Access>
    HWY_INLINE void lookUp(C /*chunk*/, const uint8_t *from, uint8_t *to, Access access) const {
        const Widest<uint8_t> d;
        const __m512i index = access.load(d, from).raw;
        const __m512i evens = pairsAt(_mm512_srli_epi16(index, 1),
                                      _mm512_test_epi16_mask(index, _mm512_set1_epi16(0x80)));
        const __m512i odds = pairsAt(_mm512_srli_epi16(index, 9), _mm512_movepi16_mask(index));
        const __mmask32 isSecond = _mm512_test_epi16_mask(index, _mm512_set1_epi16(0x01));
        const __mmask32 isFirst = _mm512_testn_epi16_mask(index, _mm512_set1_epi16(0x100));
        const __m512i even = _mm512_mask_srli_epi16(evens, isSecond, evens, 8);
        const __m512i odd = _mm512_mask_slli_epi16(odds, isFirst, odds, 8);
        constexpr __mmask64 kOddBytes = 0xAAAAAAAAAAAAAAAA;
        access.store(d, {_mm512_mask_blend_epi8(kOddBytes, even, odd)}, to);
    }

private:
    __m512i pairs_[4];

    HWY_INLINE __m512i pairsAt(__m512i index, __mmask32 isHigh) const {
        const __m512i low = _mm512_permutex2var_epi16(pairs_[0], index, pairs_[1]);
        const __m512i high = _mm512_permutex2var_epi16(pairs_[2], index, pairs_[3]);
        return _mm512_mask_blend_epi16(isHigh, low, high);
    }
};

template <>
class LookupTable<2> {
public:
    static constexpr size_t kUnits = 32;

    HWY_INLINE explicit LookupTable(const uint8_t *entries) {
        for (size_t i = 0; i < 8; ++i)
            words_[i] = _mm512_loadu_si512(entries + 64 * i);
    }

    template <class C, class Access>
    HWY_INLINE void lookUp(C /*chunk*/, const uint8_t *from, uint8_t *to, Access access) const {
        const hn::Half<Widest<uint8_t>> d8;
        const Widest<uint16_t> d16;
        const __m512i index = _mm512_cvtepu8_epi16(access.load(d8, from).raw);
        const __mmask32 isOdd = _mm512_test_epi16_mask(index, _mm512_set1_epi16(0x40));
        const __mmask32 isHigh = _mm512_test_epi16_mask(index, _mm512_set1_epi16(0x80));
        const __m512i low = _mm512_mask_blend_epi16(isOdd, quarter<0>(index), quarter<1>(index));
        const __m512i high = _mm512_mask_blend_epi16(isOdd, quarter<2>(index), quarter<3>(index));
        access.store(d16, {_mm512_mask_blend_epi16(isHigh, low, high)}, to);
    }

private:
    __m512i words_[8];

    template <size_t kQuarter>
    HWY_INLINE __m512i quarter(__m512i index) const {
        return _mm512_permutex2var_epi16(words_[2 * kQuarter], index, words_[2 * kQuarter + 1]);
    }
};

#elif QUILLON_NEON

// Of one quarter of a table of bytes, from the first one on.  An index beyond it leaves
// what the quarters before have found.
template <size_t kQuarter = 0, size_t kVectors>
HWY_INLINE void lookUpBytes(const uint8_t *table, uint8x16_t (&index)[kVectors],
                            uint8x16_t (&found)[kVectors]) {
    const uint8x16x4_t entries = vld1q_u8_x4(table + 64 * kQuarter);
    for (size_t v = 0; v < kVectors; ++v) {
        found[v] =
            kQuarter == 0 ? vqtbl4q_u8(entries, index[v]) : vqtbx4q_u8(found[v], entries, index[v]);
        index[v] = vsubq_u8(index[v], vdupq_n_u8(64));
    }
    if constexpr (kQuarter < 3)
        lookUpBytes<kQuarter + 1>(table, index, found);
}

template <>
class LookupTable<1> {
public:
    static constexpr size_t kUnits = 64;

    explicit LookupTable(const uint8_t *entries) : bytes_(entries) {}

    template <class C, class Access>
    HWY_INLINE void lookUp(C /*chunk*/, const uint8_t *from, uint8_t *to, Access /*access*/) const {
        uint8x16_t index[4], found[4];
        for (size_t v = 0; v < 4; ++v)
            index[v] = vld1q_u8(from + 16 * v);
        lookUpBytes(bytes_, index, found);
        for (size_t v = 0; v < 4; ++v)
            vst1q_u8(to + 16 * v, found[v]);
    }

private:
    const uint8_t *bytes_;
};

template <>
class LookupTable<2> {
public:
    static constexpr size_t kUnits = 64;

    explicit LookupTable(const uint8_t *entries) {
        for (size_t i = 0; i < 256; i += 16) {
            const uint8x16x2_t split = vld2q_u8(entries + 2 * i);
            vst1q_u8(low_ + i, split.val[0]);
            vst1q_u8(high_ + i, split.val[1]);
        }
    }

    template <class C, class Access>
    HWY_INLINE void lookUp(C /*chunk*/, const uint8_t *from, uint8_t *to, Access /*access*/) const {
        uint8x16_t index[4], lowFound[4], highFound[4];
        for (size_t v = 0; v < 4; ++v)
            index[v] = vld1q_u8(from + 16 * v);
        lookUpBytes(low_, index, lowFound);
        // Not both at once, for which there are not enough registers.
        asm volatile("" ::: "memory");
        lookUpBytes(high_, index, highFound);
        for (size_t v = 0; v < 4; ++v) {
            vst1q_u8(to + 32 * v, vzip1q_u8(lowFound[v], highFound[v]));
            vst1q_u8(to + 32 * v + 16, vzip2q_u8(lowFound[v], highFound[v]));
        }
    }

private:
    HWY_ALIGN uint8_t low_[256], high_[256];
};

#endif
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
