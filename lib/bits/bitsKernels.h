// The kernels of bit expansion.  Rows of a bitmap begin on a byte.  No size of an
// extent is 0; bytesPerPixel is 1 to 4.
#pragma once

#include "core/surface.h"

namespace quillon {

// Stores foreground for a set bit, background for a clear one.
void expandBitRows(DstRows dst, SrcRows bits, Extent extent, int32_t bytesPerPixel,
                   uint32_t foreground, uint32_t background);

// Stores the pixel for a set bit.  Memory under a clear one is not touched.
void stencilBitRows(DstRows dst, SrcRows bits, Extent extent, int32_t bytesPerPixel,
                    uint32_t pixel);

} // namespace quillon
