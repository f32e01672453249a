#include <hearth/hearth.h>
#include "picture.h"

#include <stdexcept>

namespace quillon::bench {

const ImageInfo &picture() {
    static const ImageInfo image = [] {
        ImageInfo read = {};
        if (!ImageUtil_ReadPNG(&read, QUILLON_PICTURE, IMAGEUTIL_READ_ADD_ALPHA))
            throw std::runtime_error("cannot read " QUILLON_PICTURE);
        return read;
    }();
    return image;
}

const std::vector<uint8_t> &pngFile() {
    static const std::vector<uint8_t> file = [] {
        const ImageUtilPngOptions options = {kPngLevel, false};
        DynBuf buffer;
        if (!ImageUtil_ConstructPNGBuffer(&picture(), &options, &buffer))
            throw std::runtime_error("cannot write the picture as a PNG");
        std::vector<uint8_t> bytes(buffer.data, buffer.data + buffer.size);
        DynBuf_Destroy(&buffer);
        return bytes;
    }();
    return file;
}

} // namespace quillon::bench
