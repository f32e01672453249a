#include "raster/rasterRopKernels.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "raster/rasterRopKernels.cpp"
#include "hwy/foreach_target.h"
#include "hwy/highway.h"

#include "raster.h"
#include "raster/copyRows.h"

#include "raster/bytePattern-inl.h"
#include "raster/kernels-inl.h"
#include "raster/streaming-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {

// ---- Against a constant -------------------------------------------------

template <size_t kBytes>
struct RopPattern {
    BytePattern<kBytes> keep;
    BytePattern<kBytes> flip;
};

template <size_t kBytes>
struct RopFillBody {
    uint8_t *dst;
    const RopPattern<kBytes> &pattern;

    template <class D, class Lanes>
    HWY_INLINE void operator()(D d, size_t i, Lanes lanes) const {
        const auto keep = hn::LoadU(d, pattern.keep.from(i));
        const auto flip = hn::LoadU(d, pattern.flip.from(i));
        lanes.store(d, hn::Xor(hn::And(lanes.load(d, dst + i), keep), flip), dst + i);
    }
};

// Vectors by threes, which hold whole pixels of every size: the pattern stays in
// registers.  Returns how far that went.
template <class D, size_t kBytes>
HWY_INLINE size_t ropFillThrees(D d, uint8_t *row, size_t bytes,
                                const RopPattern<kBytes> &pattern) {
    constexpr size_t n = kBytes;
    const auto at = [&](const BytePattern<kBytes> &part, size_t vector)
                        HWY_ATTR { return hn::LoadU(d, part.from(vector * n)); };
    const auto keep0 = at(pattern.keep, 0), flip0 = at(pattern.flip, 0);
    const auto keep1 = at(pattern.keep, 1), flip1 = at(pattern.flip, 1);
    const auto keep2 = at(pattern.keep, 2), flip2 = at(pattern.flip, 2);
    const auto combined = [&](uint8_t *to, hn::Vec<D> keep, hn::Vec<D> flip)
                              HWY_ATTR { return hn::Xor(hn::And(hn::LoadU(d, to), keep), flip); };
    size_t i = 0;
    for (; bytes - i >= 3 * n; i += 3 * n) {
        uint8_t *to = row + i;
        hn::StoreU(combined(to, keep0, flip0), d, to);
        hn::StoreU(combined(to + n, keep1, flip1), d, to + n);
        hn::StoreU(combined(to + 2 * n, keep2, flip2), d, to + 2 * n);
    }
    return i;
}

void RopFill(DstRows dst, Size bytes, int32 bytesPerPixel, uint32 keep, uint32 flip) {
    const Widest<uint8_t> d;
    constexpr size_t n = kLanes<decltype(d)>;
    const RopPattern<n> pattern = {BytePattern<n>(keep, bytesPerPixel),
                                   BytePattern<n>(flip, bytesPerPixel)};
    bytes = joinedRows(bytes, bytes.width, dst.step);
    for (size_t y = 0; y < bytes.height; ++y) {
        uint8_t *row = dst.row(y);
        // Vectors of a single byte, on the scalar target, hold no whole pixels.
        const size_t done = n < 4 ? 0 : ropFillThrees(d, row, bytes.width, pattern);
        walkParts<uint8_t>(row + done, bytes.width - done, RopFillBody<n>{row + done, pattern});
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

    template <class D, class Lanes = AllLanes>
    HWY_INLINE void operator()(D d, size_t i, Lanes lanes = {}) const {
        auto *to = reinterpret_cast<T *>(dst) + i;
        const auto s = lanes.load(d, reinterpret_cast<const T *>(src) + i);
        lanes.store(d, combine<kRop>(s, lanes.load(d, to)), to);
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
                walkPartsBackwards<uint8_t>(bytes.width, body);
            else
                walkParts<uint8_t>(to, bytes.width, body);
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

// The one operation of these that does not read what it writes.
void copyInvertedStreamed(DstRows dst, SrcRows src, Size bytes) {
    for (size_t y = 0; y < bytes.height; ++y) {
        const RopCopyBody<RASTER_ROP_COPY_INVERTED, uint8_t> body = {dst.row(y), src.row(y)};
        walkStreaming<uint8_t, 1>(
            body.dst, bytes.width, [&](auto d, size_t i) HWY_ATTR { body(d, i); },
            [&](auto d, size_t i) HWY_ATTR { body(d, i, AroundCaches()); });
    }
    hwy::FlushStream();
}

void RopCopy(DstRows dst, SrcRows src, Size bytes, int32 bytesPerPixel, uint32 rop,
             RowDirection direction) {
    const bool backwards = direction == RowDirection::RightToLeft;
    if (!backwards)
        bytes = joinedRows(bytes, bytes.width, dst.step, bytes.width, src.step);
    if (rop == RASTER_ROP_COPY_INVERTED && isStreamed(bytes.width, bytes.height) &&
        !rowsOverlap(dst, src, bytes))
        return copyInvertedStreamed(dst, src, bytes);
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
