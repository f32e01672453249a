#include "scale/scaleKernels.h"

#include "scale/scalePlain.h"
#include "simd/thresholds.h"

#include <algorithm>
#include <cstring>

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "scale/scaleKernels.cpp"
#include "hwy/foreach_target.h"
#include "hwy/highway.h"

#include "scale/boxRows-inl.h"
#include "scale/linearRows-inl.h"
#include "scale/nearestRows-inl.h"
#include "scale/nearestSteps-inl.h"
#include "scale/quarterRows-inl.h"
#include "scale/verticalPass-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {

// ---- Walks over the destination rows --------------------------------------
//
// A Row is a function object (uint8_t *dst, const uint8_t *src) that makes the
// horizontal pass over one source row.

// Goes through the destination rows.  What is read once a row stays in the job: copies
// would take registers from the loops along the rows, 5 % of the time of a blend.
class RowWalk {
public:
    HWY_INLINE explicit RowWalk(const ScaleJob &job)
        : dst(job.dst.first), y(job.y.start), job_(job),
          stride_(static_cast<uint64_t>(job.dst.stride)) {}

    HWY_INLINE bool isDone() const { return index_ == job_.y.dstSize; }
    HWY_INLINE void next() {
        dst = advance(dst, stride_);
        y += job_.y.step;
        ++index_;
    }
    HWY_INLINE const uint8_t *rowBefore() const { return advance(dst, -stride_); }

    uint8_t *dst; // the first pixel of the row
    uint32_t y;   // its position in the source

private:
    const ScaleJob &job_;
    uint64_t stride_;
    size_t index_ = 0;
};

// Each row is a source row, without a cache.  With kCopiesRepeats, a row that comes again
// is copied from the destination row before.
template <bool kCopiesRepeats, class Row>
HWY_INLINE void walkDirect(const ScaleJob &job, const Row &row) {
    const size_t rowBytes = job.dstExtent().rowBytes;
    uint32_t previous = kScaleNoRow;
    for (RowWalk walk(job); !walk.isDone(); walk.next()) {
        const uint32_t index = rowOf(job.y, walk.y);
        if (kCopiesRepeats && index == previous)
            std::memmove(walk.dst, walk.rowBefore(), rowBytes); // rows may overlap
        else
            row(walk.dst, job.src.row(index));
        previous = index;
    }
}

// Each row is a blend of two source rows, with weights that sum to 255; at the edges both
// can be the same row.
template <class Row>
HWY_INLINE void walkLinear(const ScaleJob &job, const Row &row, void *block) {
    const RowCache<Row> cache(job, row, block);
    const RowMixer mixer(job);
    for (RowWalk walk(job); !walk.isDone(); walk.next()) {
        const uint8_t *upper = cache.fetch(walk.y);
        const uint8_t *lower = cache.fetch(walk.y + kScaleOne);
        mixer.blend(walk.dst, upper, lower, (walk.y & 0xFFFF) >> 8);
    }
}

// Each row is the average of the source rows that the step covers, or of the first 32 of
// them.  A row that is covered whole has the weight 255.
template <class Row>
HWY_INLINE void walkBox(const ScaleJob &job, const Row &row, void *block) {
    const RowCache<Row> cache(job, row, block);
    const RowMixer mixer(job);
    for (RowWalk walk(job); !walk.isDone(); walk.next()) {
        ScaleTap taps[kScaleMaxTaps];
        size_t tapCount = 0;
        uint32_t position = walk.y;
        uint32_t remaining = job.y.step;
        while (remaining != 0 && tapCount < kScaleMaxTaps) {
            const uint32_t toNext = kScaleOne - (position & 0xFFFF);
            const uint32_t covered = std::min(toNext, remaining);
            const uint32_t weight = std::min<uint32_t>(covered >> 8, 255);
            taps[tapCount++] = {cache.fetch(position), weight * 0x00010001};
            position += covered;
            remaining -= covered;
        }
        mixer.average(walk.dst, taps, tapCount);
    }
}

