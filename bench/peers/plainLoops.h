// The operations on rectangles as plain loops: one pixel at a time, nothing
// prepared ahead and nothing made fast.
//
// Each takes the arguments of the exported function of its name, which have to
// be ones that the function accepts.
#pragma once

#include <quillonTypes.h>

namespace quillon::bench::plain {

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

// Also states the functions that are this with a depth, or both, fixed.
void convertPixels(uint8 *dstBuffer, uint32 dstLineIncrement, int32 dstDepth,
                   const uint8 *srcBuffer, uint32 srcLineIncrement, int32 srcDepth,
                   bool pseudoColor, const uint32 *palette, uint32 srcX, uint32 srcY, uint32 dstX,
                   uint32 dstY, uint32 width, uint32 height);

void rectRopFill(uint8 *frameBuffer, int32 lineIncrement, int32 bytesPerPixel, uint32 pixel,
                 uint32 rop, uint32 x, uint32 y, uint32 width, uint32 height);

void rectRopCopy(uint8 *dstBuffer, int32 dstLineIncrement, const uint8 *srcBuffer,
                 int32 srcLineIncrement, int32 bytesPerPixel, uint32 srcX, uint32 srcY, uint32 rop,
                 uint32 dstX, uint32 dstY, uint32 width, uint32 height);

void bitsToPixels(const uint8 *srcBits, int32 srcLineIncrement, uint8 *dstBuffer,
                  int32 dstLineIncrement, int32 bytesPerPixel, int32 width, uint32 height,
                  uint32 foreground, uint32 background);

void bitsToPixelsStencil(const uint8 *srcBits, int32 srcLineIncrement, uint8 *dstBuffer,
                         int32 dstLineIncrement, int32 bytesPerPixel, int32 width, uint32 height,
                         uint32 pixel);

void applyColorKey(const uint8 *background, uint8 *dstBuffer, const uint8 *overlay,
                   const uint8 *keySurface, int32 backgroundLineIncrement, int32 dstLineIncrement,
                   int32 overlayLineIncrement, int32 keyLineIncrement, uint32 key, uint32 x,
                   uint32 y, uint32 width, uint32 height, uint32 keyDepth);

} // namespace quillon::bench::plain
