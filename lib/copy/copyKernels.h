// The kernels of the copies.
#pragma once

#include "core/surface.h"

namespace quillon {

// Copies rows of 1 to kCopyShortRow bytes, each of which is read whole before any
// of it is written; the rows in the order in which they are given.
void copyShortRows(DstRows dst, SrcRows src, ByteExtent extent);

// Copies rows of more than kCopyShortRow bytes.  The surfaces do not overlap.
void copyMediumRows(DstRows dst, SrcRows src, ByteExtent extent);

// Copies rows of kNonTemporalRowBytes or more around the caches.  The surfaces do
// not overlap.
void copyNonTemporalRows(DstRows dst, SrcRows src, ByteExtent extent);

} // namespace quillon