// Not inlined: its frame is large, and calls that do not come here do without.
template <class Row>
HWY_NOINLINE void walkRows(const ScaleJob &job, const Row &row, void *block) {
    switch (job.y.method) {
    case ScaleMethod::kNearest:
        return walkDirect<true>(job, row);
    case ScaleMethod::kLinear:
        return walkLinear(job, row, block);
    case ScaleMethod::kBox:
        return walkBox(job, row, block);
    }
}

// Steps of whole source rows, without a cache.  Each row is made of kSpan of these, of which
// row gets the first and, if it is another, the last.  Inside the source they come at a
// constant distance.
template <uint32_t kSpan, class RowOfSpan>
HWY_INLINE void walkWholeSteps(const ScaleJob &job, const RowOfSpan &row) {
    const ScaleAxis axis = job.y;
    const auto dstStride = static_cast<uint64_t>(job.dst.stride);
    const uint64_t srcStep = (axis.step >> 16) * static_cast<uint64_t>(job.src.stride);
    uint8_t *dst = job.dst.first;
    uint32_t y = axis.start, count = 0;
    for (uint32_t left = axis.dstSize; left != 0; left -= count, y += count * axis.step) {
        const uint32_t inside = stepsBefore(y, (axis.srcSize + 1 - kSpan) << 16, axis.step);
        const uint8_t *first = job.src.row(rowOf(axis, y));
        const uint8_t *last = job.src.row(rowOf(axis, y + (kSpan - 1) * kScaleOne));
        count = std::min(std::max(inside, 1U), left);
        for (uint32_t i = 0; i < count; ++i, dst = advance(dst, dstStride)) {
            if constexpr (kSpan == 1)
                row(dst, first);
            else
                row(dst, first, last);
            first = advance(first, srcStep);
            last = advance(last, srcStep);
        }
    }
}

// ---- The kernel, by what becomes of the columns -----------------------------

#if QUILLON_HAS_VECTORS

// Whether rows are long enough to gain from stores that begin with a cache line.
bool isLongRow(const ScaleAxis &axis) {
    return axis.dstSize >= kLineBytes + kVectorPixels;
}

// Nearest pixels on both axes, by a kind of row and the number that it is for, if any.
// Around the caches a row that comes again is scaled again: the destination row before is
// far away by now.
template <template <class Access, uint32_t...> class Row, uint32_t... kNumber>
void walkNearestRows(const ScaleJob &job) {
    if (isNonTemporal(job.dstExtent()))
        walkDirect<false>(job, Row<NonTemporal, kNumber...>(job.x));
    else
        walkDirect<true>(job, Row<Unaligned, kNumber...>(job.x));
}

template <template <class Access, uint32_t...> class Row, uint32_t... kNumber>
void walkAlignedNearestRows(const ScaleJob &job) {
    if (isLongRow(job.x) && !isNonTemporal(job.dstExtent()))
        walkDirect<true>(job, Row<Aligned, kNumber...>(job.x));
    else
        walkNearestRows<Row, kNumber...>(job);
}

// Where a row takes few instructions, those between rows count, too.
template <uint32_t kStep>
void walkFirstOfEachRows(const ScaleJob &job) {
    const bool isWhole = job.y.step % kScaleOne == 0 && !isNonTemporal(job.dstExtent());
    if (kHasInterleavedAccess && isWhole) {
        const NearestFirstOfEach<Unaligned, kStep> row(job.x);
        if (!row.isInside())
            return walkWholeSteps<1>(job, row);
        return walkWholeSteps<1>(job, [&](uint8_t *dst, const uint8_t *src)
                                          HWY_ATTR { row.copyInside(dst, src); });
    }
    if constexpr (kStep < 8)
        walkAlignedNearestRows<NearestFirstOfEach, kStep>(job);
    else
        walkNearestRows<NearestFirstOfEach, kStep>(job);
}

void walkDoubledRows(const ScaleJob &job) {
    if (isLongRow(job.x))
        walkDirect<false>(job, NearestDoubled<Aligned>(job.x));
    else
        walkDirect<false>(job, NearestDoubled<Unaligned>(job.x));
}

