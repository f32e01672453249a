#include "raster/rasteropsKernels.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "raster/rasteropsKernels.cpp"
#include "hwy/foreach_target.h"
#include "hwy/highway.h"

#include "raster/bytePattern-inl.h"
#include "raster/kernels-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {

// ---- Fill ---------------------------------------------------------------

// Rows too short for the smallest vector, of 1 to 3 bytes.
void fillFewBytes(DstRows dst, Size bytes, const uint8_t *pattern) {
    for (size_t y = 0; y < bytes.height; ++y) {
        uint8_t *row = dst.row(y);
        for (size_t i = 0; i < bytes.width; ++i)
            row[i] = pattern[i];
    }
}

// Whole vectors, three in turn so that each holds its part of the pattern, and
// one that ends with the row.
template <size_t kCap>
void fillVectors(DstRows dst, Size bytes, const BytePattern<kCap> &pattern) {
    const hn::CappedTag<uint32_t, kCap / 4>
        d; // in words: the fallback has no other lanes of 4 bytes
    constexpr size_t n = kCap;
    const auto from = [&](size_t offset) HWY_ATTR {
        return hn::LoadU(d, reinterpret_cast<const uint32_t *>(pattern.from(offset)));
    };
    const auto store = [&](hn::Vec<decltype(d)> v, uint8_t *to)
                           HWY_ATTR { hn::StoreU(v, d, reinterpret_cast<uint32_t *>(to)); };
    const auto first = from(0);
    const auto second = from(n);
    const auto third = from(2 * n);
    const auto last = from(bytes.width - n);

    for (size_t y = 0; y < bytes.height; ++y) {
        uint8_t *row = dst.row(y);
        size_t i = 0;
        for (; bytes.width - i >= 3 * n; i += 3 * n) {
            store(first, row + i);
            store(second, row + i + n);
            store(third, row + i + 2 * n);
        }
        if (bytes.width - i >= n)
            store(first, row + i);
        if (bytes.width - i >= 2 * n)
            store(second, row + i + n);
        store(last, row + bytes.width - n);
    }
}

// The widest vectors that fit a row.
template <size_t kCap>
void fillCapped(DstRows dst, Size bytes, uint32_t pixel, int32_t bytesPerPixel) {
    if (bytes.width >= kCap)
        fillVectors<kCap>(dst, bytes, BytePattern<kCap>(pixel, bytesPerPixel));
    else if constexpr (kCap > 4)
        fillCapped<kCap / 2>(dst, bytes, pixel, bytesPerPixel);
    else
        fillFewBytes(dst, bytes, BytePattern<4>(pixel, bytesPerPixel).bytes);
}

void Fill(DstRows dst, Size size, int32 bytesPerPixel, uint32 pixel) {
    const size_t rowBytes = size.width * static_cast<size_t>(bytesPerPixel);
    const Size bytes = joinedRows({rowBytes, size.height}, rowBytes, dst.step);
    fillCapped<4 * kLanes<Widest<uint32_t>>>(dst, bytes, pixel, bytesPerPixel);
}

// ---- Alpha --------------------------------------------------------------

struct SetAlpha {
    uint8_t *dst;
    uint32_t alpha; // in the top byte

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        auto *pixels = reinterpret_cast<uint32_t *>(dst + 4 * i);
        const auto colour = hn::And(hn::LoadU(d, pixels), hn::Set(d, 0x00FFFFFF));
        hn::StoreU(hn::Or(colour, hn::Set(d, alpha)), d, pixels);
    }
};

void FillAlpha(DstRows dst, Size size, uint8 alpha) {
    size = joinedRows(size, 4 * size.width, dst.step);
    for (size_t y = 0; y < size.height; ++y)
        walkAgain<uint32_t>(size.width, SetAlpha{dst.row(y), uint32_t{alpha} << 24});
}

// ---- Blend --------------------------------------------------------------

