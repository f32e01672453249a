// The video operations stated as plainly as they can be, as in raster.h beside
// this file.
#pragma once

#include <raster.h> // in brackets: there is a file of this name here

namespace quillon::reference {

// format and bppdepth have to be ones that there are.
void yuvToRgb(const uint8 *srcBuffer, uint8 *dstBuffer, uint32 width, uint32 height, uint32 format,
              int32 bppdepth);

uint32 yuvToBgrx(int32 y, int32 u, int32 v);

} // namespace quillon::reference
