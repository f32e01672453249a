#include "fill/fillKernels.h"

#include "simd/thresholds.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "fill/fillKernels.cpp"
#include "hwy/foreach_target.h"
#include "hwy/highway.h"

#include "simd/pixelPattern-inl.h"
#include "simd/rowLoop-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {

#if QUILLON_HAS_VECTORS

// ---- Fill -----------------------------------------------------------------

template <class D>
struct FillBody {
    uint8_t *dst;
    PatternVectors<D> vectors; // from the first whole chunk on

    template <class C, class Access>
    HWY_INLINE void operator()(C /*chunk*/, size_t i, Access access) const {
        access.store(D(), vectors.template get<C::kTurn>(), dst + i);
    }
};

// Rows of at least one vector.  The first and the last vector are stored as they
// come and may overlap those between, which are aligned in rows of some length.
template <class Access, class D>
void fillRowsBy(D d, DstRows dst, ByteExtent extent, const PixelPattern &pattern) {
    constexpr size_t n = kBytesOf<D>;
    constexpr RowPolicy kPolicy = {.tail = Tail::kNone, .unroll = 6};
    const auto first = pattern.from(d, 0);
    const auto last = pattern.from(d, extent.rowBytes - n);
    const bool isAligned = extent.rowBytes >= 4 * n;
    size_t begin = n;
    FillBody<D> body = {dst.first, {d, pattern, begin}};
    for (size_t y = 0; y < extent.height; ++y) {
        body.dst = dst.row(y);
        const size_t toAligned = n - reinterpret_cast<uintptr_t>(body.dst) % n;
        if (isAligned && begin != toAligned) {
            begin = toAligned;
            body.vectors = {d, pattern, begin};
        }
        storeBytes(d, first, body.dst);
        if (extent.rowBytes > 2 * n)
            walkFrom<kPolicy, Access>(Chunk<n>(), begin, extent.rowBytes - 1, body);
        if (extent.rowBytes != n)
            storeBytes(d, last, body.dst + extent.rowBytes - n);
    }
}

// Rows of 1 to 3 bytes.
void fillFewBytes(DstRows dst, ByteExtent extent, const PixelPattern &pattern) {
    const uint32_t word = hn::GetLane(pattern.from(hn::CappedTag<uint32_t, 1>(), 0));
    const size_t middle = extent.rowBytes / 2, last = extent.rowBytes - 1;
    for (size_t y = 0; y < extent.height; ++y) {
        uint8_t *row = dst.row(y);
        row[0] = static_cast<uint8_t>(word);
        row[middle] = static_cast<uint8_t>(word >> (8 * middle));
        row[last] = static_cast<uint8_t>(word >> (8 * last));
    }
}

void fillKernel(DstRows dst, Extent extent, int32_t bytesPerPixel, uint32_t pixel) {
    ByteExtent bytes = inBytes(extent, bytesPerPixel);
    if (areContiguous(dst, bytes.rowBytes))
        bytes = asOneRow(bytes);
    const PixelPattern pattern(pixel, bytesPerPixel);
    if (isNonTemporal(bytes)) {
        fillRowsBy<NonTemporal>(Widest<uint32_t>(), dst, bytes, pattern);
        hwy::FlushStream();
    } else if (bytes.rowBytes < 4) {
        fillFewBytes(dst, bytes, pattern);
    } else {
        withWidestChunk<kVectorBytes, 64, 32, 16, 8, 4>(bytes.rowBytes, [&](auto chunk) HWY_ATTR {
            const hn::CappedTag<uint32_t, chunk.kUnits / 4> d;
            fillRowsBy<Unaligned>(d, dst, bytes, pattern);
        });
    }
}

// ---- Alpha ----------------------------------------------------------------

struct FillAlphaBody {
    uint8_t *dst;
    uint32_t alpha; // in the top byte

    template <class C, class Access>
    HWY_INLINE void operator()(C /*chunk*/, size_t i, Access access) const {
        const hn::CappedTag<uint32_t, C::kUnits> d;
        uint8_t *pixels = dst + 4 * i;
        const auto colour = hn::And(access.load(d, pixels), hn::Set(d, 0x00FFFFFF));
        access.store(d, hn::Or(colour, hn::Set(d, alpha)), pixels);
    }
};

// Rows of 1 to 3 pixels, too short for vectors: only the bytes that change.
void fillFewAlphas(DstRows dst, Extent extent, uint8_t alpha) {
    for (size_t y = 0; y < extent.height; ++y) {
        uint8_t *row = dst.row(y);
        row[3] = row[4 * (extent.width / 2) + 3] = row[4 * extent.width - 1] = alpha;
    }
}

void fillAlphaKernel(DstRows dst, Extent extent, uint8_t alpha) {
    if (areContiguous(dst, 4 * extent.width))
        extent = asOneRow(extent);
    if (extent.width < 4)
        return fillFewAlphas(dst, extent, alpha);
    for (size_t y = 0; y < extent.height; ++y)
        walkRowOnce<4>(extent.width, FillAlphaBody{dst.row(y), uint32_t{alpha} << 24});
}

#else

void fillKernel(DstRows dst, Extent extent, int32_t bytesPerPixel, uint32_t pixel) {
    const auto size = static_cast<size_t>(bytesPerPixel);
    for (size_t y = 0; y < extent.height; ++y)
        for (size_t x = 0; x < extent.width; ++x)
            for (size_t byte = 0; byte < size; ++byte)
                dst.row(y)[size * x + byte] = static_cast<uint8_t>(pixel >> 8 * byte);
}

void fillAlphaKernel(DstRows dst, Extent extent, uint8_t alpha) {
    for (size_t y = 0; y < extent.height; ++y)
        for (size_t x = 0; x < extent.width; ++x)
            dst.row(y)[4 * x + 3] = alpha;
}

#endif

} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace quillon {

HWY_EXPORT(fillKernel);
HWY_EXPORT(fillAlphaKernel);

void fillRows(DstRows dst, Extent extent, int32_t bytesPerPixel, uint32_t pixel) {
    HWY_DYNAMIC_DISPATCH(fillKernel)(dst, extent, bytesPerPixel, pixel);
}

void fillAlphaRows(DstRows dst, Extent extent, uint8_t alpha) {
    HWY_DYNAMIC_DISPATCH(fillAlphaKernel)(dst, extent, alpha);
}

} // namespace quillon
#endif
