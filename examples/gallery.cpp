// Makes a set of pictures from one, to be looked at: thumbnails, a crop, an
// enlargement both ways, a sprite laid over it, and a sheet of them all.
//
//     gallery PICTURE.png SPRITE.png FOLDER
#include "imageUtil.h"
#include "raster.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <exception>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

namespace {

[[noreturn]] void fail(const std::string &what) {
    throw std::runtime_error(what);
}

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
    ~Picture() { ImageUtil_FreeImageData(&image); }

    const ImageInfo &info() const { return image; }
    ImageInfo *operator->() { return &image; }
    const ImageInfo *operator->() const { return &image; }
    int32 step() const { return static_cast<int32>(image.bytesPerLine); }

private:
    ImageInfo image = {};
};

// A new picture of one colour, 32 bits a pixel.
Picture blank(uint32 width, uint32 height, uint32 colour) {
    ImageInfo info = {};
    info.width = width;
    info.height = height;
    info.depth = 24;
    info.bpp = 32;
    info.bytesPerLine = width * 4;
    // ImageUtil_FreeImageData gives blocks back to free().
    info.data = static_cast<uint8 *>(std::malloc(size_t{info.bytesPerLine} * height));
    if (!info.data)
        fail("no memory");
    Raster_RectFill(info.data, static_cast<int32>(info.bytesPerLine), 4, colour, 0, 0, width,
                    height);
    return Picture(info);
}

// Lays a picture over another, at x and y, by the alpha of its pixels.
void blend(Picture &ground, const Picture &top, uint32 x, uint32 y) {
    // Pixels in files are not premultiplied; those of the blend are.
    Picture over = blank(top->width, top->height, 0);
    for (size_t i = 0; i < size_t{top->height} * top->bytesPerLine; ++i) {
        const uint32 alpha = top->data[i | 3];
        over->data[i] = static_cast<uint8>((i & 3) == 3 ? alpha : top->data[i] * alpha / 255);
    }
    Raster_AlphaBlendOver(ground->data, x, y, ground.step(), over->data, 0, 0, over.step(),
                          top->width, top->height);
}

// Reads a PNG of any kind into 32 bits a pixel.
Picture read(const std::string &fileName) {
    ImageInfo info = {};
    const bool whole = ImageUtil_ReadPNG(&info, fileName.c_str(),
                                         IMAGEUTIL_READ_KEEP_ALPHA | IMAGEUTIL_READ_ADD_ALPHA);
    Picture file(info);
    if (!whole)
        fail(fileName + " cannot be read as a PNG (grey ones are not supported)");
    if (file->bpp == 32)
        return file;

    // A palette.  Its entries are pixels whose fourth byte is not set.
    std::vector<uint32> palette(256);
    for (size_t i = 0; i < palette.size(); ++i) {
        const ImageUtilColor c = file->palette[i];
        palette[i] = 0xFF000000U | uint32{c.red} << 16 | uint32{c.green} << 8 | c.blue;
    }
    Picture picture = blank(file->width, file->height, 0);
    Raster_ConvertPixels(picture->data, picture->bytesPerLine, 32, file->data, file->bytesPerLine,
                         8, true, palette.data(), 0, 0, 0, 0, file->width, file->height);
    return picture;
}

// A part of a picture, filtered to the given size.
Picture cut(const Picture &source, const Rect &part, uint32 width, uint32 height) {
    ImageInfo result = {};
    if (!ImageUtil_CropAndScaleImage(&source.info(), part.left, part.top, part.right, part.bottom,
                                     0, 0, static_cast<int32>(width), static_cast<int32>(height),
                                     &result))
        fail("a part cannot be scaled");
    return Picture(result);
}

Picture whole(const Picture &source, uint32 width) {
    const uint32 height =
        std::max(1U, static_cast<uint32>(uint64_t{source->height} * width / source->width));
    return cut(source, {0, 0, -1, -1}, width, height);
}

// A part of a picture, of at most the given size, around the point that divides
// the width by the golden section: that is where pictures have their subject.
Rect subject(const Picture &source, uint32 width, uint32 height) {
    width = std::min(width, source->width);
    height = std::min(height, source->height);
    const auto centre = static_cast<uint32>(0.618 * source->width);
    const uint32 left = std::min(std::max(centre, width / 2) - width / 2, source->width - width);
    Rect part;
    Rect_SetFromXYWH(&part, static_cast<int32>(left),
                     static_cast<int32>((source->height - height) / 2), static_cast<int32>(width),
                     static_cast<int32>(height));
    return part;
}

