// Writing PNG: one encoder; each of its two entries has its own stream and memory.
#include <hearth/hearth.h>
#include <quillon/imageUtil.h>
#include <quillon/raster.h>

#include "image/imageConversion.h"

#include <algorithm>
#include <array>
#include <csetjmp>
#include <cstdlib>
#include <cstring>
#include <limits>
#include <png.h>

namespace quillon {
namespace {

constexpr ImageUtilPngOptions kDefaultOptions = {.compressionLevel = -1, .stripAlpha = true};
constexpr uint32_t kBestCompression = 9;

// The state of one encoding.  An error in libpng is a longjmp, which runs no
// destructors, so everything that has to be released is a plain pointer here, outside
// the frame of the setjmp.
struct PngWriter {
    const ImageInfo *image;
    ImageUtilPngOptions options;
    const ImageUtilMemOps *memOps;
    void *ioPointer;
    png_rw_ptr writeFunction;
    png_structp png;
    png_infop info;
    png_bytep *rows;    // from the top of the picture
    uint8_t *converted; // the pixels of a 16-bit image at 24 bits
};

void *allocate(const PngWriter &writer, size_t size) {
    return writer.memOps->alloc(writer.memOps->context, size);
}

void release(const PngWriter &writer, void *block) {
    writer.memOps->free(writer.memOps->context, block);
}

// libpng reads images of 8, 24 and 32 bits in place.
bool needsConversion(const ImageInfo &image) {
    return image.bpp > 8 && image.bpp != 24 && image.bpp != 32;
}

// Whether the image has pixels, in rows long enough for its width and in a format
// that can be written.
bool isReadable(const ImageInfo &image) {
    uint32_t bytesPerPixel = std::max(image.bpp / 8, 1u);
    if (needsConversion(image)) {
        const int32_t depth = conversionDepth(image);
        if (!checkSourceDepth(depth))
            return false;
        bytesPerPixel = sourcePixelBytes(depth);
    }
    return image.data != nullptr && image.bytesPerLine >= uint64_t{image.width} * bytesPerPixel;
}

bool openWriter(PngWriter &writer) {
    writer.rows = static_cast<png_bytep *>(
        allocate(writer, size_t{writer.image->height} * sizeof(png_bytep)));
    if (writer.rows == nullptr)
        return false;
    writer.png = png_create_write_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr);
    if (writer.png == nullptr)
        return false;
    writer.info = png_create_info_struct(writer.png);
    return writer.info != nullptr;
}

void releaseConverted(PngWriter &writer) {
    if (writer.converted != nullptr) {
        release(writer, writer.converted);
        writer.converted = nullptr;
    }
}

void closeWriter(PngWriter &writer) {
    png_destroy_write_struct(&writer.png, &writer.info);
    releaseConverted(writer);
    if (writer.rows != nullptr)
        release(writer, writer.rows);
}

int colorTypeOf(const PngWriter &writer) {
    const uint32_t bpp = writer.image->bpp;
    if (bpp <= 8)
        return PNG_COLOR_TYPE_PALETTE;
    return bpp == 32 && !writer.options.stripAlpha ? PNG_COLOR_TYPE_RGB_ALPHA : PNG_COLOR_TYPE_RGB;
}

void setPalette(const PngWriter &writer) {
    const ImageInfo &image = *writer.image;
    std::array<png_color, kMaxColors> colors;
    const uint32_t count = std::min(image.numColors, kMaxColors);
    for (uint32_t i = 0; i < count; ++i) {
        const ImageUtilColor &color = image.palette[i];
        colors[i] = png_color{color.red, color.green, color.blue};
    }
    // A palette file without colours is not valid: libpng fails here.
    png_set_PLTE(writer.png, writer.info, colors.data(), static_cast<int>(count));
}

void setHeader(const PngWriter &writer) {
    png_set_write_fn(writer.png, writer.ioPointer, writer.writeFunction, nullptr);
    png_set_IHDR(writer.png, writer.info, writer.image->width, writer.image->height, 8,
                 colorTypeOf(writer), PNG_INTERLACE_NONE, PNG_COMPRESSION_TYPE_DEFAULT,
                 PNG_FILTER_TYPE_DEFAULT);
    const int32_t level = writer.options.compressionLevel;
    if (static_cast<uint32_t>(level) <= kBestCompression)
        png_set_compression_level(writer.png, level);
    png_set_bgr(writer.png);
    if (writer.image->bpp <= 8)
        setPalette(writer);
}

// Converts the image's pixels to 24 bits.
bool convertPixels(PngWriter &writer, size_t stride) {
    const ImageInfo &image = *writer.image;
    writer.converted = static_cast<uint8_t *>(allocate(writer, stride * image.height));
    if (writer.converted == nullptr)
        return false;
    Raster_ConvertPixels(writer.converted, static_cast<uint32_t>(stride), 24, image.data,
                         image.bytesPerLine, conversionDepth(image), false, nullptr, 0, 0, 0, 0,
                         image.width, image.height);
    return true;
}

void fillRows(const PngWriter &writer, const uint8_t *pixels, size_t stride) {
    const ImageInfo &image = *writer.image;
    for (uint32_t i = 0; i < image.height; ++i) {
        const uint32_t pictureRow = isBottomUp(image) ? image.height - 1 - i : i;
        // The type is that of rows to be written; here libpng only reads them.
        writer.rows[pictureRow] = const_cast<png_bytep>(pixels + i * stride);
    }
}

// The frame that an error in libpng jumps back to.
bool encode(PngWriter &writer) {
    if (setjmp(png_jmpbuf(writer.png)) != 0)
        return false;
    setHeader(writer);

    const ImageInfo &image = *writer.image;
    if (needsConversion(image)) {
        const size_t stride = roundUpTo4(png_get_rowbytes(writer.png, writer.info));
        if (!convertPixels(writer, stride))
            return false;
        fillRows(writer, writer.converted, stride);
    } else {
        fillRows(writer, image.data, image.bytesPerLine);
    }

    png_write_info(writer.png, writer.info);
    if (image.bpp == 32 && writer.options.stripAlpha)
        png_set_filler(writer.png, 0, PNG_FILLER_AFTER);
    png_write_image(writer.png, writer.rows);
    releaseConverted(writer);
    png_write_end(writer.png, nullptr);
    return true;
}

bool encodePng(const ImageInfo *image, const ImageUtilPngOptions *options, void *ioPointer,
               png_rw_ptr writeFunction, const ImageUtilMemOps *memOps) {
    if (image == nullptr || !isReadable(*image))
        return false;
    PngWriter writer = {};
    writer.image = image;
    writer.options = options != nullptr ? *options : kDefaultOptions;
    writer.memOps = memOps;
    writer.ioPointer = ioPointer;
    writer.writeFunction = writeFunction;
    const bool isWritten = openWriter(writer) && encode(writer);
    closeWriter(writer);
    return isWritten;
}

void *defaultAlloc(void * /*context*/, size_t size) {
    return std::malloc(size);
}

void defaultFree(void * /*context*/, void *block) {
    std::free(block);
}

void *defaultRealloc(void * /*context*/, void *block, size_t size) {
    return std::realloc(block, size);
}

// Makes room for length more bytes.  On failure data keeps its block.
bool makeRoom(ImageUtilPngBuffer *buffer, size_t length) {
    constexpr uint64_t kMaxSize = std::numeric_limits<uint32_t>::max();
    if (length > kMaxSize - buffer->size)
        return false;
    const uint64_t needed = buffer->size + length;
    if (needed <= buffer->capacity)
        return true;
    // More than twice the size, so that libpng's many small writes rarely reallocate.
    const uint64_t capacity = std::min(needed * 2 + 1024, kMaxSize);
    void *const data = buffer->memOps->realloc(buffer->memOps->context, buffer->data, capacity);
    if (data == nullptr)
        return false;
    buffer->data = static_cast<uint8_t *>(data);
    buffer->capacity = static_cast<uint32_t>(capacity);
    return true;
}

} // namespace
} // namespace quillon

