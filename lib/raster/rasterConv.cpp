// Pixel modes, and conversion of pixels between layouts.

#include "raster.h"

#include "core/failure.h"
#include "core/surface.h"
#include "raster/copyRows.h"
#include "raster/pixelLayout.h"
#include "raster/rasterConvKernels.h"

#include <bit>

namespace quillon {
namespace {

constexpr char kUnit[] = "lib/raster/rasterConv";

// Each holds one %d, for the depth that is refused.
constexpr char kBadPseudoDepth[] = "Raster convert pixels invalid depth for pseudo color %d\n";
constexpr char kBadSrcDepth[] = "Raster convert pixels invalid source depth %d\n";
constexpr char kBadDstDepth[] = "Raster convert pixels invalid depth %d\n";
constexpr char kBadOneSrcDepth[] = "Raster convert one pixel invalid source depth %d\n";
constexpr char kBadOneDstDepth[] = "Raster convert one pixel invalid depth %d\n";

[[gnu::cold]] void reject(const char *format, int32 depth, int line = __builtin_LINE()) {
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wformat-nonliteral"
    Warning(format, depth);
#pragma GCC diagnostic pop
    panicNotImplemented(kUnit, line);
}

bool isDirectDepth(int32 depth) {
    return isSmallDepth(depth) || depth == 15 || depth == 16 || depth == 24 || depth == 32;
}

// ---- One pixel ----------------------------------------------------------

// From a word of the 32-bit layout.  Narrowing what has been widened gives back
// every bit, so that this serves the narrower sources too.
uint32 fromWord(uint32 word, int32 dstDepth, int line = __builtin_LINE()) {
    switch (dstDepth) {
    case 3:
    case 6:
    case 8:
        return toSmall(word, kEnds32, dstDepth);
    case 15:
        return narrow24To15(word);
    case 16:
        return narrow24To16(word);
    case 24:
    case 32:
        return word;
    default:
        reject(kBadOneDstDepth, dstDepth, line);
        return 0;
    }
}

// ---- Rectangles ---------------------------------------------------------

// Two rasters and a rectangle in each, as the conversions are given them.
struct Transfer {
    uint8 *dstBuffer;
    uint32 dstLine;
    const uint8 *srcBuffer;
    uint32 srcLine;
    uint32 srcX, srcY, dstX, dstY;
    uint32 width, height;

    Size size() const { return {width, height}; }
    DstRows dst(int64_t line, int32 bytesPerPixel) const {
        return {pixelAddress(dstBuffer, line, bytesPerPixel, dstX, dstY), line};
    }
    SrcRows src(int64_t line, int32 bytesPerPixel) const {
        return {pixelAddress(srcBuffer, line, bytesPerPixel, srcX, srcY), line};
    }
};

// Line increments count in whole pixels of their layout, from the first row on.
void convert(Layout dstLayout, Layout srcLayout, const uint32 *palette, const Transfer &transfer) {
    if (transfer.size().empty())
        return;
    const int32 dstBytes = bytesPerPixelOf(dstLayout);
    const int32 srcBytes = bytesPerPixelOf(srcLayout);
    convertRows(dstLayout, transfer.dst(wholePixels(transfer.dstLine, dstBytes), dstBytes),
                srcLayout, transfer.src(wholePixels(transfer.srcLine, srcBytes), srcBytes), palette,
                transfer.size());
}

// The same, for a destination depth that still has to be looked at.
void convertChecked(int32 dstDepth, Layout srcLayout, const uint32 *palette,
                    const Transfer &transfer, int line = __builtin_LINE()) {
    if (isDirectDepth(dstDepth))
        convert(Layout{dstDepth}, srcLayout, palette, transfer);
    else
        reject(kBadDstDepth, dstDepth, line);
}

void copy(int32 depth, const Transfer &transfer) {
    const int32 bytesPerPixel = bytesPerPixelOf(depth);
    if (transfer.size().empty() || bytesPerPixel <= 0)
        return;
    const Size bytes = {transfer.size().width * static_cast<size_t>(bytesPerPixel),
                        transfer.size().height};
    copyRows(transfer.dst(transfer.dstLine, bytesPerPixel),
             transfer.src(transfer.srcLine, bytesPerPixel), bytes,
             transfer.srcY < transfer.dstY ? RowOrder::Upwards : RowOrder::Downwards);
}

// Line increments are taken as they come.
void convertIndexTo32(const uint32 *palette, const Transfer &transfer) {
    if (transfer.size().empty())
        return;
    convertRows(Layout::Rgb32, transfer.dst(transfer.dstLine, 4), Layout::Index,
                transfer.src(transfer.srcLine, 1), palette, transfer.size());
}

void convertTo32(int32 srcDepth, bool pseudoColor, const uint32 *palette,
                 const Transfer &transfer) {
    if (pseudoColor) {
        if (srcDepth > 8)
            reject(kBadPseudoDepth, srcDepth);
        else
            convertIndexTo32(palette, transfer);
        return;
    }
    switch (srcDepth) {
    case 15:
    case 16:
    case 24:
        convert(Layout::Rgb32, Layout{srcDepth}, nullptr, transfer);
        return;
    case 32:
        copy(32, transfer);
        return;
    default:
        reject(kBadSrcDepth, srcDepth);
    }
}

void convertFrom32(int32 dstDepth, const Transfer &transfer) {
    if (dstDepth == 32)
        copy(32, transfer);
    else
        convertChecked(dstDepth, Layout::Rgb32, nullptr, transfer);
}

} // namespace
} // namespace quillon

