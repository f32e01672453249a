// The horizontal pass of the scaler where it averages.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_SCALE_BOX_ROWS_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_SCALE_BOX_ROWS_INL_H
#undef QUILLON_SCALE_BOX_ROWS_INL_H
#else
#define QUILLON_SCALE_BOX_ROWS_INL_H
#endif

#include "hwy/highway.h"

#include "scale/boxSpans-inl.h"
#include "scale/channels-inl.h"
#include "scale/pixelRows-inl.h"
#include "scale/scaleAxis.h"
#include "simd/thresholds.h"

#include <algorithm>

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {
#if QUILLON_HAS_VECTORS

// ---- Averages of 2, 4 and 8 whole pixels ----------------------------------

template <bool kPrefetches>
struct HalfBody {
    uint8_t *dst;
    const uint8_t *src;

    template <class C, class Access>
    HWY_INLINE void operator()(C /*chunk*/, size_t i, Access access) const {
        const PixelTag<C> d;
        prefetchSource<kPrefetches>(src + 8 * i, 8 * C::kUnits);
        const auto pixels = Neighbours<PixelTag<C>>::load(d, src + 8 * i);
        const auto halfDifference =
            hn::And(hn::ShiftRight<1>(hn::Xor(pixels.left, pixels.right)), hn::Set(d, 0x7F7F7F7Fu));
        access.store(d, hn::Add(hn::And(pixels.left, pixels.right), halfDifference), dst + 4 * i);
    }
};

template <bool kPrefetches, uint32_t kLog2Step>
struct WholeSpansBody {
    uint8_t *dst;
    const uint8_t *src;
    uint32_t normaliser;

    template <class C, class Access>
    HWY_INLINE void operator()(C /*chunk*/, size_t i, Access access) const {
        const PixelTag<C> d;
        const uint8_t *from = src + 4 * (i << kLog2Step);
        prefetchSource<kPrefetches>(from, 4 * (C::kUnits << kLog2Step));
        const auto sums = sumOfEach<kLog2Step>(d, from);
        access.store(d, sums.average(normaliser), dst + 4 * i);
    }

private:
    // The sums of 2^k pixels each.
    template <uint32_t k, class D>
    static HWY_INLINE ChannelSums<D> sumOfEach(D d, const uint8_t *from) {
        if constexpr (k == 1) {
            const auto pixels = Neighbours<D>::load(d, from);
            ChannelSums<D> sums;
            sums.add(pixels.left);
            sums.add(pixels.right);
            return sums;
        } else {
            const auto low = sumOfEach<k - 1>(d, from);
            const auto high = sumOfEach<k - 1>(d, from + (kBytesOf<D> << (k - 1)));
            return ChannelSums<D>::ofNeighbours(low, high);
        }
    }
};

// ---- Short spans ----------------------------------------------------------

// Lookups that give both halves of a lane its bytes kLower and kUpper, or 0 for kNoByte.
inline constexpr uint8_t kNoByte = 0x80;
template <uint8_t kLower, uint8_t kUpper>
struct BytesInHalves {
    alignas(16) uint8_t from[16] = {};
    constexpr BytesInHalves() {
        for (size_t i = 0; i < 16; ++i) {
            const uint8_t byte = i % 2 == 0 ? kLower : kUpper;
            from[i] = byte == kNoByte ? byte : static_cast<uint8_t>(i / 4 * 4 + byte);
        }
    }
};
template <uint8_t kLower, uint8_t kUpper>
inline constexpr BytesInHalves<kLower, kUpper> kBytesInHalves;

template <uint8_t kLower, uint8_t kUpper, class D>
HWY_INLINE hn::Vec<D> bytesToHalves(D d, hn::Vec<D> v) {
    const hn::Repartition<uint8_t, D> d8;
    const auto from = hn::LoadDup128(d8, kBytesInHalves<kLower, kUpper>.from);
    return hn::BitCast(d, hn::TableLookupBytesOr0(hn::BitCast(d8, v), from));
}

// Averages over kWhole pixels and a fraction, none of which reaches to the last
// pixel.
template <bool kPrefetches, uint32_t kWhole>
struct ShortSpansBody {
    static constexpr uint32_t kWindows = kWhole + 1;

    uint8_t *dst;
    const uint8_t *src;
    ScaleAxis axis;

    // The most pixels in a chunk for a source row, 0 where it is too short for any.
    static size_t limit(uint32_t srcSize) {
        return srcSize > kWindows ? (srcSize - kWindows) / kWindows : 0;
    }

    template <class C, class Access>
    HWY_INLINE void operator()(C /*chunk*/, size_t i, Access access) const {
        const PixelTag<C> d;
        const hn::Repartition<uint16_t, PixelTag<C>> d16;
        const uint32_t start = axis.start + static_cast<uint32_t>(i) * axis.step;
        const uint32_t base =
            std::min(start >> 16, axis.srcSize - kWindows - kWindows * uint32_t{C::kUnits});
        const auto x = positionsFrom(d, start - (base << 16), axis.step);
        const auto end = hn::Add(x, hn::Set(d, axis.step));
        const auto index = hn::ShiftRight<16>(x);

        // Weights are 256ths, once for each half of a lane.
        const auto rest = hn::Sub(hn::Set(d, kScaleOne), hn::And(x, hn::Set(d, 0xFFFFu)));
        const auto head = bytesToHalves<1, 2>(d, rest), tail = bytesToHalves<1, kNoByte>(d, end);
        // The pixel kWhole behind the first is the last one, or one before it.
        const auto isLast = hn::Eq(hn::ShiftRight<16>(end), hn::Add(index, hn::Set(d, kWhole)));
        const auto middle = hn::IfThenElse(isLast, tail, hn::Set(d, 0x01000100u));
        const auto behind = hn::IfThenZeroElse(isLast, tail);

        const uint8_t *window = src + size_t{4} * base;
        prefetchSource<kPrefetches>(window, 4 * kWindows * C::kUnits);
        ChannelSums<PixelTag<C>> sums;
        sums.add(pickFromWindows<kWindows>(d, window, index), hn::BitCast(d16, head));
        for (uint32_t whole = 1; whole < kWhole; ++whole)
            sums.add(pickFromWindows<kWindows>(d, window += 4, index));
        sums.add(pickFromWindows<kWindows>(d, window += 4, index), hn::BitCast(d16, middle));
        sums.add(pickFromWindows<kWindows>(d, window += 4, index), hn::BitCast(d16, behind));
        access.store(d, sums.average(axis.normaliser), dst + 4 * i);
    }
};

// ---- Rows -----------------------------------------------------------------

// Averages over the step: the pixels at both ends count by their part, those
// between whole.  The last source pixel enters no sum; what would begin there is a
// copy of it.  Lanes of sums are of type T (see SpanSums).
template <class T>
class BoxRow {
public:
    BoxRow(const ScaleAxis &axis, bool prefetches)
        : axis_(axis), prefetches_(prefetches),
          inner_(std::min(stepsBefore(axis.start, axis.lastPosition(), axis.step), axis.dstSize)) {}

    HWY_NOINLINE void operator()(uint8_t *dst, const uint8_t *src) const {
        if (inner_ != 0) {
            averageInside(dst, src, inner_ - 1);
            // Only the last span can reach to the last pixel; it ends there.
            const uint32_t start = axis_.start + (inner_ - 1) * axis_.step;
            const BoxSpan span(start, std::min(start + axis_.step, axis_.lastPosition()));
            averageSpan<T>(span, span.last - span.first - 1, axis_.normaliser,
                           dst + size_t{4} * (inner_ - 1), src);
        }
        fillPixels(dst + size_t{4} * inner_, src, axis_.srcSize - 1, axis_.dstSize - inner_);
    }

private:
    HWY_INLINE void averageInside(uint8_t *dst, const uint8_t *src, size_t count) const {
        // Steps of whole pixels begin on whole pixels.
        const uint8_t *first = src + size_t{4} * (axis_.start >> 16);
        if (axis_.isHalf())
            return walkPixelsOf<HalfBody>(prefetches_, count, count, dst, first);
        if (axis_.step == 4 * kScaleOne)
            return walkPixelsOf<WholeSpansBody, 2>(prefetches_, count, count, dst, first,
                                                   axis_.normaliser);
        if (axis_.step == 8 * kScaleOne)
            return walkPixelsOf<WholeSpansBody, 3>(prefetches_, count, count, dst, first,
                                                   axis_.normaliser);
        const uint32_t whole = axis_.step >> 16;
        if (whole <= kMostWhole && averageShortSpans<kMostWhole>(whole, dst, src, count))
            return;
        // The number of pixels between the ends changes by one.  The extra one is
        // weighted away, as a branch over it would be mispredicted every few pixels.
        uint32_t start = axis_.start;
        const ptrdiff_t distance = prefetches_ ? kPrefetchUncached : 0;
        for (size_t i = 0; i < count; ++i, start += axis_.step) {
            const BoxSpan span(start, start + axis_.step);
            prefetchLines(src + 4 * span.first, size_t{4} * whole, distance);
            averageSpan<T>(span, whole - 1, axis_.normaliser, dst + 4 * i, src);
        }
    }

    static constexpr uint32_t kMostWhole =
        sizeof(T) == sizeof(uint16_t) ? scaleMostBoxPixels(kVectorBytes) : 0;

    // False where the source row is too short for windows.
    template <uint32_t kWhole>
    HWY_INLINE bool averageShortSpans(uint32_t whole, uint8_t *dst, const uint8_t *src,
                                      size_t count) const {
        if constexpr (kWhole == 0) {
            return false;
        } else {
            if (whole != kWhole)
                return averageShortSpans<kWhole - 1>(whole, dst, src, count);
            const size_t limit = ShortSpansBody<false, kWhole>::limit(axis_.srcSize);
            if (limit != 0)
                walkPixelsOf<ShortSpansBody, kWhole>(prefetches_, count, limit, dst, src, axis_);
            return limit != 0;
        }
    }

    ScaleAxis axis_;
    bool prefetches_;
    uint32_t inner_;
};

#endif
} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
