// Vectors of wide lanes narrowed to one of narrow lanes, and the widening of 16-bit
// lanes in pairs.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_SIMD_NARROW_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_SIMD_NARROW_INL_H
#undef QUILLON_SIMD_NARROW_INL_H
#else
#define QUILLON_SIMD_NARROW_INL_H
#endif

#include "hwy/highway.h"

#include "simd/access-inl.h"
#include "simd/target-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
#if QUILLON_HAS_VECTORS

// ---- Narrowing ------------------------------------------------------------

// Signed 16-bit lanes to signed bytes, saturated.  Each block has the lanes of
// first's block and then those of second's.
template <class D8, class D16 = hn::Repartition<int16_t, D8>>
HWY_INLINE hn::Vec<D8> narrowSaturated([[maybe_unused]] D8 d8, hn::Vec<D16> first,
                                       hn::Vec<D16> second) {
#if QUILLON_X86_SSSE3
    if constexpr (kBytesOf<D8> == 64)
        return hn::Vec<D8>{_mm512_packs_epi16(first.raw, second.raw)};
    else if constexpr (kBytesOf<D8> == 32)
        return hn::Vec<D8>{_mm256_packs_epi16(first.raw, second.raw)};
    else
        return hn::Vec<D8>{_mm_packs_epi16(first.raw, second.raw)};
#else
    if constexpr (kBytesOf<D8> <= 16) {
        const hn::RebindToSigned<D8> signed8;
        const hn::Half<decltype(signed8)> half;
        return hn::BitCast(
            d8, hn::Combine(signed8, hn::DemoteTo(half, second), hn::DemoteTo(half, first)));
    } else {
        HWY_ALIGN static constexpr uint8_t kToLower[16] = {
            0, 2, 4, 6, 8, 10, 12, 14, 0x80, 0x80, 0x80, 0x80, 0x80, 0x80, 0x80, 0x80};
        HWY_ALIGN static constexpr uint8_t kToUpper[16] = {
            0x80, 0x80, 0x80, 0x80, 0x80, 0x80, 0x80, 0x80, 0, 2, 4, 6, 8, 10, 12, 14};
        const D16 d16;
        const auto saturated = [&](hn::Vec<D16> v) HWY_ATTR {
            return hn::BitCast(d8, hn::Min(hn::Max(v, hn::Set(d16, -128)), hn::Set(d16, 127)));
        };
        return hn::Or(hn::TableLookupBytesOr0(saturated(first), hn::LoadDup128(d8, kToLower)),
                      hn::TableLookupBytesOr0(saturated(second), hn::LoadDup128(d8, kToUpper)));
    }
#endif
}

// The same of lanes shifted to the right.
template <int kDistance, class D8, class D16 = hn::Repartition<int16_t, D8>>
HWY_INLINE hn::Vec<D8> shiftAndNarrowSaturated(D8 d8, hn::Vec<D16> first, hn::Vec<D16> second) {
#if QUILLON_NEON
    if constexpr (kLanes<D8> == 16) {
        const auto lower = vqshrn_n_s16(first.raw, kDistance);
        const hn::Vec<hn::RebindToSigned<D8>> all{vqshrn_high_n_s16(lower, second.raw, kDistance)};
        return hn::BitCast(d8, all);
    }
#endif
    return narrowSaturated(d8, hn::ShiftRight<kDistance>(first), hn::ShiftRight<kDistance>(second));
}

#if QUILLON_X86_AVX2

namespace detail {

// The lanes of a block of a, then those of the same block of b, with unsigned saturation:
// 32-bit lanes to 16 bits, and 16-bit lanes to 8.
template <class D16, class V>
HWY_INLINE hn::Vec<D16> pack32(D16 /*d16*/, V a, V b) {
    if constexpr (kBytesOf<D16> == 64)
        return hn::Vec<D16>{_mm512_packus_epi32(a.raw, b.raw)};
    else if constexpr (kBytesOf<D16> == 32)
        return hn::Vec<D16>{_mm256_packus_epi32(a.raw, b.raw)};
    else
        return hn::Vec<D16>{_mm_packus_epi32(a.raw, b.raw)};
}
template <class D8, class V>
HWY_INLINE hn::Vec<D8> pack16(D8 /*d8*/, V a, V b) {
    if constexpr (kBytesOf<D8> == 64)
        return hn::Vec<D8>{_mm512_packus_epi16(a.raw, b.raw)};
    else if constexpr (kBytesOf<D8> == 32)
        return hn::Vec<D8>{_mm256_packus_epi16(a.raw, b.raw)};
    else
        return hn::Vec<D8>{_mm_packus_epi16(a.raw, b.raw)};
}

// Packing takes a piece of each vector in turn within a block.  These 32-bit
// indices bring the pieces of the first vector in front.
template <size_t kWords, size_t kVectors>
struct PackedOrder {
    alignas(64) uint32_t words[kWords] = {};
    constexpr PackedOrder() {
        constexpr size_t kPiece = 4 / kVectors, kBlocks = kWords / 4;
        for (size_t i = 0; i < kWords; ++i) {
            const size_t piece = i / kPiece;
            const size_t from = piece % kBlocks * kVectors + piece / kBlocks;
            words[i] = static_cast<uint32_t>(from * kPiece + i % kPiece);
        }
    }
};
template <size_t kWords, size_t kVectors>
inline constexpr PackedOrder<kWords, kVectors> kPackedOrder;

template <size_t kVectors, class D>
HWY_INLINE hn::Vec<D> inPackedOrder(D d, hn::Vec<D> packed) {
    const hn::Repartition<uint32_t, D> d32;
    constexpr size_t n = kLanes<decltype(d32)>;
    if constexpr (n == 4)
        return packed;
    else
        return hn::BitCast(
            d, hn::TableLookupLanes(hn::BitCast(d32, packed),
                                    hn::SetTableIndices(d32, kPackedOrder<n, kVectors>.words)));
}

} // namespace detail

