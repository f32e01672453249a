// The raster operations stated plainly, see raster.h beside this.
#pragma once

#include <quillonTypes.h>

namespace quillon::reference {

void rectRopFill(uint8 *frameBuffer, int32 lineIncrement, int32 bytesPerPixel, uint32 pixel,
                 uint32 rop, uint32 x, uint32 y, uint32 width, uint32 height);

void rectRopCopy(uint8 *dstBuffer, int32 dstLineIncrement, const uint8 *srcBuffer,
                 int32 srcLineIncrement, int32 bytesPerPixel, uint32 srcX, uint32 srcY, uint32 rop,
                 uint32 dstX, uint32 dstY, uint32 width, uint32 height);

} // namespace quillon::reference
