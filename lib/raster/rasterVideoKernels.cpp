#include "raster/rasterVideoKernels.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "raster/rasterVideoKernels.cpp"
#include "hwy/foreach_target.h"
#include "hwy/highway.h"

#include "raster/kernels-inl.h"
#include "raster/packed24-inl.h"
#include "raster/streaming-inl.h"

#include <algorithm>
#include <array>

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

// With c = luma - 16, a = chromaLow - 128, b = chromaHigh - 128 the fields are
//
//     low  = (298 c + 409 a + 128) >> 8           = (149 c + 64 + ((-103 a) >> 1) + 256 a) >> 7
//     mid  = (298 c - 208 a - 100 b + 128) >> 8   = (149 c + 64 + (-104 a - 50 b)) >> 7
//     high = (298 c + 516 b + 128) >> 8           = (149 c + 64 + 2 b + 256 b) >> 7
//
// exactly: all terms but 409 a are even, and an odd bit alone never carries.
//
// Fields of 0 to 255 come from sums (on the right, ahead of the shift) of 0 to
// 32767, which is half of what 16 bits hold.  Less 16384, these are the middle
// half: a saturating addition at the end of the sum keeps it in 16 bits, another
// one that doubles it holds it to this half.  The upper byte is then the field,
// less 128.
//
// No addition but the last one of a sum saturates, because what comes before
// fits: 149 c + 64 - 16384 is -18704 to 19291, to which -6541 to 6592 is added
// for low and -256 to 254 for high; -104 a - 50 b is -19558 to 19712.
constexpr int kLumaFactor = 149;
constexpr int kLumaRest = 64 - kLumaFactor * 16 - 16384;

// Samples come in the upper byte of their lanes, and factors too: the upper half
// of such a product is the product itself.
constexpr uint16_t upper(int value) {
    return static_cast<uint16_t>(value * 256);
}

// What a pair of chroma samples has to do with its pixels.
template <class V>
struct ChromaTerms {
    V low, a256, mid, high, b256;
};

// Samples less 128.
template <class D>
HWY_INLINE ChromaTerms<hn::Vec<D>> chromaTerms(D d, hn::Vec<D> a256, hn::Vec<D> b256) {
    const auto times = [d](hn::Vec<D> v, int16_t factor256)
                           HWY_ATTR { return hn::MulHigh(v, hn::Set(d, factor256)); };
    return {times(a256, -103 * 256 / 2), a256,
            hn::Add(times(a256, -104 * 256), times(b256, -50 * 256)), hn::ShiftRight<7>(b256),
            b256};
}

// Fields of pixels, in the upper byte of their lanes, less 128; the lower bytes
// are of no meaning.
template <class V>
struct Fields {
    V low, mid, high;
};

template <class D, class DU = hn::RebindToUnsigned<D>>
HWY_INLINE Fields<hn::Vec<DU>> fieldsOf(D d, hn::Vec<DU> luma,
                                        const ChromaTerms<hn::Vec<D>> &chroma) {
    const DU du;
    const auto product = hn::MulHigh(luma, hn::Set(du, upper(kLumaFactor)));
    const auto base =
        hn::BitCast(d, hn::Add(product, hn::Set(du, static_cast<uint16_t>(kLumaRest))));
    const auto field = [&](hn::Vec<D> sum, hn::Vec<D> last) HWY_ATTR {
        const auto held = hn::SaturatedAdd(sum, last);
        return hn::BitCast(du, hn::SaturatedAdd(held, held));
    };
    return {field(hn::Add(base, chroma.low), chroma.a256), field(base, chroma.mid),
            field(hn::Add(base, chroma.high), chroma.b256)};
}

// ---- Destinations -------------------------------------------------------

// The top kBits of fields, moved to begin at bit kAt.
template <int kBits, int kAt, class D>
HWY_INLINE hn::Vec<D> placed(D d, hn::Vec<D> field) {
    constexpr int kDistance = 16 - kBits - kAt;
    if constexpr (kDistance > 0)
        field = hn::ShiftRight<kDistance>(field);
    if constexpr (kAt > 0)
        field = hn::And(field, hn::Set(d, static_cast<uint16_t>(((1 << kBits) - 1) << kAt)));
    return field;
}

// To take 128 off a byte turns its top bit over.  This turns it back, given
// where the bit stands now.
template <class D>
HWY_INLINE hn::Vec<D> turned(D d, hn::Vec<D> v, int topBits) {
    return hn::Xor(v, hn::Set(d, static_cast<uint16_t>(topBits)));
}

