// The formats of video frames and of the pixels made from them.
#pragma once

#include <cstddef>
#include <cstdint>
#include <iterator>

namespace quillon {

// What a pixel made from a frame looks like.  Its three fields of 8 bits are cut
// to their top bits and put together, the low one lowest; the low and the high
// field have the same width.
struct VideoPixelLayout {
    uint8_t bytesPerPixel;
    uint8_t fieldShift; // bits cut off the low and the high field
    uint8_t midShift;   // and off the one between
    uint8_t midBits;
    uint8_t lowBits;
    uint8_t finalShift; // of the whole, to the left

    constexpr uint32_t pixel(uint32_t low, uint32_t mid, uint32_t high) const {
        const uint32_t top = high >> fieldShift << midBits | mid >> midShift;
        return (top << lowBits | low >> fieldShift) << finalShift;
    }
};

struct VideoDepth {
    int32_t bppdepth;
    VideoPixelLayout layout;
};
inline constexpr VideoDepth kVideoDepths[] = {
    {15, {2, 3, 3, 5, 5, 1}},
    {16, {2, 3, 2, 6, 5, 0}},
    {24, {3, 0, 0, 8, 8, 0}},
    {32, {4, 0, 0, 8, 8, 0}},
};

// Null for a depth that there is not.
constexpr const VideoPixelLayout *videoLayoutAt(int32_t bppdepth) {
    for (const VideoDepth &depth : kVideoDepths)
        if (depth.bppdepth == bppdepth)
            return &depth.layout;
    return nullptr;
}

// Calls frame.convert<layout>() with the layout of a depth that there is.
template <size_t kIndex = 0, class Frame>
void convertAt(int32_t bppdepth, const Frame &frame) {
    constexpr VideoDepth kDepth = kVideoDepths[kIndex];
    if constexpr (kIndex + 1 < std::size(kVideoDepths)) {
        if (bppdepth != kDepth.bppdepth)
            return convertAt<kIndex + 1>(bppdepth, frame);
    }
    frame.template convert<kDepth.layout>();
}

// An interleaved frame is a run of groups of two pixels, of 4 bytes: two luma
// samples, two bytes apart, and a pair of chroma samples between and beside them.
struct VideoGroup {
    uint8_t luma; // where the first one stands
    uint8_t chromaLow, chromaHigh;
};
inline constexpr VideoGroup kYuy2 = {0, 1, 3};
inline constexpr VideoGroup kUyvy = {1, 0, 2};

} // namespace quillon
