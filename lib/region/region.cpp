// Regions of pixels as short lists of rectangles in normal form.
//
// Two ways lead to the normal form of a changed region.
//
// The sweep takes any list.  It goes down the rows at which a rectangle begins
// or ends, reduces the rectangles there to a band of spans, and lets entries of
// the result run on through bands that hold exactly their span.
//
// The patch takes a list that is in normal form already, as every list is that
// comes from here, and touches only what the rectangle is near to, that is what
// it overlaps or touches, corners included.  The rest stays.  For in the rows of
// the rectangle only spans near to it change.  And any other change is an entry
// that starts or ceases to run on into a changed span above or below it; as that
// span has the edges of the entry before or after, the entry is near too.
#include <quillon/raster.h>

#include "core/coordinates.h"
#include "core/failure.h"

#include <algorithm>
#include <cstdint>
#include <cstring>

using namespace quillon;

static_assert(sizeof(RasterRectList) == 256);

namespace {

constexpr const char *kUnit = "lib/raster/rasterRect";
constexpr int kBugNegativeSize = 15740;

constexpr int kSlots = 16;
constexpr int kMaxEntries = 15;       // what a list in normal form may use
constexpr int kMaxBoxes = kSlots + 1; // a list filled to the brim, and one more

// Entries travel as boxes, with their far edges instead of sizes.  What wraps
// has an edge on the wrong side and covers nothing.
Rect boxOf(int32_t x, int32_t y, int32_t width, int32_t height) {
    return {.left = x, .top = y, .right = wrappingAdd(x, width), .bottom = wrappingAdd(y, height)};
}

Rect boxOf(const RasterRectListEntry &entry) {
    return boxOf(entry.x, entry.y, entry.width, entry.height);
}

RasterRectListEntry entryOf(const Rect &box) {
    return {.x = box.left,
            .y = box.top,
            .width = wrappingSubtract(box.right, box.left),
            .height = wrappingSubtract(box.bottom, box.top)};
}

uint32_t areaOf(const RasterRectListEntry &entry) {
    return static_cast<uint32_t>(entry.width) * static_cast<uint32_t>(entry.height);
}

uint32_t areaOf(const Rect &box) {
    return areaOf(entryOf(box));
}

bool isEmpty(const Rect &box) {
    return box.left >= box.right || box.top >= box.bottom;
}

// Whether an entry can hold the box: one of more columns or rows than int32_t can
// tell gets a negative size.
bool isStorable(const Rect &box) {
    return !isEmpty(box) && entryOf(box).width > 0 && entryOf(box).height > 0;
}

bool haveSameColumns(const Rect &a, const Rect &b) {
    return a.left == b.left && a.right == b.right;
}

bool covers(const Rect &outer, const Rect &inner) {
    return outer.left <= inner.left && outer.top <= inner.top && outer.right >= inner.right &&
           outer.bottom >= inner.bottom;
}

bool shareRows(const Rect &a, const Rect &b) {
    return a.top < b.bottom && b.top < a.bottom;
}
bool shareColumns(const Rect &a, const Rect &b) {
    return a.left < b.right && b.left < a.right;
}

bool overlap(const Rect &a, const Rect &b) {
    return shareColumns(a, b) && shareRows(a, b);
}

// The order of the normal form.
bool isBefore(const Rect &a, const Rect &b) {
    return a.top != b.top ? a.top < b.top : a.left < b.left;
}

template <int kCapacity>
struct Boxes {
    int count = 0;
    Rect boxes[kCapacity];