template <RasterVideoPixelLayout kLayout, class D>
HWY_INLINE void storeNarrow(D d, const Fields<hn::Vec<D>> &fields, uint8_t *dst) {
    constexpr int kLowAt = kLayout.finalShift;
    constexpr int kMidAt = kLowAt + kLayout.lowBits;
    constexpr int kHighAt = kMidAt + kLayout.midBits;
    static_assert(kLayout.lowBits == 8 - kLayout.fieldShift);
    static_assert(kLayout.midBits == 8 - kLayout.midShift);
    static_assert(kHighAt + kLayout.lowBits == 16);
    const auto low = placed<kLayout.lowBits, kLowAt>(d, fields.low);
    const auto mid = placed<kLayout.midBits, kMidAt>(d, fields.mid);
    const auto high = placed<kLayout.lowBits, kHighAt>(d, fields.high);
    const auto pixels =
        turned(d, hn::Or(low, hn::Or(mid, high)), 1 << 15 | 1 << (kHighAt - 1) | 1 << (kMidAt - 1));
    hn::StoreU(pixels, d, reinterpret_cast<uint16_t *>(dst));
}

template <size_t kBytes, class D>
HWY_INLINE void storeWords(D d, hn::Vec<D> words, uint8_t *dst) {
    if constexpr (kBytes == 3)
        store24(d, words, dst);
    else
        hn::StoreU(words, d, reinterpret_cast<uint32_t *>(dst));
}

// Whole bytes a field.  d counts the pixels; wider pixels come in two vectors.
template <size_t kBytes, class D>
HWY_INLINE void storeWide(D d, const Fields<hn::Vec<D>> &fields, uint8_t *dst) {
    const auto lowMid =
        turned(d, hn::Or(placed<8, 0>(d, fields.low), placed<8, 8>(d, fields.mid)), 0x8080);
    const auto high = turned(d, placed<8, 0>(d, fields.high), 0x80);
    const hn::Repartition<uint32_t, D> d32;
    const auto first = hn::InterleaveLower(d, lowMid, high);
    const auto second = hn::InterleaveUpper(d, lowMid, high);
    storeWords<kBytes>(d32, hn::BitCast(d32, first), dst);
    storeWords<kBytes>(d32, hn::BitCast(d32, second), dst + kBytes * kLanes<decltype(d32)>);
}

template <RasterVideoPixelLayout kLayout, class D>
HWY_INLINE void storePixels(D d, const Fields<hn::Vec<D>> &fields, uint8_t *dst) {
    if constexpr (kLayout.bytesPerPixel == 2)
        storeNarrow<kLayout>(d, fields, dst);
    else
        storeWide<kLayout.bytesPerPixel>(d, fields, dst);
}

// ---- Sources ------------------------------------------------------------

// Interleaving works within blocks of 16 bytes.  So that it gives pixels in
// their order, the pairs of words that are to be interleaved with each other's
// neighbours are first put into one block: the first half of the vector into the
// lower halves of the blocks, the second half into the upper ones.
template <size_t kWords>
HWY_ALIGN [[maybe_unused]] constexpr auto kBlockOrder = [] {
    std::array<uint32_t, kWords> order{};
    for (uint32_t i = 0; i < kWords; ++i) {
        const uint32_t pair = i / 2;
        order[i] = 2 * (pair / 2 + pair % 2 * (kWords / 4)) + i % 2;
    }
    return order;
}();

// Pixels in 32-bit lanes of two, in the order that storePixels has to get them.
template <RasterVideoPixelLayout kLayout, class D>
HWY_INLINE hn::Vec<D> inStoreOrder(D d, hn::Vec<D> pairs) {
    constexpr size_t n = kLanes<D>;
    if constexpr (kLayout.bytesPerPixel > 2 && n > 4)
        return hn::TableLookupLanes(pairs, hn::SetTableIndices(d, kBlockOrder<n>.data()));
    else
        return pairs;
}

// Byte kAt of each word, to the upper byte of both pixels of the word.
template <uint8_t kAt>
HWY_ALIGN constexpr uint8_t kToBothPixels[16] = {0x80, kAt,      0x80, kAt,     0x80, kAt + 4,
                                                 0x80, kAt + 4,  0x80, kAt + 8, 0x80, kAt + 8,
                                                 0x80, kAt + 12, 0x80, kAt + 12};

// Chroma samples, byte kAt of each word, for chromaTerms.
template <uint8_t kAt, class D, class D16 = hn::Repartition<int16_t, D>>
HWY_INLINE hn::Vec<D16> chromaSamples(D d, hn::Vec<D> words) {
    const hn::Repartition<uint8_t, D> d8;
    const auto less128 = hn::BitCast(d8, hn::Xor(words, hn::Set(d, 0x80808080)));
    const auto table = hn::LoadDup128(d8, kToBothPixels<kAt>);
    return hn::BitCast(D16(), hn::TableLookupBytesOr0(less128, table));
}

#endif

// ---- Frames -------------------------------------------------------------

