// The horizontal pass of the scaler where it averages.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_RASTER_SCALE_BOX_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_RASTER_SCALE_BOX_INL_H
#undef QUILLON_RASTER_SCALE_BOX_INL_H
#else
#define QUILLON_RASTER_SCALE_BOX_INL_H
#endif

#include "legacy/kernels-inl.h"
#include "scale/scaleKernels.h"
#include "scale/scaleVectors-inl.h"

#include "hwy/highway.h"

#include <algorithm>
#include <type_traits>

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {

// A span of source pixels: the first and the last count by a weight in 256ths,
// those between whole.
struct BoxSpan {
    BoxSpan(uint32_t start, uint32_t end)
        : first(start >> 16), last(end >> 16), head((kScaleOne - (start & 0xFFFF)) >> 8),
          tail((end & 0xFFFF) >> 8) {}

    size_t first, last;
    uint32_t head, tail; // 1 to 256, 0 to 255
};

// Averages of exactly two pixels.
struct HalfBody {
    uint8_t *dst;
    const uint8_t *src;

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        const Neighbours<D> pixels(d, src + 2 * i * kPixelBytes);
        const auto halfDifference =
            hn::And(hn::ShiftRight<1>(hn::Xor(pixels.left, pixels.right)), hn::Set(d, 0x7F7F7F7Fu));
        storePixels(hn::Add(hn::And(pixels.left, pixels.right), halfDifference), d,
                    dst + i * kPixelBytes);
    }
};

// Averages of two by two pixels, by halves in both directions: a row counts 255
// of 256, which takes one off a channel that is not 0.  All pixels are handed
// over as their complements, of which the average that is rounded up is the one
// rounded down.
struct QuarterMix {
    template <bool kInOrder, class D>
    static HWY_INLINE Neighbours<D> complementsAt(D d, const uint8_t *from) {
        const auto low = hn::Not(loadPixels(d, from));
        const auto high = hn::Not(loadPixels(d, from + kLanes<D> * kPixelBytes));
        return kInOrder ? Neighbours<D>(d, low, high) : Neighbours<D>::unordered(d, low, high);
    }

    template <class D>
    static HWY_INLINE hn::Vec<D> of([[maybe_unused]] D d, const Neighbours<D> &upper,
                                    const Neighbours<D> &lower) {
#if HWY_TARGET == HWY_SCALAR
        ChannelSums<D> sums;
        for (const Neighbours<D> &row : {upper, lower}) {
            ChannelSums<D> pair;
            pair.add(hn::Not(row.left));
            pair.add(hn::Not(row.right));
            sums.add(pair.average(kScaleOne / 2), ChannelPairs<D>::weight(255));
        }
        return sums.average(kScaleOne / 2);
#else
        const hn::Repartition<uint8_t, D> d8;
        const auto one = hn::Set(d8, uint8_t{1});
        const auto row = [&](const Neighbours<D> &pixels) HWY_ATTR {
            return hn::SaturatedAdd(
                hn::AverageRound(hn::BitCast(d8, pixels.left), hn::BitCast(d8, pixels.right)), one);
        };
        return hn::BitCast(d, hn::Not(hn::AverageRound(row(upper), row(lower))));
#endif
    }
};

// With kToEnd, also the pixel behind the whole ones, which counts for its left
// half alone.
template <class Store, bool kToEnd>
struct QuarterBody {
    uint8_t *dst;
    const uint8_t *upper, *lower;
    uint32_t whole;

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        const size_t offset = 2 * i * kPixelBytes;
        auto above = QuarterMix::complementsAt<kToEnd>(d, upper + offset);
        auto below = QuarterMix::complementsAt<kToEnd>(d, lower + offset);
        if constexpr (kToEnd) {
            const auto isWhole =
                hn::Lt(hn::Iota(d, 0), hn::Set(d, whole - static_cast<uint32_t>(i)));
            const auto black = hn::Set(d, 0xFFFFFFFFu); // its complement
            above.right = hn::IfThenElse(isWhole, above.right, black);
            below.right = hn::IfThenElse(isWhole, below.right, black);
        }
        auto mixed = QuarterMix::of(d, above, below);
        if constexpr (!kToEnd)
            mixed = Neighbours<D>::inOrder(mixed);
        storePixelsBy<Store>(mixed, d, dst + i * kPixelBytes);
    }
};

