#include "region/sweep.h"

#include "core/failure.h"

#include <algorithm>

namespace quillon {
namespace {

// The rows at which a box begins or ends, ascending, each once.
struct RowEdges {
    int count = 0;
    int32_t rows[2 * kMaxBoxes];
};

struct Span {
    int32_t left;
    int32_t right;
    bool matched; // an open entry of the result continues in this span
};

// The spans of one row, ascending; they neither overlap nor touch.
struct Band {
    int count = 0;
    Span spans[kMaxBoxes];

    // Replaces the spans first to last - 1, which may be none, by one.
    void replace(int first, int last, int32_t left, int32_t right) {
        if (first == last) {
            for (int i = count; i > first; --i)
                spans[i] = spans[i - 1];
        } else {
            std::copy(spans + last, spans + count, spans + first + 1);
        }
        count -= last - first - 1;
        spans[first] = {.left = left, .right = right, .matched = false};
    }

    void remove(int at) {
        std::copy(spans + at + 1, spans + count, spans + at);
        --count;
    }
};

void insertEdge(int32_t row, RowEdges &edges) {
    int32_t *const end = edges.rows + edges.count;
    int32_t *const place = std::lower_bound(edges.rows, end, row);
    if (place != end && *place == row)
        return;
    std::copy_backward(place, end, end + 1);
    *place = row;
    ++edges.count;
}

// Merges the columns of the boxes in row y to spans.
void buildBand(int32_t y, const ListBoxes &list, Band &band) {
    for (const Rect &box : list) {
        if (isEmpty(box) || y < box.top || y >= box.bottom)
            continue;
        // Spans that touch are merged as those that overlap are.
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

// Removes the columns of the cut.  Gives false when a span has to be split with all
// slots in use.
bool cutBand(const Rect &cut, Band &band) {
    for (int i = 0; i < band.count && band.spans[i].left < cut.right;) {
        Span &span = band.spans[i];
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
                    panicVerify(kUnitRasterRect);
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

// Continues the open entries of the result in the spans with their columns, closes
// the others at row y, and opens an entry for each span that is left.  An entry is
// open while its height is 0.  Gives false when there is no slot for a span.
bool commitBand(int32_t y, ListBoxes &result, Band &band) {
    Span *const end = band.spans + band.count;
    for (int i = 0; i < result.count; ++i) {
        Rect &entry = result.boxes[i];
        if (entry.bottom != entry.top)
            continue;
        Span *const span = std::find_if(band.spans, end, [&](const Span &s) {
            return s.left == entry.left && s.right == entry.right;
        });
        if (span != end)
            span->matched = true;
        else
            entry.bottom = y;
    }
    for (const Span *span = band.spans; span != end; ++span) {
        if (span->matched)
            continue;
        if (result.count == kMaxEntries)
            return false;
        result.append({.left = span->left, .top = y, .right = span->right, .bottom = y});
    }
    return true;
}

} // namespace

bool sweepBoxes(const ListBoxes &list, const Rect *cut, ListBoxes &result) {
    RowEdges edges;
    for (const Rect &box : list) {
        insertEdge(box.top, edges);
        insertEdge(box.bottom, edges);
    }
    if (cut != nullptr) {
        insertEdge(cut->top, edges);
        insertEdge(cut->bottom, edges);
    }
    for (int i = 0; i < edges.count; ++i) {
        const int32_t y = edges.rows[i];
        Band band;
        buildBand(y, list, band);
        if (cut != nullptr && cut->top <= y && y < cut->bottom && !cutBand(*cut, band))
            return false;
        if (!commitBand(y, result, band))
            return false;
    }
    return std::all_of(result.begin(), result.end(), isStorable);
}

} // namespace quillon
