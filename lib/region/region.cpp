// Regions of pixels as short lists of rectangles in normal form.
//
// A list in normal form, as every list that comes from here, is changed by a patch,
// which replaces the entries near the rectangle.  Any other list, filled by hand,
// is brought to normal form by a sweep.
#include <quillon/raster.h>

#include "core/failure.h"
#include "region/boxes.h"
#include "region/patch.h"
#include "region/sweep.h"

#include <algorithm>

namespace quillon {
namespace {

static_assert(sizeof(RasterRectList) == 256);

constexpr int kBugNegativeSize = 15740;

// Whether a list that is not empty has one entry and is in normal form.
bool isSingle(const RasterRectList &list) {
    return list.entries[1].width == 0 && isZeroFrom(list, 1) && !isEmpty(boxOf(list.entries[0]));
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

// What a patch cannot do.  Kept out of the entries, whose short paths then need no
// stack.
[[gnu::noinline]] uint32_t addWithoutPatch(RasterRectList &list, const Rect &rect,
                                           PatchOutcome outcome) {
    ListBoxes boxes = boxesOf(list);
    boxes.append(rect);
    ListBoxes result;
    if (outcome == PatchOutcome::kNeedsSweep && sweepBoxes(boxes, nullptr, result))
        return storeAll(list, result);
    return storeBoundingBox(list, boxes);
}

// A result that does not fit leaves the list as it is.
[[gnu::noinline]] uint32_t cutWithoutPatch(RasterRectList &list, const Rect &cut,
                                           PatchOutcome outcome) {
    ListBoxes result;
    if (outcome == PatchOutcome::kNeedsSweep &&
        sweepBoxes(boxesOf(list), isEmpty(cut) ? nullptr : &cut, result))
        return storeAll(list, result);
    return 0;
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
    if (isEmptyList(*list)) {
        list->entries[0] = {.x = x, .y = y, .width = width, .height = height};
        return areaOf(list->entries[0]);
    }

    const Rect rect = boxOf(x, y, width, height);
    if (covers(boxOf(list->entries[0]), rect) && isSingle(*list))
        return areaOf(list->entries[0]);
    const PatchResult patched = addByPatch(*list, x, y, width, height);
    return patched.outcome == PatchOutcome::kDone ? patched.area
                                                  : addWithoutPatch(*list, rect, patched.outcome);
}

uint32_t Raster_SubRect(RasterRectList *list, int32_t x, int32_t y, int32_t width, int32_t height) {
    if (width == 0 || height == 0 || isEmptyList(*list))
        return 0;

    const Rect cut = boxOf(x, y, std::max(width, 0), std::max(height, 0));
    if (!overlap(boxOf(list->entries[0]), cut) && isSingle(*list))
        return areaOf(list->entries[0]);
    const PatchResult patched = cutByPatch(*list, cut);
    return patched.outcome == PatchOutcome::kDone ? patched.area
                                                  : cutWithoutPatch(*list, cut, patched.outcome);
}
