// The horizontal pass of the scaler: one source row made into one row as wide as
// the destination rectangle, by nearest pixels, linear blends or averages.
//
// Vectors are of whole pixels.  Where positions advance slowly, what a vector
// needs lies close together in the source: it is read as whole vectors, the
// windows, and picked from them by index.  A window that would reach past the
// end of the row is moved back to end with it.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_RASTER_SCALE_ROWS_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_RASTER_SCALE_ROWS_INL_H
#undef QUILLON_RASTER_SCALE_ROWS_INL_H
#else
#define QUILLON_RASTER_SCALE_ROWS_INL_H
#endif

#include "raster/kernels-inl.h"
#include "raster/rasterScaleKernels.h"

#include "hwy/highway.h"

#include <algorithm>
#include <cstring>

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {

inline constexpr size_t kPixelBytes = 4;

// The pixels in a vector.
template <class D>
inline constexpr auto kPixels = static_cast<uint32>(kLanes<D>);

// Pixels at any address.  With a single lane Highway reads through a pointer,
// which would have to be aligned.
template <class D>
HWY_INLINE hn::Vec<D> loadPixels(D d, const uint8 *from) {
#if HWY_TARGET == HWY_SCALAR
    uint32 lane = 0;
    std::memcpy(&lane, from, sizeof(lane));
    return hn::Set(d, lane);
#else
    return hn::LoadU(d, reinterpret_cast<const uint32 *>(from));
#endif
}

template <class D>
HWY_INLINE void storePixels(hn::Vec<D> pixels, [[maybe_unused]] D d, uint8 *to) {
#if HWY_TARGET == HWY_SCALAR
    const uint32 lane = hn::GetLane(pixels);
    std::memcpy(to, &lane, sizeof(lane));
#else
    hn::StoreU(pixels, d, reinterpret_cast<uint32 *>(to));
#endif
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
    static HWY_INLINE Pairs weight(uint32 value) {
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
    static HWY_INLINE Pairs average(Pairs sums, uint32 normaliser) {
        const auto factor = hn::Set(D(), normaliser), upper = hn::Set(D(), 0xFFFF0000u);
        return hn::Or(hn::ShiftRight<16>(hn::Mul(hn::AndNot(upper, sums), factor)),
                      hn::And(hn::Mul(hn::ShiftRight<16>(sums), factor), upper));
    }
#else
    using D16 = hn::Repartition<uint16, D>;
    using Pairs = hn::Vec<D16>;

    static HWY_INLINE Pairs even(Pixels pixels) {
        return hn::And(hn::BitCast(D16(), pixels), hn::Set(D16(), 0x00FF));
    }
    static HWY_INLINE Pairs odd(Pixels pixels) {
        return high(hn::BitCast(D16(), pixels));
    }
    static HWY_INLINE Pairs weight(uint32 value) {
        return hn::Set(D16(), static_cast<uint16>(value));
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
    static HWY_INLINE Pairs average(Pairs sums, uint32 normaliser) {
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
    HWY_INLINE hn::Vec<D> average(uint32 normaliser) const {
        return Channels::joined(Channels::average(evens_, normaliser),
                                Channels::average(odds_, normaliser));
    }

private:
    using Channels = ChannelPairs<D>;

    typename Channels::Pairs evens_, odds_;
};

// Walks a row by vectors no wider than limit, for which the source row is long
// enough.
template <size_t kCap, class Body>
HWY_INLINE void walkWindows(size_t count, size_t limit, const Body &body) {
    if constexpr (kCap > 1) {
        if (limit < kCap || count < kCap)
            return walkWindows<kCap / 2>(count, limit, body);
    }
    walkCapped<uint32, kCap>(count, body);
}

template <class Body>
HWY_INLINE void walkWindows(size_t count, size_t limit, const Body &body) {
    walkWindows<kLanes<Widest<uint32>>>(count, limit, body);
}

// With four pixels in a vector, or one, several windows cost more than they save.
inline constexpr bool kVectorsAreWide = hn::MaxLanes(Widest<uint32>()) > 4;

// Source pixels by their offset from the start of kWindows vectors that lie end
// to end.
template <uint32 kWindows, class D>
HWY_INLINE hn::Vec<D> pick(D d, const uint8 *window, hn::Vec<D> offset) {
    constexpr uint32 n = kPixels<D>;
    const auto lane = hn::IndicesFromVec(d, hn::And(offset, hn::Set(d, n - 1)));
    auto picked = hn::TableLookupLanes(loadPixels(d, window), lane);
    for (uint32 i = 1; i < kWindows; ++i) {
        window += n * kPixelBytes;
        const auto next = hn::TableLookupLanes(loadPixels(d, window), lane);
        picked = hn::IfThenElse(hn::Lt(offset, hn::Set(d, i * n)), picked, next);
    }
    return picked;
}

// The positions of one vector's pixels.
template <class D>
HWY_INLINE hn::Vec<D> positionsFrom(D d, uint32 first, uint32 step) {
    return hn::Add(hn::Set(d, first), hn::Mul(hn::Iota(d, 0), hn::Set(d, step)));
}

struct FillBody {
    uint8 *dst;
    uint32 pixel;

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        storePixels(hn::Set(d, pixel), d, dst + i * kPixelBytes);
    }
};

// count copies of a source pixel.
HWY_INLINE void fillPixels(uint8 *dst, const uint8 *src, size_t index, size_t count) {
    if (count == 0)
        return;
    uint32 pixel = 0;
    std::memcpy(&pixel, src + index * kPixelBytes, kPixelBytes);
    walkAgain<uint32>(count, FillBody{dst, pixel});
}

struct CopyBody {
    uint8 *dst;
    const uint8 *src;

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        storePixels(loadPixels(d, src + i * kPixelBytes), d, dst + i * kPixelBytes);
    }
};

// Nearest pixels whose positions advance by at most kWindows pixels.
template <uint32 kWindows>
struct NearestBody {
    uint8 *dst;
    const uint8 *src;
    const ScaleAxis &axis;

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        const uint32 first = axis.start + static_cast<uint32>(i) * axis.step;
        const uint32 base = std::min(first >> 16, axis.srcSize - kWindows * kPixels<D>);
        const auto index = hn::ShiftRight<16>(positionsFrom(d, first, axis.step));
        storePixels(
            pick<kWindows>(d, src + size_t{base} * kPixelBytes, hn::Sub(index, hn::Set(d, base))),
            d, dst + i * kPixelBytes);
    }
};

// Each pixel is the source pixel of its position, or the last one.
class RasterScaleRowNearest {
public:
    explicit RasterScaleRowNearest(const ScaleAxis &axis)
        : axis_(axis), wraps_((uint64_t{axis.step} * (axis.dstSize - 1) + axis.start) >> 32 != 0),
          inner_(std::min(stepsBefore(axis.start, axis.lastPosition(), axis.step), axis.dstSize)) {}

    HWY_NOINLINE void operator()(uint8 *dst, const uint8 *src) const {
        if (wraps_)
            return pickAnywhere(dst, src);
        if (axis_.step == kScaleOne)
            std::memcpy(dst, src + size_t{axis_.start >> 16} * kPixelBytes,
                        size_t{inner_} * kPixelBytes);
        else if (axis_.step < kScaleOne)
            walkWindows(inner_, axis_.srcSize, NearestBody<1>{dst, src, axis_});
        else if (kVectorsAreWide && axis_.step <= 2 * kScaleOne)
            walkWindows(inner_, axis_.srcSize / 2, NearestBody<2>{dst, src, axis_});
        else if (kVectorsAreWide && axis_.step <= 4 * kScaleOne && axis_.srcSize >= 4)
            walkWindows(inner_, axis_.srcSize / 4, NearestBody<4>{dst, src, axis_});
        else
            pickSingly(dst, src);
        fillPixels(dst + size_t{inner_} * kPixelBytes, src, axis_.srcSize - 1,
                   axis_.dstSize - inner_);
    }

private:
    // Four a turn, read before they are written: the compiler cannot know that
    // the rows do not overlap.
    HWY_INLINE void pickSingly(uint8 *dst, const uint8 *src) const {
        const uint32 step = axis_.step;
        uint32 x = axis_.start;
        size_t i = 0;
        for (; inner_ - i >= 4; i += 4, x += 4 * step) {
            uint32 pixels[4];
            for (uint32 k = 0; k < 4; ++k)
                std::memcpy(&pixels[k], src + size_t{(x + k * step) >> 16} * kPixelBytes,
                            kPixelBytes);
            std::memcpy(dst + i * kPixelBytes, pixels, sizeof(pixels));
        }
        for (; i < inner_; ++i, x += step)
            std::memcpy(dst + i * kPixelBytes, src + size_t{x >> 16} * kPixelBytes, kPixelBytes);
    }

    // Positions that wrap come back into the source.
    HWY_INLINE void pickAnywhere(uint8 *dst, const uint8 *src) const {
        uint32 x = axis_.start;
        for (size_t i = 0; i < axis_.dstSize; ++i, x += axis_.step) {
            const size_t index = std::min(x >> 16, axis_.srcSize - 1);
            std::memcpy(dst + i * kPixelBytes, src + index * kPixelBytes, kPixelBytes);
        }
    }

    const ScaleAxis &axis_;
    bool wraps_;
    uint32 inner_;
};

struct LinearBody {
    uint8 *dst;
    const uint8 *src;
    uint32 start, step, srcSize;

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        using Channels = ChannelPairs<D>;
        const uint32 first = start + static_cast<uint32>(i) * step;
        const auto x = positionsFrom(d, first, step);
        const uint32 base = std::min(first >> 16, srcSize - 1 - kPixels<D>);
        const uint8 *window = src + size_t{base} * kPixelBytes;
        const auto offset = hn::Sub(hn::ShiftRight<16>(x), hn::Set(d, base));
        const auto left = pick<1>(d, window, offset);
        const auto right = pick<1>(d, window + kPixelBytes, offset);
        const auto full = hn::Set(d, 0xFFu);
        const auto rightWeight = hn::And(hn::ShiftRight<8>(x), full);
        const auto leftWeight = hn::Sub(full, rightWeight);
        storePixels(Channels::blend(left, Channels::weights(leftWeight), right,
                                    Channels::weights(rightWeight)),
                    d, dst + i * kPixelBytes);
    }
};