    void append(const Rect &box) { boxes[count++] = box; }
    const Rect *begin() const { return boxes; }
    const Rect *end() const { return boxes + count; }
};

using SweepBoxes = Boxes<kMaxBoxes>;

bool isEmptyList(const RasterRectList &list) {
    return list.entries[0].width < 1 || list.entries[0].height < 1;
}

bool isZeroFrom(const RasterRectList &list, int slot) {
    // Field by field, so that one instruction takes an entry.
    RasterRectListEntry bits = {};
    for (; slot < kSlots; ++slot) {
        bits.x |= list.entries[slot].x;
        bits.y |= list.entries[slot].y;
        bits.width |= list.entries[slot].width;
        bits.height |= list.entries[slot].height;
    }
    return (bits.x | bits.y | bits.width | bits.height) == 0;
}

// Entry by entry: compilers clear a whole record of this size by a string
// instruction, which takes longer.
void clear(RasterRectList &list) {
#pragma GCC unroll 16
    for (RasterRectListEntry &entry : list.entries)
        entry = {};
}

// Whether a list that is not empty has one entry and is in normal form.
bool isSingle(const RasterRectList &list) {
    return list.entries[1].width == 0 && isZeroFrom(list, 1) && !isEmpty(boxOf(list.entries[0]));
}

// --- The sweep ---------------------------------------------------------------

struct RowEdges {
    int count = 0;
    int32_t rows[2 * kMaxBoxes]; // ascending, without duplicates
};

struct RasterRectSpan {
    int32_t left;
    int32_t right;
    bool matched; // an open entry of the result runs on in it
};

// The spans of one row, ascending, neither overlapping nor touching.
struct RasterRectBand {
    int count = 0;
    RasterRectSpan spans[kMaxBoxes];

    // Replaces the spans from first up to, not including, last by one.
    void replace(int first, int last, int32_t left, int32_t right) {
        if (first == last)
            std::copy_backward(spans + last, spans + count, spans + count + 1);
        else
            std::copy(spans + last, spans + count, spans + first + 1);
        count -= last - first - 1;
        spans[first] = {.left = left, .right = right, .matched = false};
    }

    void remove(int at) {
        std::copy(spans + at + 1, spans + count, spans + at);
        --count;
    }
};

void RasterInsertEdge(int32_t row, RowEdges &edges) {
    int32_t *const end = edges.rows + edges.count;
    int32_t *const place = std::lower_bound(edges.rows, end, row);
    if (place != end && *place == row)
        return;
    std::copy_backward(place, end, end + 1);
    *place = row;
    ++edges.count;
}

void RasterBuildBand(int32_t y, const SweepBoxes &list, RasterRectBand &band) {
    for (const Rect &box : list) {
        if (isEmpty(box) || y < box.top || y >= box.bottom)
            continue;
        // Spans that touch count as overlapping, on both sides.
        int32_t left = box.left;
        int32_t right = box.right;
        int first = 0;
        while (first < band.count && band.spans[first].right < left)
            ++first;
        int last = first;
        for (; last < band.count && band.spans[last].left <= right; ++last) {
            left = std::min(left, band.spans[last].left);
            right = std::max(right, band.spans[last].right);
        }
        band.replace(first, last, left, right);
    }
}

// False when a span has to be split with all slots in use.
bool cutBand(const Rect &cut, RasterRectBand &band) {
    for (int i = 0; i < band.count && band.spans[i].left < cut.right;) {
        RasterRectSpan &span = band.spans[i];
        const int32_t end = span.right;
        if (end <= cut.left) {
            ++i;
        } else if (span.left >= cut.left && end <= cut.right) {
            band.remove(i);
        } else if (span.left >= cut.left) {
            span.left = cut.right;
        } else {
            if (end > cut.right) {
                if (band.count == kSlots) {
                    panicVerify(kUnit);
                    return false;
                }
                band.replace(i + 1, i + 1, cut.right, end);
            }
            span.right = cut.left;
            ++i;
        }
    }
    return true;
}

// An entry of the result is open, and still growing downward, while its height
// is 0.  False when a span finds no room.
bool RasterCommitBand(int32_t y, SweepBoxes &result, RasterRectBand &band) {
    RasterRectSpan *const end = band.spans + band.count;
    for (int i = 0; i < result.count; ++i) {
        Rect &entry = result.boxes[i];
        if (entry.bottom != entry.top)
            continue;
        RasterRectSpan *const span = std::find_if(band.spans, end, [&](const RasterRectSpan &s) {
            return s.left == entry.left && s.right == entry.right;
        });
        if (span != end)
            span->matched = true;
        else
            entry.bottom = y;
    }
    for (const RasterRectSpan *span = band.spans; span != end; ++span) {
        if (span->matched)
            continue;
        if (result.count == kMaxEntries)
            return false;
        result.append({.left = span->left, .top = y, .right = span->right, .bottom = y});
    }
    return true;
}

// Brings boxes in any order and position to normal form, without the pixels of
// the cut, if there is one.  False when the result does not fit a list.
bool sweep(const SweepBoxes &list, const Rect *cut, SweepBoxes &result) {
    RowEdges edges;
    for (const Rect &box : list) {
        RasterInsertEdge(box.top, edges);
        RasterInsertEdge(box.bottom, edges);
    }
    if (cut != nullptr) {
        RasterInsertEdge(cut->top, edges);
        RasterInsertEdge(cut->bottom, edges);
    }
    for (int i = 0; i < edges.count; ++i) {
        const int32_t y = edges.rows[i];
        RasterRectBand band;
        RasterBuildBand(y, list, band);
        if (cut != nullptr && cut->top <= y && y < cut->bottom && !cutBand(*cut, band))
            return false;
        if (!RasterCommitBand(y, result, band))
            return false;
    }
    return std::all_of(result.begin(), result.end(), isStorable);
}

// --- The patch ---------------------------------------------------------------

// A list as it is found.
struct Survey {
    SweepBoxes list;
    uint32_t area = 0;
    bool isNormal = true;
    int nearCount = 0;
    int near[kSlots]; // the entries near the rectangle, by index, ascending

