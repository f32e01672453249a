// Additions behind all entries of a list, as when the rectangles of a region come in
// their order.
#pragma once

#include "region/survey.h"

#include <algorithm>
#include <optional>

namespace quillon {

// The first of so many entries that the given one would continue downward, or null.
inline RasterRectListEntry *entryAbove(RasterRectListEntry *entry, int count,
                                       const RasterRectListEntry &below) {
    for (; count > 0; --count, ++entry) {
        if (entry->x == below.x && entry->width == below.width && bottomOf(*entry) == below.y)
            return entry;
    }
    return nullptr;
}

// Adds a rectangle that lies below all entries, or behind them in the last row of
// entries, to which nothing from above reaches.  It becomes the last entry, widens
// the last one, or continues another one downward.  Gives the area of the list, or
// nothing, with the list unchanged: for any other rectangle, and where there is no slot.
[[gnu::always_inline]] inline std::optional<uint32_t>
append(RasterRectList &list, const Survey &survey, RasterRectListEntry added) {
    int slot = survey.count;
    int32_t reach = survey.bottom; // of the entries above
    if (added.y < reach) {
        const RasterRectListEntry &last = list.entries[slot - 1];
        if (added.y != last.y || added.x < last.x || added.y < survey.bottomAbove)
            return {};
        reach = survey.bottomAbove;
        const int32_t lastRight = wrappingAdd(last.x, last.width);
        if (added.x <= lastRight) {
            const int32_t right = std::max(lastRight, wrappingAdd(added.x, added.width));
            added.x = last.x;
            added.width = wrappingSubtract(right, last.x);
            if (added.height != last.height || added.width < 1)
                return {};
            --slot;
        }
    }
    // The slot behind the last entry is zero.
    const uint32_t area = survey.area - areaOf(list.entries[slot]) + areaOf(added);
    if (added.y == reach) {
        if (RasterRectListEntry *const above = entryAbove(list.entries, slot, added)) {
            const int32_t height = wrappingAdd(above->height, added.height);
            if (height < 1)
                return {};
            above->height = height;
            list.entries[slot] = {};
            return area;
        }
    }
    if (slot == kMaxEntries)
        return {};
    list.entries[slot] = added;
    return area;
}

} // namespace quillon
