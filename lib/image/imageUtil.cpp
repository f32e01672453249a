// The image record, and image files: what reading, writing and composing share.

#include "image/imageRecord.h"
#include <hearth/hearth.h>

#include "core/failure.h"

#include <cstddef>
#include <cstdlib>

using namespace quillon;

// Hosts in other languages rely on where the fields are.
static_assert(sizeof(ImageUtilColor) == 4);
static_assert(offsetof(ImageInfo, palette) == 28);
static_assert(sizeof(void *) != 8 || offsetof(ImageInfo, data) == 1056);
static_assert(sizeof(void *) != 8 || sizeof(ImageInfo) == 1064);

void ImageUtil_FreeImageData(ImageInfo *image) {
    if (image->data != nullptr) {
        std::free(image->data);
        image->data = nullptr;
    }
}

namespace {

// Writes the bytes of a buffer to a file, and logs what keeps it from that.
bool ImageUtilWriteBuf(const DynBuf *buffer, const char *fileName) {
    constexpr char kFunction[] = "ImageUtilWriteBuf";
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
    const bool isWritten = isEncoded && ImageUtilWriteBuf(&buffer, fileName);
    DynBuf_Destroy(&buffer);
    return isWritten;
}

bool ImageUtil_WritePNG(const ImageInfo *image, const char *fileName,
                        const ImageUtilPngOptions *options) {
    DynBuf buffer = {};
    const bool isWritten = ImageUtil_ConstructPNGBuffer(image, options, &buffer) &&
                           ImageUtilWriteBuf(&buffer, fileName);
    DynBuf_Destroy(&buffer);
    return isWritten;
}
