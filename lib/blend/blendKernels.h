// The kernel of the blend.
#pragma once

#include "core/surface.h"

namespace quillon {

// Composites premultiplied 32-bit pixels over others, from the top left, row by
// row; neither size is 0.
void blendOverRows(DstRows dst, SrcRows src, Extent extent);

} // namespace quillon
