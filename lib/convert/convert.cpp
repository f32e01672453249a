// Pixel modes, and conversion of pixels between layouts.

#include <quillon/raster.h>

#include "convert/convert.h"
#include "convert/convertKernels.h"
#include "convert/pixelFormats.h"
#include "core/failure.h"
#include "legacy/copyRows.h"
#include "legacy/surface.h"

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

[[gnu::cold]] void reject(const char *format, int32_t depth, int line = __builtin_LINE()) {
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wformat-nonliteral"
    Warning(format, depth);
#pragma GCC diagnostic pop
    panicNotImplemented(kUnit, line);
}

bool isDirectDepth(int32_t depth) {
    return isSmallDepth(depth) || depth == 15 || depth == 16 || depth == 24 || depth == 32;
}

// ---- One pixel ----------------------------------------------------------

// From a word of the 32-bit layout.  Narrowing what has been widened gives back
// every bit, so that this serves the narrower sources too.
uint32_t fromWord(uint32_t word, int32_t dstDepth, int line = __builtin_LINE()) {
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
    uint8_t *dstBuffer;
    uint32_t dstLine;
    const uint8_t *srcBuffer;
    uint32_t srcLine;
    uint32_t srcX, srcY, dstX, dstY;
    uint32_t width, height;

    Size size() const { return {width, height}; }
    DstRows dst(int64_t line, int32_t bytesPerPixel) const {
        return {pixelAddress(dstBuffer, line, bytesPerPixel, dstX, dstY), line};
    }
    SrcRows src(int64_t line, int32_t bytesPerPixel) const {
        return {pixelAddress(srcBuffer, line, bytesPerPixel, srcX, srcY), line};
    }
};

// Line increments count in whole pixels of their layout, from the first row on.
void convert(Layout dstLayout, Layout srcLayout, const uint32_t *palette,
             const Transfer &transfer) {
    if (transfer.size().empty())
        return;
    const int32_t dstBytes = bytesPerPixelOf(dstLayout);
    const int32_t srcBytes = bytesPerPixelOf(srcLayout);
    convertRows(dstLayout, transfer.dst(wholePixels(transfer.dstLine, dstBytes), dstBytes),
                srcLayout, transfer.src(wholePixels(transfer.srcLine, srcBytes), srcBytes), palette,
                transfer.size());
}

// The same, for a destination depth that still has to be looked at.
void convertChecked(int32_t dstDepth, Layout srcLayout, const uint32_t *palette,
                    const Transfer &transfer, int line = __builtin_LINE()) {
    if (isDirectDepth(dstDepth))
        convert(Layout{dstDepth}, srcLayout, palette, transfer);
    else
        reject(kBadDstDepth, dstDepth, line);
}

void copy(int32_t depth, const Transfer &transfer) {
    const int32_t bytesPerPixel = bytesPerPixelAt(depth);
    if (transfer.size().empty() || bytesPerPixel <= 0)
        return;
    const Size bytes = {transfer.size().width * static_cast<size_t>(bytesPerPixel),
                        transfer.size().height};
    copyRows(transfer.dst(transfer.dstLine, bytesPerPixel),
             transfer.src(transfer.srcLine, bytesPerPixel), bytes,
             transfer.srcY < transfer.dstY ? RowOrder::Upwards : RowOrder::Downwards);
}

// Line increments are taken as they come.
void convertIndexTo32(const uint32_t *palette, const Transfer &transfer) {
    if (transfer.size().empty())
        return;
    convertRows(Layout::Rgb32, transfer.dst(transfer.dstLine, 4), Layout::Index,
                transfer.src(transfer.srcLine, 1), palette, transfer.size());
}

void convertTo32(int32_t srcDepth, bool pseudoColor, const uint32_t *palette,
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

void convertFrom32(int32_t dstDepth, const Transfer &transfer) {
    if (dstDepth == 32)
        copy(32, transfer);
    else
        convertChecked(dstDepth, Layout::Rgb32, nullptr, transfer);
}

} // namespace

