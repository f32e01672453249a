// Blends of two pixels by weights that sum to 255, truncated.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_SCALE_PIXEL_BLEND_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_SCALE_PIXEL_BLEND_INL_H
#undef QUILLON_SCALE_PIXEL_BLEND_INL_H
#else
#define QUILLON_SCALE_PIXEL_BLEND_INL_H
#endif

#include "hwy/highway.h"

#include "scale/channels-inl.h"
#include "simd/narrow-inl.h"
#include "simd/products-inl.h"
#include "simd/target-inl.h"

#include <type_traits>

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {
#if QUILLON_HAS_VECTORS

// Picks bits 8 to 15 of the two lanes in half a block, eight times each.
template <size_t kHalf>
struct WeightPicks {
    alignas(16) uint8_t from[16] = {};
    constexpr WeightPicks() {
        for (size_t i = 0; i < 16; ++i)
            from[i] = static_cast<uint8_t>(8 * kHalf + i / 8 * 4 + 1);
    }
};
template <size_t kHalf>
inline constexpr WeightPicks<kHalf> kWeightPicks;

// Channels of a and b as pairs of bytes, by pairs of weights: half a block of pixels makes
// a block of pairs.
template <class D>
class BlendByPairs {
public:
    // b's weight.
    HWY_INLINE BlendByPairs(D d, uint32_t weight)
        : lower_(hn::BitCast(D16(), hn::Set(d, weight * 0x01010101 ^ kRestOfA))), upper_(lower_) {}
    // b's weights, in bits 8 to 15 of lanes.
    HWY_INLINE BlendByPairs(D d, hn::Vec<D> weights)
        : lower_(pairs(d, weights, kWeightPicks<0>.from)),
          upper_(pairs(d, weights, kWeightPicks<1>.from)) {}

    HWY_INLINE hn::Vec<D> operator()(D d, hn::Vec<D> a, hn::Vec<D> b) const {
        // Less 128, channels are signed, and sums are less 128 * 255: they fit.
        const D8 d8;
        const D16 d16;
        const auto signedA = hn::Xor(hn::BitCast(d8, a), hn::Set(d8, 0x80));
        const auto signedB = hn::Xor(hn::BitCast(d8, b), hn::Set(d8, 0x80));
        // (sum + 128) >> 8, which is less 127: 128 - 128 * 255 is -127 * 256.
        const auto blended = [&](hn::Vec<D16> weights, hn::Vec<D8> channels) HWY_ATTR {
            const auto sum = pairSum(d16, weights, hn::BitCast(d16, channels));
            return hn::MulFixedPoint15(sum, hn::Set(d16, 128));
        };
        const auto lower = blended(lower_, hn::InterleaveLower(d8, signedA, signedB));
        const auto upper = blended(upper_, hn::InterleaveUpper(d8, signedA, signedB));
        return hn::BitCast(d, hn::Add(narrowSaturated(d8, lower, upper), hn::Set(d8, 127)));
    }

private:
    using D8 = hn::Repartition<uint8_t, D>;
    using D16 = hn::Repartition<int16_t, D>;
    static constexpr uint32_t kRestOfA = 0x00FF00FF; // turns a weight of b into one of a

    static HWY_INLINE hn::Vec<D16> pairs(D d, hn::Vec<D> weights, const uint8_t (&from)[16]) {
        const D8 d8;
        const auto both = hn::TableLookupBytes(hn::BitCast(d8, weights), hn::LoadDup128(d8, from));
        return hn::BitCast(D16(), hn::Xor(hn::BitCast(d, both), hn::Set(d, kRestOfA)));
    }

    hn::Vec<D16> lower_, upper_;
};

// Every other channel by itself.
template <class D>
class BlendByChannels {
public:
    HWY_INLINE BlendByChannels(D d, uint32_t weight) : weights_(hn::Set(d, weight)) {}
    HWY_INLINE BlendByChannels(D d, hn::Vec<D> weights)
        : weights_(hn::And(hn::ShiftRight<8>(weights), hn::Set(d, 0xFFu))) {}

    HWY_INLINE hn::Vec<D> operator()(D d, hn::Vec<D> a, hn::Vec<D> b) const {
        if constexpr (kHasWideningProducts && kBytesOf<D> == kVectorBytes) {
            const hn::Repartition<uint8_t, D> d8;
            const auto weights = hn::Mul(weights_, hn::Set(d, 0x01010101));
            return hn::BitCast(d, blendBytes(d8, hn::BitCast(d8, a), hn::BitCast(d8, b),
                                             hn::BitCast(d8, weights)));
        } else {
            using Channels = ChannelPairs<D>;
            const auto weightA = Channels::weights(hn::Sub(hn::Set(d, 0xFF), weights_));
            const auto weightB = Channels::weights(weights_);
            const auto evens =
                hn::Add(hn::Mul(Channels::even(a), weightA), hn::Mul(Channels::even(b), weightB));
            const auto odds =
                hn::Add(hn::Mul(Channels::odd(a), weightA), hn::Mul(Channels::odd(b), weightB));
            return Channels::interleave(Channels::highBytes(evens), Channels::highBytes(odds));
        }
    }

private:
    hn::Vec<D> weights_;
};

template <class D>
using PixelBlend =
    std::conditional_t<kHasPairProducts && kBytesOf<D> >= 16, BlendByPairs<D>, BlendByChannels<D>>;

#endif
} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
