// Raster_RectCopy: between surfaces, and within one as a window scrolls.
#include "measure.h"
#include "raster.h"

#include <cstring>

namespace quillon::bench {

void registerCopy() {
    constexpr uint32 kBytesPerPixel = 4;
    for (const Area &area : kAreas) {
        measure("copy32", area, "quillon", 2 * kBytesPerPixel, [=] {
            return [=, dst = Surface(area, kBytesPerPixel),
                    src = Surface(area, kBytesPerPixel)]() mutable {
                Raster_RectCopy(dst.data(), dst.signedIncrement(), src.data(),
                                src.signedIncrement(), kBytesPerPixel, area.left, 0, area.left, 0,
                                area.width, area.height);
            };
        });
        measure("copy32", area, "memcpy", 2 * kBytesPerPixel, [=] {
            return [=, dst = Surface(area, kBytesPerPixel),
                    src = Surface(area, kBytesPerPixel)]() mutable {
                eachRow(area, kBytesPerPixel, [&](size_t first, size_t count) {
                    std::memcpy(dst.data() + first, src.data() + first, count);
                });
            };
        });

        // All but one row of the area, a row further down.
        Area scrolled = area;
        --scrolled.height;
        measure("scroll32", scrolled, "quillon", 2 * kBytesPerPixel, [=] {
            return [=, surface = Surface(area, kBytesPerPixel)]() mutable {
                Raster_RectCopy(surface.data(), surface.signedIncrement(), surface.data(),
                                surface.signedIncrement(), kBytesPerPixel, area.left, 0, area.left,
                                1, scrolled.width, scrolled.height);
            };
        });
    }
}

} // namespace quillon::bench
