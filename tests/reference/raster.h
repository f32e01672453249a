// The pixel operations stated as plainly as they can be: one pixel at a time,
// in the order that raster.h tells, nothing prepared ahead and nothing made
// fast.  The library is held to these; they are held to raster.h by reading.
//
// Each takes the arguments of the exported function of its name, which have to
// be ones that the function accepts.
#pragma once

#include <raster.h> // in brackets: this file has the same name

namespace quillon::reference {

void rectFill(uint8 *frameBuffer, int32 lineIncrement, int32 bytesPerPixel, uint32 pixel, uint32 x,
              uint32 y, uint32 width, uint32 height);

void rectCopy(uint8 *dstBuffer, int64_t dstLineIncrement, const uint8 *srcBuffer,
              int64_t srcLineIncrement, int32 bytesPerPixel, uint32 srcX, uint32 srcY, uint32 dstX,
              uint32 dstY, uint32 width, uint32 height);

void rectFillAlpha(uint8 *frameBuffer, int32 lineIncrement, uint8 alpha, uint32 x, uint32 y,
                   uint32 width, uint32 height);

void alphaBlendOver(uint8 *dstBuffer, uint32 dstX, uint32 dstY, int32 dstLineIncrement,
                    const uint8 *srcBuffer, uint32 srcX, uint32 srcY, int32 srcLineIncrement,
                    uint32 width, uint32 height);

uint32 convertOnePixel(uint32 pixel, int32 srcDepth, int32 dstDepth);

// Also states the functions that are this with a depth, or both, fixed.
void convertPixels(uint8 *dstBuffer, uint32 dstLineIncrement, int32 dstDepth,
                   const uint8 *srcBuffer, uint32 srcLineIncrement, int32 srcDepth,
                   bool pseudoColor, const uint32 *palette, uint32 srcX, uint32 srcY, uint32 dstX,
                   uint32 dstY, uint32 width, uint32 height);

} // namespace quillon::reference
