// Pictures of 32 bits a pixel, and what every room of the gallery does to them:
// a thin layer over the library's functions that takes care of memory and of
// positions.
#ifndef GALLERY_PICTURE_H
#define GALLERY_PICTURE_H

#include <quillon/imageUtil.h>
#include <quillon/raster.h>

#include <string>
#include <string_view>
#include <utility>

namespace gallery {

inline constexpr uint32_t kWhite = 0xFFFFFFFF, kInk = 0xFF1F2A36, kPale = 0xFFE4E9EE,
                          kBlue = 0xFF2F6690, kOrange = 0xFFE8590C;

// Whatever goes wrong ends the program with a message.
[[noreturn]] void fail(const std::string &what);

// An ImageInfo that gives its pixels back.
class Picture {
public:
    Picture() = default;
    // Takes the pixels of info over.
    explicit Picture(const ImageInfo &info) : image(info) {}
    Picture(Picture &&other) noexcept : image(std::exchange(other.image, ImageInfo{})) {}
    Picture &operator=(Picture &&other) noexcept {
        std::swap(image, other.image);
        return *this;
    }
    Picture(const Picture &) = delete;
    Picture &operator=(const Picture &) = delete;
    ~Picture() { ImageUtil_FreeImageData(&image); }

    const ImageInfo &info() const { return image; }
    int32_t width() const { return static_cast<int32_t>(image.width); }
    int32_t height() const { return static_cast<int32_t>(image.height); }
    // What the raster functions call a surface.
    uint8_t *data() const { return image.data; }
    int32_t step() const { return static_cast<int32_t>(image.bytesPerLine); }
    uint8_t *at(int32_t x, int32_t y) const {
        return image.data + ptrdiff_t{y} * step() + ptrdiff_t{x} * 4;
    }
    Rect bounds() const { return {0, 0, width(), height()}; }

private:
    ImageInfo image = {};
};

// Positions and sizes are signed here, so that one can calculate with them; most
// of the library takes them unsigned.
constexpr uint32_t natural(int32_t value) {
    return static_cast<uint32_t>(value);
}

// The rectangle of a corner and a size.
Rect area(int32_t x, int32_t y, int32_t width, int32_t height);

Picture blank(int32_t width, int32_t height, uint32_t colour);
// A PNG of any kind the library reads, whether it has alpha or a palette.
Picture read(const std::string &fileName);
// Of 32 bits a pixel, from an image of that kind or with a palette.
Picture in32Bits(Picture file);

// Drawing.  The library does not clip; here, drawing past an edge is a failure.
void fill(Picture &ground, const Rect &part, uint32_t colour);
// A frame of the given thickness, just inside the rectangle.
void outline(Picture &ground, const Rect &part, uint32_t colour, int32_t thickness = 1);
void paste(Picture &ground, const Picture &top, int32_t x, int32_t y);
// By alpha; top is premultiplied.
void blend(Picture &ground, const Picture &top, int32_t x, int32_t y);
Picture premultiplied(const Picture &picture);

// A line of text, every pixel of its box written, and one with only the letters.
void write(Picture &ground, int32_t x, int32_t y, std::string_view text, uint32_t ink,
           uint32_t paper);
void stencil(Picture &ground, int32_t x, int32_t y, std::string_view text, uint32_t ink);
int32_t textWidth(std::string_view text);

// Parts and sizes.
Picture copyOf(const Picture &source);
Picture partOf(const Picture &source, const Rect &part);
Picture resized(const Picture &source, int32_t width, int32_t height);
// Every pixel a square of factor by factor.
Picture zoomed(const Picture &source, int32_t factor);
// As much of a picture as has the proportions of the given size, in that size.
Picture covering(const Picture &source, int32_t width, int32_t height);
// A part of at most the given size, around the point that divides the width by
// the golden section: that is where pictures have their subject.
Rect subject(const Picture &source, int32_t width, int32_t height);

} // namespace gallery

#endif // GALLERY_PICTURE_H
