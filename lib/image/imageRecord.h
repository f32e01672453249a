// How the units of the image room read an ImageInfo, and the sizes that follow
// from one.
#pragma once

#include "convert/pixelFormats.h"
#include <hearth/hearth.h>
#include <quillon/imageUtil.h>
#include <quillon/raster.h>

#include <cstddef>
#include <cstdint>

namespace quillon {

inline constexpr uint32_t kMaxColors = 256;

// Rows of images and files start at multiples of four bytes.
constexpr uint64_t roundUpTo4(uint64_t bytes) {
    return (bytes + 3) & ~uint64_t{3};
}

// The single depth by which Raster_ConvertPixels knows the image's pixels.
inline int32_t conversionDepth(const ImageInfo &image) {
    return image.bpp == 32 && image.depth == 24 ? 32 : static_cast<int32_t>(image.depth);
}

// The bytes of a pixel that Raster_ConvertPixels reads at a depth.
constexpr uint32_t bytesAtDepth(int32_t depth) {
    return static_cast<uint32_t>(bytesPerPixelAt(depth));
}

// True when Raster_ConvertPixels widens pixels of the depth.  Otherwise it is
// called for nothing but its Warning and its Panic, so that those come while
// the caller holds nothing yet that a Panic would leak.
inline bool checkConvertible(int32_t srcDepth, int32_t dstDepth) {
    if (srcDepth == 15 || srcDepth == 16 || srcDepth == 24 || srcDepth == 32) {
        return true;
    }
    Raster_ConvertPixels(nullptr, 0, dstDepth, nullptr, 0, srcDepth, false, nullptr, 0, 0, 0, 0, 0,
                         0);
    return false;
}

inline bool isBottomUp(const ImageInfo &image) {
    return (image.flags & IMAGEUTIL_FLAG_BOTTOM_UP) != 0;
}

inline const uint8_t *rowAt(const ImageInfo &image, uint32_t row) {
    return image.data + size_t{row} * image.bytesPerLine;
}

} // namespace quillon
