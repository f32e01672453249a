#include "picture.h"
#include "font.h"

#include <quillon/quillon.hpp>

#include <algorithm>
#include <cstdlib>
#include <stdexcept>
#include <vector>

namespace gallery {

void fail(const std::string &what) {
    throw std::runtime_error(what);
}

Rect area(int32_t x, int32_t y, int32_t width, int32_t height) {
    Rect rect;
    Rect_SetFromXYWH(&rect, x, y, width, height);
    return rect;
}

namespace {

void checkInside(const Picture &ground, int32_t x, int32_t y, int32_t width, int32_t height) {
    const Rect whole = ground.bounds(), part = area(x, y, width, height);
    if (!Rect_ContainsRect(&whole, &part))
        fail("something would be drawn past the edge of a picture");
}

int32_t widthOf(const Rect &part) {
    return part.right - part.left;
}
int32_t heightOf(const Rect &part) {
    return part.bottom - part.top;
}

// The bitmap of a line of text: a byte of each row is a row of one character.
std::vector<uint8_t> bitmapOf(std::string_view text) {
    std::vector<uint8_t> bits(text.size() * kGlyphHeight);
    for (size_t i = 0; i < text.size(); ++i) {
        const char c = text[i] < kFirstGlyph || text[i] > kLastGlyph ? '?' : text[i];
        for (size_t row = 0; row < kGlyphHeight; ++row)
            bits[row * text.size() + i] = kFont[c - kFirstGlyph][row];
    }
    return bits;
}

} // namespace

Picture blank(int32_t width, int32_t height, uint32_t colour) {
    ImageInfo info = {};
    info.width = static_cast<uint32_t>(width);
    info.height = static_cast<uint32_t>(height);
    info.depth = 24;
    info.bpp = 32;
    info.bytesPerLine = info.width * 4;
    // ImageUtil_FreeImageData gives blocks back to free().
    info.data = static_cast<uint8_t *>(std::malloc(size_t{info.bytesPerLine} * info.height));
    if (!info.data)
        fail("no memory");
    Picture picture(info);
    fill(picture, picture.bounds(), colour);
    return picture;
}

Picture read(const std::string &fileName) {
    ImageInfo info = {};
    const bool whole = ImageUtil_ReadPNG(&info, fileName.c_str(),
                                         IMAGEUTIL_READ_KEEP_ALPHA | IMAGEUTIL_READ_ADD_ALPHA);
    Picture file(info);
    if (!whole)
        fail(fileName + " cannot be read as a PNG (grey ones are not supported)");
    constexpr uint32_t kLargest = 32767;
    if (info.width > kLargest || info.height > kLargest)
        fail(fileName + " is too large: no side may have more than 32767 pixels");
    return in32Bits(std::move(file));
}

Picture in32Bits(Picture file) {
    const ImageInfo &info = file.info();
    if (info.bpp == 32)
        return file;
    // A palette.  Its entries are pixels whose fourth byte is not set.
    std::vector<uint32_t> palette(256);
    for (size_t i = 0; i < palette.size(); ++i) {
        const ImageUtilColor c = info.palette[i];
        palette[i] = 0xFF000000U | uint32_t{c.red} << 16 | uint32_t{c.green} << 8 | c.blue;
    }
    Picture picture = blank(file.width(), file.height(), 0);
    Raster_ConvertIndexTo32(picture.data(), picture.info().bytesPerLine, info.data,
                            info.bytesPerLine, palette.data(), 0, 0, 0, 0, info.width, info.height);
    return picture;
}

void fill(Picture &ground, const Rect &part, uint32_t colour) {
    checkInside(ground, part.left, part.top, widthOf(part), heightOf(part));
    Raster_RectFill(ground.data(), ground.step(), 4, colour, natural(part.left), natural(part.top),
                    natural(widthOf(part)), natural(heightOf(part)));
}

void outline(Picture &ground, const Rect &part, uint32_t colour, int32_t thickness) {
    fill(ground, area(part.left, part.top, widthOf(part), thickness), colour);
    fill(ground, area(part.left, part.bottom - thickness, widthOf(part), thickness), colour);
    fill(ground, area(part.left, part.top, thickness, heightOf(part)), colour);
    fill(ground, area(part.right - thickness, part.top, thickness, heightOf(part)), colour);
}

void paste(Picture &ground, const Picture &top, int32_t x, int32_t y) {
    checkInside(ground, x, y, top.width(), top.height());
    Raster_RectCopy(ground.data(), ground.step(), top.data(), top.step(), 4, 0, 0, natural(x),
                    natural(y), top.info().width, top.info().height);
}

void blend(Picture &ground, const Picture &top, int32_t x, int32_t y) {
    checkInside(ground, x, y, top.width(), top.height());
    //! [blend]
    Raster_AlphaBlendOver(ground.data(), natural(x), natural(y), ground.step(), top.data(), 0, 0,
                          top.step(), top.info().width, top.info().height);
    //! [blend]
}

Picture premultiplied(const Picture &picture) {
    Picture result = copyOf(picture);
    const size_t size = size_t{result.info().bytesPerLine} * result.info().height;
    for (size_t i = 0; i < size; i += 4) {
        uint8_t *pixel = result.data() + i;
        for (int channel = 0; channel < 3; ++channel)
            pixel[channel] = static_cast<uint8_t>(pixel[channel] * pixel[3] / 255);
    }
    return result;
}

int32_t textWidth(std::string_view text) {
    return static_cast<int32_t>(text.size()) * kGlyphWidth;
}

void write(Picture &ground, int32_t x, int32_t y, std::string_view text, uint32_t ink,
           uint32_t paper) {
    checkInside(ground, x, y, textWidth(text), kGlyphHeight);
    //! [text]
    const auto step = static_cast<int32_t>(text.size());
    Raster_BitsToPixels(bitmapOf(text).data(), step, ground.at(x, y), ground.step(), 4,
                        textWidth(text), kGlyphHeight, ink, paper);
    //! [text]
}

void stencil(Picture &ground, int32_t x, int32_t y, std::string_view text, uint32_t ink) {
    checkInside(ground, x, y, textWidth(text), kGlyphHeight);
    const auto step = static_cast<int32_t>(text.size());
    //! [stencil]
    Raster_BitsToPixelsStencil(bitmapOf(text).data(), step, ground.at(x, y), ground.step(), 4,
                               textWidth(text), kGlyphHeight, ink);
    //! [stencil]
}

Picture copyOf(const Picture &source) {
    Picture copy = blank(source.width(), source.height(), 0);
    paste(copy, source, 0, 0);
    return copy;
}

Picture partOf(const Picture &source, const Rect &part) {
    checkInside(source, part.left, part.top, widthOf(part), heightOf(part));
    Picture result = blank(widthOf(part), heightOf(part), 0);
    Raster_RectCopy(result.data(), result.step(), source.data(), source.step(), 4,
                    natural(part.left), natural(part.top), 0, 0, result.info().width,
                    result.info().height);
    return result;
}

Picture resized(const Picture &source, int32_t width, int32_t height) {
    Picture result = blank(width, height, 0);
    const quillon::ConstSurface from(source.data(), source.step(),
                                     {source.width(), source.height()}, quillon::Format::kBgra32);
    quillon::Surface to(result.data(), result.step(), {width, height}, quillon::Format::kBgra32);
    if (!to.copyScaled(to.bounds(), from))
        fail("a picture cannot be scaled");
    return result;
}

Picture zoomed(const Picture &source, int32_t factor) {
    //! [enlarge]
    Picture large = blank(source.width() * factor, source.height() * factor, 0);
    if (!Raster_Scale(large.data(), large.step(), large.info().width, large.info().height, 0, 0,
                      large.width(), large.height(), source.data(), source.step(),
                      source.info().width, source.info().height, factor, factor, 0))
        fail("a picture cannot be enlarged");
    //! [enlarge]
    return large;
}

Rect subject(const Picture &source, int32_t width, int32_t height) {
    width = std::min(width, source.width());
    height = std::min(height, source.height());
    const auto centre = static_cast<int32_t>(0.618 * source.width());
    const int32_t left = std::clamp(centre - width / 2, 0, source.width() - width);
    return area(left, (source.height() - height) / 2, width, height);
}

Picture covering(const Picture &source, int32_t width, int32_t height) {
    constexpr int64_t kMost = 32766; // that can be scaled
    const int64_t wide = int64_t{source.height()} * width / height;
    const int64_t high = int64_t{source.width()} * height / width;
    const Rect part = subject(source, static_cast<int32_t>(std::clamp<int64_t>(wide, 1, kMost)),
                              static_cast<int32_t>(std::clamp<int64_t>(high, 1, kMost)));
    return resized(partOf(source, part), width, height);
}

} // namespace gallery
