// Raster_YUVtoRGB and Raster_ApplyColorKey.
#include "operations.h"

#include <quillon/raster.h>

namespace quillon::bench {
namespace {

uint32_t bitsOf(int32_t depth) {
    return depth == 15 ? 16 : static_cast<uint32_t>(depth);
}

void addFrame(Plan &plan, Area area, const std::string &name, uint32_t format, int32_t depth) {
    area.surfaceWidth = 0; // frames have no gaps
    const bool planar = format == RASTER_VIDEO_YV12;
    // A YV12 frame is its planes one behind the other: as rows of luma, half more.
    area.width += planar && area.width % 2;
    const Plane frame = {area.width,
                         planar ? (area.height + 1) / 2 * 3 : area.height,
                         planar ? 8U : 16U,
                         0,
                         noise,
                         0,
                         0};
    plan.push_back({name + " to " + std::to_string(depth),
                    planar        ? (depth == 32 ? "planar video to 32" : "planar video")
                    : depth == 32 ? "packed video to 32"
                                  : "packed video",
                    area,
                    {plane(area, bitsOf(depth), noise), frame},
                    Traffic::Write,
                    {{"quillon", Agreement::Exact, [=](const Job &job) -> Work {
                          return [=, dst = job.dst, src = job.src()] {
                              Raster_YUVtoRGB(src.data, dst.data, dst.width, dst.height, format,
                                              depth);
                          };
                      }}}});
}

void addKey(Plan &plan, const Area &area, uint32_t depth) {
    // Nearly all noise differs from the key at 16 bits and more; at 8 one in 256
    // matches.  A key surface of two pixels by turns of its random bits has both.
    const uint32_t bits = (depth + 7) / 8 * 8;
    const Content keys = [bits](uint8_t *bytes, size_t count) {
        noise(bytes, count);
        const size_t pixelBytes = bits / 8;
        for (size_t i = 0; i + pixelBytes <= count; i += pixelBytes) {
            const bool match = bytes[i] & 1;
            for (size_t byte = 0; byte < pixelBytes; ++byte)
                bytes[i + byte] = match ? static_cast<uint8_t>(kPixel >> (8 * byte)) : 0;
        }
    };
    plan.push_back({"key " + std::to_string(depth),
                    "key",
                    area,
                    {plane(area, 32, noise), plane(area, 32, noise), plane(area, 32, noise),
                     plane(area, bits, keys)},
                    Traffic::Write,
                    {{"quillon", Agreement::Exact, [=](const Job &job) -> Work {
                          return [=] {
                              const Buffer &dst = job.dst;
                              Raster_ApplyColorKey(job.sources[0].data, dst.data,
                                                   job.sources[1].data, job.sources[2].data,
                                                   job.sources[0].line(), dst.line(),
                                                   job.sources[1].line(), job.sources[2].line(),
                                                   kPixel, 0, 0, dst.width, dst.height, depth);
                          };
                      }}}});
}

} // namespace

void addVideo(Plan &plan, const Area &area) {
    // Frames have no gaps: in a surface they would only be measured twice.
    const bool isRepeated = area.surfaceWidth != 0 && area.width > 32;
    for (const int32_t depth : {15, 16, 24, 32}) {
        if (isRepeated)
            break;
        addFrame(plan, area, "YUY2", RASTER_VIDEO_YUY2, depth);
        addFrame(plan, area, "UYVY", RASTER_VIDEO_UYVY, depth);
        addFrame(plan, area, "YV12", RASTER_VIDEO_YV12, depth);
    }
    for (const uint32_t depth : {8, 16, 32})
        addKey(plan, area, depth);
}

} // namespace quillon::bench
