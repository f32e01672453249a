// Conversion of rectangles between pixel formats.
#include <quillon/raster.h>

#include "convert/convert.h"
#include "convert/convertKernels.h"
#include "convert/pixelFormats.h"
#include "copy/copyRows.h"
#include "core/failure.h"
#include "core/surface.h"

namespace quillon {
namespace {

constexpr char kBadSrcDepth[] = "Raster convert pixels invalid source depth %d\n";
constexpr char kBadDstDepth[] = "Raster convert pixels invalid depth %d\n";

// Two rasters and a rectangle in each, as the entries are given them.
struct Transfer {
    uint8_t *dstBuffer;
    uint32_t dstLineIncrement;
    const uint8_t *srcBuffer;
    uint32_t srcLineIncrement;
    uint32_t srcX, srcY, dstX, dstY;
    uint32_t width, height;

    Extent extent() const { return {width, height}; }
    DstRows dst(int64_t stride, int32_t bytesPerPixel) const {
        return {pixelAddress(dstBuffer, stride, bytesPerPixel, dstX, dstY), stride};
    }
    SrcRows src(int64_t stride, int32_t bytesPerPixel) const {
        return {pixelAddress(srcBuffer, stride, bytesPerPixel, srcX, srcY), stride};
    }
};

void copyAtDepth(int32_t depth, const Transfer &transfer) {
    const int32_t bytesPerPixel = bytesPerPixelAt(depth);
    if (transfer.extent().empty() || bytesPerPixel <= 0)
        return;
    copyRows(transfer.dst(transfer.dstLineIncrement, bytesPerPixel),
             transfer.src(transfer.srcLineIncrement, bytesPerPixel),
             inBytes(transfer.extent(), bytesPerPixel),
             transfer.srcY < transfer.dstY ? RowOrder::kUpward : RowOrder::kDownward);
}

// Line increments count in whole pixels, from the first row on, except where
// palette entries are stored as they are.
void convertFormats(PixelFormat dstFormat, PixelFormat srcFormat, const uint32_t *palette,
                    const Transfer &transfer) {
    if (transfer.extent().empty())
        return;
    const int32_t dstBytes = traitsOf(dstFormat).bytesPerPixel;
    const int32_t srcBytes = traitsOf(srcFormat).bytesPerPixel;
    const bool isExact = srcFormat == PixelFormat::kIndex && dstFormat == PixelFormat::kRgb32;
    const int64_t dstStride = isExact ? transfer.dstLineIncrement
                                      : strideInWholePixels(transfer.dstLineIncrement, dstBytes);
    const int64_t srcStride = strideInWholePixels(transfer.srcLineIncrement, srcBytes);
    convertRows(transfer.dst(dstStride, dstBytes), transfer.src(srcStride, srcBytes),
                transfer.extent(), palette, srcFormat, dstFormat);
}

// The conversion by depths, with its checks: what all entries do.
void convertDepths(int32_t dstDepth, int32_t srcDepth, bool pseudoColor, const uint32_t *palette,
                   const Transfer &transfer) {
    if (pseudoColor && srcDepth > 8) {
        rejectDepth(kBadPseudoDepth, srcDepth);
        return;
    }
    if (!pseudoColor && srcDepth == dstDepth) {
        copyAtDepth(srcDepth, transfer);
        return;
    }
    if (!pseudoColor && !checkSourceDepth(srcDepth))
        return;
    const PixelFormat dstFormat = formatAt(dstDepth);
    if (!traitsOf(dstFormat).isDestination) {
        rejectDepth(kBadDstDepth, dstDepth);
        return;
    }
    convertFormats(dstFormat, pseudoColor ? PixelFormat::kIndex : formatAt(srcDepth), palette,
                   transfer);
}

} // namespace

void rejectDepth(const char *format, int32_t depth, int line) {
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wformat-nonliteral"
    Warning(format, depth);
#pragma GCC diagnostic pop
    panicNotImplemented(kUnitRasterConv, line);
}

bool checkSourceDepth(int32_t depth, int line) {
    if (traitsOf(formatAt(depth)).isSource)
        return true;
    rejectDepth(kBadSrcDepth, depth, line);
    return false;
}

} // namespace quillon

using namespace quillon;

void Raster_ConvertPixels(uint8_t *dstBuffer, uint32_t dstLineIncrement, int32_t dstDepth,
                          const uint8_t *srcBuffer, uint32_t srcLineIncrement, int32_t srcDepth,
                          bool pseudoColor, const uint32_t *palette, uint32_t srcX, uint32_t srcY,
                          uint32_t dstX, uint32_t dstY, uint32_t width, uint32_t height) {
    convertDepths(dstDepth, srcDepth, pseudoColor, palette,
                  {dstBuffer, dstLineIncrement, srcBuffer, srcLineIncrement, srcX, srcY, dstX, dstY,
                   width, height});
}

void Raster_ConvertPixelsTo32(uint8_t *dstBuffer, uint32_t dstLineIncrement,
                              const uint8_t *srcBuffer, uint32_t srcLineIncrement, int32_t srcDepth,
                              bool pseudoColor, const uint32_t *palette, uint32_t srcX,
                              uint32_t srcY, uint32_t dstX, uint32_t dstY, uint32_t width,
                              uint32_t height) {
    convertDepths(32, srcDepth, pseudoColor, palette,
                  {dstBuffer, dstLineIncrement, srcBuffer, srcLineIncrement, srcX, srcY, dstX, dstY,
                   width, height});
}

void Raster_ConvertPixelsFrom32(uint8_t *dstBuffer, uint32_t dstLineIncrement, int32_t dstDepth,
                                const uint8_t *srcBuffer, uint32_t srcLineIncrement, uint32_t srcX,
                                uint32_t srcY, uint32_t dstX, uint32_t dstY, uint32_t width,
                                uint32_t height) {
    convertDepths(dstDepth, 32, false, nullptr,
                  {dstBuffer, dstLineIncrement, srcBuffer, srcLineIncrement, srcX, srcY, dstX, dstY,
                   width, height});
}

void Raster_ConvertIndexTo32(uint8_t *dstBuffer, uint32_t dstLineIncrement,
                             const uint8_t *srcBuffer, uint32_t srcLineIncrement,
                             const uint32_t *palette, uint32_t srcX, uint32_t srcY, uint32_t dstX,
                             uint32_t dstY, uint32_t width, uint32_t height) {
    convertFormats(PixelFormat::kRgb32, PixelFormat::kIndex, palette,
                   {dstBuffer, dstLineIncrement, srcBuffer, srcLineIncrement, srcX, srcY, dstX,
                    dstY, width, height});
}

void RasterCopyPixels(uint8_t *dstBuffer, uint32_t dstLineIncrement, const uint8_t *srcBuffer,
                      uint32_t srcLineIncrement, int32_t depth, uint32_t srcX, uint32_t srcY,
                      uint32_t dstX, uint32_t dstY, uint32_t width, uint32_t height) {
    copyAtDepth(depth, {dstBuffer, dstLineIncrement, srcBuffer, srcLineIncrement, srcX, srcY, dstX,
                        dstY, width, height});
}
