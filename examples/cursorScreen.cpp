// cursorScreen: moves two cursors over a software screen and its edges, and
// writes what the display showed at some stops.
//
//     c++ -std=c++17 cursorScreen.cpp $(pkg-config --cflags --libs quillon)
//     ./a.out SHEET.png
#include <quillon/imageUtil.h>
#include <quillon/raster.h>
#include <quillon/version.h>

#include <algorithm>
#include <array>
#include <cstdio>
#include <string_view>
#include <vector>

namespace {

constexpr char kHelp[] =
    "usage: cursorScreen SHEET.png\n"
    "\n"
    "Moves two cursors over a screen and its edges, and writes what was to be seen at some stops.\n"
    "\n"
    "  --help, --version   show this text; show the version\n";

// A surface of 32-bit pixels whose rows lie end to end.
struct Surface {
    Surface(uint32_t w, uint32_t h) : width(w), height(h), pixels(size_t{w} * h * 4) {}
    uint8_t *data() { return pixels.data(); }
    int32_t step() const { return static_cast<int32_t>(width * 4); }

    uint32_t width, height;
    std::vector<uint8_t> pixels;
};

// A glowing disc, in memory of the caller's.
RasterCursor makeDisc(std::vector<uint8_t> &image) {
    constexpr int kSize = 32;
    for (int i = 0; i < kSize * kSize; ++i) {
        // Twice the way from the centre, which lies between four pixels.
        const int dx = i % kSize * 2 - (kSize - 1), dy = i / kSize * 2 - (kSize - 1);
        const int alpha = std::clamp((kSize * kSize - dx * dx - dy * dy) / 4, 0, 255);
        // B G R A, colours multiplied by alpha: the blend adds them as they are.
        for (const int byte : {0, 224 * alpha / 255, alpha, alpha})
            image.push_back(static_cast<uint8_t>(byte));
    }
    RasterCursor disc = {RASTER_CURSOR_ALPHA, kSize / 2, kSize / 2, kSize, kSize, {}};
    disc.alphaImage = image.data();
    return disc;
}

// An arrow that comes as two planes of one bit per pixel.
RasterCursor makeArrow(std::vector<uint8_t> &images) {
    // '#' black: AND 0, XOR 0       '.' white: AND 0, XOR 1
    // ' ' the screen: AND 1, XOR 0  '~' the screen inverted: AND 1, XOR 1
    constexpr std::array<std::string_view, 17> kArrow = {
        "#               ", "##              ", "#.#             ", "#..#            ",
        "#...#           ", "#....#          ", "#.....#         ", "#......#        ",
        "#.......#       ", "#........#      ", "#.....#####     ", "#..#..#   ~~~~~~",
        "#.# #..#  ~~~~~~", "##  #..#  ~~~~~~", "#    #..# ~~~~~~", "     #..# ~~~~~~",
        "      ##  ~~~~~~"};
    constexpr uint32_t kWidth = kArrow[0].size(), kHeight = kArrow.size();
    const uint32_t rowBytes = Raster_CalculateCursorSize(kWidth, 1, 1); // whole words
    std::vector<uint8_t> andPlane(size_t{rowBytes} * kHeight), xorPlane(andPlane.size());
    for (size_t y = 0; y < kHeight; ++y) {
        for (size_t x = 0; x < kWidth; ++x) {
            const char c = kArrow[y][x];
            const int bit = 0x80 >> x % 8; // the leftmost pixel is the top bit
            andPlane[y * rowBytes + x / 8] |= static_cast<uint8_t>(c == ' ' || c == '~' ? bit : 0);
            xorPlane[y * rowBytes + x / 8] |= static_cast<uint8_t>(c == '.' || c == '~' ? bit : 0);
        }
    }
    // Drawing takes 32 bits per pixel: the AND plane, and behind it the XOR plane.
    const uint32_t planeSize = Raster_CalculateCursorSize(kWidth, kHeight, 32);
    images.resize(size_t{planeSize} * 2);
    Raster_ExpandPlanarCursorData(kWidth, kHeight, 1, andPlane.data(), 1, xorPlane.data(), 32,
                                  images.data(), planeSize * 2);
    RasterCursor arrow = {RASTER_CURSOR_ANDXOR, 0, 0, kWidth, kHeight, {}};
    arrow.andImage = images.data();
    arrow.xorImage = images.data() + planeSize;
    return arrow;
}

// Shows the cursor at a new position of the pointer.  covered is the part of the
// display under it, of size 0 as long as there is none.
void moveCursor(Surface &screen, const RasterCursor &cursor, const RectPoint &pointer,
                Surface &display, RasterCursorBox &covered) {
    // The screen has no cursor in it, so it tells what lies under the old one.
    Raster_RectCopy(display.data(), display.step(), screen.data(), screen.step(), 4, covered.dstX,
                    covered.dstY, covered.dstX, covered.dstY, covered.width, covered.height);
    const RasterCursorScreen size = {screen.width, screen.height};
    if (Raster_ComputeCursorBox(&size, &cursor, pointer.x, pointer.y, &covered) == 0) {
        covered = {}; // wholly outside; the call has left the box as it was
        return;
    }
    // Composed in a buffer of its own; the screen is only read.
    Surface composed(covered.width, covered.height);
    Raster_DrawCursor(screen.data(), screen.step(), composed.data(), composed.step(), &cursor,
                      &covered);
    // This rectangle is what a host sends to its display, which here is memory, too.
    Raster_RectCopy(display.data(), display.step(), composed.data(), composed.step(), 4, 0, 0,
                    covered.dstX, covered.dstY, covered.width, covered.height);
}

} // namespace