using namespace quillon;

bool ImageUtil_ConstructPNGBuffer(const ImageInfo *image, const ImageUtilPngOptions *options,
                                  DynBuf *buffer) {
    if (buffer == nullptr || image == nullptr)
        return false;
    DynBuf_Init(buffer);
    const ImageUtilMemOps memOps = {nullptr, defaultAlloc, defaultFree, defaultRealloc};
    if (!encodePng(image, options, buffer, ImageUtilDynBufWriteCallback, &memOps)) {
        DynBuf_Destroy(buffer);
        return false;
    }
    return true;
}

bool ImageUtil_ConstructPNGBufferWithMemOps(const ImageInfo *image,
                                            const ImageUtilPngOptions *options, uint8_t **outData,
                                            uint32_t *outSize, const ImageUtilMemOps *memOps) {
    ImageUtilPngBuffer buffer = {};
    buffer.memOps = memOps;
    if (!encodePng(image, options, &buffer, ImageUtilBufferWriteCallback, memOps)) {
        *outSize = 0;
        memOps->free(memOps->context, buffer.data);
        return false;
    }
    *outData = buffer.data;
    *outSize = buffer.size;
    return true;
}

void ImageUtilDynBufWriteCallback(png_structp png, uint8_t *source, size_t length) {
    auto *const buffer = static_cast<DynBuf *>(png_get_io_ptr(png));
    if (!DynBuf_Append(buffer, source, length))
        png_error(png, "Unable to append data");
}

void ImageUtilBufferWriteCallback(png_structp png, uint8_t *source, size_t length) {
    auto *const buffer = static_cast<ImageUtilPngBuffer *>(png_get_io_ptr(png));
    if (!makeRoom(buffer, length) || buffer->data == nullptr) {
        buffer->size = 0;
        buffer->capacity = 0;
        png_error(png, "Unable to append data: Out of memory");
    }
    std::memcpy(buffer->data + buffer->size, source, length);
    buffer->size += static_cast<uint32_t>(length);
}
