#include "raster/rasteropsKernels.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "raster/rasteropsKernels.cpp"
#include "hwy/foreach_target.h"
#include "hwy/highway.h"

#include "raster/kernels-inl.h"
#include "raster/pixelPattern-inl.h"
#include "raster/streaming-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {

// ---- Fill ---------------------------------------------------------------

// Rows too short for the smallest vector, of 1 to 3 bytes.
void fillFewBytes(DstRows dst, Size bytes, const PixelPattern &pattern) {
    const uint32_t word = hn::GetLane(pattern.from(hn::CappedTag<uint32_t, 1>(), 0));
    const size_t middle = bytes.width / 2, last = bytes.width - 1;
    for (size_t y = 0; y < bytes.height; ++y) {
        uint8_t *row = dst.row(y);
        row[0] = static_cast<uint8_t>(word);
        row[middle] = static_cast<uint8_t>(word >> (8 * middle));
        row[last] = static_cast<uint8_t>(word >> (8 * last));
    }
}

// The vectors from byte i on, but for the last one of the row.
template <class Stores, class D>
HWY_INLINE void fillFrom(D d, uint8_t *row, size_t i, size_t end, const PatternVectors<D> &v) {
    constexpr size_t n = PatternVectors<D>::kBytes;
    const auto storeThree = [&](size_t at) HWY_ATTR {
        Stores::store(d, v.first, row + at);
        Stores::store(d, v.second, row + at + n);
        Stores::store(d, v.third, row + at + 2 * n);
    };
    for (; end - i > 6 * n; i += 6 * n) {
        storeThree(i);
        storeThree(i + 3 * n);
    }
    if (end - i > 3 * n) {
        storeThree(i);
        i += 3 * n;
    }
    if (end - i > n)
        Stores::store(d, v.first, row + i);
    if (end - i > 2 * n)
        Stores::store(d, v.second, row + i + n);
}

// Rows of at least one vector.  The first and the last vector are stored as they
// come and may overlap what is between them, which is aligned where it is long
// enough to be worth that.
template <class Stores, class D>
void fillVectors(D d, DstRows dst, Size bytes, const PixelPattern &pattern) {
    constexpr size_t n = PatternVectors<D>::kBytes;
    const auto first = pattern.from(d, 0);
    const auto last = pattern.from(d, bytes.width - n);
    const bool isLong = bytes.width >= 4 * n;
    size_t begin = n;
    PatternVectors<D> between(d, pattern, begin);
    for (size_t y = 0; y < bytes.height; ++y) {
        uint8_t *row = dst.row(y);
        const size_t toAligned = n - reinterpret_cast<uintptr_t>(row) % n;
        if (isLong && begin != toAligned) {
            begin = toAligned;
            between = PatternVectors<D>(d, pattern, begin);
        }
        ThroughCaches::store(d, first, row);
        fillFrom<Stores>(d, row, begin, bytes.width, between);
        if (bytes.width != n)
            ThroughCaches::store(d, last, row + bytes.width - n);
    }
}

// The widest vectors that fit a row, in words: the fallback has no others of 4 bytes.
template <size_t kBytes>
void fillCapped(DstRows dst, Size bytes, const PixelPattern &pattern) {
    if (bytes.width >= kBytes)
        fillVectors<ThroughCaches>(hn::CappedTag<uint32_t, kBytes / 4>(), dst, bytes, pattern);
    else if constexpr (kBytes > 4)
        fillCapped<kBytes / 2>(dst, bytes, pattern);
    else
        fillFewBytes(dst, bytes, pattern);
}

void Fill(DstRows dst, Size size, int32 bytesPerPixel, uint32 pixel) {
    const size_t rowBytes = size.width * static_cast<size_t>(bytesPerPixel);
    const Size bytes = joinedRows({rowBytes, size.height}, rowBytes, dst.step);
    const PixelPattern pattern(pixel, bytesPerPixel);
    if (isStreamed(bytes.width, bytes.height)) {
        fillVectors<AroundCaches>(Widest<uint32_t>(), dst, bytes, pattern);
        hwy::FlushStream();
    } else {
        fillCapped<4 * kLanes<Widest<uint32_t>>>(dst, bytes, pattern);
    }
}

// ---- Alpha --------------------------------------------------------------

struct SetAlpha {
    uint8_t *dst;
    uint32_t alpha; // in the top byte

    template <class D, class Lanes>
    HWY_INLINE void operator()(D d, size_t i, Lanes lanes) const {
        auto *pixels = reinterpret_cast<uint32_t *>(dst + 4 * i);
        const auto colour = hn::And(lanes.load(d, pixels), hn::Set(d, 0x00FFFFFF));
        lanes.store(d, hn::Or(colour, hn::Set(d, alpha)), pixels);
    }
};

// Rows too short for vectors, of 1 to 3 pixels: only the bytes that change.
void fillFewAlphas(DstRows dst, Size size, uint8 alpha) {
    for (size_t y = 0; y < size.height; ++y) {
        uint8_t *row = dst.row(y);
        row[3] = row[4 * (size.width / 2) + 3] = row[4 * size.width - 1] = alpha;
    }
}

void FillAlpha(DstRows dst, Size size, uint8 alpha) {
    size = joinedRows(size, 4 * size.width, dst.step);
    if (size.width < 4)
        return fillFewAlphas(dst, size, alpha);
    for (size_t y = 0; y < size.height; ++y) {
        uint8_t *row = dst.row(y);
        walkParts<uint32_t>(row, size.width, SetAlpha{row, uint32_t{alpha} << 24});
    }
}

// ---- Blend --------------------------------------------------------------

// source + destination * (255 - source alpha) / 255 in the colour bytes, held at
// 255, and the destination's alpha byte as it is.
#if HWY_TARGET == HWY_SCALAR

