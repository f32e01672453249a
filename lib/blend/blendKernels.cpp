#include "blend/blendKernels.h"

#include "blend/blendPlain.h"
#include "simd/thresholds.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "blend/blendKernels.cpp"
#include "hwy/foreach_target.h"
#include "hwy/highway.h"

#include "simd/products-inl.h"
#include "simd/rowLoop-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {

#if QUILLON_HAS_VECTORS

constexpr size_t kChunkBytes = kHasInterleavedAccess ? 4 * kVectorBytes : kVectorBytes;

// The colour of one vector of pixels with the alpha of the other.
template <class D, class V>
HWY_INLINE V colourOf(D d, V colour, V alpha) {
    return hn::IfVecThenElse(hn::Set(d, 0x00FFFFFF), colour, alpha);
}

// blendOverPixel in vectors.
//
// With a the source's alpha, channel * (255 - a) / 255 is the upper half of
// channel * (65536 - 257 * a), exactly, unless a is 0 (docs/numbers.md).  A
// channel in the upper byte of 16 bits gives it in the upper byte again, with the
// rest below.
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

    const auto isUncovered = hn::Eq(hn::BitCast(d, factor), hn::Zero(d));
    const auto kept = hn::IfThenElse(isUncovered, dst, hn::BitCast(d, under));
    const auto sum = hn::SaturatedAdd(hn::BitCast(d8, src), hn::BitCast(d8, kept));
    return colourOf(d, hn::BitCast(d, sum), dst);
}

// Much of what lies over a picture is clear or opaque, in long runs.  A look at the alpha
// of one pixel is cheaper than one at a vector.
HWY_INLINE bool isClearOrOpaque(const uint8_t *pixel) {
    return pixel[3] == 0 || pixel[3] == 255;
}

// blendOver by channels, for as many pixels as there are bytes in a vector.
HWY_INLINE void blendChannelsOver(const uint8_t *src, uint8_t *dst) {
    const Widest<uint8_t> d;
    using Bytes = hn::Vec<decltype(d)>;
    Bytes srcBlue, srcGreen, srcRed, srcAlpha, blue, green, red, alpha;
    hn::LoadInterleaved4(d, src, srcBlue, srcGreen, srcRed, srcAlpha);
    const auto any = hn::Or(hn::Or(srcBlue, srcGreen), hn::Or(srcRed, srcAlpha));
    if (isClearOrOpaque(src) && hn::AllTrue(d, hn::Eq(any, hn::Zero(d))))
        return;
    hn::LoadInterleaved4(d, dst, blue, green, red, alpha);
    const auto factor = hn::Not(srcAlpha);
    const auto over = [&](Bytes channel, Bytes under) HWY_ATTR {
        return hn::SaturatedAdd(channel, multiplyDivideBy255(d, under, factor));
    };
    hn::StoreInterleaved4(over(srcBlue, blue), over(srcGreen, green), over(srcRed, red), alpha, d,
                          dst);
}

template <bool kPrefetches>
struct BlendBody {
    uint8_t *dst;
    const uint8_t *src;
    PrefetchDistance distance;

    template <class C, class Access>
    HWY_INLINE void operator()(C /*chunk*/, size_t i, Access access) const {
        uint8_t *pixels = dst + 4 * i;
        const uint8_t *from = src + 4 * i;
        if constexpr (kPrefetches) {
            hwy::Prefetch(advance(pixels, static_cast<uint64_t>(distance.dst)));
            hwy::Prefetch(advance(from, static_cast<uint64_t>(distance.src)));
        }
        if constexpr (C::kUnits == kVectorBytes)
            return blendChannelsOver(from, pixels);
        const hn::CappedTag<uint32_t, C::kUnits> d;
        const auto over = access.load(d, from);
        if (isClearOrOpaque(from)) {
            if (hn::AllTrue(d, hn::Eq(over, hn::Zero(d))))
                return;
            if (hn::AllTrue(d,
                            hn::Eq(hn::Or(over, hn::Set(d, 0x00FFFFFF)), hn::Set(d, 0xFFFFFFFF))))
                return access.store(d, colourOf(d, over, access.load(d, pixels)), pixels);
        }
        access.store(d, blendOver(d, over, access.load(d, pixels)), pixels);
    }
};

template <class Body>
HWY_INLINE void walkBlendRow(size_t width, const Body &body) {
    if constexpr (kHasInterleavedAccess) {
        constexpr RowPolicy kWhole = {.tail = Tail::kNone}, kRest = {.tail = Tail::kExact};
        walkRow<kWhole>(Chunk<kVectorBytes>(), width, body);
        const size_t rest = width % kVectorBytes;
        if (rest != 0)
            walkFrom<kRest, Unaligned>(Chunk<kVectorBytes / 4>(), width - rest, width, body);
    } else {
        walkRowOnce<4>(width, body);
    }
}

template <bool kPrefetches>
void blendRowsBy(DstRows dst, SrcRows src, Extent extent, PrefetchDistance distance) {
    for (size_t y = 0; y < extent.height; ++y) {
        const BlendBody<kPrefetches> body = {dst.row(y), src.row(y), distance};
        if (hasOverlapHazard(body.dst, body.src, kChunkBytes))
            blendOverRowPlain(body.dst, body.src, extent.width);
        else
            walkBlendRow(extent.width, body);
    }
}

void blendKernel(DstRows dst, SrcRows src, Extent extent) {
    const size_t rowBytes = 4 * extent.width;
    if (areContiguous(dst, rowBytes) && areContiguous(src, rowBytes))
        extent = asOneRow(extent);
    const ByteExtent bytes = inBytes(extent, 4);
    const ptrdiff_t ahead = isNonTemporal(bytes) ? kPrefetchUncached : kPrefetchInCaches;
    if (extent.width >= kPrefetchLongRow)
        blendRowsBy<kPrefetchesAhead>(dst, src, extent, {ahead, ahead});
    else if (extent.width >= kPrefetchNextRow)
        blendRowsBy<kPrefetchesAhead>(dst, src, extent, {dst.stride, src.stride});
    else
        blendRowsBy<false>(dst, src, extent, {});
}

#else

void blendKernel(DstRows dst, SrcRows src, Extent extent) {
    for (size_t y = 0; y < extent.height; ++y)
        blendOverRowPlain(dst.row(y), src.row(y), extent.width);
}

#endif

} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace quillon {

HWY_EXPORT(blendKernel);

void blendOverRows(DstRows dst, SrcRows src, Extent extent) {
    HWY_DYNAMIC_DISPATCH(blendKernel)(dst, src, extent);
}

} // namespace quillon
#endif
