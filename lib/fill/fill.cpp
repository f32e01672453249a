// Solid fill, and the fill of the alpha byte.
#include <quillon/raster.h>

#include "core/failure.h"
#include "core/surface.h"
#include "fill/fillKernels.h"

using namespace quillon;

void Raster_RectFill(uint8_t *frameBuffer, int32_t lineIncrement, int32_t bytesPerPixel,
                     uint32_t pixel, uint32_t x, uint32_t y, uint32_t width, uint32_t height) {
    if (!isPixelSize(bytesPerPixel)) {
        rejectPixelSize();
        return;
    }
    const Extent extent = {width, height};
    if (extent.empty())
        return;

    const DstRows dst = {pixelAddress(frameBuffer, lineIncrement, bytesPerPixel, x, y),
                         strideInWholePixels(lineIncrement, bytesPerPixel)};
    fillRows(dst, extent, bytesPerPixel, pixel);
}

void Raster_RectFillAlpha(uint8_t *frameBuffer, int32_t lineIncrement, uint8_t alpha, uint32_t x,
                          uint32_t y, uint32_t width, uint32_t height) {
    const Extent extent = {width, height};
    if (extent.empty())
        return;

    const DstRows dst = {pixelAddress(frameBuffer, lineIncrement, 4, x, y), lineIncrement};
    fillAlphaRows(dst, extent, alpha);
}