template <class D, class V>
HWY_INLINE V blendOver(D d, V srcPixel, V dstPixel) {
    const uint32_t src = hn::GetLane(srcPixel), dst = hn::GetLane(dstPixel);
    uint32_t blended = dst & 0xFF000000;
    for (uint32_t shift = 0; shift < 24; shift += 8) {
        const uint32_t under = (dst >> shift & 0xFF) * (255 - (src >> 24)) / 255;
        blended |= HWY_MIN((src >> shift & 0xFF) + under, 255u) << shift;
    }
    return hn::Set(d, blended);
}

#else

// With a the source's alpha, channel * (255 - a) / 255 is the upper half of
// channel * (65536 - 257 * a), exactly, unless a is 0.  A channel in the upper
// byte of 16 bits gives it in the upper byte again, with the rest below.
template <class D, class V>
HWY_INLINE V blendOver(D d, V src, V dst) {
    const hn::Repartition<uint8_t, D> d8;
    const hn::Repartition<uint16_t, D> d16;
    HWY_ALIGN static constexpr uint8_t kAlphas[16] = {3,  3,  3,  3,  7,  7,  7,  7,
                                                      11, 11, 11, 11, 15, 15, 15, 15};
    const auto alphas = hn::TableLookupBytes(hn::BitCast(d8, src), hn::LoadDup128(d8, kAlphas));
    const auto factor = hn::Sub(hn::Zero(d16), hn::BitCast(d16, alphas));
    const auto low = hn::Set(d16, 0x00FF);
    const auto dst16 = hn::BitCast(d16, dst);
    const auto blueRed = hn::MulHigh(hn::And(dst16, low), factor);
    const auto green = hn::MulHigh(hn::AndNot(low, dst16), factor);
    const auto under = hn::OrAnd(blueRed, green, hn::Set(d16, 0xFF00));

    const auto uncovered = hn::Eq(hn::BitCast(d, factor), hn::Zero(d));
    const auto kept = hn::IfThenElse(uncovered, dst, hn::BitCast(d, under));
    const auto sum = hn::SaturatedAdd(hn::BitCast(d8, src), hn::BitCast(d8, kept));
    return hn::IfVecThenElse(hn::Set(d, 0x00FFFFFF), hn::BitCast(d, sum), dst);
}

#endif

// Bytes to ask for ahead of the vector at hand.  Rows of some length ask for the
// same place of the next row, which the processor does not do of itself.
constexpr ptrdiff_t kAheadOfCaches = 2048;
constexpr size_t kLongRow = 1024; // pixels

template <bool kPrefetches>
struct BlendOver {
    uint8_t *dst;
    const uint8_t *src;
    ptrdiff_t dstAhead, srcAhead;

    template <class D, class Lanes = AllLanes>
    HWY_INLINE void operator()(D d, size_t i, Lanes lanes = {}) const {
        uint8_t *at = dst + 4 * i;
        const uint8_t *from = src + 4 * i;
        if constexpr (kPrefetches) {
            hwy::Prefetch(advance(at, static_cast<uint64_t>(dstAhead)));
            hwy::Prefetch(advance(from, static_cast<uint64_t>(srcAhead)));
        }
        auto *pixels = reinterpret_cast<uint32_t *>(at);
        const auto over = lanes.load(d, reinterpret_cast<const uint32_t *>(from));
        // Much of what lies over a picture is clear, in long runs, and changes
        // nothing.  A look at one pixel is cheaper than one at a vector.
        if (isClear(from) && hn::AllTrue(d, hn::Eq(over, hn::Zero(d))))
            return;
        lanes.store(d, blendOver(d, over, lanes.load(d, pixels)), pixels);
    }

    HWY_INLINE static bool isClear(const uint8_t *from) {
        uint32_t pixel;
        hwy::CopyBytes<4>(from, &pixel);
        return pixel == 0;
    }
};

template <bool kPrefetches>
void blendRows(DstRows dst, SrcRows src, Size size, ptrdiff_t dstAhead, ptrdiff_t srcAhead) {
    for (size_t y = 0; y < size.height; ++y) {
        const BlendOver<kPrefetches> body = {dst.row(y), src.row(y), dstAhead, srcAhead};
        if (runsIntoItself(body.dst, body.src, 4 * kLanes<Widest<uint32_t>>))
            walkSingly<uint32_t>(size.width, body);
        else
            walkParts<uint32_t>(body.dst, size.width, body);
    }
}

void Blend(DstRows dst, SrcRows src, Size size) {
    size = joinedRows(size, 4 * size.width, dst.step, 4 * size.width, src.step);
    const ptrdiff_t ahead =
        isStreamed(4 * size.width, size.height) ? kAheadOfCaches : kAheadInCaches;
    if (size.width >= kLongRow)
        blendRows<true>(dst, src, size, ahead, ahead);
    else if (size.width >= 64)
        blendRows<true>(dst, src, size, dst.step, src.step);
    else
        blendRows<false>(dst, src, size, 0, 0);
}

} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace quillon {

HWY_EXPORT(Fill);
HWY_EXPORT(FillAlpha);
HWY_EXPORT(Blend);

void fillRows(DstRows dst, Size size, int32 bytesPerPixel, uint32 pixel) {
    HWY_DYNAMIC_DISPATCH(Fill)(dst, size, bytesPerPixel, pixel);
}

void fillAlphaRows(DstRows dst, Size size, uint8 alpha) {
    HWY_DYNAMIC_DISPATCH(FillAlpha)(dst, size, alpha);
}

void blendOverRows(DstRows dst, SrcRows src, Size size) {
    HWY_DYNAMIC_DISPATCH(Blend)(dst, src, size);
}

} // namespace quillon
#endif
