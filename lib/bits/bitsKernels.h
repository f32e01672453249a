// The lower floor of bit expansion.  Rows of the bitmap begin on a byte; size
// counts pixels, and neither of its fields is 0.  bytesPerPixel is 1 to 4.
#pragma once

#include "legacy/surface.h"

namespace quillon {

// Foreground for a set bit, background for a clear one.
void bitsToPixelRows(DstRows dst, SrcRows bits, Size size, int32_t bytesPerPixel,
                     uint32_t foreground, uint32_t background);

// The pixel for a set bit; memory under a clear one is not touched.
void stencilRows(DstRows dst, SrcRows bits, Size size, int32_t bytesPerPixel, uint32_t pixel);

} // namespace quillon
