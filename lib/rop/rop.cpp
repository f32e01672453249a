// Raster operations against a constant and between surfaces.
#include <quillon/raster.h>

#include "core/failure.h"
#include "core/surface.h"
#include "fill/fillKernels.h"
#include "rop/ropKernels.h"
#include "rop/ropTable.h"

namespace quillon {
namespace {

// Combines rows with a constant, by an operation that does something.
void combineWithConstant(DstRows dst, Extent extent, int32_t bytesPerPixel, uint32_t pixel,
                         uint32_t rop) {
    const RopConstant constant = ropConstant(rop, pixel);
    if (ropIgnoresDestination(rop))
        fillRows(dst, extent, bytesPerPixel, constant.flip);
    else
        ropFillRows(dst, inBytes(extent, bytesPerPixel), bytesPerPixel, constant);
}

} // namespace
} // namespace quillon

using namespace quillon;

void Raster_RectROPfill(uint8_t *frameBuffer, int32_t lineIncrement, int32_t bytesPerPixel,
                        uint32_t pixel, uint32_t rop, uint32_t x, uint32_t y, uint32_t width,
                        uint32_t height) {
    if (rop == RASTER_ROP_COPY) {
        Raster_RectFill(frameBuffer, lineIncrement, bytesPerPixel, pixel, x, y, width, height);
        return;
    }
    if (!isPixelSize(bytesPerPixel)) {
        rejectPixelSize();
        return;
    }
    const Extent extent = {width, height};
    if (ropDoesNothing(rop) || extent.empty())
        return;

    const DstRows dst = {pixelAddress(frameBuffer, lineIncrement, bytesPerPixel, x, y),
                         strideInWholePixels(lineIncrement, bytesPerPixel)};
    combineWithConstant(dst, extent, bytesPerPixel, pixel, rop);
}

void Raster_RectROPcopy(uint8_t *dstBuffer, int32_t dstLineIncrement, const uint8_t *srcBuffer,
                        int32_t srcLineIncrement, int32_t bytesPerPixel, uint32_t srcX,
                        uint32_t srcY, uint32_t rop, uint32_t dstX, uint32_t dstY, uint32_t width,
                        uint32_t height) {
    if (rop == RASTER_ROP_COPY) {
        Raster_RectCopy(dstBuffer, dstLineIncrement, srcBuffer, srcLineIncrement, bytesPerPixel,
                        srcX, srcY, dstX, dstY, width, height);
        return;
    }
    const bool isUpward = srcY < dstY;
    const bool isBackward = srcY == dstY && dstX > srcX;
    // Two checks, as the message tells by its line which way a row would have
    // been walked.
    if (isBackward && !isPixelSize(bytesPerPixel)) {
        rejectPixelSize();
        return;
    }
    if (!isBackward && !isPixelSize(bytesPerPixel)) {
        rejectPixelSize();
        return;
    }
    const Extent extent = {width, height};
    if (ropDoesNothing(rop) || extent.empty())
        return;

    // Upward, the walk begins at the exact address of the last row, and the stride
    // is the negated line increment, rounded after that.  The number of the row can
    // pass 32 bits.
    const uint64_t toFirst = isUpward ? uint64_t{height} - 1 : 0;
    const int64_t sign = isUpward ? -1 : 1;
    const DstRows dst = {
        pixelAddress(dstBuffer, dstLineIncrement, bytesPerPixel, dstX, dstY + toFirst),
        strideInWholePixels(sign * dstLineIncrement, bytesPerPixel)};
    if (ropIgnoresSource(rop)) {
        combineWithConstant(dst, extent, bytesPerPixel, 0, rop);
        return;
    }
    const SrcRows src = {
        pixelAddress(srcBuffer, srcLineIncrement, bytesPerPixel, srcX, srcY + toFirst),
        strideInWholePixels(sign * srcLineIncrement, bytesPerPixel)};
    ropCopyRows(dst, src, inBytes(extent, bytesPerPixel), bytesPerPixel, rop,
                isBackward ? RowDirection::kRightToLeft : RowDirection::kLeftToRight);
}
