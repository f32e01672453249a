#include "rop/ropKernels.h"

#include "rop/ropPlain.h"
#include "simd/thresholds.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "rop/ropKernels.cpp"
#include "hwy/foreach_target.h"
#include "hwy/highway.h"

#include "simd/pixelPattern-inl.h"
#include "simd/rowLoop-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {

#if QUILLON_HAS_VECTORS

// ---- Against a constant ---------------------------------------------------

// The pattern of keep and flip as vectors, from the first byte of the row on, and
// in memory from the tail on.
struct RopFillBody {
    using Words = Widest<uint32_t>;

    uint8_t *dst;
    PatternVectors<Words> keep, flip;
    const uint8_t *keepTail, *flipTail;
    size_t tail; // where it begins

    template <class C, class Access>
    HWY_INLINE void operator()(C /*chunk*/, size_t i, Access access) const {
        if constexpr (C::kUnits == kVectorBytes && std::is_same_v<Access, Unaligned>) {
            const Words d;
            const auto kept = hn::And(access.load(d, dst + i), keep.template get<C::kTurn>());
            access.store(d, hn::Xor(kept, flip.template get<C::kTurn>()), dst + i);
        } else {
            const hn::CappedTag<uint8_t, C::kUnits> d;
            const auto kept = hn::And(access.load(d, dst + i), loadBytes(d, keepTail + i - tail));
            access.store(d, hn::Xor(kept, loadBytes(d, flipTail + i - tail)), dst + i);
        }
    }
};

void ropFillKernel(DstRows dst, ByteExtent extent, int32_t bytesPerPixel, RopConstant constant) {
    constexpr RowPolicy kPolicy = {.tail = Tail::kExact, .unroll = 3};
    const RopFillBody::Words d;
    if (areContiguous(dst, extent.rowBytes))
        extent = asOneRow(extent);

    const PixelPattern keep(constant.keep, bytesPerPixel), flip(constant.flip, bytesPerPixel);
    const size_t tail = extent.rowBytes - extent.rowBytes % kVectorBytes;
    HWY_ALIGN uint8_t keepTail[kVectorBytes];
    HWY_ALIGN uint8_t flipTail[kVectorBytes];
    storeBytes(d, keep.from(d, tail), keepTail);
    storeBytes(d, flip.from(d, tail), flipTail);
    RopFillBody body = {dst.first, {d, keep, 0}, {d, flip, 0}, keepTail, flipTail, tail};
    for (size_t y = 0; y < extent.height; ++y) {
        body.dst = dst.row(y);
        walkRow<kPolicy>(Chunk<kVectorBytes>(), extent.rowBytes, body);
    }
}

// ---- Two surfaces ---------------------------------------------------------

template <uint32_t kRop, class V>
HWY_INLINE V combine(V s, V d) {
    switch (kRop) {
    case RASTER_ROP_AND:
        return hn::And(s, d);
    case RASTER_ROP_AND_REVERSE:
        return hn::AndNot(d, s);
    case RASTER_ROP_AND_INVERTED:
        return hn::AndNot(s, d);
    case RASTER_ROP_XOR:
        return hn::Xor(s, d);
    case RASTER_ROP_OR:
        return hn::Or(s, d);
    case RASTER_ROP_NOR:
        return hn::Not(hn::Or(s, d));
    case RASTER_ROP_EQUIV:
        return hn::Not(hn::Xor(s, d));
    case RASTER_ROP_OR_REVERSE:
        return hn::Or(s, hn::Not(d));
    case RASTER_ROP_COPY_INVERTED:
        return hn::Not(s);
    case RASTER_ROP_OR_INVERTED:
        return hn::Or(hn::Not(s), d);
    default:
        return hn::Not(hn::And(s, d));
    }
}

template <uint32_t kRop>
struct RopCopyBody {
    static constexpr size_t kDstBytes = 1;
    uint8_t *dst;
    const uint8_t *src;

    template <class C, class Access>
    HWY_INLINE void operator()(C /*chunk*/, size_t i, Access access) const {
        const hn::CappedTag<uint8_t, C::kUnits> d;
        const auto s = access.load(d, src + i);
        access.store(d, combine<kRop>(s, access.load(d, dst + i)), dst + i);
    }
};

