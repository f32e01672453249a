// The lower floor of video frames.
#pragma once

#include "legacy/surface.h"

namespace quillon {

// What a pixel made from a frame looks like.  Three fields of 8 bits are cut to
// their top bits and put together with the low one lowest; the low and the high
// field have the same width.
struct RasterVideoPixelLayout {
    uint8_t bytesPerPixel;
    uint8_t fieldShift; // bits cut off the low and the high field
    uint8_t midShift;   // and off the one between
    uint8_t midBits;
    uint8_t lowBits;
    uint8_t finalShift; // of the whole, to the left
};
inline constexpr RasterVideoPixelLayout kVideoLayout15 = {2, 3, 3, 5, 5, 1};
inline constexpr RasterVideoPixelLayout kVideoLayout16 = {2, 3, 2, 6, 5, 0};
inline constexpr RasterVideoPixelLayout kVideoLayout24 = {3, 0, 0, 8, 8, 0};
inline constexpr RasterVideoPixelLayout kVideoLayout32 = {4, 0, 0, 8, 8, 0};

// The order of the samples in a group: two luma samples and a pair of chroma.
enum class VideoGroupOrder { Yuy2, Uyvy };

// Converts a run of groups, each to two pixels.  bppdepth is 15, 16, 24 or 32.
void convertPackedFrame(uint8_t *dst, int32_t bppdepth, const uint8_t *src, VideoGroupOrder order,
                        size_t groups);

struct VideoPlanes {
    SrcRows luma;
    SrcRows chromaHigh;
    SrcRows chromaLow;
};

// Converts blocks of two by two pixels that share their chroma; neither of
// pairs' sizes is 0.
void convertPlanarFrame(DstRows dst, int32_t bppdepth, const VideoPlanes &src, Size pairs);

} // namespace quillon
