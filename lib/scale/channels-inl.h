// Arithmetic on the four 8-bit channels of pixels.
//
// Weights have 8 bits, so that a product, and the sum of two, fits 16; every
// product is truncated by itself, and the results depend on it.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_SCALE_CHANNELS_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_SCALE_CHANNELS_INL_H
#undef QUILLON_SCALE_CHANNELS_INL_H
#else
#define QUILLON_SCALE_CHANNELS_INL_H
#endif

#include "hwy/highway.h"

#include "simd/access-inl.h"
#include "simd/shuffle-inl.h"
#include "simd/target-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {
#if QUILLON_HAS_VECTORS

// Two channels of each pixel, the even ones (0 and 2) or the odd ones (1 and 3), in
// 16-bit lanes.
template <class D>
struct ChannelPairs {
    using D16 = hn::Repartition<uint16_t, D>;
    using Pixels = hn::Vec<D>;
    using Pairs = hn::Vec<D16>;

    static HWY_INLINE Pairs even(Pixels pixels) {
        return hn::And(hn::BitCast(D16(), pixels), hn::Set(D16(), 0x00FF));
    }
    static HWY_INLINE Pairs odd(Pixels pixels) { return highBytes(hn::BitCast(D16(), pixels)); }
    static HWY_INLINE Pixels interleave(Pairs evens, Pairs odds) {
        return hn::BitCast(D(), hn::Or(evens, hn::ShiftLeft<8>(odds)));
    }
    static HWY_INLINE Pairs highBytes(Pairs sums) { return hn::ShiftRight<8>(sums); }

    // Channels by weights of up to 256, divided by 256.
    static HWY_INLINE Pairs weightedEven(Pixels pixels, Pairs weights) {
        if constexpr (kHasHighProducts)
            return hn::MulHigh(hn::ShiftLeft<8>(hn::BitCast(D16(), pixels)), weights);
        else
            return highBytes(hn::Mul(even(pixels), weights));
    }
    static HWY_INLINE Pairs weightedOdd(Pixels pixels, Pairs weights) {
        if constexpr (kHasHighProducts)
            return hn::MulHigh(hn::And(hn::BitCast(D16(), pixels), hn::Set(D16(), 0xFF00)),
                               weights);
        else
            return highBytes(hn::Mul(odd(pixels), weights));
    }

    static HWY_INLINE Pairs weight(uint32_t value) {
        return hn::Set(D16(), static_cast<uint16_t>(value));
    }
    // From one weight in each pixel's lane.
    static HWY_INLINE Pairs weights(Pixels values) {
        return hn::BitCast(D16(), hn::Or(values, hn::ShiftLeft<16>(values)));
    }
};

// Of two vectors of pixels end to end those with even places, and their neighbours
// to the right.
template <class D>
struct Neighbours {
    hn::Vec<D> left, right;

    static HWY_INLINE Neighbours of([[maybe_unused]] D d, hn::Vec<D> low, hn::Vec<D> high) {
        if constexpr (kLanes<D> == 1)
            return {low, high};
        else
            return {hn::ConcatEven(d, high, low), hn::ConcatOdd(d, high, low)};
    }
    // In the order of evenLanesUnordered.
    static HWY_INLINE Neighbours unordered([[maybe_unused]] D d, hn::Vec<D> low, hn::Vec<D> high) {
        if constexpr (kLanes<D> == 1)
            return {low, high};
        else
            return {evenLanesUnordered(d, low, high), oddLanesUnordered(d, low, high)};
    }

    static HWY_INLINE Neighbours load(D d, const uint8_t *from) {
        return of(d, loadBytes(d, from), loadBytes(d, from + kBytesOf<D>));
    }
};

// Sums of pixels.
template <class D>
class ChannelSums {
public:
    // Spelt out: a default constructor of the compiler's is not compiled for the
    // target.
    HWY_INLINE ChannelSums() : evens_(Channels::weight(0)), odds_(Channels::weight(0)) {}

    HWY_INLINE void add(hn::Vec<D> pixels) {
        evens_ = hn::Add(evens_, Channels::even(pixels));
        odds_ = hn::Add(odds_, Channels::odd(pixels));
    }
    HWY_INLINE void add(hn::Vec<D> pixels, typename ChannelPairs<D>::Pairs weight) {
        evens_ = hn::Add(evens_, Channels::weightedEven(pixels, weight));
        odds_ = hn::Add(odds_, Channels::weightedOdd(pixels, weight));
    }

    // The sums by a normaliser below 65536 and divided by 65536, which fit 8 bits.
    HWY_INLINE hn::Vec<D> average(uint32_t normaliser) const {
        const auto factor = Channels::weight(normaliser);
        return Channels::interleave(hn::MulHigh(evens_, factor), hn::MulHigh(odds_, factor));
    }

    // The sums of neighbours in low and high end to end.
    static HWY_INLINE ChannelSums ofNeighbours(const ChannelSums &low, const ChannelSums &high) {
        ChannelSums sums;
        sums.evens_ = addNeighbours(low.evens_, high.evens_);
        sums.odds_ = addNeighbours(low.odds_, high.odds_);
        return sums;
    }

private:
    using Channels = ChannelPairs<D>;
    using D16 = typename Channels::D16;
    using Pairs = typename Channels::Pairs;

    static HWY_INLINE Pairs addNeighbours(Pairs low, Pairs high) {
        const auto sums = Neighbours<D>::of(D(), hn::BitCast(D(), low), hn::BitCast(D(), high));
        return hn::Add(hn::BitCast(D16(), sums.left), hn::BitCast(D16(), sums.right));
    }

    Pairs evens_, odds_;
};

#endif
} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
