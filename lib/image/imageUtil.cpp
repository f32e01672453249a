// The image record, and image files.
#include <hearth/hearth.h>
#include <quillon/imageUtil.h>

#include "core/failure.h"

#include <cstddef>
#include <cstdlib>

// The layout of the records is part of the interface.
static_assert(sizeof(ImageUtilColor) == 4 && offsetof(ImageUtilColor, red) == 2);
static_assert(offsetof(ImageInfo, numColors) == 24 && offsetof(ImageInfo, palette) == 28);
static_assert(sizeof(void *) != 8 || offsetof(ImageInfo, data) == 1056);
static_assert(sizeof(void *) != 8 || sizeof(ImageInfo) == 1064);
static_assert(offsetof(ImageUtilPngOptions, stripAlpha) == 4 && sizeof(ImageUtilPngOptions) == 8);
static_assert(sizeof(void *) != 8 || offsetof(ImageUtilMemOps, realloc) == 24);
static_assert(sizeof(void *) != 8 || sizeof(ImageUtilMemOps) == 32);
static_assert(sizeof(void *) != 8 || offsetof(ImageUtilPngReadState, offset) == 8);
static_assert(sizeof(void *) != 8 || sizeof(ImageUtilPngReadState) == 16);
static_assert(sizeof(void *) != 8 || offsetof(ImageUtilPngBuffer, memOps) == 16);
static_assert(sizeof(void *) != 8 || sizeof(ImageUtilPngBuffer) == 24);

namespace quillon {
namespace {

// Writes the bytes of a buffer to a file; logs a failure.
bool writeBuffer(const DynBuf *buffer, const char *fileName) {
    constexpr char kFunction[] = "ImageUtilWriteBuf"; // a fixed text of the interface
    FileIODescriptor file;
    FileIO_Invalidate(&file);
    int status = FileIO_Open(&file, fileName, FILEIO_ACCESS_WRITE, FILEIO_OPEN_CREATE);
    if (status != 0) {
        Log("%s: Failed open file '%s': %s (%d)\n", kFunction, fileName,
            FileIO_ErrorEnglish(status), status);
        return false;
    }
    size_t actual = 0;
    status = FileIO_Write(&file, buffer->data, buffer->size, &actual);
    FileIO_Close(&file);
    if (status != 0) {
        Log("%s: Failed to write file '%s': %s (%d)\n", kFunction, fileName,
            FileIO_ErrorEnglish(status), status);
        return false;
    }
    if (actual != buffer->size) {
        Log("%s: Wrong number of image bytes written to '%s': %s (%d)\n", kFunction, fileName,
            FileIO_ErrorEnglish(0), 0);
        return false;
    }
    return true;
}

} // namespace
} // namespace quillon

using namespace quillon;

void ImageUtil_FreeImageData(ImageInfo *image) {
    if (image->data == nullptr)
        return;
    std::free(image->data);
    image->data = nullptr;
}

bool ImageUtil_WriteImage(const ImageInfo *image, const char *fileName, uint32_t format) {
    DynBuf buffer = {};
    bool isEncoded = false;
    switch (format) {
    case IMAGEUTIL_FORMAT_PNG:
        isEncoded = ImageUtil_ConstructPNGBuffer(image, nullptr, &buffer);
        break;
    case IMAGEUTIL_FORMAT_BMP:
        isEncoded = ImageUtil_ConstructBMPBuffer(image, &buffer);
        break;
    default:
        panicNotImplemented(kUnitImageUtil);
        return false;
    }
    const bool isWritten = isEncoded && writeBuffer(&buffer, fileName);
    DynBuf_Destroy(&buffer);
    return isWritten;
}

bool ImageUtil_WritePNG(const ImageInfo *image, const char *fileName,
                        const ImageUtilPngOptions *options) {
    DynBuf buffer = {};
    const bool isWritten =
        ImageUtil_ConstructPNGBuffer(image, options, &buffer) && writeBuffer(&buffer, fileName);
    DynBuf_Destroy(&buffer);
    return isWritten;
}
