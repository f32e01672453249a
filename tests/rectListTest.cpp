// Rectangle lists, held to a bitmap.
#include "raster.h"

#include "support/messages.h"
#include "support/random.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <limits>
#include <regex>
#include <vector>

using namespace quillon::test;

// In the namespace of the record, where the macros look for them.
static bool operator==(const RasterRectList &a, const RasterRectList &b) {
    return std::memcmp(&a, &b, sizeof(a)) == 0;
}

static std::ostream &operator<<(std::ostream &out, const RasterRectList &list) {
    for (const RasterRectListEntry &e : list.entries)
        out << "\n    " << e.x << ", " << e.y << ", " << e.width << " x " << e.height;
    return out;
}

namespace {

using Entry = RasterRectListEntry;

constexpr int32 kMin = std::numeric_limits<int32>::min();
constexpr int32 kMax = std::numeric_limits<int32>::max();
constexpr int kSlots = 16;
constexpr size_t kMaxEntries = 15;

RasterRectList listOf(const std::vector<Entry> &entries) {
    RasterRectList list = {};
    std::copy(entries.begin(), entries.end(), list.entries);
    return list;
}

uint32 add(RasterRectList &list, const Entry &e) {
    return Raster_AddRect(&list, e.x, e.y, e.width, e.height);
}

uint32 subtract(RasterRectList &list, const Entry &e) {
    return Raster_SubRect(&list, e.x, e.y, e.width, e.height);
}

// --- The model ---------------------------------------------------------------

// A field of cells for lists whose coordinates are small numbers.
constexpr int kCells = 24;

class Bitmap {
public:
    void set(const Entry &rect, bool value) {
        for (int y = std::max(rect.y, 0); y < std::min(rect.y + rect.height, kCells); ++y) {
            for (int x = std::max(rect.x, 0); x < std::min(rect.x + rect.width, kCells); ++x)
                cells_[size_t(y)][size_t(x)] = value;
        }
    }

    // The normal form, row after row: a run of cells lengthens the entry that
    // ended with the very same run in the row above, or begins a new one.
    std::vector<Entry> entries() const {
        std::vector<Entry> found;
        for (int y = 0; y < kCells; ++y) {
            for (int x = 0; x < kCells; ++x) {
                if (!cells_[size_t(y)][size_t(x)])
                    continue;
                const int left = x;
                while (x < kCells && cells_[size_t(y)][size_t(x)])
                    ++x;
                const auto above = std::find_if(found.begin(), found.end(), [&](const Entry &e) {
                    return e.y + e.height == y && e.x == left && e.width == x - left;
                });
                if (above != found.end())
                    ++above->height;
                else
                    found.push_back({left, y, x - left, 1});
            }
        }
        return found;
    }

private:
    std::array<std::array<bool, kCells>, kCells> cells_ = {};
};

std::vector<Entry> used(const RasterRectList &list) {
    const auto *end = std::find_if(std::begin(list.entries), std::end(list.entries),
                                   [](const Entry &e) { return e.width < 1; });
    return {std::begin(list.entries), end};
}

Entry boundingBox(const std::vector<Entry> &entries) {
    int left = kMax, top = kMax, right = kMin, bottom = kMin;
    for (const Entry &e : entries) {
        left = std::min(left, e.x);
        top = std::min(top, e.y);
        right = std::max(right, e.x + e.width);
        bottom = std::max(bottom, e.y + e.height);
    }
    return {left, top, right - left, bottom - top};
}

uint32 areaOf(const std::vector<Entry> &entries) {
    uint32 area = 0;
    for (const Entry &e : entries)
        area += uint32(e.width) * uint32(e.height);
    return area;
}

struct Outcome {
    RasterRectList list;
    size_t count;  // of the entries that mean anything
    uint32 result; // in cells
};

// What a call has to do to a list whose coordinates are cells.
Outcome model(const RasterRectList &list, const Entry &rect, bool isAdding) {
    std::vector<Entry> all = used(list);
    const Outcome unchanged = {list, all.size(), 0};
    if (rect.width == 0 || rect.height == 0)
        return unchanged;
    if (list.entries[0].width < 1 || list.entries[0].height < 1) {
        if (!isAdding)
            return unchanged;
        RasterRectList stored = list;
        stored.entries[0] = rect;
        return {stored, std::max<size_t>(all.size(), 1), areaOf({rect})};
    }
    Bitmap bitmap;
    for (const Entry &e : all)
        bitmap.set(e, true);
    bitmap.set(rect, isAdding);
    std::vector<Entry> entries = bitmap.entries();
    if (entries.size() > kMaxEntries) {
        if (!isAdding)
            return unchanged;
        all.push_back(rect);
        entries = {boundingBox(all)};
    }
    return {listOf(entries), entries.size(), areaOf(entries)};
}

// Where the field of cells lies in the coordinates of the library, and how large
// a cell is there.
struct Placement {
    int32 x, y, width, height;

