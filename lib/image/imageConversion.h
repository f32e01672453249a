// An ImageInfo as the source of Raster_ConvertPixels.
//
// Every caller checks the depth (checkSourceDepth of convert.h) before it allocates
// anything: the check may end in a Panic, and a host's Panic may throw or longjmp.
#pragma once

#include "convert/convert.h"
#include "convert/pixelFormats.h"
#include "image/imageRecord.h"

#include <cstdint>

namespace quillon {

// The depth that names the image's pixel format.
inline int32_t conversionDepth(const ImageInfo &image) {
    return image.bpp == 32 && image.depth == 24 ? 32 : static_cast<int32_t>(image.depth);
}

// Bytes per source pixel; the depth is one that checkSourceDepth accepts.
inline uint32_t sourcePixelBytes(int32_t depth) {
    return static_cast<uint32_t>(bytesPerPixelAt(depth));
}

} // namespace quillon
