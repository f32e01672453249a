#include "plainLoops.h"

#include <algorithm>
#include <bit>
#include <cstdlib>
#include <utility>
#include <vector>

namespace quillon::bench::plain {
namespace {

// The first byte of pixel (x, y).  In whole addresses that wrap around: pixel
// (0, 0) may lie outside of memory as long as the rectangle does not.
template <class Byte>
Byte *pixelAt(Byte *buffer, int64_t lineIncrement, int32_t bytesPerPixel, uint64_t x, uint64_t y) {
    return reinterpret_cast<Byte *>(reinterpret_cast<uintptr_t>(buffer) +
                                    y * static_cast<uint64_t>(lineIncrement) +
                                    x * static_cast<uint64_t>(bytesPerPixel));
}

inline uint32_t load(const uint8_t *address, int32_t bytes) {
    uint32_t pixel = 0;
    for (int32_t i = 0; i < bytes; ++i)
        pixel |= uint32_t{address[i]} << (8 * i);
    return pixel;
}

inline void store(uint8_t *address, int32_t bytes, uint32_t pixel) {
    for (int32_t i = 0; i < bytes; ++i)
        address[i] = static_cast<uint8_t>(pixel >> (8 * i));
}

// A line increment in whole pixels, rounded down, where pixels are units of 2 or
// 4 bytes; as it is where they are bytes.
inline int64_t wholePixelLine(int64_t lineIncrement, int32_t bytes) {
    if (bytes != 2 && bytes != 4)
        return lineIncrement;
    const int64_t rest = ((lineIncrement % bytes) + bytes) % bytes; // 0 to bytes - 1
    return lineIncrement - rest;
}

// --- Layouts and colours

struct Layout {
    int32_t depth;
    int32_t bytes;
    uint32_t red, green, blue, alpha; // masks
};

const Layout &layoutOf(int32_t depth) {
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
    uint32_t red, green, blue, alpha;
};

// The channel under a mask, widened to 8 bits by repeating its bits.
uint32_t widened(uint32_t pixel, uint32_t mask) {
    const int bits = std::popcount(mask);
    const uint32_t value = (pixel & mask) >> std::countr_zero(mask);
    uint32_t repeated = 0;
    int have = 0;
    for (; have < 8; have += bits)
        repeated = (repeated << bits) | value;
    return repeated >> (have - 8);
}

// The top bits of an 8-bit channel, put under a mask.
uint32_t narrowed(uint32_t channel, uint32_t mask) {
    if (mask == 0)
        return 0;
    return (channel >> (8 - std::popcount(mask))) << std::countr_zero(mask);
}

Color colorOf(uint32_t pixel, const Layout &layout, uint32_t alphaWhereNone) {
    return {widened(pixel, layout.red), widened(pixel, layout.green), widened(pixel, layout.blue),
            layout.alpha != 0 ? widened(pixel, layout.alpha) : alphaWhereNone};
}

uint32_t pixelOf(const Color &color, const Layout &layout) {
    return narrowed(color.red, layout.red) | narrowed(color.green, layout.green) |
           narrowed(color.blue, layout.blue) | narrowed(color.alpha, layout.alpha);
}

// --- Raster operations

constexpr uint32_t kCopy = 3, kNoop = 5, kLast = 15;

// Each bit of the code says what becomes of one pair of operand bits.
uint32_t combined(uint32_t rop, uint32_t s, uint32_t d) {
    uint32_t result = 0;
    if ((rop & 8) != 0)
        result |= ~s & ~d;
    if ((rop & 4) != 0)
        result |= ~s & d;
    if ((rop & 2) != 0)
        result |= s & ~d;
    if ((rop & 1) != 0)
        result |= s & d;
    return result;
}

// --- Bits

bool isSet(const uint8_t *rowBits, int32_t column) {
    return ((rowBits[column / 8] >> (7 - column % 8)) & 1) != 0;
}

// Calls paint(address, set) for every pixel.
template <class Paint>
void forEachBit(const uint8_t *srcBits, int32_t srcLineIncrement, uint8_t *dstBuffer,
                int32_t dstLineIncrement, int32_t bytesPerPixel, int32_t width, uint32_t height,
                const Paint &paint) {
    for (int64_t row = 0; row < height; ++row)
        for (int32_t column = 0; column < width; ++column)
            paint(dstBuffer + row * dstLineIncrement + int64_t{column} * bytesPerPixel,
                  isSet(srcBits + row * srcLineIncrement, column));
}

} // namespace

// --- Fill, copy, alpha

void rectFill(uint8_t *frameBuffer, int32_t lineIncrement, int32_t bytesPerPixel, uint32_t pixel, uint32_t x,
              uint32_t y, uint32_t width, uint32_t height) {
    uint8_t *first = pixelAt(frameBuffer, lineIncrement, bytesPerPixel, x, y);
    const int64_t step = wholePixelLine(lineIncrement, bytesPerPixel);
    for (uint64_t row = 0; row < height; ++row)
        for (uint64_t column = 0; column < width; ++column)
            store(pixelAt(first, step, bytesPerPixel, column, row), bytesPerPixel, pixel);
}

void rectCopy(uint8_t *dstBuffer, int64_t dstLineIncrement, const uint8_t *srcBuffer,
              int64_t srcLineIncrement, int32_t bytesPerPixel, uint32_t srcX, uint32_t srcY, uint32_t dstX,
              uint32_t dstY, uint32_t width, uint32_t height) {
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
        const std::vector<uint8_t> bytes(srcRow(row), srcRow(row) + rowBytes);
        std::copy(bytes.begin(), bytes.end(), dstRow(row));
    }
}

