// Raster_AlphaBlendOver, over noise and over what windows are made of.
#include "operations.h"

#include <quillon/raster.h>

namespace quillon::bench {
namespace {

void addBlend(Plan &plan, const Area &area, const std::string &name, const Content &content) {
    plan.push_back({"blend " + name,
                    "blend " + name,
                    area,
                    {plane(area, 32, noise), plane(area, 32, content)},
                    Traffic::Change,
                    {{"quillon", Agreement::Exact, [](const Job &job) -> Work {
                          return [dst = job.dst, src = job.src()] {
                              Raster_AlphaBlendOver(dst.data, 0, 0, dst.line(), src.data, 0, 0,
                                                    src.line(), dst.width, dst.height);
                          };
                      }}}});
}

} // namespace

void addBlends(Plan &plan, const Area &area) {
    addBlend(plan, area, "noise", noise);
    addBlend(plan, area, "interface", interfacePixels);
}

} // namespace quillon::bench