template <RasterVideoPixelLayout kLayout>
constexpr size_t kPairBytes = size_t{2} * kLayout.bytesPerPixel;

template <Group kGroup, RasterVideoPixelLayout kLayout>
struct ConvertGroups {
    uint8_t *dst;
    const uint8_t *src;

    // Groups i and on: as many as d has words.
    template <class D>
    HWY_INLINE void operator()([[maybe_unused]] D d, size_t i) const {
        const uint8_t *group = src + 4 * i;
        uint8_t *pixels = dst + kPairBytes<kLayout> * i;
#if HWY_TARGET == HWY_SCALAR
        convertPair<kLayout>(group[kGroup.luma], group[kGroup.luma + 2], group[kGroup.chromaLow],
                             group[kGroup.chromaHigh], pixels);
#else
        const hn::Repartition<int16_t, D> d16;
        const hn::RebindToUnsigned<decltype(d16)> du16;
        const auto groups =
            inStoreOrder<kLayout>(d, hn::LoadU(d, reinterpret_cast<const uint32_t *>(group)));
        const auto chroma = chromaTerms(d16, chromaSamples<kGroup.chromaLow>(d, groups),
                                        chromaSamples<kGroup.chromaHigh>(d, groups));
        auto luma = hn::BitCast(du16, groups);
        if constexpr (kGroup.luma == 0)
            luma = hn::ShiftLeft<8>(luma);
        else
            luma = hn::And(luma, hn::Set(du16, 0xFF00));
        storePixels<kLayout>(du16, fieldsOf(d16, luma, chroma), pixels);
#endif
    }
};

// Two rows, which share their chroma.
template <RasterVideoPixelLayout kLayout>
struct ConvertRowPair {
    uint8_t *upper, *lower;
    const uint8_t *upperLuma, *lowerLuma;
    const uint8_t *chromaHighRow, *chromaLowRow;

    // Pairs of columns i and on: as many as d has words.
    template <class D>
    HWY_INLINE void operator()([[maybe_unused]] D d, size_t i) const {
        const size_t at = kPairBytes<kLayout> * i;
#if HWY_TARGET == HWY_SCALAR
        const auto convert = [&](const uint8_t *luma, uint8_t *pixels) {
            convertPair<kLayout>(luma[2 * i], luma[2 * i + 1], chromaLowRow[i], chromaHighRow[i],
                                 pixels + at);
        };
        convert(upperLuma, upper);
        convert(lowerLuma, lower);
#else
        const hn::Repartition<int16_t, D> d16;
        const hn::RebindToUnsigned<decltype(d16)> du16;
        const auto chromaOf = [&](const uint8_t *row) HWY_ATTR {
            const hn::Rebind<uint8_t, D> d8;
            const auto words = hn::PromoteTo(d, hn::LoadU(d8, row + i));
            return chromaSamples<0>(d, inStoreOrder<kLayout>(d, words));
        };
        const auto lumaOf = [&](const uint8_t *row) HWY_ATTR {
            const hn::Rebind<uint8_t, decltype(du16)> d8;
            const auto samples = hn::PromoteTo(du16, hn::LoadU(d8, row + 2 * i));
            const auto ordered = inStoreOrder<kLayout>(d, hn::BitCast(d, samples));
            return hn::ShiftLeft<8>(hn::BitCast(du16, ordered));
        };
        const auto chroma = chromaTerms(d16, chromaOf(chromaLowRow), chromaOf(chromaHighRow));
        storePixels<kLayout>(du16, fieldsOf(d16, lumaOf(upperLuma), chroma), upper + at);
        storePixels<kLayout>(du16, fieldsOf(d16, lumaOf(lowerLuma), chroma), lower + at);
#endif
    }
};

struct Run {
    uint8_t *dst;
    const uint8_t *src;
    VideoGroupOrder order;
    size_t groups;
};

template <RasterVideoPixelLayout kLayout>
void convertGroups(const Run &run) {
    if (run.order == VideoGroupOrder::Yuy2)
        walkAgain<uint32_t>(run.groups, ConvertGroups<kYuy2, kLayout>{run.dst, run.src});
    else
        walkAgain<uint32_t>(run.groups, ConvertGroups<kUyvy, kLayout>{run.dst, run.src});
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

template <RasterVideoPixelLayout kLayout>
void convertRowPairs(DstRows dst, const VideoPlanes &src, Size pairs) {
    for (size_t r = 0; r < pairs.height; ++r) {
        const ConvertRowPair<kLayout> body = {dst.row(2 * r),        dst.row(2 * r + 1),
                                              src.luma.row(2 * r),   src.luma.row(2 * r + 1),
                                              src.chromaHigh.row(r), src.chromaLow.row(r)};
        walkAgain<uint32_t>(pairs.width, body);
    }
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
