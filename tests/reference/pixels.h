// What becomes of a pixel, stated as plainly as it can be.  The library is held
// to these; they are held to raster.h by reading.
#pragma once

#include "quillonTypes.h"

namespace quillon::reference {

// By a raster operation; a code that is none leaves dst as it is.
uint32 combined(uint32 rop, uint32 src, uint32 dst);

uint32 blended(uint32 src, uint32 dst);

// In a rectangle: a layout without alpha counts as opaque.
uint32 converted(uint32 pixel, int32 srcDepth, int32 dstDepth);

// By itself.
uint32 convertedAlone(uint32 pixel, int32 srcDepth, int32 dstDepth);

} // namespace quillon::reference
