// Several images on one canvas.
#include <quillon/imageUtil.h>
#include <quillon/raster.h>

#include "image/imageConversion.h"

#include <algorithm>
#include <array>
#include <cstdlib>
#include <cstring>

namespace quillon {
namespace {

struct Canvas {
    ImageInfo info;
    Rect bounds;      // of all the images, in the caller's coordinates
    int32_t srcDepth; // of the images, where they are converted
    bool needsAlpha;  // 32 bits, made from images without alpha
};

// The visible part of an image: a rectangle of the image and of the canvas.
struct Overlay {
    uint32_t srcX, srcY;
    uint32_t dstX, dstY;
    uint32_t width, height;
};

// The size of the canvas on one axis; at most INT32_MAX, which bounds can exceed.
uint32_t sizeOfAxis(int32_t low, int32_t high) {
    return static_cast<uint32_t>(std::clamp<int64_t>(int64_t{high} - low, 0, INT32_MAX));
}

// Bytes per pixel of images that are copied, or of any canvas.
uint32_t bytesPerPixel(const ImageInfo &image) {
    return image.bpp / 8;
}

// Wraps at 32 bits; only the sum of several areas is wider.
uint32_t areaOf(const ImageInfo &image) {
    return image.width * image.height;
}

// The size and format of the canvas, without its stride and its pixels.
Canvas planCanvas(const ImageInfo *images, const RectPoint *positions, uint32_t count) {
    Canvas canvas;
    std::memset(&canvas, 0, sizeof canvas);
    uint64_t coveredArea = 0;
    for (uint32_t i = 0; i < count; ++i) {
        Rect rect;
        Rect_SetFromXYWH(&rect, positions[i].x, positions[i].y,
                         static_cast<int32_t>(images[i].width),
                         static_cast<int32_t>(images[i].height));
        Rect_Union(&canvas.bounds, &rect);
        coveredArea += areaOf(images[i]);
    }
    ImageInfo &info = canvas.info;
    info.width = sizeOfAxis(canvas.bounds.left, canvas.bounds.right);
    info.height = sizeOfAxis(canvas.bounds.top, canvas.bounds.bottom);

    // Only areas are compared: a gap and an overlap of the same size cancel out.
    canvas.needsAlpha = coveredArea != areaOf(info) && images[0].bpp != 32;
    canvas.srcDepth = static_cast<int32_t>(images[0].depth);
    info.depth = canvas.needsAlpha ? 24 : images[0].depth;
    info.bpp = canvas.needsAlpha ? 32 : images[0].bpp;
    return canvas;
}

// The copy takes its strides as int32_t.
bool isCopyableStride(uint64_t bytesPerLine) {
    return bytesPerLine <= INT32_MAX;
}

// Images of up to 8 bits are expanded through their palettes; any other depth must
// be one that can be converted.
bool arePaintable(const Canvas &canvas, const ImageInfo *images, uint32_t count) {
    for (uint32_t i = 0; i < count; ++i) {
        if (images[i].data == nullptr)
            continue;
        if (canvas.needsAlpha && canvas.srcDepth > 8 && !checkSourceDepth(canvas.srcDepth))
            return false;
        if (!isCopyableStride(images[i].bytesPerLine))
            return false;
    }
    return true;
}

// Bytes that painting reads per pixel; 0 where it copies images of less than 8 bits.
uint32_t bytesReadPerPixel(const Canvas &canvas) {
    if (!canvas.needsAlpha)
        return bytesPerPixel(canvas.info);
    return canvas.srcDepth <= 8 ? 1 : sourcePixelBytes(canvas.srcDepth);
}

// The part of an image that lies both on the canvas and within the bytes of the
// image's rows: width may claim more pixels than bytesPerLine holds.
Overlay clipToCanvas(const Canvas &canvas, const ImageInfo &image, RectPoint position) {
    const uint32_t pixelBytes = bytesReadPerPixel(canvas);
    const uint32_t inRow = pixelBytes == 0 ? 0 : image.bytesPerLine / pixelBytes;
    const int64_t left = int64_t{position.x} - canvas.bounds.left;
    const int64_t top = int64_t{position.y} - canvas.bounds.top;
    const int64_t right = std::min<int64_t>(left + std::min(image.width, inRow), canvas.info.width);
    const int64_t bottom = std::min<int64_t>(top + image.height, canvas.info.height);
    const int64_t firstX = std::max<int64_t>(left, 0);
    const int64_t firstY = std::max<int64_t>(top, 0);
    if (firstX >= right || firstY >= bottom)
        return Overlay{};
    return Overlay{.srcX = static_cast<uint32_t>(firstX - left),
                   .srcY = static_cast<uint32_t>(firstY - top),
                   .dstX = static_cast<uint32_t>(firstX),
                   .dstY = static_cast<uint32_t>(firstY),
                   .width = static_cast<uint32_t>(right - firstX),
                   .height = static_cast<uint32_t>(bottom - firstY)};
}

using Palette = std::array<uint32_t, kMaxColors>;

// The image's palette as 32-bit pixels.
Palette paletteOf(const ImageInfo &image) {
    Palette palette = {};
    const uint32_t count = std::min(image.numColors, kMaxColors);
    for (uint32_t i = 0; i < count; ++i) {
        const ImageUtilColor &color = image.palette[i];
        palette[i] = uint32_t{color.red} << 16 | uint32_t{color.green} << 8 | color.blue;
    }
    return palette;
}

// Converts an image to 32 bits with alpha 255.
void paintWithAlpha(const Canvas &canvas, const ImageInfo &image, const Overlay &part) {
    const ImageInfo &info = canvas.info;
    const bool isIndexed = canvas.srcDepth <= 8;
    const Palette palette = isIndexed ? paletteOf(image) : Palette{};
    Raster_ConvertPixels(info.data, info.bytesPerLine, 32, image.data, image.bytesPerLine,
                         canvas.srcDepth, isIndexed, palette.data(), part.srcX, part.srcY,
                         part.dstX, part.dstY, part.width, part.height);
    Raster_RectFillAlpha(info.data, static_cast<int32_t>(info.bytesPerLine), 255, part.dstX,
                         part.dstY, part.width, part.height);
}

// Copies an image to a canvas of the same format.
void paintPlain(const Canvas &canvas, const ImageInfo &image, const Overlay &part) {
    const ImageInfo &info = canvas.info;
    Raster_RectCopy(info.data, static_cast<int32_t>(info.bytesPerLine), image.data,
                    static_cast<int32_t>(image.bytesPerLine),
                    static_cast<int32_t>(bytesPerPixel(info)), part.srcX, part.srcY, part.dstX,
                    part.dstY, part.width, part.height);
}

} // namespace
} // namespace quillon