// Two source rows made one of half their length.  The last pixel enters no
// average; behind them there are copies of it.
class RasterScaleRowQuarter {
public:
    explicit RasterScaleRowQuarter(const ScaleAxis &axis)
        : first_(axis.start >> 16), last_(axis.srcSize - 1), count_(axis.dstSize) {
        const uint32_t before = first_ < last_ ? last_ - first_ : 0;
        whole_ = std::min(before / 2, count_);
        averaged_ = std::min((before + 1) / 2, count_);
    }

    template <class Store>
    HWY_INLINE void write(uint8_t *dst, const uint8_t *upper, const uint8_t *lower) const {
        const size_t offset = size_t{first_} * kPixelBytes;
        const QuarterBody<ThroughCaches, true> toEnd = {dst, upper + offset, lower + offset,
                                                        whole_};
        if constexpr (!std::is_same_v<Store, ThroughCaches>)
            walkStreaming<uint32_t, kPixelBytes>(
                dst, averaged_, toEnd,
                QuarterBody<Store, true>{dst, toEnd.upper, toEnd.lower, whole_});
        else
            writeInside(toEnd);
        if (averaged_ != count_)
            copyLast(dst, upper, lower);
    }

private:
    HWY_INLINE void writeInside(const QuarterBody<ThroughCaches, true> &toEnd) const {
        const Widest<uint32_t> d;
        constexpr uint32_t n = kPixels<decltype(d)>;
        if (averaged_ < n)
            return walkAgain<uint32_t>(averaged_, toEnd);
        const QuarterBody<ThroughCaches, false> inside = {toEnd.dst, toEnd.upper, toEnd.lower, 0};
        uint32_t i = 0;
        for (; whole_ - i >= n; i += n)
            inside(d, i);
        if (i != averaged_)
            toEnd(d, averaged_ - n);
    }

    HWY_NOINLINE void copyLast(uint8_t *dst, const uint8_t *upper, const uint8_t *lower) const {
        const hn::CappedTag<uint32_t, 1> d;
        const size_t offset = size_t{last_} * kPixelBytes;
        const auto above = hn::Not(loadPixels(d, upper + offset));
        const auto below = hn::Not(loadPixels(d, lower + offset));
        const auto mixed = QuarterMix::of(d, {d, above, above}, {d, below, below});
        walkAgain<uint32_t>(count_ - averaged_,
                            FillBody{dst + size_t{averaged_} * kPixelBytes, hn::GetLane(mixed)});
    }

    uint32_t first_, last_, count_;
    uint32_t whole_;    // pixels that are averages of four
    uint32_t averaged_; // the same, and the one of two
};

// Averages of 2^kDoublings whole pixels.
template <uint32_t kDoublings>
struct WholeBody {
    uint8_t *dst;
    const uint8_t *src;
    uint32_t normaliser;

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        const auto total = sum<kDoublings>(d, src + (i << kDoublings) * kPixelBytes);
        storePixels(total.average(normaliser), d, dst + i * kPixelBytes);
    }

private:
    template <uint32_t k, class D>
    static HWY_INLINE ChannelSums<D> sum(D d, const uint8_t *from) {
        if constexpr (k == 1) {
            const Neighbours<D> pixels(d, from);
            ChannelSums<D> sums;
            sums.add(pixels.left);
            sums.add(pixels.right);
            return sums;
        } else {
            const size_t half = (kLanes<D> << (k - 1)) * kPixelBytes;
            return ChannelSums<D>::ofNeighbours(sum<k - 1>(d, from), sum<k - 1>(d, from + half));
        }
    }
};

// Averages over kWhole pixels and a fraction, none of which reaches to the last
// pixel.
template <uint32_t kWhole>
struct BoxBody {
    static constexpr uint32_t kWindows = kWhole + 1;

    uint8_t *dst;
    const uint8_t *src;
    const ScaleAxis &axis;

    // How wide vectors can be for a source row.
    static size_t limit(uint32_t srcSize) {
        return srcSize > kWindows ? (srcSize - kWindows) / kWindows : 0;
    }

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        using Channels = ChannelPairs<D>;
        const uint32_t start = axis.start + static_cast<uint32_t>(i) * axis.step;
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

        const uint32_t base =
            std::min(start >> 16, axis.srcSize - kWindows - kWindows * kPixels<D>);
        const auto offset = hn::Sub(first, hn::Set(d, base));
        const uint8_t *window = src + size_t{base} * kPixelBytes;
        ChannelSums<D> sums;
        sums.add(pick<kWindows>(d, window, offset), Channels::weights(head));
        for (uint32_t whole = 1; whole < kWhole; ++whole)
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

