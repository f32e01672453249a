#include "raster/rasterRopKernels.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "raster/rasterRopKernels.cpp"
#include "hwy/foreach_target.h"
#include "hwy/highway.h"

#include "raster.h"
#include "raster/copyRows.h"

#include "raster/kernels-inl.h"
#include "raster/pixelPattern-inl.h"
#include "raster/streaming-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {

// ---- Against a constant -------------------------------------------------

template <class D, class Lanes>
HWY_INLINE void combineVector(D d, uint8_t *at, hn::Vec<D> keep, hn::Vec<D> flip, Lanes lanes) {
    auto *to = reinterpret_cast<hn::TFromD<D> *>(at);
    lanes.store(d, hn::Xor(hn::And(lanes.load(d, to), keep), flip), to);
}

// A row of whole vectors.
template <class D>
HWY_INLINE void combineVectors(D d, uint8_t *row, size_t bytes, const PatternVectors<D> &keep,
                               const PatternVectors<D> &flip) {
    constexpr size_t n = PatternVectors<D>::kBytes;
    const AllLanes all;
    size_t i = 0;
    for (; bytes - i >= 3 * n; i += 3 * n) {
        combineVector(d, row + i, keep.first, flip.first, all);
        combineVector(d, row + i + n, keep.second, flip.second, all);
        combineVector(d, row + i + 2 * n, keep.third, flip.third, all);
    }
    if (bytes - i >= n)
        combineVector(d, row + i, keep.first, flip.first, all);
    if (bytes - i >= 2 * n)
        combineVector(d, row + i + n, keep.second, flip.second, all);
}

// The rest of a row, behind its whole vectors; the pattern from there on.
struct RopFillRest {
    uint8_t *dst;
    const uint8_t *keep;
    const uint8_t *flip;

    template <class D, class Lanes>
    HWY_INLINE void operator()(D d, size_t i, Lanes lanes) const {
        combineVector(d, dst + i, hn::LoadU(d, keep + i), hn::LoadU(d, flip + i), lanes);
    }
};

void RopFill(DstRows dst, Size bytes, int32 bytesPerPixel, uint32 keep, uint32 flip) {
    const Widest<uint32_t> d;
    using Vectors = PatternVectors<Widest<uint32_t>>;
    const PixelPattern keepPattern(keep, bytesPerPixel), flipPattern(flip, bytesPerPixel);
    const Vectors keepVectors(d, keepPattern, 0), flipVectors(d, flipPattern, 0);

    bytes = joinedRows(bytes, bytes.width, dst.step);
    const size_t whole = bytes.width - bytes.width % Vectors::kBytes;
    HWY_ALIGN uint32_t keepRest[kLanes<decltype(d)>];
    HWY_ALIGN uint32_t flipRest[kLanes<decltype(d)>];
    hn::Store(keepPattern.from(d, whole), d, keepRest);
    hn::Store(flipPattern.from(d, whole), d, flipRest);

    for (size_t y = 0; y < bytes.height; ++y) {
        uint8_t *row = dst.row(y);
        combineVectors(d, row, whole, keepVectors, flipVectors);
        const RopFillRest rest = {row + whole, reinterpret_cast<const uint8_t *>(keepRest),
                                  reinterpret_cast<const uint8_t *>(flipRest)};
        if (whole != bytes.width)
            walkParts<uint8_t>(rest.dst, bytes.width - whole, rest);
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
