// Images with random pixels, and a plain reading of their colours.
#pragma once

#include "support/fence.h"
#include "support/random.h"

#include <gtest/gtest.h>
#include <quillon/imageUtil.h>

namespace quillon::test {

struct Format {
    uint32_t depth, bpp;
};

inline constexpr Format kFormats[] = {{8, 8}, {15, 16}, {16, 16}, {24, 24}, {24, 32}};

// An image with a block of exactly the size that its record tells.
struct TestImage {
    TestImage(Random &random, Format format, uint32_t width, uint32_t height, uint32_t padding = 0)
        : pixels(size_t{height} * (width * format.bpp / 8 + padding)) {
        random.fill(&info, sizeof info); // flags without a meaning, too
        info.width = width;
        info.height = height;
        info.depth = format.depth;
        info.bpp = format.bpp;
        info.bytesPerLine = width * format.bpp / 8 + padding;
        info.numColors = format.bpp == 8 ? 256 : 0;
        random.fill(pixels.data(), pixels.size());
        info.data = pixels.data();
    }

    ImageInfo info;
    FencedBuffer pixels;
};

struct Color {
    uint8_t blue, green, red, alpha;
    friend bool operator==(const Color &, const Color &) = default;
};

// A pixel by its row in memory; alpha 255 where there is none.
inline Color colorAt(const ImageInfo &image, uint32_t x, uint32_t row) {
    const uint8_t *const p =
        image.data + size_t{row} * image.bytesPerLine + size_t{x} * (image.bpp / 8);
    if (image.bpp == 8) {
        const ImageUtilColor &entry = image.palette[*p];
        return {entry.blue, entry.green, entry.red, 255};
    }
    if (image.bpp != 16) {
        return {p[0], p[1], p[2], image.bpp == 32 ? p[3] : uint8_t{255}};
    }
    // The top bits of a channel are repeated below it.
    const auto widen = [word = p[0] | uint32_t{p[1]} << 8](uint32_t shift, uint32_t bits) {
        const uint32_t value = word >> shift & ((1u << bits) - 1);
        return static_cast<uint8_t>(value << (8 - bits) | value >> (2 * bits - 8));
    };
    const uint32_t greenBits = image.depth - 10;
    return {widen(0, 5), widen(5, greenBits), widen(5 + greenBits, 5), 255};
}

// The same by the row of the picture, from its top.
inline Color pictureColorAt(const ImageInfo &image, uint32_t x, uint32_t y) {
    const bool isReversed = (image.flags & IMAGEUTIL_FLAG_BOTTOM_UP) != 0;
    return colorAt(image, x, isReversed ? image.height - 1 - y : y);
}

// Holds the rows, from the first of the picture to the last, to colorOf(x, y).
template <class ColorOf>
void expectColors(const ImageInfo &image, bool isBottomUp, const ColorOf &colorOf) {
    for (uint32_t y = 0; y < image.height; ++y)
        for (uint32_t x = 0; x < image.width; ++x) {
            Color expected = colorOf(x, y);
            if (image.bpp != 32)
                expected.alpha = 255;
            ASSERT_EQ(colorAt(image, x, isBottomUp ? image.height - 1 - y : y), expected)
                << "pixel " << x << ", " << y;
        }
}

} // namespace quillon::test
