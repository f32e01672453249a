// An arbitrary image record as a PNG, by both encoders: both succeed with the same bytes,
// which can be read, or both fail.

#include "imageInput.h"
#include <hearth/hearth.h>

#include <cstdlib>
#include <cstring>

using namespace quillon::fuzz;

namespace {

const ImageUtilMemOps kMemOps = {
    nullptr, [](void *, size_t size) { return std::malloc(size); },
    [](void *, void *block) { std::free(block); },
    [](void *, void *block, size_t size) { return std::realloc(block, size); }};

void writeBoth(const ImageInfo &image, const ImageUtilPngOptions *options) {
    DynBuf png = {};
    uint8_t *block = nullptr;
    uint32_t blockSize = 0;
    const bool isWritten = ImageUtil_ConstructPNGBuffer(&image, options, &png);
    require(ImageUtil_ConstructPNGBufferWithMemOps(&image, options, &block, &blockSize, &kMemOps) ==
            isWritten);
    if (isWritten) {
        require(png.size == blockSize && std::memcmp(png.data, block, blockSize) == 0);
        ImageInfo read;
        require(readPng({block, block + blockSize}, IMAGEUTIL_READ_KEEP_ALPHA, &read) ||
                uint64_t{image.height} * image.width * 4 > kMostBytes);
        ImageUtil_FreeImageData(&read);
    }
    std::free(block);
    DynBuf_Destroy(&png);
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size) {
    Input input(data, size);
    chooseTarget(input.byte());
    const uint32_t choice = input.byte();
    const ImageUtilPngOptions options = {static_cast<int32_t>(choice >> 2) - 2, (choice & 1) != 0};
    const InputImage image(input);
    try {
        writeBoth(image.info, (choice & 2) != 0 ? &options : nullptr);
    } catch (const Panicked &) { // a depth that does not exist
    }
    return 0;
}