// A part of a picture, each pixel of it a square of factor by factor.
Picture enlargedNearest(const Picture &source, const Rect &part, uint32 factor) {
    const Picture small = cut(source, part, static_cast<uint32>(part.right - part.left),
                              static_cast<uint32>(part.bottom - part.top));
    Picture large = blank(small->width * factor, small->height * factor, 0);
    if (!Raster_Scale(large->data, large.step(), large->width, large->height, 0, 0,
                      static_cast<int32>(large->width), static_cast<int32>(large->height),
                      small->data, small.step(), small->width, small->height, factor, factor, 0))
        fail("the picture cannot be enlarged");
    return large;
}

void save(const Picture &picture, const std::string &fileName) {
    const bool bmp = fileName.find(".bmp") != std::string::npos;
    if (!ImageUtil_WriteImage(&picture.info(), fileName.c_str(),
                              bmp ? IMAGEUTIL_FORMAT_BMP : IMAGEUTIL_FORMAT_PNG))
        fail(fileName + " cannot be written");
}

// Rows of pictures on one sheet.
class Sheet {
public:
    void add(const Picture &picture) {
        images.push_back(picture.info());
        corners.push_back({x, y});
        x += static_cast<int32>(picture->width) + kGap;
        rowHeight = std::max(rowHeight, static_cast<int32>(picture->height));
    }
    void newRow() {
        x = 0;
        y += rowHeight + kGap;
        rowHeight = 0;
    }
    // All of it on dark grey, with a margin.
    Picture drawn() const {
        ImageInfo info = {};
        if (!ImageUtil_Combine(images.data(), corners.data(), static_cast<uint32>(images.size()),
                               &info))
            fail("the sheet cannot be made");
        const Picture pasted(info);
        Picture ground = blank(pasted->width + 2 * kGap, pasted->height + 2 * kGap, 0xFF303438);
        blend(ground, pasted, kGap, kGap);
        return ground;
    }

private:
    static constexpr int32 kGap = 16;
    std::vector<ImageInfo> images; // borrowed
    std::vector<RectPoint> corners;
    int32 x = 0, y = 0, rowHeight = 0;
};

void makeGallery(const Picture &file, const Picture &sprite, const std::string &folder) {
    // What is transparent shows white.
    Picture picture = blank(file->width, file->height, 0xFFFFFFFF);
    blend(picture, file, 0, 0);

    std::vector<Picture> thumbnails;
    for (const uint32 width : {480U, 240U, 120U, 60U}) {
        thumbnails.push_back(whole(picture, width));
        save(thumbnails.back(), folder + "thumbnail-" + std::to_string(width) + ".png");
        save(thumbnails.back(), folder + "thumbnail-" + std::to_string(width) + ".bmp");
    }

    const Rect part = subject(picture, 480, 320);
    const Picture crop = cut(picture, part, static_cast<uint32>(part.right - part.left),
                             static_cast<uint32>(part.bottom - part.top));
    save(crop, folder + "crop.png");

    const Rect detail = subject(picture, 120, 80);
    const Picture nearest = enlargedNearest(picture, detail, 4);
    const Picture filtered = cut(picture, detail, nearest->width, nearest->height);
    save(nearest, folder + "enlarged-nearest.png");
    save(filtered, folder + "enlarged-filtered.png");

    // The sprite in falling sizes, from left to right as far as there is room.
    Picture decorated = whole(picture, 480);
    uint32 x = 0;
    for (uint32 size = sprite->width / 2; size >= 8 && x + size <= decorated->width; size /= 2) {
        const Picture small = whole(sprite, size);
        if (small->height <= decorated->height)
            blend(decorated, small, x, decorated->height - small->height);
        x += size;
    }
    save(decorated, folder + "sprite.png");

    Sheet sheet;
    for (const Picture &thumbnail : thumbnails)
        sheet.add(thumbnail);
    sheet.newRow();
    sheet.add(crop);
    sheet.add(decorated);
    sheet.newRow();
    sheet.add(nearest);
    sheet.add(filtered);
    save(sheet.drawn(), folder + "sheet.png");
}

} // namespace

int main(int argc, char **argv) {
    if (argc != 4) {
        std::fputs("usage: gallery PICTURE.png SPRITE.png FOLDER\n", stderr);
        return 2;
    }
    try {
        makeGallery(read(argv[1]), read(argv[2]), std::string(argv[3]) + "/");
        return 0;
    } catch (const std::exception &error) {
        std::fprintf(stderr, "gallery: %s\n", error.what());
        return 1;
    }
}
