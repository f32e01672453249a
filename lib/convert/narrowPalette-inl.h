// Conversion of palette indices to formats of 8 or 16 bits by a palette that is narrowed
// first.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_CONVERT_NARROW_PALETTE_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_CONVERT_NARROW_PALETTE_INL_H
#undef QUILLON_CONVERT_NARROW_PALETTE_INL_H
#else
#define QUILLON_CONVERT_NARROW_PALETTE_INL_H
#endif

#include "hwy/highway.h"

#include "convert/conversionBodies-inl.h"
#include "simd/rowLoop-inl.h"
#include "simd/tableLookup-inl.h"

#include <algorithm>

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
#if QUILLON_HAS_VECTORS

// Palette indices from begin on, below end.
struct IndexRange {
    size_t begin = 256, end = 0;

    bool isAll() const { return begin == 0 && end == 256; }
    bool contains(const IndexRange &other) const {
        return begin <= other.begin && other.end <= end;
    }
};

// From the lowest index of a rectangle to its highest one.
inline IndexRange indicesIn(SrcRows src, Extent extent) {
    const Widest<uint8_t> d;
    constexpr size_t n = kVectorBytes;
    auto lowest = hn::Set(d, 0xFF), highest = hn::Zero(d);
    const auto add = [&](hn::Vec<decltype(d)> indices) HWY_ATTR {
        lowest = hn::Min(lowest, indices);
        highest = hn::Max(highest, indices);
    };
    for (size_t y = 0; y < extent.height; ++y) {
        const uint8_t *row = src.row(y);
        if (extent.width >= n) {
            for (size_t x = 0; x < extent.width - n; x += n)
                add(loadBytes(d, row + x));
            add(loadBytes(d, row + extent.width - n));
        } else {
            const auto isIn = hn::FirstN(d, extent.width);
            const auto indices = FirstLanes{extent.width}.load(d, row);
            add(hn::IfThenElse(isIn, indices, hn::Set(d, row[0])));
        }
    }
    HWY_ALIGN uint8_t low[n], high[n];
    hn::Store(lowest, d, low);
    hn::Store(highest, d, high);
    return {*std::min_element(low, low + n), size_t{1} + *std::max_element(high, high + n)};
}

// The entries of a palette in the destination's format, as far as they are in use.
template <class Destination>
struct NarrowPalette {
    const uint32_t *palette;
    const NarrowingWeights &weights;
    IndexRange known = {};
    HWY_ALIGN uint8_t entries[256 * Destination::kBytes] = {};

    void cover(const IndexRange &used) {
        if (known.contains(used))
            return;
        known = {std::min(known.begin, used.begin), std::max(known.end, used.end)};
        const ConvertThrough32Body<From32Bits, Destination> body = {
            {entries + known.begin * Destination::kBytes,
             reinterpret_cast<const uint8_t *>(palette + known.begin)},
            nullptr,
            weights};
        const size_t count = known.end - known.begin;
        withWidestChunk<kVectorBytes, 64, 32, 16, 4, 1>(
            count, [&](auto chunk) HWY_ATTR { walkRow(chunk, count, body); });
    }
};

template <size_t kDstBytes>
struct LookupBody : ConversionRow<1, kDstBytes> {
    LookupTable<kDstBytes> table;

    template <class C, class Access>
    HWY_INLINE void operator()(C chunk, size_t i, Access access) const {
        table.lookUp(chunk, this->src + i, this->dst + i * kDstBytes, access);
    }
};

template <class Access, class Destination>
HWY_NOINLINE void lookUpTile(DstRows dst, SrcRows src, Extent extent,
                             const NarrowPalette<Destination> &palette) {
    using Table = LookupTable<Destination::kBytes>;
    constexpr Chunk<Table::kUnits> kChunk;
    LookupBody<Destination::kBytes> body = {{}, Table(palette.entries)};
    for (size_t y = 0; y < extent.height; ++y) {
        body.dst = dst.row(y);
        body.src = src.row(y);
        if (extent.width >= Table::kUnits)
            walkAlignedRow<Access>(kChunk, extent.width, body);
        else if constexpr (kHasMaskedTails)
            body(kChunk, 0, FirstLanes{extent.width});
    }
}

template <size_t kDstBytes>
bool paysToNarrowPalette(Extent extent) {
    return extent.width * extent.height >= kNarrowPalettePixels &&
           (kHasMaskedTails || extent.width >= LookupTable<kDstBytes>::kUnits);
}

// Tile by tile, each as soon as the entries that it uses are there.
template <class Destination, class Access>
void convertByNarrowPalette(DstRows dst, SrcRows src, Extent extent,
                            NarrowPalette<Destination> &palette) {
    const size_t tileHeight = std::max(kNarrowPaletteTile / extent.width, size_t{1});
    for (size_t y = 0; y < extent.height; y += tileHeight) {
        size_t width = 0;
        for (size_t x = 0; x < extent.width; x += width) {
            const size_t rest = extent.width - x;
            width = rest < 2 * kNarrowPaletteTile ? rest : kNarrowPaletteTile;
            const Extent tile = {width, std::min(tileHeight, extent.height - y)};
            const DstRows dstTile = {dst.row(y) + x * Destination::kBytes, dst.stride};
            const SrcRows srcTile = {src.row(y) + x, src.stride};
            if (!palette.known.isAll())
                palette.cover(indicesIn(srcTile, tile));
            lookUpTile<Access>(dstTile, srcTile, tile, palette);
        }
    }
}

template <class Destination>
void convertByNarrowPalette(DstRows dst, SrcRows src, Extent extent, const uint32_t *palette,
                            const NarrowingWeights &weights) {
    if (areContiguous(dst, extent.width * Destination::kBytes) && areContiguous(src, extent.width))
        extent = asOneRow(extent);
    NarrowPalette<Destination> narrow = {palette, weights};
    if (isNonTemporal({extent.width * Destination::kBytes, extent.height})) {
        convertByNarrowPalette<Destination, NonTemporal>(dst, src, extent, narrow);
        hwy::FlushStream();
    } else {
        convertByNarrowPalette<Destination, Aligned>(dst, src, extent, narrow);
    }
}

#endif
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
