// What becomes of a pixel, stated as plainly as it can be.  The library is held
// to these; they are held to raster.h by reading.
#pragma once

#include <cstdint>

namespace quillon::reference {

// By a raster operation; a code that is none leaves dst as it is.
uint32_t combined(uint32_t rop, uint32_t src, uint32_t dst);

uint32_t blended(uint32_t src, uint32_t dst);

// In a rectangle: a layout without alpha counts as opaque.
uint32_t converted(uint32_t pixel, int32_t srcDepth, int32_t dstDepth);

// By itself.
uint32_t convertedAlone(uint32_t pixel, int32_t srcDepth, int32_t dstDepth);

} // namespace quillon::reference
