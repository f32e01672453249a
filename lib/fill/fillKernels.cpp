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

// A row whose first and last vector are stored unaligned and overlap those
// between, which are aligned.
template <class D>
struct FillBody {
    const PixelPattern &pattern;
    uint8_t *dst = nullptr;
    size_t begin = kBytesOf<D>; // of the aligned vectors
    PatternVectors<D> vectors = {D(), pattern, begin};

    template <class C, class Access>
    HWY_INLINE void operator()(C /*chunk*/, size_t i, Access access) const {
        access.store(D(), vectors.template get<C::kTurn>(), dst + i);
        keepStoreOrder();
    }

    HWY_INLINE void moveTo(uint8_t *row) {
        dst = row;
        const size_t newBegin = kBytesOf<D> - reinterpret_cast<uintptr_t>(row) % kBytesOf<D>;
        if (newBegin == begin)
            return;
        if (!pattern.isSameAt(begin, newBegin))
            vectors = {D(), pattern, newBegin};
        begin = newBegin;
    }
};

// Rows that kVectors vectors hold, of which the last may overlap the one before.
template <size_t kVectors, class D>
void fillShortRows(D d, DstRows dst, ByteExtent extent, const PixelPattern &pattern) {
    constexpr size_t n = kBytesOf<D>;
    const auto first = pattern.from(d, 0);
    const auto last = pattern.from(d, extent.rowBytes - n);
    FillBody<D> body = {pattern};
    for (size_t y = 0; y < extent.height; ++y) {
        body.moveTo(dst.row(y));
        storeBytes(d, first, body.dst);
        if constexpr (kVectors > 2) {
            walkTurns<Unaligned, n>(body.begin, body, std::make_index_sequence<kVectors - 2>());
            if (body.begin + (kVectors - 1) * n < extent.rowBytes)
                body(Chunk<n, kVectors - 2>(), body.begin + (kVectors - 2) * n, Unaligned());
        }
        if constexpr (kVectors > 1)
            storeBytes(d, last, body.dst + extent.rowBytes - n);
    }
}

template <class Access>
void fillLongRows(DstRows dst, ByteExtent extent, const PixelPattern &pattern) {
    // Multiples of the three vectors of a pattern.
    constexpr RowPolicy kPolicy = {.tail = Tail::kNone, .unroll = kHasPairedStores ? 12 : 6};
    constexpr Chunk<kVectorBytes> kChunk;
    const Widest<uint32_t> d;
    const auto first = pattern.from(d, 0);
    const auto last = pattern.from(d, extent.rowBytes - kVectorBytes);
    FillBody<Widest<uint32_t>> body = {pattern};
    for (size_t y = 0; y < extent.height; ++y) {
        body.moveTo(dst.row(y));
        storeBytes(d, first, body.dst);
        walkFrom<kPolicy, Access>(kChunk, body.begin, extent.rowBytes - 1, body);
        storeBytes(d, last, body.dst + extent.rowBytes - kVectorBytes);
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
        fillLongRows<NonTemporal>(dst, bytes, pattern);
        hwy::FlushStream();
    } else if (bytes.rowBytes > kFillShortVectors * kVectorBytes) {
        fillLongRows<Unaligned>(dst, bytes, pattern);
    } else if (bytes.rowBytes < 4) {
        fillFewBytes(dst, bytes, pattern);
    } else {
        withShortRow<kFillShortVectors>(bytes.rowBytes, [&](auto d, auto vectors) HWY_ATTR {
            fillShortRows<vectors>(d, dst, bytes, pattern);
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
        const auto old = access.load(d, pixels);
        const auto alphas = hn::Set(d, alpha);
        if constexpr (kHasBitInsertion)
            access.store(d, hn::IfVecThenElse(hn::Set(d, 0xFF000000), alphas, old), pixels);
        else
            access.store(d, hn::Or(hn::And(old, hn::Set(d, 0x00FFFFFF)), alphas), pixels);
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
