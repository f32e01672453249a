// Fills, copies and raster operations.
#include "rooms.h"
#include "sheet.h"

#include <array>
#include <vector>

namespace gallery {

namespace {

constexpr std::array<uint32_t, 8> kRings = {0xFF1B4965, 0xFF2F6690, 0xFF5FA8D3, 0xFFBEE9E8,
                                            0xFFFFF3B0, 0xFFF6BD60, 0xFFE8590C, 0xFF9E2A2B};

// Squares within squares, filled in pixels of the given layout; depth 8 stands
// for indices into kRings.
Picture filledRings(int32_t depth) {
    constexpr int32_t kSize = 160, kRing = 10;
    const bool indices = depth == 8;
    const int32_t bytes = (depth + 7) / 8, step = kSize * bytes;
    std::vector<uint8_t> surface(size_t{kSize} * static_cast<size_t>(step));
    //! [fill]
    for (uint32_t ring = 0; ring < kRings.size(); ++ring) {
        const uint32_t colour = kRings[ring];
        const uint32_t pixel =
            indices ? ring : Raster_ConvertOnePixel(colour, 32, depth, false, nullptr);
        const uint32_t inset = ring * kRing;
        Raster_RectFill(surface.data(), step, bytes, pixel, inset, inset, kSize - 2 * inset,
                        kSize - 2 * inset);
    }
    //! [fill]
    Picture shown = blank(kSize, kSize, 0);
    Raster_ConvertPixelsTo32(shown.data(), shown.info().bytesPerLine, surface.data(), natural(step),
                             depth, indices, kRings.data(), 0, 0, 0, 0, kSize, kSize);
    return shown;
}

struct Operation {
    const char *name, *formula;
};
constexpr std::array<Operation, 16> kOperations = {{{"CLEAR", "0"},
                                                    {"AND", "S & D"},
                                                    {"AND_REVERSE", "S & ~D"},
                                                    {"COPY", "S"},
                                                    {"AND_INVERTED", "~S & D"},
                                                    {"NOOP", "D"},
                                                    {"XOR", "S ^ D"},
                                                    {"OR", "S | D"},
                                                    {"NOR", "~(S | D)"},
                                                    {"EQUIV", "~(S ^ D)"},
                                                    {"INVERT", "~D"},
                                                    {"OR_REVERSE", "S | ~D"},
                                                    {"COPY_INVERTED", "~S"},
                                                    {"OR_INVERTED", "~S | D"},
                                                    {"NAND", "~(S & D)"},
                                                    {"SET", "1"}}};

std::string labelOf(uint32_t rop) {
    return std::to_string(rop) + " " + kOperations[rop].name + "\n   " + kOperations[rop].formula;
}

constexpr int32_t kTileWidth = 168, kTileHeight = 112;

Picture againstConstant(uint32_t rop) {
    constexpr std::array<uint32_t, 4> kStripes = {0xFF000000, kBlue, 0xFFBEE9C8, kWhite};
    constexpr int32_t kStripe = kTileWidth / 4, kBarTop = 28, kBar = kTileHeight - 2 * kBarTop;
    Picture picture = blank(kTileWidth, kTileHeight, 0);
    int32_t x = 0;
    for (const uint32_t colour : kStripes) {
        fill(picture, area(x, 0, kStripe, kTileHeight), colour);
        x += kStripe;
    }
    //! [ropFill]
    Raster_RectROPfill(picture.data(), picture.step(), 4, kOrange, rop, 0, kBarTop, kTileWidth,
                       kBar);
    //! [ropFill]
    outline(picture, picture.bounds(), kPale); // or white ends in the page
    return picture;
}

// A disc on a surface of one byte a pixel, row by row.
std::vector<uint8_t> disc(int32_t centreX) {
    constexpr int32_t kRadius = 40, kCentreY = kTileHeight / 2;
    std::vector<uint8_t> surface(size_t{kTileWidth} * kTileHeight);
    for (int32_t y = -kRadius; y <= kRadius; ++y) {
        int32_t half = 0;
        while ((half + 1) * (half + 1) + y * y <= kRadius * kRadius)
            ++half;
        Raster_RectFill(surface.data(), kTileWidth, 1, 0xFF, natural(centreX - half),
                        natural(kCentreY + y), natural(2 * half + 1), 1);
    }
    return surface;
}

Picture betweenDiscs(uint32_t rop) {
    //! [ropCopy]
    const std::vector<uint8_t> source = disc(62);
    std::vector<uint8_t> surface = disc(106);
    Raster_RectROPcopy(surface.data(), kTileWidth, source.data(), kTileWidth, 1, 0, 0, rop, 0, 0,
                       kTileWidth, kTileHeight);
    //! [ropCopy]
    std::vector<uint32_t> palette(256);
    palette[0x00] = kPale;
    palette[0xFF] = kBlue;
    Picture shown = blank(kTileWidth, kTileHeight, 0);
    Raster_ConvertIndexTo32(shown.data(), shown.info().bytesPerLine, surface.data(), kTileWidth,
                            palette.data(), 0, 0, 0, 0, kTileWidth, kTileHeight);
    return shown;
}

} // namespace

void showFills(Page &page, const Material &material) {
    page.room("Fills and copies", "Rectangles of one value, and rectangles moved.");

    Sheet fills(4);
    for (const int32_t depth : {8, 16, 24, 32}) {
        const int32_t bytes = depth / 8;
        fills.add(filledRings(depth),
                  std::to_string(bytes) + (bytes == 1 ? " byte a pixel" : " bytes a pixel"));
    }
    page.show(fills,
              {"fill",
               "Eight squares within each other, from blue to red, four times.",
               "`Raster_RectFill`: eight squares, each filled over the last, in pixels of each "
               "size. They look the same, but for shades that 16 bits cannot hold.",
               {"fill"}});

    constexpr int32_t kWidth = 344, kHeight = 228;
    const Rect from = area(150, 66, 150, 110), to = area(90, 30, 150, 110);
    Picture before = covering(material.photo, kWidth, kHeight);
    Picture after = copyOf(before);
    outline(before, from, kOrange, 2);
    //! [copy]
    Raster_RectCopy(after.data(), after.step(), after.data(), after.step(), 4, natural(from.left),
                    natural(from.top), natural(to.left), natural(to.top), 150, 110);
    //! [copy]
    outline(after, to, kOrange, 2);
    Sheet copies(2);
    copies.add(std::move(before), "what is copied");
    copies.add(std::move(after), "where it went");
    page.show(copies,
              {"copy",
               "The middle of a landscape in a frame, and the same part copied further up and to "
               "the left, over its old place.",
               "`Raster_RectCopy` within one surface. The two places overlap, and the copy is "
               "whole all the same: nothing of it repeats.",
               {"copy"}});
}

void showRasterOperations(Page &page) {
    page.room("Raster operations",
              "The sixteen ways to combine a source S with what the destination D holds, bit by "
              "bit. The number of each is its truth table.");
    Sheet constants(4);
    Sheet discs(4);
    for (uint32_t rop = 0; rop < kOperations.size(); ++rop) {
        constants.add(againstConstant(rop), labelOf(rop));
        discs.add(betweenDiscs(rop), labelOf(rop));
    }
    page.show(discs,
              {"rop-surfaces",
               "Sixteen diagrams of two overlapping discs, each with other parts of them dark.",
               "`Raster_RectROPcopy` between two surfaces of one byte a pixel: S is the left disc, "
               "D the right one. Dark is 1, so each tile is the diagram of its formula.",
               {"ropCopy"}});
    page.show(constants,
              {"rop-constant",
               "Sixteen times stripes of black, blue, pale green and white, with a bar across "
               "them whose colours are what the operation makes of each stripe.",
               "`Raster_RectROPfill`: S is an orange, D four stripes, of which black has no bit "
               "set and white every one. The bar across them is combined, the rest left as it "
               "was.",
               {"ropFill"}});
}

} // namespace gallery
