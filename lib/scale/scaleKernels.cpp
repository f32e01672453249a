// Resampling: the walks over the destination rows, which blend what the row
// kernels make.
//
// All arithmetic is on the four 8-bit channels of a pixel alike.  Weights have
// 8 bits, so that a product, and the sum of two, fits 16; every product is
// truncated by itself, and the results depend on it.

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "scale/scaleKernels.cpp"
#include "scale/scaleKernels.h"

#include <algorithm>
#include <cstring>

#include "hwy/foreach_target.h" // IWYU pragma: keep

#include "hwy/highway.h"
#include "legacy/kernels-inl.h"
#include "legacy/streaming-inl.h"
#include "scale/boxRows-inl.h"
#include "scale/nearestRows-inl.h"
#include "scale/scaleVectors-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {

// The source row of a vertical position.
HWY_INLINE uint32_t rowOf(const ScaleAxis &axis, uint32_t position) {
    const bool isAbove = position >> 31 != 0;
    return isAbove ? 0 : std::min(position >> 16, axis.srcSize - 1);
}

HWY_INLINE bool isStreamed(const ScaleJob &job) {
    return quillon::isStreamed(size_t{job.x.dstSize} * kPixelBytes, job.y.dstSize);
}

// The source rows that neighbouring destination rows share, already scaled.
template <class Row>
class RowCache {
public:
    RowCache(const ScaleJob &job, const Row &row, void *block)
        : job_(job), row_(row), slots_(static_cast<RasterScaleRowSlot *>(block)) {
        const ScaleCacheShape shape(job);
        mask_ = static_cast<uint32_t>(shape.slots - 2);
        const auto behindSlots = reinterpret_cast<uintptr_t>(slots_ + shape.slots);
        auto *pixels = reinterpret_cast<uint8_t *>((behindSlots + ScaleCacheShape::kAlignment - 1) &
                                                   -ScaleCacheShape::kAlignment);
        for (size_t i = 0; i < shape.slots; ++i)
            slots_[i] = {pixels + i * shape.rowBytes, kScaleNoRow};
    }

    HWY_INLINE const uint8_t *fetch(uint32_t position) const {
        const uint32_t index = rowOf(job_.y, position);
        RasterScaleRowSlot &slot = slots_[index == 0 ? 0 : 1 + (index & mask_)];
        if (slot.rowIndex != index) {
            slot.rowIndex = index;
            row_(slot.pixels, job_.src.row(index));
        }
        return slot.pixels;
    }

private:
    const ScaleJob &job_;
    const Row &row_;
    RasterScaleRowSlot *slots_;
    uint32_t mask_; // slots - 2
};

// Each destination row is one scaled source row.  No cache: a row that comes
// again is copied from the destination row before, unless that is far away by now,
// or takes longer than to scale the row again.
template <bool kRereads, class Row>
HWY_INLINE void walkDirect(const ScaleJob &job, const Row &row) {
    uint8_t *dst = job.dst.first;
    uint32_t y = job.y.start;
    uint32_t previous = kScaleNoRow;
    for (uint32_t i = 0; i < job.y.dstSize; ++i, y += job.y.step) {
        const uint32_t index = rowOf(job.y, y);
        if (kRereads && index == previous)
            std::memmove(dst, dst - job.dst.step, size_t{job.x.dstSize} * kPixelBytes);
        else
            row(dst, job.src.row(index));
        previous = index;
        dst += job.dst.step;
    }
}

// Mixes a row by one of two bodies, through the caches or around them.
template <class Through, class Around>
HWY_INLINE void mixRow(bool streams, const uint8_t *dst, size_t count, const Through &throughCaches,
                       const Around &aroundCaches) {
    if (streams)
        walkStreaming<uint32_t, kPixelBytes>(dst, count, throughCaches, aroundCaches);
    else
        walkAgain<uint32_t>(count, throughCaches);
}

template <class Store>
struct BlendBody {
    uint8_t *dst;
    const uint8_t *upper, *lower;
    uint32_t lowerWeight; // 0 to 255

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        using Channels = ChannelPairs<D>;
        const size_t offset = i * kPixelBytes;
        storePixelsBy<Store>(
            Channels::blend(loadPixels(d, upper + offset), Channels::weight(255 - lowerWeight),
                            loadPixels(d, lower + offset), Channels::weight(lowerWeight)),
            d, dst + offset);
    }
};

// Each destination row is a blend of two source rows, with weights that sum to
// 255; at the edges both can be the same row.
template <class Row>
HWY_INLINE void walkLinear(const ScaleJob &job, const Row &row, void *block) {
    const RowCache<Row> cache(job, row, block);
    const bool streams = isStreamed(job);
    uint8_t *dst = job.dst.first;
    uint32_t y = job.y.start;
    for (uint32_t i = 0; i < job.y.dstSize; ++i, y += job.y.step) {
        const uint8_t *upper = cache.fetch(y);
        const uint8_t *lower = cache.fetch(y + kScaleOne);
        const uint32_t weight = (y & 0xFFFF) >> 8;
        mixRow(streams, dst, job.x.dstSize, BlendBody<ThroughCaches>{dst, upper, lower, weight},
               BlendBody<AroundCaches>{dst, upper, lower, weight});
        dst += job.dst.step;
    }
}

// A source row and its weight in an average, 0 to 255.
struct Tap {
    const uint8_t *row;
    uint32_t weight;
};

