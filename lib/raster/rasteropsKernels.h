// The lower floor of the rectangle routines.  Each function takes a whole
// rectangle, picks the processor's best instruction set once, and walks the
// rows; arguments are valid and no size is 0.
#pragma once

#include "core/surface.h"

namespace quillon {

// Stores the low bytesPerPixel bytes of pixel in every pixel.
void fillRows(DstRows dst, Size size, int32 bytesPerPixel, uint32 pixel);

// Sets byte 3 of every 32-bit pixel.
void fillAlphaRows(DstRows dst, Size size, uint8 alpha);

// Composites premultiplied 32-bit pixels, from the top left, row by row.
void blendOverRows(DstRows dst, SrcRows src, Size size);

} // namespace quillon
