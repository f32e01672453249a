// Copies of rectangles.
#include <quillon/raster.h>

#include "copy/copyRows.h"
#include "core/surface.h"

using namespace quillon;

void Raster_RectCopy(uint8_t *dstBuffer, int32_t dstLineIncrement, const uint8_t *srcBuffer,
                     int32_t srcLineIncrement, int32_t bytesPerPixel, uint32_t srcX, uint32_t srcY,
                     uint32_t dstX, uint32_t dstY, uint32_t width, uint32_t height) {
    const Extent extent = {width, height};
    if (extent.empty() || bytesPerPixel <= 0)
        return;

    const SrcRows src = {pixelAddress(srcBuffer, srcLineIncrement, bytesPerPixel, srcX, srcY),
                         srcLineIncrement};
    const DstRows dst = {pixelAddress(dstBuffer, dstLineIncrement, bytesPerPixel, dstX, dstY),
                         dstLineIncrement};
    copyRows(dst, src, inBytes(extent, bytesPerPixel),
             srcY < dstY ? RowOrder::kUpward : RowOrder::kDownward);
}
