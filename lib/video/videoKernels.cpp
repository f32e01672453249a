#include "video/videoKernels.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "video/videoKernels.cpp"
#include "hwy/foreach_target.h"
#include "hwy/highway.h"

#include "legacy/kernels-inl.h"
#include "legacy/streaming-inl.h"
#include "video/videoPixels-inl.h"

#include <array>
#include <cstring>

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {

// Where the samples of a group stand: its first luma, the second one being two
// bytes further, and its chroma.
struct Group {
    uint8_t luma, chromaLow, chromaHigh;
};
constexpr Group kYuy2 = {0, 1, 3};
constexpr Group kUyvy = {1, 0, 2};

// ---- Frames -------------------------------------------------------------

template <RasterVideoPixelLayout kLayout>
constexpr size_t kPairBytes = size_t{2} * kLayout.bytesPerPixel;

template <Group kGroup, RasterVideoPixelLayout kLayout>
struct ConvertGroups {
    uint8_t *dst;
    const uint8_t *src;

#if HWY_TARGET == HWY_SCALAR
    void pair(size_t i) const {
        const uint8_t *group = src + 4 * i;
        convertPair<kLayout>(group[kGroup.luma], group[kGroup.luma + 2], group[kGroup.chromaLow],
                             group[kGroup.chromaHigh], dst + kPairBytes<kLayout> * i);
    }
#else
    // Some pages are read for each that is written around the caches; so that
    // nothing waits for them, ask for the groups well ahead of i.
    HWY_INLINE void prefetch(size_t i, size_t last) const {
        const uint8_t *ahead = src + 4 * HWY_MIN(i + 512, last);
        for (size_t line = 0; line < kLanes<Widest<uint8_t>> * 2; line += 64)
            hwy::Prefetch(ahead + line);
    }

    // Groups i and on: half as many as d has bytes.
    template <class Store, class D>
    HWY_INLINE void block(D d, size_t i) const {
        const auto first = sums(d, i);
        const auto second = sums(d, i + kLanes<D> / 4);
        storePixels<kLayout, Store, false>(d, first, second, dst + kPairBytes<kLayout> * i);
    }

    template <class D>
    HWY_INLINE auto sums(D /*d*/, size_t i) const {
        const hn::Repartition<uint32_t, D> d32;
        const hn::Repartition<int16_t, D> d16;
        const auto groups =
            less128(d32, hn::LoadU(d32, reinterpret_cast<const uint32_t *>(src) + i));
        constexpr bool isLower = kGroup.luma == 0;
        const auto luma = weighed < isLower ? kLumaFactor : 0,
                   isLower ? 0 : kLumaFactor > (d16, hn::BitCast(d16, groups));
        return sumsOf(hn::Add(luma, hn::Set(d16, kLumaRest)),
                      chromaOf<kGroup.chromaLow, kGroup.chromaHigh>(d32, groups));
    }
#endif
};

// How far on the samples of the next two rows are.
struct NextRows {
    ptrdiff_t luma, chroma;
};

// One row, or two which share their chroma.
template <RasterVideoPixelLayout kLayout, size_t kRows>
struct ConvertRows {
    std::array<uint8_t *, kRows> dst;
    std::array<const uint8_t *, kRows> luma;
    const uint8_t *chromaHigh, *chromaLow;
    NextRows next = {};

#if HWY_TARGET == HWY_SCALAR
    void pair(size_t i) const {
        for (size_t row = 0; row < kRows; ++row)
            convertPair<kLayout>(luma[row][2 * i], luma[row][2 * i + 1], chromaLow[i],
                                 chromaHigh[i], dst[row] + kPairBytes<kLayout> * i);
    }
#else
    ConvertRows<kLayout, 1> only(size_t row) const {
        return {{dst[row]}, {luma[row]}, chromaHigh, chromaLow, next};
    }

    // The same place two rows on.
    HWY_INLINE void prefetch(size_t i, size_t /*last*/) const {
        for (const uint8_t *samples : luma)
            hwy::Prefetch(samples + next.luma + 2 * i);
        hwy::Prefetch(chromaHigh + next.chroma + i);
        hwy::Prefetch(chromaLow + next.chroma + i);
    }

    // Pairs of columns i and on: half as many as d has bytes.
    template <class Store, class D>
    HWY_INLINE void block(D d, size_t i) const {
        const hn::Repartition<int16_t, D> d16;
        const auto ab = ordered<kLayout.bytesPerPixel, Come::InOrder>(d16, chroma(d16, i));
        const auto terms = [&](auto both)
                               HWY_ATTR { return chromaTerms(d16, hn::ShiftLeft<8>(both), both); };
        const auto firstTerms = terms(hn::InterleaveLower(d16, ab, ab));
        const auto secondTerms = terms(hn::InterleaveUpper(d16, ab, ab));
        for (size_t row = 0; row < kRows; ++row) {
            const auto samples =
                ordered<kLayout.bytesPerPixel, Come::InOrder>(d, hn::LoadU(d, luma[row] + 2 * i));
            const auto first = hn::InterleaveLower(d, samples, hn::Zero(d));
            const auto second = hn::InterleaveUpper(d, samples, hn::Zero(d));
            storePixels<kLayout, Store, true>(
                d, sumsOf(lumaTerm(d16, hn::BitCast(d16, first)), firstTerms),
                sumsOf(lumaTerm(d16, hn::BitCast(d16, second)), secondTerms),
                dst[row] + kPairBytes<kLayout> * i);
        }
    }

    template <class D16>
    HWY_INLINE static hn::Vec<D16> lumaTerm(D16 d, hn::Vec<D16> luma) {
        return hn::Add(hn::Mul(luma, hn::Set(d, kLumaFactor)),
                       hn::Set(d, kLumaRest - 128 * kLumaFactor));
    }

    // Less 128, a in the lower bytes and b in the upper ones.
    template <class D16>
    HWY_INLINE hn::Vec<D16> chroma(D16 d, size_t i) const {
        const hn::Rebind<uint8_t, D16> half;
        const auto low = hn::PromoteTo(d, hn::LoadU(half, chromaLow + i));
        const auto high = hn::PromoteTo(d, hn::LoadU(half, chromaHigh + i));
        return hn::Xor(hn::Or(low, hn::ShiftLeft<8>(high)),
                       hn::Set(d, static_cast<int16_t>(0x8080)));
    }
#endif
};

#if HWY_TARGET != HWY_SCALAR

// The least number of pairs there are in a block.
constexpr size_t kLeastPairs = 8;
using Least = hn::CappedTag<uint8_t, 2 * kLeastPairs>;

// Calls use with the widest tag of which so many pairs fill a block; they are not
// fewer than the least number.
template <size_t kCap = kLanes<Widest<uint8_t>>, class Use>
HWY_INLINE void withBlocks(size_t pairs, const Use &use) {
    const hn::CappedTag<uint8_t, kCap> d;
    constexpr size_t n = kLanes<decltype(d)> / 2;
    if constexpr (n > kLeastPairs) {
        if (pairs < n)
            return withBlocks<n>(pairs, use);
    }
    use(d);
}

// Every pair at least once, of at least a block.
template <class D, class Body>
HWY_INLINE void walkThroughCaches(D d, size_t pairs, const Body &body) {
    constexpr size_t n = kLanes<D> / 2;
    size_t i = 0;
    for (; pairs - i >= n; i += n)
        body.template block<ThroughCaches>(d, i);
    if (i != pairs)
        body.template block<ThroughCaches>(d, pairs - n);
}

// Pairs from dst on to the next one that begins a cache line; 64 where none does.
template <size_t kBytes>
size_t pairsToLine(const uint8_t *dst) {
    const size_t pixels = pixelsToLine<kBytes>(dst);
    return pixels % 2 != 0 || pixels == 64 ? 64 : pixels / 2;
}

// The same for at least 64 pairs, and where one begins a cache line around the
// caches.
template <size_t kBytes, class Body>
HWY_INLINE void walkAroundCaches(const uint8_t *dst, size_t pairs, const Body &body) {
    const Widest<uint8_t> d;
    constexpr size_t n = kLanes<decltype(d)> / 2;
    const size_t head = pairsToLine<kBytes>(dst);
    if (head == 64)
        return walkThroughCaches(d, pairs, body);
    for (size_t i = 0; i < head; i += n)
        body.template block<ThroughCaches>(d, i);
    size_t i = head;
    for (; pairs - i >= n; i += n) {
        body.prefetch(i, pairs - n);
        body.template block<AroundCaches>(d, i);
    }
    if (i != pairs)
        body.template block<ThroughCaches>(d, pairs - n);
}

#endif

template <Group kGroup, RasterVideoPixelLayout kLayout>
void convertRun(uint8_t *dst, const uint8_t *src, size_t pairs) {
    using Convert = ConvertGroups<kGroup, kLayout>;
#if HWY_TARGET == HWY_SCALAR
    for (size_t i = 0; i < pairs; ++i)
        Convert{dst, src}.pair(i);
#else
    if (pairs < kLeastPairs) {
        uint8_t groups[4 * kLeastPairs] = {}, pixels[kPairBytes<kLayout> * kLeastPairs];
        std::memcpy(groups, src, 4 * pairs);
        Convert{pixels, groups}.template block<ThroughCaches>(Least(), 0);
        std::memcpy(dst, pixels, kPairBytes<kLayout> * pairs);
        return;
    }
    const Convert body = {dst, src};
    if (isStreamed(kPairBytes<kLayout> * pairs, 1)) {
        walkAroundCaches<kLayout.bytesPerPixel>(dst, pairs, body);
        hwy::FlushStream();
    } else {
        withBlocks(pairs, [&](auto d) HWY_ATTR { walkThroughCaches(d, pairs, body); });
    }
#endif
}

struct Run {
    uint8_t *dst;
    const uint8_t *src;
    VideoGroupOrder order;
    size_t groups;
};

template <RasterVideoPixelLayout kLayout>
void convertGroups(const Run &run) {
    if (run.order == VideoGroupOrder::Yuy2)
        convertRun<kYuy2, kLayout>(run.dst, run.src, run.groups);
    else
        convertRun<kUyvy, kLayout>(run.dst, run.src, run.groups);
}

// NOLINTNEXTLINE(readability-non-const-parameter): dst is written through run
void ConvertPacked(uint8_t *dst, int32_t bppdepth, const uint8_t *src, VideoGroupOrder order,
                   size_t groups) {
    const Run run = {dst, src, order, groups};
    switch (bppdepth) {
    case 15:
        return convertGroups<kVideoLayout15>(run);
    case 16:
        return convertGroups<kVideoLayout16>(run);
    case 24:
        return convertGroups<kVideoLayout24>(run);
    default:
        return convertGroups<kVideoLayout32>(run);
    }
}

#if HWY_TARGET != HWY_SCALAR

// Two rows too short for a block.
template <RasterVideoPixelLayout kLayout>
void convertFewPairs(const ConvertRows<kLayout, 2> &rows, size_t pairs) {
    uint8_t luma[2][2 * kLeastPairs] = {}, high[kLeastPairs] = {}, low[kLeastPairs] = {};
    uint8_t pixels[2][kPairBytes<kLayout> * kLeastPairs];
    for (size_t row = 0; row < 2; ++row)
        std::memcpy(luma[row], rows.luma[row], 2 * pairs);
    std::memcpy(high, rows.chromaHigh, pairs);
    std::memcpy(low, rows.chromaLow, pairs);
    const ConvertRows<kLayout, 2> copies = {{pixels[0], pixels[1]}, {luma[0], luma[1]}, high, low};
    copies.template block<ThroughCaches>(Least(), 0);
    for (size_t row = 0; row < 2; ++row)
        std::memcpy(rows.dst[row], pixels[row], kPairBytes<kLayout> * pairs);
}

// Two rows around the caches: together if they lie to cache lines alike.
template <RasterVideoPixelLayout kLayout>
void streamRows(const ConvertRows<kLayout, 2> &rows, size_t pairs) {
    constexpr size_t kBytes = kLayout.bytesPerPixel;
    if (pairsToLine<kBytes>(rows.dst[0]) == pairsToLine<kBytes>(rows.dst[1]))
        return walkAroundCaches<kBytes>(rows.dst[0], pairs, rows);
    for (size_t row = 0; row < 2; ++row)
        walkAroundCaches<kBytes>(rows.dst[row], pairs, rows.only(row));
}

#endif

template <RasterVideoPixelLayout kLayout>
void convertRowPairs(DstRows dst, const VideoPlanes &src, Size pairs) {
    const NextRows next = {2 * src.luma.step, src.chromaHigh.step};
    const auto rows = [&](size_t r) {
        return ConvertRows<kLayout, 2>{{dst.row(2 * r), dst.row(2 * r + 1)},
                                       {src.luma.row(2 * r), src.luma.row(2 * r + 1)},
                                       src.chromaHigh.row(r),
                                       src.chromaLow.row(r),
                                       r + 1 < pairs.height ? next : NextRows{}};
    };
#if HWY_TARGET == HWY_SCALAR
    for (size_t r = 0; r < pairs.height; ++r)
        for (size_t i = 0; i < pairs.width; ++i)
            rows(r).pair(i);
#else
    if (isStreamed(kPairBytes<kLayout> * pairs.width, 2 * pairs.height)) {
        for (size_t r = 0; r < pairs.height; ++r)
            streamRows(rows(r), pairs.width);
        hwy::FlushStream();
    } else if (pairs.width < kLeastPairs) {
        for (size_t r = 0; r < pairs.height; ++r)
            convertFewPairs(rows(r), pairs.width);
    } else {
        withBlocks(pairs.width, [&](auto d) HWY_ATTR {
            for (size_t r = 0; r < pairs.height; ++r)
                walkThroughCaches(d, pairs.width, rows(r));
        });
    }
#endif
}

void ConvertPlanar(DstRows dst, int32_t bppdepth, const VideoPlanes &src, Size pairs) {
    switch (bppdepth) {
    case 15:
        return convertRowPairs<kVideoLayout15>(dst, src, pairs);
    case 16:
        return convertRowPairs<kVideoLayout16>(dst, src, pairs);
    case 24:
        return convertRowPairs<kVideoLayout24>(dst, src, pairs);
    default:
        return convertRowPairs<kVideoLayout32>(dst, src, pairs);
    }
}

} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace quillon {

HWY_EXPORT(ConvertPacked);
HWY_EXPORT(ConvertPlanar);

void convertPackedFrame(uint8_t *dst, int32_t bppdepth, const uint8_t *src, VideoGroupOrder order,
                        size_t groups) {
    HWY_DYNAMIC_DISPATCH(ConvertPacked)(dst, bppdepth, src, order, groups);
}

void convertPlanarFrame(DstRows dst, int32_t bppdepth, const VideoPlanes &src, Size pairs) {
    HWY_DYNAMIC_DISPATCH(ConvertPlanar)(dst, bppdepth, src, pairs);
}

} // namespace quillon
#endif
