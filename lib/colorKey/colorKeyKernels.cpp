#include "colorKey/colorKeyKernels.h"

#include "colorKey/colorKeyPlain.h"
#include "simd/thresholds.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "colorKey/colorKeyKernels.cpp"
#include "hwy/foreach_target.h"
#include "hwy/highway.h"

#include "simd/rowLoop-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {

#if QUILLON_HAS_VECTORS

// Rows of fewer pixels are not worth a vector.
constexpr size_t kLeastWidth = 4;

template <class KeyPixel>
struct ColorKeyBody {
    static constexpr size_t kDstBytes = 4;
    uint8_t *dst;
    const uint8_t *background, *overlay, *keys;
    uint32_t key; // without the bits that do not count

    template <class C, class Access>
    HWY_INLINE void operator()(C /*chunk*/, size_t i, Access access) const {
        const hn::CappedTag<uint32_t, C::kUnits> d;
        constexpr size_t n = kLanes<decltype(d)>;
        hn::Vec<decltype(d)> results[C::kUnits / n];
        for (size_t v = 0; v < C::kUnits / n; ++v) {
            const auto isKey = hn::Eq(loadKeys(d, i + v * n, access), hn::Set(d, key));
            const auto over = access.load(d, overlay + 4 * (i + v * n));
            const auto under = access.load(d, background + 4 * (i + v * n));
            results[v] = hn::IfThenElse(isKey, over, under);
        }
        for (size_t v = 0; v < C::kUnits / n; ++v)
            access.store(d, results[v], dst + 4 * (i + v * n));
    }

private:
    // Of pixels of 32 bits the top byte does not count.
    template <class D, class Access>
    HWY_INLINE hn::Vec<D> loadKeys(D d, size_t i, Access access) const {
        if constexpr (sizeof(KeyPixel) == 4) {
            return hn::ShiftLeft<8>(access.load(d, keys + 4 * i));
        } else {
            const hn::Rebind<KeyPixel, D> narrow;
            return hn::PromoteTo(d, access.load(narrow, keys + sizeof(KeyPixel) * i));
        }
    }
};

// Whether the pixels of a row have to be composed one by one.  The destination
// advances faster than narrow key pixels and may catch up with them anywhere, so
// that any overlap with those counts.
template <class KeyPixel>
bool hasHazard(const ColorKeyBody<KeyPixel> &row, size_t width) {
    constexpr size_t kChunkBytes = kVectorsAtOnce * kVectorBytes;
    if (hasOverlapHazard(row.dst, row.background, kChunkBytes) ||
        hasOverlapHazard(row.dst, row.overlay, kChunkBytes))
        return true;
    if constexpr (sizeof(KeyPixel) == 4)
        return hasOverlapHazard(row.dst, row.keys, kChunkBytes);
    const auto dst = reinterpret_cast<uintptr_t>(row.dst);
    const auto keys = reinterpret_cast<uintptr_t>(row.keys);
    return dst < keys + sizeof(KeyPixel) * width && keys < dst + 4 * width;
}

// Whether nothing that is written is read.
bool areApart(const ColorKeySurfaces &surfaces, Extent extent, int32_t keyBytes) {
    const AddressRange dst = addressesOf(surfaces.dst, inBytes(extent, 4));
    return !dst.overlaps(addressesOf(surfaces.background, inBytes(extent, 4))) &&
           !dst.overlaps(addressesOf(surfaces.overlay, inBytes(extent, 4))) &&
           !dst.overlaps(addressesOf(surfaces.keys, inBytes(extent, keyBytes)));
}

template <class KeyPixel>
void composeRows(const ColorKeySurfaces &surfaces, Extent extent, uint32_t key) {
    const bool isAround =
        isNonTemporal(inBytes(extent, 4)) && areApart(surfaces, extent, sizeof(KeyPixel));
    for (size_t y = 0; y < extent.height; ++y) {
        const ColorKeyBody<KeyPixel> body = {surfaces.dst.row(y), surfaces.background.row(y),
                                             surfaces.overlay.row(y), surfaces.keys.row(y),
                                             sizeof(KeyPixel) == 4 ? key << 8 : key};
        if (isAround)
            walkAlignedRow<NonTemporal>(Chunk<kVectorBytes / 4>(), extent.width, body);
        else if (extent.width < kLeastWidth || hasHazard(body, extent.width))
            composeRowPlain<KeyPixel>(body.dst, body.background, body.overlay, body.keys,
                                      extent.width, key);
        else
            walkRowOnce<4, kVectorsAtOnce>(extent.width, body);
    }
    if (isAround)
        hwy::FlushStream();
}

#else

template <class KeyPixel>
void composeRows(const ColorKeySurfaces &surfaces, Extent extent, uint32_t key) {
    for (size_t y = 0; y < extent.height; ++y)
        composeRowPlain<KeyPixel>(surfaces.dst.row(y), surfaces.background.row(y),
                                  surfaces.overlay.row(y), surfaces.keys.row(y), extent.width, key);
}

#endif

void colorKeyKernel(const ColorKeySurfaces &surfaces, Extent extent, int32_t keyBytes,
                    uint32_t key) {
    const size_t rowBytes = 4 * extent.width;
    if (areContiguous(surfaces.dst, rowBytes) && areContiguous(surfaces.background, rowBytes) &&
        areContiguous(surfaces.overlay, rowBytes) &&
        areContiguous(surfaces.keys, inBytes(extent, keyBytes).rowBytes))
        extent = asOneRow(extent);
    switch (keyBytes) {
    case 1:
        return composeRows<uint8_t>(surfaces, extent, key);
    case 2:
        return composeRows<uint16_t>(surfaces, extent, key);
    default:
        return composeRows<uint32_t>(surfaces, extent, key);
    }
}

} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace quillon {

HWY_EXPORT(colorKeyKernel);

void composeByKey(const ColorKeySurfaces &surfaces, Extent extent, int32_t keyBytes, uint32_t key) {
    HWY_DYNAMIC_DISPATCH(colorKeyKernel)(surfaces, extent, keyBytes, key);
}

} // namespace quillon
#endif
