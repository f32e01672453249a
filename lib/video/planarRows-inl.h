// The rows of planar frames.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_VIDEO_PLANAR_ROWS_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_VIDEO_PLANAR_ROWS_INL_H
#undef QUILLON_VIDEO_PLANAR_ROWS_INL_H
#else
#define QUILLON_VIDEO_PLANAR_ROWS_INL_H
#endif

#include "hwy/highway.h"

#include "simd/rowLoop-inl.h"
#include "video/splitSamples-inl.h"
#include "video/videoFormats.h"
#include "video/yuv-inl.h"

#include <cstring>

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
#if QUILLON_HAS_VECTORS

// One row, or two that share their chroma.
template <VideoPixelLayout kLayout, size_t kRows>
struct PlanarBody {
    static constexpr size_t kDstBytes = kLayout.bytesPerPixel;
    static constexpr size_t kUnitsPerGroup = 2;
    uint8_t *dst;
    const uint8_t *luma, *chromaHigh, *chromaLow;
    ptrdiff_t dstStride, lumaStride; // to the second row

    // Chroma samples are half as many, and in rows half as many as well.
    template <class C>
    HWY_INLINE void prefetch(C /*chunk*/, size_t i, PrefetchDistance distance) const {
        for (size_t row = 0; row < kRows; ++row)
            prefetchLines(lumaRow(row) + i, C::kUnits, distance.src);
        prefetchLines(chromaHigh + i / 2, C::kUnits / 2, distance.src / 4);
        prefetchLines(chromaLow + i / 2, C::kUnits / 2, distance.src / 4);
    }

    template <class C, class Access>
    HWY_INLINE void operator()(C /*chunk*/, size_t i, Access access) const {
        if constexpr (C::kUnits == 2 * kVectorBytes)
            return convertSplit(i);
        const hn::CappedTag<uint8_t, C::kUnits> d;
        const hn::Repartition<int16_t, decltype(d)> d16;
        const auto ab =
            orderForStore<kDstBytes, QuadOrder::kRising>(d16, chroma(d16, i / 2, access));
        const auto firstTerms = termsOf(d16, hn::InterleaveLower(d16, ab, ab));
        const auto secondTerms = termsOf(d16, hn::InterleaveUpper(d16, ab, ab));
        for (size_t row = 0; row < kRows; ++row) {
            const auto samples =
                orderForStore<kDstBytes, QuadOrder::kRising>(d, access.load(d, lumaRow(row) + i));
            const auto first = hn::InterleaveLower(d, samples, hn::Zero(d));
            const auto second = hn::InterleaveUpper(d, samples, hn::Zero(d));
            storePixels<kLayout, QuadOrder::kForStore>(
                d, sumsOf(lumaTerm(d16, hn::BitCast(d16, first)), firstTerms),
                sumsOf(lumaTerm(d16, hn::BitCast(d16, second)), secondTerms),
                dstRow(row) + kDstBytes * i, access);
        }
    }

    PlanarBody<kLayout, 1> onlyRow(size_t row) const {
        return {dstRow(row), lumaRow(row), chromaHigh, chromaLow, 0, 0};
    }

    uint8_t *dstRow(size_t row) const { return row == 0 ? dst : dst + dstStride; }
    const uint8_t *lumaRow(size_t row) const { return row == 0 ? luma : luma + lumaStride; }

private:
    HWY_INLINE void convertSplit(size_t i) const {
        const Widest<uint8_t> d;
        const auto chroma =
            chromaTermsOf(d, hn::LoadU(d, chromaLow + i / 2), hn::LoadU(d, chromaHigh + i / 2));
        for (size_t row = 0; row < kRows; ++row) {
            hn::Vec<decltype(d)> even, odd;
            hn::LoadInterleaved2(d, lumaRow(row) + i, even, odd);
            storeSplitPixels<kLayout>(d, even, odd, chroma, dstRow(row) + kDstBytes * i);
        }
    }

    // a in the lower bytes, b in the upper ones.
    template <class D16, class Access>
    HWY_INLINE hn::Vec<D16> chroma(D16 d16, size_t i, Access access) const {
        const hn::Rebind<uint8_t, D16> half;
        const auto low = hn::PromoteTo(d16, access.load(half, chromaLow + i));
        const auto high = hn::PromoteTo(d16, access.load(half, chromaHigh + i));
        return hn::Xor(hn::Or(low, hn::ShiftLeft<8>(high)),
                       hn::Set(d16, static_cast<int16_t>(0x8080)));
    }

    template <class D16>
    HWY_INLINE static ChromaTerms<hn::Vec<D16>> termsOf(D16 d16, hn::Vec<D16> ab) {
        return chromaTerms(d16, hn::ShiftLeft<8>(ab), ab);
    }
};

// Converts rows that are shorter than a chunk, by way of rows of its own.
template <VideoPixelLayout kLayout>
class ShortRowsConverter {
public:
    void operator()(const PlanarBody<kLayout, 2> &rows, size_t width) {
        for (size_t row = 0; row < 2; ++row)
            std::memcpy(luma_[row], rows.lumaRow(row), width);
        std::memcpy(chromaHigh_, rows.chromaHigh, width / 2);
        std::memcpy(chromaLow_, rows.chromaLow, width / 2);
        const PlanarBody<kLayout, 2> copies = {pixels_[0], luma_[0],           chromaHigh_,
                                               chromaLow_, sizeof(pixels_[0]), sizeof(luma_[0])};
        copies(Chunk<kLeastPixels>(), 0, Unaligned());
        for (size_t row = 0; row < 2; ++row)
            std::memcpy(rows.dstRow(row), pixels_[row], kLayout.bytesPerPixel * width);
    }

private:
    uint8_t luma_[2][kLeastPixels] = {};
    uint8_t chromaHigh_[kLeastPixels / 2] = {}, chromaLow_[kLeastPixels / 2] = {};
    uint8_t pixels_[2][kLayout.bytesPerPixel * kLeastPixels];
};

// Together where both rows lie to cache lines alike.
template <VideoPixelLayout kLayout>
void convertRowsNonTemporal(const PlanarBody<kLayout, 2> &rows, size_t width,
                            PrefetchDistance distance) {
    using Body = PlanarBody<kLayout, 2>;
    const Chunk<kMostPixels> chunk;
    if (headOf<Body>(rows.dst) == headOf<Body>(rows.dstRow(1)))
        return walkAlignedRow<NonTemporal, kPrefetchingPolicy>(chunk, width, rows, distance);
    for (size_t row = 0; row < 2; ++row)
        walkAlignedRow<NonTemporal, kPrefetchingPolicy>(chunk, width, rows.onlyRow(row), distance);
}

#endif
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
