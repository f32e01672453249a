// The scaler stated as plainly as it can be: one channel of one pixel at a
// time, nothing kept from one row to the next but whole scaled rows.
//
// Both functions take the arguments of the exported function of their name,
// which have to be ones that the function accepts.
#pragma once

#include "raster.h"

namespace quillon::reference {

uint32 scale(uint8 *dstBuffer, int32 dstLineIncrement, uint32 dstWidth, uint32 dstHeight,
             int32 left, int32 top, int32 right, int32 bottom, const uint8 *srcBuffer,
             int32 srcLineIncrement, uint32 srcWidth, uint32 srcHeight, double scaleX,
             double scaleY, uint32 filter);

// For factors that are finite.
void scaleSrcCoordinates(Rect *rect, uint32 srcWidth, uint32 srcHeight, double scaleX,
                         double scaleY);

} // namespace quillon::reference
