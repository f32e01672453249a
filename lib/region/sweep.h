// The normal form of any list, by a sweep over its rows.
#pragma once

#include "region/boxes.h"

namespace quillon {

// Computes the normal form of boxes in any order, which may overlap, without the
// pixels of the cut unless that is null.  The result is empty on entry.  Gives
// false when the result does not fit a list.
bool sweepBoxes(const ListBoxes &list, const Rect *cut, ListBoxes &result);

} // namespace quillon
