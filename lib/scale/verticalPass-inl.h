// The vertical pass of the scaler: the walks over the destination rows, which fetch
// source rows after the horizontal pass and blend or average them.
//
// A Row is a function object (uint8_t *dst, const uint8_t *src) that makes the
// horizontal pass over one source row.
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
#include "scale/pixelRows-inl.h"
#include "scale/scaleKernels.h"
#include "scale/scalePlain.h"
#include "simd/thresholds.h"

#include <algorithm>
#include <cstring>

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
        access.store(d, blendPixels(d, above, below, hn::Set(d, lowerWeight)), dst + 4 * i);
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
        ChannelSums<PixelTag<C>> sums;
        for (const ScaleTap *tap = taps; tap != taps + tapCount; ++tap)
            sums.add(access.load(d, tap->pixels + 4 * i),
                     ChannelPairs<PixelTag<C>>::weight(tap->weight));
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

// The index of the source row of a vertical position.
HWY_INLINE uint32_t rowOf(const ScaleAxis &axis, uint32_t position) {
    const bool isAbove = position >> 31 != 0;
    return isAbove ? 0 : std::min(position >> 16, axis.srcSize - 1);
}

// The source rows that neighbouring destination rows share, after the horizontal
// pass.
template <class Row>
class RowCache {
public:
    RowCache(const ScaleJob &job, const Row &row, void *block)
        : axis_(job.y), src_(job.src), row_(row), slots_(static_cast<RasterScaleRowSlot *>(block)) {
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
        RasterScaleRowSlot &slot = slots_[index == 0 ? 0 : 1 + (index & mask_)];
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
    RasterScaleRowSlot *slots_;
    uint32_t mask_; // slotCount - 2: the divisor is a power of two
};

// ---- Walks ----------------------------------------------------------------

// Each destination row is a source row, without a cache.  With kCopiesRepeats, a row
// that comes again is copied from the destination row before.
template <bool kCopiesRepeats, class Row>
HWY_INLINE void walkDirect(const ScaleJob &job, const Row &row) {
    const ByteExtent extent = job.dstExtent();
    const auto stride = static_cast<uint64_t>(job.dst.stride);
    uint8_t *dst = job.dst.first;
    uint32_t y = job.y.start;
    uint32_t previous = kScaleNoRow;
    for (size_t i = 0; i < extent.height; ++i, y += job.y.step) {
        const uint32_t index = rowOf(job.y, y);
        if (kCopiesRepeats && index == previous)
            std::memmove(dst, advance(dst, -stride), extent.rowBytes); // rows may overlap
        else
            row(dst, job.src.row(index));
        previous = index;
        dst = advance(dst, stride);
    }
}

// Each destination row is a blend of two source rows, with weights that sum to 255;
// at the edges both can be the same row.
template <class Row>
HWY_INLINE void walkLinear(const ScaleJob &job, const Row &row, void *block) {
    const RowCache<Row> cache(job, row, block);
    const RowMixer mixer(job);
    const auto stride = static_cast<uint64_t>(job.dst.stride);
    uint8_t *dst = job.dst.first;
    uint32_t y = job.y.start;
    for (size_t i = 0; i < job.y.dstSize; ++i, y += job.y.step) {
        const uint8_t *upper = cache.fetch(y);
        const uint8_t *lower = cache.fetch(y + kScaleOne);
        mixer.blend(dst, upper, lower, (y & 0xFFFF) >> 8);
        dst = advance(dst, stride);
    }
}

// Each destination row is the average of the source rows that the step covers, or of
// the first 32 of them.  A row that is covered whole has the weight 255.
template <class Row>
HWY_INLINE void walkBox(const ScaleJob &job, const Row &row, void *block) {
    const RowCache<Row> cache(job, row, block);
    const RowMixer mixer(job);
    const auto stride = static_cast<uint64_t>(job.dst.stride);
    uint8_t *dst = job.dst.first;
    uint32_t y = job.y.start;
    for (size_t i = 0; i < job.y.dstSize; ++i, y += job.y.step) {
        ScaleTap taps[kScaleMaxTaps];
        size_t tapCount = 0;
        uint32_t position = y;
        uint32_t remaining = job.y.step;
        while (remaining != 0 && tapCount < kScaleMaxTaps) {
            const uint32_t toNext = kScaleOne - (position & 0xFFFF);
            const uint32_t covered = std::min(toNext, remaining);
            const uint32_t weight = std::min<uint32_t>(covered >> 8, 255);
            taps[tapCount++] = {cache.fetch(position), weight};
            position += covered;
            remaining -= covered;
        }
        mixer.average(dst, taps, tapCount);
        dst = advance(dst, stride);
    }
}

template <class Row>
void walkRows(const ScaleJob &job, const Row &row, void *block) {
    switch (job.y.method) {
    case ScaleMethod::kNearest:
        return walkDirect<true>(job, row);
    case ScaleMethod::kLinear:
        return walkLinear(job, row, block);
    case ScaleMethod::kBox:
        return walkBox(job, row, block);
    }
}

// Each destination row is made of two source rows at once: row is called with
// (uint8_t *dst, const uint8_t *upper, const uint8_t *lower).
template <class RowOfTwo>
HWY_INLINE void walkPairs(const ScaleJob &job, const RowOfTwo &row) {
    const auto stride = static_cast<uint64_t>(job.dst.stride);
    uint8_t *dst = job.dst.first;
    uint32_t y = job.y.start;
    for (size_t i = 0; i < job.y.dstSize; ++i, y += job.y.step) {
        row(dst, job.src.row(rowOf(job.y, y)), job.src.row(rowOf(job.y, y + kScaleOne)));
        dst = advance(dst, stride);
    }
}

} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
