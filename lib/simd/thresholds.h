// Where one way of walking a rectangle becomes faster than another.  All such
// numbers of all rooms stand here, each with what set it: measured on Sapphire
// Rapids (AVX-512 and AVX2) unless it says otherwise.  `scripts/bench --growth` and
// `--sweep` show a number that does not fit a processor as a step or a slow point.
#pragma once

#include "core/surface.h"

#include <algorithm>

namespace quillon {

// ---- Stores around the caches ---------------------------------------------

// Destinations that are not read are written around the caches from this size on.
// A store through the caches reads its line first and drives another one out.
// That pays as long as the surface stays in the caches of the core: 24 GB/s around
// them against 9 GB/s through them beyond that size, and a tenth slower where all
// of it would have stayed in the next cache.
inline constexpr size_t kNonTemporalBytes = size_t{3} << 19;

// Shorter rows are not worth the alignment that such stores need.
inline constexpr size_t kNonTemporalRowBytes = 256;

constexpr bool isNonTemporal(ByteExtent dst) {
    return dst.rowBytes >= kNonTemporalRowBytes && dst.rowBytes * dst.height >= kNonTemporalBytes;
}

// ---- Prefetch distances, in bytes -----------------------------------------

// Ahead in long rows of a surface that is in some cache.
inline constexpr ptrdiff_t kPrefetchInCaches = 768;

// The same of a surface that is not: half a page.  Conversions take up to 1.1 times as
// long at 3072 and 1.05 at 768.
inline constexpr ptrdiff_t kPrefetchUncached = 2048;

// The stencil, whose stores leave out lanes and wait for the lines that hold these.
constexpr bool isPrefetchedStencil(ByteExtent dst) {
    return dst.rowBytes > kPrefetchUncached && dst.rowBytes * dst.height >= kNonTemporalBytes;
}

// Smooth scaling, whose source or destination is larger than the caches of the core: 0.4
// to 0.95 of the time, but 1.1 to 1.3 times as much where half of what is prefetched lies
// beside the rows.
constexpr bool isPrefetchedScale(ByteExtent src, int64_t srcStride, ByteExtent dst) {
    const size_t bytes = std::max(src.rowBytes * src.height, dst.rowBytes * dst.height);
    const bool isContiguous = srcStride == static_cast<int64_t>(src.rowBytes);
    return bytes >= kNonTemporalBytes && src.rowBytes >= (isContiguous ? 1 : 4) * kPrefetchUncached;
}

// Raster operations between surfaces, by vectors of up to 32 bytes: what is prefetched of
// one surface before the other one's turn, twice its size ahead.  0.87 to 0.94 of the time
// of AVX2; line by line gains nothing, and with 64 bytes in a vector pages of 4 KB lose.
inline constexpr size_t kRopPrefetchBlock = 512;

// ---- Lengths of rows, in bytes ---------------------------------------------

// The fill: rows of up to so many vectors are stored unaligned, without a loop.
inline constexpr size_t kFillShortVectors = 8;

// The copy: rows up to here are held in registers, where the call of memmove would
// take longer than the row.
inline constexpr size_t kCopyShortRow = 128;

// Rows up to here are copied by a loop of our own, 1.2 to 1.5 times as fast as
// memcpy, which has more means for longer ones.
inline constexpr size_t kCopyMediumRow = 8192;

// Bits to pixels: rows of up to so many vectors are stored unaligned.  To align
// them costs two chunks that are in part stored twice, more than the vectors that
// lie across two cache lines.
inline constexpr size_t kExpandUnalignedVectors = 16;

// ---- Lengths of rows, in pixels --------------------------------------------

// The blend: rows from here on prefetch the same place of the next row, which the
// processor does not do of itself, and longer ones prefetch ahead in the row.
inline constexpr size_t kPrefetchNextRow = 64;
inline constexpr size_t kPrefetchLongRow = 1024;

// Conversions: shorter rows are not worth the head that aligns the stores of the others
// to cache lines.
inline constexpr size_t kConvertLongRow = 512;

// Shorter ones of them that are walked by chunks of less than this do not prefetch the
// next row: it is one or two lines.
inline constexpr size_t kConvertPrefetchRow = 32;

// Palette indices to 8 or 16 bits: from so many pixels on, it pays to narrow the palette
// first, for lookups in vectors.
inline constexpr size_t kNarrowPalettePixels = 2048;

// These search a tile of so many pixels for the palette entries that it uses, and convert
// it while it is in the nearest cache.
inline constexpr size_t kNarrowPaletteTile = 8192;

// ---- Source pixels ----------------------------------------------------------

// Nearest pixels: steps of up to so many source pixels read the source in whole
// vectors and pick from these, longer ones pick pixel by pixel.  A fourth vector
// gains up to 15 % with AVX-512 and loses 5 to 30 % with AVX2.  With four pixels in
// a vector even a second one loses.
constexpr uint32_t scaleMostNearestPixels(size_t vectorBytes) {
    return vectorBytes >= 64 ? 4 : vectorBytes >= 32 ? 3 : 1;
}

// The same for averages of so many whole source pixels.  AVX-512, which picks from
// two vectors at once, is 2.6 times as fast at 8, AVX2 1.3 times at 4 and even at 5.
constexpr uint32_t scaleMostBoxPixels(size_t vectorBytes) {
    return vectorBytes >= 64 ? 8 : vectorBytes >= 32 ? 4 : 0;
}

// The stencil: shorter rows are taken pixel by pixel, which is faster than to mask
// the bits of a chunk.
inline constexpr size_t kStencilShortRow = 4;

} // namespace quillon
