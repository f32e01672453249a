// The kernels of the raster operations.  These are bitwise, so rows are rows of
// bytes.  Neither size of an extent is 0.
#pragma once

#include "core/surface.h"
#include "rop/ropTable.h"

namespace quillon {

// Combines every pixel with one value, of which the low bytesPerPixel bytes count.
void ropFillRows(DstRows dst, ByteExtent extent, int32_t bytesPerPixel, RopConstant constant);

enum class RowDirection { kLeftToRight, kRightToLeft };

// Combines two surfaces, pixel by pixel in the given direction, rows in the order
// in which they are given.  rop is one of the codes that read the source, other
// than the copy.
void ropCopyRows(DstRows dst, SrcRows src, ByteExtent extent, int32_t bytesPerPixel, uint32_t rop,
                 RowDirection direction);

} // namespace quillon
