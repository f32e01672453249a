// The horizontal pass of the scaler: one source row made into one row as wide as
// the destination rectangle, by nearest pixels or linear blends.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_RASTER_SCALE_ROWS_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_RASTER_SCALE_ROWS_INL_H
#undef QUILLON_RASTER_SCALE_ROWS_INL_H
#else
#define QUILLON_RASTER_SCALE_ROWS_INL_H
#endif

#include "legacy/kernels-inl.h"
#include "scale/scaleKernels.h"
#include "scale/scaleVectors-inl.h"

#include "hwy/highway.h"

#include <algorithm>
#include <cstring>
#include <type_traits>

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {

// Nearest pixels whose positions advance by at most kWindows pixels: those in
// front of the last pixel or, with kToEnd, any.
template <uint32_t kWindows, class Store, bool kToEnd>
struct NearestBody {
    uint8_t *dst;
    const uint8_t *src;
    uint32_t start, step, srcSize;

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        const uint32_t first = start + static_cast<uint32_t>(i) * step;
        const uint32_t base = std::min(first >> 16, srcSize - kWindows * kPixels<D>);
        auto offset = hn::ShiftRight<16>(positionsFrom(d, first - (base << 16), step));
        if constexpr (kToEnd)
            offset = hn::Min(offset, hn::Set(d, srcSize - 1 - base));
        storePixelsBy<Store>(pick<kWindows>(d, src + size_t{base} * kPixelBytes, offset), d,
                             dst + i * kPixelBytes);
    }
};

// The rows of nearest pixels come in kinds, which differ in how positions advance
// and are chosen once for all rows.  Each pixel is the source pixel of its
// position, or the last one.
class NearestRow {
public:
    explicit NearestRow(const ScaleAxis &axis)
        : start_(axis.start), step_(axis.step), srcSize_(axis.srcSize), count_(axis.dstSize),
          inner_(std::min(stepsBefore(axis.start, axis.lastPosition(), axis.step), axis.dstSize)) {}

protected:
    // What follows the pixels in front of the last one.
    HWY_INLINE void fillBehindInner(uint8_t *dst, const uint8_t *src) const {
        fillPixels(dst + size_t{inner_} * kPixelBytes, src, srcSize_ - 1, count_ - inner_);
    }

    uint32_t start_, step_, srcSize_, count_, inner_;
};

// Positions that wrap come back into the source.
struct RasterScaleRowWrapping : NearestRow {
    using NearestRow::NearestRow;

    HWY_INLINE void operator()(uint8_t *dst, const uint8_t *src) const {
        uint32_t x = start_;
        for (size_t i = 0; i < count_; ++i, x += step_) {
            const size_t index = std::min(x >> 16, srcSize_ - 1);
            std::memcpy(dst + i * kPixelBytes, src + index * kPixelBytes, kPixelBytes);
        }
    }
};

// Steps of one pixel.
struct RasterScaleRowCopy : NearestRow {
    using NearestRow::NearestRow;

    HWY_INLINE void operator()(uint8_t *dst, const uint8_t *src) const {
        std::memcpy(dst, src + size_t{start_ >> 16} * kPixelBytes, size_t{inner_} * kPixelBytes);
        fillBehindInner(dst, src);
    }
};

// Steps of up to kWindows pixels.
template <uint32_t kWindows, class Store>
struct RasterScaleRowClose : NearestRow {
    using NearestRow::NearestRow;

    HWY_INLINE void operator()(uint8_t *dst, const uint8_t *src) const {
        const Widest<uint32_t> d;
        constexpr uint32_t n = kPixels<decltype(d)>;
        const auto toEnd = body<ThroughCaches, true>(dst, src);
        if (srcSize_ < kWindows * n || count_ < n)
            return walkWindows(count_, srcSize_ / kWindows, toEnd);
        if constexpr (!std::is_same_v<Store, ThroughCaches>)
            return walkStreaming<uint32_t, kPixelBytes>(dst, count_, toEnd,
                                                        body<Store, true>(dst, src));
        const auto inside = body<ThroughCaches, false>(dst, src);
        uint32_t i = 0;
        for (; inner_ - i >= n; i += n)
            inside(d, i);
        for (; count_ - i >= n; i += n)
            toEnd(d, i);
        if (i != count_)
            toEnd(d, count_ - n);
    }

private:
    template <class By, bool kToEnd>
    HWY_INLINE NearestBody<kWindows, By, kToEnd> body(uint8_t *dst, const uint8_t *src) const {
        return {dst, src, start_, step_, srcSize_};
    }
};

