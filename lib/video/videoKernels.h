// The kernels of video frames.  Pixels come in pairs that share their chroma, so
// that every size is even, and none is 0.  bppdepth is 15, 16, 24 or 32.
#pragma once

#include "core/surface.h"

namespace quillon {

// Converts a run of interleaved pixels, which has no rows.  format is
// RASTER_VIDEO_YUY2 or RASTER_VIDEO_UYVY.
void convertInterleavedRun(uint8_t *dst, int32_t bppdepth, const uint8_t *src, uint32_t format,
                           size_t pixels);

struct VideoPlanes {
    SrcRows luma;
    SrcRows chromaHigh; // a sample for two by two pixels
    SrcRows chromaLow;
};

// Converts the rows of a planar frame.
void convertPlanarRows(DstRows dst, int32_t bppdepth, const VideoPlanes &src, Extent extent);

} // namespace quillon
