#include "raster/rasterVideoKernels.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "raster/rasterVideoKernels.cpp"
#include "hwy/foreach_target.h"
#include "hwy/highway.h"

#include "raster/kernels-inl.h"
#include "raster/streaming-inl.h"

#include <algorithm>
#include <array>
#include <cstring>

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {

// Where the samples of a group stand: its first luma, the second one being two
// bytes further, and its chroma.
struct Group {
    uint8_t luma, chromaLow, chromaHigh;
};
constexpr Group kYuy2 = {0, 1, 3};
constexpr Group kUyvy = {1, 0, 2};

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
#define QUILLON_PAIRS_X86 1
HWY_INLINE __m128i multiplyPairs(__m128i factors, __m128i samples) {
    return _mm_maddubs_epi16(factors, samples);
}
HWY_INLINE __m128i packPairs(__m128i first, __m128i second) {
    return _mm_packs_epi16(first, second);
}
#if HWY_TARGET <= HWY_AVX2
HWY_INLINE __m256i multiplyPairs(__m256i factors, __m256i samples) {
    return _mm256_maddubs_epi16(factors, samples);
}
HWY_INLINE __m256i packPairs(__m256i first, __m256i second) {
    return _mm256_packs_epi16(first, second);
}
#endif
#if HWY_TARGET <= HWY_AVX3
HWY_INLINE __m512i multiplyPairs(__m512i factors, __m512i samples) {
    return _mm512_maddubs_epi16(factors, samples);
}
HWY_INLINE __m512i packPairs(__m512i first, __m512i second) {
    return _mm512_packs_epi16(first, second);
}
#endif
#endif

// Per word: its lower byte times a factor and its upper one times another.
template <uint8_t kLower, uint8_t kUpper, class D>
HWY_INLINE hn::Vec<D> weighed(D d, hn::Vec<D> samples) {
#ifdef QUILLON_PAIRS_X86
    const auto factors = hn::Set(d, static_cast<int16_t>(kUpper << 8 | kLower));
    return hn::Vec<D>{multiplyPairs(factors.raw, samples.raw)};
#else
    const auto lower = hn::ShiftRight<8>(hn::ShiftLeft<8>(samples));
    return hn::Add(hn::Mul(lower, hn::Set(d, kLower)),
                   hn::Mul(hn::ShiftRight<8>(samples), hn::Set(d, kUpper)));
#endif
}

// Words as signed bytes, held to what those can be.  In each block of 16 bytes
// come the words of the first vector's block, then those of the second one's.
template <class D, class D16 = hn::Repartition<int16_t, D>>
HWY_INLINE hn::Vec<D> narrowed(D d, hn::Vec<D16> first, hn::Vec<D16> second) {
#ifdef QUILLON_PAIRS_X86
    (void)d;
    return hn::Vec<D>{packPairs(first.raw, second.raw)};
#else
    const hn::Half<hn::RebindToSigned<D>> half;
    const hn::RebindToSigned<D> d8;
    return hn::BitCast(d, hn::Combine(d8, hn::DemoteTo(half, second), hn::DemoteTo(half, first)));
#endif
}
#undef QUILLON_PAIRS_X86

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
HWY_INLINE hn::Vec<D> words(D16, const Sums<hn::Vec<D16>> &sums) {
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
        // the blocks has them at c % 4 in part 0, to which the others are turned.
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
HWY_INLINE ChromaTerms<hn::Vec<D16>> chromaOf(D, hn::Vec<D> groups) {
    const hn::Repartition<uint8_t, D> d8;
    const D16 d16;
    const auto both = [&](const std::array<uint8_t, 16> &sources) HWY_ATTR {
        return hn::BitCast(d16, hn::TableLookupBytesOr0(hn::BitCast(d8, groups),
                                                        hn::LoadDup128(d8, sources.data())));
    };
    return chromaTerms(d16, both(kToBothPixels<kNone, kLow>), both(kToBothPixels<kLow, kHigh>));
}

#endif

// ---- Frames -------------------------------------------------------------

template <RasterVideoPixelLayout kLayout>
constexpr size_t kPairBytes = size_t{2} * kLayout.bytesPerPixel;

template <Group kGroup, RasterVideoPixelLayout kLayout>
struct ConvertGroups {
    uint8_t *dst;
    const uint8_t *src;

#if HWY_TARGET == HWY_SCALAR
    void pair(size_t i) const {
        const uint8_t *group = src + 4 * i;
        convertPair<kLayout>(group[kGroup.luma], group[kGroup.luma + 2], group[kGroup.chromaLow],
                             group[kGroup.chromaHigh], dst + kPairBytes<kLayout> * i);
    }
#else
    // Some pages are read for each that is written around the caches; so that
    // nothing waits for them, ask for the groups well ahead of i.
    HWY_INLINE void prefetch(size_t i, size_t last) const {
        const uint8_t *ahead = src + 4 * HWY_MIN(i + 512, last);
        for (size_t line = 0; line < kLanes<Widest<uint8_t>> * 2; line += 64)
            hwy::Prefetch(ahead + line);
    }

    // Groups i and on: half as many as d has bytes.
    template <class Store, class D>
    HWY_INLINE void block(D d, size_t i) const {
        const auto first = sums(d, i);
        const auto second = sums(d, i + kLanes<D> / 4);
        storePixels<kLayout, Store, false>(d, first, second, dst + kPairBytes<kLayout> * i);
    }

    template <class D>
    HWY_INLINE auto sums(D, size_t i) const {
        const hn::Repartition<uint32_t, D> d32;
        const hn::Repartition<int16_t, D> d16;
        const auto groups =
            less128(d32, hn::LoadU(d32, reinterpret_cast<const uint32_t *>(src) + i));
        constexpr bool isLower = kGroup.luma == 0;
        const auto luma = weighed < isLower ? kLumaFactor : 0,
                   isLower ? 0 : kLumaFactor > (d16, hn::BitCast(d16, groups));
        return sumsOf(hn::Add(luma, hn::Set(d16, kLumaRest)),
                      chromaOf<kGroup.chromaLow, kGroup.chromaHigh>(d32, groups));
    }
#endif
};

// How far on the samples of the next two rows are.
struct NextRows {
    ptrdiff_t luma, chroma;
};

// One row, or two which share their chroma.
template <RasterVideoPixelLayout kLayout, size_t kRows>
struct ConvertRows {
    std::array<uint8_t *, kRows> dst;
    std::array<const uint8_t *, kRows> luma;
    const uint8_t *chromaHigh, *chromaLow;
    NextRows next = {};

#if HWY_TARGET == HWY_SCALAR
    void pair(size_t i) const {
        for (size_t row = 0; row < kRows; ++row)
            convertPair<kLayout>(luma[row][2 * i], luma[row][2 * i + 1], chromaLow[i],
                                 chromaHigh[i], dst[row] + kPairBytes<kLayout> * i);
    }
#else
    ConvertRows<kLayout, 1> only(size_t row) const {
        return {{dst[row]}, {luma[row]}, chromaHigh, chromaLow, next};
    }

    // The same place two rows on.
    HWY_INLINE void prefetch(size_t i, size_t /*last*/) const {
        for (const uint8_t *samples : luma)
            hwy::Prefetch(samples + next.luma + 2 * i);
        hwy::Prefetch(chromaHigh + next.chroma + i);
        hwy::Prefetch(chromaLow + next.chroma + i);
    }

    // Pairs of columns i and on: half as many as d has bytes.
    template <class Store, class D>
    HWY_INLINE void block(D d, size_t i) const {
        const hn::Repartition<int16_t, D> d16;
        const auto ab = ordered<kLayout.bytesPerPixel, Come::InOrder>(d16, chroma(d16, i));
        const auto terms = [&](auto both)
                               HWY_ATTR { return chromaTerms(d16, hn::ShiftLeft<8>(both), both); };
        const auto firstTerms = terms(hn::InterleaveLower(d16, ab, ab));
        const auto secondTerms = terms(hn::InterleaveUpper(d16, ab, ab));
        for (size_t row = 0; row < kRows; ++row) {
            const auto samples =
                ordered<kLayout.bytesPerPixel, Come::InOrder>(d, hn::LoadU(d, luma[row] + 2 * i));
            const auto first = hn::InterleaveLower(d, samples, hn::Zero(d));
            const auto second = hn::InterleaveUpper(d, samples, hn::Zero(d));
            storePixels<kLayout, Store, true>(
                d, sumsOf(lumaTerm(d16, hn::BitCast(d16, first)), firstTerms),
                sumsOf(lumaTerm(d16, hn::BitCast(d16, second)), secondTerms),
                dst[row] + kPairBytes<kLayout> * i);
        }
    }

    template <class D16>
    HWY_INLINE static hn::Vec<D16> lumaTerm(D16 d, hn::Vec<D16> luma) {
        return hn::Add(hn::Mul(luma, hn::Set(d, kLumaFactor)),
                       hn::Set(d, kLumaRest - 128 * kLumaFactor));
    }

    // Less 128, a in the lower bytes and b in the upper ones.
    template <class D16>
    HWY_INLINE hn::Vec<D16> chroma(D16 d, size_t i) const {
        const hn::Rebind<uint8_t, D16> half;
        const auto low = hn::PromoteTo(d, hn::LoadU(half, chromaLow + i));
        const auto high = hn::PromoteTo(d, hn::LoadU(half, chromaHigh + i));
        return hn::Xor(hn::Or(low, hn::ShiftLeft<8>(high)),
                       hn::Set(d, static_cast<int16_t>(0x8080)));
    }
#endif
};

#if HWY_TARGET != HWY_SCALAR

// The least number of pairs there are in a block.
constexpr size_t kLeastPairs = 8;
using Least = hn::CappedTag<uint8_t, 2 * kLeastPairs>;

// Calls use with the widest tag of which so many pairs fill a block; they are not
// fewer than the least number.
template <size_t kCap = kLanes<Widest<uint8_t>>, class Use>
HWY_INLINE void withBlocks(size_t pairs, const Use &use) {
    const hn::CappedTag<uint8_t, kCap> d;
    constexpr size_t n = kLanes<decltype(d)> / 2;
    if constexpr (n > kLeastPairs) {
        if (pairs < n)
            return withBlocks<n>(pairs, use);
    }
    use(d);
}

// Every pair at least once, of at least a block.
template <class D, class Body>
HWY_INLINE void walkThroughCaches(D d, size_t pairs, const Body &body) {
    constexpr size_t n = kLanes<D> / 2;
    size_t i = 0;
    for (; pairs - i >= n; i += n)
        body.template block<ThroughCaches>(d, i);
    if (i != pairs)
        body.template block<ThroughCaches>(d, pairs - n);
}

// Pairs from dst on to the next one that begins a cache line; 64 where none does.
template <size_t kBytes>
size_t pairsToLine(const uint8_t *dst) {
    const size_t pixels = pixelsToLine<kBytes>(dst);
    return pixels % 2 != 0 || pixels == 64 ? 64 : pixels / 2;
}

// The same for at least 64 pairs, and where one begins a cache line around the
// caches.
template <size_t kBytes, class Body>
HWY_INLINE void walkAroundCaches(const uint8_t *dst, size_t pairs, const Body &body) {
    const Widest<uint8_t> d;
    constexpr size_t n = kLanes<decltype(d)> / 2;
    const size_t head = pairsToLine<kBytes>(dst);
    if (head == 64)
        return walkThroughCaches(d, pairs, body);
    for (size_t i = 0; i < head; i += n)
        body.template block<ThroughCaches>(d, i);
    size_t i = head;
    for (; pairs - i >= n; i += n) {
        body.prefetch(i, pairs - n);
        body.template block<AroundCaches>(d, i);
    }
    if (i != pairs)
        body.template block<ThroughCaches>(d, pairs - n);
}

#endif

template <Group kGroup, RasterVideoPixelLayout kLayout>
void convertRun(uint8_t *dst, const uint8_t *src, size_t pairs) {
    using Convert = ConvertGroups<kGroup, kLayout>;
#if HWY_TARGET == HWY_SCALAR
    for (size_t i = 0; i < pairs; ++i)
        Convert{dst, src}.pair(i);
#else
    if (pairs < kLeastPairs) {
        uint8_t groups[4 * kLeastPairs] = {}, pixels[kPairBytes<kLayout> * kLeastPairs];
        std::memcpy(groups, src, 4 * pairs);
        Convert{pixels, groups}.template block<ThroughCaches>(Least(), 0);
        std::memcpy(dst, pixels, kPairBytes<kLayout> * pairs);
        return;
    }
    const Convert body = {dst, src};
    if (isStreamed(kPairBytes<kLayout> * pairs, 1)) {
        walkAroundCaches<kLayout.bytesPerPixel>(dst, pairs, body);
        hwy::FlushStream();
    } else {
        withBlocks(pairs, [&](auto d) HWY_ATTR { walkThroughCaches(d, pairs, body); });
    }
#endif
}

struct Run {
    uint8_t *dst;
    const uint8_t *src;
    VideoGroupOrder order;
    size_t groups;
};

template <RasterVideoPixelLayout kLayout>
void convertGroups(const Run &run) {
    if (run.order == VideoGroupOrder::Yuy2)
        convertRun<kYuy2, kLayout>(run.dst, run.src, run.groups);
    else
        convertRun<kUyvy, kLayout>(run.dst, run.src, run.groups);
}

// NOLINTNEXTLINE(readability-non-const-parameter): dst is written through run
void ConvertPacked(uint8 *dst, int32 bppdepth, const uint8 *src, VideoGroupOrder order,
                   size_t groups) {
    const Run run = {dst, src, order, groups};
    switch (bppdepth) {
    case 15:
        return convertGroups<kVideoLayout15>(run);
    case 16:
        return convertGroups<kVideoLayout16>(run);
    case 24:
        return convertGroups<kVideoLayout24>(run);
    default:
        return convertGroups<kVideoLayout32>(run);
    }
}

#if HWY_TARGET != HWY_SCALAR

// Two rows too short for a block.
template <RasterVideoPixelLayout kLayout>
void convertFewPairs(const ConvertRows<kLayout, 2> &rows, size_t pairs) {
    uint8_t luma[2][2 * kLeastPairs] = {}, high[kLeastPairs] = {}, low[kLeastPairs] = {};
    uint8_t pixels[2][kPairBytes<kLayout> * kLeastPairs];
    for (size_t row = 0; row < 2; ++row)
        std::memcpy(luma[row], rows.luma[row], 2 * pairs);
    std::memcpy(high, rows.chromaHigh, pairs);
    std::memcpy(low, rows.chromaLow, pairs);
    const ConvertRows<kLayout, 2> copies = {{pixels[0], pixels[1]}, {luma[0], luma[1]}, high, low};
    copies.template block<ThroughCaches>(Least(), 0);
    for (size_t row = 0; row < 2; ++row)
        std::memcpy(rows.dst[row], pixels[row], kPairBytes<kLayout> * pairs);
}

// Two rows around the caches: together if they lie to cache lines alike.
template <RasterVideoPixelLayout kLayout>
void streamRows(const ConvertRows<kLayout, 2> &rows, size_t pairs) {
    constexpr size_t kBytes = kLayout.bytesPerPixel;
    if (pairsToLine<kBytes>(rows.dst[0]) == pairsToLine<kBytes>(rows.dst[1]))
        return walkAroundCaches<kBytes>(rows.dst[0], pairs, rows);
    for (size_t row = 0; row < 2; ++row)
        walkAroundCaches<kBytes>(rows.dst[row], pairs, rows.only(row));
}

#endif

template <RasterVideoPixelLayout kLayout>
void convertRowPairs(DstRows dst, const VideoPlanes &src, Size pairs) {
    const NextRows next = {2 * src.luma.step, src.chromaHigh.step};
    const auto rows = [&](size_t r) {
        return ConvertRows<kLayout, 2>{{dst.row(2 * r), dst.row(2 * r + 1)},
                                       {src.luma.row(2 * r), src.luma.row(2 * r + 1)},
                                       src.chromaHigh.row(r),
                                       src.chromaLow.row(r),
                                       r + 1 < pairs.height ? next : NextRows{}};
    };
#if HWY_TARGET == HWY_SCALAR
    for (size_t r = 0; r < pairs.height; ++r)
        for (size_t i = 0; i < pairs.width; ++i)
            rows(r).pair(i);
#else
    if (isStreamed(kPairBytes<kLayout> * pairs.width, 2 * pairs.height)) {
        for (size_t r = 0; r < pairs.height; ++r)
            streamRows(rows(r), pairs.width);
        hwy::FlushStream();
    } else if (pairs.width < kLeastPairs) {
        for (size_t r = 0; r < pairs.height; ++r)
            convertFewPairs(rows(r), pairs.width);
    } else {
        withBlocks(pairs.width, [&](auto d) HWY_ATTR {
            for (size_t r = 0; r < pairs.height; ++r)
                walkThroughCaches(d, pairs.width, rows(r));
        });
    }
#endif
}

void ConvertPlanar(DstRows dst, int32 bppdepth, const VideoPlanes &src, Size pairs) {
    switch (bppdepth) {
    case 15:
        return convertRowPairs<kVideoLayout15>(dst, src, pairs);
    case 16:
        return convertRowPairs<kVideoLayout16>(dst, src, pairs);
    case 24:
        return convertRowPairs<kVideoLayout24>(dst, src, pairs);
    default:
        return convertRowPairs<kVideoLayout32>(dst, src, pairs);
    }
}

// ---- Colour key ---------------------------------------------------------

// Key pixels as words that equal the key where they match.  Of 32-bit pixels the
// top byte is shifted out.
template <class D>
HWY_INLINE hn::Vec<D> loadKeys(D d, const uint32_t *keys) {
    return hn::ShiftLeft<8>(hn::LoadU(d, keys));
}

template <class D, class Pixel>
HWY_INLINE hn::Vec<D> loadKeys(D d, const Pixel *keys) {
    const hn::Rebind<Pixel, D> narrow;
    return hn::PromoteTo(d, hn::LoadU(narrow, keys));
}

template <class Pixel, class Store>
struct ApplyKey {
    uint8_t *dst;
    const uint8_t *background, *overlay, *keys;
    uint32_t key;

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        const auto words = [&](const uint8_t *row) HWY_ATTR {
            return hn::LoadU(d, reinterpret_cast<const uint32_t *>(row) + i);
        };
        const auto matches =
            hn::Eq(loadKeys(d, reinterpret_cast<const Pixel *>(keys) + i), hn::Set(d, key));
        Store::store(d, hn::IfThenElse(matches, words(overlay), words(background)), dst + 4 * i);
    }
};

// From first up to behind last.
struct Bytes {
    uintptr_t first, last;

    bool overlaps(const Bytes &other) const { return first < other.last && other.first < last; }
};

Bytes bytesOf(const uint8_t *row, ptrdiff_t step, size_t rowBytes, size_t rows) {
    const auto first = reinterpret_cast<uintptr_t>(row);
    const uintptr_t toLast = static_cast<uintptr_t>(step) * (rows - 1);
    return {step < 0 ? first + toLast : first, (step < 0 ? first : first + toLast) + rowBytes};
}

template <class Pixel>
struct KeyedSurfaces {
    KeyedRows rows;
    Size size;
    uint32_t key;

    template <class Store>
    ApplyKey<Pixel, Store> body(size_t y) const {
        return {rows.dst.row(y), rows.background.row(y), rows.overlay.row(y), rows.key.row(y), key};
    }

    // Whether the pixels of a row have to be gone through one by one.  Writing
    // goes on faster than the reading of narrow key pixels and may catch up with
    // it anywhere, so there any overlap counts.
    bool runsIntoItself(size_t y) const {
        constexpr size_t kVector = 4 * kLanes<Widest<uint32_t>>;
        const uint8_t *dst = rows.dst.row(y), *keys = rows.key.row(y);
        const auto catchesUp = [&](const uint8_t *src) {
            return HWY_NAMESPACE::runsIntoItself(dst, src, kVector);
        };
        if (catchesUp(rows.background.row(y)) || catchesUp(rows.overlay.row(y)))
            return true;
        if constexpr (sizeof(Pixel) == 4)
            return catchesUp(keys);
        return bytesOf(dst, 0, 4 * size.width, 1)
            .overlaps(bytesOf(keys, 0, sizeof(Pixel) * size.width, 1));
    }

    // Whether nothing that is written is read.
    bool isApart() const {
        const auto all = [&](const auto &surface, size_t pixelBytes) {
            return bytesOf(surface.row(0), surface.step, pixelBytes * size.width, size.height);
        };
        const Bytes dst = all(rows.dst, 4);
        return !dst.overlaps(all(rows.background, 4)) && !dst.overlaps(all(rows.overlay, 4)) &&
               !dst.overlaps(all(rows.key, sizeof(Pixel)));
    }
};

template <class Pixel>
void applyKey(const KeyedRows &rows, Size size, uint32 key) {
    const size_t rowBytes = 4 * size.width;
    const auto fits = [](const SrcRows &src, size_t bytes) {
        return src.step == static_cast<ptrdiff_t>(bytes);
    };
    if (fits(rows.background, rowBytes) && fits(rows.overlay, rowBytes))
        size = joinedRows(size, rowBytes, rows.dst.step, sizeof(Pixel) * size.width, rows.key.step);

    const KeyedSurfaces<Pixel> surfaces = {rows, size, key};
    const bool streams = isStreamed(4 * size.width, size.height) && surfaces.isApart();
    for (size_t y = 0; y < size.height; ++y) {
        const auto body = surfaces.template body<ThroughCaches>(y);
        if (streams)
            walkStreaming<uint32_t, 4>(body.dst, size.width, body,
                                       surfaces.template body<AroundCaches>(y));
        else if (surfaces.runsIntoItself(y))
            walkSingly<uint32_t>(size.width, body);
        else
            walkOnce<uint32_t>(size.width, body);
    }
    if (streams)
        hwy::FlushStream();
}

void Key(const KeyedRows &rows, Size size, KeyPixel keyPixel, uint32 key) {
    switch (keyPixel) {
    case KeyPixel::Bytes1:
        return applyKey<uint8_t>(rows, size, key);
    case KeyPixel::Bytes2:
        return applyKey<uint16_t>(rows, size, key);
    case KeyPixel::Bytes4:
        return applyKey<uint32_t>(rows, size, key << 8);
    }
}

} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace quillon {

HWY_EXPORT(ConvertPacked);
HWY_EXPORT(ConvertPlanar);
HWY_EXPORT(Key);

void convertPackedFrame(uint8 *dst, int32 bppdepth, const uint8 *src, VideoGroupOrder order,
                        size_t groups) {
    HWY_DYNAMIC_DISPATCH(ConvertPacked)(dst, bppdepth, src, order, groups);
}

void convertPlanarFrame(DstRows dst, int32 bppdepth, const VideoPlanes &src, Size pairs) {
    HWY_DYNAMIC_DISPATCH(ConvertPlanar)(dst, bppdepth, src, pairs);
}

void applyKeyRows(const KeyedRows &rows, Size size, KeyPixel keyPixel, uint32 key) {
    HWY_DYNAMIC_DISPATCH(Key)(rows, size, keyPixel, key);
}

} // namespace quillon
#endif
