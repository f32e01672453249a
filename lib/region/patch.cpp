#include "region/patch.h"

#include <algorithm>

namespace quillon {
namespace {

// The boxes of the entries near a rectangle, with their indices, ascending.
struct NearBoxes {
    int count = 0;
    int indices[kSlots];
    Rect boxes[kSlots];

    const Rect *begin() const { return boxes; }
    const Rect *end() const { return boxes + count; }
};

// Those of the boxes that overlap or touch the rectangle, corners included, for which
// the predicate holds.
template <class Predicate>
void findNear(const RasterRectList &list, int count, const Rect &rect, Predicate isWanted,
              NearBoxes &near) {
    for (int i = 0; i < count; ++i) {
        const RasterRectListEntry &entry = list.entries[i];
        if (entry.y > rect.bottom)
            return;
        if (entry.x > rect.right || wrappingAdd(entry.x, entry.width) < rect.left)
            continue;
        const Rect box = boxOf(entry);
        if (box.bottom < rect.top || !isWanted(box))
            continue;
        near.indices[near.count] = i;
        near.boxes[near.count++] = box;
    }
}

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
Rect *appendJoinedRows(const NearBoxes &near, const Rect &rect, Pieces &pieces) {
    const Rect *alive = near.begin();
    Rect *piece = nullptr;
    for (int32_t y = rect.top; y < rect.bottom;) {
        while (alive != near.end() && alive->bottom <= y)
            ++alive;
        // Edges as separate variables: a box written field by field and then read
        // as a whole waits until the stores have reached the cache.
        int32_t left = rect.left, right = rect.right, bottom = rect.bottom;
        const Rect *box = alive;
        for (; box != near.end() && box->top <= y; ++box) {
            if (box->bottom <= y)
                continue;
            bottom = std::min(bottom, box->bottom);
            left = std::min(left, box->left);
            right = std::max(right, box->right);
        }
        if (box != near.end())
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

void makeAddedPieces(const NearBoxes &near, const Rect &rect, Pieces &pieces) {
    for (const Rect &box : near) {
        if (box.top < rect.top)
            pieces.append({box.left, box.top, box.right, std::min(box.bottom, rect.top)});
    }
    Rect *const last = appendJoinedRows(near, rect, pieces);
    for (const Rect &box : near) {
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

void makeCutPieces(const NearBoxes &near, const Rect &cut, Pieces &pieces) {
    for (const Rect &box : near) {
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

// Inserts a rectangle that is near none of the entries.
PatchResult insert(RasterRectList &list, int count, uint32_t area, const Rect &rect) {
    if (count == kMaxEntries)
        return {false, 0};
    RasterRectListEntry *place = list.entries + count;
    for (; place != list.entries && !isBefore(place[-1], rect); --place)
        *place = place[-1];
    *place = entryOf(rect);
    return {true, area + areaOf(rect)};
}

// No piece is empty, but one may be too large.
bool areStorable(const Pieces &pieces) {
    int32_t signs = 0;
    for (const Rect &piece : pieces)
        signs |=
            wrappingSubtract(piece.right, piece.left) | wrappingSubtract(piece.bottom, piece.top);
    return signs >= 0;
}

// Gives the area of what is removed.
uint32_t removeNear(RasterRectList &list, int count, const NearBoxes &near) {
    uint32_t area = 0;
    for (const Rect &box : near)
        area += areaOf(box);
    int to = near.indices[0];
    for (int from = to, next = 0; from < count; ++from) {
        if (next < near.count && near.indices[next] == from)
            ++next;
        else
            list.entries[to++] = list.entries[from];
    }
    return area;
}

// Gives the area of what is inserted.  From the last piece on, so that every entry is
// moved once, and those before the first piece not at all.
uint32_t insertPieces(RasterRectList &list, int count, const Pieces &pieces) {
    uint32_t area = 0;
    int from = count - 1;
    for (int i = pieces.count - 1; i >= 0; --i) {
        const Rect &piece = pieces.boxes[i];
        for (; from >= 0 && !isBefore(list.entries[from], piece); --from)
            list.entries[from + i + 1] = list.entries[from];
        list.entries[from + i + 1] = entryOf(piece);
        area += areaOf(piece);
    }
    return area;
}

// There is at least one near box.
PatchResult replaceIfFits(RasterRectList &list, int count, uint32_t area, const NearBoxes &near,
                          const Pieces &pieces) {
    const int kept = count - near.count;
    const int newCount = kept + pieces.count;
    if (newCount > kMaxEntries || !areStorable(pieces))
        return {false, 0};
    area -= removeNear(list, count, near);
    area += insertPieces(list, kept, pieces);
    for (int i = newCount; i < count; ++i)
        list.entries[i] = {};
    return {true, area};
}

} // namespace

PatchResult addByPatch(RasterRectList &list, int count, uint32_t area, const Rect &rect) {
    NearBoxes near;
    // An entry right above or below can continue only in rows that the rectangle
    // extends to the entry's own columns.
    findNear(
        list, count, rect,
        [&](const Rect &box) {
            return shareRows(box, rect) || (box.left <= rect.left && rect.right <= box.right);
        },
        near);
    if (near.count == 0)
        return insert(list, count, area, rect);
    Pieces pieces;
    makeAddedPieces(near, rect, pieces);
    return replaceIfFits(list, count, area, near, pieces);
}

PatchResult cutByPatch(RasterRectList &list, int count, uint32_t area, const Rect &cut) {
    NearBoxes near;
    // An entry right above or below can continue only in what is left beside the
    // cut.
    findNear(
        list, count, cut,
        [&](const Rect &box) {
            return shareRows(box, cut) || box.right == cut.left || box.left == cut.right;
        },
        near);
    if (std::none_of(near.begin(), near.end(), [&](const Rect &box) { return overlap(box, cut); }))
        return {true, area};
    Pieces pieces;
    makeCutPieces(near, cut, pieces);
    return replaceIfFits(list, count, area, near, pieces);
}

} // namespace quillon