// Each pixel twice, from an even pixel of the row on.
struct DoubledBody {
    uint8_t *dst;
    const uint8_t *src;

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        storePixels(doubled(d, src + i / 2 * kPixelBytes), d, dst + i * kPixelBytes);
    }

private:
    template <class D>
    static HWY_INLINE hn::Vec<D> doubled(D d, const uint8_t *from) {
        constexpr size_t n = kLanes<D>;
        if constexpr (n <= 2) {
            return hn::Set(d, hn::GetLane(loadPixels(hn::CappedTag<uint32_t, 1>(), from)));
        } else {
#if HWY_TARGET != HWY_SCALAR
            HWY_ALIGN static constexpr uint32_t kTwice[16] = {0, 0, 1, 1, 2, 2, 3, 3,
                                                              4, 4, 5, 5, 6, 6, 7, 7};
            const auto half = loadPixels(hn::Half<D>(), from);
            return hn::TableLookupLanes(hn::ZeroExtendVector(d, half),
                                        hn::SetTableIndices(d, kTwice));
#endif
        }
    }
};

// Steps of half a pixel, from a whole one on.
struct RasterScaleRowDoubled : NearestRow {
    explicit RasterScaleRowDoubled(const ScaleAxis &axis)
        : NearestRow(axis), first_(std::min(axis.start >> 16, axis.srcSize - 1)),
          doubled_(std::min(2 * (axis.srcSize - first_), axis.dstSize)) {}

    HWY_INLINE void operator()(uint8_t *dst, const uint8_t *src) const {
        walkOnce<uint32_t>(doubled_, DoubledBody{dst, src + size_t{first_} * kPixelBytes});
        fillPixels(dst + size_t{doubled_} * kPixelBytes, src, srcSize_ - 1, count_ - doubled_);
    }

private:
    uint32_t first_, doubled_;
};

// Of 2^kDoublings pixels the first.
template <uint32_t kDoublings, class Store>
struct FirstOfEachBody {
    uint8_t *dst;
    const uint8_t *src;

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        storePixelsBy<Store>(firstOfEach<kDoublings>(d, src + (i << kDoublings) * kPixelBytes), d,
                             dst + i * kPixelBytes);
    }

private:
    template <uint32_t k, class D>
    static HWY_INLINE hn::Vec<D> firstOfEach(D d, const uint8_t *from) {
        if constexpr (k == 0) {
            return loadPixels(d, from);
        } else {
            const size_t half = (kLanes<D> << (k - 1)) * kPixelBytes;
            return Neighbours<D>(d, firstOfEach<k - 1>(d, from), firstOfEach<k - 1>(d, from + half))
                .left;
        }
    }
};

// Steps of 2^kDoublings pixels.
template <uint32_t kDoublings, class Store>
struct RasterScaleRowWhole : NearestRow {
    explicit RasterScaleRowWhole(const ScaleAxis &axis)
        : NearestRow(axis), first_(axis.start >> 16),
          whole_(std::min((axis.srcSize - std::min(first_, axis.srcSize)) >> kDoublings,
                          axis.dstSize)) {}

    HWY_INLINE void operator()(uint8_t *dst, const uint8_t *src) const {
        const uint8_t *from = src + size_t{first_} * kPixelBytes;
        const FirstOfEachBody<kDoublings, ThroughCaches> body = {dst, from};
        if constexpr (std::is_same_v<Store, ThroughCaches>)
            walkAgain<uint32_t>(whole_, body);
        else
            walkStreaming<uint32_t, kPixelBytes>(dst, whole_, body,
                                                 FirstOfEachBody<kDoublings, Store>{dst, from});
        if (whole_ != count_)
            writeEnd(dst, src);
    }

private:
    // The pixel whose step reaches behind the row, and copies of the last one.
    HWY_NOINLINE void writeEnd(uint8_t *dst, const uint8_t *src) const {
        const size_t index = size_t{first_} + (size_t{whole_} << kDoublings);
        fillPixels(dst + size_t{whole_} * kPixelBytes, src, index, inner_ - whole_);
        fillBehindInner(dst, src);
    }