void rectFillAlpha(uint8_t *frameBuffer, int32_t lineIncrement, uint8_t alpha, uint32_t x, uint32_t y,
                   uint32_t width, uint32_t height) {
    for (uint64_t row = 0; row < height; ++row)
        for (uint64_t column = 0; column < width; ++column)
            pixelAt(frameBuffer, lineIncrement, 4, x + column, y + row)[3] = alpha;
}

void alphaBlendOver(uint8_t *dstBuffer, uint32_t dstX, uint32_t dstY, int32_t dstLineIncrement,
                    const uint8_t *srcBuffer, uint32_t srcX, uint32_t srcY, int32_t srcLineIncrement,
                    uint32_t width, uint32_t height) {
    for (uint64_t row = 0; row < height; ++row)
        for (uint64_t column = 0; column < width; ++column) {
            uint8_t *dst = pixelAt(dstBuffer, dstLineIncrement, 4, dstX + column, dstY + row);
            const uint8_t *src = pixelAt(srcBuffer, srcLineIncrement, 4, srcX + column, srcY + row);
            // Read whole: the store to dst may change src where they overlap.
            const uint32_t source[] = {src[0], src[1], src[2]};
            const uint32_t below[] = {dst[0], dst[1], dst[2]};
            const uint32_t inverse = 255u - src[3];
            for (int c = 0; c < 3; ++c)
                dst[c] = static_cast<uint8_t>(std::min(255u, source[c] + below[c] * inverse / 255));
        }
}

// --- Conversion

void convertPixels(uint8_t *dstBuffer, uint32_t dstLineIncrement, int32_t dstDepth,
                   const uint8_t *srcBuffer, uint32_t srcLineIncrement, int32_t srcDepth,
                   bool pseudoColor, const uint32_t *palette, uint32_t srcX, uint32_t srcY, uint32_t dstX,
                   uint32_t dstY, uint32_t width, uint32_t height) {
    const Layout &dstLayout = layoutOf(dstDepth);
    const Layout &srcLayout = layoutOf(pseudoColor ? 32 : srcDepth); // of a palette's entries
    const int32_t srcBytes = pseudoColor ? 1 : srcLayout.bytes;
    if (!pseudoColor && srcDepth == dstDepth)
        return rectCopy(dstBuffer, dstLineIncrement, srcBuffer, srcLineIncrement, srcBytes, srcX,
                        srcY, dstX, dstY, width, height);

    const bool isExact = pseudoColor && dstDepth == 32;
    const int64_t dstLine =
        isExact ? dstLineIncrement : wholePixelLine(dstLineIncrement, dstLayout.bytes);
    const int64_t srcLine = wholePixelLine(srcLineIncrement, srcBytes);
    for (uint64_t row = 0; row < height; ++row)
        for (uint64_t column = 0; column < width; ++column) {
            const uint8_t *src = pixelAt(srcBuffer, srcLine, srcBytes, srcX + column, srcY + row);
            uint8_t *dst = pixelAt(dstBuffer, dstLine, dstLayout.bytes, dstX + column, dstY + row);
            const uint32_t pixel = pseudoColor ? palette[*src] : load(src, srcBytes);
            store(dst, dstLayout.bytes, pixelOf(colorOf(pixel, srcLayout, 255), dstLayout));
        }
}

// --- Raster operations

void rectRopFill(uint8_t *frameBuffer, int32_t lineIncrement, int32_t bytesPerPixel, uint32_t pixel,
                 uint32_t rop, uint32_t x, uint32_t y, uint32_t width, uint32_t height) {
    if (rop == kNoop || rop > kLast)
        return;
    uint8_t *first = pixelAt(frameBuffer, lineIncrement, bytesPerPixel, x, y);
    const int64_t step = wholePixelLine(lineIncrement, bytesPerPixel);
    for (uint64_t row = 0; row < height; ++row)
        for (uint64_t column = 0; column < width; ++column) {
            uint8_t *dst = pixelAt(first, step, bytesPerPixel, column, row);
            store(dst, bytesPerPixel, combined(rop, pixel, load(dst, bytesPerPixel)));
        }
}

