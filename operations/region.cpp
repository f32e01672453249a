// Rectangle lists, held to a bitmap.

#include "operations.h"
#include "support/judge.h"
#include "support/panic.h"
#include <quillon/raster.h>

#include <algorithm>
#include <limits>

namespace quillon::test {
namespace {

using Entry = RasterRectListEntry;

constexpr int32_t kMin = std::numeric_limits<int32_t>::min();
constexpr int32_t kMax = std::numeric_limits<int32_t>::max();

RasterRectList listOf(const std::vector<Entry> &entries) {
    RasterRectList list = {};
    std::copy(entries.begin(), entries.end(), list.entries);
    return list;
}

std::vector<Entry> used(const RasterRectList &list) {
    const auto *end = std::find_if(std::begin(list.entries), std::end(list.entries),
                                   [](const Entry &e) { return e.width < 1; });
    return {std::begin(list.entries), end};
}

using Change = decltype(Raster_AddRect);

uint32_t apply(Change *change, RasterRectList &list, const Entry &e) {
    return change(&list, e.x, e.y, e.width, e.height);
}

uint32_t areaOf(const std::vector<Entry> &entries) {
    uint32_t area = 0;
    for (const Entry &e : entries)
        area += uint32_t(e.width) * uint32_t(e.height);
    return area;
}

// --- The model, for coordinates that are the cells of a small field

constexpr int kCells = 24;

struct Bitmap {
    bool cells[kCells][kCells] = {};

    void set(const Entry &rect, bool value) {
        for (int y = rect.y; y < rect.y + rect.height; ++y)
            std::fill_n(cells[y] + rect.x, std::max(rect.width, 0), value);
    }

