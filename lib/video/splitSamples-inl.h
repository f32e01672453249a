// Frames whose samples are loaded as one vector for each kind, and whose pixels are
// stored from one for each of their bytes: the even luma samples and the odd ones share
// their vectors of chroma.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_VIDEO_SPLIT_SAMPLES_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_VIDEO_SPLIT_SAMPLES_INL_H
#undef QUILLON_VIDEO_SPLIT_SAMPLES_INL_H
#else
#define QUILLON_VIDEO_SPLIT_SAMPLES_INL_H
#endif

#include "hwy/highway.h"

#include "simd/bitInsert-inl.h"
#include "simd/products-inl.h"
#include "simd/target-inl.h"
#include "video/videoFormats.h"
#include "video/yuv-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
#if QUILLON_HAS_VECTORS

// Of the pairs of chroma samples in a vector each.
template <class D8, class D16 = hn::Repartition<int16_t, D8>>
HWY_INLINE Halves<ChromaTerms<hn::Vec<D16>>> chromaTermsOf(D8 d, hn::Vec<D8> chromaLow,
                                                           hn::Vec<D8> chromaHigh) {
    const D16 d16;
    const hn::RebindToSigned<D8> s8;
    const auto a = hn::BitCast(s8, hn::Xor(chromaLow, hn::Set(d, 0x80)));
    const auto b = hn::BitCast(s8, hn::Xor(chromaHigh, hn::Set(d, 0x80)));
    const auto lowOf = [&](auto a256) HWY_ATTR {
        return hn::MulFixedPoint15(hn::BitCast(d16, a256), hn::Set(d16, int16_t{-409 * 64}));
    };
    const auto mid = addHalves(multiplyWide(s8, a, 104), multiplyWide(s8, b, 50));
    const auto high = multiplyWide(s8, b, 129);
    return {{lowOf(hn::InterleaveLower(s8, hn::Zero(s8), a)), mid.lower, high.lower},
            {lowOf(hn::InterleaveUpper(s8, hn::Zero(s8), a)), mid.upper, high.upper}};
}

// The bytes of the pixels of a vector of luma samples.
template <VideoPixelLayout kLayout, class D8, class V16>
HWY_INLINE void pixelBytes(D8 d, hn::Vec<D8> luma, const Halves<ChromaTerms<V16>> &chroma,
                           hn::Vec<D8> (&bytes)[kLayout.bytesPerPixel]) {
    const hn::Repartition<int16_t, D8> d16;
    const auto products = multiplyWide(d, luma, kLumaFactor);
    const auto sums = [&](auto product, const ChromaTerms<V16> &terms) HWY_ATTR {
        const auto rest = hn::Set(d16, int16_t{kLumaRest - 128 * kLumaFactor});
        return sumsOf(hn::Add(hn::BitCast(d16, product), rest), terms);
    };
    const FieldSums<V16> lower = sums(products.lower, chroma.lower);
    const FieldSums<V16> upper = sums(products.upper, chroma.upper);
    const auto low = fieldBytes(d, lower.low, upper.low);
    const auto mid = fieldBytes(d, lower.mid, upper.mid);
    const auto high = fieldBytes(d, lower.high, upper.high);
    if constexpr (kLayout.bytesPerPixel == 2) {
        // Low and high have the same width, and the upper byte has the top of mid.
        constexpr int kMidInUpper = 8 - kLayout.lowBits;
        constexpr int kMidInLower = kLayout.midBits - kMidInUpper;
        constexpr uint8_t kUsed = 0xFF << kLayout.finalShift & 0xFF;
        const auto lowerByte = insertBelow<kMidInLower>(d, hn::ShiftLeft<kMidInUpper>(mid), low);
        bytes[0] = kUsed == 0xFF ? lowerByte : hn::And(lowerByte, hn::Set(d, kUsed));
        bytes[1] = insertBelow<kLayout.lowBits>(d, high, mid);
    } else {
        bytes[0] = low;
        bytes[1] = mid;
        bytes[2] = high;
        if constexpr (kLayout.bytesPerPixel == 4)
            bytes[3] = hn::Zero(d);
    }
}

template <class D8, size_t kBytes>
HWY_INLINE void storePixelBytes(D8 d, const hn::Vec<D8> (&bytes)[kBytes], uint8_t *dst) {
    if constexpr (kBytes == 2)
        hn::StoreInterleaved2(bytes[0], bytes[1], d, dst);
    else if constexpr (kBytes == 3)
        hn::StoreInterleaved3(bytes[0], bytes[1], bytes[2], d, dst);
    else
        hn::StoreInterleaved4(bytes[0], bytes[1], bytes[2], bytes[3], d, dst);
}

// kMostPixels pixels.
template <VideoPixelLayout kLayout, class D8, class V16>
HWY_INLINE void storeSplitPixels(D8 d, hn::Vec<D8> evenLuma, hn::Vec<D8> oddLuma,
                                 const Halves<ChromaTerms<V16>> &chroma, uint8_t *dst) {
    constexpr size_t kBytes = kLayout.bytesPerPixel;
    hn::Vec<D8> even[kBytes], odd[kBytes], pixels[kBytes];
    pixelBytes<kLayout>(d, evenLuma, chroma, even);
    pixelBytes<kLayout>(d, oddLuma, chroma, odd);
    for (size_t byte = 0; byte < kBytes; ++byte)
        pixels[byte] = hn::InterleaveLower(d, even[byte], odd[byte]);
    storePixelBytes(d, pixels, dst);
    for (size_t byte = 0; byte < kBytes; ++byte)
        pixels[byte] = hn::InterleaveUpper(d, even[byte], odd[byte]);
    storePixelBytes(d, pixels, dst + kBytes * kVectorBytes);
}

// kMostPixels pixels of an interleaved frame.
template <VideoGroup kGroup, VideoPixelLayout kLayout>
HWY_INLINE void convertSplitGroups(const uint8_t *src, uint8_t *dst) {
    const Widest<uint8_t> d;
    hn::Vec<decltype(d)> samples[4];
    hn::LoadInterleaved4(d, src, samples[0], samples[1], samples[2], samples[3]);
    storeSplitPixels<kLayout>(
        d, samples[kGroup.luma], samples[kGroup.luma + 2],
        chromaTermsOf(d, samples[kGroup.chromaLow], samples[kGroup.chromaHigh]), dst);
}

#endif
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
