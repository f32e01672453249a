// What holds for a list as a whole, before it is changed.
#pragma once

#include "region/boxes.h"

namespace quillon {

// A row of entries is a run of entries with the same top.  This is small enough to be
// handed around in registers.
struct Survey {
    int count;           // of the entries; 0: the list is not in normal form
    uint32_t area;       // of all
    int32_t bottom;      // of the lowest entry
    int32_t bottomAbove; // of the lowest entry above the last row of entries
};

// Surveys a list that is not empty.  In normal form every entry stands behind those
// before it in order, overlaps none of them, touches none in a row, and continues none
// downward; the slots behind the last entry are zero.
Survey surveyList(const RasterRectList &list);

} // namespace quillon
