// Rectangle routines: fill, copy, alpha.

#include "raster.h"

#include "core/failure.h"
#include "core/surface.h"
#include "raster/copyRows.h"
#include "raster/rasteropsKernels.h"

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
