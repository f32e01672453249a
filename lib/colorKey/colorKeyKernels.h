// The lower floor of the colour key.
#pragma once

#include "legacy/surface.h"

namespace quillon {

// A pixel of a key surface, by its bytes.
enum class KeyPixel { Bytes1 = 1, Bytes2 = 2, Bytes4 = 4 };

struct KeyedRows {
    DstRows dst;
    SrcRows background;
    SrcRows overlay;
    SrcRows key;
};

// Takes each pixel from the overlay where the key surface matches and from the
// background elsewhere, from the top left, row by row; no size is 0.
void applyKeyRows(const KeyedRows &rows, Size size, KeyPixel keyPixel, uint32_t key);

} // namespace quillon
