// Arbitrary bytes as a PNG, read with arbitrary flags on an instruction set that the
// input names.  What could be read is written again in both formats.
//
// The first byte holds the flags, the second the instruction set; the rest is the file.

#include "imageInput.h"
#include <hearth/hearth.h>

using namespace quillon::fuzz;

namespace {

void writeAgain(const ImageInfo &image) {
    for (const bool stripAlpha : {false, true}) {
        const ImageUtilPngOptions options = {.compressionLevel = 1, .stripAlpha = stripAlpha};
        DynBuf png = {};
        const bool isWritten = ImageUtil_ConstructPNGBuffer(&image, &options, &png);
        // A palette may lack a colour that a pixel names; libpng reads that, and
        // refuses to write it.
        require(isWritten || image.bpp == 8);
        DynBuf_Destroy(&png);
    }
    DynBuf bmp = {};
    require(ImageUtil_ConstructBMPBuffer(&image, &bmp));
    DynBuf_Destroy(&bmp);
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size) {
    Input input(data, size);
    const uint32_t flags = input.byte();
    chooseTarget(input.byte());
    const std::vector<uint8_t> file(input.rest(), input.rest() + input.left());
    ImageInfo image;
    if (readPng(file, flags, &image))
        writeAgain(image);
    ImageUtil_FreeImageData(&image);
    return 0;
}
