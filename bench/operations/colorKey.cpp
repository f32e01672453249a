#include "operations.h"

#include <algorithm>

namespace quillon::bench {
namespace {

// Random bits choose between the key and 0.
auto keysOf(uint32_t pixelBytes) {
    return [=](uint8_t *bytes, size_t count) {
        noise(bytes, count);
        for (size_t i = 0; i + pixelBytes <= count; i += pixelBytes)
            for (size_t byte = 0, isKey = bytes[i] & 1; byte < pixelBytes; ++byte)
                bytes[i + byte] = static_cast<uint8_t>(isKey * (kPixel >> (8 * byte)));
    };
}

} // namespace

void addColorKeys(Plan &plan) {
    const Plane surface = {32, noise};
    for (const uint32_t depth : {8U, 16U, 32U})
        plan.add(text("key ", depth), "key", Traffic::Write,
                 {surface, surface, surface, {depth, keysOf(depth / 8)}}, [=](const Job &job) {
                     const auto &[dst, background, overlay, keys] = job.planes;
                     Raster_ApplyColorKey(background.data, dst.data, overlay.data, keys.data,
                                          background.stride, dst.stride, overlay.stride,
                                          keys.stride, kPixel, 0, 0, dst.width, dst.height, depth);
                 });
}

} // namespace quillon::bench
