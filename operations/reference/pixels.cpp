#include "reference/pixels.h"

#include <algorithm>
#include <bit>
#include <cstdlib>

namespace quillon::reference {
namespace {

struct Format {
    int32_t depth;
    uint32_t red, green, blue, alpha; // masks
};

const Format &formatAt(int32_t depth) {
    static const Format formats[] = {
        {3, 0x04, 0x20, 0x80, 0},
        {6, 0x30, 0x0C, 0x03, 0},
        {8, 0x07, 0x38, 0xC0, 0},
        {15, 0x7C00, 0x03E0, 0x001F, 0},
        {16, 0xF800, 0x07E0, 0x001F, 0},
        {24, 0xFF0000, 0x00FF00, 0x0000FF, 0},
        {32, 0xFF0000, 0x00FF00, 0x0000FF, 0xFF000000},
    };
    for (const Format &format : formats)
        if (format.depth == depth)
            return format;
    std::abort(); // the test asks for what there is not
}

// The channel under a mask, widened to 8 bits by repeating its bits, of which the
// top ones are put under the other mask.
uint32_t moved(uint32_t pixel, uint32_t from, uint32_t to) {
    const int bits = std::popcount(from);
    const uint32_t value = (pixel & from) >> std::countr_zero(from);
    uint32_t repeated = 0;
    int have = 0;
    for (; have < 8; have += bits)
        repeated = (repeated << bits) | value;
    const uint32_t channel = repeated >> (have - 8);
    return (channel >> (8 - std::popcount(to))) << std::countr_zero(to);
}

} // namespace

// The code is the truth table: bit 3 - (2 * s + d) is the result for bits s and d.
uint32_t combined(uint32_t rop, uint32_t s, uint32_t d) {
    const auto where = [&](uint32_t bit, uint32_t bits) {
        return (rop >> bit & 1) != 0 ? bits : 0;
    };
    return rop > 15 ? d : where(3, ~s & ~d) | where(2, ~s & d) | where(1, s & ~d) | where(0, s & d);
}

uint32_t blended(uint32_t src, uint32_t dst) {
    uint32_t result = dst & 0xFF000000;
    for (int shift = 0; shift < 24; shift += 8) {
        const uint32_t shown = (dst >> shift & 0xFF) * (255 - (src >> 24)) / 255;
        result |= std::min((src >> shift & 0xFF) + shown, 255u) << shift;
    }
    return result;
}

uint32_t converted(uint32_t pixel, int32_t srcDepth, int32_t dstDepth) {
    const Format &src = formatAt(srcDepth), &dst = formatAt(dstDepth);
    const uint32_t color = moved(pixel, src.red, dst.red) | moved(pixel, src.green, dst.green) |
                           moved(pixel, src.blue, dst.blue);
    return color | (src.alpha == 0 ? dst.alpha : pixel & dst.alpha);
}

uint32_t convertedAlone(uint32_t pixel, int32_t srcDepth, int32_t dstDepth) {
    // A 24-bit pixel in a word is taken for a 32-bit one: its top byte goes along.
    const bool areWords = std::min(srcDepth, dstDepth) >= 24;
    if (srcDepth == dstDepth || areWords)
        return pixel;
    return converted(pixel, srcDepth, dstDepth) & 0x00FFFFFF;
}

} // namespace quillon::reference
