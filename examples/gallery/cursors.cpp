// Mouse cursors, with masks and with alpha.
#include "rooms.h"
#include "sheet.h"

#include <algorithm>
#include <array>
#include <cstdlib>
#include <memory>
#include <string_view>
#include <vector>

namespace gallery {

namespace {

// '#' is black, '.' white, 'x' inverts, and a space leaves the screen alone.
constexpr std::string_view kArrow[] = {
    "#           ", "##          ", "#.#         ", "#..#        ", "#...#       ", "#....#      ",
    "#.....#     ", "#......#    ", "#.......#   ", "#........#  ", "#.....##### ", "#..#..#     ",
    "#.# #..#    ", "##  #..#    ", "#    #..#   ", "     #..#   ", "      ##    "};
constexpr std::string_view kBeam[] = {"xxxx xxxx", "    x    ", "    x    ", "    x    ",
                                      "    x    ", "    x    ", "    x    ", "    x    ",
                                      "    x    ", "    x    ", "    x    ", "    x    ",
                                      "    x    ", "    x    ", "    x    ", "xxxx xxxx"};

// A cursor together with the pixels its record points to.
struct Cursor {
    RasterCursor record = {};
    std::vector<uint8_t> images;
};

// From its two planes of one bit a pixel, as a host would hand it over.
template <size_t height>
Cursor maskCursor(const std::string_view (&rows)[height], uint32_t hotspot) {
    const auto width = static_cast<uint32_t>(rows[0].size());
    const uint32_t planeSize = Raster_CalculateCursorSize(width, height, 1);
    const size_t step = planeSize / height;
    std::vector<uint8_t> andPlane(planeSize), xorPlane(planeSize);
    for (size_t y = 0; y < height; ++y)
        for (size_t x = 0; x < width; ++x) {
            const char c = rows[y][x];
            const auto bit = static_cast<uint8_t>(0x80 >> x % 8);
            const size_t at = y * step + x / 8;
            andPlane[at] |= c == ' ' || c == 'x' ? bit : uint8_t{0};
            xorPlane[at] |= c == '.' || c == 'x' ? bit : uint8_t{0};
        }

    const uint32_t imageSize = Raster_CalculateCursorSize(width, height, 32);
    Cursor cursor;
    cursor.images.resize(size_t{imageSize} * 2);
    //! [cursorPlanes]
    Raster_ExpandPlanarCursorData(width, height, 1, andPlane.data(), 1, xorPlane.data(), 32,
                                  cursor.images.data(), imageSize * 2);
    RasterCursor &record = cursor.record;
    record.type = RASTER_CURSOR_ANDXOR;
    record.hotspotX = record.hotspotY = hotspot;
    record.width = width;
    record.height = height;
    record.andImage = cursor.images.data();
    record.xorImage = record.andImage + imageSize;
    //! [cursorPlanes]
    return cursor;
}

// The picture must outlive the record.
RasterCursor alphaCursor(const Picture &image) {
    RasterCursor record = {};
    record.type = RASTER_CURSOR_ALPHA;
    record.hotspotX = image.info().width / 2;
    record.hotspotY = image.info().height / 2;
    record.width = image.info().width;
    record.height = image.info().height;
    record.alphaImage = image.data();
    return record;
}

void draw(Picture &screen, const RasterCursor &cursor, int32_t x, int32_t y) {
    //! [cursorDraw]
    const RasterCursorScreen size = {screen.info().width, screen.info().height};
    RasterCursorBox box;
    if (Raster_ComputeCursorBox(&size, &cursor, x, y, &box))
        Raster_DrawCursor(screen.data(), screen.step(), nullptr, 0, &cursor, &box);
    //! [cursorDraw]
}

void drawScaled(Picture &screen, const RasterCursor &cursor, int32_t x, int32_t y, double scale) {
    //! [cursorScale]
    const std::unique_ptr<RasterCursor, void (*)(RasterCursor *)> large(
        Raster_ScaleCursor(&cursor, scale, scale), [](RasterCursor *scaled) {
            if (!scaled)
                return;
            if (scaled->type == RASTER_CURSOR_ALPHA) {
                std::free(scaled->alphaImage);
            } else {
                std::free(scaled->andImage);
                std::free(scaled->xorImage);
            }
            std::free(scaled);
        });
    if (!large)
        fail("no memory");
    draw(screen, *large, x, y);
    //! [cursorScale]
}

} // namespace

void showCursors(Page &page, const Material &material) {
    page.room("Cursors", "Two masks, or one image with alpha, drawn where the pointer is.");
    const Cursor arrow = maskCursor(kArrow, 0);
    const Cursor beam = maskCursor(kBeam, 4);
    const Picture marble = resized(material.sprite, 32, 32);
    const RasterCursor ball = alphaCursor(marble);

    const Picture screen = covering(material.photo, 86, 57);
    std::array<Picture, 4> screens;
    std::generate(screens.begin(), screens.end(), [&screen] { return copyOf(screen); });
    for (const int32_t x : {10, 36, 62})
        draw(screens[0], arrow.record, x, 18);
    fill(screens[1], area(13, 14, 30, 30), kInk);
    fill(screens[1], area(43, 14, 30, 30), kWhite);
    for (const int32_t x : {5, 24, 43, 62, 81})
        draw(screens[1], beam.record, x, 24);
    draw(screens[2], ball, 26, 30);
    draw(screens[2], ball, 60, 30);
    for (const int32_t x : {0, 43, 85})
        for (const int32_t y : {0, 28, 56})
            if (x != 43 || y != 28)
                draw(screens[3], ball, x, y);

    Sheet sheet(2);
    const char *labels[] = {"masks: black, white, clear", "masks: inverting", "alpha",
                            "cut at the edges of the screen"};
    for (size_t i = 0; i < screens.size(); ++i)
        sheet.add(zoomed(screens[i], 4), labels[i]);
    page.show(sheet,
              {"cursors",
               "Three arrows on a landscape; text cursors that invert what is under them; two "
               "marbles with soft shadows; marbles cut off at all edges of a screen.",
               "`Raster_ExpandPlanarCursorData` makes masks of planes of one bit a pixel, "
               "`Raster_ComputeCursorBox` cuts a cursor to the screen, `Raster_DrawCursor` draws "
               "it. Pixels are shown four times their size.",
               {"cursorPlanes", "cursorDraw"}});

    Sheet scaled(2);
    const auto addScaled = [&](bool alpha, std::initializer_list<double> scales,
                               const std::string &label) {
        Picture wide = covering(material.photo, 344, 170);
        int32_t x = 28;
        for (const double scale : scales) {
            const int32_t half = static_cast<int32_t>(16 * scale);
            drawScaled(wide, alpha ? ball : arrow.record, x + (alpha ? half : 0), alpha ? 84 : 48,
                       scale);
            x += half * 2 + 32;
        }
        scaled.add(std::move(wide), label);
    };
    addScaled(false, {0.5, 1, 2, 3}, "masks: 0.5, 1, 2 and 3 times, nearest");
    addScaled(false, {6}, "masks: 6 times");
    addScaled(true, {0.5, 1, 2, 3}, "alpha: 0.5, 1, 2 and 3 times, filtered");
    addScaled(true, {5}, "alpha: 5 times");
    page.show(scaled,
              {"cursors-scaled",
               "Arrows of several sizes, whose pixels can be seen, and marbles, which are smooth.",
               "`Raster_ScaleCursor`: a mask knows no half tones and shows its pixels, an image "
               "with alpha stays smooth.",
               {"cursorScale"}});
}

} // namespace gallery
