// Bit fields of bytes put together.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_SIMD_BIT_INSERT_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_SIMD_BIT_INSERT_INL_H
#undef QUILLON_SIMD_BIT_INSERT_INL_H
#else
#define QUILLON_SIMD_BIT_INSERT_INL_H
#endif

#include "hwy/highway.h"

#include "simd/target-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
#if QUILLON_HAS_VECTORS

// Of each byte the upper kCount bits of upper, 0 to 8, and below them the upper bits of
// lower.
template <int kCount, class D8>
HWY_INLINE hn::Vec<D8> insertBelow([[maybe_unused]] D8 d, hn::Vec<D8> upper,
                                   [[maybe_unused]] hn::Vec<D8> lower) {
    if constexpr (kCount == 0) {
        return lower;
    } else if constexpr (kCount == 8) {
        return upper;
    } else {
#if QUILLON_NEON
        if constexpr (kLanes<D8> == 16)
            return hn::Vec<D8>{vsriq_n_u8(upper.raw, lower.raw, kCount)};
#endif
        const auto mask = hn::Set(d, static_cast<uint8_t>(0xFF << (8 - kCount)));
        return hn::Or(hn::And(upper, mask), hn::ShiftRight<kCount>(lower));
    }
}

#endif
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
