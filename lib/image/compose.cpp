// Making one image out of others: several on one canvas, a part of one scaled.

#include "image/imageRecord.h"

#include "core/extended.h"

#include <algorithm>
#include <array>
#include <cstdlib>
#include <cstring>

using namespace quillon;

namespace {

// The pixels of one image on the canvas: a rectangle that both have.
struct Overlay {
    uint32_t srcX, srcY;
    uint32_t dstX, dstY;
    uint32_t width, height;
};

// What is common to all images of one canvas.
struct Canvas {
    ImageInfo info;
    Rect bounds;      // of all the images, in the caller's coordinates
    int32_t srcDepth; // of the images, where they are converted
    bool needsAlpha;  // 32 bits, made from images without alpha
};

// An axis of the canvas.  The bounds can be wider than an int32_t tells.
uint32_t extent(int32_t low, int32_t high) {
    if (high <= low) {
        return 0;
    }
    return static_cast<uint32_t>(std::min<int64_t>(int64_t{high} - low, INT32_MAX));
}

// Bytes per pixel of images that are copied, or of any canvas.
uint32_t bytesPerPixel(const ImageInfo &image) {
    return image.bpp / 8;
}

// Wraps in 32 bits; only the sum of several is wider.
uint32_t areaOf(const ImageInfo &image) {
    return image.width * image.height;
}

// Sizes and format of the canvas; nothing is allocated yet.
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
    info.width = extent(canvas.bounds.left, canvas.bounds.right);
    info.height = extent(canvas.bounds.top, canvas.bounds.bottom);

    // A test of areas alone: a gap and an overlap of the same size pass unseen.
    canvas.needsAlpha = coveredArea != areaOf(info) && images[0].bpp != 32;
    canvas.srcDepth = static_cast<int32_t>(images[0].depth);
    info.depth = canvas.needsAlpha ? 24 : images[0].depth;
    info.bpp = canvas.needsAlpha ? 32 : images[0].bpp;
    return canvas;
}

// Line increments of copies are int32_t.
bool isCopyableStep(uint64_t bytesPerLine) {
    return bytesPerLine <= INT32_MAX;
}

// Whether every image can be painted on the canvas.  Images of up to 8 bits are
// expanded through their palettes, all others need a depth to convert from.
bool arePaintable(const Canvas &canvas, const ImageInfo *images, uint32_t count) {
    for (uint32_t i = 0; i < count; ++i) {
        if (images[i].data == nullptr) {
            continue;
        }
        if (canvas.needsAlpha && canvas.srcDepth > 8 && !checkConvertible(canvas.srcDepth, 32)) {
            return false;
        }
        if (!isCopyableStep(images[i].bytesPerLine)) {
            return false;
        }
    }
    return true;
}

// The part of an image at a position that is on the canvas and in the memory of
// the image's rows, whatever its width says.
Overlay clipToCanvas(const Canvas &canvas, const ImageInfo &image, RectPoint position) {
    const uint32_t srcBytesPerPixel = !canvas.needsAlpha     ? bytesPerPixel(canvas.info)
                                      : canvas.srcDepth <= 8 ? 1
                                                             : bytesAtDepth(canvas.srcDepth);
    const uint32_t inRow = srcBytesPerPixel == 0 ? 0 : image.bytesPerLine / srcBytesPerPixel;
    const int64_t left = int64_t{position.x} - canvas.bounds.left;
    const int64_t top = int64_t{position.y} - canvas.bounds.top;
    const int64_t right = std::min<int64_t>(left + std::min(image.width, inRow), canvas.info.width);
    const int64_t bottom = std::min<int64_t>(top + image.height, canvas.info.height);
    const int64_t firstX = std::max<int64_t>(left, 0);
    const int64_t firstY = std::max<int64_t>(top, 0);
    if (firstX >= right || firstY >= bottom) {
        return Overlay{};
    }
    return Overlay{static_cast<uint32_t>(firstX - left),  static_cast<uint32_t>(firstY - top),
                   static_cast<uint32_t>(firstX),         static_cast<uint32_t>(firstY),
                   static_cast<uint32_t>(right - firstX), static_cast<uint32_t>(bottom - firstY)};
}

using Palette = std::array<uint32_t, kMaxColors>;

// The image's palette in the form of 32-bit pixels.
Palette paletteOf(const ImageInfo &image) {
    Palette palette = {};
    const uint32_t count = std::min(image.numColors, kMaxColors);
    for (uint32_t i = 0; i < count; ++i) {
        const ImageUtilColor &color = image.palette[i];
        palette[i] = uint32_t{color.red} << 16 | uint32_t{color.green} << 8 | color.blue;
    }
    return palette;
}

// Paints an image opaquely on a canvas that has an alpha of its own.
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

