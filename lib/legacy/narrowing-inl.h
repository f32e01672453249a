// Whole vectors of wide lanes made one of narrow lanes.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_NARROWING_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_NARROWING_INL_H
#undef QUILLON_NARROWING_INL_H
#else
#define QUILLON_NARROWING_INL_H
#endif

#include "hwy/highway.h"

#include "legacy/kernels-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {

// The pieces of 8 bytes of the first half of a vector of kWords words in the lower
// halves of its blocks, and those of the second in the upper ones.
template <size_t kWords>
struct Dealt {
    alignas(64) uint32_t words[kWords] = {};
    constexpr Dealt() {
        for (size_t i = 0; i < kWords; ++i) {
            const size_t block = i / 4, half = i / 2 % 2;
            words[i] = static_cast<uint32_t>(half * kWords / 2 + block * 2 + i % 2);
        }
    }
};
template <size_t kWords>
inline constexpr Dealt<kWords> kDealt;

#if HWY_ARCH_X86 && HWY_TARGET != HWY_SCALAR && HWY_TARGET != HWY_EMU128

namespace detail {

HWY_INLINE __m128i weighed(__m128i v, __m128i bytes, __m128i pairs) {
    return _mm_madd_epi16(_mm_maddubs_epi16(v, bytes), pairs);
}
#if HWY_TARGET <= HWY_AVX2
HWY_INLINE __m256i weighed(__m256i v, __m256i bytes, __m256i pairs) {
    return _mm256_madd_epi16(_mm256_maddubs_epi16(v, bytes), pairs);
}
#endif
#if HWY_TARGET <= HWY_AVX3
HWY_INLINE __m512i weighed(__m512i v, __m512i bytes, __m512i pairs) {
    return _mm512_madd_epi16(_mm512_maddubs_epi16(v, bytes), pairs);
}
#endif

} // namespace detail

// The weighted sum of the bytes of each word: bytes holds what each one counts in a
// sum of two, which has to stay below 32768, and pairs what each of those counts.
// The highest byte is zero.
template <class D>
HWY_INLINE hn::Vec<D> weighed(D d, hn::Vec<D> v, uint32_t bytes, uint32_t pairs) {
    return hn::Vec<D>{detail::weighed(v.raw, hn::Set(d, bytes).raw, hn::Set(d, pairs).raw)};
}

#else

template <class D>
HWY_INLINE hn::Vec<D> weighed(D d, hn::Vec<D> v, uint32_t bytes, uint32_t pairs) {
    const uint32_t lower = pairs & 0xFFFF, upper = pairs >> 16;
    const auto byte = hn::Set(d, 0xFF);
    const auto first = hn::Mul(hn::And(v, byte), hn::Set(d, (bytes & 0xFF) * lower));
    const auto second =
        hn::Mul(hn::And(hn::ShiftRight<8>(v), byte), hn::Set(d, (bytes >> 8 & 0xFF) * lower));
    const auto third = hn::Mul(hn::ShiftRight<16>(v), hn::Set(d, (bytes >> 16) * upper));
    return hn::Add(hn::Add(first, second), third);
}

#endif

#if HWY_TARGET == HWY_AVX2 || HWY_TARGET == HWY_AVX3

