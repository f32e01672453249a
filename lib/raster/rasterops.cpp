// Rectangle routines: fill, copy, alpha, raster operations, bit expansion.

#include "raster.h"

#include "core/failure.h"
#include "core/surface.h"
#include "raster/copyRows.h"
#include "raster/rasterBitsKernels.h"
#include "raster/rasterRopKernels.h"
#include "raster/rasteropsKernels.h"
#include "raster/rop.h"

namespace quillon {
namespace {

constexpr char kUnit[] = "lib/raster/rasterops";

[[gnu::cold]] void rejectDepth(int line = __builtin_LINE()) {
    Warning("Raster: Unsupported frame buffer depth\n");
    panicNotImplemented(kUnit, line);
}

bool isPixelSize(int32 bytesPerPixel) {
    return bytesPerPixel >= 1 && bytesPerPixel <= 4;
}

// Combines rows with a constant, where the operation is one that does something.
void ropRows(DstRows dst, Size size, int32 bytesPerPixel, uint32 pixel, uint32 rop) {
    const RopConstant constant = ropConstant(rop, pixel);
    if (ropIgnoresDestination(rop)) {
        fillRows(dst, size, bytesPerPixel, constant.flip);
        return;
    }
    const Size bytes = {size.width * static_cast<size_t>(bytesPerPixel), size.height};
    ropFillRows(dst, bytes, bytesPerPixel, constant.keep, constant.flip);
}

} // namespace
} // namespace quillon

using namespace quillon;

void Raster_RectFill(uint8 *frameBuffer, int32 lineIncrement, int32 bytesPerPixel, uint32 pixel,
                     uint32 x, uint32 y, uint32 width, uint32 height) {
    if (!isPixelSize(bytesPerPixel)) {
        rejectDepth();
        return;
    }
    const Size size = {width, height};
    if (size.empty())
        return;

    const DstRows dst = {pixelAddress(frameBuffer, lineIncrement, bytesPerPixel, x, y),
                         wholePixels(lineIncrement, bytesPerPixel)};
    fillRows(dst, size, bytesPerPixel, pixel);
}

void Raster_RectCopy(uint8 *dstBuffer, int32 dstLineIncrement, const uint8 *srcBuffer,
                     int32 srcLineIncrement, int32 bytesPerPixel, uint32 srcX, uint32 srcY,
                     uint32 dstX, uint32 dstY, uint32 width, uint32 height) {
    const Size size = {width, height};
    if (size.empty() || bytesPerPixel <= 0)
        return;

    const SrcRows src = {pixelAddress(srcBuffer, srcLineIncrement, bytesPerPixel, srcX, srcY),
                         srcLineIncrement};
    const DstRows dst = {pixelAddress(dstBuffer, dstLineIncrement, bytesPerPixel, dstX, dstY),
                         dstLineIncrement};
    const Size bytes = {size.width * static_cast<size_t>(bytesPerPixel), size.height};
    copyRows(dst, src, bytes, srcY < dstY ? RowOrder::Upwards : RowOrder::Downwards);
}

void Raster_RectFillAlpha(uint8 *frameBuffer, int32 lineIncrement, uint8 alpha, uint32 x, uint32 y,
                          uint32 width, uint32 height) {
    const Size size = {width, height};
    if (size.empty())
        return;

    const DstRows dst = {pixelAddress(frameBuffer, lineIncrement, 4, x, y), lineIncrement};
    fillAlphaRows(dst, size, alpha);
}

void Raster_AlphaBlendOver(uint8 *dstBuffer, uint32 dstX, uint32 dstY, int32 dstLineIncrement,
                           const uint8 *srcBuffer, uint32 srcX, uint32 srcY, int32 srcLineIncrement,
                           uint32 width, uint32 height) {
    const Size size = {width, height};
    if (size.empty())
        return;

    const DstRows dst = {pixelAddress(dstBuffer, dstLineIncrement, 4, dstX, dstY),
                         dstLineIncrement};
    const SrcRows src = {pixelAddress(srcBuffer, srcLineIncrement, 4, srcX, srcY),
                         srcLineIncrement};
    blendOverRows(dst, src, size);
}

void Raster_RectROPfill(uint8 *frameBuffer, int32 lineIncrement, int32 bytesPerPixel, uint32 pixel,
                        uint32 rop, uint32 x, uint32 y, uint32 width, uint32 height) {
    if (rop == RASTER_ROP_COPY) {
        Raster_RectFill(frameBuffer, lineIncrement, bytesPerPixel, pixel, x, y, width, height);
        return;
    }
    if (!isPixelSize(bytesPerPixel)) {
        rejectDepth();
        return;
    }
    const Size size = {width, height};
    if (ropDoesNothing(rop) || size.empty())
        return;

    const DstRows dst = {pixelAddress(frameBuffer, lineIncrement, bytesPerPixel, x, y),
                         wholePixels(lineIncrement, bytesPerPixel)};
    ropRows(dst, size, bytesPerPixel, pixel, rop);
}

