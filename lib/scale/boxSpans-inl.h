// The average of one span of source pixels, of any length.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_SCALE_BOX_SPANS_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_SCALE_BOX_SPANS_INL_H
#undef QUILLON_SCALE_BOX_SPANS_INL_H
#else
#define QUILLON_SCALE_BOX_SPANS_INL_H
#endif

#include "hwy/highway.h"

#include "scale/scaleAxis.h"
#include "simd/access-inl.h"
#include "simd/target-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {
#if QUILLON_HAS_VECTORS

// A span of source pixels: the first and the last count by a weight in 256ths,
// those between whole.
struct BoxSpan {
    HWY_INLINE BoxSpan(uint32_t start, uint32_t end)
        : first(start >> 16), last(end >> 16), head((kScaleOne - (start & 0xFFFF)) >> 8),
          tail((end & 0xFFFF) >> 8) {}

    size_t first, last;
    uint32_t head, tail; // 1 to 256, 0 to 255
};

// Spans of up to so many pixels have sums that fit 16 bits: 257 * 255 is 65535.
inline constexpr uint32_t kMostPixelsIn16 = 257;

// Sums of the pixels of a row, in lanes of type T, one for each channel.
template <class T>
class SpanSums {
public:
    using D = hn::CappedTag<T, 4>;
    using V = hn::Vec<D>;

    HWY_INLINE explicit SpanSums(const uint8_t *row) : row_(row) {}

    // One pixel.  The weight is at most 256, which counts it whole.
    HWY_INLINE V weighted(size_t index, uint32_t weight) const {
        return hn::ShiftRight<8>(hn::Mul(load(D(), index), hn::Set(D(), static_cast<T>(weight))));
    }

    // count whole pixels.
    HWY_INLINE V whole(size_t index, size_t count) const {
        auto sums = hn::Zero(WideD());
        for (; count >= kWidePixels; count -= kWidePixels, index += kWidePixels)
            sums = hn::Add(sums, load(WideD(), index));
        return addRest<kWidePixels / 2>(index, count, fold(WideD(), sums));
    }

private:
    using WideD = Widest<T>;
    static constexpr size_t kWidePixels = kLanes<WideD> / 4;

    template <class DT>
    HWY_INLINE hn::Vec<DT> load(DT d, size_t index) const {
        return hn::PromoteTo(d, loadBytes(hn::Rebind<uint8_t, DT>(), row_ + 4 * index));
    }

    // Fewer than 2 * kPixels pixels.
    template <size_t kPixels>
    HWY_INLINE V addRest([[maybe_unused]] size_t index, [[maybe_unused]] size_t count,
                         V sum) const {
        if constexpr (kPixels == 0) {
            return sum;
        } else {
            if (count & kPixels) {
                const hn::CappedTag<T, 4 * kPixels> d;
                sum = hn::Add(sum, fold(d, load(d, index)));
                index += kPixels;
            }
            return addRest<kPixels / 2>(index, count, sum);
        }
    }

    // The sum of the pixels in a vector.
    template <class DT>
    static HWY_INLINE V fold([[maybe_unused]] DT d, hn::Vec<DT> sums) {
        if constexpr (kLanes<DT> == 4) {
            return sums;
        } else {
            const hn::Half<DT> half;
            return fold(half, hn::Add(hn::LowerHalf(half, sums), hn::UpperHalf(half, sums)));
        }
    }

    const uint8_t *row_;
};

// sum * normaliser / 65536 in bytes, which it fits.
HWY_INLINE auto normaliseToBytes(hn::CappedTag<uint16_t, 4> d, hn::Vec<decltype(d)> sum,
                                 uint32_t normaliser) {
    const auto average = hn::MulHigh(sum, hn::Set(d, static_cast<uint16_t>(normaliser)));
    return hn::DemoteTo(hn::CappedTag<uint8_t, 4>(),
                        hn::BitCast(hn::RebindToSigned<decltype(d)>(), average));
}
HWY_INLINE auto normaliseToBytes(hn::CappedTag<uint32_t, 4> d, hn::Vec<decltype(d)> sum,
                                 uint32_t normaliser) {
    return hn::U8FromU32(hn::ShiftRight<16>(hn::Mul(sum, hn::Set(d, normaliser))));
}

// The average of a span with so many whole pixels behind its first one, and then
// one more or the last one.
template <class T>
HWY_INLINE void averageSpan(const BoxSpan &span, size_t whole, uint32_t normaliser, uint8_t *dst,
                            const uint8_t *src) {
    const typename SpanSums<T>::D d;
    const SpanSums<T> sums(src);
    const size_t middle = span.first + 1 + whole;
    const bool isLast = middle == span.last;
    auto sum = sums.weighted(span.first, span.head);
    sum = hn::Add(sum, sums.whole(span.first + 1, whole));
    sum = hn::Add(sum, sums.weighted(middle, isLast ? span.tail : 256));
    sum = hn::Add(sum, sums.weighted(span.last, isLast ? 0 : span.tail));
    storeBytes(hn::CappedTag<uint8_t, 4>(), normaliseToBytes(d, sum, normaliser), dst);
}

#endif
} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