int main(int argc, char **argv) {
    const std::string_view option = argc == 2 ? argv[1] : "";
    if (option == "--help")
        return std::fputs(kHelp, stdout) < 0;
    if (option == "--version")
        return std::puts("cursorScreen " QUILLON_VERSION_STRING) < 0;
    if (argc != 2)
        return std::fputs(kHelp, stderr), 2;
    Surface screen(128, 96);
    for (uint32_t x = 0; x < screen.width; x += 16) { // stripes, from blue to orange
        const uint32_t pixel = (0x20 + x * 3 / 2) << 16 | 0x60 << 8 | (0x90 - x);
        Raster_RectFill(screen.data(), screen.step(), 4, pixel, x, 0, 16, screen.height);
    }
    const std::vector<uint8_t> before = screen.pixels;

    // Over a corner, inside, over two edges, and away, which takes the cursor off.
    constexpr std::array<RectPoint, 5> kStops = {
        {{2, 3}, {60, 43}, {122, 30}, {50, 90}, {200, -40}}};
    Surface sheet(136 * kStops.size() + 8, 104 * 2 + 8);
    std::vector<uint8_t> discImage, arrowImages;
    uint32_t top = 8;
    for (const RasterCursor &cursor : {makeDisc(discImage), makeArrow(arrowImages)}) {
        Surface display = screen;
        RasterCursorBox covered = {};
        uint32_t left = 8;
        for (const RectPoint &stop : kStops) {
            moveCursor(screen, cursor, stop, display, covered);
            std::printf("(%d, %d): %u by %u pixels at (%u, %u)\n", stop.x, stop.y, covered.width,
                        covered.height, covered.dstX, covered.dstY);
            Raster_RectCopy(sheet.data(), sheet.step(), display.data(), display.step(), 4, 0, 0,
                            left, top, display.width, display.height);
            left += 136;
        }
        if (display.pixels != before || screen.pixels != before) {
            std::fputs("cursorScreen: the cursor has left a trace\n", stderr);
            return 1;
        }
        top += 104;
    }

    ImageInfo image = {}; // its pixels are on loan, so there is nothing to free
    image.width = sheet.width;
    image.height = sheet.height;
    image.depth = 24;
    image.bpp = 32;
    image.bytesPerLine = sheet.width * 4;
    image.data = sheet.data();
    if (!ImageUtil_WriteImage(&image, argv[1], IMAGEUTIL_FORMAT_PNG)) {
        std::fprintf(stderr, "cursorScreen: %s cannot be written\n", argv[1]);
        return 1;
    }
    return 0;
}
