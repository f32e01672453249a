// Products of bytes, and their sums.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_SIMD_PRODUCTS_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_SIMD_PRODUCTS_INL_H
#undef QUILLON_SIMD_PRODUCTS_INL_H
#else
#define QUILLON_SIMD_PRODUCTS_INL_H
#endif

#include "hwy/highway.h"

#include "simd/target-inl.h"

#include <type_traits>

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
#if QUILLON_HAS_VECTORS

#if QUILLON_X86_SSSE3

namespace detail {

// Unsigned bytes of a by signed bytes of b, the products of each 16-bit lane added with
// signed saturation.
template <class D16, class A, class B>
HWY_INLINE hn::Vec<D16> multiplyBytes(D16 /*d16*/, A a, B b) {
    if constexpr (kBytesOf<D16> == 64)
        return hn::Vec<D16>{_mm512_maddubs_epi16(a.raw, b.raw)};
    else if constexpr (kBytesOf<D16> == 32)
        return hn::Vec<D16>{_mm256_maddubs_epi16(a.raw, b.raw)};
    else
        return hn::Vec<D16>{_mm_maddubs_epi16(a.raw, b.raw)};
}

// The products of signed 16-bit lanes added in each 32-bit lane.
template <class D, class A, class B>
HWY_INLINE hn::Vec<D> addPairs(D /*d*/, A a, B b) {
    if constexpr (kBytesOf<D> == 64)
        return hn::Vec<D>{_mm512_madd_epi16(a.raw, b.raw)};
    else if constexpr (kBytesOf<D> == 32)
        return hn::Vec<D>{_mm256_madd_epi16(a.raw, b.raw)};
    else
        return hn::Vec<D>{_mm_madd_epi16(a.raw, b.raw)};
}

} // namespace detail

#endif

// Of each 32-bit lane the sum of its lower three bytes, each by two factors: its
// own byte in bytes, and the half of pairs that the sum of two bytes is multiplied
// by.  Sums of two bytes stay below 32768.  The highest byte is zero.
template <class D>
HWY_INLINE hn::Vec<D> weightedByteSum(D d, hn::Vec<D> v, uint32_t bytes, uint32_t pairs) {
#if QUILLON_X86_SSSE3
    const hn::Repartition<int16_t, D> d16;
    const auto sums = detail::multiplyBytes(d16, v, hn::Set(d, bytes));
    return detail::addPairs(d, sums, hn::Set(d, pairs));
#else
    const uint32_t lower = pairs & 0xFFFF, upper = pairs >> 16;
    const auto byte = hn::Set(d, 0xFF);
    const auto first = hn::Mul(hn::And(v, byte), hn::Set(d, (bytes & 0xFF) * lower));
    const auto second =
        hn::Mul(hn::And(hn::ShiftRight<8>(v), byte), hn::Set(d, (bytes >> 8 & 0xFF) * lower));
    const auto third = hn::Mul(hn::ShiftRight<16>(v), hn::Set(d, (bytes >> 16) * upper));
    return hn::Add(hn::Add(first, second), third);
#endif
}

// Of each 16-bit lane the sum of its two signed bytes, each by the unsigned byte of factors
// at its place, which fits 16 bits.
template <class D16>
HWY_INLINE hn::Vec<D16> pairSum(D16 d, hn::Vec<D16> factors, hn::Vec<D16> v) {
#if QUILLON_X86_SSSE3
    return detail::multiplyBytes(d, factors, v);
#else
    const auto byte = hn::Set(d, 0xFF);
    const auto lower = hn::ShiftRight<8>(hn::ShiftLeft<8>(v));
    return hn::Add(hn::Mul(lower, hn::And(factors, byte)),
                   hn::Mul(hn::ShiftRight<8>(v), hn::And(hn::ShiftRight<8>(factors), byte)));
#endif
}

// The same by two factors.
template <uint8_t kLower, uint8_t kUpper, class D16>
HWY_INLINE hn::Vec<D16> weightedPairSum(D16 d, hn::Vec<D16> v) {
    return pairSum(d, hn::Set(d, static_cast<int16_t>(kUpper << 8 | kLower)), v);
}

// Vectors of lanes of twice the size: of the lower lanes of a vector and the upper ones.
template <class V>
struct Halves {
    V lower, upper;
};

template <class V>
HWY_INLINE Halves<V> addHalves(const Halves<V> &a, const Halves<V> &b) {
    return {hn::Add(a.lower, b.lower), hn::Add(a.upper, b.upper)};
}

