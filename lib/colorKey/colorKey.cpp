// The colour key: an overlay shown where a third surface holds the key colour.
#include <quillon/rasterVideo.h>

#include "colorKey/colorKeyKernels.h"
#include "core/surface.h"

using namespace quillon;

void Raster_ApplyColorKey(const uint8_t *background, uint8_t *dstBuffer, const uint8_t *overlay,
                          const uint8_t *keySurface, int32_t backgroundLineIncrement,
                          int32_t dstLineIncrement, int32_t overlayLineIncrement,
                          int32_t keyLineIncrement, uint32_t key, uint32_t x, uint32_t y,
                          uint32_t width, uint32_t height, uint32_t keyDepth) {
    const Extent extent = {width, height};
    if (extent.empty())
        return;

    const int32_t keyBytes = keyDepth == 32 ? 4 : keyDepth == 16 ? 2 : 1;
    const ColorKeySurfaces surfaces = {
        .dst = {pixelAddress(dstBuffer, dstLineIncrement, 4, x, y), dstLineIncrement},
        .background = {pixelAddress(background, backgroundLineIncrement, 4, x, y),
                       backgroundLineIncrement},
        .overlay = {overlay, overlayLineIncrement},
        .keys = {pixelAddress(keySurface, keyLineIncrement, keyBytes, x, y), keyLineIncrement},
    };
    composeByKey(surfaces, extent, keyBytes, key);
}