    // The normal form, row after row: a run of cells lengthens the entry that
    // ended with the very same run in the row above, or begins a new one.
    std::vector<Entry> entries() const {
        std::vector<Entry> found;
        for (int y = 0; y < kCells; ++y)
            for (int x = 0, left = 0; x < kCells; left = ++x) {
                while (x < kCells && cells[y][x])
                    ++x;
                const Entry run = {left, y, x - left, 1};
                const auto above = std::find_if(found.begin(), found.end(), [&](const Entry &e) {
                    return e.y + e.height == y && e.x == left && e.width == run.width;
                });
                if (above != found.end())
                    ++above->height;
                else if (run.width > 0)
                    found.push_back(run);
            }
        return found;
    }
};

uint32_t model(RasterRectList &list, const Entry &rect, bool isAdding) {
    const bool isEmpty = list.entries[0].width < 1 || list.entries[0].height < 1;
    if (rect.width == 0 || rect.height == 0 || (isEmpty && !isAdding))
        return 0;
    if (isEmpty) {
        list.entries[0] = rect; // the rest is not looked at
        return areaOf({rect});
    }
    const std::vector<Entry> all = used(list);
    Bitmap bitmap;
    for (const Entry &e : all)
        bitmap.set(e, true);
    bitmap.set(rect, isAdding);
    std::vector<Entry> entries = bitmap.entries();
    if (entries.size() > 15) {
        if (!isAdding)
            return 0;
        Rect box = {rect.x, rect.y, rect.x + rect.width, rect.y + rect.height};
        for (const Entry &e : all)
            box = {std::min(box.left, e.x), std::min(box.top, e.y),
                   std::max(box.right, e.x + e.width), std::max(box.bottom, e.y + e.height)};
        entries = {{box.left, box.top, box.right - box.left, box.bottom - box.top}};
    }
    list = listOf(entries);
    return areaOf(entries);
}

// --- Random lists of cells

Entry randomRect(Random &random) {
    const int32_t largest = random.oneOf({3, 6, kCells});
    const int32_t width = random.between(1, largest), height = random.between(1, largest);
    return {random.between(0, kCells - width), random.between(0, kCells - height), width, height};
}

// A list as a host may fill it: overlapping, unordered, with entries of no
// height, and anything at all behind its end.
RasterRectList randomList(Random &random) {
    RasterRectList list;
    random.fill(&list, sizeof(list));
    const uint32_t count = 1 + random.below(16);
    for (uint32_t i = 0; i < count; ++i) {
        list.entries[i] = randomRect(random);
        if (random.oneIn(16))
            list.entries[i].height = 0;
    }
    if (count < 16)
        list.entries[count].width = random.oneOf({0, -1, kMin});
    return list;
}

// Moves an edge of an entry by a cell: the list is almost in normal form.
void disturb(Random &random, RasterRectList &list) {
    const size_t count = used(list).size();
    if (count == 0)
        return;
    Entry &entry = list.entries[random.below(uint32_t(count))], moved = entry;
    moved.*random.oneOf({&Entry::x, &Entry::y, &Entry::width, &Entry::height}) +=
        random.oneOf({-1, 1});
    if (moved.width > 0 && std::min({moved.x, moved.y, moved.height}) >= 0 &&
        std::max(moved.x + moved.width, moved.y + moved.height) <= kCells)
        entry = moved;
}

// Where the field lies in the coordinates of the library, also at their ends, and
// how large a cell is there.
struct Placement {
    explicit Placement(Random &random) {
        for (const int axis : {0, 1}) {
            size[axis] = random.oneOf({1, 1, 3, 1000, kMax / kCells});
            origin[axis] =
                random.oneOf({0, -7, kMin, int32_t(kMax - int64_t{size[axis]} * kCells)});
        }
    }
    Entry operator()(const Entry &e) const {
        const auto place = [&](int axis, int32_t cells, int32_t start) {
            return int32_t(uint32_t(start) + uint32_t(cells) * uint32_t(size[axis]));
        };
        return {place(0, e.x, origin[0]), place(1, e.y, origin[1]), place(0, e.width, 0),
                place(1, e.height, 0)};
    }
    // What lies behind the end stays.
    RasterRectList operator()(RasterRectList list) const {
        std::transform(list.entries, list.entries + used(list).size(), list.entries, *this);
        return list;
    }
    int32_t size[2], origin[2];
};

} // namespace

// A few changes of a list.
void tryRectList(Random &random) {
    const Placement placement(random);
    RasterRectList cells = random.oneIn(2) ? randomList(random) : RasterRectList{};
    for (uint32_t step = 0, steps = 1 + random.below(10); step < steps; ++step) {
        if (random.oneIn(30))
            Raster_ClearRectList(&cells);
        if (random.oneIn(8))
            disturb(random, cells);
        Entry rect = randomRect(random);
        const bool isAdding = random.oneIn(2);
        if (random.oneIn(16)) {
            int32_t &side = random.oneIn(2) ? rect.width : rect.height;
            side = isAdding ? 0 : random.between(-1, 0);
        }
        RasterRectList list = placement(cells);
        const uint32_t area = model(cells, rect, isAdding);
        const Entry placed = placement(rect);
        compare(apply(isAdding ? Raster_AddRect : Raster_SubRect, list, placed),
                area * uint32_t(placement.size[0]) * uint32_t(placement.size[1]), "area of a list");
        compare(list, placement(cells), "list");
    }
}

// No undefined behaviour, and what has been brought to normal form stays as it is.
void tryAnyRectList(Random &random) {
    const auto number = [&] {
        const int32_t small = random.between(-9, 9), any = random.between(kMin, kMax);
        return random.oneOf({kMin, kMin + 1, -1, 0, 1, kMax - 1, kMax, small, any});
    };
    RasterRectList list = {};
    for (uint32_t i = 0, count = random.below(17); i < count; ++i)
        list.entries[i] = {number(), number(), random.between(1, kMax), number()};
    const Entry rect = {number(), number(), random.between(0, kMax), random.between(0, kMax)};
    const Entry nothing = {0, 0, -1, -1};
    try {
        apply(random.oneIn(2) ? Raster_AddRect : Raster_SubRect, list, rect);
        if (apply(Raster_SubRect, list, nothing) == 0)
            return;
        const RasterRectList normal = list;
        compare(apply(Raster_SubRect, list, nothing), areaOf(used(normal)), "area of a list");
        compare(list, normal, "list in normal form");
    } catch (const PanicError &) {
    }
}

void family::region(Random &random) {
    random.oneIn(2) ? tryAnyRectList(random) : tryRectList(random);
}

} // namespace quillon::test