template <uint32_t kRop>
void ropCopyRowsBy(DstRows dst, SrcRows src, ByteExtent extent, int32_t bytesPerPixel,
                   RowDirection direction) {
    const bool isBackward = direction == RowDirection::kRightToLeft;
    for (size_t y = 0; y < extent.height; ++y) {
        const RopCopyBody<kRop> body = {dst.row(y), src.row(y)};
        // Backward, it is a destination behind the source that is read again after
        // it has been written.
        if (isBackward ? hasOverlapHazard(body.src, body.dst, kVectorBytes)
                       : hasOverlapHazard(body.dst, body.src, kVectorBytes))
            ropRowPlain(kRop, body.dst, body.src, extent.rowBytes, bytesPerPixel, direction);
        else if (isBackward)
            walkRowOnceBackward<1>(extent.rowBytes, body);
        else
            walkRowOnce<1>(extent.rowBytes, body);
    }
}

template <uint32_t... kRops>
void ropCopyRowsByCode(uint32_t rop, DstRows dst, SrcRows src, ByteExtent extent,
                       int32_t bytesPerPixel, RowDirection direction) {
    (void)((rop == kRops &&
            (ropCopyRowsBy<kRops>(dst, src, extent, bytesPerPixel, direction), true)) ||
           ...);
}

// The one operation of these that does not read what it writes.
void copyInvertedNonTemporal(DstRows dst, SrcRows src, ByteExtent extent) {
    for (size_t y = 0; y < extent.height; ++y) {
        const RopCopyBody<RASTER_ROP_COPY_INVERTED> body = {dst.row(y), src.row(y)};
        walkAlignedRow<NonTemporal>(Chunk<kVectorBytes>(), extent.rowBytes, body);
    }
    hwy::FlushStream();
}

void ropCopyKernel(DstRows dst, SrcRows src, ByteExtent extent, int32_t bytesPerPixel, uint32_t rop,
                   RowDirection direction) {
    if (direction == RowDirection::kLeftToRight && areContiguous(dst, extent.rowBytes) &&
        areContiguous(src, extent.rowBytes))
        extent = asOneRow(extent);
    if (rop == RASTER_ROP_COPY_INVERTED && isNonTemporal(extent) && !rowsOverlap(dst, src, extent))
        return copyInvertedNonTemporal(dst, src, extent);
    ropCopyRowsByCode<RASTER_ROP_AND, RASTER_ROP_AND_REVERSE, RASTER_ROP_AND_INVERTED,
                      RASTER_ROP_XOR, RASTER_ROP_OR, RASTER_ROP_NOR, RASTER_ROP_EQUIV,
                      RASTER_ROP_OR_REVERSE, RASTER_ROP_COPY_INVERTED, RASTER_ROP_OR_INVERTED,
                      RASTER_ROP_NAND>(rop, dst, src, extent, bytesPerPixel, direction);
}

#else

void ropFillKernel(DstRows dst, ByteExtent extent, int32_t bytesPerPixel, RopConstant constant) {
    const auto size = static_cast<size_t>(bytesPerPixel);
    for (size_t y = 0; y < extent.height; ++y)
        for (size_t i = 0; i < extent.rowBytes; ++i) {
            const size_t shift = 8 * (i % size);
            uint8_t &byte = dst.row(y)[i];
            byte = static_cast<uint8_t>((byte & constant.keep >> shift) ^ constant.flip >> shift);
        }
}

void ropCopyKernel(DstRows dst, SrcRows src, ByteExtent extent, int32_t bytesPerPixel, uint32_t rop,
                   RowDirection direction) {
    for (size_t y = 0; y < extent.height; ++y)
        ropRowPlain(rop, dst.row(y), src.row(y), extent.rowBytes, bytesPerPixel, direction);
}

#endif

} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace quillon {

HWY_EXPORT(ropFillKernel);
HWY_EXPORT(ropCopyKernel);

void ropFillRows(DstRows dst, ByteExtent extent, int32_t bytesPerPixel, RopConstant constant) {
    HWY_DYNAMIC_DISPATCH(ropFillKernel)(dst, extent, bytesPerPixel, constant);
}

void ropCopyRows(DstRows dst, SrcRows src, ByteExtent extent, int32_t bytesPerPixel, uint32_t rop,
                 RowDirection direction) {
    HWY_DYNAMIC_DISPATCH(ropCopyKernel)(dst, src, extent, bytesPerPixel, rop, direction);
}

} // namespace quillon
#endif
