// Regions of pixels as short lists of rectangles in normal form.
//
// A list in normal form, as every list that comes from here, is changed by a patch,
// which replaces the entries near the rectangle.  Any other list, filled by hand,
// is brought to normal form by a sweep.  The additions that hosts make most are done
// without either: behind all entries, inside one, or over all of them.
#include <quillon/raster.h>

#include "core/failure.h"
#include "region/append.h"
#include "region/boxes.h"
#include "region/patch.h"
#include "region/survey.h"
#include "region/sweep.h"

#include <algorithm>
#include <optional>

namespace quillon {
namespace {

static_assert(sizeof(RasterRectList) == 256);

constexpr int kBugNegativeSize = 15740;

// ---- Short paths --------------------------------------------------------------

bool coversAll(const Rect &rect, const RasterRectList &list) {
    for (int i = 0; i < kSlots && list.entries[i].width >= 1; ++i) {
        if (!covers(rect, boxOf(list.entries[i])))
            return false;
    }
    return true;
}

// Whether a coordinate is one of those from start on, of which there are so many.
inline bool holds(int32_t start, int32_t extent, int32_t coordinate) {
    return static_cast<uint32_t>(wrappingSubtract(coordinate, start)) <
           static_cast<uint32_t>(extent);
}

// Whether an entry of a list in normal form covers the rectangle.
inline bool isInside(const Rect &rect, const RasterRectList &list) {
    // The slot behind the last entry is zero.
    for (const RasterRectListEntry *entry = list.entries; entry->width >= 1; ++entry) {
        if (entry->y > rect.top)
            return false;
        // Few entries share a column with the left edge.
        if (holds(entry->x, entry->width, rect.left) && covers(boxOf(*entry), rect))
            return true;
    }
    return false;
}

// ---- Long paths ---------------------------------------------------------------

// Those of an addition take the arguments of the exported function, which are still in
// its registers, and are not inlined: its short paths then need no stack.

[[gnu::noinline]] uint32_t storeFirst(RasterRectList &list, int32_t x, int32_t y, int32_t width,
                                      int32_t height) {
    list.entries[0] = {.x = x, .y = y, .width = width, .height = height};
    return areaOf(list.entries[0]);
}

// Adds a rectangle that covers the first entry.  True where it covers all; these are
// replaced then.
[[gnu::noinline]] bool addOverAll(RasterRectList &list, int32_t x, int32_t y, int32_t width,
                                  int32_t height) {
    if (!coversAll(boxOf(x, y, width, height), list))
        return false;
    clear(list);
    storeFirst(list, x, y, width, height);
    return true;
}

ListBoxes boxesOf(const RasterRectList &list) {
    ListBoxes boxes;
    for (int i = 0; i < kSlots && list.entries[i].width >= 1; ++i)
        boxes.append(boxOf(list.entries[i]));
    return boxes;
}

uint32_t storeAll(RasterRectList &list, const ListBoxes &boxes) {
    uint32_t area = 0;
    clear(list);
    for (int i = 0; i < boxes.count; ++i) {
        list.entries[i] = entryOf(boxes.boxes[i]);
        area += areaOf(list.entries[i]);
    }
    return area;
}

// The bounding box stands for a region that does not fit.
uint32_t storeBoundingBox(RasterRectList &list, const ListBoxes &boxes) {
    Rect bounds = boxes.boxes[0];
    for (const Rect &box : boxes)
        Rect_BoundingBox(&bounds, &bounds, &box);
    if (!isStorable(bounds))
        return 0;
    ListBoxes single;
    single.append(bounds);
    return storeAll(list, single);
}

// A list that is not in normal form, or a rectangle that wraps.
[[gnu::noinline]] uint32_t addBySweep(RasterRectList &list, int32_t x, int32_t y, int32_t width,
                                      int32_t height) {
    ListBoxes boxes = boxesOf(list);
    boxes.append(boxOf(x, y, width, height));
    ListBoxes result;
    return sweepBoxes(boxes, nullptr, result) ? storeAll(list, result)
                                              : storeBoundingBox(list, boxes);
}

// A result that does not fit leaves the list as it is.
[[gnu::noinline]] uint32_t cutBySweep(RasterRectList &list, const Rect &cut) {
    ListBoxes result;
    return sweepBoxes(boxesOf(list), isEmpty(cut) ? nullptr : &cut, result) ? storeAll(list, result)
                                                                            : 0;
}

[[gnu::noinline]] uint32_t addAnywhere(RasterRectList &list, int32_t x, int32_t y, int32_t width,
                                       int32_t height, int count, uint32_t area) {
    const Rect rect = boxOf(x, y, width, height);
    const PatchResult patched = addByPatch(list, count, area, rect);
    if (patched.isDone)
        return patched.area;
    ListBoxes boxes = boxesOf(list);
    boxes.append(rect);
    return storeBoundingBox(list, boxes);
}

} // namespace
} // namespace quillon

using namespace quillon;

void Raster_ClearRectList(RasterRectList *list) {
    clear(*list);
}

uint32_t Raster_AddRect(RasterRectList *list, int32_t x, int32_t y, int32_t width, int32_t height) {
    if (width == 0 || height == 0)
        return 0;
    if (width < 0 || height < 0) {
        panicVerifyBug(kUnitRasterRect, kBugNegativeSize);
        return 0;
    }
    if (isEmptyList(*list))
        return storeFirst(*list, x, y, width, height);

    const Rect rect = boxOf(x, y, width, height);
    if (isEmpty(rect))
        return addBySweep(*list, x, y, width, height);
    if (y <= list->entries[0].y && width >= list->entries[0].width &&
        addOverAll(*list, x, y, width, height))
        return areaOf(rect);
    const Survey survey = surveyList(*list);
    if (survey.count == 0)
        return addBySweep(*list, x, y, width, height);
    if (const std::optional<uint32_t> area =
            append(*list, survey, {.x = x, .y = y, .width = width, .height = height}))
        return *area;
    if (isInside(rect, *list))
        return survey.area;
    return addAnywhere(*list, x, y, width, height, survey.count, survey.area);
}

uint32_t Raster_SubRect(RasterRectList *list, int32_t x, int32_t y, int32_t width, int32_t height) {
    if (width == 0 || height == 0 || isEmptyList(*list))
        return 0;

    const Rect cut = boxOf(x, y, std::max(width, 0), std::max(height, 0));
    if (coversAll(cut, *list)) {
        clear(*list);
        return 0;
    }
    const Survey survey = surveyList(*list);
    if (survey.count == 0)
        return cutBySweep(*list, cut);
    return isEmpty(cut) ? survey.area : cutByPatch(*list, survey.count, survey.area, cut).area;
}