// Whether every eighth pixel is loaded by a loop for that.  Gathers take 0.8 of its time in
// short rows, which are too short for vectors that begin with cache lines.
bool loadsEighths(const ScaleJob &job) {
    return !kHasFastGather || job.x.dstSize >= kEighthsInLinesFrom ||
           isNonTemporal(job.dstExtent());
}

// Columns are nearest pixels.  Rows can be blends or averages only where columns are
// copied.
void scaleNearest(const ScaleJob &job, void *cache) {
    const uint32_t step = job.x.step;
    const auto canPick = [&](uint32_t windows) HWY_ATTR {
        return windows <= scaleMostNearestPixels(kVectorBytes) && step <= windows * kScaleOne &&
               job.x.srcSize >= windows;
    };
    if ((uint64_t{step} * (job.x.dstSize - 1) + job.x.start) >> 32 != 0)
        walkRows(job, NearestWrapping(job.x), cache);
    else if (step == kScaleOne)
        walkRows(job, NearestCopied(job.x), cache);
    else if (step == kScaleOne / 2 && job.x.start % kScaleOne == 0 &&
             !isNonTemporal(job.dstExtent()))
        walkDoubledRows(job);
    else if (step < kScaleOne)
        walkNearestRows<NearestPicked, 1>(job);
    else if (step == 2 * kScaleOne)
        walkFirstOfEachRows<2>(job);
    else if (step == 4 * kScaleOne)
        walkFirstOfEachRows<4>(job);
    else if (step == 8 * kScaleOne && loadsEighths(job))
        walkFirstOfEachRows<8>(job);
    else if (canPick(2))
        walkNearestRows<NearestPicked, 2>(job);
    else if (canPick(3))
        walkNearestRows<NearestPicked, 3>(job);
    else if (canPick(4))
        walkNearestRows<NearestPicked, 4>(job);
    else
        walkAlignedNearestRows<NearestGathered>(job);
}

void scaleQuarter(const ScaleJob &job) {
    if (isNonTemporal(job.dstExtent()))
        walkWholeSteps<2>(job, QuarterRow<NonTemporal>(job.x, job.isPrefetched()));
    else
        walkWholeSteps<2>(job, QuarterRow<Unaligned>(job.x, false));
}

void scaleColumns(const ScaleJob &job, void *cache) {
    switch (job.x.method) {
    case ScaleMethod::kNearest:
        return scaleNearest(job, cache);
    case ScaleMethod::kLinear:
        return walkRows(job, LinearRow(job.x, job.isPrefetched()), cache);
    case ScaleMethod::kBox:
        return job.x.step <= kMostPixelsIn16 * kScaleOne
                   ? walkRows(job, BoxRow<uint16_t>(job.x, job.isPrefetched()), cache)
                   : walkRows(job, BoxRow<uint32_t>(job.x, job.isPrefetched()), cache);
    }
}

void scaleKernel(const ScaleJob &job, void *cache) {
    if (job.isQuarter())
        scaleQuarter(job);
    else
        scaleColumns(job, cache);
    if (isNonTemporal(job.dstExtent()))
        hwy::FlushStream();
}

#else

void scaleKernel(const ScaleJob &job, void *cache) {
    const ScaleAxis &x = job.x;
    if (job.isQuarter())
        walkWholeSteps<2>(job, [&](uint8_t *dst, const uint8_t *upper, const uint8_t *lower) {
            quarterRowPlain(x, dst, upper, lower);
        });
    else
        walkRows(
            job, [&](uint8_t *dst, const uint8_t *src) { scaleRowPlain(x, dst, src); }, cache);
}

#endif

} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace quillon {

HWY_EXPORT(scaleKernel);

void scaleRows(const ScaleJob &job, void *cache) {
    HWY_DYNAMIC_DISPATCH(scaleKernel)(job, cache);
}

} // namespace quillon
#endif