// The products of bytes and a factor, all of which fit 16 bits.
template <class D8, class T16 = hwy::MakeWide<hn::TFromD<D8>>, class D16 = hn::Repartition<T16, D8>>
HWY_INLINE Halves<hn::Vec<D16>> multiplyWide(D8 /*d*/, hn::Vec<D8> v, int factor) {
#if QUILLON_NEON
    if constexpr (kLanes<D8> == 16 && std::is_signed_v<T16>) {
        if (factor <= 127) {
            const auto factors = vdupq_n_s8(static_cast<int8_t>(factor));
            return {hn::Vec<D16>{vmull_s8(vget_low_s8(v.raw), vget_low_s8(factors))},
                    hn::Vec<D16>{vmull_high_s8(v.raw, factors)}};
        }
    } else if constexpr (kLanes<D8> == 16) {
        const auto factors = vdupq_n_u8(static_cast<uint8_t>(factor));
        return {hn::Vec<D16>{vmull_u8(vget_low_u8(v.raw), vget_low_u8(factors))},
                hn::Vec<D16>{vmull_high_u8(v.raw, factors)}};
    }
#endif
    const D16 d16;
    const hn::Half<D8> half;
    const auto factors = hn::Set(d16, static_cast<T16>(factor));
    return {hn::Mul(hn::PromoteTo(d16, hn::LowerHalf(half, v)), factors),
            hn::Mul(hn::PromoteTo(d16, hn::UpperHalf(half, v)), factors)};
}

// (a + b) / 2 of bytes, truncated.
template <class D8>
HWY_INLINE hn::Vec<D8> averageDown(D8 /*d*/, hn::Vec<D8> a, hn::Vec<D8> b) {
#if QUILLON_NEON
    if constexpr (kLanes<D8> == 16)
        return hn::Vec<D8>{vhaddq_u8(a.raw, b.raw)};
#endif
    return hn::Not(hn::AverageRound(hn::Not(a), hn::Not(b)));
}

// (a * (255 - weight) + b * weight) / 256 of bytes, truncated.
template <class D8>
HWY_INLINE hn::Vec<D8> blendBytes([[maybe_unused]] D8 d, hn::Vec<D8> a, hn::Vec<D8> b,
                                  hn::Vec<D8> weight) {
    const auto rest = hn::Not(weight);
#if QUILLON_NEON
    if constexpr (kLanes<D8> == 16) {
        const auto lower = vmlal_u8(vmull_u8(vget_low_u8(a.raw), vget_low_u8(rest.raw)),
                                    vget_low_u8(b.raw), vget_low_u8(weight.raw));
        const auto upper = vmlal_high_u8(vmull_high_u8(a.raw, rest.raw), b.raw, weight.raw);
        return hn::Vec<D8>{vshrn_high_n_u16(vshrn_n_u16(lower, 8), upper, 8)};
    }
#endif
    const hn::Repartition<uint16_t, D8> d16;
    const auto even = [&](hn::Vec<D8> v)
                          HWY_ATTR { return hn::And(hn::BitCast(d16, v), hn::Set(d16, 0x00FF)); };
    const auto odd = [&](hn::Vec<D8> v) HWY_ATTR { return hn::ShiftRight<8>(hn::BitCast(d16, v)); };
    const auto evens = hn::Add(hn::Mul(even(a), even(rest)), hn::Mul(even(b), even(weight)));
    const auto odds = hn::Add(hn::Mul(odd(a), odd(rest)), hn::Mul(odd(b), odd(weight)));
    return hn::BitCast(d, hn::Or(hn::ShiftRight<8>(evens), hn::AndNot(hn::Set(d16, 0x00FF), odds)));
}

// x * y / 255 of bytes, truncated.
template <class D8>
HWY_INLINE hn::Vec<D8> multiplyDivideBy255([[maybe_unused]] D8 d, hn::Vec<D8> x, hn::Vec<D8> y) {
    // p / 255 is (p + p / 256 + 1) / 256 for all products (docs/numbers.md).
#if QUILLON_NEON
    if constexpr (kLanes<D8> == 16) {
        const auto low = vmull_u8(vget_low_u8(x.raw), vget_low_u8(y.raw));
        const auto high = vmull_high_u8(x.raw, y.raw), one = vdupq_n_u16(1);
        const auto lowBytes = vaddhn_u16(vsraq_n_u16(low, low, 8), one);
        return hn::Vec<D8>{vaddhn_high_u16(lowBytes, vsraq_n_u16(high, high, 8), one)};
    }
#endif
    const hn::Half<D8> half;
    const hn::Rebind<uint16_t, decltype(half)> d16;
    const auto divided = [&](auto halfX, auto halfY) HWY_ATTR {
        const auto p = hn::Mul(hn::PromoteTo(d16, halfX), hn::PromoteTo(d16, halfY));
        const auto sum = hn::Add(hn::Add(p, hn::ShiftRight<8>(p)), hn::Set(d16, 1));
        return hn::TruncateTo(half, hn::ShiftRight<8>(sum));
    };
    return hn::Combine(d, divided(hn::UpperHalf(half, x), hn::UpperHalf(half, y)),
                       divided(hn::LowerHalf(half, x), hn::LowerHalf(half, y)));
}

#endif
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