bool checkSourceDepth(int32_t depth, int line) {
    if (depth == 15 || depth == 16 || depth == 24 || depth == 32)
        return true;
    reject(kBadSrcDepth, depth, line);
    return false;
}

} // namespace quillon

using namespace quillon;

bool Raster_IsModeReasonable(int32_t depth, int32_t bitsPerPixel, bool pseudoColor) {
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

uint32_t Raster_ConvertOnePixel(uint32_t pixel, int32_t srcDepth, int32_t dstDepth,
                                bool pseudoColor, const uint32_t *palette) {
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

void RasterRGB_MakeRGBParam(RasterRGBParam *param, int32_t componentBits, uint32_t mask) {
    const int low = std::countr_zero(mask);
    const int width = std::countr_one(mask >> low);
    const int rounded = (width + componentBits - 1) / componentBits * componentBits;
    const uint64_t multiplier =
        ((uint64_t{1} << rounded) - 1) / ((uint64_t{1} << componentBits) - 1);
    const int shift = rounded - width - low;

    param->multiplier = static_cast<uint32_t>(shift < 0 ? multiplier << -shift : multiplier);
    param->shift = static_cast<uint32_t>(shift < 0 ? 0 : shift);
    param->mask = mask;
}

void Raster_ConvertPixels(uint8_t *dstBuffer, uint32_t dstLineIncrement, int32_t dstDepth,
                          const uint8_t *srcBuffer, uint32_t srcLineIncrement, int32_t srcDepth,
                          bool pseudoColor, const uint32_t *palette, uint32_t srcX, uint32_t srcY,
                          uint32_t dstX, uint32_t dstY, uint32_t width, uint32_t height) {
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

void Raster_ConvertPixelsTo32(uint8_t *dstBuffer, uint32_t dstLineIncrement,
                              const uint8_t *srcBuffer, uint32_t srcLineIncrement, int32_t srcDepth,
                              bool pseudoColor, const uint32_t *palette, uint32_t srcX,
                              uint32_t srcY, uint32_t dstX, uint32_t dstY, uint32_t width,
                              uint32_t height) {
    convertTo32(srcDepth, pseudoColor, palette,
                {dstBuffer, dstLineIncrement, srcBuffer, srcLineIncrement, srcX, srcY, dstX, dstY,
                 width, height});
}

void Raster_ConvertPixelsFrom32(uint8_t *dstBuffer, uint32_t dstLineIncrement, int32_t dstDepth,
                                const uint8_t *srcBuffer, uint32_t srcLineIncrement, uint32_t srcX,
                                uint32_t srcY, uint32_t dstX, uint32_t dstY, uint32_t width,
                                uint32_t height) {
    convertFrom32(dstDepth, {dstBuffer, dstLineIncrement, srcBuffer, srcLineIncrement, srcX, srcY,
                             dstX, dstY, width, height});
}

void Raster_ConvertIndexTo32(uint8_t *dstBuffer, uint32_t dstLineIncrement,
                             const uint8_t *srcBuffer, uint32_t srcLineIncrement,
                             const uint32_t *palette, uint32_t srcX, uint32_t srcY, uint32_t dstX,
                             uint32_t dstY, uint32_t width, uint32_t height) {
    convertIndexTo32(palette, {dstBuffer, dstLineIncrement, srcBuffer, srcLineIncrement, srcX, srcY,
                               dstX, dstY, width, height});
}

void RasterCopyPixels(uint8_t *dstBuffer, uint32_t dstLineIncrement, const uint8_t *srcBuffer,
                      uint32_t srcLineIncrement, int32_t depth, uint32_t srcX, uint32_t srcY,
                      uint32_t dstX, uint32_t dstY, uint32_t width, uint32_t height) {
    copy(depth, {dstBuffer, dstLineIncrement, srcBuffer, srcLineIncrement, srcX, srcY, dstX, dstY,
                 width, height});
}