void rectRopCopy(uint8_t *dstBuffer, int32_t dstLineIncrement, const uint8_t *srcBuffer,
                 int32_t srcLineIncrement, int32_t bytesPerPixel, uint32_t srcX, uint32_t srcY, uint32_t rop,
                 uint32_t dstX, uint32_t dstY, uint32_t width, uint32_t height) {
    if (rop == kCopy)
        return rectCopy(dstBuffer, dstLineIncrement, srcBuffer, srcLineIncrement, bytesPerPixel,
                        srcX, srcY, dstX, dstY, width, height);
    if (rop == kNoop || rop > kLast || width == 0 || height == 0)
        return;

    const bool upwards = srcY < dstY;
    const bool leftwards = srcY == dstY && dstX > srcX;
    const uint64_t firstRow = upwards ? uint64_t{height} - 1 : 0;
    const uint64_t firstColumn = leftwards ? uint64_t{width} - 1 : 0;
    const auto stepOf = [&](int64_t line) {
        return wholePixelLine(upwards ? -line : line, bytesPerPixel);
    };
    const int32_t pixelStep = leftwards ? -bytesPerPixel : bytesPerPixel;
    uint8_t *dstFirst =
        pixelAt(dstBuffer, dstLineIncrement, bytesPerPixel, dstX + firstColumn, dstY + firstRow);
    const uint8_t *srcFirst =
        pixelAt(srcBuffer, srcLineIncrement, bytesPerPixel, srcX + firstColumn, srcY + firstRow);

    for (uint64_t row = 0; row < height; ++row)
        for (uint64_t column = 0; column < width; ++column) {
            uint8_t *dst = pixelAt(dstFirst, stepOf(dstLineIncrement), pixelStep, column, row);
            const uint8_t *src = pixelAt(srcFirst, stepOf(srcLineIncrement), pixelStep, column, row);
            if (bytesPerPixel != 3) {
                store(dst, bytesPerPixel,
                      combined(rop, load(src, bytesPerPixel), load(dst, bytesPerPixel)));
                continue;
            }
            for (int i = 0; i < 3; ++i) { // one byte is stored before the next is read
                const int at = leftwards ? 2 - i : i;
                dst[at] = static_cast<uint8_t>(combined(rop, src[at], dst[at]));
            }
        }
}

// --- Bits

void bitsToPixels(const uint8_t *srcBits, int32_t srcLineIncrement, uint8_t *dstBuffer,
                  int32_t dstLineIncrement, int32_t bytesPerPixel, int32_t width, uint32_t height,
                  uint32_t foreground, uint32_t background) {
    forEachBit(srcBits, srcLineIncrement, dstBuffer, dstLineIncrement, bytesPerPixel, width, height,
               [=](uint8_t *pixel, bool set) {
                   store(pixel, bytesPerPixel, set ? foreground : background);
               });
}

void bitsToPixelsStencil(const uint8_t *srcBits, int32_t srcLineIncrement, uint8_t *dstBuffer,
                         int32_t dstLineIncrement, int32_t bytesPerPixel, int32_t width, uint32_t height,
                         uint32_t pixel) {
    forEachBit(srcBits, srcLineIncrement, dstBuffer, dstLineIncrement, bytesPerPixel, width, height,
               [=](uint8_t *address, bool set) {
                   if (set)
                       store(address, bytesPerPixel, pixel);
               });
}

// --- Colour key

void applyColorKey(const uint8_t *background, uint8_t *dstBuffer, const uint8_t *overlay,
                   const uint8_t *keySurface, int32_t backgroundLineIncrement, int32_t dstLineIncrement,
                   int32_t overlayLineIncrement, int32_t keyLineIncrement, uint32_t key, uint32_t x,
                   uint32_t y, uint32_t width, uint32_t height, uint32_t keyDepth) {
    const int32_t keyBytes = keyDepth == 32 ? 4 : keyDepth == 16 ? 2 : 1;
    const uint32_t compared = keyDepth == 32 ? 0x00FFFFFF : 0xFFFFFFFF;
    for (uint64_t row = 0; row < height; ++row)
        for (uint64_t column = 0; column < width; ++column) {
            const auto at = [&](auto *buffer, int32_t line, int32_t bytes) {
                return pixelAt(buffer, line, bytes, x + column, y + row);
            };
            const uint32_t pixel = load(at(keySurface, keyLineIncrement, keyBytes), keyBytes);
            const uint8_t *taken = (pixel & compared) == (key & compared)
                                     ? pixelAt(overlay, overlayLineIncrement, 4, column, row)
                                     : at(background, backgroundLineIncrement, 4);
            store(at(dstBuffer, dstLineIncrement, 4), 4, load(taken, 4));
        }
}

} // namespace quillon::bench::plain
