// Video frames, and an overlay seen through a colour key.
#include "rooms.h"
#include "sheet.h"

#include <algorithm>
#include <cstring>
#include <vector>

namespace gallery {

namespace {

constexpr int32_t kWidth = 224, kHeight = 150; // even, as frames are

struct Yuv {
    uint8_t y, u, v;
};

// The mean of a block of pixels, as video has it: luma from 16 to 235, and the
// differences of blue (u) and red (v) around 128.
Yuv yuvOf(const Picture &picture, int32_t x, int32_t y, int32_t columns, int32_t rows) {
    int32_t red = 0, green = 0, blue = 0;
    for (int32_t row = y; row < y + rows; ++row)
        for (int32_t column = x; column < x + columns; ++column) {
            const uint8_t *pixel = picture.at(column, row);
            blue += pixel[0];
            green += pixel[1];
            red += pixel[2];
        }
    const int32_t whole = 256 * columns * rows;
    const auto part = [whole](int32_t base, int32_t sum) {
        return static_cast<uint8_t>((base * whole + sum + whole / 2) / whole);
    };
    return {part(16, 66 * red + 129 * green + 25 * blue),
            part(128, -38 * red - 74 * green + 112 * blue),
            part(128, 112 * red - 94 * green - 18 * blue)};
}

using Frame = std::vector<uint8_t>;

// Two pixels in four bytes; lumaAt is 0 for YUY2, 1 for UYVY.
Frame packedFrame(const Picture &picture, size_t lumaAt, bool exchanged) {
    Frame frame;
    for (int32_t y = 0; y < kHeight; ++y)
        for (int32_t x = 0; x < kWidth; x += 2) {
            const Yuv both = yuvOf(picture, x, y, 2, 1);
            uint8_t four[4];
            four[lumaAt] = yuvOf(picture, x, y, 1, 1).y;
            four[lumaAt + 2] = yuvOf(picture, x + 1, y, 1, 1).y;
            four[1 - lumaAt] = exchanged ? both.v : both.u;
            four[3 - lumaAt] = exchanged ? both.u : both.v;
            frame.insert(frame.end(), four, four + 4);
        }
    return frame;
}

// A plane of luma, then V and U in half the width and height.
Frame planarFrame(const Picture &picture) {
    Frame frame, uPlane;
    for (int32_t y = 0; y < kHeight; ++y)
        for (int32_t x = 0; x < kWidth; ++x)
            frame.push_back(yuvOf(picture, x, y, 1, 1).y);
    for (int32_t y = 0; y < kHeight; y += 2)
        for (int32_t x = 0; x < kWidth; x += 2) {
            const Yuv four = yuvOf(picture, x, y, 2, 2);
            frame.push_back(four.v);
            uPlane.push_back(four.u);
        }
    frame.insert(frame.end(), uPlane.begin(), uPlane.end());
    return frame;
}

Picture converted(const Frame &frame, uint32_t format, int32_t depth) {
    const auto bytes = static_cast<uint32_t>((depth + 7) / 8);
    //! [video]
    std::vector<uint8_t> pixels(size_t{kWidth} * kHeight * bytes);
    Raster_YUVtoRGB(frame.data(), pixels.data(), kWidth, kHeight, format, depth);
    //! [video]
    // Depth 15 comes out one bit higher than the other functions have it.
    for (size_t i = 0; depth == 15 && i < pixels.size(); i += 2) {
        uint16_t pixel = 0;
        std::memcpy(&pixel, &pixels[i], 2);
        pixel = static_cast<uint16_t>(pixel >> 1);
        std::memcpy(&pixels[i], &pixel, 2);
    }
    Picture picture = blank(kWidth, kHeight, 0);
    Raster_ConvertPixelsTo32(picture.data(), picture.info().bytesPerLine, pixels.data(),
                             kWidth * bytes, depth, false, nullptr, 0, 0, 0, 0, kWidth, kHeight);
    return picture;
}

void exchangeRedAndBlue(Picture &picture) {
    const size_t size = size_t{picture.info().bytesPerLine} * picture.info().height;
    for (size_t i = 0; i < size; i += 4)
        std::swap(picture.data()[i], picture.data()[i + 2]);
}

Picture pixelByPixel(const Picture &picture) {
    Picture result = blank(kWidth, kHeight, 0);
    for (int32_t y = 0; y < kHeight; ++y)
        for (int32_t x = 0; x < kWidth; ++x) {
            //! [videoPixel]
            const Yuv yuv = yuvOf(picture, x, y, 1, 1);
            fill(result, area(x, y, 1, 1), RasterRGB_YUVtoBGRX(yuv.y, yuv.u, yuv.v));
            //! [videoPixel]
        }
    return result;
}

constexpr uint32_t kKey = 0xFFFF00FF;
constexpr int32_t kTitle = 20;

// A desktop with a player, whose screen is of the key colour, and in front of it
// a note.
Picture desktop(const Rect &screen) {
    Picture picture = blank(344, 236, 0xFF5C7C8A);
    fill(picture,
         area(screen.left - 4, screen.top - kTitle, screen.right - screen.left + 8,
              screen.bottom - screen.top + kTitle + 4),
         kInk);
    stencil(picture, screen.left + 2, screen.top - 16, "Player", kWhite);
    fill(picture, screen, kKey);

    const Rect note = area(206, 120, 128, 84);
    fill(picture, note, 0xFFFFF3B0);
    outline(picture, note, kInk);
    fill(picture, area(note.left, note.top, 128, kTitle), kOrange);
    stencil(picture, note.left + 8, note.top + 4, "Note", kWhite);
    stencil(picture, note.left + 8, note.top + 32, "in front of", kInk);
    stencil(picture, note.left + 8, note.top + 48, "the film", kInk);
    return picture;
}

} // namespace

void showVideo(Page &page, const Material &material) {
    page.room("Video", "Frames of luma and two colour differences, U and V, become pixels.");
    const Picture photo = covering(material.photo, kWidth, kHeight);
    const Frame planar = planarFrame(photo);

    Sheet sheet(3);
    sheet.add(converted(packedFrame(photo, 0, false), RASTER_VIDEO_YUY2, 32), "YUY2, depth 32");
    sheet.add(converted(packedFrame(photo, 1, false), RASTER_VIDEO_UYVY, 32), "UYVY, depth 32");
    sheet.add(converted(planar, RASTER_VIDEO_YV12, 32), "YV12, depth 32");
    for (const int32_t depth : {24, 16, 15})
        sheet.add(converted(planar, RASTER_VIDEO_YV12, depth),
                  "YV12, depth " + std::to_string(depth));
    page.show(sheet,
              {"video-formats",
               "The same landscape six times, its colours a little off.",
               "`Raster_YUVtoRGB`: the same frame in each format, and in each depth of pixels.",
               {"video"}});

    //! [videoExchanged]
    Picture exact = converted(packedFrame(photo, 0, true), RASTER_VIDEO_YUY2, 32);
    exchangeRedAndBlue(exact);
    //! [videoExchanged]
    Sheet colours(3);
    colours.add(copyOf(photo), "what was filmed");
    colours.add(pixelByPixel(photo), "one pixel at a time");
    colours.add(std::move(exact), "YUY2, U and V exchanged");
    page.show(colours,
              {"video-colours",
               "The landscape as it was filmed, and twice after its way through video, with the "
               "same colours.",
               "`RasterRGB_YUVtoBGRX` gives the colours that were filmed. `Raster_YUVtoRGB` has U "
               "and V in each other's places, so its colours above are a little off; a frame in "
               "which they are exchanged, and red and blue afterwards, gets them right.",
               {"videoPixel", "videoExchanged"}});
}

void showColorKey(Page &page, const Material &material) {
    page.room("Colour key", "A film that shows where a window is painted in one certain colour.");
    const Rect screen = area(24, 40, 240, 160);
    const Picture background = desktop(screen);
    const Picture film = covering(material.photo, 240, 160);
    Picture result = copyOf(background);
    //! [colorKey]
    Raster_ApplyColorKey(background.data(), result.data(), film.data(), background.data(),
                         background.step(), result.step(), film.step(), background.step(),
                         kKey & 0xFFFFFF, natural(screen.left), natural(screen.top),
                         film.info().width, film.info().height, 32);
    //! [colorKey]
    Sheet sheet(2);
    sheet.add(copyOf(background), "the desktop, with the key in magenta");
    sheet.add(std::move(result), "with the film in its place");
    page.show(sheet,
              {"color-key",
               "A desktop with a window whose screen is magenta, and the same with a landscape "
               "there; a note lies in front of both.",
               "`Raster_ApplyColorKey`: the film replaces the key colour, and nothing else, so the "
               "note stays in front of it.",
               {"colorKey"}});
}

} // namespace gallery
