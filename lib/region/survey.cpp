#include "region/survey.h"

#include <algorithm>

namespace quillon {
namespace {

using Entry = RasterRectListEntry;

// Whether one of the entries, which end right above the box or higher, is continued by
// it.
inline bool continuesOne(const Entry &entry, const Entry *first, const Entry *end) {
    for (const Entry *above = first; above != end; ++above) {
        if (above->x == entry.x && above->width == entry.width && bottomOf(*above) == entry.y)
            return true;
    }
    return false;
}

// Whether one of the entries, which begin above this one, overlaps it, touches it in a
// row, or is continued by it.  Not inlined: the loop of a survey needs all registers.
[[gnu::noinline]] bool isDisturbed(const Entry &entry, const Entry *first, const Entry *end) {
    const Rect box = boxOf(entry);
    for (const Entry *other = first; other != end; ++other) {
        const Rect above = boxOf(*other);
        if (above.bottom == box.top
                ? haveSameColumns(above, box)
                : above.bottom > box.top && above.left <= box.right && box.left <= above.right)
            return true;
    }
    return false;
}

} // namespace

Survey surveyEntries(const RasterRectList &list) {
    constexpr Survey kNotNormal = {};
    const Entry *entry = list.entries;
    const Entry *row = entry;   // the first entry of the current row
    const Entry *alive = entry; // those before it end above that row
    Rect box = boxOf(*entry);
    uint32_t area = areaOf(*entry);
    int32_t bottom = box.bottom;
    int32_t bottomAbove = kCoordinateMin;
    // A list with all slots in use is not in normal form; any other one has an end.
    if (isEmpty(box) || list.entries[kSlots - 1].width >= 1)
        return kNotNormal;
    while ((++entry)->width >= 1) {
        const int32_t right = box.right;
        box = boxOf(*entry);
        area += areaOf(*entry);
        if (isEmpty(box))
            return kNotNormal;
        // Beside the entry before, in a row to which nothing from above reaches.
        if (box.top == row->y && box.left > right && alive == row) {
            bottom = std::max(bottom, box.bottom);
            continue;
        }
        // Below all entries before.
        if (box.top > bottom) {
            row = entry;
            alive = entry;
            bottomAbove = bottom;
            bottom = box.bottom;
            continue;
        }
        if (box.top == row->y) {
            if (box.left <= right)
                return kNotNormal;
        } else {
            if (box.top < row->y)
                return kNotNormal;
            if (bottomAbove <= row->y) {
                alive = row;
            } else {
                // One of them reaches down to the row.
                while (bottomOf(*alive) < box.top)
                    ++alive;
            }
            bottomAbove = bottom;
            row = entry;
        }
        // From alive on there are entries that reach down to the row.
        if (bottomAbove <= box.top ? continuesOne(*entry, alive, row)
                                   : isDisturbed(*entry, alive, row))
            return kNotNormal;
        bottom = std::max(bottom, box.bottom);
    }
    const int count = static_cast<int>(entry - list.entries);
    if (!isZeroFrom(list, count))
        return kNotNormal;
    return {.count = count, .area = area, .bottom = bottom, .bottomAbove = bottomAbove};
}

} // namespace quillon
