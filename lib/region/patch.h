// Changes of a list in normal form that leave most of it as it is.
//
// A patch replaces only the entries near the rectangle: those that overlap or touch
// it, corners included.  The others stay as they are.  In the rows of the rectangle
// only spans that overlap or touch it change.  The only other change is that an
// entry above or below it begins or ceases to continue in a changed span; that span
// has the columns of the entry, before the change or after it, so that the entry
// touches the rectangle, too.
#pragma once

#include "region/survey.h"

namespace quillon {

struct PatchResult {
    bool isDone;   // otherwise the result has too many entries, or one that is too large
    uint32_t area; // of the changed list
};

// These change a list in normal form, of so many entries and pixels, or leave it as it
// is when they cannot.  The added rectangle is not empty, and lies inside no entry.
PatchResult addByPatch(RasterRectList &list, int count, uint32_t area, const Rect &rect);
PatchResult cutByPatch(RasterRectList &list, int count, uint32_t area, const Rect &cut);

} // namespace quillon