// Two vectors of 32-bit lanes, of values that fit, to 16 bits.
template <class D16, class V>
HWY_INLINE hn::Vec<D16> narrowTo16(D16 d16, V a, V b) {
    return detail::inPackedOrder<2>(d16, detail::pack32(d16, a, b));
}

// Two vectors of 16-bit lanes, of values that fit, to 8 bits.
template <class D8, class V>
HWY_INLINE hn::Vec<D8> narrowTo8(D8 d8, V a, V b) {
    return detail::inPackedOrder<2>(d8, detail::pack16(d8, a, b));
}

// Four vectors of 32-bit lanes, of values that fit, to 8 bits.
template <class D8, class V>
HWY_INLINE hn::Vec<D8> narrowTo8(D8 d8, const V (&v)[4]) {
    const hn::Repartition<uint16_t, D8> d16;
    const auto low = detail::pack32(d16, v[0], v[1]), high = detail::pack32(d16, v[2], v[3]);
    return detail::inPackedOrder<4>(d8, detail::pack16(d8, low, high));
}

#else

template <class D, class V>
HWY_INLINE hn::Vec<D> narrowPair(D d, V a, V b) {
    const hn::Half<D> half;
    return hn::Combine(d, hn::TruncateTo(half, b), hn::TruncateTo(half, a));
}
template <class D16, class V>
HWY_INLINE hn::Vec<D16> narrowTo16(D16 d16, V a, V b) {
    return narrowPair(d16, a, b);
}
template <class D8, class V>
HWY_INLINE hn::Vec<D8> narrowTo8(D8 d8, V a, V b) {
    return narrowPair(d8, a, b);
}
template <class D8, class V>
HWY_INLINE hn::Vec<D8> narrowTo8(D8 d8, const V (&v)[4]) {
    const hn::Repartition<uint16_t, D8> d16;
    return narrowPair(d8, narrowPair(d16, v[0], v[1]), narrowPair(d16, v[2], v[3]));
}

#endif

// One vector of wider lanes, of values that fit, to a shorter vector of 8 or 16 bits.
// Not by hn::TruncateTo where there is an instruction: Highway 1.0.3 gets some sizes
// of AVX3_DL wrong.
template <class DNarrow, class D>
HWY_INLINE hn::Vec<DNarrow> narrowOne(DNarrow narrow, D /*d*/, hn::Vec<D> v) {
#if QUILLON_X86_AVX512
    constexpr size_t kFrom = sizeof(hn::TFromD<D>), kTo = sizeof(hn::TFromD<DNarrow>);
    if constexpr (kBytesOf<D> == 64 && kFrom == 4 && kTo == 1)
        return hn::Vec<DNarrow>{_mm512_cvtepi32_epi8(v.raw)};
    else if constexpr (kBytesOf<D> == 64 && kFrom == 2 && kTo == 1)
        return hn::Vec<DNarrow>{_mm512_cvtepi16_epi8(v.raw)};
    else if constexpr (kBytesOf<D> == 32 && kFrom == 4 && kTo == 1)
        return hn::Vec<DNarrow>{_mm256_cvtepi32_epi8(v.raw)};
    else if constexpr (kBytesOf<D> == 32 && kFrom == 4 && kTo == 2)
        return hn::Vec<DNarrow>{_mm256_cvtepi32_epi16(v.raw)};
    else if constexpr (kBytesOf<D> == 32 && kFrom == 2 && kTo == 1)
        return hn::Vec<DNarrow>{_mm256_cvtepi16_epi8(v.raw)};
    else
#endif
        return hn::TruncateTo(narrow, v);
}

// ---- Widening -------------------------------------------------------------

// 32-bit indices that put the 8-byte pieces of a vector's first half in the lower
// halves of its blocks, and those of its second half in the upper ones.
template <size_t kWords>
struct WideningOrder {
    alignas(64) uint32_t words[kWords] = {};
    constexpr WideningOrder() {
        for (size_t i = 0; i < kWords; ++i) {
            const size_t block = i / 4, half = i / 2 % 2;
            words[i] = static_cast<uint32_t>(half * kWords / 2 + block * 2 + i % 2);
        }
    }
};
template <size_t kWords>
inline constexpr WideningOrder<kWords> kWideningOrder;

// 16-bit lanes in the order that interleaving within blocks makes consecutive.
template <class D16>
HWY_INLINE hn::Vec<D16> loadForInterleave(D16 d16, const uint8_t *src) {
    const auto v = loadBytes(d16, src);
    const hn::Repartition<uint32_t, D16> d32;
    constexpr size_t n = kLanes<decltype(d32)>;
    if constexpr (n <= 4)
        return v;
    else
        return hn::BitCast(d16,
                           hn::TableLookupLanes(hn::BitCast(d32, v),
                                                hn::SetTableIndices(d32, kWideningOrder<n>.words)));
}

// Two vectors of 32-bit lanes from their halves, which are in that order.
template <class D, class V>
HWY_INLINE void interleaveHalves(D d, V low, V high, hn::Vec<D> &first, hn::Vec<D> &second) {
    const hn::Repartition<uint16_t, D> d16;
    first = hn::BitCast(d, hn::InterleaveLower(d16, low, high));
    second = hn::BitCast(d, hn::InterleaveUpper(d16, low, high));
}

#endif
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
