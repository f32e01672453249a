#include "rop/ropKernels.h"

#include "rop/ropPlain.h"
#include "simd/thresholds.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "rop/ropKernels.cpp"
#include "hwy/foreach_target.h"
#include "hwy/highway.h"

#include "rop/ropCopyRow-inl.h"
#include "simd/pixelPattern-inl.h"
#include "simd/rowLoop-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {

#if QUILLON_HAS_VECTORS

// Rows of a vector or less are one chunk each, whose mask is made once for all.
constexpr bool isOneMaskedVector(ByteExtent extent) {
    return kHasMaskedTails && extent.rowBytes <= kVectorBytes;
}

// ---- Against a constant ---------------------------------------------------

// D becomes (D & keep) ^ flip, which by what these are is one operation.  AVX-512 has one
// for all, and elsewhere on x86 memory is what limits.
enum class RopFill { kAny, kAnd, kXor, kOr, kAndNot, kOrNot };

constexpr RopFill ropFillOf(RopConstant constant) {
    const auto [keep, flip] = constant;
    return flip == 0       ? RopFill::kAnd
           : keep == ~0U   ? RopFill::kXor
           : flip == ~keep ? RopFill::kOr
           : flip == keep  ? RopFill::kAndNot
           : flip == ~0U   ? RopFill::kOrNot
                           : RopFill::kAny;
}

template <RopFill kFill, class V>
HWY_INLINE V ropAgainst(V v, V keep, V flip) {
    switch (kFill) {
    case RopFill::kAnd:
        return hn::And(v, keep);
    case RopFill::kXor:
        return hn::Xor(v, flip);
    case RopFill::kOr:
        return hn::Or(v, flip);
    case RopFill::kAndNot:
        return hn::AndNot(v, flip);
    case RopFill::kOrNot: {
        // flip is the complement of keep.  Of bytes, as GCC makes one instruction of it.
        const hn::DFromV<V> d;
        const hn::Repartition<uint8_t, decltype(d)> d8;
        return hn::BitCast(d, hn::Or(hn::BitCast(d8, flip), hn::Not(hn::BitCast(d8, v))));
    }
    default:
        return hn::Xor(hn::And(v, keep), flip);
    }
}

// The pattern of keep and flip as vectors, from the first byte of the row on, and
// in memory from the tail on.
template <RopFill kFill>
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
            const auto result =
                ropAgainst<kFill>(access.load(d, dst + i), keep.template get<C::kTurn>(),
                                  flip.template get<C::kTurn>());
            access.store(d, result, dst + i);
        } else {
            const hn::CappedTag<uint8_t, C::kUnits> d;
            const auto result =
                ropAgainst<kFill>(access.load(d, dst + i), loadBytes(d, keepTail + i - tail),
                                  loadBytes(d, flipTail + i - tail));
            access.store(d, result, dst + i);
        }
    }
};

template <RopFill kFill>
void ropFillRowsBy(DstRows dst, ByteExtent extent, int32_t bytesPerPixel, RopConstant constant) {
    // Multiples of the three vectors of a pattern.
    constexpr RowPolicy kPolicy = {.tail = Tail::kExact, .unroll = kHasPairedStores ? 12 : 3};
    const Widest<uint32_t> d;
    if (kFill == RopFill::kOrNot)
        constant.flip = ~constant.keep;
    const PixelPattern keep(constant.keep, bytesPerPixel), flip(constant.flip, bytesPerPixel);
    const bool isShort = isOneMaskedVector(extent);
    const size_t tail = isShort ? 0 : extent.rowBytes - extent.rowBytes % kVectorBytes;
    HWY_ALIGN uint8_t keepTail[kVectorBytes];
    HWY_ALIGN uint8_t flipTail[kVectorBytes];
    storeBytes(d, keep.from(d, tail), keepTail);
    storeBytes(d, flip.from(d, tail), flipTail);
    RopFillBody<kFill> body = {dst.first, {d, keep, 0}, {d, flip, 0}, keepTail, flipTail, tail};
    constexpr Chunk<kVectorBytes> chunk;
    for (size_t y = 0; y < extent.height; ++y) {
        body.dst = dst.row(y);
        if (isShort)
            body(chunk, 0, FirstLanes{extent.rowBytes});
        else
            walkRow<kPolicy>(chunk, extent.rowBytes, body);
    }
}

