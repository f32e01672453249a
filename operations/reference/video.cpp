#include "reference/video.h"

#include <algorithm>
#include <cstring>

namespace quillon::reference {
namespace {

uint32_t clamped(int32_t value) {
    return static_cast<uint32_t>(std::clamp(value, 0, 255));
}

// A pixel of a frame; its value at the depth.
uint32_t framePixel(int32_t luma, int32_t chromaLow, int32_t chromaHigh, int32_t bppdepth) {
    const int32_t t = (luma - 16) * 298, a = chromaLow - 128, b = chromaHigh - 128;
    const uint32_t low = clamped((t + 409 * a + 128) >> 8);
    const uint32_t mid = clamped((t - 208 * a - 100 * b + 128) >> 8);
    const uint32_t high = clamped((t + 516 * b + 128) >> 8);
    switch (bppdepth) {
    case 15:
        return (high / 8 * 1024 + mid / 8 * 32 + low / 8) * 2;
    case 16:
        return high / 8 * 2048 + mid / 4 * 32 + low / 8;
    default:
        return high * 65536 + mid * 256 + low;
    }
}

// Where in a frame a pixel's samples are.
struct Samples {
    uint64_t luma, chromaLow, chromaHigh;
};

Samples planarSamples(uint64_t x, uint64_t y, uint32_t width, uint32_t height) {
    const uint64_t halfWidth = (uint64_t{width} + 1) / 2, halfHeight = (uint64_t{height} + 1) / 2;
    const uint64_t high = 4 * halfWidth * halfHeight, low = high + halfWidth * halfHeight;
    const uint64_t sample = y / 2 * halfWidth + x / 2;
    return {y * 2 * halfWidth + x, low + sample, high + sample};
}

Samples packedSamples(uint64_t pixel, bool isYuy2) {
    const uint64_t group = pixel / 2 * 4, luma = group + pixel % 2 * 2;
    return isYuy2 ? Samples{luma, group + 1, group + 3} : Samples{luma + 1, group, group + 2};
}

// A sum of 32 bits, shifted and clamped.
uint32_t channel(int64_t sum) {
    return clamped(static_cast<int32_t>(static_cast<uint32_t>(sum)) >> 8);
}

} // namespace

void yuvToRgb(const uint8_t *srcBuffer, uint8_t *dstBuffer, uint32_t width, uint32_t height,
              uint32_t format, int32_t bppdepth) {
    const bool isPlanar = format == RASTER_VIDEO_YV12;
    const auto bytes = static_cast<size_t>(bppdepth + 1) / 8;
    for (uint64_t i = 0; i < uint64_t{width} * height; ++i) {
        const uint64_t x = i % width, y = i / width;
        const bool isWritten = isPlanar ? x < width / 2 * 2 && y < height / 2 * 2
                                        : i < uint64_t{width} * height / 2 * 2;
        const Samples at = isPlanar ? planarSamples(x, y, width, height)
                                    : packedSamples(i, format == RASTER_VIDEO_YUY2);
        if (isWritten) {
            const uint32_t pixel = framePixel(srcBuffer[at.luma], srcBuffer[at.chromaLow],
                                              srcBuffer[at.chromaHigh], bppdepth);
            std::memcpy(dstBuffer + i * bytes, &pixel, bytes);
        }
    }
}

uint32_t yuvToBgrx(int32_t y, int32_t u, int32_t v) {
    const int64_t t = (int64_t{y} - 16) * 298, d = int64_t{u} - 128, e = int64_t{v} - 128;
    return channel(t + 409 * e) << 16 | channel(t - 100 * d - 208 * e) << 8 | channel(t + 516 * d);
}

} // namespace quillon::reference
