// The kernel of the pixel conversions.
#pragma once

#include "convert/pixelFormats.h"
#include "core/surface.h"

namespace quillon {

// Converts a rectangle between two different formats, of which one is a source and
// the other a destination; neither size is 0, and the surfaces do not overlap.
// palette is read for kIndex only, from the lowest index in use to the highest.
void convertRows(DstRows dst, SrcRows src, Extent extent, const uint32_t *palette,
                 PixelFormat srcFormat, PixelFormat dstFormat);

} // namespace quillon
