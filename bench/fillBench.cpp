// Raster_RectFill and Raster_RectFillAlpha.
#include "measure.h"
#include "raster.h"

#include <cstring>

namespace quillon::bench {
namespace {

void registerDepth(const Area &area, uint32 bytesPerPixel) {
    const std::string operation = "fill" + std::to_string(8 * bytesPerPixel);
    measure(operation, area, "quillon", bytesPerPixel, [=] {
        return [=, surface = Surface(area, bytesPerPixel)]() mutable {
            Raster_RectFill(surface.data(), surface.signedIncrement(),
                            static_cast<int32>(bytesPerPixel), 0x12345678, area.left, 0, area.width,
                            area.height);
        };
    });
    measure(operation, area, "memset", bytesPerPixel, [=] {
        return [=, surface = Surface(area, bytesPerPixel)]() mutable {
            eachRow(area, bytesPerPixel, [&](size_t first, size_t count) {
                std::memset(surface.data() + first, 0x78, count);
            });
        };
    });
}

} // namespace

void registerFill() {
    for (const Area &area : kAreas) {
        for (const uint32 bytesPerPixel : {1U, 2U, 3U, 4U})
            registerDepth(area, bytesPerPixel);
        measure("fillAlpha", area, "quillon", 8, [=] {
            return [=, surface = Surface(area, 4)]() mutable {
                Raster_RectFillAlpha(surface.data(), surface.signedIncrement(), 255, area.left, 0,
                                     area.width, area.height);
            };
        });
    }
}

} // namespace quillon::bench