template <class Store>
struct AverageBody {
    uint8_t *dst;
    const Tap *taps;
    size_t count;
    uint32_t normaliser;

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        const size_t offset = i * kPixelBytes;
        ChannelSums<D> sums;
        for (const Tap *tap = taps; tap != taps + count; ++tap)
            sums.add(loadPixels(d, tap->row + offset), ChannelPairs<D>::weight(tap->weight));
        storePixelsBy<Store>(sums.average(normaliser), d, dst + offset);
    }
};

// Each destination row is the average of the source rows that the step covers,
// or of the first 32 of them.  A row covered whole has the weight 255 of 256.
template <class Row>
HWY_INLINE void walkBox(const ScaleJob &job, const Row &row, void *block) {
    const RowCache<Row> cache(job, row, block);
    const bool streams = isStreamed(job);
    uint8_t *dst = job.dst.first;
    uint32_t y = job.y.start;
    for (uint32_t i = 0; i < job.y.dstSize; ++i, y += job.y.step) {
        Tap taps[kScaleMaxTaps];
        size_t count = 0;
        uint32_t position = y;
        uint32_t remaining = job.y.step;
        while (remaining != 0 && count < kScaleMaxTaps) {
            const uint32_t toNext = kScaleOne - (position & 0xFFFF);
            const uint32_t covered = std::min(toNext, remaining);
            const uint32_t weight = std::min<uint32_t>(covered >> 8, 255);
            taps[count++] = {cache.fetch(position), weight};
            position += covered;
            remaining -= covered;
        }
        const uint32_t normaliser = job.y.normaliser;
        mixRow(streams, dst, job.x.dstSize,
               AverageBody<ThroughCaches>{dst, taps, count, normaliser},
               AverageBody<AroundCaches>{dst, taps, count, normaliser});
        dst += job.dst.step;
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

template <template <class Store> class Row>
void walkNearestBy(const ScaleJob &job) {
    if (isStreamed(job))
        walkDirect<false>(job, Row<AroundCaches>(job.x));
    else
        walkDirect<true>(job, Row<ThroughCaches>(job.x));
}

template <class Store>
using RowCloseBy1 = RasterScaleRowClose<1, Store>;
template <class Store>
using RowCloseBy2 = RasterScaleRowClose<2, Store>;
template <class Store>
using RowCloseBy4 = RasterScaleRowClose<4, Store>;
template <class Store>
using RowWholeBy2 = RasterScaleRowWhole<1, Store>;
template <class Store>
using RowWholeBy4 = RasterScaleRowWhole<2, Store>;
template <class Store>
using RowWholeBy8 = RasterScaleRowWhole<3, Store>;

// From here on reading a row in whole vectors to keep an eighth of it pays.
constexpr uint32_t kLongRow = 128;

// Columns are nearest pixels; where rows are not, too, the columns' step is one.
void walkNearest(const ScaleJob &job, void *block) {
    const uint32_t step = job.x.step;
    if ((uint64_t{step} * (job.x.dstSize - 1) + job.x.start) >> 32 != 0)
        walkRows(job, RasterScaleRowWrapping(job.x), block);
    else if (step == kScaleOne)
        walkRows(job, RasterScaleRowCopy(job.x), block);
    else if (step == kScaleOne / 2 && job.x.start % kScaleOne == 0 && !isStreamed(job))
        walkDirect<false>(job, RasterScaleRowDoubled(job.x));
    else if (step < kScaleOne)
        walkNearestBy<RowCloseBy1>(job);
    else if (step == 2 * kScaleOne)
        walkNearestBy<RowWholeBy2>(job);
    else if (step == 4 * kScaleOne)
        walkNearestBy<RowWholeBy4>(job);
    else if (step == 8 * kScaleOne && job.x.dstSize >= kLongRow)
        walkNearestBy<RowWholeBy8>(job);
    else if (kVectorsAreWide && step <= 2 * kScaleOne && job.x.srcSize >= 2)
        walkNearestBy<RowCloseBy2>(job);
    else if (kVectorsAreWide && step <= 4 * kScaleOne && job.x.srcSize >= 4)
        walkNearestBy<RowCloseBy4>(job);
    else
        walkNearestBy<RasterScaleRowSparse>(job);
}

template <class Store>
void walkQuarters(const ScaleJob &job) {
    const RasterScaleRowQuarter row(job.x);
    uint8_t *dst = job.dst.first;
    uint32_t y = job.y.start;
    for (uint32_t i = 0; i < job.y.dstSize; ++i, y += job.y.step) {
        row.write<Store>(dst, job.src.row(rowOf(job.y, y)),
                         job.src.row(rowOf(job.y, y + kScaleOne)));
        dst += job.dst.step;
    }
}

void walkAll(const ScaleJob &job, void *block) {
    if (job.isQuarter())
        return isStreamed(job) ? walkQuarters<AroundCaches>(job) : walkQuarters<ThroughCaches>(job);
    switch (job.x.method) {
    case ScaleMethod::kNearest:
        return walkNearest(job, block);
    case ScaleMethod::kLinear:
        return walkRows(job, RasterScaleRowLinear(job.x), block);
    case ScaleMethod::kBox:
        return job.x.step <= 257 * kScaleOne
                   ? walkRows(job, RasterScaleRowBox<uint16_t>(job.x), block)
                   : walkRows(job, RasterScaleRowBox<uint32_t>(job.x), block);
    }
}

void scaleRect(const ScaleJob &job, void *block) {
    walkAll(job, block);
    if (isStreamed(job))
        hwy::FlushStream();
}

} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace quillon {

HWY_EXPORT(scaleRect);

void RasterScaleRect(const ScaleJob &job, void *cache) {
    HWY_DYNAMIC_DISPATCH(scaleRect)(job, cache);
}

} // namespace quillon
#endif
