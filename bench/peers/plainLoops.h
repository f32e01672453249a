// The operations on rectangles as plain loops: one pixel at a time, nothing
// prepared ahead and nothing made fast.
//
// Each takes the arguments of the exported function of its name, which have to
// be ones that the function accepts.
#pragma once

#include <cstdint>

namespace quillon::bench::plain {

void rectFill(uint8_t *frameBuffer, int32_t lineIncrement, int32_t bytesPerPixel, uint32_t pixel, uint32_t x,
              uint32_t y, uint32_t width, uint32_t height);

void rectCopy(uint8_t *dstBuffer, int64_t dstLineIncrement, const uint8_t *srcBuffer,
              int64_t srcLineIncrement, int32_t bytesPerPixel, uint32_t srcX, uint32_t srcY, uint32_t dstX,
              uint32_t dstY, uint32_t width, uint32_t height);

void rectFillAlpha(uint8_t *frameBuffer, int32_t lineIncrement, uint8_t alpha, uint32_t x, uint32_t y,
                   uint32_t width, uint32_t height);

void alphaBlendOver(uint8_t *dstBuffer, uint32_t dstX, uint32_t dstY, int32_t dstLineIncrement,
                    const uint8_t *srcBuffer, uint32_t srcX, uint32_t srcY, int32_t srcLineIncrement,
                    uint32_t width, uint32_t height);

// Also states the functions that are this with a depth, or both, fixed.
void convertPixels(uint8_t *dstBuffer, uint32_t dstLineIncrement, int32_t dstDepth,
                   const uint8_t *srcBuffer, uint32_t srcLineIncrement, int32_t srcDepth,
                   bool pseudoColor, const uint32_t *palette, uint32_t srcX, uint32_t srcY, uint32_t dstX,
                   uint32_t dstY, uint32_t width, uint32_t height);

void rectRopFill(uint8_t *frameBuffer, int32_t lineIncrement, int32_t bytesPerPixel, uint32_t pixel,
                 uint32_t rop, uint32_t x, uint32_t y, uint32_t width, uint32_t height);

void rectRopCopy(uint8_t *dstBuffer, int32_t dstLineIncrement, const uint8_t *srcBuffer,
                 int32_t srcLineIncrement, int32_t bytesPerPixel, uint32_t srcX, uint32_t srcY, uint32_t rop,
                 uint32_t dstX, uint32_t dstY, uint32_t width, uint32_t height);

void bitsToPixels(const uint8_t *srcBits, int32_t srcLineIncrement, uint8_t *dstBuffer,
                  int32_t dstLineIncrement, int32_t bytesPerPixel, int32_t width, uint32_t height,
                  uint32_t foreground, uint32_t background);

void bitsToPixelsStencil(const uint8_t *srcBits, int32_t srcLineIncrement, uint8_t *dstBuffer,
                         int32_t dstLineIncrement, int32_t bytesPerPixel, int32_t width, uint32_t height,
                         uint32_t pixel);

void applyColorKey(const uint8_t *background, uint8_t *dstBuffer, const uint8_t *overlay,
                   const uint8_t *keySurface, int32_t backgroundLineIncrement, int32_t dstLineIncrement,
                   int32_t overlayLineIncrement, int32_t keyLineIncrement, uint32_t key, uint32_t x,
                   uint32_t y, uint32_t width, uint32_t height, uint32_t keyDepth);

} // namespace quillon::bench::plain