using namespace quillon;

bool Raster_IsModeReasonable(int32 depth, int32 bitsPerPixel, bool pseudoColor) {
    if (pseudoColor)
        return bitsPerPixel == 8;
    switch (bitsPerPixel) {
    case 24:
    case 32:
        return depth == 24;
    case 16:
        return depth == 15 || depth == 16;
    default:
        return false;
    }
}

uint32 Raster_ConvertOnePixel(uint32 pixel, int32 srcDepth, int32 dstDepth, bool pseudoColor,
                              const uint32 *palette) {
    if (pseudoColor) {
        if (srcDepth != 8) {
            reject(kBadPseudoDepth, srcDepth);
            return 0;
        }
        pixel = palette[pixel];
        srcDepth = 32;
    }
    switch (srcDepth) {
    case 15:
        return dstDepth == 15 ? pixel : fromWord(widen15To24(pixel), dstDepth);
    case 16:
        return dstDepth == 16 ? pixel : fromWord(widen16To24(pixel), dstDepth);
    case 24:
    case 32:
        return fromWord(pixel, dstDepth);
    default:
        reject(kBadOneSrcDepth, srcDepth);
        return 0;
    }
}

void RasterRGB_MakeRGBParam(RasterRGBParam *param, int32 componentBits, uint32 mask) {
    const int low = std::countr_zero(mask);
    const int width = std::countr_one(mask >> low);
    const int rounded = (width + componentBits - 1) / componentBits * componentBits;
    const uint64_t multiplier =
        ((uint64_t{1} << rounded) - 1) / ((uint64_t{1} << componentBits) - 1);
    const int shift = rounded - width - low;

    param->multiplier = static_cast<uint32>(shift < 0 ? multiplier << -shift : multiplier);
    param->shift = static_cast<uint32>(shift < 0 ? 0 : shift);
    param->mask = mask;
}

void Raster_ConvertPixels(uint8 *dstBuffer, uint32 dstLineIncrement, int32 dstDepth,
                          const uint8 *srcBuffer, uint32 srcLineIncrement, int32 srcDepth,
                          bool pseudoColor, const uint32 *palette, uint32 srcX, uint32 srcY,
                          uint32 dstX, uint32 dstY, uint32 width, uint32 height) {
    const Transfer transfer = {
        dstBuffer, dstLineIncrement, srcBuffer, srcLineIncrement, srcX, srcY, dstX, dstY, width,
        height};
    if (dstDepth == 32) {
        convertTo32(srcDepth, pseudoColor, palette, transfer);
        return;
    }
    if (pseudoColor) {
        if (srcDepth > 8)
            reject(kBadPseudoDepth, srcDepth);
        else
            convertChecked(dstDepth, Layout::Index, palette, transfer);
        return;
    }
    if (srcDepth == dstDepth) {
        copy(srcDepth, transfer);
        return;
    }
    switch (srcDepth) {
    case 15:
        convertChecked(dstDepth, Layout::Rgb15, nullptr, transfer);
        return;
    case 16:
        convertChecked(dstDepth, Layout::Rgb16, nullptr, transfer);
        return;
    case 24:
        convertChecked(dstDepth, Layout::Rgb24, nullptr, transfer);
        return;
    case 32:
        convertFrom32(dstDepth, transfer);
        return;
    default:
        reject(kBadSrcDepth, srcDepth);
    }
}

void Raster_ConvertPixelsTo32(uint8 *dstBuffer, uint32 dstLineIncrement, const uint8 *srcBuffer,
                              uint32 srcLineIncrement, int32 srcDepth, bool pseudoColor,
                              const uint32 *palette, uint32 srcX, uint32 srcY, uint32 dstX,
                              uint32 dstY, uint32 width, uint32 height) {
    convertTo32(srcDepth, pseudoColor, palette,
                {dstBuffer, dstLineIncrement, srcBuffer, srcLineIncrement, srcX, srcY, dstX, dstY,
                 width, height});
}

void Raster_ConvertPixelsFrom32(uint8 *dstBuffer, uint32 dstLineIncrement, int32 dstDepth,
                                const uint8 *srcBuffer, uint32 srcLineIncrement, uint32 srcX,
                                uint32 srcY, uint32 dstX, uint32 dstY, uint32 width,
                                uint32 height) {
    convertFrom32(dstDepth, {dstBuffer, dstLineIncrement, srcBuffer, srcLineIncrement, srcX, srcY,
                             dstX, dstY, width, height});
}

void Raster_ConvertIndexTo32(uint8 *dstBuffer, uint32 dstLineIncrement, const uint8 *srcBuffer,
                             uint32 srcLineIncrement, const uint32 *palette, uint32 srcX,
                             uint32 srcY, uint32 dstX, uint32 dstY, uint32 width, uint32 height) {
    convertIndexTo32(palette, {dstBuffer, dstLineIncrement, srcBuffer, srcLineIncrement, srcX, srcY,
                               dstX, dstY, width, height});
}

void RasterCopyPixels(uint8 *dstBuffer, uint32 dstLineIncrement, const uint8 *srcBuffer,
                      uint32 srcLineIncrement, int32 depth, uint32 srcX, uint32 srcY, uint32 dstX,
                      uint32 dstY, uint32 width, uint32 height) {
    copy(depth, {dstBuffer, dstLineIncrement, srcBuffer, srcLineIncrement, srcX, srcY, dstX, dstY,
                 width, height});
}
