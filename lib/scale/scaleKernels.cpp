#include "scale/scaleKernels.h"

#include "scale/scalePlain.h"
#include "simd/thresholds.h"

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

#if QUILLON_HAS_VECTORS

// Rows whose vectors are better aligned than as they come.
bool isLongRow(const ScaleAxis &axis) {
    return axis.dstSize >= kLineBytes + kVectorPixels;
}

// Rows of nearest pixels on both axes.  Around the caches a row that comes again is
// scaled again: the destination row before is far away by now.
template <template <class Access> class Row>
void walkNearestRows(const ScaleJob &job) {
    if (isNonTemporal(job.dstExtent()))
        walkDirect<false>(job, Row<NonTemporal>(job.x));
    else
        walkDirect<true>(job, Row<Unaligned>(job.x));
}

template <template <class Access> class Row>
void walkAlignedNearestRows(const ScaleJob &job) {
    if (isLongRow(job.x) && !isNonTemporal(job.dstExtent()))
        walkDirect<true>(job, Row<Aligned>(job.x));
    else
        walkNearestRows<Row>(job);
}

void walkDoubledRows(const ScaleJob &job) {
    if (isLongRow(job.x))
        walkDirect<false>(job, NearestDoubled<Aligned>(job.x));
    else
        walkDirect<false>(job, NearestDoubled<Unaligned>(job.x));
}

template <class Access>
using NearestPickedFrom1 = NearestPicked<1, Access>;
template <class Access>
using NearestPickedFrom2 = NearestPicked<2, Access>;
template <class Access>
using NearestPickedFrom3 = NearestPicked<3, Access>;
template <class Access>
using NearestPickedFrom4 = NearestPicked<4, Access>;
template <class Access>
using NearestEveryOf2 = NearestFirstOfEach<1, Access>;
template <class Access>
using NearestEveryOf4 = NearestFirstOfEach<2, Access>;
template <class Access>
using NearestEveryOf8 = NearestFirstOfEach<3, Access>;

// Whether every eighth pixel is picked from whole vectors, not by itself: with 64 bytes
// in a vector these take 0.7 of the time where none crosses a cache line and 1.2 where
// all do, and 0.8 out of memory that no cache holds, as they ask for a row's lines at
// once.
bool picksEighthsFromVectors(const ScaleJob &job) {
    const auto first = reinterpret_cast<uintptr_t>(job.src.first) + 4 * (job.x.start >> 16);
    const auto stride = static_cast<uintptr_t>(job.src.stride);
    const bool isAligned = kVectorBytes == 64 && (first | stride) % 64 == 0;
    return kHasInterleavedAccess || isAligned || isNonTemporal(job.dstExtent());
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
        walkNearestRows<NearestPickedFrom1>(job);
    else if (step == 2 * kScaleOne)
        walkAlignedNearestRows<NearestEveryOf2>(job);
    else if (step == 4 * kScaleOne)
        walkAlignedNearestRows<NearestEveryOf4>(job);
    else if (step == 8 * kScaleOne && picksEighthsFromVectors(job))
        walkNearestRows<NearestEveryOf8>(job);
    else if (canPick(2))
        walkNearestRows<NearestPickedFrom2>(job);
    else if (canPick(3))
        walkNearestRows<NearestPickedFrom3>(job);
    else if (canPick(4))
        walkNearestRows<NearestPickedFrom4>(job);
    else
        walkAlignedNearestRows<NearestGathered>(job);
}

void scaleQuarter(const ScaleJob &job) {
    if (isNonTemporal(job.dstExtent()))
        walkPairs(job, QuarterRow<NonTemporal>(job.x));
    else
        walkPairs(job, QuarterRow<Unaligned>(job.x));
}

void scaleColumns(const ScaleJob &job, void *cache) {
    switch (job.x.method) {
    case ScaleMethod::kNearest:
        return scaleNearest(job, cache);
    case ScaleMethod::kLinear:
        return walkRows(job, RasterScaleRowLinear(job.x), cache);
    case ScaleMethod::kBox:
        return job.x.step <= kMostPixelsIn16 * kScaleOne
                   ? walkRows(job, RasterScaleRowBox<uint16_t>(job.x), cache)
                   : walkRows(job, RasterScaleRowBox<uint32_t>(job.x), cache);
    }
}

void scaleRectKernel(const ScaleJob &job, void *cache) {
    if (job.isQuarter())
        scaleQuarter(job);
    else
        scaleColumns(job, cache);
    if (isNonTemporal(job.dstExtent()))
        hwy::FlushStream();
}

#else

void scaleRectKernel(const ScaleJob &job, void *cache) {
    const ScaleAxis &x = job.x;
    if (job.isQuarter())
        walkPairs(job, [&](uint8_t *dst, const uint8_t *upper, const uint8_t *lower) {
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

HWY_EXPORT(scaleRectKernel);

void RasterScaleRect(const ScaleJob &job, void *cache) {
    HWY_DYNAMIC_DISPATCH(scaleRectKernel)(job, cache);
}

} // namespace quillon
#endif
