// What becomes of the samples of a frame: the arithmetic of colours, and the way
// from the sums of fields to the pixels in memory.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_VIDEO_PIXELS_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_VIDEO_PIXELS_INL_H
#undef QUILLON_VIDEO_PIXELS_INL_H
#else
#define QUILLON_VIDEO_PIXELS_INL_H
#endif

#include "hwy/highway.h"

#include "legacy/kernels-inl.h"
#include "video/videoKernels.h"

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdint>

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {

#if HWY_TARGET == HWY_SCALAR

// ---- A pair of pixels ---------------------------------------------------

// Vectors of one lane have no room for a pair of pixels, so there are none here.

constexpr uint32_t clamped(int32_t value) {
    return static_cast<uint32_t>(std::min(std::max(value, 0), 255));
}

template <RasterVideoPixelLayout kLayout>
HWY_INLINE void convertPair(uint8_t luma0, uint8_t luma1, uint8_t chromaLow, uint8_t chromaHigh,
                            uint8_t *dst) {
    const int32_t a = chromaLow - 128, b = chromaHigh - 128;
    for (const uint8_t luma : {luma0, luma1}) {
        const int32_t t = (luma - 16) * 298 + 128;
        const uint32_t low = clamped((t + 409 * a) >> 8);
        const uint32_t mid = clamped((t - 208 * a - 100 * b) >> 8);
        const uint32_t high = clamped((t + 516 * b) >> 8);
        const uint32_t top =
            high >> kLayout.fieldShift << kLayout.midBits | mid >> kLayout.midShift;
        const uint32_t pixel = (top << kLayout.lowBits | low >> kLayout.fieldShift)
                               << kLayout.finalShift;
        hwy::CopyBytes<kLayout.bytesPerPixel>(&pixel, dst);
        dst += kLayout.bytesPerPixel;
    }
}

#else

// ---- Colours ------------------------------------------------------------

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
constexpr int kLumaFactor = 149;
constexpr int kLumaRest = 16752 - 16384;

#if HWY_ARCH_X86 && HWY_TARGET != HWY_EMU128

HWY_INLINE __m128i multiplyPairs(__m128i factors, __m128i samples) {
    return _mm_maddubs_epi16(factors, samples);
}
HWY_INLINE __m128i packWords(__m128i first, __m128i second) {
    return _mm_packs_epi16(first, second);
}
#if HWY_TARGET <= HWY_AVX2
HWY_INLINE __m256i multiplyPairs(__m256i factors, __m256i samples) {
    return _mm256_maddubs_epi16(factors, samples);
}
HWY_INLINE __m256i packWords(__m256i first, __m256i second) {
    return _mm256_packs_epi16(first, second);
}
#endif
#if HWY_TARGET <= HWY_AVX3
HWY_INLINE __m512i multiplyPairs(__m512i factors, __m512i samples) {
    return _mm512_maddubs_epi16(factors, samples);
}
HWY_INLINE __m512i packWords(__m512i first, __m512i second) {
    return _mm512_packs_epi16(first, second);
}
#endif

// Per word: its lower byte, which has a sign, times a factor and its upper one
// times another.
template <uint8_t kLower, uint8_t kUpper, class D>
HWY_INLINE hn::Vec<D> weighed(D d, hn::Vec<D> samples) {
    const auto factors = hn::Set(d, static_cast<int16_t>(kUpper << 8 | kLower));
    return hn::Vec<D>{multiplyPairs(factors.raw, samples.raw)};
}

// Words as signed bytes, held to what those can be.  In each block of 16 bytes
// come the words of the first vector's block, then those of the second one's.
template <class D, class D16 = hn::Repartition<int16_t, D>>
HWY_INLINE hn::Vec<D> narrowed(D /*d*/, hn::Vec<D16> first, hn::Vec<D16> second) {
    return hn::Vec<D>{packWords(first.raw, second.raw)};
}

#else

template <uint8_t kLower, uint8_t kUpper, class D>
HWY_INLINE hn::Vec<D> weighed(D d, hn::Vec<D> samples) {
    const auto lower = hn::ShiftRight<8>(hn::ShiftLeft<8>(samples));
    return hn::Add(hn::Mul(lower, hn::Set(d, kLower)),
                   hn::Mul(hn::ShiftRight<8>(samples), hn::Set(d, kUpper)));
}

template <class D, class D16 = hn::Repartition<int16_t, D>>
HWY_INLINE hn::Vec<D> narrowed(D d, hn::Vec<D16> first, hn::Vec<D16> second) {
    const hn::RebindToSigned<D> signedBytes;
    const hn::Half<decltype(signedBytes)> half;
    return hn::BitCast(
        d, hn::Combine(signedBytes, hn::DemoteTo(half, second), hn::DemoteTo(half, first)));
}

#endif

// What a pair of chroma samples has to do with its pixels: -(409 a >> 1),
// 104 a + 50 b, 129 b.
template <class V>
struct ChromaTerms {
    V low, mid, high;
};

// Given 256 a, and a and b in the bytes of a word.
template <class D>
HWY_INLINE ChromaTerms<hn::Vec<D>> chromaTerms(D d, hn::Vec<D> a256, hn::Vec<D> ab) {
    return {hn::MulFixedPoint15(a256, hn::Set(d, -409 * 64)), weighed<104, 50>(d, ab),
            weighed<0, 129>(d, ab)};
}

// The sums of pixels, less 16384.
template <class V>
struct Sums {
    V low, mid, high;
};

template <class V>
HWY_INLINE Sums<V> sumsOf(V luma, const ChromaTerms<V> &chroma) {
    return {hn::SaturatedSub(luma, chroma.low), hn::SaturatedSub(luma, chroma.mid),
            hn::SaturatedAdd(hn::SaturatedAdd(luma, chroma.high), chroma.high)};
}

// ---- Destinations -------------------------------------------------------

// The top kBits of fields in the upper bytes of words, moved to begin at bit kAt.
template <int kBits, int kAt, class D>
HWY_INLINE hn::Vec<D> placed(D d, hn::Vec<D> field) {
    constexpr int kDistance = 16 - kBits - kAt;
    if constexpr (kDistance > 0)
        field = hn::ShiftRight<kDistance>(field);
    if constexpr (kAt > 0)
        field = hn::And(field, hn::Set(d, static_cast<uint16_t>(((1 << kBits) - 1) << kAt)));
    return field;
}

// Pixels of two bytes.  To take 128 off a field turns its top bit over; in the
// end these are turned back.
template <RasterVideoPixelLayout kLayout, class D16, class D = hn::RebindToUnsigned<D16>>
HWY_INLINE hn::Vec<D> words(D16 /*d16*/, const Sums<hn::Vec<D16>> &sums) {
    constexpr int kLowAt = kLayout.finalShift;
    constexpr int kMidAt = kLowAt + kLayout.lowBits;
    constexpr int kHighAt = kMidAt + kLayout.midBits;
    static_assert(kLayout.lowBits == 8 - kLayout.fieldShift);
    static_assert(kLayout.midBits == 8 - kLayout.midShift);
    static_assert(kHighAt + kLayout.lowBits == 16);
    const D d;
    const auto field = [&](hn::Vec<D16> sum)
                           HWY_ATTR { return hn::BitCast(d, hn::SaturatedAdd(sum, sum)); };
    const auto low = placed<kLayout.lowBits, kLowAt>(d, field(sums.low));
    const auto mid = placed<kLayout.midBits, kMidAt>(d, field(sums.mid));
    const auto high = placed<kLayout.lowBits, kHighAt>(d, field(sums.high));
    constexpr int kTopBits = 1 << 15 | 1 << (kHighAt - 1) | 1 << (kMidAt - 1);
    return hn::Xor(hn::Or(low, hn::Or(mid, high)), hn::Set(d, static_cast<uint16_t>(kTopBits)));
}

// ---- Order --------------------------------------------------------------

// Pixels are moved between vectors within blocks of 16 bytes.  So that they end up
// in the order of memory, fours of them, quads, are first put where this is:
// - 2 bytes a pixel: the first half of a block's words is of the first vector;
// - 3 bytes: the block has pixels that follow each other, see storeParts;
// - 4 bytes: each quad becomes a block, of a vector of its own.
constexpr size_t quadAt(size_t bytes, size_t blocks, size_t block, size_t i) {
    return bytes == 2   ? i / 2 * 2 * blocks + 2 * block + i % 2
           : bytes == 3 ? 4 * (3 * block % blocks) + i
                        : blocks * i + block;
}

// Where narrowed() leaves a quad of pixels that come in their order.
constexpr size_t narrowedAt(size_t quad, size_t blocks) {
    const size_t inVector = quad % (2 * blocks);
    return inVector / 2 * 4 + quad / (2 * blocks) * 2 + inVector % 2;
}

enum class Come { InOrder, Narrowed };

template <size_t kBytes, size_t kBlocks, Come kCome>
HWY_ALIGN constexpr auto kQuads = [] {
    std::array<uint32_t, 4 * kBlocks> quads{};
    for (size_t block = 0; block < kBlocks; ++block)
        for (size_t i = 0; i < 4; ++i) {
            const size_t quad = quadAt(kBytes, kBlocks, block, i);
            quads[4 * block + i] =
                static_cast<uint32_t>(kCome == Come::Narrowed ? narrowedAt(quad, kBlocks) : quad);
        }
    return quads;
}();

// A quad is a word of 4 bytes.
template <size_t kBytes, Come kCome, class D>
HWY_INLINE hn::Vec<D> ordered(D d, hn::Vec<D> v) {
    constexpr size_t kBlocks = kLanes<D> * sizeof(hn::TFromD<D>) / 16;
    const hn::Repartition<uint32_t, D> d32;
    if constexpr (kBlocks == 1 || (kBlocks == 2 && kBytes == 3 && kCome == Come::InOrder))
        return v;
    else
        return hn::BitCast(d, hn::TableLookupLanes(
                                  hn::BitCast(d32, v),
                                  hn::SetTableIndices(d32, kQuads<kBytes, kBlocks, kCome>.data())));
}

// ---- Whole bytes --------------------------------------------------------

// The bytes of one field, from the sums of the first half of the pixels and of the
// second.
template <class D, class V>
HWY_INLINE hn::Vec<D> fieldBytes(D d, V first, V second) {
    return hn::Xor(narrowed(d, hn::ShiftRight<7>(first), hn::ShiftRight<7>(second)),
                   hn::Set(d, 0x80));
}

template <class Store, class D>
HWY_INLINE void storeFourBytes(D d, hn::Vec<D> low, hn::Vec<D> mid, hn::Vec<D> high, uint8_t *dst) {
    const hn::Repartition<uint16_t, D> d16;
    const auto storeTwo = [&](hn::Vec<D> lowMid, hn::Vec<D> highZero, uint8_t *to) HWY_ATTR {
        const auto words = hn::BitCast(d16, lowMid), tops = hn::BitCast(d16, highZero);
        Store::store(d16, hn::InterleaveLower(d16, words, tops), to);
        Store::store(d16, hn::InterleaveUpper(d16, words, tops), to + kLanes<D>);
    };
    storeTwo(hn::InterleaveLower(d, low, mid), hn::InterleaveLower(d, high, hn::Zero(d)), dst);
    storeTwo(hn::InterleaveUpper(d, low, mid), hn::InterleaveUpper(d, high, hn::Zero(d)),
             dst + 2 * kLanes<D>);
}

// What a table has where a byte is to be 0.
constexpr uint8_t kNone = 0x80;

// Three bytes a pixel: a block of 16 pixels has three parts, of 16 bytes each.
constexpr size_t fieldAt(size_t part, size_t byte) {
    return (16 * part + byte) % 3;
}

// Where the bytes of one field are among the block's, for a part, or for all of
// them: no two parts have a field at the same byte.
constexpr size_t kAllParts = 3;
template <size_t kField, size_t kPart>
HWY_ALIGN constexpr auto kToPart = [] {
    std::array<uint8_t, 16> sources{};
    for (size_t byte = 0; byte < 16; ++byte) {
        sources[byte] = kNone;
        for (size_t part = 0; part < 3; ++part)
            if (fieldAt(part, byte) == kField && (part == kPart || kPart == kAllParts))
                sources[byte] = static_cast<uint8_t>((16 * part + byte) / 3);
    }
    return sources;
}();

template <size_t kField, size_t kPart, class D>
HWY_INLINE hn::Vec<D> toPart(D d, hn::Vec<D> field) {
    return hn::TableLookupBytesOr0(field, hn::LoadDup128(d, kToPart<kField, kPart>.data()));
}

#if HWY_TARGET == HWY_AVX3

// The blocks from the part with the given number among those that a vector has
// of the memory, the kVector-th of three.
template <size_t kPart, size_t kVector, class D>
HWY_INLINE hn::Mask<D> ofPart(D) {
    constexpr uint8_t kMask = [] {
        uint8_t mask = 0;
        for (size_t block = 0; block < 4; ++block)
            if ((4 * kVector + block) % 3 == kPart)
                mask = static_cast<uint8_t>(mask | 3 << 2 * block);
        return mask;
    }();
    return hn::Mask<D>{kMask};
}

#endif

// The parts of the blocks to the order of memory, which has those of a block one
// after the other.
template <class Store, class D>
HWY_INLINE void storeParts(D d, hn::Vec<D> part0, hn::Vec<D> part1, hn::Vec<D> part2, uint8_t *to) {
    constexpr size_t n = kLanes<D>;
    if constexpr (n == 16) {
        Store::store(d, part0, to);
        Store::store(d, part1, to + n);
        Store::store(d, part2, to + 2 * n);
    } else if constexpr (n == 32) {
        Store::store(d, hn::ConcatLowerLower(d, part1, part0), to);
        Store::store(d, hn::ConcatUpperLower(d, part0, part2), to + n);
        Store::store(d, hn::ConcatUpperUpper(d, part2, part1), to + 2 * n);
    } else {
#if HWY_TARGET == HWY_AVX3
        // The 16 bytes that come c-th in memory are of part c % 3.  The order of
        // the blocks has them at c % 4 in the first part, to which the others are turned.
        const hn::Repartition<uint64_t, D> d64;
        const auto a = hn::BitCast(d64, part0);
        const hn::Vec<decltype(d64)> b{_mm512_shuffle_i64x2(part1.raw, part1.raw, 0x93)};
        const hn::Vec<decltype(d64)> c{_mm512_shuffle_i64x2(part2.raw, part2.raw, 0x4E)};
        const auto merged = [&](auto isA, auto isB) HWY_ATTR {
            return hn::IfThenElse(isA, a, hn::IfThenElse(isB, b, c));
        };
        Store::store(d64, merged(ofPart<0, 0>(d64), ofPart<1, 0>(d64)), to);
        Store::store(d64, merged(ofPart<0, 1>(d64), ofPart<1, 1>(d64)), to + n);
        Store::store(d64, merged(ofPart<0, 2>(d64), ofPart<1, 2>(d64)), to + 2 * n);
#endif
    }
}

#if HWY_TARGET == HWY_AVX3

// The bytes of a part that a field has.
template <size_t kField, size_t kPart, class D>
HWY_INLINE hn::Mask<D> ofField(D d) {
    constexpr uint64_t kMask = [] {
        uint64_t mask = 0;
        for (size_t byte = 0; byte < 64; ++byte)
            mask |= uint64_t{fieldAt(kPart, byte % 16) == kField} << byte;
        return mask;
    }();
    (void)d;
    return hn::Mask<D>{static_cast<decltype(hn::Mask<D>::raw)>(kMask)};
}

template <class Store, class D>
HWY_INLINE void storeThreeBytes(D d, hn::Vec<D> low, hn::Vec<D> mid, hn::Vec<D> high,
                                uint8_t *dst) {
    low = toPart<0, kAllParts>(d, low);
    mid = toPart<1, kAllParts>(d, mid);
    high = toPart<2, kAllParts>(d, high);
    const auto part = [&](auto isLow, auto isMid) HWY_ATTR {
        return hn::IfThenElse(isLow, low, hn::IfThenElse(isMid, mid, high));
    };
    storeParts<Store>(d, part(ofField<0, 0>(d), ofField<1, 0>(d)),
                      part(ofField<0, 1>(d), ofField<1, 1>(d)),
                      part(ofField<0, 2>(d), ofField<1, 2>(d)), dst);
}

#else

template <class Store, class D>
HWY_INLINE void storeThreeBytes(D d, hn::Vec<D> low, hn::Vec<D> mid, hn::Vec<D> high,
                                uint8_t *dst) {
    const auto part = [&](auto lowBytes, auto midBytes, auto highBytes)
                          HWY_ATTR { return hn::Or(hn::Or(lowBytes, midBytes), highBytes); };
    storeParts<Store>(d, part(toPart<0, 0>(d, low), toPart<1, 0>(d, mid), toPart<2, 0>(d, high)),
                      part(toPart<0, 1>(d, low), toPart<1, 1>(d, mid), toPart<2, 1>(d, high)),
                      part(toPart<0, 2>(d, low), toPart<1, 2>(d, mid), toPart<2, 2>(d, high)), dst);
}

#endif

// As many pixels as d has bytes, from their sums in two vectors.  Those that do
// not come in the order of their size come as they are in memory.
template <RasterVideoPixelLayout kLayout, class Store, bool kIsOrdered, class D, class V>
HWY_INLINE void storePixels(D d, const Sums<V> &first, const Sums<V> &second, uint8_t *dst) {
    constexpr size_t kBytes = kLayout.bytesPerPixel;
    if constexpr (kBytes == 2) {
        const hn::Repartition<int16_t, D> d16;
        const hn::RebindToUnsigned<decltype(d16)> du16;
        Store::store(du16, words<kLayout>(d16, first), dst);
        Store::store(du16, words<kLayout>(d16, second), dst + kLanes<D>);
    } else {
        const auto field = [&](V firstSums, V secondSums) HWY_ATTR {
            const auto bytes = fieldBytes(d, firstSums, secondSums);
            if constexpr (kIsOrdered)
                return bytes;
            else
                return ordered<kBytes, Come::Narrowed>(d, bytes);
        };
        const auto low = field(first.low, second.low);
        const auto mid = field(first.mid, second.mid);
        const auto high = field(first.high, second.high);
        if constexpr (kBytes == 3)
            storeThreeBytes<Store>(d, low, mid, high, dst);
        else
            storeFourBytes<Store>(d, low, mid, high, dst);
    }
}

// ---- Sources ------------------------------------------------------------

// For both pixels of each word of 4 bytes: the bytes kLower and kUpper of it, as
// those of a word of 2.
template <uint8_t kLower, uint8_t kUpper>
HWY_ALIGN constexpr auto kToBothPixels = [] {
    std::array<uint8_t, 16> sources{};
    for (size_t i = 0; i < 16; ++i) {
        const uint8_t byte = i % 2 == 0 ? kLower : kUpper;
        sources[i] = byte == kNone ? kNone : static_cast<uint8_t>(i / 4 * 4 + byte);
    }
    return sources;
}();

// Samples less 128 have their top bit turned over.
template <class D>
HWY_INLINE hn::Vec<D> less128(D d, hn::Vec<D> groups) {
    return hn::Xor(groups, hn::Set(d, 0x80808080));
}

// From samples less 128, a at byte kLow of each word and b at kHigh.
template <uint8_t kLow, uint8_t kHigh, class D, class D16 = hn::Repartition<int16_t, D>>
HWY_INLINE ChromaTerms<hn::Vec<D16>> chromaOf(D /*d*/, hn::Vec<D> groups) {
    const hn::Repartition<uint8_t, D> d8;
    const D16 d16;
    const auto both = [&](const std::array<uint8_t, 16> &sources) HWY_ATTR {
        return hn::BitCast(d16, hn::TableLookupBytesOr0(hn::BitCast(d8, groups),
                                                        hn::LoadDup128(d8, sources.data())));
    };
    return chromaTerms(d16, both(kToBothPixels<kNone, kLow>), both(kToBothPixels<kLow, kHigh>));
}

#endif

} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
