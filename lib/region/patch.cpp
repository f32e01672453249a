#include "region/patch.h"

#include "region/survey.h"

#include <algorithm>

namespace quillon {
namespace {

// ---- The boxes that replace the near ones -----------------------------------

// In normal form.  There are at most four for each near box; or one above, two
// beside and one below.
using Pieces = Boxes<4 * kSlots>;

// Declared inline, as GCC would call some of these: 5 % of the time of an addition.

inline void insertInOrder(Pieces &pieces, const Rect &box) {
    Rect *place = pieces.boxes + pieces.count++;
    for (; place != pieces.boxes && isBefore(box, place[-1]); --place)
        *place = place[-1];
    *place = box;
}

// The piece that a box would continue downward, or null.
inline Rect *pieceAbove(Pieces &pieces, const Rect &box) {
    Rect *const end = pieces.boxes + pieces.count;
    Rect *const above = std::find_if(pieces.boxes, end, [&](const Rect &piece) {
        return piece.bottom == box.top && haveSameColumns(piece, box);
    });
    return above != end ? above : nullptr;
}

// Appends the pieces in the rows of an added rectangle, in each of which it is one
// span with all the near ones.  Gives the piece of the last rows.
Rect *appendJoinedRows(const Survey &survey, const Rect &rect, Pieces &pieces) {
    // The boxes that extend the rectangle to the left or right, by ascending top.
    Boxes<kSlots> wide;
    for (int i = 0; i < survey.nearCount; ++i) {
        const Rect &box = survey.nearBox(i);
        if (shareRows(box, rect) && (box.left < rect.left || box.right > rect.right))
            wide.append(box);
    }
    const Rect *alive = wide.begin();
    Rect *piece = nullptr;
    for (int32_t y = rect.top; y < rect.bottom;) {
        while (alive != wide.end() && alive->bottom <= y)
            ++alive;
        // Edges as separate variables: a box written field by field and then read
        // as a whole waits until the stores have reached the cache.
        int32_t left = rect.left, right = rect.right, bottom = rect.bottom;
        const Rect *box = alive;
        for (; box != wide.end() && box->top <= y; ++box) {
            if (box->bottom <= y)
                continue;
            bottom = std::min(bottom, box->bottom);
            left = std::min(left, box->left);
            right = std::max(right, box->right);
        }
        if (box != wide.end())
            bottom = std::min(bottom, box->top);
        const Rect band = {.left = left, .top = y, .right = right, .bottom = bottom};
        // The first band can continue any piece above, the others only the band
        // before them.
        if (piece == nullptr)
            piece = pieceAbove(pieces, band);
        if (piece == nullptr || !haveSameColumns(*piece, band)) {
            pieces.append(band);
            piece = pieces.boxes + pieces.count - 1;
        }
        piece->bottom = band.bottom;
        y = band.bottom;
    }
    return piece;
}

void makeAddedPieces(const Survey &survey, const Rect &rect, Pieces &pieces) {
    for (int i = 0; i < survey.nearCount; ++i) {
        const Rect &box = survey.nearBox(i);
        if (box.top < rect.top)
            pieces.append({box.left, box.top, box.right, std::min(box.bottom, rect.top)});
    }
    Rect *const last = appendJoinedRows(survey, rect, pieces);
    for (int i = 0; i < survey.nearCount; ++i) {
        const Rect &box = survey.nearBox(i);
        if (box.bottom <= rect.bottom)
            continue;
        if (haveSameColumns(*last, box))
            last->bottom = box.bottom;
        else
            insertInOrder(pieces,
                          {box.left, std::max(box.top, rect.bottom), box.right, box.bottom});
    }
}

// Inserts a box with an edge on the cut, which can continue a piece above it.
inline void insertBesideCut(Pieces &pieces, const Rect &box) {
    if (isEmpty(box))
        return;
    if (Rect *const above = pieceAbove(pieces, box))
        above->bottom = box.bottom;
    else
        insertInOrder(pieces, box);
}

void makeCutPieces(const Survey &survey, const Rect &cut, Pieces &pieces) {
    for (int i = 0; i < survey.nearCount; ++i) {
        const Rect &box = survey.nearBox(i);
        if (!overlap(box, cut)) {
            insertBesideCut(pieces, box);
            continue;
        }
        const int32_t top = std::max(box.top, cut.top);
        const int32_t bottom = std::min(box.bottom, cut.bottom);
        if (box.top < top)
            insertInOrder(pieces, {box.left, box.top, box.right, top});
        insertBesideCut(pieces, {box.left, top, cut.left, bottom});
        insertBesideCut(pieces, {cut.right, top, box.right, bottom});
        if (bottom < box.bottom)
            insertInOrder(pieces, {box.left, bottom, box.right, box.bottom});
    }
}

// ---- Their way into the list ------------------------------------------------

bool fits(const Survey &survey, const Pieces &pieces) {
    return survey.list.count - survey.nearCount + pieces.count <= kMaxEntries &&
           std::all_of(pieces.begin(), pieces.end(), isStorable);
}

// Merges the pieces with the entries that stay, and gives the area of all.  From
// the last entry on, so that entries before the first change are not visited.
uint32_t replaceNear(RasterRectList &list, const Survey &survey, const Pieces &pieces) {
    const int oldCount = survey.list.count;
    uint32_t area = survey.area;
    int from = oldCount - 1;
    int nearLeft = survey.nearCount;
    int piecesLeft = pieces.count;
    int to = oldCount - nearLeft + piecesLeft;
    // The last slot of a list in normal form is all zero.
    for (int i = to; i < oldCount; ++i)
        list.entries[i] = list.entries[kSlots - 1];
    while (nearLeft > 0 || piecesLeft > 0) {
        if (nearLeft > 0 && survey.near[nearLeft - 1] == from) {
            --nearLeft;
            area -= areaOf(survey.list.boxes[from--]);
        } else if (piecesLeft > 0 &&
                   (from < 0 || isBefore(survey.list.boxes[from], pieces.boxes[piecesLeft - 1]))) {
            area += areaOf(pieces.boxes[--piecesLeft]);
            list.entries[--to] = entryOf(pieces.boxes[piecesLeft]);
        } else {
            list.entries[--to] = entryOf(survey.list.boxes[from--]);
        }
    }
    return area;
}

PatchResult replaceIfFits(RasterRectList &list, const Survey &survey, const Pieces &pieces) {
    if (!fits(survey, pieces))
        return {PatchOutcome::kDoesNotFit, 0};
    return {PatchOutcome::kDone, replaceNear(list, survey, pieces)};
}

} // namespace

PatchResult addByPatch(RasterRectList &list, int32_t x, int32_t y, int32_t width, int32_t height) {
    const Rect rect = boxOf(x, y, width, height);
    Survey survey;
    surveyList(list, rect, survey);
    if (!survey.isNormal || isEmpty(rect))
        return {PatchOutcome::kNeedsSweep, 0};
    for (int i = 0; i < survey.nearCount; ++i) {
        if (covers(survey.nearBox(i), rect))
            return {PatchOutcome::kDone, survey.area};
    }
    // An entry right above or below can continue only in rows that the rectangle
    // extends to the entry's own columns.
    survey.keepNear([&](const Rect &box) {
        return shareRows(box, rect) || (box.left <= rect.left && rect.right <= box.right);
    });
    Pieces pieces;
    makeAddedPieces(survey, rect, pieces);
    return replaceIfFits(list, survey, pieces);
}

PatchResult cutByPatch(RasterRectList &list, const Rect &cut) {
    Survey survey;
    surveyList(list, cut, survey);
    if (!survey.isNormal)
        return {PatchOutcome::kNeedsSweep, 0};
    if (survey.nearCount == 0 || isEmpty(cut))
        return {PatchOutcome::kDone, survey.area};
    // An entry right above or below can continue only in what is left beside the
    // cut.
    survey.keepNear([&](const Rect &box) {
        return shareRows(box, cut) || box.right == cut.left || box.left == cut.right;
    });
    Pieces pieces;
    makeCutPieces(survey, cut, pieces);
    return replaceIfFits(list, survey, pieces);
}

} // namespace quillon
