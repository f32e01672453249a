// The horizontal pass of the scaler where it blends neighbours.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_SCALE_LINEAR_ROWS_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_SCALE_LINEAR_ROWS_INL_H
#undef QUILLON_SCALE_LINEAR_ROWS_INL_H
#else
#define QUILLON_SCALE_LINEAR_ROWS_INL_H
#endif

#include "hwy/highway.h"

#include "scale/pixelBlend-inl.h"
#include "scale/pixelRows-inl.h"
#include "scale/scaleAxis.h"

#include <algorithm>

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {
#if QUILLON_HAS_VECTORS

// Blends of neighbours with weights that sum to 255.  srcSize is larger than a
// chunk.
template <bool kPrefetches>
struct LinearBody {
    uint8_t *dst;
    const uint8_t *src;
    uint32_t start, step, srcSize;

    template <class C, class Access>
    HWY_INLINE void operator()(C /*chunk*/, size_t i, Access access) const {
        const PixelTag<C> d;
        const uint32_t first = start + static_cast<uint32_t>(i) * step;
        const uint32_t base = std::min(first >> 16, srcSize - 1 - uint32_t{C::kUnits});
        const auto x = positionsFrom(d, first - (base << 16), step);
        const uint8_t *window = src + size_t{4} * base;
        prefetchSource<kPrefetches>(window, 4 * C::kUnits);
        const auto index = hn::ShiftRight<16>(x);
        const auto left = pickFromWindows<1>(d, window, index);
        const auto right = pickFromWindows<1>(d, window + 4, index);
        access.store(d, PixelBlend<decltype(d)>(d, x)(d, left, right), dst + 4 * i);
    }
};

// Copies of the first pixel while positions are negative, blends, and copies of the
// last pixel.
class LinearRow {
public:
    LinearRow(const ScaleAxis &axis, bool prefetches)
        : prefetches_(prefetches), step_(axis.step), srcSize_(axis.srcSize), leading_(0) {
        const bool isNegative = axis.start >> 31 != 0;
        if (isNegative)
            leading_ =
                std::min(stepsBefore(axis.start, uint64_t{1} << 32, axis.step), axis.dstSize);
        innerStart_ = axis.start + leading_ * axis.step;
        inner_ = std::min(stepsBefore(innerStart_, axis.lastPosition(), axis.step),
                          axis.dstSize - leading_);
        trailing_ = axis.dstSize - leading_ - inner_;
    }

    HWY_NOINLINE void operator()(uint8_t *dst, const uint8_t *src) const {
        fillPixels(dst, src, 0, leading_);
        dst += size_t{4} * leading_;
        walkPixelsOf<LinearBody>(prefetches_, inner_, srcSize_ - 1, dst, src, innerStart_, step_,
                                 srcSize_);
        dst += size_t{4} * inner_;
        fillPixels(dst, src, srcSize_ - 1, trailing_);
    }

private:
    bool prefetches_;
    uint32_t step_, srcSize_;
    uint32_t leading_, inner_, trailing_; // pixels
    uint32_t innerStart_;
};

#endif
} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