    uint32_t first_, whole_; // whole: pixels whose steps lie in the row
};

#if HWY_TARGET <= HWY_AVX3
// Elsewhere gathering a vector is slower than reading its pixels one by one.
template <class Store>
struct GatherBody {
    uint8_t *dst;
    const uint8_t *src;
    uint32_t start, step;

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        const auto x = positionsFrom(d, start + static_cast<uint32_t>(i) * step, step);
        const auto index = hn::BitCast(hn::RebindToSigned<D>(), hn::ShiftRight<16>(x));
        storePixelsBy<Store>(hn::GatherIndex(d, reinterpret_cast<const uint32_t *>(src), index), d,
                             dst + i * kPixelBytes);
    }
};
#endif

// Any steps.
template <class Store>
struct RasterScaleRowSparse : NearestRow {
    using NearestRow::NearestRow;

    HWY_INLINE void operator()(uint8_t *dst, const uint8_t *src) const {
#if HWY_TARGET <= HWY_AVX3
        const GatherBody<ThroughCaches> body = {dst, src, start_, step_};
        if constexpr (std::is_same_v<Store, ThroughCaches>)
            walkAgain<uint32_t>(inner_, body);
        else
            walkStreaming<uint32_t, kPixelBytes>(dst, inner_, body,
                                                 GatherBody<Store>{dst, src, start_, step_});
#else
        pickSingly(dst, src);
#endif
        fillBehindInner(dst, src);
    }

private:
    // Four a turn, read before they are written: the compiler cannot know that
    // the rows do not overlap.
    HWY_INLINE void pickSingly(uint8_t *dst, const uint8_t *src) const {
        uint32_t x = start_;
        uint32_t i = 0;
        for (; inner_ - i >= 4; i += 4, x += 4 * step_) {
            const uint32_t a = pixelAt(src, x), b = pixelAt(src, x + step_);
            const uint32_t c = pixelAt(src, x + 2 * step_), d = pixelAt(src, x + 3 * step_);
            putPixel(dst, i, a);
            putPixel(dst, i + 1, b);
            putPixel(dst, i + 2, c);
            putPixel(dst, i + 3, d);
        }
        for (; i < inner_; ++i, x += step_)
            putPixel(dst, i, pixelAt(src, x));
    }

    static HWY_INLINE uint32_t pixelAt(const uint8_t *src, uint32_t x) {
        uint32_t pixel = 0;
        std::memcpy(&pixel, src + size_t{x >> 16} * kPixelBytes, kPixelBytes);
        return pixel;
    }
    static HWY_INLINE void putPixel(uint8_t *dst, size_t i, uint32_t pixel) {
        std::memcpy(dst + i * kPixelBytes, &pixel, kPixelBytes);
    }
};

struct LinearBody {
    uint8_t *dst;
    const uint8_t *src;
    uint32_t start, step, srcSize;

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        using Channels = ChannelPairs<D>;
        const uint32_t first = start + static_cast<uint32_t>(i) * step;
        const auto x = positionsFrom(d, first, step);
        const uint32_t base = std::min(first >> 16, srcSize - 1 - kPixels<D>);
        const uint8_t *window = src + size_t{base} * kPixelBytes;
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

    HWY_NOINLINE void operator()(uint8_t *dst, const uint8_t *src) const {
        fillPixels(dst, src, 0, leading_);
        dst += size_t{leading_} * kPixelBytes;
        walkWindows(inner_, axis_.srcSize - 1,
                    LinearBody{dst, src, innerStart_, axis_.step, axis_.srcSize});
        dst += size_t{inner_} * kPixelBytes;
        fillPixels(dst, src, axis_.srcSize - 1, axis_.dstSize - leading_ - inner_);
    }

private:
    const ScaleAxis &axis_;
    uint32_t leading_, inner_, innerStart_;
};

} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
