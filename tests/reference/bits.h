// Bit and stencil expansion stated plainly, see raster.h beside this.
#pragma once

#include <quillonTypes.h>

namespace quillon::reference {

void bitsToPixels(const uint8 *srcBits, int32 srcLineIncrement, uint8 *dstBuffer,
                  int32 dstLineIncrement, int32 bytesPerPixel, int32 width, uint32 height,
                  uint32 foreground, uint32 background);

void bitsToPixelsStencil(const uint8 *srcBits, int32 srcLineIncrement, uint8 *dstBuffer,
                         int32 dstLineIncrement, int32 bytesPerPixel, int32 width, uint32 height,
                         uint32 pixel);

} // namespace quillon::reference
