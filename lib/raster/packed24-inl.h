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

#include "raster/kernels-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {

// Within each 16 bytes: three bytes a pixel to four, and back.
HWY_ALIGN constexpr uint8_t kSpreadBytes[16] = {0, 1, 2, 0x80, 3, 4,  5,  0x80,
                                                6, 7, 8, 0x80, 9, 10, 11, 0x80};
HWY_ALIGN constexpr uint8_t kPackBytes[16] = {0,  1,  2,  4,  5,    6,    8,    9,
                                              10, 12, 13, 14, 0x80, 0x80, 0x80, 0x80};
// Across groups of 16 bytes: three words a group to four, and back.  The words
// behind the packed ones are not used, but have to be words of the vector.
HWY_ALIGN constexpr uint32_t kSpreadWords[16] = {0, 1, 2, 2, 3, 4, 5, 5, 6, 7, 8, 8, 9, 10, 11, 11};
template <size_t kWords>
HWY_ALIGN constexpr uint32_t kPackWords[kWords] = {0,  1,  2,  4,  5, 6, 8,  9,
                                                   10, 12, 13, 14, 3, 7, 11, 15};
template <>
HWY_ALIGN inline constexpr uint32_t kPackWords<8>[8] = {0, 1, 2, 4, 5, 6, 3, 7};

// Exactly three bytes a pixel are read: half a vector, and a quarter.
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
        const hn::Half<decltype(half)> quarter;
        const auto rest = hn::ZeroExtendVector(half, hn::LoadU(quarter, src + 2 * n));
        auto v = hn::BitCast(d, hn::Combine(d8, rest, hn::LoadU(half, src)));
        if constexpr (n > 4)
            v = hn::TableLookupLanes(v, hn::SetTableIndices(d, kSpreadWords));
        return hn::BitCast(
            d, hn::TableLookupBytesOr0(hn::BitCast(d8, v), hn::LoadDup128(d8, kSpreadBytes)));
#endif
    }
}

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
        auto bytes = hn::TableLookupBytesOr0(hn::BitCast(d8, v), hn::LoadDup128(d8, kPackBytes));
        if constexpr (n > 4)
            bytes = hn::BitCast(d8, hn::TableLookupLanes(hn::BitCast(d, bytes),
                                                         hn::SetTableIndices(d, kPackWords<n>)));
        hn::StoreU(hn::LowerHalf(half, bytes), half, dst);
        hn::StoreU(hn::LowerHalf(quarter, hn::UpperHalf(half, bytes)), quarter, dst + 2 * n);
#endif
    }
}

} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
