// Expansion of 1-bit bitmaps to pixels, opaque and as a stencil.
#include <quillon/raster.h>

#include "bits/bitsKernels.h"
#include "legacy/surface.h"

namespace quillon {
namespace {

bool isPixelSize(int32_t bytesPerPixel) {
    return bytesPerPixel >= 1 && bytesPerPixel <= 4;
}

} // namespace
} // namespace quillon

using namespace quillon;

void Raster_BitsToPixels(const uint8_t *srcBits, int32_t srcLineIncrement, uint8_t *dstBuffer,
                         int32_t dstLineIncrement, int32_t bytesPerPixel, int32_t width,
                         uint32_t height, uint32_t foreground, uint32_t background) {
    if (!isPixelSize(bytesPerPixel) || width < 1 || height == 0)
        return;
    bitsToPixelRows({dstBuffer, dstLineIncrement}, {srcBits, srcLineIncrement},
                    {static_cast<size_t>(width), height}, bytesPerPixel, foreground, background);
}

void RasterBitsToPixels8(const uint8_t *srcBits, int32_t srcLineIncrement, uint8_t *dstBuffer,
                         int32_t dstLineIncrement, int32_t width, uint32_t height,
                         uint32_t foreground, uint32_t background) {
    Raster_BitsToPixels(srcBits, srcLineIncrement, dstBuffer, dstLineIncrement, 1, width, height,
                        foreground, background);
}

void RasterBitsToPixels16(const uint8_t *srcBits, int32_t srcLineIncrement, uint8_t *dstBuffer,
                          int32_t dstLineIncrement, int32_t width, uint32_t height,
                          uint32_t foreground, uint32_t background) {
    Raster_BitsToPixels(srcBits, srcLineIncrement, dstBuffer, dstLineIncrement, 2, width, height,
                        foreground, background);
}

void RasterBitsToPixels24(const uint8_t *srcBits, int32_t srcLineIncrement, uint8_t *dstBuffer,
                          int32_t dstLineIncrement, int32_t width, uint32_t height,
                          uint32_t foreground, uint32_t background) {
    Raster_BitsToPixels(srcBits, srcLineIncrement, dstBuffer, dstLineIncrement, 3, width, height,
                        foreground, background);
}

void RasterBitsToPixels32(const uint8_t *srcBits, int32_t srcLineIncrement, uint8_t *dstBuffer,
                          int32_t dstLineIncrement, int32_t width, uint32_t height,
                          uint32_t foreground, uint32_t background) {
    Raster_BitsToPixels(srcBits, srcLineIncrement, dstBuffer, dstLineIncrement, 4, width, height,
                        foreground, background);
}

void Raster_BitsToPixelsStencil(const uint8_t *srcBits, int32_t srcLineIncrement,
                                uint8_t *dstBuffer, int32_t dstLineIncrement, int32_t bytesPerPixel,
                                int32_t width, uint32_t height, uint32_t pixel) {
    if (!isPixelSize(bytesPerPixel) || width < 1 || height == 0)
        return;
    stencilRows({dstBuffer, dstLineIncrement}, {srcBits, srcLineIncrement},
                {static_cast<size_t>(width), height}, bytesPerPixel, pixel);
}

void RasterBitsToPixelsStencil8(const uint8_t *srcBits, int32_t srcLineIncrement,
                                uint8_t *dstBuffer, int32_t dstLineIncrement, int32_t width,
                                uint32_t height, uint32_t pixel) {
    Raster_BitsToPixelsStencil(srcBits, srcLineIncrement, dstBuffer, dstLineIncrement, 1, width,
                               height, pixel);
}

void RasterBitsToPixelsStencil16(const uint8_t *srcBits, int32_t srcLineIncrement,
                                 uint8_t *dstBuffer, int32_t dstLineIncrement, int32_t width,
                                 uint32_t height, uint32_t pixel) {
    Raster_BitsToPixelsStencil(srcBits, srcLineIncrement, dstBuffer, dstLineIncrement, 2, width,
                               height, pixel);
}

void RasterBitsToPixelsStencil24(const uint8_t *srcBits, int32_t srcLineIncrement,
                                 uint8_t *dstBuffer, int32_t dstLineIncrement, int32_t width,
                                 uint32_t height, uint32_t pixel) {
    Raster_BitsToPixelsStencil(srcBits, srcLineIncrement, dstBuffer, dstLineIncrement, 3, width,
                               height, pixel);
}

void RasterBitsToPixelsStencil32(const uint8_t *srcBits, int32_t srcLineIncrement,
                                 uint8_t *dstBuffer, int32_t dstLineIncrement, int32_t width,
                                 uint32_t height, uint32_t pixel) {
    Raster_BitsToPixelsStencil(srcBits, srcLineIncrement, dstBuffer, dstLineIncrement, 4, width,
                               height, pixel);
}
