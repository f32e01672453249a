// What interleaved and planar frames share: the arithmetic of colours, from luma
// and chroma samples to the sums of fields and from these to pixels, and the sizes
// of chunks.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_VIDEO_YUV_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_VIDEO_YUV_INL_H
#undef QUILLON_VIDEO_YUV_INL_H
#else
#define QUILLON_VIDEO_YUV_INL_H
#endif

#include "hwy/highway.h"

#include "simd/interleave-inl.h"
#include "simd/narrow-inl.h"
#include "simd/products-inl.h"
#include "simd/rowLoop-inl.h"
#include "simd/target-inl.h"
#include "video/videoFormats.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
#if QUILLON_HAS_VECTORS

// ---- Chunks of pixels -----------------------------------------------------

// The least number of pixels in a chunk: their luma samples fill a block.
inline constexpr size_t kLeastPixels = 16;

// The most: a vector of luma samples or, where samples are split, two.
inline constexpr size_t kMostPixels = (kHasInterleavedAccess ? 2 : 1) * kVectorBytes;

// Calls use with the widest chunk for rows of at least kLeastPixels.
template <class Use>
HWY_INLINE void withVideoChunk(size_t width, const Use &use) {
    withWidestChunk<kMostPixels, 64, 32, kLeastPixels>(width, use);
}

inline constexpr RowPolicy kPrefetchingPolicy = {.prefetches = true};

// ---- From samples to sums -------------------------------------------------

// With y = luma - 128, a = chromaLow - 128, b = chromaHigh - 128 the fields are
//
//     low  = (298 (y + 112) + 409 a + 128) >> 8          = (16752 + 149 y + (409 a >> 1)) >> 7
//     mid  = (298 (y + 112) - 208 a - 100 b + 128) >> 8  = (16752 + 149 y - 104 a - 50 b) >> 7
//     high = (298 (y + 112) + 516 b + 128) >> 8          = (16752 + 149 y + 258 b) >> 7
//
// exactly: all terms but 409 a are even, and an odd bit alone never carries.
//
// Fields of 0 to 255 come from sums (on the right, ahead of the shift) of 0 to
// 32767.  Less 16384 these are the middle half of what 16 bits hold.  So a sum
// that saturates belongs to a field that does, and no other addition leaves 16
// bits: 149 y + 368 is -18704 to 19291, the terms of chroma are less than 26177.
inline constexpr uint8_t kLumaFactor = 149;
inline constexpr int kLumaRest = 16752 - 16384;

// 149 y + 368, of luma samples in 16-bit lanes.
template <class D16>
HWY_INLINE hn::Vec<D16> lumaTerm(D16 d, hn::Vec<D16> luma) {
    return hn::Add(hn::Mul(luma, hn::Set(d, int16_t{kLumaFactor})),
                   hn::Set(d, int16_t{kLumaRest - 128 * kLumaFactor}));
}

// The same of y, a signed byte at kByte of each 16-bit lane.
template <size_t kByte, class D16>
HWY_INLINE hn::Vec<D16> lumaTermOfByte(D16 d, hn::Vec<D16> v) {
    constexpr uint8_t kLower = kByte == 0 ? kLumaFactor : 0;
    constexpr uint8_t kUpper = kByte == 1 ? kLumaFactor : 0;
    const auto product = weightedPairSum<kLower, kUpper>(d, v);
    return hn::Add(product, hn::Set(d, int16_t{kLumaRest}));
}

// What a pair of chroma samples adds to the pixels that share it:
// -(409 a >> 1), 104 a + 50 b, 129 b.
template <class V>
struct ChromaTerms {
    V low, mid, high;
};

// Given 256 a, and a and b as the bytes of a 16-bit lane.
template <class D16>
HWY_INLINE ChromaTerms<hn::Vec<D16>> chromaTerms(D16 d, hn::Vec<D16> a256, hn::Vec<D16> ab) {
    const auto low = hn::MulFixedPoint15(a256, hn::Set(d, int16_t{-409 * 64}));
    const auto mid = weightedPairSum<104, 50>(d, ab);
    const auto high = weightedPairSum<0, 129>(d, ab);
    return {low, mid, high};
}

// The sums of pixels, less 16384.
template <class V>
struct FieldSums {
    V low, mid, high;
};

template <class V>
HWY_INLINE FieldSums<V> sumsOf(V luma, const ChromaTerms<V> &chroma) {
    return {hn::SaturatedSub(luma, chroma.low), hn::SaturatedSub(luma, chroma.mid),
            hn::SaturatedAdd(hn::SaturatedAdd(luma, chroma.high), chroma.high)};
}

// ---- Groups of interleaved samples ----------------------------------------

// Lookups that give both pixels of a group the same 16-bit lane: the bytes kLower
// and kUpper of the group, or 0 for kZeroByte.
inline constexpr uint8_t kZeroByte = 0x80;
template <uint8_t kLower, uint8_t kUpper>
struct ToBothPixels {
    alignas(16) uint8_t from[16] = {};
    constexpr ToBothPixels() {
        for (size_t i = 0; i < 16; ++i) {
            const uint8_t byte = i % 2 == 0 ? kLower : kUpper;
            from[i] = byte == kZeroByte ? byte : static_cast<uint8_t>(i / 4 * 4 + byte);
        }
    }
};
template <uint8_t kLower, uint8_t kUpper>
inline constexpr ToBothPixels<kLower, kUpper> kToBothPixels;