// Copies of the first pixel, blends of neighbours with weights that sum to 255,
// copies of the last pixel.
class RasterScaleRowLinear {
public:
    explicit RasterScaleRowLinear(const ScaleAxis &axis) : axis_(axis), leading_(0) {
        const bool isAhead = axis.start >> 31 != 0;
        if (isAhead)
            leading_ =
                std::min(stepsBefore(axis.start, uint64_t{1} << 32, axis.step), axis.dstSize);
        innerStart_ = axis.start + leading_ * axis.step;
        inner_ = std::min(stepsBefore(innerStart_, axis.lastPosition(), axis.step),
                          axis.dstSize - leading_);
    }

    HWY_NOINLINE void operator()(uint8 *dst, const uint8 *src) const {
        fillPixels(dst, src, 0, leading_);
        dst += size_t{leading_} * kPixelBytes;
        walkWindows(inner_, axis_.srcSize - 1,
                    LinearBody{dst, src, innerStart_, axis_.step, axis_.srcSize});
        dst += size_t{inner_} * kPixelBytes;
        fillPixels(dst, src, axis_.srcSize - 1, axis_.dstSize - leading_ - inner_);
    }

private:
    const ScaleAxis &axis_;
    uint32 leading_, inner_, innerStart_;
};

// A span of source pixels: the first and the last count by a weight in 256ths,
// those between whole.
struct BoxSpan {
    BoxSpan(uint32 start, uint32 end)
        : first(start >> 16), last(end >> 16), head((kScaleOne - (start & 0xFFFF)) >> 8),
          tail((end & 0xFFFF) >> 8) {}