    explicit BoxSums(const uint8_t *channel) : channel_(channel) {}

    // The weight is at most 256, which takes the pixel whole.
    HWY_INLINE V weighted(size_t index, uint32_t weight) const {
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
        const hn::Rebind<uint8_t, DT> d8;
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

    const uint8_t *channel_;
};

HWY_INLINE auto normalised(hn::Vec<hn::CappedTag<uint16_t, 4>> sum, uint32_t normaliser) {
    const hn::CappedTag<uint16_t, 4> d;
    const auto average = hn::MulHigh(sum, hn::Set(d, static_cast<uint16_t>(normaliser)));
    return hn::DemoteTo(hn::CappedTag<uint8_t, 4>(),
                        hn::BitCast(hn::RebindToSigned<decltype(d)>(), average));
}

HWY_INLINE auto normalised(hn::Vec<hn::CappedTag<uint32_t, 4>> sum, uint32_t normaliser) {
    const hn::CappedTag<uint32_t, 4> d;
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

    HWY_NOINLINE void operator()(uint8_t *dst, const uint8_t *src) const {
        if (inner_ != 0) {
            averageInside(dst, src, inner_ - 1);
            // Only the last span can reach to the last pixel; it ends there.
            const uint32_t start = axis_.start + (inner_ - 1) * axis_.step;
            const BoxSpan span(start, std::min(start + axis_.step, axis_.lastPosition()));
            averageOf(span, span.last - span.first - 1, dst + size_t{inner_ - 1} * kPixelBytes,
                      src);
        }
        fillPixels(dst + size_t{inner_} * kPixelBytes, src, axis_.srcSize - 1,
                   axis_.dstSize - inner_);
    }

private:
    HWY_INLINE void averageInside(uint8_t *dst, const uint8_t *src, size_t count) const {
        if (axis_.isHalf())
            return walkAgain<uint32_t>(
                count, HalfBody{dst, src + size_t{axis_.start >> 16} * kPixelBytes});
        // Steps of whole pixels begin on whole pixels.
        const uint8_t *first = src + size_t{axis_.start >> 16} * kPixelBytes;
        if (axis_.step == 4 * kScaleOne)
            return walkAgain<uint32_t>(count, WholeBody<2>{dst, first, axis_.normaliser});
        if (axis_.step == 8 * kScaleOne)
            return walkAgain<uint32_t>(count, WholeBody<3>{dst, first, axis_.normaliser});
        const uint32_t whole = axis_.step >> 16;
        if (whole <= kMostClose && averageClose<kMostClose>(whole, dst, src, count))
            return;
        // The number of pixels between the ends changes by one.  The extra one
        // is weighted away instead of branched over, which would be mistaken
        // every few pixels.
        uint32_t start = axis_.start;
        for (size_t i = 0; i < count; ++i, start += axis_.step) {
            const BoxSpan span(start, start + axis_.step);
            averageOf(span, whole - 1, dst + i * kPixelBytes, src);
        }
    }

    // The most whole pixels for which picking from windows is the faster way.
    static constexpr uint32_t kMostClose = kVectorsAreWide && sizeof(T) == sizeof(uint16_t) ? 4 : 0;

    // False when the source row is too short for windows.
    template <uint32_t kWhole>
    HWY_INLINE bool averageClose(uint32_t whole, uint8_t *dst, const uint8_t *src,
                                 size_t count) const {
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
    HWY_INLINE void averageOf(const BoxSpan &span, size_t whole, uint8_t *dst,
                              const uint8_t *src) const {
        const size_t middle = span.first + 1 + whole;
        const bool isLast = middle == span.last;
        for (size_t channel = 0; channel < 4; channel += kLanes<typename BoxSums<T>::D>) {
            const BoxSums<T> sums(src + channel);
            auto sum = sums.weighted(span.first, span.head);
            sum = hn::Add(sum, sums.run(span.first + 1, whole));
            sum = hn::Add(sum, sums.weighted(middle, isLast ? span.tail : 256));
            sum = hn::Add(sum, sums.weighted(span.last, isLast ? 0 : span.tail));
            hn::StoreU(normalised(sum, axis_.normaliser), hn::CappedTag<uint8_t, 4>(),
                       dst + channel);
        }
    }

    const ScaleAxis &axis_;
    uint32_t inner_;
};

} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
