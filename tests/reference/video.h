// The video operations stated as plainly as they can be, as in raster.h beside
// this file.
#pragma once

#include <raster.h> // in brackets: there is a file of this name here

namespace quillon::reference {

// format and bppdepth have to be ones that there are.
void yuvToRgb(const uint8 *srcBuffer, uint8 *dstBuffer, uint32 width, uint32 height, uint32 format,
              int32 bppdepth);

uint32 yuvToBgrx(int32 y, int32 u, int32 v);

void applyColorKey(const uint8 *background, uint8 *dstBuffer, const uint8 *overlay,
                   const uint8 *keySurface, int32 backgroundLineIncrement, int32 dstLineIncrement,
                   int32 overlayLineIncrement, int32 keyLineIncrement, uint32 key, uint32 x,
                   uint32 y, uint32 width, uint32 height, uint32 keyDepth);

} // namespace quillon::reference
