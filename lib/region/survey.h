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
Survey surveyEntries(const RasterRectList &list);

// The same, and faster for a list of one entry.
inline Survey surveyList(const RasterRectList &list) {
    if (list.entries[1].width >= 1)
        return surveyEntries(list);
    const Rect box = boxOf(list.entries[0]);
    if (isEmpty(box) || !isZeroFrom(list, 1))
        return {};
    return {.count = 1, .area = areaOf(box), .bottom = box.bottom, .bottomAbove = kCoordinateMin};
}

} // namespace quillon
