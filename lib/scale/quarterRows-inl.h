// Both passes of the scaler at once, for averages of two by two pixels: from two
// source rows straight to a destination row.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_SCALE_QUARTER_ROWS_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_SCALE_QUARTER_ROWS_INL_H
#undef QUILLON_SCALE_QUARTER_ROWS_INL_H
#else
#define QUILLON_SCALE_QUARTER_ROWS_INL_H
#endif

#include "hwy/highway.h"

#include "scale/channels-inl.h"
#include "scale/pixelRows-inl.h"
#include "scale/scaleAxis.h"

#include <algorithm>
#include <type_traits>

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {
#if QUILLON_HAS_VECTORS

// The averages of each pixel with its neighbour, in two rows.  A row counts 255 of
// 256, which takes one off a channel that is not 0.  The pixels are handed over as
// their complements, of which the average that is rounded up is the one rounded
// down.
template <class D>
HWY_INLINE hn::Vec<D> averageQuarters(D d, const Neighbours<D> &upper, const Neighbours<D> &lower) {
    const hn::Repartition<uint8_t, D> d8;
    const auto one = hn::Set(d8, uint8_t{1});
    const auto averageRow = [&](const Neighbours<D> &pixels) HWY_ATTR {
        return hn::SaturatedAdd(
            hn::AverageRound(hn::BitCast(d8, pixels.left), hn::BitCast(d8, pixels.right)), one);
    };
    return hn::BitCast(d, hn::Not(hn::AverageRound(averageRow(upper), averageRow(lower))));
}

// Every fourth pixel of a row, from each of the first four on, by vectors.
using SplitPixels = hn::Vec<Widest<uint32_t>>[4];

HWY_INLINE void loadSplitPixels(const uint8_t *from, SplitPixels &pixels) {
    const Widest<uint32_t> d;
    hn::LoadInterleaved4(d, reinterpret_cast<const uint32_t *>(from), pixels[0], pixels[1],
                         pixels[2], pixels[3]);
}

// The same averages of twice as many pixels as a vector has.
HWY_INLINE void storeSplitQuarters(const SplitPixels &above, const SplitPixels &below,
                                   uint8_t *dst) {
    const Widest<uint32_t> d;
    const Widest<uint8_t> d8;
    using Pixels = hn::Vec<decltype(d)>;
    const auto averageRow = [&](Pixels left, Pixels right) HWY_ATTR {
        const auto average = averageDown(d8, hn::BitCast(d8, left), hn::BitCast(d8, right));
        return hn::SaturatedSub(average, hn::Set(d8, uint8_t{1}));
    };
    const auto average = [&](size_t k) HWY_ATTR {
        return hn::BitCast(d, averageDown(d8, averageRow(above[k], above[k + 1]),
                                          averageRow(below[k], below[k + 1])));
    };
    hn::StoreInterleaved2(average(0), average(2), d, reinterpret_cast<uint32_t *>(dst));
}

// Pixels that are averages of four or, with kToEnd, also the one behind them, which
// is the average of its left half and black.
template <bool kToEnd>
struct QuarterBody {
    static constexpr size_t kDstBytes = 4;
    static constexpr size_t kMovingUnits = 2 * kVectorPixels;
    uint8_t *dst;
    const uint8_t *upper, *lower;
    uint32_t whole;
    bool prefetches; // around the caches

    template <class C, class Access>
    HWY_INLINE void operator()([[maybe_unused]] C chunk, size_t i, Access access) const {
        if constexpr (C::kUnits == kMovingUnits)
            return movedTo(i).takeNext(chunk);
        if (std::is_same_v<Access, NonTemporal> && prefetches) {
            prefetchSource<true>(upper + 8 * i, 8 * C::kUnits);
            prefetchSource<true>(lower + 8 * i, 8 * C::kUnits);
        }
        const PixelTag<C> d;
        auto above = loadComplements(d, upper + 8 * i);
        auto below = loadComplements(d, lower + 8 * i);
        if constexpr (kToEnd) {
            const auto left = hn::Set(d, whole - static_cast<uint32_t>(i));
            const auto isWhole = hn::Lt(hn::Iota(d, 0), left);
            const auto black = hn::Set(d, 0xFFFFFFFFu); // its complement
            above.right = hn::IfThenElse(isWhole, above.right, black);
            below.right = hn::IfThenElse(isWhole, below.right, black);
            access.store(d, averageQuarters(d, above, below), dst + 4 * i);
        } else {
            const auto unordered = averageQuarters(d, above, below);
            access.store(d, laneOrderRestored(d, unordered), dst + 4 * i);
        }
    }

    HWY_INLINE QuarterBody movedTo(size_t i) const {
        return {dst + 4 * i, upper + 8 * i, lower + 8 * i, whole - static_cast<uint32_t>(i),
                prefetches};
    }
    template <class C>
    HWY_INLINE void takeNext(C /*chunk*/) {
        static_assert(C::kUnits == kMovingUnits);
        SplitPixels above, below;
        loadSplitPixels(upper, above);
        loadSplitPixels(lower, below);
        if constexpr (kToEnd) {
            // The last pixel of the row is the only one that may have no right half.
            const Widest<uint32_t> d;
            const auto isWhole = hn::Lt(hn::Add(hn::Iota(d, 0), hn::Iota(d, 1)), hn::Set(d, whole));
            above[3] = hn::IfThenElseZero(isWhole, above[3]);
            below[3] = hn::IfThenElseZero(isWhole, below[3]);
        }
        storeSplitQuarters(above, below, dst);
        upper = advancedInRegister(upper, 8 * C::kUnits);
        lower = advancedInRegister(lower, 8 * C::kUnits);
        dst = advancedInRegister(dst, 4 * C::kUnits);
    }

private:
    template <class D>
    static HWY_INLINE Neighbours<D> loadComplements(D d, const uint8_t *from) {
        const auto low = hn::Not(loadBytes(d, from));
        const auto high = hn::Not(loadBytes(d, from + kBytesOf<D>));
        return kToEnd ? Neighbours<D>::of(d, low, high) : Neighbours<D>::unordered(d, low, high);
    }
};

// count copies of what the last pixels of two rows give.
HWY_NOINLINE void copyLastQuarter(uint8_t *dst, const uint8_t *upper, const uint8_t *lower,
                                  size_t count) {
    const PixelTag<Chunk<1>> d;
    const auto above = hn::Not(loadBytes(d, upper)), below = hn::Not(loadBytes(d, lower));
    const uint32_t pixel = hn::GetLane(averageQuarters(d, {above, above}, {below, below}));
    walkPixels(count, FillPixelsBody{dst, pixel});
}

// The last source pixel enters no average; what would begin there is a copy of it.
template <class Access>
class QuarterRow {
public:
    QuarterRow(const ScaleAxis &axis, bool prefetches)
        : first_(axis.start >> 16), last_(axis.srcSize - 1), count_(axis.dstSize),
          prefetches_(prefetches) {
        const uint32_t before = first_ < last_ ? last_ - first_ : 0;
        whole_ = std::min(before / 2, count_);
        averaged_ = std::min((before + 1) / 2, count_);
    }

    HWY_INLINE void operator()(uint8_t *dst, const uint8_t *upper, const uint8_t *lower) const {
        const size_t offset = size_t{4} * first_;
        const QuarterBody<true> toEnd = {dst, upper + offset, lower + offset, whole_, prefetches_};
        if constexpr (std::is_same_v<Access, NonTemporal>)
            walkPixelsBy<NonTemporal>(averaged_, toEnd);
        else if (averaged_ < kUnits)
            walkPixels(averaged_, toEnd);
        else
            averageLongRow(toEnd);
        if (averaged_ != count_) {
            const size_t last = size_t{4} * last_;
            copyLastQuarter(dst + size_t{4} * averaged_, upper + last, lower + last,
                            count_ - averaged_);
        }
    }

private:
    static constexpr size_t kUnits = kHasInterleavedAccess ? 2 * kVectorPixels : kVectorPixels;

    // What whole chunks leave of the averages fits into the last chunk of the row.
    HWY_INLINE void averageLongRow(const QuarterBody<true> &toEnd) const {
        constexpr RowPolicy kInner = {.tail = Tail::kNone};
        const Chunk<kUnits> chunk;
        const QuarterBody<false> inside = {toEnd.dst, toEnd.upper, toEnd.lower, whole_, false};
        walkRow<kInner>(chunk, whole_, inside);
        if (whole_ - whole_ % kUnits != averaged_)
            toEnd(chunk, averaged_ - kUnits, Unaligned());
    }

    uint32_t first_, last_, count_;
    uint32_t whole_;    // pixels that are averages of four
    uint32_t averaged_; // the same, and the one of two
    bool prefetches_;
};

#endif
} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
