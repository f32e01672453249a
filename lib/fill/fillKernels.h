// The kernels of the fills.  Each takes a whole rectangle, of which no size is 0.
#pragma once

#include "core/surface.h"

namespace quillon {

// Stores the low bytesPerPixel bytes of pixel in every pixel.
void fillRows(DstRows dst, Extent extent, int32_t bytesPerPixel, uint32_t pixel);

// Stores alpha in byte 3 of every 32-bit pixel.
void fillAlphaRows(DstRows dst, Extent extent, uint8_t alpha);

} // namespace quillon