    size_t first, last;
    uint32 head, tail; // 1 to 256, 0 to 255
};

// Averages of exactly two pixels.
struct HalfBody {
    uint8 *dst;
    const uint8 *src;

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        const uint8 *from = src + 2 * i * kPixelBytes;
        const auto low = loadPixels(d, from);
        const auto high = loadPixels(d, from + kLanes<D> * kPixelBytes);
        auto left = low, right = high;
        if constexpr (kLanes < D >> 1) {
            left = ConcatEven(d, high, low); // found by argument: there is none for one lane
            right = ConcatOdd(d, high, low);
        }
        const auto halfDifference =
            hn::And(hn::ShiftRight<1>(hn::Xor(left, right)), hn::Set(d, 0x7F7F7F7Fu));
        storePixels(hn::Add(hn::And(left, right), halfDifference), d, dst + i * kPixelBytes);
    }
};

// Averages over kWhole pixels and a fraction, none of which reaches to the last
// pixel.
template <uint32 kWhole>
struct BoxBody {
    static constexpr uint32 kWindows = kWhole + 1;

    uint8 *dst;
    const uint8 *src;
    const ScaleAxis &axis;

    // How wide vectors can be for a source row.
    static size_t limit(uint32 srcSize) {
        return srcSize > kWindows ? (srcSize - kWindows) / kWindows : 0;
    }

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        using Channels = ChannelPairs<D>;
        const uint32 start = axis.start + static_cast<uint32>(i) * axis.step;
        const auto x = positionsFrom(d, start, axis.step);
        const auto end = hn::Add(x, hn::Set(d, axis.step));
        const auto first = hn::ShiftRight<16>(x);
        const auto last = hn::ShiftRight<16>(end);

