// The vertical pass of the scaler: source rows after the horizontal pass are kept, and
// blended or averaged.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_SCALE_VERTICAL_PASS_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_SCALE_VERTICAL_PASS_INL_H
#undef QUILLON_SCALE_VERTICAL_PASS_INL_H
#else
#define QUILLON_SCALE_VERTICAL_PASS_INL_H
#endif

#include "hwy/highway.h"

#include "scale/channels-inl.h"
#include "scale/pixelBlend-inl.h"
#include "scale/pixelRows-inl.h"
#include "scale/scaleKernels.h"
#include "scale/scalePlain.h"
#include "simd/thresholds.h"

#include <algorithm>

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {

// ---- One destination row --------------------------------------------------

#if QUILLON_HAS_VECTORS

struct BlendRowsBody {
    static constexpr size_t kDstBytes = 4;
    uint8_t *dst;
    const uint8_t *upper, *lower;
    uint32_t lowerWeight;

    template <class C, class Access>
    HWY_INLINE void operator()(C /*chunk*/, size_t i, Access access) const {
        const PixelTag<C> d;
        const auto above = access.load(d, upper + 4 * i), below = access.load(d, lower + 4 * i);
        const PixelBlend<PixelTag<C>> blend(d, lowerWeight);
        access.store(d, blend(d, above, below), dst + 4 * i);
    }
};

struct AverageRowsBody {
    static constexpr size_t kDstBytes = 4;
    uint8_t *dst;
    const ScaleTap *taps;
    size_t tapCount;
    uint32_t normaliser;

    template <class C, class Access>
    HWY_INLINE void operator()(C /*chunk*/, size_t i, Access access) const {
        const PixelTag<C> d;
        const hn::Repartition<uint16_t, PixelTag<C>> d16;
        ChannelSums<PixelTag<C>> sums;
        for (const ScaleTap *tap = taps; tap != taps + tapCount; ++tap)
            sums.add(access.load(d, tap->pixels + 4 * i),
                     hn::BitCast(d16, hn::Set(d, tap->weights)));
        access.store(d, sums.average(normaliser), dst + 4 * i);
    }
};

// Makes destination rows of several source rows.
class RowMixer {
public:
    explicit RowMixer(const ScaleJob &job)
        : width_(job.x.dstSize), normaliser_(job.y.normaliser),
          isNonTemporal_(isNonTemporal(job.dstExtent())) {}

    HWY_INLINE void blend(uint8_t *dst, const uint8_t *upper, const uint8_t *lower,
                          uint32_t lowerWeight) const {
        walk(BlendRowsBody{dst, upper, lower, lowerWeight});
    }
    HWY_INLINE void average(uint8_t *dst, const ScaleTap *taps, size_t tapCount) const {
        walk(AverageRowsBody{dst, taps, tapCount, normaliser_});
    }

private:
    template <class Body>
    HWY_INLINE void walk(const Body &body) const {
        if (isNonTemporal_)
            walkPixelsBy<NonTemporal>(width_, body);
        else
            walkPixels(width_, body);
    }

    size_t width_;
    uint32_t normaliser_;
    bool isNonTemporal_;
};

#else

class RowMixer {
public:
    explicit RowMixer(const ScaleJob &job) : width_(job.x.dstSize), normaliser_(job.y.normaliser) {}

    void blend(uint8_t *dst, const uint8_t *upper, const uint8_t *lower,
               uint32_t lowerWeight) const {
        blendRowsPlain(dst, upper, lower, lowerWeight, width_);
    }
    void average(uint8_t *dst, const ScaleTap *taps, size_t tapCount) const {
        averageRowsPlain(dst, taps, tapCount, normaliser_, width_);
    }

private:
    size_t width_;
    uint32_t normaliser_;
};

#endif

// ---- Source rows ----------------------------------------------------------

// The index of the source row of a vertical position.  Those above the first row are
// negative.
HWY_INLINE uint32_t rowOf(const ScaleAxis &axis, uint32_t position) {
    const auto inside = static_cast<uint32_t>(std::max(static_cast<int32_t>(position), 0));
    return std::min(inside >> 16, axis.srcSize - 1);
}

// The source rows that neighbouring destination rows share, after the horizontal pass,
// which row(uint8_t *dst, const uint8_t *src) makes.
template <class Row>
class RowCache {
public:
    RowCache(const ScaleJob &job, const Row &row, void *block)
        : axis_(job.y), src_(job.src), row_(row), slots_(static_cast<ScaleCacheSlot *>(block)) {
        const ScaleCacheShape shape(job);
        mask_ = static_cast<uint32_t>(shape.slotCount - 2);
        const auto behindSlots = reinterpret_cast<uintptr_t>(slots_ + shape.slotCount);
        auto *pixels = reinterpret_cast<uint8_t *>((behindSlots + ScaleCacheShape::kAlignment - 1) &
                                                   -ScaleCacheShape::kAlignment);
        for (size_t i = 0; i < shape.slotCount; ++i)
            slots_[i] = {pixels + i * shape.rowBytes, kScaleNoRow};
    }

    HWY_INLINE const uint8_t *fetch(uint32_t position) const {
        const uint32_t index = rowOf(axis_, position);
        ScaleCacheSlot &slot = slots_[index == 0 ? 0 : 1 + (index & mask_)];
        if (slot.rowIndex != index) {
            slot.rowIndex = index;
            row_(slot.pixels, src_.row(index));
        }
        return slot.pixels;
    }

private:
    ScaleAxis axis_;
    SrcRows src_;
    const Row &row_;
    ScaleCacheSlot *slots_;
    uint32_t mask_; // slotCount - 2: the divisor is a power of two
};

} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
