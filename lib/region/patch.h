// Changes of a list in normal form that leave most of it as it is.
//
// A patch replaces only the entries near the rectangle: those that overlap or touch
// it, corners included.  The others stay as they are.  In the rows of the rectangle
// only spans that overlap or touch it change.  The only other change is that an
// entry above or below it begins or ceases to continue in a changed span; that span
// has the columns of the entry, before the change or after it, so that the entry
// touches the rectangle, too.
#pragma once

#include "region/boxes.h"

namespace quillon {

enum class PatchOutcome : uint32_t {
    kDone,
    kDoesNotFit, // the result has more entries than a list, or one that is too large
    kNeedsSweep, // the list is not in normal form, or the rectangle wraps
};

struct PatchResult {
    PatchOutcome outcome;
    uint32_t area; // of the changed list, when done
};

// These change the list only when done.
PatchResult addByPatch(RasterRectList &list, int32_t x, int32_t y, int32_t width, int32_t height);
PatchResult cutByPatch(RasterRectList &list, const Rect &cut);

} // namespace quillon