        const auto fraction = hn::Set(d, 0xFFFFu);
        const auto head = hn::ShiftRight<8>(hn::Sub(hn::Set(d, kScaleOne), hn::And(x, fraction)));
        const auto tail = hn::ShiftRight<8>(hn::And(end, fraction));
        // The pixel kWhole behind the first is the last one, or one before it.
        const auto isLast = hn::Eq(last, hn::Add(first, hn::Set(d, kWhole)));
        const auto middle = hn::IfThenElse(isLast, tail, hn::Set(d, 256u));
        const auto behind = hn::IfThenZeroElse(isLast, tail);

        const uint32 base = std::min(start >> 16, axis.srcSize - kWindows - kWindows * kPixels<D>);
        const auto offset = hn::Sub(first, hn::Set(d, base));
        const uint8 *window = src + size_t{base} * kPixelBytes;
        ChannelSums<D> sums;
        sums.add(pick<kWindows>(d, window, offset), Channels::weights(head));
        for (uint32 whole = 1; whole < kWhole; ++whole)
            sums.add(pick<kWindows>(d, window += kPixelBytes, offset));
        sums.add(pick<kWindows>(d, window += kPixelBytes, offset), Channels::weights(middle));
        sums.add(pick<kWindows>(d, window += kPixelBytes, offset), Channels::weights(behind));
        storePixels(sums.average(axis.normaliser), d, dst + i * kPixelBytes);
    }
};

// Sums over long spans, one pixel's channels in a vector of lanes T (one channel
// after the other where vectors have one lane).  16 bits hold the sums of up to
// 257 pixels.
template <class T>
class BoxSums {
public:
    using D = hn::CappedTag<T, 4>;
    using V = hn::Vec<D>;

    explicit BoxSums(const uint8 *channel) : channel_(channel) {}

    // The weight is at most 256, which takes the pixel whole.
    HWY_INLINE V weighted(size_t index, uint32 weight) const {
        return hn::ShiftRight<8>(hn::Mul(load(D(), index), hn::Set(D(), static_cast<T>(weight))));
    }

    // Whole pixels.
    HWY_INLINE V run(size_t index, size_t count) const {
        auto wide = hn::Zero(WideD());
        for (; count >= kWide; count -= kWide, index += kWide)
            wide = hn::Add(wide, load(WideD(), index));
        return tail<kWide / 2>(index, count, folded(WideD(), wide));
    }

private:
    using WideD = Widest<T>;
    static constexpr size_t kWide = std::max<size_t>(kLanes<WideD> / 4, 1); // in pixels

    template <class DT>
    HWY_INLINE hn::Vec<DT> load(DT d, size_t index) const {
        const hn::Rebind<uint8, DT> d8;
        return hn::PromoteTo(d, hn::LoadU(d8, channel_ + index * kPixelBytes));
    }

    template <size_t kCount>
    HWY_INLINE V tail(size_t index, [[maybe_unused]] size_t count, V sum) const {
        if constexpr (kCount == 0) {
            return sum;
        } else {
            if (count & kCount) {
                const hn::CappedTag<T, 4 * kCount> d;
                sum = hn::Add(sum, folded(d, load(d, index)));
                index += kCount;
            }
            return tail<kCount / 2>(index, count, sum);
        }
    }

    // The sum of the pixels in a vector.
    template <class DT>
    static HWY_INLINE V folded([[maybe_unused]] DT d, hn::Vec<DT> sums) {
        if constexpr (kLanes<DT> <= 4) {
            return sums;
        } else {
            const hn::Half<DT> half; // UpperHalf: found by argument, as above
            return folded(half, hn::Add(hn::LowerHalf(half, sums), UpperHalf(half, sums)));
        }
    }

    const uint8 *channel_;
};

