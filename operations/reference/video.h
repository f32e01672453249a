// The video operations stated as plainly as they can be, one pixel at a time.
#pragma once

#include <quillon/raster.h>

namespace quillon::reference {

// format and bppdepth have to be ones that there are.
void yuvToRgb(const uint8_t *srcBuffer, uint8_t *dstBuffer, uint32_t width, uint32_t height,
              uint32_t format, int32_t bppdepth);

uint32_t yuvToBgrx(int32_t y, int32_t u, int32_t v);

} // namespace quillon::reference
