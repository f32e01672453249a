// The lower floor of the pixel conversions.
#pragma once

#include "convert/pixelFormats.h"
#include "legacy/surface.h"

namespace quillon {

// Converts a rectangle of pixels between two different layouts that do not
// overlap; neither size is 0.  src is Index or at least Rgb15; dst is anything
// but Index.  palette is read for Index only, at the indices that occur.
void convertRows(Layout dstLayout, DstRows dst, Layout srcLayout, SrcRows src,
                 const uint32_t *palette, Size size);

} // namespace quillon