    const Rect &nearBox(int i) const { return list.boxes[near[i]]; }

    template <class Predicate>
    void keepNear(Predicate isWanted) {
        int kept = 0;
        for (int i = 0; i < nearCount; ++i) {
            if (isWanted(nearBox(i)))
                near[kept++] = near[i];
        }
        nearCount = kept;
    }
};

// Finds the boxes near to the rectangle, unless the list is not in normal form:
// every box stands behind those before it in order, and neither overlaps one,
// nor touches it in a row, nor could continue it.
bool findNear(Survey &survey, const Rect &rect) {
    const SweepBoxes &list = survey.list;
    int row = 0;   // the first box of the row in which the newest one starts
    int alive = 0; // the boxes before it end above that row
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

void surveyList(const RasterRectList &list, const Rect &rect, Survey &survey) {
    int count = 0;
    for (; count < kSlots && list.entries[count].width >= 1; ++count) {
        survey.list.boxes[count] = boxOf(list.entries[count]);
        survey.area += areaOf(list.entries[count]);
    }
    survey.list.count = count;
    survey.isNormal = count < kSlots && findNear(survey, rect) && isZeroFrom(list, count);
}

// What takes the place of the entries near the rectangle, in normal form: at
// most four boxes for each, or one above, two in the rows and one below.
using Pieces = Boxes<4 * kSlots>;

void insertInOrder(Pieces &pieces, const Rect &box) {
    Rect *place = pieces.boxes + pieces.count++;
    for (; place != pieces.boxes && isBefore(box, place[-1]); --place)
        *place = place[-1];
    *place = box;
}

// The piece that a box would continue downward, or null.
Rect *pieceAbove(Pieces &pieces, const Rect &box) {
    Rect *const end = pieces.boxes + pieces.count;
    Rect *const above = std::find_if(pieces.boxes, end, [&](const Rect &piece) {
        return piece.bottom == box.top && haveSameColumns(piece, box);
    });
    return above != end ? above : nullptr;
}

// The rows of an added rectangle: every span near to it joins it.  Gives the
// piece of the last rows.
Rect *appendJoinedRows(const Survey &survey, const Rect &rect, Pieces &pieces) {
    // Only what stands out on a side matters; it begins in ascending rows.
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
        // Edges by themselves: a box changed field by field, and then copied
        // whole, would keep the processor waiting.
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
        // The first band may continue any piece above, the others only the band
        // before.
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

// A box that has an edge on a cut, and may now continue one above.
void insertBesideCut(Pieces &pieces, const Rect &box) {
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

bool canReplace(const Survey &survey, const Pieces &pieces) {
    return survey.list.count - survey.nearCount + pieces.count <= kMaxEntries &&
           std::all_of(pieces.begin(), pieces.end(), isStorable);
}

// Puts the pieces in the place of the near entries.  From the end, so that it
// is over as soon as nothing moves any more.
uint32_t replaceNear(RasterRectList &list, const Survey &survey, const Pieces &pieces) {
    const int oldCount = survey.list.count;
    uint32_t area = survey.area;
    int from = oldCount - 1;
    int nearLeft = survey.nearCount;
    int piecesLeft = pieces.count;
    int to = oldCount - nearLeft + piecesLeft;
    // The last slot of a normal form is all zero.
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

// --- Storing -----------------------------------------------------------------

uint32_t storeAll(RasterRectList &list, const SweepBoxes &boxes) {
    uint32_t area = 0;
    clear(list);
    for (int i = 0; i < boxes.count; ++i) {
        list.entries[i] = entryOf(boxes.boxes[i]);
        area += areaOf(list.entries[i]);
    }
    return area;
}

// What to do with a region that does not fit.
uint32_t storeBoundingBox(RasterRectList &list, const SweepBoxes &boxes) {
    Rect bounds = boxes.boxes[0];
    for (const Rect &box : boxes)
        Rect_BoundingBox(&bounds, &bounds, &box);
    if (!isStorable(bounds))
        return 0;
    SweepBoxes single;
    single.append(bounds);
    return storeAll(list, single);
}

// What is left of the entries, apart from them, so that their short ways save no
// registers and make no room for this one.
[[gnu::noinline]] uint32_t addToList(RasterRectList &list, int32_t x, int32_t y, int32_t width,
                                     int32_t height) {
    const Rect rect = boxOf(x, y, width, height);
    Survey survey;
    surveyList(list, rect, survey);
    if (survey.isNormal && !isEmpty(rect)) {
        for (int i = 0; i < survey.nearCount; ++i) {
            if (covers(survey.nearBox(i), rect))
                return survey.area;
        }
        // An entry right above or below runs on only into rows joined to its
        // own width.
        survey.keepNear([&](const Rect &box) {
            return shareRows(box, rect) || (box.left <= rect.left && rect.right <= box.right);
        });
        Pieces pieces;
        makeAddedPieces(survey, rect, pieces);
        if (canReplace(survey, pieces))
            return replaceNear(list, survey, pieces);
        survey.list.append(rect);
    } else {
        survey.list.append(rect);
        SweepBoxes result;
        if (sweep(survey.list, nullptr, result))
            return storeAll(list, result);
    }
    return storeBoundingBox(list, survey.list);
}

[[gnu::noinline]] uint32_t cutFromList(RasterRectList &list, const Rect &cut) {
    Survey survey;
    surveyList(list, cut, survey);
    if (survey.isNormal) {
        if (survey.nearCount == 0 || isEmpty(cut))
            return survey.area;
        // An entry right above or below runs on only into what the cut leaves
        // on one of its sides.
        survey.keepNear([&](const Rect &box) {
            return shareRows(box, cut) || box.right == cut.left || box.left == cut.right;
        });
        Pieces pieces;
        makeCutPieces(survey, cut, pieces);
        return canReplace(survey, pieces) ? replaceNear(list, survey, pieces) : 0;
    }
    SweepBoxes result;
    return sweep(survey.list, isEmpty(cut) ? nullptr : &cut, result) ? storeAll(list, result) : 0;
}

} // namespace

void Raster_ClearRectList(RasterRectList *list) {
    clear(*list);
}

uint32_t Raster_AddRect(RasterRectList *list, int32_t x, int32_t y, int32_t width, int32_t height) {
    if (width == 0 || height == 0)
        return 0;
    if (width < 0 || height < 0) {
        panicVerifyBug(kUnit, kBugNegativeSize);
        return 0;
    }
    if (isEmptyList(*list)) {
        list->entries[0] = {.x = x, .y = y, .width = width, .height = height};
        return areaOf(list->entries[0]);
    }

    const Rect rect = boxOf(x, y, width, height);
    if (covers(boxOf(list->entries[0]), rect) && isSingle(*list))
        return areaOf(list->entries[0]);
    return addToList(*list, x, y, width, height);
}

uint32_t Raster_SubRect(RasterRectList *list, int32_t x, int32_t y, int32_t width, int32_t height) {
    if (width == 0 || height == 0 || isEmptyList(*list))
        return 0;

    const Rect cut = boxOf(x, y, std::max(width, 0), std::max(height, 0));
    if (!overlap(boxOf(list->entries[0]), cut) && isSingle(*list))
        return areaOf(list->entries[0]);
    return cutFromList(*list, cut);
}
