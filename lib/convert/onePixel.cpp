// Pixel modes, the conversion of one pixel, and the placement of one channel.
#include <quillon/raster.h>

#include "convert/channels.h"
#include "convert/convert.h"
#include "convert/pixelFormats.h"

#include <bit>

namespace quillon {
namespace {

constexpr char kBadOneSrcDepth[] = "Raster convert one pixel invalid source depth %d\n";
constexpr char kBadOneDstDepth[] = "Raster convert one pixel invalid depth %d\n";

using PixelFunction = uint32_t (*)(uint32_t pixel);

constexpr PairTable<PixelFunction> kPixelFunctions(
    []<PixelFormat kFrom, PixelFormat kTo>() -> PixelFunction { return convertPixel<kFrom, kTo>; });

} // namespace
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
            rejectDepth(kBadPseudoDepth, srcDepth);
            return 0;
        }
        pixel = palette[pixel];
        srcDepth = 32;
    }
    const PixelFormat from = formatAt(srcDepth);
    if (const PixelFunction convert = kPixelFunctions.at(from, formatAt(dstDepth)))
        return convert(pixel);
    if (traitsOf(from).isSource)
        rejectDepth(kBadOneDstDepth, dstDepth);
    else
        rejectDepth(kBadOneSrcDepth, srcDepth);
    return 0;
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
