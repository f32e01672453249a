// What the scaler's kernels share: pixels as vectors, arithmetic on their
// channels, and picking pixels from a source row.
//
// Vectors are of whole pixels.  Where positions advance slowly, what a vector
// needs lies close together in the source: it is read as whole vectors, the
// windows, and picked from them by index.  A window that would reach past the
// end of the row is moved back to end with it.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_RASTER_SCALE_VECTORS_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_RASTER_SCALE_VECTORS_INL_H
#undef QUILLON_RASTER_SCALE_VECTORS_INL_H
#else
#define QUILLON_RASTER_SCALE_VECTORS_INL_H
#endif

#include "legacy/kernels-inl.h"
#include "legacy/streaming-inl.h"
#include "scale/scaleKernels.h"

#include "hwy/highway.h"

#include <algorithm>
#include <cstring>
#include <type_traits>

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {

inline constexpr size_t kPixelBytes = 4;

// The pixels in a vector.
template <class D>
inline constexpr auto kPixels = static_cast<uint32_t>(kLanes<D>);

// Pixels at any address.  With a single lane Highway reads through a pointer,
// which would have to be aligned.
template <class D>
HWY_INLINE hn::Vec<D> loadPixels(D d, const uint8_t *from) {
#if HWY_TARGET == HWY_SCALAR
    uint32_t lane = 0;
    std::memcpy(&lane, from, sizeof(lane));
    return hn::Set(d, lane);
#else
    return hn::LoadU(d, reinterpret_cast<const uint32_t *>(from));
#endif
}

template <class D>
HWY_INLINE void storePixels(hn::Vec<D> pixels, [[maybe_unused]] D d, uint8_t *to) {
#if HWY_TARGET == HWY_SCALAR
    const uint32_t lane = hn::GetLane(pixels);
    std::memcpy(to, &lane, sizeof(lane));
#else
    hn::StoreU(pixels, d, reinterpret_cast<uint32_t *>(to));
#endif
}

// The same by one of the policies of streaming-inl.h.
template <class Store, class D>
HWY_INLINE void storePixelsBy(hn::Vec<D> pixels, D d, uint8_t *to) {
    if constexpr (std::is_same_v<Store, ThroughCaches>)
        storePixels(pixels, d, to);
    else
        Store::store(d, pixels, to);
}

// Arithmetic on pixels two channels at a time: the even ones (0 and 2), or the
// odd ones (1 and 3), each in a 16-bit half of the pixel's lane.  Weights are at
// most 256, and the same for both halves.
template <class D>
struct ChannelPairs {
    using Pixels = hn::Vec<D>;

#if HWY_TARGET == HWY_SCALAR
    // There are no 16-bit lanes in a vector of one lane, but a product of a
    // whole lane stays within its halves.
    using Pairs = Pixels;

    static HWY_INLINE Pairs low() {
        return hn::Set(D(), 0x00FF00FFu);
    }
    static HWY_INLINE Pairs even(Pixels pixels) {
        return hn::And(pixels, low());
    }
    static HWY_INLINE Pairs odd(Pixels pixels) {
        return high(pixels);
    }
    static HWY_INLINE Pairs inLanes(Pixels pairs) {
        return pairs;
    }
    static HWY_INLINE Pairs weight(uint32_t value) {
        return hn::Set(D(), value);
    }
    static HWY_INLINE Pairs weights(Pixels values) {
        return values;
    }
    static HWY_INLINE Pairs high(Pairs sums) {
        return hn::And(hn::ShiftRight<8>(sums), low());
    }
    static HWY_INLINE Pixels joined(Pairs evens, Pairs odds) {
        return hn::Or(evens, hn::ShiftLeft<8>(odds));
    }
    static HWY_INLINE Pairs average(Pairs sums, uint32_t normaliser) {
        const auto factor = hn::Set(D(), normaliser), upper = hn::Set(D(), 0xFFFF0000u);
        return hn::Or(hn::ShiftRight<16>(hn::Mul(hn::AndNot(upper, sums), factor)),
                      hn::And(hn::Mul(hn::ShiftRight<16>(sums), factor), upper));
    }
#else
    using D16 = hn::Repartition<uint16_t, D>;
    using Pairs = hn::Vec<D16>;

    static HWY_INLINE Pairs even(Pixels pixels) {
        return hn::And(hn::BitCast(D16(), pixels), hn::Set(D16(), 0x00FF));
    }
    static HWY_INLINE Pairs odd(Pixels pixels) {
        return high(hn::BitCast(D16(), pixels));
    }
    static HWY_INLINE Pairs inLanes(Pixels pairs) {
        return hn::BitCast(D16(), pairs);
    }
    static HWY_INLINE Pairs weight(uint32_t value) {
        return hn::Set(D16(), static_cast<uint16_t>(value));
    }
    // From one weight in each pixel's lane.
    static HWY_INLINE Pairs weights(Pixels values) {
        return hn::BitCast(D16(), hn::Or(values, hn::ShiftLeft<16>(values)));
    }
    // The high bytes of 16-bit sums.
    static HWY_INLINE Pairs high(Pairs sums) {
        return hn::ShiftRight<8>(sums);
    }
    static HWY_INLINE Pixels joined(Pairs evens, Pairs odds) {
        return hn::BitCast(D(), hn::Or(evens, hn::ShiftLeft<8>(odds)));
    }
    // Sums of channels by a normaliser below 65536, of which the high half is
    // known to fit 8 bits.
    static HWY_INLINE Pairs average(Pairs sums, uint32_t normaliser) {
        return hn::MulHigh(sums, weight(normaliser));
    }
#endif

    // The blend of two pixels by weights that sum to at most 256.
    static HWY_INLINE Pixels blend(Pixels a, Pairs weightA, Pixels b, Pairs weightB) {
        const auto evens = hn::Add(hn::Mul(even(a), weightA), hn::Mul(even(b), weightB));
        const auto odds = hn::Add(hn::Mul(odd(a), weightA), hn::Mul(odd(b), weightB));
        return joined(high(evens), high(odds));
    }
};

// Pixels next to each other: of 2 * kPixels of them those with even, and those
// with odd places.
template <class D>
struct Neighbours {
    hn::Vec<D> left, right;

    HWY_INLINE Neighbours(D d, const uint8_t *from)
        : Neighbours(d, loadPixels(d, from), loadPixels(d, from + kLanes<D> * kPixelBytes)) {}

    HWY_INLINE Neighbours([[maybe_unused]] D d, hn::Vec<D> low, hn::Vec<D> high)
        : left(low), right(high) {
        if constexpr (kLanes < D >> 1) {
            left = ConcatEven(d, high, low); // found by argument: there is none for one lane
            right = ConcatOdd(d, high, low);
        }
    }

    // In any order that is the same for all; inOrder brings it back.
    static HWY_INLINE Neighbours unordered(D d, hn::Vec<D> low, hn::Vec<D> high) {
        Neighbours pixels(d, low, high);
#if HWY_TARGET == HWY_AVX2
        // What crosses the middle of a vector takes longer.
        if constexpr (kLanes<D> == 8) {
            const auto a = _mm256_castsi256_ps(low.raw), b = _mm256_castsi256_ps(high.raw);
            pixels.left.raw = _mm256_castps_si256(_mm256_shuffle_ps(a, b, 0x88));
            pixels.right.raw = _mm256_castps_si256(_mm256_shuffle_ps(a, b, 0xDD));
        }
#endif
        return pixels;
    }

    static HWY_INLINE hn::Vec<D> inOrder(hn::Vec<D> pixels) {
#if HWY_TARGET == HWY_AVX2
        if constexpr (kLanes<D> == 8)
            return hn::Vec<D>{_mm256_permute4x64_epi64(pixels.raw, 0xD8)};
#endif
        return pixels;
    }
};

// Weighted sums of pixels, every product truncated by itself.
template <class D>
class ChannelSums {
public:
    // Spelt out: a constructor that the compiler makes is not compiled for the
    // target.
    HWY_INLINE ChannelSums() : evens_(Channels::weight(0)), odds_(Channels::weight(0)) {}

    HWY_INLINE void add(hn::Vec<D> pixels) {
        evens_ = hn::Add(evens_, Channels::even(pixels));
        odds_ = hn::Add(odds_, Channels::odd(pixels));
    }
    HWY_INLINE void add(hn::Vec<D> pixels, typename ChannelPairs<D>::Pairs weight) {
        evens_ = hn::Add(evens_, Channels::high(hn::Mul(Channels::even(pixels), weight)));
        odds_ = hn::Add(odds_, Channels::high(hn::Mul(Channels::odd(pixels), weight)));
    }
    HWY_INLINE hn::Vec<D> average(uint32_t normaliser) const {
        return Channels::joined(Channels::average(evens_, normaliser),
                                Channels::average(odds_, normaliser));
    }

    // Each sum of low or high and the one after it, as of pixels end to end.
    static HWY_INLINE ChannelSums ofNeighbours(const ChannelSums &low, const ChannelSums &high) {
        ChannelSums sums;
        sums.evens_ = neighbours(low.evens_, high.evens_);
        sums.odds_ = neighbours(low.odds_, high.odds_);
        return sums;
    }

private:
    using Channels = ChannelPairs<D>;
    using Pairs = typename Channels::Pairs;

    static HWY_INLINE Pairs neighbours(Pairs low, Pairs high) {
        const Neighbours<D> sums(D(), hn::BitCast(D(), low), hn::BitCast(D(), high));
        return hn::Add(Channels::inLanes(sums.left), Channels::inLanes(sums.right));
    }

    Pairs evens_, odds_;
};

// Walks a row by vectors no wider than limit, for which the source row is long
// enough.
template <size_t kCap, class Body>
HWY_INLINE void walkWindows(size_t count, size_t limit, const Body &body) {
    if constexpr (kCap > 1) {
        if (limit < kCap || count < kCap)
            return walkWindows<kCap / 2>(count, limit, body);
    }
    walkCapped<uint32_t, kCap>(count, body);
}

template <class Body>
HWY_INLINE void walkWindows(size_t count, size_t limit, const Body &body) {
    walkWindows<kLanes<Widest<uint32_t>>>(count, limit, body);
}

// With four pixels in a vector, or one, several windows cost more than they save.
inline constexpr bool kVectorsAreWide = hn::MaxLanes(Widest<uint32_t>()) > 4;

// Source pixels by their offset from the start of two vectors that lie end to
// end.  Only the low bits of an offset count.
template <class D>
HWY_INLINE hn::Vec<D> pickFromTwo(D d, const uint8_t *window, hn::Vec<D> offset) {
    constexpr uint32_t n = kPixels<D>;
    const auto low = loadPixels(d, window), high = loadPixels(d, window + n * kPixelBytes);
#if HWY_TARGET <= HWY_AVX3
    if constexpr (n == 16)
        return {_mm512_permutex2var_epi32(low.raw, offset.raw, high.raw)};
    else if constexpr (n == 8)
        return {_mm256_permutex2var_epi32(low.raw, offset.raw, high.raw)};
    else if constexpr (n == 4)
        return {_mm_permutex2var_epi32(low.raw, offset.raw, high.raw)};
#endif
    const auto lane = hn::IndicesFromVec(d, hn::And(offset, hn::Set(d, n - 1)));
    const auto isLow = hn::Eq(hn::And(offset, hn::Set(d, n)), hn::Zero(d));
    return hn::IfThenElse(isLow, hn::TableLookupLanes(low, lane), hn::TableLookupLanes(high, lane));
}

// The same for any number of windows.
template <uint32_t kWindows, class D>
HWY_INLINE hn::Vec<D> pick(D d, const uint8_t *window, hn::Vec<D> offset) {
    constexpr uint32_t n = kPixels<D>;
    if constexpr (kWindows == 1) {
        return hn::TableLookupLanes(loadPixels(d, window), hn::IndicesFromVec(d, offset));
    } else if constexpr (kWindows == 2) {
        return pickFromTwo(d, window, offset);
    } else {
        const auto low = pickFromTwo(d, window, offset);
        window += size_t{2} * n * kPixelBytes;
        auto rest = hn::Sub(offset, hn::Set(d, 2 * n));
        if constexpr (kWindows == 3)
            rest = hn::And(rest, hn::Set(d, n - 1));
        const auto high = pick<kWindows - 2>(d, window, rest);
        return hn::IfThenElse(hn::Lt(offset, hn::Set(d, 2 * n)), low, high);
    }
}

// The positions of one vector's pixels.
template <class D>
HWY_INLINE hn::Vec<D> positionsFrom(D d, uint32_t first, uint32_t step) {
    return hn::Add(hn::Set(d, first), hn::Mul(hn::Iota(d, 0), hn::Set(d, step)));
}

struct FillBody {
    uint8_t *dst;
    uint32_t pixel;

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        storePixels(hn::Set(d, pixel), d, dst + i * kPixelBytes);
    }
};

// count copies of a source pixel.
HWY_INLINE void fillPixels(uint8_t *dst, const uint8_t *src, size_t index, size_t count) {
    if (count == 0)
        return;
    uint32_t pixel = 0;
    std::memcpy(&pixel, src + index * kPixelBytes, kPixelBytes);
    walkAgain<uint32_t>(count, FillBody{dst, pixel});
}

struct CopyBody {
    uint8_t *dst;
    const uint8_t *src;

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        storePixels(loadPixels(d, src + i * kPixelBytes), d, dst + i * kPixelBytes);
    }
};

} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
