// The lower floor of the copies.  Rows are rows of bytes.
#pragma once

#include "legacy/surface.h"

namespace quillon {

// The longest row that copyShortRows takes.
inline constexpr size_t kShortRow = 128;

// Copies rows of 1 to kShortRow bytes, each of which is read whole before any of
// it is written; the rows in the order in which they are given.
void copyShortRows(DstRows dst, SrcRows src, Size bytes);

// The longest row that is not left to memcpy, which has more means for long ones.
inline constexpr size_t kMiddlingRow = 8192;

// Copies rows of more than kShortRow bytes.  The surfaces do not overlap.
void copyMiddlingRows(DstRows dst, SrcRows src, Size bytes);

// Copies rows of at least 256 bytes around the caches.  The surfaces do not overlap.
void copyStreamedRows(DstRows dst, SrcRows src, Size bytes);

} // namespace quillon
