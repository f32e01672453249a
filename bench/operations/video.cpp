#include "operations.h"

namespace quillon::bench {
namespace {

void addFrame(Plan &plan, const char *name, uint32_t format, int32_t depth) {
    const bool isPlanar = format == RASTER_VIDEO_YV12;
    // Frames are packed.  The planes of YV12, one behind the other, have the bytes
    // of one and a half as many rows of luma.
    Area area = plan.area;
    area.surfaceWidth = 0;
    area.width += isPlanar && area.width % 2;
    Area srcArea = area;
    if (isPlanar)
        srcArea.height = (area.height + 1) / 2 * 3;
    plan.add(text(name, " to ", depth), isPlanar ? "planar video" : "interleaved video",
             Traffic::Write,
             {{depth == 15 ? 16U : static_cast<uint32_t>(depth), noise, area},
              {isPlanar ? 8U : 16U, noise, srcArea}},
             [=](const Buffer &dst, const Buffer &src) {
                 Raster_YUVtoRGB(src.data, dst.data, dst.width, dst.height, format, depth);
             });
}

} // namespace

void addVideo(Plan &plan) {
    if (plan.area.surfaceWidth != 0 && plan.area.width > 32)
        return; // the same frames as with contiguous rows
    for (const int32_t depth : {15, 16, 24, 32}) {
        addFrame(plan, "YUY2", RASTER_VIDEO_YUY2, depth);
        addFrame(plan, "UYVY", RASTER_VIDEO_UYVY, depth);
        addFrame(plan, "YV12", RASTER_VIDEO_YV12, depth);
    }
}

} // namespace quillon::bench
