// Expansion of 1-bit bitmaps to pixels, opaque and as a stencil.
#include <quillon/raster.h>

#include "bits/bitsKernels.h"
#include "core/surface.h"

namespace quillon {
namespace {

// Contiguous rows of whole bytes are one long row.
Extent joinRows(DstRows dst, SrcRows bits, Extent extent, int32_t bytesPerPixel) {
    const bool isContiguous = extent.width % 8 == 0 &&
                              areContiguous(dst, inBytes(extent, bytesPerPixel).rowBytes) &&
                              areContiguous(bits, extent.width / 8);
    return isContiguous ? asOneRow(extent) : extent;
}

void expand(DstRows dst, SrcRows bits, int32_t bytesPerPixel, int32_t width, uint32_t height,
            uint32_t foreground, uint32_t background) {
    if (!isPixelSize(bytesPerPixel) || width < 1 || height == 0)
        return;
    const Extent extent = {static_cast<size_t>(width), height};
    expandBitRows(dst, bits, joinRows(dst, bits, extent, bytesPerPixel), bytesPerPixel, foreground,
                  background);
}

void stencil(DstRows dst, SrcRows bits, int32_t bytesPerPixel, int32_t width, uint32_t height,
             uint32_t pixel) {
    if (!isPixelSize(bytesPerPixel) || width < 1 || height == 0)
        return;
    const Extent extent = {static_cast<size_t>(width), height};
    stencilBitRows(dst, bits, joinRows(dst, bits, extent, bytesPerPixel), bytesPerPixel, pixel);
}

} // namespace
} // namespace quillon

using namespace quillon;

void Raster_BitsToPixels(const uint8_t *srcBits, int32_t srcLineIncrement, uint8_t *dstBuffer,
                         int32_t dstLineIncrement, int32_t bytesPerPixel, int32_t width,
                         uint32_t height, uint32_t foreground, uint32_t background) {
    expand({dstBuffer, dstLineIncrement}, {srcBits, srcLineIncrement}, bytesPerPixel, width, height,
           foreground, background);
}

void RasterBitsToPixels8(const uint8_t *srcBits, int32_t srcLineIncrement, uint8_t *dstBuffer,
                         int32_t dstLineIncrement, int32_t width, uint32_t height,
                         uint32_t foreground, uint32_t background) {
    expand({dstBuffer, dstLineIncrement}, {srcBits, srcLineIncrement}, 1, width, height, foreground,
           background);
}

void RasterBitsToPixels16(const uint8_t *srcBits, int32_t srcLineIncrement, uint8_t *dstBuffer,
                          int32_t dstLineIncrement, int32_t width, uint32_t height,
                          uint32_t foreground, uint32_t background) {
    expand({dstBuffer, dstLineIncrement}, {srcBits, srcLineIncrement}, 2, width, height, foreground,
           background);
}

void RasterBitsToPixels24(const uint8_t *srcBits, int32_t srcLineIncrement, uint8_t *dstBuffer,
                          int32_t dstLineIncrement, int32_t width, uint32_t height,
                          uint32_t foreground, uint32_t background) {
    expand({dstBuffer, dstLineIncrement}, {srcBits, srcLineIncrement}, 3, width, height, foreground,
           background);
}

void RasterBitsToPixels32(const uint8_t *srcBits, int32_t srcLineIncrement, uint8_t *dstBuffer,
                          int32_t dstLineIncrement, int32_t width, uint32_t height,
                          uint32_t foreground, uint32_t background) {
    expand({dstBuffer, dstLineIncrement}, {srcBits, srcLineIncrement}, 4, width, height, foreground,
           background);
}

void Raster_BitsToPixelsStencil(const uint8_t *srcBits, int32_t srcLineIncrement,
                                uint8_t *dstBuffer, int32_t dstLineIncrement, int32_t bytesPerPixel,
                                int32_t width, uint32_t height, uint32_t pixel) {
    stencil({dstBuffer, dstLineIncrement}, {srcBits, srcLineIncrement}, bytesPerPixel, width,
            height, pixel);
}

void RasterBitsToPixelsStencil8(const uint8_t *srcBits, int32_t srcLineIncrement,
                                uint8_t *dstBuffer, int32_t dstLineIncrement, int32_t width,
                                uint32_t height, uint32_t pixel) {
    stencil({dstBuffer, dstLineIncrement}, {srcBits, srcLineIncrement}, 1, width, height, pixel);
}

void RasterBitsToPixelsStencil16(const uint8_t *srcBits, int32_t srcLineIncrement,
                                 uint8_t *dstBuffer, int32_t dstLineIncrement, int32_t width,
                                 uint32_t height, uint32_t pixel) {
    stencil({dstBuffer, dstLineIncrement}, {srcBits, srcLineIncrement}, 2, width, height, pixel);
}

void RasterBitsToPixelsStencil24(const uint8_t *srcBits, int32_t srcLineIncrement,
                                 uint8_t *dstBuffer, int32_t dstLineIncrement, int32_t width,
                                 uint32_t height, uint32_t pixel) {
    stencil({dstBuffer, dstLineIncrement}, {srcBits, srcLineIncrement}, 3, width, height, pixel);
}

void RasterBitsToPixelsStencil32(const uint8_t *srcBits, int32_t srcLineIncrement,
                                 uint8_t *dstBuffer, int32_t dstLineIncrement, int32_t width,
                                 uint32_t height, uint32_t pixel) {
    stencil({dstBuffer, dstLineIncrement}, {srcBits, srcLineIncrement}, 4, width, height, pixel);
}
