// The copy of a rectangle of bytes, shared by the copies by pixel size and by
// layout.
#pragma once

#include "legacy/surface.h"

namespace quillon {

// Whether rectangles have bytes in common, or lie between each other's rows.
// size.width counts bytes.
bool rowsOverlap(DstRows dst, SrcRows src, Size size);

enum class RowOrder { Downwards, Upwards };

// Copies rows of bytes.  size.width counts bytes; neither size is 0.
//
// order is the order of the rows where the rectangles overlap in memory; where
// they do not it has no effect.  Overlap within a row is settled by memmove.
void copyRows(DstRows dst, SrcRows src, Size size, RowOrder order);

} // namespace quillon