// Products of the two 16-bit halves of each lane.  The halves hold at most 255,
// so where there are no 16-bit lanes to multiply, one wide product will do: b is
// the same in both halves.
template <class D, class V>
HWY_INLINE V mulHalves(D d, V a, V b) {
#if HWY_TARGET == HWY_SCALAR
    (void)d;
    return hn::Mul(a, hn::And(b, hn::Set(d, 0xFF)));
#else
    const hn::Repartition<uint16_t, D> d16;
    return hn::BitCast(d, hn::Mul(hn::BitCast(d16, a), hn::BitCast(d16, b)));
#endif
}

// x / 255, truncated, in bits 8 and up of the sum x + 1 + x / 256, for two
// 16-bit values a lane.  Exact for x up to 255 * 255, and no half overflows.
template <class D, class V>
HWY_INLINE V divideHalvesBy255(D d, V x) {
    const auto low = hn::Set(d, 0x00FF00FF);
    const auto carry = hn::And(hn::ShiftRight<8>(x), low);
    return hn::Add(hn::Add(x, hn::Set(d, 0x00010001)), carry);
}

// Sums of bytes, held at 255.
template <class D, class V>
HWY_INLINE V addBytes(D d, V a, V b) {
#if HWY_TARGET == HWY_SCALAR
    const auto low = hn::Set(d, 0x00FF00FF);
    const auto held = [&](V sum) HWY_ATTR {
        const auto over = hn::And(hn::ShiftRight<8>(sum), hn::Set(d, 0x00010001));
        return hn::And(hn::Or(sum, hn::Sub(hn::ShiftLeft<8>(over), over)), low);
    };
    const auto even = held(hn::Add(hn::And(a, low), hn::And(b, low)));
    const auto odd =
        held(hn::Add(hn::And(hn::ShiftRight<8>(a), low), hn::And(hn::ShiftRight<8>(b), low)));
    return hn::Or(even, hn::ShiftLeft<8>(odd));
#else
    const hn::Repartition<uint8_t, D> d8;
    return hn::BitCast(d, hn::SaturatedAdd(hn::BitCast(d8, a), hn::BitCast(d8, b)));
#endif
}

// source + destination * (255 - source alpha) / 255 in the colour bytes, and the
// destination's alpha byte as it is.
template <class D, class V>
HWY_INLINE V blendOver(D d, V src, V dst) {
    const auto low = hn::Set(d, 0x00FF00FF);
    const auto alpha = hn::ShiftRight<24>(src);
    const auto inverse = hn::Xor(hn::Or(alpha, hn::ShiftLeft<16>(alpha)), low);

    const auto dstGreen = hn::And(hn::ShiftRight<8>(dst), hn::Set(d, 0xFF));
    const auto blueRed = divideHalvesBy255(d, mulHalves(d, hn::And(dst, low), inverse));
    const auto green = divideHalvesBy255(d, mulHalves(d, dstGreen, inverse));
    const auto under =
        hn::Or(hn::And(hn::ShiftRight<8>(blueRed), low), hn::And(green, hn::Set(d, 0x0000FF00)));

    const auto dstAlpha = hn::And(dst, hn::Set(d, 0xFF000000));
    return addBytes(d, hn::And(src, hn::Set(d, 0x00FFFFFF)), hn::Or(under, dstAlpha));
}

struct BlendOver {
    uint8_t *dst;
    const uint8_t *src;

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        auto *pixels = reinterpret_cast<uint32_t *>(dst + 4 * i);
        const auto *over = reinterpret_cast<const uint32_t *>(src + 4 * i);
        hn::StoreU(blendOver(d, hn::LoadU(d, over), hn::LoadU(d, pixels)), d, pixels);
    }
};

void Blend(DstRows dst, SrcRows src, Size size) {
    size = joinedRows(size, 4 * size.width, dst.step, 4 * size.width, src.step);
    for (size_t y = 0; y < size.height; ++y) {
        const BlendOver body = {dst.row(y), src.row(y)};
        if (runsIntoItself(body.dst, body.src, 4 * kLanes<Widest<uint32_t>>))
            walkSingly<uint32_t>(size.width, body);
        else
            walkOnce<uint32_t>(size.width, body);
    }
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
