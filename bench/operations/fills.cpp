// Raster_RectFill, Raster_RectFillAlpha, and Raster_RectROPfill with every code.
#include "operations.h"

#include "names.h"
#include <quillon/raster.h>

namespace quillon::bench {
namespace {

void addFill(Plan &plan, const Area &area, uint32_t bits) {
    const auto bytes = static_cast<int32_t>(bits / 8);
    plan.push_back({"fill " + std::to_string(bits),
                    "fill",
                    area,
                    {plane(area, bits, noise)},
                    Traffic::Write,
                    {{"quillon", Agreement::Exact, [=](const Job &job) -> Work {
                          return [=, dst = job.dst] {
                              Raster_RectFill(dst.data, dst.line(), bytes, kPixel, 0, 0, dst.width,
                                              dst.height);
                          };
                      }}}});
}

void addAlphaFill(Plan &plan, const Area &area) {
    plan.push_back({"alpha fill",
                    "fill",
                    area,
                    {plane(area, 32, noise)},
                    Traffic::Change,
                    {{"quillon", Agreement::Exact, [](const Job &job) -> Work {
                          return [dst = job.dst] {
                              Raster_RectFillAlpha(dst.data, dst.line(), kAlpha, 0, 0, dst.width,
                                                   dst.height);
                          };
                      }}}});
}

void addRasterFill(Plan &plan, const Area &area, uint32_t rop, uint32_t bits) {
    const auto bytes = static_cast<int32_t>(bits / 8);
    plan.push_back({"raster fill " + ropName(rop) + " " + std::to_string(bits),
                    ropFamily("raster fill", rop),
                    area,
                    {plane(area, bits, noise)},
                    ropReadsDestination(rop) ? Traffic::Change : Traffic::Write,
                    {{"quillon", Agreement::Exact, [=](const Job &job) -> Work {
                          return [=, dst = job.dst] {
                              Raster_RectROPfill(dst.data, dst.line(), bytes, kPixel, rop, 0, 0,
                                                 dst.width, dst.height);
                          };
                      }}}});
}

} // namespace

void addFills(Plan &plan, const Area &area) {
    for (const uint32_t bits : {8, 16, 24, 32})
        addFill(plan, area, bits);
    addAlphaFill(plan, area);
    for (uint32_t rop = 0; rop < 16; ++rop) {
        if (rop == RASTER_ROP_NOOP)
            continue;
        addRasterFill(plan, area, rop, 32);
    }
    for (const uint32_t bits : {8, 16, 24})
        addRasterFill(plan, area, RASTER_ROP_XOR, bits);
}

} // namespace quillon::bench
