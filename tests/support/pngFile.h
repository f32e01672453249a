// PNG files made and taken apart with libpng alone.
#pragma once

#include "quillonTypes.h"
#include "support/random.h"

#include <png.h>

#include <vector>

namespace quillon::test {

// A PNG as it is stored: no transformation has touched the samples.
struct PngPicture {
    uint32 width = 0, height = 0;
    int colorType = PNG_COLOR_TYPE_RGB;
    int bitDepth = 8;
    bool interlaced = false;
    bool hasTransparency = false;   // writes a tRNS chunk; not set by decodePng
    std::vector<png_color> palette; // a suggested one in colour types 2 and 6
    std::vector<uint16> samples;    // all channels of a pixel, pixels row by row

    uint32 channels() const;
    const uint16 *pixel(uint32 x, uint32 y) const {
        return &samples[(size_t{y} * width + x) * channels()];
    }
};

PngPicture randomPicture(Random &random, uint32 width, uint32 height, int colorType, int bitDepth,
                         bool interlaced = false);

// Without samples, a file that ends in the first bytes of its pixels.
std::vector<uint8> encodePng(const PngPicture &picture);

// A file that is no valid PNG ends the test program, with libpng's message.
PngPicture decodePng(const void *data, size_t size);

} // namespace quillon::test