// The sums of the pixels of a vector of groups, as 16-bit lanes in their order.
template <VideoGroup kGroup, class D8, class D16 = hn::Repartition<int16_t, D8>>
HWY_INLINE FieldSums<hn::Vec<D16>> sumsOfGroups(D8 d8, hn::Vec<D8> samples) {
    const D16 d16;
    // Less 128: the top bit is turned over.
    const auto groups = hn::Xor(samples, hn::Set(d8, 0x80));
    const auto bothPixels = [&](const uint8_t(&from)[16]) HWY_ATTR {
        return hn::BitCast(d16, hn::TableLookupBytesOr0(groups, hn::LoadDup128(d8, from)));
    };
    const auto a256 = bothPixels(kToBothPixels<kZeroByte, kGroup.chromaLow>.from);
    const auto ab = bothPixels(kToBothPixels<kGroup.chromaLow, kGroup.chromaHigh>.from);
    return sumsOf(lumaTermOfByte<kGroup.luma>(d16, hn::BitCast(d16, groups)),
                  chromaTerms(d16, a256, ab));
}

// ---- From sums to pixels --------------------------------------------------

// The top kBits of 16-bit lanes, moved to begin at bit kAt.
template <int kBits, int kAt, class D>
HWY_INLINE hn::Vec<D> topBitsAt(D d, hn::Vec<D> field) {
    constexpr int kDistance = 16 - kBits - kAt;
    if constexpr (kDistance > 0)
        field = hn::ShiftRight<kDistance>(field);
    if constexpr (kAt > 0)
        field = hn::And(field, hn::Set(d, static_cast<uint16_t>(((1 << kBits) - 1) << kAt)));
    return field;
}

// Pixels of two bytes.
template <VideoPixelLayout kLayout, class D16, class D = hn::RebindToUnsigned<D16>>
HWY_INLINE hn::Vec<D> pixels16(D16 /*d16*/, const FieldSums<hn::Vec<D16>> &sums) {
    constexpr int kLowAt = kLayout.finalShift;
    constexpr int kMidAt = kLowAt + kLayout.lowBits;
    constexpr int kHighAt = kMidAt + kLayout.midBits;
    static_assert(kLayout.lowBits == 8 - kLayout.fieldShift);
    static_assert(kLayout.midBits == 8 - kLayout.midShift);
    static_assert(kHighAt + kLayout.lowBits == 16);
    const D d;
    const auto field = [&](hn::Vec<D16> sum)
                           HWY_ATTR { return hn::BitCast(d, hn::SaturatedAdd(sum, sum)); };
    const auto low = topBitsAt<kLayout.lowBits, kLowAt>(d, field(sums.low));
    const auto mid = topBitsAt<kLayout.midBits, kMidAt>(d, field(sums.mid));
    const auto high = topBitsAt<kLayout.lowBits, kHighAt>(d, field(sums.high));
    // The fields are less 128: their top bits are turned over.
    constexpr int kTopBits = 1 << 15 | 1 << (kHighAt - 1) | 1 << (kMidAt - 1);
    return hn::Xor(hn::Or(low, hn::Or(mid, high)), hn::Set(d, static_cast<uint16_t>(kTopBits)));
}

// The bytes of one field, from its sums in two vectors.
template <class D, class V>
HWY_INLINE hn::Vec<D> fieldBytes(D d, V first, V second) {
    return hn::Xor(shiftAndNarrowSaturated<7>(d, first, second), hn::Set(d, 0x80));
}

// As many pixels as d has bytes, from their sums in two vectors, whose quads come
// in kOrder once they are bytes.
template <VideoPixelLayout kLayout, QuadOrder kOrder, class D, class V, class Access>
HWY_INLINE void storePixels(D d, const FieldSums<V> &first, const FieldSums<V> &second,
                            uint8_t *dst, Access access) {
    constexpr size_t kBytes = kLayout.bytesPerPixel;
    if constexpr (kBytes == 2) {
        const hn::Repartition<int16_t, D> d16;
        const hn::RebindToUnsigned<decltype(d16)> du16;
        access.store(du16, pixels16<kLayout>(d16, first), dst);
        access.store(du16, pixels16<kLayout>(d16, second), dst + kLanes<D>);
    } else if constexpr (kBytes == 4 && kOrder == QuadOrder::kNarrowed && kBytesOf<D> == 32) {
        storeInterleavedByBlocks(d, fieldBytes(d, first.low, second.low),
                                 fieldBytes(d, first.mid, second.mid),
                                 fieldBytes(d, first.high, second.high), hn::Zero(d), dst, access);
    } else {
        const auto field = [&](V firstSums, V secondSums) HWY_ATTR {
            return orderForStore<kBytes, kOrder>(d, fieldBytes(d, firstSums, secondSums));
        };
        const auto low = field(first.low, second.low);
        const auto mid = field(first.mid, second.mid);
        const auto high = field(first.high, second.high);
        if constexpr (kBytes == 3)
            storeInterleaved(d, low, mid, high, dst, access);
        else
            storeInterleaved(d, low, mid, high, hn::Zero(d), dst, access);
    }
}

#endif
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
