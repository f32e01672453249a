// Additions behind all entries of a list, as when the rectangles of a region come in
// their order.
#pragma once

#include "region/survey.h"

#include <algorithm>
#include <optional>

namespace quillon {

// The first of so many entries that the box would continue downward, or null.
inline RasterRectListEntry *entryAbove(RasterRectListEntry *entry, int count, const Rect &box) {
    for (; count > 0; --count, ++entry) {
        if (entry->x == box.left && wrappingAdd(entry->x, entry->width) == box.right &&
            bottomOf(*entry) == box.top)
            return entry;
    }
    return nullptr;
}

// Adds a rectangle that lies below all entries, or behind them in the last row of
// entries, to which nothing from above reaches.  It becomes the last entry, widens
// the last one, or continues another one downward.  Gives the area of the list, or
// nothing, with the list unchanged: for any other rectangle, and where there is no slot.
[[gnu::always_inline]] inline std::optional<uint32_t>
append(RasterRectList &list, const Survey &survey, const Rect &rect) {
    int slot = survey.count;
    int32_t reach = survey.bottom; // of the entries above
    Rect box = rect;
    if (rect.top < survey.bottom) {
        const Rect last = boxOf(list.entries[slot - 1]);
        if (rect.top != last.top || rect.left < last.left || rect.top < survey.bottomAbove)
            return {};
        reach = survey.bottomAbove;
        if (rect.left <= last.right) {
            if (rect.bottom != last.bottom)
                return {};
            --slot;
            box.left = last.left;
            box.right = std::max(rect.right, last.right);
        }
    }
    if (slot == kMaxEntries || !isStorable(box))
        return {};
    // The slot behind the entries is zero.
    const uint32_t area = survey.area - areaOf(list.entries[slot]) + areaOf(box);
    if (box.top == reach) {
        if (RasterRectListEntry *const above = entryAbove(list.entries, slot, box)) {
            box.top = above->y;
            if (!isStorable(box))
                return {};
            list.entries[slot] = {};
            *above = entryOf(box);
            return area;
        }
    }
    list.entries[slot] = entryOf(box);
    return area;
}

} // namespace quillon
