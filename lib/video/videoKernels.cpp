#include "video/videoKernels.h"

#include "simd/thresholds.h"
#include "video/videoFormats.h"
#include "video/videoPlain.h"

#include <quillon/rasterVideo.h>

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "video/videoKernels.cpp"
#include "hwy/foreach_target.h"
#include "hwy/highway.h"

#include "simd/rowLoop-inl.h"
#include "video/planarRows-inl.h"
#include "video/splitSamples-inl.h"
#include "video/yuv-inl.h"

#include <cstring>

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {

#if QUILLON_HAS_VECTORS

// ---- Interleaved frames ---------------------------------------------------

template <VideoGroup kGroup, VideoPixelLayout kLayout>
struct InterleavedBody {
    static constexpr size_t kDstBytes = kLayout.bytesPerPixel;
    static constexpr size_t kUnitsPerGroup = 2;
    uint8_t *dst;
    const uint8_t *src;

    template <class C>
    HWY_INLINE void prefetch(C /*chunk*/, size_t i, PrefetchDistance distance) const {
        prefetchLines(src + 2 * i, 2 * C::kUnits, distance.src);
    }

    template <class C, class Access>
    HWY_INLINE void operator()(C /*chunk*/, size_t i, Access access) const {
        const hn::CappedTag<uint8_t, C::kUnits> d;
        const uint8_t *samples = src + 2 * i;
        if constexpr (C::kUnits == 2 * kVectorBytes)
            return convertSplitGroups<kGroup, kLayout>(samples, dst + kDstBytes * i);
        const auto first = sumsOfGroups<kGroup>(d, access.load(d, samples));
        const auto second = sumsOfGroups<kGroup>(d, access.load(d, samples + C::kUnits));
        storePixels<kLayout, QuadOrder::kNarrowed>(d, first, second, dst + kDstBytes * i, access);
    }
};

template <VideoGroup kGroup, VideoPixelLayout kLayout>
void convertFewInterleaved(uint8_t *dst, const uint8_t *src, size_t pixels) {
    uint8_t samples[2 * kLeastPixels] = {}, converted[kLayout.bytesPerPixel * kLeastPixels];
    const InterleavedBody<kGroup, kLayout> body = {converted, samples};
    std::memcpy(samples, src, 2 * pixels);
    body(Chunk<kLeastPixels>(), 0, Unaligned());
    std::memcpy(dst, converted, kLayout.bytesPerPixel * pixels);
}

template <VideoGroup kGroup>
struct InterleavedFrame {
    uint8_t *dst;
    const uint8_t *src;
    size_t pixels;

    template <VideoPixelLayout kLayout>
    void convert() const {
        if (pixels < kLeastPixels)
            return convertFewInterleaved<kGroup, kLayout>(dst, src, pixels);
        const InterleavedBody<kGroup, kLayout> body = {dst, src};
        if (isNonTemporal({kLayout.bytesPerPixel * pixels, 1})) {
            walkAlignedRow<NonTemporal, kPrefetchingPolicy>(Chunk<kMostPixels>(), pixels, body,
                                                            {0, kPrefetchUncached});
            hwy::FlushStream();
        } else {
            withVideoChunk(pixels, [&](auto chunk) HWY_ATTR { walkRow(chunk, pixels, body); });
        }
    }
};

// ---- Planar frames --------------------------------------------------------

struct PlanarFrame {
    DstRows dst;
    VideoPlanes src;
    Extent extent;

    template <VideoPixelLayout kLayout>
    void convert() const {
        // A copy: for all the compiler knows, the stores of pixels change *this.
        const PlanarFrame frame = *this;
        const size_t width = extent.width;
        if (isNonTemporal(inBytes(extent, kLayout.bytesPerPixel))) {
            // The same place of the next rows.
            const PrefetchDistance distance = {0, 2 * src.luma.stride};
            frame.forRowPairs<kLayout>(
                [=](const auto &rows) HWY_ATTR { convertRowsNonTemporal(rows, width, distance); });
            hwy::FlushStream();
        } else if (width < kLeastPixels) {
            ShortRowsConverter<kLayout> converter;
            frame.forRowPairs<kLayout>([&](const auto &rows) HWY_ATTR { converter(rows, width); });
        } else {
            withVideoChunk(width, [=](auto chunk) HWY_ATTR {
                frame.forRowPairs<kLayout>([=](const auto &rows)
                                               HWY_ATTR { walkRow(chunk, width, rows); });
            });
        }
    }

private:
    template <VideoPixelLayout kLayout, class Use>
    HWY_INLINE void forRowPairs(const Use &use) const {
        PlanarBody<kLayout, 2> rows = {dst.first,           src.luma.first, src.chromaHigh.first,
                                       src.chromaLow.first, dst.stride,     src.luma.stride};
        for (size_t y = 0; y < extent.height; y += 2) {
            use(rows);
            rows.dst = advance(rows.dst, 2 * static_cast<size_t>(dst.stride));
            rows.luma = advance(rows.luma, 2 * static_cast<size_t>(src.luma.stride));
            rows.chromaHigh = advance(rows.chromaHigh, static_cast<size_t>(src.chromaHigh.stride));
            rows.chromaLow = advance(rows.chromaLow, static_cast<size_t>(src.chromaLow.stride));
        }
    }
};

#else

template <VideoGroup kGroup>
struct InterleavedFrame {
    uint8_t *dst;
    const uint8_t *src;
    size_t pixels;

    template <VideoPixelLayout kLayout>
    void convert() const {
        for (size_t i = 0; i < pixels; i += 2) {
            const uint8_t *group = src + 2 * i;
            convertPair<kLayout>(group[kGroup.luma], group[kGroup.luma + 2],
                                 group[kGroup.chromaLow], group[kGroup.chromaHigh],
                                 dst + kLayout.bytesPerPixel * i);
        }
    }
};

struct PlanarFrame {
    DstRows dst;
    const VideoPlanes &src;
    Extent extent;

    template <VideoPixelLayout kLayout>
    void convert() const {
        for (size_t y = 0; y < extent.height; ++y)
            for (size_t x = 0; x < extent.width; x += 2)
                convertPair<kLayout>(
                    src.luma.row(y)[x], src.luma.row(y)[x + 1], src.chromaLow.row(y / 2)[x / 2],
                    src.chromaHigh.row(y / 2)[x / 2], dst.row(y) + kLayout.bytesPerPixel * x);
    }
};

#endif

void convertInterleavedKernel(uint8_t *dst, int32_t bppdepth, const uint8_t *src, uint32_t format,
                              size_t pixels) {
    if (format == RASTER_VIDEO_YUY2)
        convertAt(bppdepth, InterleavedFrame<kYuy2>{dst, src, pixels});
    else
        convertAt(bppdepth, InterleavedFrame<kUyvy>{dst, src, pixels});
}

void convertPlanarKernel(DstRows dst, int32_t bppdepth, const VideoPlanes &src, Extent extent) {
    convertAt(bppdepth, PlanarFrame{dst, src, extent});
}

} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace quillon {

HWY_EXPORT(convertInterleavedKernel);
HWY_EXPORT(convertPlanarKernel);

void convertInterleavedRun(uint8_t *dst, int32_t bppdepth, const uint8_t *src, uint32_t format,
                           size_t pixels) {
    HWY_DYNAMIC_DISPATCH(convertInterleavedKernel)(dst, bppdepth, src, format, pixels);
}

void convertPlanarRows(DstRows dst, int32_t bppdepth, const VideoPlanes &src, Extent extent) {
    HWY_DYNAMIC_DISPATCH(convertPlanarKernel)(dst, bppdepth, src, extent);
}

} // namespace quillon
#endif
