// Pixel layouts: what is left of a picture in each.
#include "rooms.h"
#include "sheet.h"

#include <array>
#include <cstdio>
#include <vector>

namespace gallery {

namespace {

struct Layout {
    int32_t depth, bytes;
    const char *fields;
};
constexpr std::array<Layout, 7> kLayouts = {{{32, 4, "8+8+8 bits, alpha"},
                                             {24, 3, "8+8+8 bits"},
                                             {16, 2, "5+6+5 bits"},
                                             {15, 2, "5+5+5 bits"},
                                             {8, 1, "3+3+2 bits"},
                                             {6, 1, "2+2+2 bits"},
                                             {3, 1, "1+1+1 bits"}}};

// A channel of one of the one-byte layouts, widened to 8 bits: the field is
// repeated from the top down.
uint32_t widened(uint32_t pixel, uint32_t shift, uint32_t bits) {
    const uint32_t field = pixel >> shift & ((1U << bits) - 1);
    uint32_t wide = field;
    for (uint32_t have = bits; have < 8; have += bits)
        wide = wide << bits | field;
    const uint32_t surplus = (8 + bits - 1) / bits * bits - 8;
    return wide >> surplus;
}

// The library converts to the one-byte layouts, not from them.  Taken as indices,
// their pixels come back through a palette of what each byte means.
std::vector<uint32_t> paletteOf(int32_t depth) {
    struct Field {
        uint32_t shift, bits;
    };
    const std::array<Field, 3> rgb = depth == 3   ? std::array<Field, 3>{{{2, 1}, {5, 1}, {7, 1}}}
                                     : depth == 6 ? std::array<Field, 3>{{{4, 2}, {2, 2}, {0, 2}}}
                                                  : std::array<Field, 3>{{{0, 3}, {3, 3}, {6, 2}}};
    std::vector<uint32_t> palette(256);
    for (uint32_t pixel = 0; pixel < palette.size(); ++pixel) {
        palette[pixel] = 0xFF000000;
        for (uint32_t channel = 0; channel < 3; ++channel)
            palette[pixel] |= widened(pixel, rgb[channel].shift, rgb[channel].bits)
                              << (16 - 8 * channel);
    }
    return palette;
}

Picture throughLayout(const Picture &picture, const Layout &layout) {
    const uint32_t width = picture.info().width, height = picture.info().height;
    const uint32_t step = width * static_cast<uint32_t>(layout.bytes);
    //! [convert]
    std::vector<uint8_t> surface(size_t{step} * height);
    Raster_ConvertPixelsFrom32(surface.data(), step, layout.depth, picture.data(),
                               picture.info().bytesPerLine, 0, 0, 0, 0, width, height);
    //! [convert]

    const bool indices = layout.bytes == 1;
    std::vector<uint32_t> palette;
    if (indices)
        palette = paletteOf(layout.depth);
    Picture back = blank(picture.width(), picture.height(), 0);
    Raster_ConvertPixelsTo32(back.data(), back.info().bytesPerLine, surface.data(), step,
                             layout.depth, indices, palette.data(), 0, 0, 0, 0, width, height);
    return back;
}

// The photo above ramps of red, green, blue and grey.
Picture chart(const Picture &photo) {
    constexpr int32_t kWidth = 168, kPhoto = 126, kRamp = 10;
    Picture picture = blank(kWidth, kPhoto + 4 * kRamp, 0);
    paste(picture, covering(photo, kWidth, kPhoto), 0, 0);
    for (int32_t x = 0; x < kWidth; ++x) {
        const auto level = static_cast<uint32_t>(x * 255 / (kWidth - 1));
        int32_t y = kPhoto;
        for (const uint32_t channels : {0x010000U, 0x000100U, 0x000001U, 0x010101U}) {
            fill(picture, area(x, y, 1, kRamp), 0xFF000000 | channels * level);
            y += kRamp;
        }
    }
    return picture;
}

std::string hexOf(uint32_t value, int32_t bytes) {
    // The top byte of 32 bits goes along to 24, where it is not stored.
    value &= 0xFFFFFFFF >> (32 - bytes * 8);
    std::array<char, 16> text{};
    std::snprintf(text.data(), text.size(), "0x%0*X", bytes * 2, value);
    return text.data();
}

} // namespace

void showLayouts(Page &page, const Material &material) {
    page.room("Pixel layouts", "The seven layouts of a pixel, and what is left of a picture that "
                               "has been through each.");
    const Picture original = chart(material.photo);
    Sheet sheet(4);
    sheet.add(copyOf(original), "the picture itself");
    for (const Layout &layout : kLayouts) {
        const uint32_t orange = Raster_ConvertOnePixel(kOrange, 32, layout.depth, false, nullptr);
        sheet.add(throughLayout(original, layout), "depth " + std::to_string(layout.depth) + "\n" +
                                                       layout.fields + "\norange is " +
                                                       hexOf(orange, layout.bytes));
    }
    page.show(sheet,
              {"layouts",
               "A landscape above ramps of red, green, blue and grey, eight times, with ever fewer "
               "colours.",
               "`Raster_ConvertPixelsFrom32`, then `Raster_ConvertPixelsTo32`; the ramps under the "
               "picture count the levels of each channel. There is no way back from one byte a "
               "pixel as such: those bytes serve as indices into a palette of what they mean. The "
               "orange is one pixel, from `Raster_ConvertOnePixel`.",
               {"convert"}});
}

} // namespace gallery
