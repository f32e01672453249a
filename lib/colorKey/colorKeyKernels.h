// The kernel of the colour key.
#pragma once

#include "core/surface.h"

namespace quillon {

struct ColorKeySurfaces {
    DstRows dst;
    SrcRows background;
    SrcRows overlay;
    SrcRows keys;
};

// Takes each pixel from the overlay where the key surface, of pixels of 1, 2 or 4
// bytes, matches and from the background elsewhere: from the top left, row by row.
// Neither size is 0.
void composeByKey(const ColorKeySurfaces &surfaces, Extent extent, int32_t keyBytes, uint32_t key);

} // namespace quillon
