// Raster_Scale.  Sizes are those of the source; the bytes are all of the source and
// all of the destination, also where nearest sampling skips some.
#include "measure.h"
#include "raster.h"

namespace quillon::bench {
namespace {

void registerFactor(const Area &area, const std::string &name, double factor, uint32 filter) {
    Area scaled = area;
    scaled.width = scaled.surfaceWidth = static_cast<uint32>(area.width * factor);
    scaled.height = static_cast<uint32>(area.height * factor);
    measure(name + "/" + area.name + "/quillon", scaled.pixels(),
            4 * (area.pixels() + scaled.pixels()), [=] {
                return [=, dst = Surface(scaled, 4), src = Surface(area, 4)]() mutable {
                    Raster_Scale(dst.data(), dst.signedIncrement(), scaled.width, scaled.height, 0,
                                 0, static_cast<int32>(scaled.width),
                                 static_cast<int32>(scaled.height), src.data(),
                                 src.signedIncrement(), area.width, area.height, factor, factor,
                                 filter);
                };
            });
}

} // namespace

void registerScale() {
    constexpr Area kSources[] = {
        {"32x32", 0, 32, 32, 32},
        {"256x128", 0, 256, 128, 256},
        {"1920x1080", 0, 1920, 1080, 1920},
    };
    constexpr struct {
        const char *name;
        double value;
    } kFactors[] = {{"2", 2}, {"1.5", 1.5}, {"0.7", 0.7}, {"0.5", 0.5}, {"0.2", 0.2}};
    for (const Area &area : kSources) {
        for (const auto &factor : kFactors) {
            const std::string filtered = factor.value > 1 ? "scaleLinear" : "scaleBox";
            registerFactor(area, std::string("scaleNearest") + factor.name, factor.value, 0);
            registerFactor(area, filtered + factor.name, factor.value, 2);
        }
    }
}

} // namespace quillon::bench
