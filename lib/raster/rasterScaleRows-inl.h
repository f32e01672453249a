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

#include "raster/kernels-inl.h"
#include "raster/rasterScaleKernels.h"
#include "raster/rasterScaleVectors-inl.h"

#include "hwy/highway.h"

#include <algorithm>
#include <cstring>
#include <type_traits>

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {

// Nearest pixels whose positions advance by at most kWindows pixels: those in
// front of the last pixel or, with kToEnd, any.
template <uint32 kWindows, class Store, bool kToEnd>
struct NearestBody {
    uint8 *dst;
    const uint8 *src;
    uint32 start, step, srcSize;

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        const uint32 first = start + static_cast<uint32>(i) * step;
        const uint32 base = std::min(first >> 16, srcSize - kWindows * kPixels<D>);
        auto offset = hn::ShiftRight<16>(positionsFrom(d, first - (base << 16), step));
        if constexpr (kToEnd)
            offset = hn::Min(offset, hn::Set(d, srcSize - 1 - base));
        storePixelsBy<Store>(pick<kWindows>(d, src + size_t{base} * kPixelBytes, offset), d,
                             dst + i * kPixelBytes);
    }
};

// Each pixel is the source pixel of its position, or the last one.
class RasterScaleRowNearest {
public:
    explicit RasterScaleRowNearest(const ScaleAxis &axis)
        : axis_(axis), wraps_((uint64_t{axis.step} * (axis.dstSize - 1) + axis.start) >> 32 != 0),
          inner_(std::min(stepsBefore(axis.start, axis.lastPosition(), axis.step), axis.dstSize)) {}

    HWY_INLINE void operator()(uint8 *dst, const uint8 *src) const {
        write<ThroughCaches>(dst, src);
    }

    template <class Store>
    HWY_NOINLINE void write(uint8 *dst, const uint8 *src) const {
        if (wraps_)
            pickAnywhere(dst, src);
        else if (axis_.step == kScaleOne)
            copy(dst, src);
        else if (axis_.step < kScaleOne)
            pickWindows<1, Store>(dst, src);
        else if (kVectorsAreWide && axis_.step <= 2 * kScaleOne && axis_.srcSize >= 2)
            pickWindows<2, Store>(dst, src);
        else if (kVectorsAreWide && axis_.step <= 4 * kScaleOne && axis_.srcSize >= 4)
            pickWindows<4, Store>(dst, src);
        else
            pickSingly(dst, src);
    }

private:
    template <uint32 kWindows, class Store>
    HWY_INLINE NearestBody<kWindows, Store, true> toEnd(uint8 *dst, const uint8 *src) const {
        return {dst, src, axis_.start, axis_.step, axis_.srcSize};
    }

    template <uint32 kWindows, class Store>
    HWY_INLINE void pickWindows(uint8 *dst, const uint8 *src) const {
        const Widest<uint32> d;
        constexpr uint32 n = kPixels<decltype(d)>;
        const auto body = toEnd<kWindows, ThroughCaches>(dst, src);
        const uint32 count = axis_.dstSize;
        if (axis_.srcSize < kWindows * n || count < n)
            return walkWindows(count, axis_.srcSize / kWindows, body);
        if constexpr (!std::is_same_v<Store, ThroughCaches>)
            return walkStreaming<uint32, kPixelBytes>(dst, count, body,
                                                      toEnd<kWindows, Store>(dst, src));
        const NearestBody<kWindows, Store, false> inside = {dst, src, axis_.start, axis_.step,
                                                            axis_.srcSize};
        uint32 i = 0;
        for (; inner_ - i >= n; i += n)
            inside(d, i);
        for (; count - i >= n; i += n)
            body(d, i);
        if (i != count)
            body(d, count - n);
    }

    HWY_INLINE void copy(uint8 *dst, const uint8 *src) const {
        std::memcpy(dst, src + size_t{axis_.start >> 16} * kPixelBytes,
                    size_t{inner_} * kPixelBytes);
        fillPixels(dst + size_t{inner_} * kPixelBytes, src, axis_.srcSize - 1,
                   axis_.dstSize - inner_);
    }

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
        fillPixels(dst + size_t{inner_} * kPixelBytes, src, axis_.srcSize - 1,
                   axis_.dstSize - inner_);
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

} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
