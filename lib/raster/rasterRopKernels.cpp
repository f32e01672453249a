#include "raster/rasterRopKernels.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "raster/rasterRopKernels.cpp"
#include "hwy/foreach_target.h"
#include "hwy/highway.h"

#include "raster.h"

#include "raster/bytePattern-inl.h"
#include "raster/kernels-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {

// ---- Against a constant -------------------------------------------------

template <size_t kBytes>
struct RopPattern {
    BytePattern<kBytes> keep;
    BytePattern<kBytes> flip;
};

// One vector from byte i of a row on; kPeriod is the number of bytes after which
// the pattern repeats, and 1 where it is the same in all vectors.
template <size_t kPeriod, size_t kBytes>
struct RopFillBody {
    uint8_t *dst;
    const RopPattern<kBytes> &pattern;

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        const size_t phase = kPeriod == 1 ? 0 : i % kPeriod;
        const auto keep = hn::LoadU(d, pattern.keep.bytes + phase);
        const auto flip = hn::LoadU(d, pattern.flip.bytes + phase);
        hn::StoreU(hn::Xor(hn::And(hn::LoadU(d, dst + i), keep), flip), d, dst + i);
    }
};

void RopFill(DstRows dst, Size bytes, int32 bytesPerPixel, uint32 keep, uint32 flip) {
    constexpr size_t n = kLanes<Widest<uint8_t>>;
    const RopPattern<n> pattern = {BytePattern<n>(keep, bytesPerPixel),
                                   BytePattern<n>(flip, bytesPerPixel)};
    bytes = joinedRows(bytes, bytes.width, dst.step);
    // Vectors of a single byte, on the scalar target, see a byte of the pixel each.
    constexpr size_t kPeriod = n < 4 ? 12 : 3;
    for (size_t y = 0; y < bytes.height; ++y) {
        if (bytesPerPixel == 3 || n < 4)
            walkOnce<uint8_t>(bytes.width, RopFillBody<kPeriod, n>{dst.row(y), pattern});
        else
            walkOnce<uint8_t>(bytes.width, RopFillBody<1, n>{dst.row(y), pattern});
    }
}

// ---- Two surfaces -------------------------------------------------------

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

template <uint32_t kRop, class T>
struct RopCopyBody {
    uint8_t *dst;
    const uint8_t *src;

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        auto *to = reinterpret_cast<T *>(dst) + i;
        const auto s = hn::LoadU(d, reinterpret_cast<const T *>(src) + i);
        hn::StoreU(combine<kRop>(s, hn::LoadU(d, to)), d, to);
    }
};

// A row whose overlap makes the order of the single pixels count.
template <uint32_t kRop, class T>
HWY_INLINE void ropPixels(uint8_t *dst, const uint8_t *src, size_t bytes, bool backwards) {
    const RopCopyBody<kRop, T> body = {dst, src};
    if (backwards)
        walkSinglyBackwards<T>(bytes / sizeof(T), body);
    else
        walkSingly<T>(bytes / sizeof(T), body);
}

template <uint32_t kRop>
void ropRows(DstRows dst, SrcRows src, Size bytes, int32 bytesPerPixel, bool backwards) {
    // A pixel is read whole also where vectors are smaller.
    constexpr size_t n = HWY_MAX(kLanes<Widest<uint8_t>>, sizeof(uint32_t));
    for (size_t y = 0; y < bytes.height; ++y) {
        uint8_t *to = dst.row(y);
        const uint8_t *from = src.row(y);
        // Going backwards, it is a destination behind the source that is read
        // again after having been written.
        const bool ordered = backwards ? runsIntoItself(from, to, n) : runsIntoItself(to, from, n);
        if (!ordered) {
            const RopCopyBody<kRop, uint8_t> body = {to, from};
            if (backwards)
                walkOnceBackwards<uint8_t>(bytes.width, body);
            else
                walkOnce<uint8_t>(bytes.width, body);
        } else if (bytesPerPixel == 2) {
            ropPixels<kRop, uint16_t>(to, from, bytes.width, backwards);
        } else if (bytesPerPixel == 4) {
            ropPixels<kRop, uint32_t>(to, from, bytes.width, backwards);
        } else {
            ropPixels<kRop, uint8_t>(to, from, bytes.width, backwards);
        }
    }
}

template <uint32_t... kRops>
void ropRowsOf(uint32_t rop, DstRows dst, SrcRows src, Size bytes, int32 bytesPerPixel,
               bool backwards) {
    (void)((rop == kRops && (ropRows<kRops>(dst, src, bytes, bytesPerPixel, backwards), true)) ||
           ...);
}

void RopCopy(DstRows dst, SrcRows src, Size bytes, int32 bytesPerPixel, uint32 rop,
             RowDirection direction) {
    const bool backwards = direction == RowDirection::RightToLeft;
    if (!backwards)
        bytes = joinedRows(bytes, bytes.width, dst.step, bytes.width, src.step);
    ropRowsOf<RASTER_ROP_AND, RASTER_ROP_AND_REVERSE, RASTER_ROP_AND_INVERTED, RASTER_ROP_XOR,
              RASTER_ROP_OR, RASTER_ROP_NOR, RASTER_ROP_EQUIV, RASTER_ROP_OR_REVERSE,
              RASTER_ROP_COPY_INVERTED, RASTER_ROP_OR_INVERTED, RASTER_ROP_NAND>(
        rop, dst, src, bytes, bytesPerPixel, backwards);
}

} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace quillon {

HWY_EXPORT(RopFill);
HWY_EXPORT(RopCopy);

void ropFillRows(DstRows dst, Size bytes, int32 bytesPerPixel, uint32 keep, uint32 flip) {
    HWY_DYNAMIC_DISPATCH(RopFill)(dst, bytes, bytesPerPixel, keep, flip);
}

void ropCopyRows(DstRows dst, SrcRows src, Size bytes, int32 bytesPerPixel, uint32 rop,
                 RowDirection direction) {
    HWY_DYNAMIC_DISPATCH(RopCopy)(dst, src, bytes, bytesPerPixel, rop, direction);
}

} // namespace quillon
#endif
