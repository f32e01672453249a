// Reading PNG: which files are accepted, and how libpng delivers their pixels.
#include <hearth/hearth.h>
#include <quillon/imageUtil.h>

#include "image/imageRecord.h"
#include "image/pngChunks.h"

#include <algorithm>
#include <csetjmp>
#include <cstdlib>
#include <cstring>
#include <png.h>

namespace quillon {
namespace {

// Compressed bytes behind the last row that libpng may inflate, only to throw away what
// comes out (up to 1032 times as much): it does so to learn where their stream ends.
#ifdef QUILLON_FUZZED
constexpr uint32_t kMaxSurplusBytes = 64; // inputs of fuzzers are short
#else
constexpr uint32_t kMaxSurplusBytes = 1 << 16;
#endif

// What setjmp returns when a file has more: its pixels are complete.
constexpr int kTooMuchSurplus = 2;

// The io pointer of libpng.
struct PngInput {
    ImageUtilPngReadState state;
    bool isInPixels;       // libpng reads rows, and the rest of their stream
    uint32_t height;       // in rows, then
    uint32_t surplusBytes; // read behind the last row
};

// The state of one decoding.  An error in libpng is a longjmp, which runs no
// destructors, so everything that has to be released is a plain pointer here, outside
// the frame of the setjmp.
struct PngReader {
    ImageInfo *image;
    uint32_t flags;
    PngInput *input;
    png_structp png;
    png_infop info;
    png_bytep *rows; // from the top of the picture
};

PngFile fileOf(const PngReader &reader) {
    return PngFile{reader.input->state.buffer, reader.input->state.size};
}

bool openReader(PngReader &reader, const uint8_t *buffer, uint32_t size) {
    reader.input = static_cast<PngInput *>(UtilSafeCalloc0(1, sizeof(PngInput)));
    if (reader.input == nullptr)
        return false;
    reader.input->state = ImageUtilPngReadState{buffer, 0, size};
    if (size < kPngSignatureBytes || png_sig_cmp(buffer, 0, kPngSignatureBytes) != 0)
        return false;
    reader.png = png_create_read_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr);
    if (reader.png == nullptr)
        return false;
    reader.info = png_create_info_struct(reader.png);
    return reader.info != nullptr;
}

void closeReader(PngReader &reader) {
    png_destroy_read_struct(&reader.png, &reader.info, nullptr);
    std::free(reader.rows);
    std::free(reader.input);
}

void takePalette(const PngReader &reader) {
    ImageInfo &image = *reader.image;
    png_colorp colors = nullptr;
    int count = 0;
    png_get_PLTE(reader.png, reader.info, &colors, &count);
    image.numColors = std::min(static_cast<uint32_t>(count), kMaxColors);
    for (uint32_t i = 0; i < image.numColors; ++i)
        image.palette[i] = ImageUtilColor{colors[i].blue, colors[i].green, colors[i].red, 0};
}

bool isBehindLastRow(png_structp png, const PngInput &input) {
    constexpr png_byte kInterlacePasses = 7;
    return input.isInPixels && (png_get_current_pass_number(png) >= kInterlacePasses ||
                                png_get_current_row_number(png) >= input.height);
}

void readForLibpng(png_structp png, png_bytep dest, size_t length) {
    auto *const input = static_cast<PngInput *>(png_get_io_ptr(png));
    if (isBehindLastRow(png, *input)) {
        input->surplusBytes += static_cast<uint32_t>(length);
        if (input->surplusBytes > kMaxSurplusBytes)
            png_longjmp(png, kTooMuchSurplus);
    }
    ImageUtilReadPngCallback(png, dest, length);
}

// Reads the chunks ahead of the pixels, fills the record but for its stride and
// pixels, and sets libpng up to deliver one of the record's three formats.  False
// for a grey file.
bool readHeader(const PngReader &reader) {
    png_structp png = reader.png;
    png_infop info = reader.info;
    png_set_read_fn(png, reader.input, readForLibpng);
    skipCostlyChunks(png, fileOf(reader));
    png_read_info(png, info);

    const int colorType = png_get_color_type(png, info);
    const bool isPalette = colorType == PNG_COLOR_TYPE_PALETTE;
    const bool isRgb = colorType == PNG_COLOR_TYPE_RGB;
    const bool isRgba = colorType == PNG_COLOR_TYPE_RGB_ALPHA;
    if (!isPalette && !isRgb && !isRgba)
        return false;

    const bool reduce = png_get_bit_depth(png, info) == 16;
    const bool dropAlpha = isRgba && (reader.flags & IMAGEUTIL_READ_KEEP_ALPHA) == 0;
    const bool addAlpha = isRgb && (reader.flags & IMAGEUTIL_READ_ADD_ALPHA) != 0;
    const bool unpack = isPalette && png_get_bit_depth(png, info) < 8;
    if (reduce)
        png_set_scale_16(png);
    if (dropAlpha)
        png_set_strip_alpha(png);
    if (addAlpha)
        png_set_add_alpha(png, 255, PNG_FILLER_AFTER);
    if (unpack)
        png_set_packing(png);
    if (reduce || dropAlpha || addAlpha || unpack) {
        // After the second call png_read_image warns about interlaced files unless
        // their handling is on.
        png_set_interlace_handling(png);
        png_read_update_info(png, info);
    }

    ImageInfo &image = *reader.image;
    image.depth = isPalette ? 8 : 24;
    image.bpp = 8u * png_get_channels(png, info);
    image.width = png_get_image_width(png, info);
    image.height = png_get_image_height(png, info);
    if (isPalette)
        takePalette(reader);
    png_set_bgr(png);
    return true;
}

// Allocates the pixels and the pointers to their rows.  Only when both are there does
// the record get its stride and its pixels.
bool prepareRows(PngReader &reader) {
    ImageInfo &image = *reader.image;
    const uint64_t stride = roundUpTo4(png_get_rowbytes(reader.png, reader.info));
    if (stride > UINT32_MAX / image.height)
        return false; // the pixels would exceed 4 GiB

    auto *const pixels = static_cast<uint8_t *>(UtilSafeMalloc0(image.height * stride));
    if (pixels == nullptr)
        return false;
    reader.rows =
        static_cast<png_bytep *>(UtilSafeMalloc0(size_t{image.height} * sizeof(png_bytep)));
    if (reader.rows == nullptr) {
        std::free(pixels);
        return false;
    }
    image.bytesPerLine = static_cast<uint32_t>(stride);
    image.data = pixels;

    const bool bottomUp = (reader.flags & IMAGEUTIL_READ_BOTTOM_UP) != 0;
    for (uint32_t i = 0; i < image.height; ++i) {
        const uint32_t row = bottomUp ? image.height - 1 - i : i;
        reader.rows[i] = pixels + row * stride;
    }
    return true;
}

// The frame that an error in libpng jumps back to.
bool decode(PngReader &reader) {
    switch (setjmp(png_jmpbuf(reader.png))) {
    case 0:
        break;
    case kTooMuchSurplus:
        return isWholeBehind(fileOf(reader), reader.input->state.offset);
    default:
        return false;
    }
    if (!readHeader(reader) || !prepareRows(reader))
        return false;
    reader.input->height = reader.image->height;
    reader.input->isInPixels = true;
    png_read_image(reader.png, reader.rows);
    reader.input->isInPixels = false;
    png_read_end(reader.png, nullptr);
    return true;
}

// The contents of a file, to be released with free; null when it cannot be opened,
// sized or read, or is empty.
uint8_t *readFile(const char *fileName, uint32_t *size) {
    FileIODescriptor file;
    FileIO_Invalidate(&file);
    if (FileIO_Open(&file, fileName, FILEIO_ACCESS_READ, FILEIO_OPEN) != 0)
        return nullptr;
    const int64_t fileSize = FileIO_GetSize(&file);
    if (fileSize < 0) {
        FileIO_Close(&file);
        return nullptr;
    }
    const auto wanted = static_cast<uint32_t>(fileSize); // the low 32 bits
    size_t actual = 0;
    auto *const buffer = static_cast<uint8_t *>(UtilSafeCalloc0(1, wanted));
    const bool isRead = buffer != nullptr && FileIO_Read(&file, buffer, wanted, &actual) == 0;
    FileIO_Close(&file);
    if (!isRead) {
        std::free(buffer);
        return nullptr;
    }
    *size = static_cast<uint32_t>(actual);
    return buffer;
}

} // namespace
} // namespace quillon

using namespace quillon;

bool ImageUtil_ReadPNG(ImageInfo *image, const char *fileName, uint32_t flags) {
    uint32_t size = 0;
    uint8_t *const buffer = readFile(fileName, &size);
    const bool isRead = ImageUtil_ReadPNGBuffer(image, buffer, size, flags);
    std::free(buffer);
    return isRead;
}

bool ImageUtil_ReadPNGBuffer(ImageInfo *image, const uint8_t *buffer, uint32_t size,
                             uint32_t flags) {
    if (buffer == nullptr || image == nullptr || size == 0)
        return false;
    std::memset(image, 0, sizeof *image);

    PngReader reader = {};
    reader.image = image;
    reader.flags = flags;
    const bool isRead = openReader(reader, buffer, size) && decode(reader);
    closeReader(reader);
    return isRead;
}

void ImageUtilReadPngCallback(png_structp png, uint8_t *dest, size_t length) {
    auto *const state = static_cast<ImageUtilPngReadState *>(png_get_io_ptr(png));
    if (state->offset > state->size || length > state->size - state->offset)
        png_error(png, "Unexpected end of data");
    std::memcpy(dest, state->buffer + state->offset, length);
    state->offset += static_cast<uint32_t>(length);
}
