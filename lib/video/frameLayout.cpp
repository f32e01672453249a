#include "video/frameLayout.h"

#include "core/latch.h"
#include <hearth/hearth.h>
#include <quillon/rasterVideo.h>

namespace quillon {
namespace {

constinit Latch attributesLatch;

size_t roundedUpToEven(uint32_t extent) {
    return (size_t{extent} + 1) & ~size_t{1};
}

} // namespace

bool layOutFrame(uint32_t format, uint32_t width, uint32_t height, size_t *size, size_t *pitches,
                 size_t *offsets) {
    if (offsets != nullptr)
        offsets[0] = 0;

    const size_t evenWidth = roundedUpToEven(width);
    const size_t evenHeight = roundedUpToEven(height);
    switch (format) {
    case RASTER_VIDEO_YUY2:
    case RASTER_VIDEO_UYVY:
        *size = 2 * evenWidth * height;
        return true;
    case RASTER_VIDEO_YV12: {
        const size_t luma = evenWidth * evenHeight;
        const size_t chroma = (evenWidth / 2) * (evenHeight / 2);
        *size = luma + 2 * chroma;
        if (pitches != nullptr) {
            pitches[0] = evenWidth;
            pitches[1] = pitches[2] = evenWidth / 2;
        }
        if (offsets != nullptr) {
            offsets[1] = luma;
            offsets[2] = luma + chroma;
        }
        return true;
    }
    default:
        *size = 0;
        if (attributesLatch.firstTime()) // the message is a fixed text of the interface
            Log("%s: format :%u not supported.\n", "RasterComputeVideoAttributes", format);
        return false;
    }
}

} // namespace quillon