using namespace quillon;

bool ImageUtil_Combine(const ImageInfo *images, const RectPoint *positions, uint32_t count,
                       ImageInfo *result) {
    if (count == 0) {
        std::memset(result, 0, sizeof *result);
        return true;
    }
    Canvas canvas = planCanvas(images, positions, count);
    const uint64_t bytesPerLine =
        roundUpTo4(uint64_t{canvas.info.width} * bytesPerPixel(canvas.info));
    if (!isCopyableStride(bytesPerLine) || !arePaintable(canvas, images, count))
        return false;
    canvas.info.bytesPerLine = static_cast<uint32_t>(bytesPerLine);
    // Never 0 bytes: calloc may answer that with null, which means failure here.
    canvas.info.data = static_cast<uint8_t *>(
        std::calloc(std::max(canvas.info.height, 1u), std::max<uint64_t>(bytesPerLine, 1)));
    if (canvas.info.data == nullptr)
        return false;

    for (uint32_t i = 0; i < count; ++i) {
        if (images[i].data == nullptr)
            continue;
        const Overlay part = clipToCanvas(canvas, images[i], positions[i]);
        if (canvas.needsAlpha)
            paintWithAlpha(canvas, images[i], part);
        else
            paintPlain(canvas, images[i], part);
    }
    *result = canvas.info;
    return true;
}