namespace detail {

HWY_INLINE __m128i packWords(__m128i a, __m128i b) {
    return _mm_packus_epi32(a, b);
}
HWY_INLINE __m256i packWords(__m256i a, __m256i b) {
    return _mm256_packus_epi32(a, b);
}
HWY_INLINE __m128i packHalves(__m128i a, __m128i b) {
    return _mm_packus_epi16(a, b);
}
HWY_INLINE __m256i packHalves(__m256i a, __m256i b) {
    return _mm256_packus_epi16(a, b);
}
#if HWY_TARGET == HWY_AVX3
HWY_INLINE __m512i packWords(__m512i a, __m512i b) {
    return _mm512_packus_epi32(a, b);
}
HWY_INLINE __m512i packHalves(__m512i a, __m512i b) {
    return _mm512_packus_epi16(a, b);
}
#endif

// Packing works on blocks of 16 bytes and takes a piece of each vector in turn.
// These words, of a vector of kWords, put the pieces of the first vector first.
template <size_t kWords, size_t kVectors>
struct Sorted {
    alignas(64) uint32_t words[kWords] = {};
    constexpr Sorted() {
        constexpr size_t kPiece = 4 / kVectors, kBlocks = kWords / 4;
        for (size_t i = 0; i < kWords; ++i) {
            const size_t piece = i / kPiece;
            const size_t from = piece % kBlocks * kVectors + piece / kBlocks;
            words[i] = static_cast<uint32_t>(from * kPiece + i % kPiece);
        }
    }
};
template <size_t kWords, size_t kVectors>
inline constexpr Sorted<kWords, kVectors> kSorted;

template <size_t kVectors, class D>
HWY_INLINE hn::Vec<D> sorted(D d, hn::Vec<D> packed) {
    const hn::Repartition<uint32_t, D> d32;
    constexpr size_t n = kLanes<decltype(d32)>;
    if constexpr (n == 4)
        return packed;
    else
        return hn::BitCast(
            d, hn::TableLookupLanes(hn::BitCast(d32, packed),
                                    hn::SetTableIndices(d32, kSorted<n, kVectors>.words)));
}

} // namespace detail

// Lanes of 32 bits, of values that fit, to 16.
template <class D16, class V>
HWY_INLINE hn::Vec<D16> packed16(D16 d16, V a, V b) {
    return detail::sorted<2>(d16, hn::Vec<D16>{detail::packWords(a.raw, b.raw)});
}

// Lanes of 16 bits, of values that fit, to 8.
template <class D8, class V>
HWY_INLINE hn::Vec<D8> packed8(D8 d8, V a, V b) {
    return detail::sorted<2>(d8, hn::Vec<D8>{detail::packHalves(a.raw, b.raw)});
}

// Lanes of 32 bits, of values that fit, to 8.
template <class D8, class V>
HWY_INLINE hn::Vec<D8> packed8(D8 d8, const V (&v)[4]) {
    const auto halves = detail::packHalves(detail::packWords(v[0].raw, v[1].raw),
                                           detail::packWords(v[2].raw, v[3].raw));
    return detail::sorted<4>(d8, hn::Vec<D8>{halves});
}

#elif HWY_TARGET != HWY_SCALAR

template <class D, class V>
HWY_INLINE hn::Vec<D> packed(D d, V a, V b) {
    const hn::Half<D> half;
    return hn::Combine(d, hn::TruncateTo(half, b), hn::TruncateTo(half, a));
}
template <class D16, class V>
HWY_INLINE hn::Vec<D16> packed16(D16 d16, V a, V b) {
    return packed(d16, a, b);
}
template <class D8, class V>
HWY_INLINE hn::Vec<D8> packed8(D8 d8, V a, V b) {
    return packed(d8, a, b);
}
template <class D8, class V>
HWY_INLINE hn::Vec<D8> packed8(D8 d8, const V (&v)[4]) {
    const hn::Repartition<uint16_t, D8> d16;
    return packed(d8, packed(d16, v[0], v[1]), packed(d16, v[2], v[3]));
}

#endif

#if HWY_TARGET != HWY_SCALAR

// Lanes of 16 bits in the order that interleaving, which works on blocks of 16
// bytes, makes consecutive.
template <class D16>
HWY_INLINE hn::Vec<D16> loadDealt(D16 d16, const uint8_t *src) {
    const auto v = hn::LoadU(d16, reinterpret_cast<const uint16_t *>(src));
    const hn::Repartition<uint32_t, D16> d32;
    constexpr size_t n = kLanes<decltype(d32)>;
    if constexpr (n <= 4)
        return v;
    else
        return hn::BitCast(d16, hn::TableLookupLanes(hn::BitCast(d32, v),
                                                     hn::SetTableIndices(d32, kDealt<n>.words)));
}

// Two vectors of words from their dealt halves.
template <class D, class V>
HWY_INLINE void interleave(D d, V low, V high, hn::Vec<D> &first, hn::Vec<D> &second) {
    const hn::Repartition<uint16_t, D> d16;
    first = hn::BitCast(d, hn::InterleaveLower(d16, low, high));
    second = hn::BitCast(d, hn::InterleaveUpper(d16, low, high));
}

#endif

} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
