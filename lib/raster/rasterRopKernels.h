// The lower floor of the raster operations.  Raster operations are bitwise, so
// rows are rows of bytes; a size's width counts bytes here.
#pragma once

#include "core/surface.h"

namespace quillon {

// Combines every pixel with one value: D becomes (D & keep) ^ flip, of which the
// low bytesPerPixel bytes count.  Every operation against a constant is of this
// form.
void ropFillRows(DstRows dst, Size bytes, int32 bytesPerPixel, uint32 keep, uint32 flip);

enum class RowDirection { LeftToRight, RightToLeft };

// Combines two surfaces, pixel by pixel in the given direction, rows in the
// order in which they are given.  rop is one of the codes that read the source,
// other than the copy.
void ropCopyRows(DstRows dst, SrcRows src, Size bytes, int32 bytesPerPixel, uint32 rop,
                 RowDirection direction);

} // namespace quillon
