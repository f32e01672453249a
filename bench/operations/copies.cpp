// Raster_RectCopy, between surfaces and within one, and Raster_RectROPcopy.
#include "operations.h"

#include "names.h"
#include <quillon/raster.h>

#include <cstring>

namespace quillon::bench {
namespace {

void addCopy(Plan &plan, const Area &area, uint32_t bits) {
    const auto bytes = static_cast<int32_t>(bits / 8);
    plan.push_back({"copy " + std::to_string(bits),
                    "copy",
                    area,
                    {plane(area, bits, noise), plane(area, bits, noise)},
                    Traffic::Write,
                    {{"quillon", Agreement::Exact, [=](const Job &job) -> Work {
                          return [=, dst = job.dst, src = job.src()] {
                              Raster_RectCopy(dst.data, dst.line(), src.data, src.line(), bytes, 0,
                                              0, 0, 0, dst.width, dst.height);
                          };
                      }}}});
}

// Within one surface, by lines and pixels: what memmove does row by row.
void addScroll(Plan &plan, const Area &area, const std::string &name, uint32_t fromX, uint32_t fromY,
               uint32_t toX, uint32_t toY) {
    if (area.width <= fromX + toX || area.height <= fromY + toY)
        return;
    const auto ours = [=](const Job &job) -> Work {
        return [=, dst = job.dst] {
            Raster_RectCopy(dst.data, dst.line(), dst.data, dst.line(), 4, fromX, fromY, toX, toY,
                            dst.width - fromX - toX, dst.height - fromY - toY);
        };
    };
    const auto theirs = [=](const Job &job) -> Work {
        return [=, dst = job.dst] {
            const uint32_t rows = dst.height - fromY - toY;
            const size_t bytes = size_t{4} * (dst.width - fromX - toX);
            for (uint32_t i = 0; i < rows; ++i) {
                const uint32_t row = fromY < toY ? rows - 1 - i : i;
                std::memmove(dst.data + (toY + row) * dst.step + size_t{4} * toX,
                             dst.data + (fromY + row) * dst.step + size_t{4} * fromX, bytes);
            }
        };
    };
    plan.push_back({"scroll " + name,
                    "scroll",
                    area,
                    {plane(area, 32, noise)},
                    Traffic::None,
                    {{"quillon", Agreement::Exact, ours}, {"memmove", Agreement::Exact, theirs}}});
}

void addRasterCopy(Plan &plan, const Area &area, uint32_t rop, uint32_t bits) {
    const auto bytes = static_cast<int32_t>(bits / 8);
    std::vector<Plane> planes = {plane(area, bits, noise)};
    if (rop != RASTER_ROP_INVERT && rop != RASTER_ROP_CLEAR && rop != RASTER_ROP_SET)
        planes.push_back(plane(area, bits, noise));
    plan.push_back({"raster copy " + ropName(rop) + " " + std::to_string(bits),
                    ropFamily("raster copy", rop),
                    area,
                    planes,
                    ropReadsDestination(rop) ? Traffic::Change : Traffic::Write,
                    {{"quillon", Agreement::Exact, [=](const Job &job) -> Work {
                          const Buffer src = job.sourceCount > 0 ? job.src() : job.dst;
                          return [=, dst = job.dst] {
                              Raster_RectROPcopy(dst.data, dst.line(), src.data, src.line(), bytes,
                                                 0, 0, rop, 0, 0, dst.width, dst.height);
                          };
                      }}}});
}

} // namespace

void addCopies(Plan &plan, const Area &area) {
    for (const uint32_t bits : {8, 16, 24, 32})
        addCopy(plan, area, bits);
    addScroll(plan, area, "up", 0, 8, 0, 0);
    addScroll(plan, area, "down", 0, 0, 0, 8);
    addScroll(plan, area, "right", 0, 0, 3, 0);
    for (uint32_t rop = 0; rop < 16; ++rop) {
        if (rop != RASTER_ROP_NOOP)
            addRasterCopy(plan, area, rop, 32);
    }
    for (const uint32_t bits : {8, 16, 24})
        addRasterCopy(plan, area, RASTER_ROP_XOR, bits);
}

} // namespace quillon::bench
