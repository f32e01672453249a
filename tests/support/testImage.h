// Images with random pixels, and a plain reading of their colours.
#pragma once

#include "imageUtil.h"
#include "support/random.h"

#include <vector>

namespace quillon::test {

struct Format {
    uint32 depth;
    uint32 bpp;
};

inline constexpr Format kFormats[] = {{8, 8}, {15, 16}, {16, 16}, {24, 24}, {24, 32}};

// An image with a block of exactly the size that its record tells.
struct TestImage {
    ImageInfo info = {};
    std::vector<uint8> pixels;

    TestImage() = default;
    TestImage(Random &random, Format format, uint32 width, uint32 height, uint32 padding = 0) {
        info.width = width;
        info.height = height;
        info.depth = format.depth;
        info.bpp = format.bpp;
        info.bytesPerLine = width * format.bpp / 8 + padding;
        info.flags = 0xFFFFFFFEu; // bits without a meaning
        if (format.bpp == 8) {
            info.numColors = 256;
            random.fill(info.palette, sizeof info.palette);
            for (ImageUtilColor &color : info.palette) {
                color.reserved = 0;
            }
        }
        pixels.resize(size_t{height} * info.bytesPerLine);
        random.fill(pixels.data(), pixels.size());
        info.data = pixels.data();
    }
    TestImage(const TestImage &) = delete;
    TestImage &operator=(const TestImage &) = delete;
};

struct Color {
    uint8 blue, green, red, alpha;

    friend bool operator==(const Color &, const Color &) = default;
};

// A channel of some bits, its top bits repeated below them.
inline uint8 widen(uint32 value, uint32 bits) {
    return static_cast<uint8>(value << (8 - bits) | value >> (2 * bits - 8));
}

// The colour of a pixel by its row in memory; alpha 255 where there is none.
inline Color colorAt(const ImageInfo &image, uint32 x, uint32 row) {
    const uint8 *const pixel =
        image.data + size_t{row} * image.bytesPerLine + size_t{x} * (image.bpp / 8);
    if (image.bpp == 8) {
        const ImageUtilColor &entry = image.palette[*pixel];
        return {entry.blue, entry.green, entry.red, 255};
    }
    if (image.bpp == 16) {
        const uint32 word = pixel[0] | uint32{pixel[1]} << 8;
        const uint32 greenBits = image.depth - 10;
        return {widen(word & 31, 5), widen(word >> 5 & ((1u << greenBits) - 1), greenBits),
                widen(word >> (5 + greenBits) & 31, 5), 255};
    }
    return {pixel[0], pixel[1], pixel[2], image.bpp == 32 ? pixel[3] : uint8{255}};
}

// The same by the row of the picture, from its top.
inline Color pictureColorAt(const ImageInfo &image, uint32 x, uint32 y) {
    const bool isReversed = (image.flags & IMAGEUTIL_FLAG_BOTTOM_UP) != 0;
    return colorAt(image, x, isReversed ? image.height - 1 - y : y);
}

} // namespace quillon::test
