// Pixels of video frames one by one, for processors without vectors.
#pragma once

#include "video/videoFormats.h"

#include <algorithm>
#include <cstdint>
#include <cstring>

namespace quillon {

// Two pixels that share their chroma.
template <VideoPixelLayout kLayout>
void convertPair(uint8_t luma0, uint8_t luma1, uint8_t chromaLow, uint8_t chromaHigh,
                 uint8_t *dst) {
    const auto clamped = [](int32_t field) {
        return static_cast<uint32_t>(std::clamp(field, 0, 255));
    };
    const int32_t a = chromaLow - 128, b = chromaHigh - 128;
    for (const uint8_t luma : {luma0, luma1}) {
        const int32_t t = (luma - 16) * 298 + 128;
        const uint32_t low = clamped((t + 409 * a) >> 8);
        const uint32_t mid = clamped((t - 208 * a - 100 * b) >> 8);
        const uint32_t high = clamped((t + 516 * b) >> 8);
        const uint32_t pixel = kLayout.pixel(low, mid, high);
        std::memcpy(dst, &pixel, kLayout.bytesPerPixel);
        dst += kLayout.bytesPerPixel;
    }
}

} // namespace quillon
