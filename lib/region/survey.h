// A list as a patch finds it.
#pragma once

#include "region/boxes.h"

namespace quillon {

struct Survey {
    ListBoxes list;
    uint32_t area = 0;
    bool isNormal = true; // the list is in normal form
    int nearCount = 0;
    int near[kSlots]; // the indices of the entries near the rectangle, ascending

    const Rect &nearBox(int i) const { return list.boxes[near[i]]; }

    template <class Predicate>
    void keepNear(Predicate isWanted) {
        int kept = 0;
        for (int i = 0; i < nearCount; ++i) {
            if (isWanted(nearBox(i)))
                near[kept++] = near[i];
        }
        nearCount = kept;
    }
};

// Fills in a new survey: the boxes of the list, and those that overlap or touch the
// rectangle, corners included.  The latter are complete in lists in normal form.
void surveyList(const RasterRectList &list, const Rect &rect, Survey &survey);

} // namespace quillon
