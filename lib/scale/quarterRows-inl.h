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

// The same by vectors of every fourth pixel, for twice as many as a vector has.
HWY_INLINE void averageSplitQuarters(uint8_t *dst, const uint8_t *upper, const uint8_t *lower) {
    const Widest<uint32_t> d;
    const Widest<uint8_t> d8;
    using Pixels = hn::Vec<decltype(d)>;
    Pixels above[4], below[4];
    hn::LoadInterleaved4(d, reinterpret_cast<const uint32_t *>(upper), above[0], above[1], above[2],
                         above[3]);
    hn::LoadInterleaved4(d, reinterpret_cast<const uint32_t *>(lower), below[0], below[1], below[2],
                         below[3]);
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
    uint8_t *dst;
    const uint8_t *upper, *lower;
    uint32_t whole;

    template <class C, class Access>
    HWY_INLINE void operator()(C /*chunk*/, size_t i, Access access) const {
        if constexpr (C::kUnits == 2 * kVectorPixels)
            return averageSplitQuarters(dst + 4 * i, upper + 8 * i, lower + 8 * i);
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
    explicit QuarterRow(const ScaleAxis &axis)
        : first_(axis.start >> 16), last_(axis.srcSize - 1), count_(axis.dstSize) {
        const uint32_t before = first_ < last_ ? last_ - first_ : 0;
        whole_ = std::min(before / 2, count_);
        averaged_ = std::min((before + 1) / 2, count_);
    }

    HWY_INLINE void operator()(uint8_t *dst, const uint8_t *upper, const uint8_t *lower) const {
        const size_t offset = size_t{4} * first_;
        const QuarterBody<true> toEnd = {dst, upper + offset, lower + offset, whole_};
        if (averaged_ < kVectorPixels)
            walkPixels(averaged_, toEnd);
        else if constexpr (std::is_same_v<Access, NonTemporal>)
            walkAlignedRow<NonTemporal>(Chunk<kVectorPixels>(), averaged_, toEnd);
        else
            averageLongRow(toEnd);
        if (averaged_ != count_) {
            const size_t last = size_t{4} * last_;
            copyLastQuarter(dst + size_t{4} * averaged_, upper + last, lower + last,
                            count_ - averaged_);
        }
    }

private:
    // What whole chunks leave of the averages fits into the last chunk of the row.
    HWY_INLINE void averageLongRow(const QuarterBody<true> &toEnd) const {
        constexpr RowPolicy kInner = {.tail = Tail::kNone};
        const Chunk<kVectorPixels> chunk;
        const QuarterBody<false> inside = {toEnd.dst, toEnd.upper, toEnd.lower, whole_};
        size_t begin = 0;
        if constexpr (kHasInterleavedAccess) {
            constexpr RowPolicy kSplit = {.tail = Tail::kNone, .unroll = 2};
            constexpr Chunk<2 * kVectorPixels> kChunk;
            walkRow<kSplit>(kChunk, whole_, inside);
            begin = whole_ - whole_ % kChunk.kUnits;
        }
        walkFrom<kInner, Unaligned>(chunk, begin, whole_, inside);
        if (whole_ - whole_ % kVectorPixels != averaged_)
            toEnd(chunk, averaged_ - kVectorPixels, Unaligned());
    }

    uint32_t first_, last_, count_;
    uint32_t whole_;    // pixels that are averages of four
    uint32_t averaged_; // the same, and the one of two
};

#endif
} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