HWY_INLINE auto normalised(hn::Vec<hn::CappedTag<uint16, 4>> sum, uint32 normaliser) {
    const hn::CappedTag<uint16, 4> d;
    const auto average = hn::MulHigh(sum, hn::Set(d, static_cast<uint16>(normaliser)));
    return hn::DemoteTo(hn::CappedTag<uint8, 4>(),
                        hn::BitCast(hn::RebindToSigned<decltype(d)>(), average));
}

HWY_INLINE auto normalised(hn::Vec<hn::CappedTag<uint32, 4>> sum, uint32 normaliser) {
    const hn::CappedTag<uint32, 4> d;
    return hn::U8FromU32(hn::ShiftRight<16>(hn::Mul(sum, hn::Set(d, normaliser))));
}

// Averages over the step: the pixels at both ends count by their part, those
// between whole.  The last source pixel never enters a sum; what would start
// there is a copy of it.
template <class T>
class RasterScaleRowBox {
public:
    explicit RasterScaleRowBox(const ScaleAxis &axis)
        : axis_(axis),
          inner_(std::min(stepsBefore(axis.start, axis.lastPosition(), axis.step), axis.dstSize)) {}

    HWY_NOINLINE void operator()(uint8 *dst, const uint8 *src) const {
        if (inner_ != 0) {
            averageInside(dst, src, inner_ - 1);
            // Only the last span can reach to the last pixel; it ends there.
            const uint32 start = axis_.start + (inner_ - 1) * axis_.step;
            const BoxSpan span(start, std::min(start + axis_.step, axis_.lastPosition()));
            averageOf(span, span.last - span.first - 1, dst + size_t{inner_ - 1} * kPixelBytes,
                      src);
        }
        fillPixels(dst + size_t{inner_} * kPixelBytes, src, axis_.srcSize - 1,
                   axis_.dstSize - inner_);
    }

private:
    HWY_INLINE void averageInside(uint8 *dst, const uint8 *src, size_t count) const {
        if (axis_.step == 2 * kScaleOne && axis_.normaliser == kScaleOne / 2)
            return walkAgain<uint32>(count,
                                     HalfBody{dst, src + size_t{axis_.start >> 16} * kPixelBytes});
        const uint32 whole = axis_.step >> 16;
        if (whole <= kMostClose && averageClose<kMostClose>(whole, dst, src, count))
            return;
        // The number of pixels between the ends changes by one.  The extra one
        // is weighted away instead of branched over, which would be mistaken
        // every few pixels.
        uint32 start = axis_.start;
        for (size_t i = 0; i < count; ++i, start += axis_.step) {
            const BoxSpan span(start, start + axis_.step);
            averageOf(span, whole - 1, dst + i * kPixelBytes, src);
        }
    }

    // The most whole pixels for which picking from windows is the faster way.
    static constexpr uint32 kMostClose = kVectorsAreWide && sizeof(T) == sizeof(uint16) ? 4 : 0;

    // False when the source row is too short for windows.
    template <uint32 kWhole>
    HWY_INLINE bool averageClose(uint32 whole, uint8 *dst, const uint8 *src, size_t count) const {
        if constexpr (kWhole == 0) {
            return false;
        } else {
            if (whole != kWhole)
                return averageClose<kWhole - 1>(whole, dst, src, count);
            const size_t limit = BoxBody<kWhole>::limit(axis_.srcSize);
            if (limit != 0)
                walkWindows(count, limit, BoxBody<kWhole>{dst, src, axis_});
            return limit != 0;
        }
    }

    // The average of a span with whole pixels behind its first one, and then one
    // more or the last one.
    HWY_INLINE void averageOf(const BoxSpan &span, size_t whole, uint8 *dst,
                              const uint8 *src) const {
        const size_t middle = span.first + 1 + whole;
        const bool isLast = middle == span.last;
        for (size_t channel = 0; channel < 4; channel += kLanes<typename BoxSums<T>::D>) {
            const BoxSums<T> sums(src + channel);
            auto sum = sums.weighted(span.first, span.head);
            sum = hn::Add(sum, sums.run(span.first + 1, whole));
            sum = hn::Add(sum, sums.weighted(middle, isLast ? span.tail : 256));
            sum = hn::Add(sum, sums.weighted(span.last, isLast ? 0 : span.tail));
            hn::StoreU(normalised(sum, axis_.normaliser), hn::CappedTag<uint8, 4>(), dst + channel);
        }
    }

    const ScaleAxis &axis_;
    uint32 inner_;
};

} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
