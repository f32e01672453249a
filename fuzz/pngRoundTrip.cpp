// Arbitrary bytes as a PNG; what could be read is written as a PNG and read again, and
// must be the same.  Input as that of pngRead.

#include "imageInput.h"
#include <hearth/hearth.h>

#include <cstring>

using namespace quillon::fuzz;

namespace {

void requireEqual(const ImageInfo &a, const ImageInfo &b) {
    require(a.width == b.width && a.height == b.height && a.depth == b.depth && a.bpp == b.bpp);
    require(a.bytesPerLine == b.bytesPerLine && a.numColors == b.numColors);
    require(std::memcmp(a.palette, b.palette, sizeof a.palette) == 0);
    const size_t rowBytes = size_t{a.width} * a.bpp / 8; // the padding is not written
    for (size_t row = 0; row < a.height; ++row)
        require(std::memcmp(a.data + row * a.bytesPerLine, b.data + row * b.bytesPerLine,
                            rowBytes) == 0);
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size) {
    Input input(data, size);
    const uint32_t flags = input.byte() | IMAGEUTIL_READ_KEEP_ALPHA;
    chooseTarget(input.byte());
    ImageInfo image, again;
    if (!readPng({input.rest(), input.rest() + input.left()}, flags, &image))
        return 0;
    const bool isBottomUp = (flags & IMAGEUTIL_READ_BOTTOM_UP) != 0;
    image.flags = isBottomUp ? IMAGEUTIL_FLAG_BOTTOM_UP : 0;
    const ImageUtilPngOptions options = {static_cast<int32_t>(flags >> 4), false};
    DynBuf png = {};
    if (ImageUtil_ConstructPNGBuffer(&image, &options, &png)) {
        const auto *const bytes = reinterpret_cast<const uint8_t *>(png.data);
        require(readPng({bytes, bytes + png.size}, flags, &again));
        requireEqual(image, again);
        ImageUtil_FreeImageData(&again);
    }
    DynBuf_Destroy(&png);
    ImageUtil_FreeImageData(&image);
    return 0;
}
