#include "convert/convertKernels.h"

#include <algorithm>

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "convert/convertKernels.cpp"
#include "hwy/foreach_target.h"
#include "hwy/highway.h"

#include "convert/pixelFormats-inl.h"
#include "legacy/kernels-inl.h"
#include "legacy/streaming-inl.h"

// A conversion goes over a row in blocks, as many pixels as a vector has bytes.  It
// is a source, which loads a block as vectors of words of the 32-bit layout, and a
// destination, which stores such vectors.  Narrowing what has been widened gives
// back every bit, so that the detour through words, which never leaves the
// registers, costs nothing in exactness.  Pairs whose pixels stay within 16 bits
// skip it.

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {

// What conversions have to be told beyond their layouts.
struct Tables {
    const uint32_t *palette;
    Weights weights;
};

// ---- Conversions of a block ----------------------------------------------

template <class Source, class Destination>
struct ThroughWords {
    static constexpr size_t kSrcBytes = Source::kBytes;
    static constexpr size_t kDstBytes = Destination::kBytes;

    template <class Stores, class D8>
    HWY_INLINE static void convert(D8 /*d*/, uint8_t *dst, const uint8_t *src,
                                   const Tables &tables) {
        constexpr bool kOpaque = Destination::kHasAlpha && !Source::kHasAlpha;
        const hn::CappedTag<uint32_t, kLanes<D8>> d;
        hn::Vec<decltype(d)> words[kLanes<D8> / kLanes<decltype(d)>];
        Source::template load<kOpaque>(d, src, tables.palette, words);
        Destination::template store<Stores>(d, words, dst, tables.weights);
    }
};

struct Widen15To16 {
    template <class D>
    HWY_INLINE static hn::Vec<D> converted(D d, hn::Vec<D> p) {
        const auto wide =
            hn::Or(hn::ShiftLeft<1>(masked(d, p, 0x7FE0)), hn::ShiftRight<4>(masked(d, p, 0x0200)));
        return hn::Or(masked(d, p, 0x001F), wide);
    }
};

struct Narrow16To15 {
    template <class D>
    HWY_INLINE static hn::Vec<D> converted(D d, hn::Vec<D> p) {
        return hn::Or(masked(d, p, 0x001F), masked(d, hn::ShiftRight<1>(p), 0x7FE0));
    }
};

// From one layout of 16 bits to the other.
template <class Conversion>
struct Within16 {
    static constexpr size_t kSrcBytes = 2;
    static constexpr size_t kDstBytes = 2;

    template <class Stores, class D8>
    HWY_INLINE static void convert(D8 /*d*/, uint8_t *dst, const uint8_t *src,
                                   const Tables & /*tables*/) {
        const hn::CappedTag<uint16_t, kLanes<D8>> d;
        for (size_t i = 0; i < 2 * kLanes<D8>; i += 2 * kLanes<decltype(d)>) {
            const auto p = hn::LoadU(d, reinterpret_cast<const uint16_t *>(src + i));
            Stores::store(d, Conversion::converted(d, p), dst + i);
        }
    }
};

// A shift to the right, or to the left where the distance is negative.
template <int kDistance, class V>
HWY_INLINE V shiftedRight(V v) {
    if constexpr (kDistance >= 0)
        return hn::ShiftRight<kDistance>(v);
    else
        return hn::ShiftLeft<-kDistance>(v);
}

// Pixels of 16 bits moved into a one-byte layout.
template <ChannelEnds kEnds, int kDepth, class D>
HWY_INLINE hn::Vec<D> toSmall(D d, hn::Vec<D> v) {
    constexpr const auto &mask = RasterSmallMasks[kDepth];
    const auto red = shiftedRight<shiftToMask(kEnds.red, mask[0])>(v);
    const auto green = shiftedRight<shiftToMask(kEnds.green, mask[1])>(v);
    const auto blue = shiftedRight<shiftToMask(kEnds.blue, mask[2])>(v);
    return hn::Or(masked(d, red, mask[0]),
                  hn::Or(masked(d, green, mask[1]), masked(d, blue, mask[2])));
}

template <ChannelEnds kEnds, int kDepth>
struct From16ToSmall {
    static constexpr size_t kSrcBytes = 2;
    static constexpr size_t kDstBytes = 1;

    template <class Stores, class D8>
    HWY_INLINE static void convert(D8 d8, uint8_t *dst, const uint8_t *src,
                                   const Tables & /*tables*/) {
        const hn::CappedTag<uint16_t, kLanes<D8>> d;
        constexpr size_t n = kLanes<decltype(d)>;
        if constexpr (kLanes<D8> == n)
            Stores::store(d8, hn::TruncateTo(d8, pixels(d, src)), dst);
        else
            Stores::store(d8, packed8(d8, pixels(d, src), pixels(d, src + 2 * n)), dst);
    }

private:
    template <class D>
    HWY_INLINE static hn::Vec<D> pixels(D d, const uint8_t *src) {
        return toSmall<kEnds, kDepth>(d, hn::LoadU(d, reinterpret_cast<const uint16_t *>(src)));
    }
};

// ---- Rectangles ---------------------------------------------------------

struct Job {
    DstRows dst;
    SrcRows src;
    Tables tables;
    Size size;
};

// From how many pixels on it pays to align the blocks to the destination's lines.
inline constexpr size_t kLongRow = 512;

// How far ahead of the block at hand to ask for memory, in bytes; 0 not at all.  The
// processor asks ahead itself, but only inside a page, and not for the next row.
struct Ahead {
    ptrdiff_t src, dst;
};
inline constexpr Ahead kAheadOfBlocks = {kAheadInCaches, kAheadInCaches};
inline constexpr Ahead kAheadOfCaches = {3072, 0};

// Asks for the lines of so many bytes.
HWY_INLINE void prefetchBytes(const uint8_t *from, size_t bytes, ptrdiff_t ahead) {
    if (ahead == 0)
        return;
    const uint8_t *line = advance(from, static_cast<uint64_t>(ahead));
    for (size_t i = 0; i < bytes; i += 64)
        hwy::Prefetch(advance(line, i));
}

// A row of a conversion, by pixels.
template <class Conversion>
struct RowOf {
    uint8_t *dst;
    const uint8_t *src;
    Tables tables;

    template <class Stores, class D8>
    HWY_INLINE void convert(D8 d, size_t i) const {
        Conversion::template convert<Stores>(d, dst + i * Conversion::kDstBytes,
                                             src + i * Conversion::kSrcBytes, tables);
    }
    HWY_INLINE void prefetch(size_t i, size_t count, const Ahead &ahead) const {
        prefetchBytes(src + i * Conversion::kSrcBytes, count * Conversion::kSrcBytes, ahead.src);
        prefetchBytes(dst + i * Conversion::kDstBytes, count * Conversion::kDstBytes, ahead.dst);
    }
};

// Every pixel of each row at least once, in blocks of kBlock pixels, of which the
// last may overlap the one before; rows shorter than that in the next smaller ones.
template <class Conversion, size_t kBlock = kLanes<Widest<uint8_t>>>
HWY_NOINLINE void convertRows(const Job &job) {
    if constexpr (kBlock > 1) {
        if (job.size.width < kBlock)
            return convertRows<Conversion, kBlock / (kBlock > 16 ? 2 : 4)>(job);
    }
    const hn::CappedTag<uint8_t, kBlock> d;
    const size_t last = job.size.width - kBlock;
    const Ahead nextRow = {job.src.step, job.dst.step};
    RowOf<Conversion> row = {job.dst.first, job.src.first, job.tables};
    for (size_t y = 0; y < job.size.height; ++y) {
        for (size_t i = 0;; i = std::min(i + kBlock, last)) {
            if constexpr (kBlock >= 32)
                row.prefetch(i, kBlock, nextRow);
            row.template convert<ThroughCaches>(d, i);
            if (i == last)
                break;
        }
        row.dst = advance(row.dst, static_cast<size_t>(job.dst.step));
        row.src = advance(row.src, static_cast<size_t>(job.src.step));
    }
}

// A piece of a row; it may be empty.
template <class Conversion>
HWY_NOINLINE void convertPiece(const RowOf<Conversion> &row, size_t begin, size_t end) {
    if (begin != end)
        convertRows<Conversion>({{row.dst + begin * Conversion::kDstBytes, 0},
                                 {row.src + begin * Conversion::kSrcBytes, 0},
                                 row.tables,
                                 {end - begin, 1}});
}

// Long rows: from the first pixel on that begins a cache line, all blocks fill lines.
template <class Conversion>
HWY_NOINLINE void convertLongRows(const Job &job) {
    const Widest<uint8_t> d;
    constexpr size_t n = kLanes<decltype(d)>;
    const size_t width = job.size.width;
    const bool streams = isStreamed(Conversion::kDstBytes * width, job.size.height);
    for (size_t y = 0; y < job.size.height; ++y) {
        const RowOf<Conversion> row = {job.dst.row(y), job.src.row(y), job.tables};
        const size_t toLine = pixelsToLine<Conversion::kDstBytes>(row.dst);
        const size_t begin = toLine < 64 ? toLine : width;
        size_t i = begin;
        convertPiece(row, 0, begin);
        if (streams) {
            for (; width - i >= n; i += n) {
                row.prefetch(i, n, kAheadOfCaches);
                row.template convert<AroundCaches>(d, i);
            }
        } else {
            for (; width - i >= n; i += n) {
                row.prefetch(i, n, kAheadOfBlocks);
                row.template convert<ToWholeLines>(d, i);
            }
        }
        convertPiece(row, i, width);
    }
    if (streams)
        hwy::FlushStream();
}

template <class Conversion>
void convertRectangle(Job job) {
    job.size = joinedRows(job.size, Conversion::kDstBytes * job.size.width, job.dst.step,
                          Conversion::kSrcBytes * job.size.width, job.src.step);
    constexpr size_t n = kLanes<Widest<uint8_t>>;
    if (n > 1 && job.size.width >= kLongRow)
        convertLongRows<Conversion>(job);
    else
        convertRows<Conversion>(job);
}

Weights weightsOf(Layout layout) {
    switch (layout) {
    case Layout::Small3:
    case Layout::Small6:
    case Layout::Small8:
        return weightsOfSmall(static_cast<size_t>(layout));
    case Layout::Rgb15:
        return kWeights15;
    case Layout::Rgb16:
        return kWeights16;
    default:
        return {};
    }
}

template <class Source>
void convertWords(Layout dstLayout, const Job &job) {
    switch (dstLayout) {
    case Layout::Small3:
    case Layout::Small6:
    case Layout::Small8:
        return convertRectangle<ThroughWords<Source, ToSmall>>(job);
    case Layout::Rgb15:
    case Layout::Rgb16:
        return convertRectangle<ThroughWords<Source, To16Bits>>(job);
    case Layout::Rgb24:
        return convertRectangle<ThroughWords<Source, To24>>(job);
    case Layout::Rgb32:
        return convertRectangle<ThroughWords<Source, To32>>(job);
    case Layout::Index:
        return;
    }
}

// From 15 or 16; Conversion goes to the other of the two.
template <class Source, ChannelEnds kEnds, class Conversion>
void convert16(Layout dstLayout, const Job &job) {
    switch (dstLayout) {
    case Layout::Small3:
        return convertRectangle<From16ToSmall<kEnds, 3>>(job);
    case Layout::Small6:
        return convertRectangle<From16ToSmall<kEnds, 6>>(job);
    case Layout::Small8:
        return convertRectangle<From16ToSmall<kEnds, 8>>(job);
    case Layout::Rgb15:
    case Layout::Rgb16:
        return convertRectangle<Within16<Conversion>>(job);
    case Layout::Rgb24:
        return convertRectangle<ThroughWords<Source, To24>>(job);
    case Layout::Rgb32:
        return convertRectangle<ThroughWords<Source, To32>>(job);
    case Layout::Index:
        return;
    }
}

void Convert(Layout dstLayout, DstRows dst, Layout srcLayout, SrcRows src, const uint32_t *palette,
             Size size) {
    const Job job = {dst, src, {palette, weightsOf(dstLayout)}, size};
    switch (srcLayout) {
    case Layout::Index:
        return convertWords<FromIndex>(dstLayout, job);
    case Layout::Rgb15:
        return convert16<From15, kEnds15, Widen15To16>(dstLayout, job);
    case Layout::Rgb16:
        return convert16<From16, kEnds16, Narrow16To15>(dstLayout, job);
    case Layout::Rgb24:
        return convertWords<From24>(dstLayout, job);
    case Layout::Rgb32:
        return convertWords<From32>(dstLayout, job);
    case Layout::Small3:
    case Layout::Small6:
    case Layout::Small8:
        return; // destinations only
    }
}

} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace quillon {

HWY_EXPORT(Convert);

void convertRows(Layout dstLayout, DstRows dst, Layout srcLayout, SrcRows src,
                 const uint32_t *palette, Size size) {
    HWY_DYNAMIC_DISPATCH(Convert)(dstLayout, dst, srcLayout, src, palette, size);
}

} // namespace quillon
#endif