    Entry operator()(const Entry &e) const {
        const auto place = [](int32 origin, int32 cell, int32 size) {
            return int32(uint32(origin) + uint32(cell) * uint32(size));
        };
        return {place(x, e.x, width), place(y, e.y, height), e.width * width, e.height * height};
    }

    RasterRectList operator()(RasterRectList list, size_t count) const {
        std::transform(list.entries, list.entries + count, list.entries, *this);
        return list;
    }
};

Placement randomPlacement(Random &random) {
    const auto size = [&] { return random.oneOf({1, 1, 3, 1000, kMax / kCells}); };
    const int32 width = size(), height = size();
    // At the ends of the coordinates too, so that the last edge is a limit.
    const auto origin = [&](int32 cell) {
        return random.oneOf({0, -7, kMin, int32(kMax - int64_t{cell} * kCells)});
    };
    return {origin(width), origin(height), width, height};
}

Entry randomRect(Random &random) {
    const int32 largest = random.oneOf({3, 6, kCells});
    const int32 width = random.between(1, largest), height = random.between(1, largest);
    return {random.between(0, kCells - width), random.between(0, kCells - height), width, height};
}

// A list as a host may fill it: overlapping, unordered, with entries of no
// height, and anything at all behind its end.
RasterRectList randomList(Random &random) {
    RasterRectList list;
    random.fill(&list, sizeof(list));
    const auto count = random.below(kSlots + 1);
    for (uint32 i = 0; i < count; ++i) {
        list.entries[i] = randomRect(random);
        if (random.oneIn(16))
            list.entries[i].height = 0;
    }
    if (count < kSlots)
        list.entries[count].width = random.oneOf({0, -1, kMin});
    return list;
}

// A list in normal form but for one entry that is cut in two, which still touch.
RasterRectList randomSplitList(Random &random) {
    Bitmap bitmap;
    for (int i = 0; i < 3; ++i)
        bitmap.set(randomRect(random), !random.oneIn(3));
    std::vector<Entry> entries = bitmap.entries();
    if (entries.empty() || entries.size() > kMaxEntries)
        return {};
    Entry &first = entries[random.below(uint32(entries.size()))];
    Entry second = first;
    if (random.oneIn(2)) {
        first.width = random.between(1, first.width);
        second.x += first.width;
        second.width -= first.width;
        Entry &shortened = random.oneIn(2) ? first : second;
        const int32 rows = random.between(0, first.height - 1);
        shortened.y += rows;
        shortened.height -= rows;
    } else {
        first.height = random.between(1, first.height);
        second.y += first.height;
        second.height -= first.height;
    }
    if (second.width > 0 && second.height > 0)
        entries.push_back(second);
    std::sort(entries.begin(), entries.end(),
              [](const Entry &a, const Entry &b) { return a.y != b.y ? a.y < b.y : a.x < b.x; });
    return listOf(entries);
}

void checkStep(Random &random, const Placement &placement, RasterRectList &cells) {
    Entry rect = randomRect(random);
    const bool isAdding = random.oneIn(2);
    if (random.oneIn(16))
        (random.oneIn(2) ? rect.width : rect.height) = isAdding ? 0 : random.between(-1, 0);
    const Outcome expected = model(cells, rect, isAdding);

    RasterRectList list = placement(cells, used(cells).size());
    const Entry placed = placement(rect);
    const uint32 result = isAdding ? add(list, placed) : subtract(list, placed);
    EXPECT_EQ(result, expected.result * uint32(placement.width) * uint32(placement.height));
    EXPECT_EQ(list, placement(expected.list, expected.count))
        << (isAdding ? "after adding " : "after cutting ") << rect.x << ", " << rect.y << ", "
        << rect.width << " x " << rect.height << " (in cells) with" << cells;
    cells = expected.list;
}

TEST(RectList, agreesWithABitmapOverLongSequences) {
    forEachCase(400, [](Random &random) {
        const Placement placement = randomPlacement(random);
        RasterRectList list = {};
        for (int step = 0; step < 300 && !testing::Test::HasFailure(); ++step)
            checkStep(random, placement, list);
    });
}

TEST(RectList, bringsAnyListToNormalForm) {
    forEachCase(30000, [](Random &random) {
        RasterRectList list = random.oneIn(2) ? randomList(random) : randomSplitList(random);
        checkStep(random, randomPlacement(random), list);
    });
}

// --- Known values ------------------------------------------------------------

TEST(RectList, addsNeighboursAndOverlaps) {
    const RasterRectList square = listOf({{0, 0, 10, 10}});
    RasterRectList list = {};
    EXPECT_EQ(add(list, {0, 0, 10, 10}), 100u);
    EXPECT_EQ(list, square);
    EXPECT_EQ(add(list, {10, 0, 10, 10}), 200u);
    EXPECT_EQ(list, listOf({{0, 0, 20, 10}}));
    list = square;
    EXPECT_EQ(add(list, {0, 10, 10, 10}), 200u);
    EXPECT_EQ(list, listOf({{0, 0, 10, 20}}));
    list = square;
    EXPECT_EQ(add(list, {5, 5, 10, 10}), 175u);
    EXPECT_EQ(list, listOf({{0, 0, 10, 5}, {0, 5, 15, 5}, {5, 10, 10, 5}}));
    list = square;
    EXPECT_EQ(subtract(list, {4, 4, 2, 2}), 96u);
    EXPECT_EQ(list, listOf({{0, 0, 10, 4}, {0, 4, 4, 2}, {6, 4, 4, 2}, {0, 6, 10, 4}}));
    Raster_ClearRectList(&list);
    EXPECT_EQ(list, RasterRectList{});
}

TEST(RectList, theSixteenthEntryIsTooMany) {
    RasterRectList list = {};
    for (int i = 0; i < 15; ++i)
        EXPECT_EQ(add(list, {20 * i, 20 * i, 10, 10}), 100u * uint32(i + 1));
    EXPECT_EQ(used(list).size(), 15u);
    EXPECT_EQ(add(list, {300, 300, 10, 10}), 96100u);
    EXPECT_EQ(list, listOf({{0, 0, 310, 310}}));

    // Holes make three entries each: the fifth is refused.
    list = listOf({{0, 0, 100, 100}});
    for (int i = 1; i < 5; ++i)
        EXPECT_EQ(subtract(list, {10 * i, 10 * i, 2, 2}), 10000u - 4u * uint32(i));
    EXPECT_EQ(used(list).size(), 13u);
    const RasterRectList full = list;
    EXPECT_EQ(subtract(list, {50, 50, 2, 2}), 0u);
    EXPECT_EQ(list, full);
}

// --- Limits ------------------------------------------------------------------

TEST(RectList, aRegionTooLargeForAnEntryIsNotStored) {
    for (const bool isWide : {true, false}) {
        const auto turned = [=](Entry e) {
            return isWide ? e : Entry{e.y, e.x, e.height, e.width};
        };
        RasterRectList list = {};
        EXPECT_EQ(add(list, turned({kMin, 0, kMax, 1})), uint32(kMax));
        const RasterRectList before = list;
        EXPECT_EQ(add(list, turned({-1, 0, 100, 1})), 0u);
        EXPECT_EQ(list, before);
        EXPECT_EQ(subtract(list, turned({kMin, 0, kMax, 1})), 0u);
        EXPECT_EQ(list, RasterRectList{});
    }
}

TEST(RectList, anEdgeThatWrapsCoversNothing) {
    const RasterRectList square = listOf({{0, 0, 10, 10}});
    for (const Entry &e : {Entry{kMax - 5, 0, 10, 10}, Entry{0, kMax - 5, 10, 10}}) {
        RasterRectList list = square;
        EXPECT_EQ(add(list, e), 100u);
        EXPECT_EQ(subtract(list, e), 100u);
        EXPECT_EQ(list, square);
    }
}

// Any numbers at all: no undefined behaviour, and what has been brought to normal
// form stays as it is.
TEST(RectList, survivesAnyNumbers) {
    forEachCase(100000, [](Random &random) {
        const auto number = [&] {
            return random.oneOf({kMin, kMin + 1, -1, 0, 1, kMax - 1, kMax, random.between(-9, 9),
                                 random.between(kMin, kMax)});
        };
        RasterRectList list = {};
        const auto count = random.below(kSlots + 1);
        for (uint32 i = 0; i < count; ++i)
            list.entries[i] = {number(), number(), random.between(1, kMax), number()};
        const Entry rect = {number(), number(), random.between(0, kMax), random.between(0, kMax)};
        try {
            random.oneIn(2) ? add(list, rect) : subtract(list, rect);
            if (subtract(list, {0, 0, -1, -1}) == 0)
                return;
            const RasterRectList normal = list;
            EXPECT_EQ(subtract(list, {0, 0, -1, -1}), areaOf(used(normal)));
            EXPECT_EQ(list, normal);
        } catch (const PanicError &) {
        }
    });
}

// --- Panics ------------------------------------------------------------------

TEST(RectList, refusesNegativeSizes) {
    const std::regex message("VERIFY lib/raster/rasterRect:[1-9][0-9]* bugNr=15740\n");
    const RasterRectList square = listOf({{0, 0, 10, 10}});
    for (const RasterRectList &before : {RasterRectList{}, square}) {
        RasterRectList list = before;
        for (const Entry &e : {Entry{0, 0, -1, 5}, Entry{0, 0, 5, kMin}, Entry{0, 0, -1, -1}})
            EXPECT_TRUE(std::regex_match(expectPanic([&] { add(list, e); }), message));
        // A size of 0 comes first.
        EXPECT_EQ(add(list, {0, 0, 0, -5}), 0u);
        EXPECT_EQ(add(list, {0, 0, -5, 0}), 0u);
        EXPECT_EQ(list, before);
    }
}

TEST(RectList, sixteenSpansInARow) {
    RasterRectList columns;
    for (int i = 0; i < kSlots; ++i)
        columns.entries[i] = {10 * i, 0, 5, 20};
    RasterRectList list = columns;
    // From the first row on, the split finds no free span.
    const int first = panicLine(expectPanic([&] {
                                    subtract(list, {1, -5, 2, 10});
                                }),
                                "VERIFY lib/raster/rasterRect");
    EXPECT_GT(first, 0);
    EXPECT_EQ(list, columns);
    // Further down the sixteen entries are too many before it comes to that.
    EXPECT_EQ(subtract(list, {1, 5, 2, 10}), 0u);
    EXPECT_EQ(list, columns);
    // Without one of the columns the rest fits.
    EXPECT_EQ(subtract(list, {70, 0, 5, 20}), 1500u);
    EXPECT_EQ(used(list).size(), 15u);
    // A seventeenth rectangle takes full part, whether it fits or not.
    list = columns;
    EXPECT_EQ(add(list, {0, 0, 150, 20}), 3100u);
    EXPECT_EQ(list, listOf({{0, 0, 155, 20}}));
    list = columns;
    EXPECT_EQ(add(list, {200, 0, 5, 30}), 205u * 30u);
    EXPECT_EQ(list, listOf({{0, 0, 205, 30}}));
}

} // namespace
