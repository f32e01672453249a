// An arbitrary rectangle of an arbitrary image, cut out and scaled.

#include "imageInput.h"

using namespace quillon::fuzz;

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size) {
    Input input(data, size);
    chooseTarget(input.byte());
    int32_t edges[8]; // of the source, and of the result
    for (int32_t &edge : edges) {
        const uint32_t kind = input.byte();
        edge = kind < 0xA0 ? static_cast<int32_t>(kind) : -1;
        if (kind >= 0xF0)
            edge = static_cast<int32_t>(input.word());
    }
    edges[4] *= edges[4] != 1 ? 0 : 1; // mostly 0, as they must be
    edges[5] *= edges[5] != 1 ? 0 : 1;
    const InputImage image(input);
    // Rows of a crop as wide as the image have to be contiguous.
    if (image.info.bytesPerLine != uint64_t{image.info.width} * 4 && edges[0] == 0)
        edges[0] = 1;
    ImageInfo result = {};
    if (ImageUtil_CropAndScaleImage(&image.info, edges[0], edges[1], edges[2], edges[3], edges[4],
                                    edges[5], edges[6], edges[7], &result)) {
        require(result.data != nullptr && result.width != 0 && result.height != 0);
        require(result.bytesPerLine == uint64_t{result.width} * 4);
    }
    ImageUtil_FreeImageData(&result);
    return 0;
}