bool ImageUtil_Combine(const ImageInfo *images, const RectPoint *positions, uint32_t count,
                       ImageInfo *result) {
    if (count == 0) {
        std::memset(result, 0, sizeof *result);
        return true;
    }
    Canvas canvas = planCanvas(images, positions, count);
    const uint64_t bytesPerLine =
        roundUpTo4(uint64_t{canvas.info.width} * bytesPerPixel(canvas.info));
    if (!isCopyableStep(bytesPerLine) || !arePaintable(canvas, images, count)) {
        return false;
    }
    canvas.info.bytesPerLine = static_cast<uint32_t>(bytesPerLine);
    // Never 0 bytes, for which null could be the answer to success.
    canvas.info.data = static_cast<uint8_t *>(
        std::calloc(std::max(canvas.info.height, 1u), std::max<uint64_t>(bytesPerLine, 1)));
    if (canvas.info.data == nullptr) {
        return false;
    }
    for (uint32_t i = 0; i < count; ++i) {
        if (images[i].data == nullptr) {
            continue;
        }
        const Overlay part = clipToCanvas(canvas, images[i], positions[i]);
        if (canvas.needsAlpha) {
            paintWithAlpha(canvas, images[i], part);
        } else {
            paintPlain(canvas, images[i], part);
        }
    }
    *result = canvas.info;
    return true;
}

namespace {

constexpr int32_t kNotGiven = -1;
constexpr uint32_t kBytesPerPixel = 4; // whatever bpp says
constexpr uint32_t kFiltered = 2;

// The rectangle cut out of the source, its edges as the source has them.
struct Crop {
    uint32_t left, top;
    uint32_t width, height;
};

struct OutputSize {
    uint32_t width, height;
};

// One axis of the crop: false unless low < high <= limit.
bool resolveEdges(int32_t low, int32_t high, uint32_t limit, uint32_t *start, uint32_t *length) {
    if (low < 0 || (high != kNotGiven && high <= low)) {
        return false;
    }
    const uint32_t end = high == kNotGiven ? limit : static_cast<uint32_t>(high);
    *start = static_cast<uint32_t>(low);
    *length = end - *start;
    return *start < end && end <= limit;
}

// The size asked for; a side left open follows the other by proportion, its
// product taken in 32 bits.
OutputSize outputSize(const Crop &crop, int32_t dstRight, int32_t dstBottom) {
    OutputSize size = {crop.width, crop.height};
    if (dstRight != kNotGiven) {
        size.width = static_cast<uint32_t>(dstRight);
    } else if (dstBottom != kNotGiven) {
        size.width = static_cast<uint32_t>(dstBottom) * crop.width / crop.height;
    }
    if (dstBottom != kNotGiven) {
        size.height = static_cast<uint32_t>(dstBottom);
    } else if (dstRight != kNotGiven) {
        size.height = crop.height * static_cast<uint32_t>(dstRight) / crop.width;
    }
    return size;
}

void copyCrop(uint8_t *block, size_t pitch, const uint8_t *first, const ImageInfo &src,
              const Crop &crop) {
    if (crop.width == src.width) {
        std::memcpy(block, first, crop.height * pitch); // rows end to end
        return;
    }
    for (uint32_t row = 0; row < crop.height; ++row) {
        std::memcpy(block + row * pitch, first + size_t{row} * src.bytesPerLine, pitch);
    }
}

bool scaleCrop(uint8_t *block, size_t pitch, const uint8_t *first, const ImageInfo &src,
               const Crop &crop, OutputSize size) {
    if (src.bytesPerLine > INT32_MAX) {
        return false; // the scaler's line increments are int32_t
    }
    return Raster_Scale(block, static_cast<int32_t>(pitch), size.width, size.height, 0, 0,
                        static_cast<int32_t>(size.width), static_cast<int32_t>(size.height), first,
                        static_cast<int32_t>(src.bytesPerLine), crop.width, crop.height,
                        extendedQuotient(size.width, crop.width),
                        extendedQuotient(size.height, crop.height), kFiltered) != 0;
}

} // namespace

bool ImageUtil_CropAndScaleImage(const ImageInfo *src, int32_t srcLeft, int32_t srcTop,
                                 int32_t srcRight, int32_t srcBottom, int32_t dstLeft,
                                 int32_t dstTop, int32_t dstRight, int32_t dstBottom,
                                 ImageInfo *result) {
    Crop crop = {};
    if (!resolveEdges(srcLeft, srcRight, src->width, &crop.left, &crop.width) ||
        !resolveEdges(srcTop, srcBottom, src->height, &crop.top, &crop.height) || dstLeft != 0 ||
        dstTop != 0) {
        return false;
    }
    const OutputSize size = outputSize(crop, dstRight, dstBottom);
    const uint64_t pitch = uint64_t{size.width} * kBytesPerPixel;
    const uint64_t cropEnd = (uint64_t{crop.left} + crop.width) * kBytesPerPixel;
    if (size.width == 0 || size.height == 0 || pitch > INT32_MAX || size.height > INT32_MAX ||
        src->data == nullptr || cropEnd > src->bytesPerLine) {
        return false;
    }

    uint8_t *const block = static_cast<uint8_t *>(UtilSafeMalloc0(size.height * pitch));
    if (block == nullptr) {
        return false;
    }
    const uint8_t *const first = rowAt(*src, crop.top) + size_t{crop.left} * kBytesPerPixel;
    if (crop.width == size.width && crop.height == size.height) {
        copyCrop(block, pitch, first, *src, crop);
    } else if (!scaleCrop(block, pitch, first, *src, crop, size)) {
        std::free(block);
        return false;
    }

    ImageInfo made;
    std::memset(&made, 0, sizeof made);
    made.width = size.width;
    made.height = size.height;
    made.depth = src->depth;
    made.bpp = src->bpp;
    made.bytesPerLine = static_cast<uint32_t>(pitch);
    made.data = block;
    *result = made;
    return true;
}
