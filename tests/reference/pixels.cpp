#include "reference/pixels.h"

#include "raster.h"

#include <algorithm>
#include <bit>
#include <cstdlib>

namespace quillon::reference {
namespace {

struct Layout {
    int32 depth;
    uint32 red, green, blue, alpha; // masks
};

const Layout &layoutOf(int32 depth) {
    static const Layout layouts[] = {
        {3, 0x04, 0x20, 0x80, 0},
        {6, 0x30, 0x0C, 0x03, 0},
        {8, 0x07, 0x38, 0xC0, 0},
        {15, 0x7C00, 0x03E0, 0x001F, 0},
        {16, 0xF800, 0x07E0, 0x001F, 0},
        {24, 0xFF0000, 0x00FF00, 0x0000FF, 0},
        {32, 0xFF0000, 0x00FF00, 0x0000FF, 0xFF000000},
    };
    for (const Layout &layout : layouts)
        if (layout.depth == depth)
            return layout;
    std::abort(); // the test asks for what there is not
}

// The channel under a mask, widened to 8 bits by repeating its bits, of which the
// top ones are put under the other mask.
uint32 moved(uint32 pixel, uint32 from, uint32 to) {
    const int bits = std::popcount(from);
    const uint32 value = (pixel & from) >> std::countr_zero(from);
    uint32 repeated = 0;
    int have = 0;
    for (; have < 8; have += bits)
        repeated = (repeated << bits) | value;
    const uint32 channel = repeated >> (have - 8);
    return (channel >> (8 - std::popcount(to))) << std::countr_zero(to);
}

} // namespace

uint32 combined(uint32 rop, uint32 s, uint32 d) {
    const uint32 results[][2] = {
        {RASTER_ROP_CLEAR, 0},
        {RASTER_ROP_AND, s & d},
        {RASTER_ROP_AND_REVERSE, s & ~d},
        {RASTER_ROP_COPY, s},
        {RASTER_ROP_AND_INVERTED, ~s & d},
        {RASTER_ROP_NOOP, d},
        {RASTER_ROP_XOR, s ^ d},
        {RASTER_ROP_OR, s | d},
        {RASTER_ROP_NOR, ~(s | d)},
        {RASTER_ROP_EQUIV, ~(s ^ d)},
        {RASTER_ROP_INVERT, ~d},
        {RASTER_ROP_OR_REVERSE, s | ~d},
        {RASTER_ROP_COPY_INVERTED, ~s},
        {RASTER_ROP_OR_INVERTED, ~s | d},
        {RASTER_ROP_NAND, ~(s & d)},
        {RASTER_ROP_SET, ~uint32{0}},
    };
    for (const auto &[code, result] : results)
        if (code == rop)
            return result;
    return d;
}

uint32 blended(uint32 src, uint32 dst) {
    uint32 result = dst & 0xFF000000;
    for (int shift = 0; shift < 24; shift += 8) {
        const uint32 shown = (dst >> shift & 0xFF) * (255 - (src >> 24)) / 255;
        result |= std::min((src >> shift & 0xFF) + shown, 255u) << shift;
    }
    return result;
}

uint32 converted(uint32 pixel, int32 srcDepth, int32 dstDepth) {
    const Layout &src = layoutOf(srcDepth), &dst = layoutOf(dstDepth);
    const uint32 color = moved(pixel, src.red, dst.red) | moved(pixel, src.green, dst.green) |
                         moved(pixel, src.blue, dst.blue);
    return color | (src.alpha == 0 ? dst.alpha : pixel & dst.alpha);
}

uint32 convertedAlone(uint32 pixel, int32 srcDepth, int32 dstDepth) {
    // A 24-bit pixel in a word is taken for a 32-bit one: its top byte goes along.
    const bool areWords = std::min(srcDepth, dstDepth) >= 24;
    if (srcDepth == dstDepth || areWords)
        return pixel;
    return converted(pixel, srcDepth, dstDepth) & 0x00FFFFFF;
}

} // namespace quillon::reference
