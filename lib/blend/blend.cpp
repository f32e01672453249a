// Compositing of premultiplied pixels.
#include <quillon/raster.h>

#include "blend/blendKernels.h"
#include "core/surface.h"

using namespace quillon;

void Raster_AlphaBlendOver(uint8_t *dstBuffer, uint32_t dstX, uint32_t dstY,
                           int32_t dstLineIncrement, const uint8_t *srcBuffer, uint32_t srcX,
                           uint32_t srcY, int32_t srcLineIncrement, uint32_t width,
                           uint32_t height) {
    const Extent extent = {width, height};
    if (extent.empty())
        return;

    const DstRows dst = {pixelAddress(dstBuffer, dstLineIncrement, 4, dstX, dstY),
                         dstLineIncrement};
    const SrcRows src = {pixelAddress(srcBuffer, srcLineIncrement, 4, srcX, srcY),
                         srcLineIncrement};
    blendOverRows(dst, src, extent);
}
