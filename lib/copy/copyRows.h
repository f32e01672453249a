// The copy of rows of bytes, for the copies by pixel size and by depth.
#pragma once

#include "core/surface.h"

namespace quillon {

enum class RowOrder { kDownward, kUpward };

// Copies rows of bytes; neither size is 0.
//
// order is the order of the rows where the rectangles overlap in memory; where
// they do not it has no effect.  A row is read whole before it is written.
void copyRows(DstRows dst, SrcRows src, ByteExtent extent, RowOrder order);

} // namespace quillon
