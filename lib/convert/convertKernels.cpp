#include "convert/convertKernels.h"

#include "convert/channels.h"
#include "simd/thresholds.h"

#include <cstring>

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "convert/convertKernels.cpp"
#include "hwy/foreach_target.h"
#include "hwy/highway.h"

#include "convert/conversionBodies-inl.h"
#include "convert/narrowPalette-inl.h"
#include "simd/rowLoop-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {

#if QUILLON_HAS_VECTORS

// Where a chunk takes few instructions, those of the loop count.
constexpr bool kIsUnrolled = kHasInterleavedAccess;

// The functions by body are not inlined: several pairs of formats share a body, and
// each loop has the registers for itself.

// Rows of kUnits pixels to less than kConvertLongRow.
template <size_t kUnits, class Body>
HWY_NOINLINE void convertShortRows(Chunk<kUnits> chunk, DstRows dst, SrcRows src, Extent extent,
                                   const Body &constants) {
    constexpr RowPolicy kPolicy = {.tail = kIsUnrolled ? Tail::kOverlap : Tail::kOverlapInLoop,
                                   .unroll = kIsUnrolled ? 4 : 1,
                                   .prefetches = kUnits >= kConvertPrefetchRow};
    const PrefetchDistance nextRow = {dst.stride, src.stride};
    // With rows that might be empty, compilers set up constants again in each.
    if (extent.width < kUnits || extent.height == 0)
        __builtin_unreachable();
    Body body = constants;
    const auto forEachRow = [&](const auto &walk) HWY_ATTR {
        for (size_t y = 0; y < extent.height; ++y) {
            body.dst = dst.row(y);
            body.src = src.row(y);
            walk();
        }
    };
    if (kIsUnrolled && extent.width <= 2 * kUnits)
        forEachRow([&]() HWY_ATTR {
            body(chunk, 0, Unaligned());
            body(chunk, extent.width - kUnits, Unaligned());
        });
    else
        forEachRow([&]() HWY_ATTR { walkRow<kPolicy>(chunk, extent.width, body, nextRow); });
}

template <class Access, class Body>
HWY_NOINLINE void convertLongRows(DstRows dst, SrcRows src, Extent extent, const Body &constants) {
    constexpr RowPolicy kPolicy = {.unroll = kIsUnrolled ? 4 : 1, .prefetches = true};
    constexpr PrefetchDistance kDistance =
        std::is_same_v<Access, NonTemporal>
            ? PrefetchDistance{0, kPrefetchUncached}
            : PrefetchDistance{kPrefetchInCaches, kPrefetchInCaches};
    Body body = constants;
    for (size_t y = 0; y < extent.height; ++y) {
        body.dst = dst.row(y);
        body.src = src.row(y);
        walkAlignedRow<Access, kPolicy>(Chunk<kVectorBytes>(), extent.width, body, kDistance);
    }
}

template <class Body>
HWY_INLINE void convertRowsBy(DstRows dst, SrcRows src, Extent extent, const Body &body) {
    const size_t dstBytes = Body::kDstBytes * extent.width;
    if (areContiguous(dst, dstBytes) && areContiguous(src, Body::kSrcBytes * extent.width))
        extent = asOneRow(extent);
    if (extent.width < kConvertLongRow) {
        withWidestChunk<kVectorBytes, 64, 32, 16, 4, 1>(extent.width, [&](auto chunk) HWY_ATTR {
            convertShortRows(chunk, dst, src, extent, body);
        });
    } else if (isNonTemporal({Body::kDstBytes * extent.width, extent.height})) {
        convertLongRows<NonTemporal>(dst, src, extent, body);
        hwy::FlushStream();
    } else {
        convertLongRows<Aligned>(dst, src, extent, body);
    }
}

template <PixelFormat kFrom, PixelFormat kTo>
void convertRectangle(DstRows dst, SrcRows src, Extent extent, const uint32_t *palette) {
    constexpr FormatTraits from = traitsOf(kFrom), to = traitsOf(kTo);
    static_assert(from.bytesPerPixel > 1 || kFrom == PixelFormat::kIndex,
                  "SourceOf takes single bytes for palette indices");
    if constexpr (!kHasInterleavedAccess && from.bytesPerPixel == 2 && to.bytesPerPixel <= 2) {
        convertRowsBy(dst, src, extent, ConvertFrom16Body<kFrom, kTo>{{dst.first, src.first}});
    } else {
        using Through32 = ConvertThrough32Body<SourceOf<kFrom>, DestinationOf<kTo>>;
        constexpr NarrowingWeights weights = narrowingWeights(to);
        if constexpr (kHasTableLookup && kFrom == PixelFormat::kIndex && to.bytesPerPixel <= 2) {
            if (paysToNarrowPalette<to.bytesPerPixel>(extent))
                return convertByNarrowPalette<DestinationOf<kTo>>(dst, src, extent, palette,
                                                                  weights);
        }
        const Through32 body = {{dst.first, src.first}, palette, weights};
        if constexpr (kHasInterleavedAccess && from.bytesPerPixel >= 3 && to.bytesPerPixel >= 3)
            convertRowsBy(dst, src, extent, ConvertByCopyBody<kFrom, kTo>{body});
        else if constexpr (kHasInterleavedAccess && kFrom != PixelFormat::kIndex)
            convertRowsBy(dst, src, extent, ConvertByChannelsBody<kFrom, kTo>{body});
        else
            convertRowsBy(dst, src, extent, body);
    }
}

#else

template <PixelFormat kFrom, PixelFormat kTo>
void convertRectangle(DstRows dst, SrcRows src, Extent extent, const uint32_t *palette) {
    constexpr FormatTraits from = traitsOf(kFrom), to = traitsOf(kTo);
    constexpr uint32_t alpha = from.hasAlpha ? 0 : 0xFF000000;
    for (size_t y = 0; y < extent.height; ++y)
        for (size_t x = 0; x < extent.width; ++x) {
            uint32_t pixel = 0;
            std::memcpy(&pixel, src.row(y) + x * from.bytesPerPixel, from.bytesPerPixel);
            if constexpr (kFrom == PixelFormat::kIndex)
                pixel = palette[pixel];
            const uint32_t converted = convertPixel<kFrom, kTo>(pixel) | alpha;
            std::memcpy(dst.row(y) + x * to.bytesPerPixel, &converted, to.bytesPerPixel);
        }
}

#endif

using RectangleFunction = void (*)(DstRows dst, SrcRows src, Extent extent,
                                   const uint32_t *palette);

constexpr PairTable<RectangleFunction>
    kRectangleFunctions([]<PixelFormat kFrom, PixelFormat kTo>() -> RectangleFunction {
        if constexpr (kFrom == kTo)
            return nullptr; // a copy
        else
            return convertRectangle<kFrom, kTo>;
    });

void convertKernel(DstRows dst, SrcRows src, Extent extent, const uint32_t *palette,
                   PixelFormat srcFormat, PixelFormat dstFormat) {
    kRectangleFunctions.at(srcFormat, dstFormat)(dst, src, extent, palette);
}

} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace quillon {

HWY_EXPORT(convertKernel);

void convertRows(DstRows dst, SrcRows src, Extent extent, const uint32_t *palette,
                 PixelFormat srcFormat, PixelFormat dstFormat) {
    HWY_DYNAMIC_DISPATCH(convertKernel)(dst, src, extent, palette, srcFormat, dstFormat);
}

} // namespace quillon
#endif