void ropFillKernel(DstRows dst, ByteExtent extent, int32_t bytesPerPixel, RopConstant constant) {
    if (areContiguous(dst, extent.rowBytes))
        extent = asOneRow(extent);
    if constexpr (kHasPairedStores) {
        switch (ropFillOf(constant)) {
        case RopFill::kAnd:
            return ropFillRowsBy<RopFill::kAnd>(dst, extent, bytesPerPixel, constant);
        case RopFill::kXor:
            return ropFillRowsBy<RopFill::kXor>(dst, extent, bytesPerPixel, constant);
        case RopFill::kOr:
            return ropFillRowsBy<RopFill::kOr>(dst, extent, bytesPerPixel, constant);
        case RopFill::kAndNot:
            return ropFillRowsBy<RopFill::kAndNot>(dst, extent, bytesPerPixel, constant);
        case RopFill::kOrNot:
            return ropFillRowsBy<RopFill::kOrNot>(dst, extent, bytesPerPixel, constant);
        case RopFill::kAny:
            break;
        }
    }
    ropFillRowsBy<RopFill::kAny>(dst, extent, bytesPerPixel, constant);
}

// ---- Two surfaces ---------------------------------------------------------

template <uint32_t kRop>
void ropCopyRowsBy(DstRows dst, SrcRows src, ByteExtent extent, int32_t bytesPerPixel,
                   RowDirection direction) {
    const bool isBackward = direction == RowDirection::kRightToLeft;
    for (size_t y = 0; y < extent.height; ++y) {
        const RopCopyBody<kRop> body = {dst.row(y), src.row(y)};
        // Backward, it is a destination behind the source that is read again after
        // it has been written.
        if (isBackward ? hasOverlapHazard(body.src, body.dst, kVectorBytes)
                       : hasOverlapHazard(body.dst, body.src, kVectorsAtOnce * kVectorBytes))
            ropRowPlain(kRop, body.dst, body.src, extent.rowBytes, bytesPerPixel, direction);
        else if (isBackward)
            walkRowOnceBackward<1>(extent.rowBytes, body);
        else
            walkRowOnce<1, kVectorsAtOnce>(extent.rowBytes, body);
    }
}

// Of surfaces without a byte in common the order does not matter.
template <uint32_t kRop>
void ropCopyRowsApart(DstRows dst, SrcRows src, ByteExtent extent) {
    const auto forEachRow = [&](const auto &walk) HWY_ATTR {
        for (size_t y = 0; y < extent.height; ++y)
            walk(RopCopyBody<kRop>{dst.row(y), src.row(y)});
    };
    if (isOneMaskedVector(extent))
        forEachRow([&](const auto &body)
                       HWY_ATTR { body(Chunk<kVectorBytes>(), 0, FirstLanes{extent.rowBytes}); });
    else if (kPrefetchesAhead && isNonTemporal(extent))
        forEachRow([&](const auto &body)
                       HWY_ATTR { ropCopyRowUncached<kRop>(body.dst, body.src, extent.rowBytes); });
    else
        forEachRow([&](const auto &body)
                       HWY_ATTR { walkRowOnce<1, kVectorsAtOnce>(extent.rowBytes, body); });
}

template <uint32_t... kRops>
void ropCopyRowsByCode(uint32_t rop, DstRows dst, SrcRows src, ByteExtent extent,
                       int32_t bytesPerPixel, RowDirection direction, bool areApart) {
    if (areApart)
        (void)((rop == kRops && (ropCopyRowsApart<kRops>(dst, src, extent), true)) || ...);
    else
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
    const bool areApart = !rowsOverlap(dst, src, extent);
    if (rop == RASTER_ROP_COPY_INVERTED && areApart && isNonTemporal(extent))
        return copyInvertedNonTemporal(dst, src, extent);
    ropCopyRowsByCode<RASTER_ROP_AND, RASTER_ROP_AND_REVERSE, RASTER_ROP_AND_INVERTED,
                      RASTER_ROP_XOR, RASTER_ROP_OR, RASTER_ROP_NOR, RASTER_ROP_EQUIV,
                      RASTER_ROP_OR_REVERSE, RASTER_ROP_COPY_INVERTED, RASTER_ROP_OR_INVERTED,
                      RASTER_ROP_NAND>(rop, dst, src, extent, bytesPerPixel, direction, areApart);
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
