// Arbitrary images at arbitrary places of one canvas.  All have the format of the first,
// as the function asks.

#include "imageInput.h"

#include <algorithm>
#include <memory>

using namespace quillon::fuzz;

namespace {

// Of the box around all images, roughly.
uint64_t canvasBytes(const std::vector<ImageInfo> &images,
                     const std::vector<RectPoint> &positions) {
    int64_t left = INT32_MAX, top = INT32_MAX, right = INT32_MIN, bottom = INT32_MIN;
    for (size_t i = 0; i < images.size(); ++i) {
        left = std::min<int64_t>(left, positions[i].x);
        top = std::min<int64_t>(top, positions[i].y);
        right = std::max(right, positions[i].x + int64_t{images[i].width});
        bottom = std::max(bottom, positions[i].y + int64_t{images[i].height});
    }
    const auto extent = [](int64_t low, int64_t high) {
        return static_cast<uint64_t>(std::clamp<int64_t>(high - low, 0, INT32_MAX));
    };
    return extent(left, right) * extent(top, bottom) * 4;
}

} // namespace

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
    if (isUnwieldy(canvasBytes(images, positions)))
        return 0;
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
