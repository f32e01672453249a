// Video: YUV frames, colour key.

#include "rasterVideo.h"

#include "core/latch.h"
#include "core/surface.h"
#include "hearth.h"
#include "raster/rasterKeyKernels.h"
#include "raster/rasterVideoKernels.h"
#include "raster/videoAttributes.h"

#include <algorithm>

namespace quillon {
namespace {

constinit Latch depthLatch;
constinit Latch formatLatch;

constexpr char kYuvToRgb[] = "Raster_YUVtoRGB";

// 0 for a depth that there is not.
size_t bytesPerPixelAt(int32 bppdepth) {
    switch (bppdepth) {
    case 15:
        return kVideoLayout15.bytesPerPixel;
    case 16:
        return kVideoLayout16.bytesPerPixel;
    case 24:
        return kVideoLayout24.bytesPerPixel;
    case 32:
        return kVideoLayout32.bytesPerPixel;
    default:
        return 0;
    }
}

bool isVideoFormat(uint32 format) {
    return format == RASTER_VIDEO_YUY2 || format == RASTER_VIDEO_UYVY ||
           format == RASTER_VIDEO_YV12;
}

// A result of the formula before its shift, held to 8 bits after it.
uint32 channel(uint32 sum) {
    return static_cast<uint32>(std::clamp(static_cast<int32>(sum) >> 8, 0, 255));
}

} // namespace
} // namespace quillon

using namespace quillon;

void Raster_YUVtoRGB(const uint8 *srcBuffer, uint8 *dstBuffer, uint32 width, uint32 height,
                     uint32 format, int32 bppdepth) {
    const size_t bytesPerPixel = bytesPerPixelAt(bppdepth);
    if (bytesPerPixel == 0) {
        if (depthLatch.firstTime())
            Log("%s: bppdepth:%d not supported.\n", kYuvToRgb, bppdepth);
        return;
    }
    if (!isVideoFormat(format)) {
        if (formatLatch.firstTime())
            Log("%s: format:%u not supported.\n", kYuvToRgb, format);
        return;
    }
    size_t size = 0, pitches[3] = {}, offsets[3] = {};
    if (!RasterComputeVideoAttributes(format, width, height, &size, pitches, offsets))
        return;

    if (format != RASTER_VIDEO_YV12) {
        const auto order =
            format == RASTER_VIDEO_YUY2 ? VideoGroupOrder::Yuy2 : VideoGroupOrder::Uyvy;
        const uint64_t groups = uint64_t{width} * height / 2;
        if (groups != 0)
            convertPackedFrame(dstBuffer, bppdepth, srcBuffer, order, groups);
        return;
    }
    const Size pairs = {width / 2, height / 2};
    if (pairs.empty())
        return;
    const auto plane = [&](int i) {
        return SrcRows{advance(srcBuffer, offsets[i]), static_cast<ptrdiff_t>(pitches[i])};
    };
    const DstRows dst = {dstBuffer, static_cast<ptrdiff_t>(width * bytesPerPixel)};
    convertPlanarFrame(dst, bppdepth, {plane(0), plane(1), plane(2)}, pairs);
}

// Unsigned, so that arguments of any size wrap.
uint32 RasterRGB_YUVtoBGRX(int32 y, int32 u, int32 v) {
    const uint32 t = (static_cast<uint32>(y) - 16) * 298;
    const uint32 d = static_cast<uint32>(u) - 128;
    const uint32 e = static_cast<uint32>(v) - 128;
    const uint32 red = channel(t + 409 * e);
    const uint32 green = channel(t - 100 * d - 208 * e);
    const uint32 blue = channel(t + 516 * d);
    return red << 16 | green << 8 | blue;
}

void Raster_ApplyColorKey(const uint8 *background, uint8 *dstBuffer, const uint8 *overlay,
                          const uint8 *keySurface, int32 backgroundLineIncrement,
                          int32 dstLineIncrement, int32 overlayLineIncrement,
                          int32 keyLineIncrement, uint32 key, uint32 x, uint32 y, uint32 width,
                          uint32 height, uint32 keyDepth) {
    const Size size = {width, height};
    if (size.empty())
        return;

    const KeyPixel keyPixel = keyDepth == 32   ? KeyPixel::Bytes4
                              : keyDepth == 16 ? KeyPixel::Bytes2
                                               : KeyPixel::Bytes1;
    const auto keyBytes = static_cast<int64_t>(keyPixel);
    const KeyedRows rows = {
        .dst = {pixelAddress(dstBuffer, dstLineIncrement, 4, x, y), dstLineIncrement},
        .background = {pixelAddress(background, backgroundLineIncrement, 4, x, y),
                       backgroundLineIncrement},
        .overlay = {overlay, overlayLineIncrement},
        .key = {pixelAddress(keySurface, keyLineIncrement, keyBytes, x, y), keyLineIncrement},
    };
    applyKeyRows(rows, size, keyPixel, key);
}
