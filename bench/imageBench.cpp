// Files and composition, on a real picture.  Pixels and bytes are counted of the
// picture itself: not of its file, nor of the result.
#include "imageUtil.h"
#include "measure.h"

#include <memory>
#include <stdexcept>

namespace quillon::bench {
namespace {

struct FreePixels {
    void operator()(ImageInfo *image) const {
        ImageUtil_FreeImageData(image);
        delete image;
    }
};
using Image = std::shared_ptr<ImageInfo>;

void require(bool done) {
    if (!done)
        throw std::runtime_error("an image function failed on " QUILLON_PICTURE);
}

Image read(bool alpha) {
    Image image(new ImageInfo{}, FreePixels());
    require(ImageUtil_ReadPNG(image.get(), QUILLON_PICTURE, alpha ? IMAGEUTIL_READ_ADD_ALPHA : 0));
    return image;
}

// The picture, with alpha or without.
Image picture(bool alpha) {
    static const Image kinds[] = {read(false), read(true)};
    return kinds[alpha];
}

double pixelBytes(const ImageInfo &image) {
    return double{1} * image.height * image.bytesPerLine;
}

// count tells how often the picture goes through one call.
template <class Prepare>
void measureImage(const std::string &operation, bool alpha, Prepare prepare, int count = 1) {
    const Image image = picture(alpha);
    measure(operation + (alpha ? "Bgra/" : "Bgr/") + std::to_string(image->width) + "x" +
                std::to_string(image->height) + "/quillon",
            double{1} * count * image->width * image->height, count * pixelBytes(*image),
            [=] { return prepare(image); });
}

void registerPng(bool alpha) {
    for (const int32 level : {1, 6}) {
        measureImage("pngWrite" + std::to_string(level), alpha, [=](const Image &image) {
            return [=] {
                const ImageUtilPngOptions options = {level, false};
                DynBuf buffer;
                require(ImageUtil_ConstructPNGBuffer(image.get(), &options, &buffer));
                DynBuf_Destroy(&buffer);
            };
        });
    }
    measureImage("pngRead", alpha, [](const Image &image) {
        const ImageUtilPngOptions options = {6, false};
        DynBuf buffer;
        require(ImageUtil_ConstructPNGBuffer(image.get(), &options, &buffer));
        const std::vector<uint8> file(buffer.data, buffer.data + buffer.size);
        DynBuf_Destroy(&buffer);
        return [=] {
            ImageInfo read = {};
            require(ImageUtil_ReadPNGBuffer(&read, file.data(), static_cast<uint32>(file.size()),
                                            IMAGEUTIL_READ_KEEP_ALPHA));
            ImageUtil_FreeImageData(&read);
        };
    });
}

void registerBmp(bool alpha) {
    measureImage("bmpWrite", alpha, [](const Image &image) {
        return [=] {
            DynBuf buffer;
            require(ImageUtil_ConstructBMPBuffer(image.get(), &buffer));
            DynBuf_Destroy(&buffer);
        };
    });
}

// Two copies side by side: touching, or with a gap between them.
void registerCombine(const std::string &operation, bool alpha, int32 gap) {
    measureImage(
        operation, alpha,
        [=](const Image &image) {
            return [=] {
                const ImageInfo images[] = {*image, *image};
                const RectPoint positions[] = {{0, 0}, {static_cast<int32>(image->width) + gap, 0}};
                ImageInfo combined = {};
                require(ImageUtil_Combine(images, positions, 2, &combined));
                ImageUtil_FreeImageData(&combined);
            };
        },
        2);
}

void registerCropAndScale(const std::string &operation, int32 width) {
    measureImage(operation, true, [=](const Image &image) {
        return [=] {
            ImageInfo result = {};
            require(ImageUtil_CropAndScaleImage(image.get(), 100, 100, -1, -1, 0, 0, width, -1,
                                                &result));
            ImageUtil_FreeImageData(&result);
        };
    });
}

} // namespace

void registerImage() {
    for (const bool alpha : {false, true}) {
        registerPng(alpha);
        registerBmp(alpha);
        registerCombine("combine", alpha, 0);
        registerCombine("combineGap", alpha, 1);
    }
    registerCropAndScale("crop", -1);
    registerCropAndScale("cropAndScale", 240);
}

} // namespace quillon::bench
