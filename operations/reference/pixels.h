// What becomes of a pixel, stated as plainly as it can be.  The library is held
// to these; they are held to raster.h by reading.
#pragma once

#include <cstdint>

namespace quillon::reference {

// By a raster operation; a code that is none leaves dst as it is.
uint32_t combined(uint32_t rop, uint32_t src, uint32_t dst);

uint32_t blended(uint32_t src, uint32_t dst);

// The pixel formats by their depths: all, to which pixels are converted, and those from
// which they are.
inline constexpr int32_t kDepths[] = {3, 6, 8, 15, 16, 24, 32};
inline constexpr int32_t kSourceDepths[] = {15, 16, 24, 32};

// In a rectangle: a format without alpha counts as opaque.
uint32_t converted(uint32_t pixel, int32_t srcDepth, int32_t dstDepth);

// By itself.
uint32_t convertedAlone(uint32_t pixel, int32_t srcDepth, int32_t dstDepth);

} // namespace quillon::reference
