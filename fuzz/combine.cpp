// Arbitrary images at arbitrary places of one canvas.  All have the format of the first,
// as the function asks.

#include "imageInput.h"

#include <memory>

using namespace quillon::fuzz;

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size) {
    Input input(data, size);
    chooseTarget(input.byte());
    const uint32_t count = input.byte() % 5;
    std::vector<RectPoint> positions;
    for (uint32_t i = 0; i < count; ++i) {
        const bool isFar = input.byte() >= 0xF0;
        const auto place = [&] {
            const uint32_t value = isFar ? input.word() : input.byte() - 128;
            return static_cast<int32_t>(value);
        };
        positions.push_back({place(), place()});
    }
    std::vector<std::unique_ptr<InputImage>> owned;
    std::vector<ImageInfo> images;
    for (uint32_t i = 0; i < count; ++i) {
        owned.push_back(std::make_unique<InputImage>(input));
        images.push_back(owned.back()->info);
        images.back().depth = images[0].depth;
        images.back().bpp = images[0].bpp;
    }
    ImageInfo canvas = {};
    try {
        if (ImageUtil_Combine(images.data(), positions.data(), count, &canvas)) {
            require(count == 0 || canvas.data != nullptr);
            require(canvas.bytesPerLine >= uint64_t{canvas.width} * (canvas.bpp / 8));
        }
    } catch (const Panicked &) { // a depth that does not exist
    }
    ImageUtil_FreeImageData(&canvas);
    return 0;
}
