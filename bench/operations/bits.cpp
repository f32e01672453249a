// Raster_BitsToPixels and Raster_BitsToPixelsStencil: letters, noise, and here and
// there a pixel.
#include "operations.h"

#include <quillon/raster.h>

namespace quillon::bench {
namespace {

void addOpaque(Plan &plan, const Area &area, const std::string &name, const Content &content,
               uint32_t bits) {
    const auto bytes = static_cast<int32_t>(bits / 8);
    plan.push_back({"bits " + name + " to " + std::to_string(bits),
                    "bits",
                    area,
                    {plane(area, bits, noise), plane(area, 1, content)},
                    Traffic::Write,
                    {{"quillon", Agreement::Exact, [=](const Job &job) -> Work {
                          return [=, dst = job.dst, src = job.src()] {
                              Raster_BitsToPixels(src.data, src.line(), dst.data, dst.line(), bytes,
                                                  static_cast<int32_t>(dst.width), dst.height,
                                                  kForeground, kBackground);
                          };
                      }}}});
}

void addStencil(Plan &plan, const Area &area, const std::string &name, const Content &content,
                uint32_t bits) {
    const auto bytes = static_cast<int32_t>(bits / 8);
    plan.push_back({"stencil " + name + " to " + std::to_string(bits),
                    "stencil",
                    area,
                    {plane(area, bits, noise), plane(area, 1, content)},
                    Traffic::Change,
                    {{"quillon", Agreement::Exact, [=](const Job &job) -> Work {
                          return [=, dst = job.dst, src = job.src()] {
                              Raster_BitsToPixelsStencil(src.data, src.line(), dst.data, dst.line(),
                                                         bytes, static_cast<int32_t>(dst.width),
                                                         dst.height, kForeground);
                          };
                      }}}});
}

} // namespace

void addBits(Plan &plan, const Area &area) {
    for (const uint32_t bits : {8, 16, 24, 32}) {
        addOpaque(plan, area, "noise", noise, bits);
        addStencil(plan, area, "text", textBits, bits);
        addStencil(plan, area, "noise", noise, bits);
        addStencil(plan, area, "sparse", sparseBits, bits);
    }
}

} // namespace quillon::bench
