#include "region/survey.h"

namespace quillon {
namespace {

// Finds the boxes near the rectangle.  Gives false when the list is not in normal
// form, in which every box stands behind those before it in order, overlaps none of
// them, touches none in a row, and continues none downward.
bool findNear(Survey &survey, const Rect &rect) {
    const ListBoxes &list = survey.list;
    int row = 0;   // the first box with the top of the current one
    int alive = 0; // the boxes before this one end above that top
    for (int i = 0; i < list.count; ++i) {
        const Rect box = list.boxes[i];
        if (isEmpty(box))
            return false;
        if (i > 0 && box.top == list.boxes[i - 1].top) {
            if (box.left <= list.boxes[i - 1].right)
                return false;
        } else if (i > 0) {
            if (box.top < list.boxes[i - 1].top)
                return false;
            row = i;
            while (alive < row && list.boxes[alive].bottom < box.top)
                ++alive;
        }
        for (int k = alive; k < row; ++k) {
            const Rect &above = list.boxes[k];
            if (above.bottom < box.top || above.right < box.left || box.right < above.left)
                continue;
            if (above.bottom > box.top || haveSameColumns(above, box))
                return false;
        }
        if (box.top <= rect.bottom && rect.top <= box.bottom && box.left <= rect.right &&
            rect.left <= box.right)
            survey.near[survey.nearCount++] = i;
    }
    return true;
}

} // namespace

void surveyList(const RasterRectList &list, const Rect &rect, Survey &survey) {
    int count = 0;
    for (; count < kSlots && list.entries[count].width >= 1; ++count) {
        survey.list.boxes[count] = boxOf(list.entries[count]);
        survey.area += areaOf(list.entries[count]);
    }
    survey.list.count = count;
    survey.isNormal = count < kSlots && findNear(survey, rect) && isZeroFrom(list, count);
}

} // namespace quillon