void Raster_RectROPcopy(uint8 *dstBuffer, int32 dstLineIncrement, const uint8 *srcBuffer,
                        int32 srcLineIncrement, int32 bytesPerPixel, uint32 srcX, uint32 srcY,
                        uint32 rop, uint32 dstX, uint32 dstY, uint32 width, uint32 height) {
    if (rop == RASTER_ROP_COPY) {
        Raster_RectCopy(dstBuffer, dstLineIncrement, srcBuffer, srcLineIncrement, bytesPerPixel,
                        srcX, srcY, dstX, dstY, width, height);
        return;
    }
    const bool upwards = srcY < dstY;
    const bool backwards = srcY == dstY && dstX > srcX;
    if (backwards && !isPixelSize(bytesPerPixel)) {
        rejectDepth();
        return;
    }
    if (!backwards && !isPixelSize(bytesPerPixel)) {
        rejectDepth();
        return;
    }
    const Size size = {width, height};
    if (ropDoesNothing(rop) || size.empty())
        return;

    // Going up, the walk begins at the exact address of the last row, and the
    // step is what is left of the negated increment after rounding.  The row's
    // number can pass 32 bits.
    const uint64_t toFirst = upwards ? uint64_t{height} - 1 : 0;
    const int64_t sign = upwards ? -1 : 1;
    const DstRows dst = {
        pixelAddress(dstBuffer, dstLineIncrement, bytesPerPixel, dstX, dstY + toFirst),
        wholePixels(sign * dstLineIncrement, bytesPerPixel)};
    if (ropIgnoresSource(rop)) {
        ropRows(dst, size, bytesPerPixel, 0, rop);
        return;
    }
    const SrcRows src = {
        pixelAddress(srcBuffer, srcLineIncrement, bytesPerPixel, srcX, srcY + toFirst),
        wholePixels(sign * srcLineIncrement, bytesPerPixel)};
    ropCopyRows(dst, src, {size.width * static_cast<size_t>(bytesPerPixel), size.height},
                bytesPerPixel, rop,
                backwards ? RowDirection::RightToLeft : RowDirection::LeftToRight);
}

void Raster_BitsToPixels(const uint8 *srcBits, int32 srcLineIncrement, uint8 *dstBuffer,
                         int32 dstLineIncrement, int32 bytesPerPixel, int32 width, uint32 height,
                         uint32 foreground, uint32 background) {
    if (!isPixelSize(bytesPerPixel) || width < 1 || height == 0)
        return;
    bitsToPixelRows({dstBuffer, dstLineIncrement}, {srcBits, srcLineIncrement},
                    {static_cast<size_t>(width), height}, bytesPerPixel, foreground, background);
}

void RasterBitsToPixels8(const uint8 *srcBits, int32 srcLineIncrement, uint8 *dstBuffer,
                         int32 dstLineIncrement, int32 width, uint32 height, uint32 foreground,
                         uint32 background) {
    Raster_BitsToPixels(srcBits, srcLineIncrement, dstBuffer, dstLineIncrement, 1, width, height,
                        foreground, background);
}

void RasterBitsToPixels16(const uint8 *srcBits, int32 srcLineIncrement, uint8 *dstBuffer,
                          int32 dstLineIncrement, int32 width, uint32 height, uint32 foreground,
                          uint32 background) {
    Raster_BitsToPixels(srcBits, srcLineIncrement, dstBuffer, dstLineIncrement, 2, width, height,
                        foreground, background);
}

void RasterBitsToPixels24(const uint8 *srcBits, int32 srcLineIncrement, uint8 *dstBuffer,
                          int32 dstLineIncrement, int32 width, uint32 height, uint32 foreground,
                          uint32 background) {
    Raster_BitsToPixels(srcBits, srcLineIncrement, dstBuffer, dstLineIncrement, 3, width, height,
                        foreground, background);
}

void RasterBitsToPixels32(const uint8 *srcBits, int32 srcLineIncrement, uint8 *dstBuffer,
                          int32 dstLineIncrement, int32 width, uint32 height, uint32 foreground,
                          uint32 background) {
    Raster_BitsToPixels(srcBits, srcLineIncrement, dstBuffer, dstLineIncrement, 4, width, height,
                        foreground, background);
}

void Raster_BitsToPixelsStencil(const uint8 *srcBits, int32 srcLineIncrement, uint8 *dstBuffer,
                                int32 dstLineIncrement, int32 bytesPerPixel, int32 width,
                                uint32 height, uint32 pixel) {
    if (!isPixelSize(bytesPerPixel) || width < 1 || height == 0)
        return;
    stencilRows({dstBuffer, dstLineIncrement}, {srcBits, srcLineIncrement},
                {static_cast<size_t>(width), height}, bytesPerPixel, pixel);
}

void RasterBitsToPixelsStencil8(const uint8 *srcBits, int32 srcLineIncrement, uint8 *dstBuffer,
                                int32 dstLineIncrement, int32 width, uint32 height, uint32 pixel) {
    Raster_BitsToPixelsStencil(srcBits, srcLineIncrement, dstBuffer, dstLineIncrement, 1, width,
                               height, pixel);
}

void RasterBitsToPixelsStencil16(const uint8 *srcBits, int32 srcLineIncrement, uint8 *dstBuffer,
                                 int32 dstLineIncrement, int32 width, uint32 height, uint32 pixel) {
    Raster_BitsToPixelsStencil(srcBits, srcLineIncrement, dstBuffer, dstLineIncrement, 2, width,
                               height, pixel);
}

void RasterBitsToPixelsStencil24(const uint8 *srcBits, int32 srcLineIncrement, uint8 *dstBuffer,
                                 int32 dstLineIncrement, int32 width, uint32 height, uint32 pixel) {
    Raster_BitsToPixelsStencil(srcBits, srcLineIncrement, dstBuffer, dstLineIncrement, 3, width,
                               height, pixel);
}

void RasterBitsToPixelsStencil32(const uint8 *srcBits, int32 srcLineIncrement, uint8 *dstBuffer,
                                 int32 dstLineIncrement, int32 width, uint32 height, uint32 pixel) {
    Raster_BitsToPixelsStencil(srcBits, srcLineIncrement, dstBuffer, dstLineIncrement, 4, width,
                               height, pixel);
}
