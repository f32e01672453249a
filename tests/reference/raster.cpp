#include "reference/raster.h"

#include "reference/pixels.h"

#include <algorithm>
#include <bit>
#include <cstdlib>
#include <utility>
#include <vector>

namespace quillon::reference {
namespace {

// --- Layouts and colours

struct Layout {
    int32 depth;
    int32 bytes;
    uint32 red, green, blue, alpha; // masks
};

const Layout &layoutOf(int32 depth) {
    static const Layout layouts[] = {
        {3, 1, 0x04, 0x20, 0x80, 0},
        {6, 1, 0x30, 0x0C, 0x03, 0},
        {8, 1, 0x07, 0x38, 0xC0, 0},
        {15, 2, 0x7C00, 0x03E0, 0x001F, 0},
        {16, 2, 0xF800, 0x07E0, 0x001F, 0},
        {24, 3, 0xFF0000, 0x00FF00, 0x0000FF, 0},
        {32, 4, 0xFF0000, 0x00FF00, 0x0000FF, 0xFF000000},
    };
    for (const Layout &layout : layouts)
        if (layout.depth == depth)
            return layout;
    std::abort(); // the test asks for what there is not
}

// Channels of 8 bits.
struct Color {
    uint32 red, green, blue, alpha;
};

// The channel under a mask, widened to 8 bits by repeating its bits.
uint32 widened(uint32 pixel, uint32 mask) {
    const int bits = std::popcount(mask);
    const uint32 value = (pixel & mask) >> std::countr_zero(mask);
    uint32 repeated = 0;
    int have = 0;
    for (; have < 8; have += bits)
        repeated = (repeated << bits) | value;
    return repeated >> (have - 8);
}

// The top bits of an 8-bit channel, put under a mask.
uint32 narrowed(uint32 channel, uint32 mask) {
    if (mask == 0)
        return 0;
    return (channel >> (8 - std::popcount(mask))) << std::countr_zero(mask);
}

Color colorOf(uint32 pixel, const Layout &layout, uint32 alphaWhereNone) {
    return {widened(pixel, layout.red), widened(pixel, layout.green), widened(pixel, layout.blue),
            layout.alpha != 0 ? widened(pixel, layout.alpha) : alphaWhereNone};
}

uint32 pixelOf(const Color &color, const Layout &layout) {
    return narrowed(color.red, layout.red) | narrowed(color.green, layout.green) |
           narrowed(color.blue, layout.blue) | narrowed(color.alpha, layout.alpha);
}

} // namespace

// --- Fill, copy, alpha

void rectFill(uint8 *frameBuffer, int32 lineIncrement, int32 bytesPerPixel, uint32 pixel, uint32 x,
              uint32 y, uint32 width, uint32 height) {
    uint8 *first = pixelAt(frameBuffer, lineIncrement, bytesPerPixel, x, y);
    const int64_t step = wholePixelLine(lineIncrement, bytesPerPixel);
    for (uint64_t row = 0; row < height; ++row)
        for (uint64_t column = 0; column < width; ++column)
            store(pixelAt(first, step, bytesPerPixel, column, row), bytesPerPixel, pixel);
}

void rectCopy(uint8 *dstBuffer, int64_t dstLineIncrement, const uint8 *srcBuffer,
              int64_t srcLineIncrement, int32 bytesPerPixel, uint32 srcX, uint32 srcY, uint32 dstX,
              uint32 dstY, uint32 width, uint32 height) {
    if (bytesPerPixel <= 0 || width == 0 || height == 0)
        return;
    const size_t rowBytes = size_t{width} * static_cast<size_t>(bytesPerPixel);
    const auto srcRow = [&](uint64_t row) {
        return pixelAt(srcBuffer, srcLineIncrement, bytesPerPixel, srcX, srcY + row);
    };
    const auto dstRow = [&](uint64_t row) {
        return pixelAt(dstBuffer, dstLineIncrement, bytesPerPixel, dstX, dstY + row);
    };

    // With a negative line increment the last row is the lowest in memory.
    const uint64_t last = uint64_t{height} - 1;
    const auto [srcLow, srcHigh] = std::minmax({srcRow(0), srcRow(last)});
    const auto [dstLow, dstHigh] = std::minmax({dstRow(0), dstRow(last)});
    const bool overlap = srcLow < dstHigh + rowBytes && dstLow < srcHigh + rowBytes;
    const bool fromLastRow = overlap && srcY < dstY;

    for (uint64_t i = 0; i < height; ++i) {
        const uint64_t row = fromLastRow ? last - i : i;
        const std::vector<uint8> bytes(srcRow(row), srcRow(row) + rowBytes);
        std::copy(bytes.begin(), bytes.end(), dstRow(row));
    }
}

void rectFillAlpha(uint8 *frameBuffer, int32 lineIncrement, uint8 alpha, uint32 x, uint32 y,
                   uint32 width, uint32 height) {
    for (uint64_t row = 0; row < height; ++row)
        for (uint64_t column = 0; column < width; ++column)
            pixelAt(frameBuffer, lineIncrement, 4, x + column, y + row)[3] = alpha;
}

void alphaBlendOver(uint8 *dstBuffer, uint32 dstX, uint32 dstY, int32 dstLineIncrement,
                    const uint8 *srcBuffer, uint32 srcX, uint32 srcY, int32 srcLineIncrement,
                    uint32 width, uint32 height) {
    for (uint64_t row = 0; row < height; ++row)
        for (uint64_t column = 0; column < width; ++column) {
            uint8 *dst = pixelAt(dstBuffer, dstLineIncrement, 4, dstX + column, dstY + row);
            const uint8 *src = pixelAt(srcBuffer, srcLineIncrement, 4, srcX + column, srcY + row);
            // Read whole: the store to dst may change src where they overlap.
            const uint32 source[] = {src[0], src[1], src[2]};
            const uint32 below[] = {dst[0], dst[1], dst[2]};
            const uint32 inverse = 255u - src[3];
            for (int c = 0; c < 3; ++c)
                dst[c] = static_cast<uint8>(std::min(255u, source[c] + below[c] * inverse / 255));
        }
}

// --- Conversion

uint32 convertOnePixel(uint32 pixel, int32 srcDepth, int32 dstDepth) {
    // A 24-bit pixel in a word is taken for a 32-bit one: its top byte goes along.
    const bool isWord = srcDepth == 24 || srcDepth == 32;
    const bool toWord = dstDepth == 24 || dstDepth == 32;
    if (srcDepth == dstDepth || (isWord && toWord))
        return pixel;
    return pixelOf(colorOf(pixel, layoutOf(srcDepth), 0), layoutOf(dstDepth));
}

void convertPixels(uint8 *dstBuffer, uint32 dstLineIncrement, int32 dstDepth,
                   const uint8 *srcBuffer, uint32 srcLineIncrement, int32 srcDepth,
                   bool pseudoColor, const uint32 *palette, uint32 srcX, uint32 srcY, uint32 dstX,
                   uint32 dstY, uint32 width, uint32 height) {
    const Layout &dstLayout = layoutOf(dstDepth);
    const Layout &srcLayout = layoutOf(pseudoColor ? 32 : srcDepth); // of a palette's entries
    const int32 srcBytes = pseudoColor ? 1 : srcLayout.bytes;
    if (!pseudoColor && srcDepth == dstDepth)
        return rectCopy(dstBuffer, dstLineIncrement, srcBuffer, srcLineIncrement, srcBytes, srcX,
                        srcY, dstX, dstY, width, height);

    const bool isExact = pseudoColor && dstDepth == 32;
    const int64_t dstLine =
        isExact ? dstLineIncrement : wholePixelLine(dstLineIncrement, dstLayout.bytes);
    const int64_t srcLine = wholePixelLine(srcLineIncrement, srcBytes);
    for (uint64_t row = 0; row < height; ++row)
        for (uint64_t column = 0; column < width; ++column) {
            const uint8 *src = pixelAt(srcBuffer, srcLine, srcBytes, srcX + column, srcY + row);
            uint8 *dst = pixelAt(dstBuffer, dstLine, dstLayout.bytes, dstX + column, dstY + row);
            const uint32 pixel = pseudoColor ? palette[*src] : load(src, srcBytes);
            store(dst, dstLayout.bytes, pixelOf(colorOf(pixel, srcLayout, 255), dstLayout));
        }
}

} // namespace quillon::reference
