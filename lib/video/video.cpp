// YUV to RGB: frames, and one pixel.
#include <quillon/rasterVideo.h>

#include "core/latch.h"
#include "core/surface.h"
#include "video/frameLayout.h"
#include "video/videoFormats.h"
#include "video/videoKernels.h"
#include <hearth/hearth.h>

#include <algorithm>

namespace quillon {
namespace {

constinit Latch depthLatch;
constinit Latch formatLatch;

constexpr char kYuvToRgb[] = "Raster_YUVtoRGB";

bool isVideoFormat(uint32_t format) {
    return format == RASTER_VIDEO_YUY2 || format == RASTER_VIDEO_UYVY ||
           format == RASTER_VIDEO_YV12;
}

// A result of the formula before its shift, clamped to 8 bits after it.
uint32_t channel(uint32_t sum) {
    return static_cast<uint32_t>(std::clamp(static_cast<int32_t>(sum) >> 8, 0, 255));
}

} // namespace
} // namespace quillon

using namespace quillon;

void Raster_YUVtoRGB(const uint8_t *srcBuffer, uint8_t *dstBuffer, uint32_t width, uint32_t height,
                     uint32_t format, int32_t bppdepth) {
    const VideoPixelLayout *layout = videoLayoutAt(bppdepth);
    if (layout == nullptr) {
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
    if (!layOutFrame(format, width, height, &size, pitches, offsets))
        return;

    // Pixels come in pairs; what is odd is left alone.
    if (format != RASTER_VIDEO_YV12) {
        const uint64_t pixels = uint64_t{width} * height & ~uint64_t{1};
        if (pixels != 0)
            convertInterleavedRun(dstBuffer, bppdepth, srcBuffer, format, pixels);
        return;
    }
    const Extent even = {width & ~1u, height & ~1u};
    if (even.empty())
        return;
    const auto plane = [&](int i) {
        return SrcRows{advance(srcBuffer, offsets[i]), static_cast<ptrdiff_t>(pitches[i])};
    };
    const DstRows dst = {dstBuffer, static_cast<ptrdiff_t>(size_t{width} * layout->bytesPerPixel)};
    convertPlanarRows(dst, bppdepth, {plane(0), plane(1), plane(2)}, even);
}

// Unsigned, so that arguments of any size wrap.
uint32_t RasterRGB_YUVtoBGRX(int32_t y, int32_t u, int32_t v) {
    const uint32_t t = (static_cast<uint32_t>(y) - 16) * 298;
    const uint32_t d = static_cast<uint32_t>(u) - 128;
    const uint32_t e = static_cast<uint32_t>(v) - 128;
    const uint32_t red = channel(t + 409 * e);
    const uint32_t green = channel(t - 100 * d - 208 * e);
    const uint32_t blue = channel(t + 516 * d);
    return red << 16 | green << 8 | blue;
}
