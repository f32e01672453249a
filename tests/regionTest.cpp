// Rectangle lists, held to a bitmap and at their limits.

#include "operations.h"
#include "support/messages.h"
#include <quillon/raster.h>

#include <algorithm>
#include <cstring>

// In the namespace of the record, where the macros look for it.
static bool operator==(const RasterRectList &a, const RasterRectList &b) {
    return std::memcmp(&a, &b, sizeof(a)) == 0;
}

namespace quillon::test {
namespace {

using Entry = RasterRectListEntry;

uint32_t apply(decltype(Raster_AddRect) *change, RasterRectList &list, const Entry &e) {
    return change(&list, e.x, e.y, e.width, e.height);
}

TEST(RectList, agreesWithABitmap) {
    forEachCase(48000, tryRectList);
}

// Any numbers at all.
TEST(RectList, survivesAnyNumbers) {
    forEachCase(100000, tryAnyRectList);
}

TEST(RectList, refusesWhatHasNoSize) {
    for (const bool isWide : {true, false}) {
        const auto turned = [=](const Entry &e) {
            return isWide ? e : Entry{e.y, e.x, e.height, e.width};
        };
        // Together they are wider than an entry tells.
        RasterRectList list = {{turned({INT32_MIN, 0, INT32_MAX, 1})}};
        const RasterRectList before = list;
        EXPECT_EQ(apply(Raster_AddRect, list, turned({-1, 0, 100, 1})), 0u);
        // Whose edge wraps covers nothing.
        EXPECT_EQ(apply(Raster_AddRect, list, turned({INT32_MAX - 5, 0, 10, 3})),
                  uint32_t(INT32_MAX));
        EXPECT_EQ(apply(Raster_SubRect, list, turned({INT32_MAX - 5, 0, 10, 3})),
                  uint32_t(INT32_MAX));
        for (const Entry &next : {Entry{}, Entry{20, 20, 5, 5}}) {
            RasterRectList wrapped = {{turned({INT32_MAX - 5, 0, 10, 3}), next}};
            EXPECT_EQ(apply(Raster_AddRect, wrapped, {0, 0, 5, 5}),
                      25u + uint32_t(next.width * next.height));
        }
        for (const Entry &e : {Entry{0, 0, -1, 5}, Entry{0, 0, 5, INT32_MIN}, Entry{0, 0, -1, -1}})
            expectPanic(
                "VERIFY lib/raster/rasterRect", [&] { apply(Raster_AddRect, list, turned(e)); },
                " bugNr=15740");
        EXPECT_EQ(apply(Raster_AddRect, list, turned({0, 0, 0, -5})),
                  0u); // a size of 0 comes first
        EXPECT_EQ(list, before);
    }
}

// Whatever stands behind the end is cleared, in any slot.
TEST(RectList, clearsWhatIsBehindTheEnd) {
    RasterRectList normal = {};
    for (int count = 0; count < 15; ++count) {
        apply(Raster_AddRect, normal, {20 * count, 20 * count, 10, 10});
        for (int slot = count + 1; slot < 16; ++slot) {
            for (const auto field : {&Entry::x, &Entry::y, &Entry::height}) {
                RasterRectList list = normal;
                list.entries[slot].*field = 1;
                apply(Raster_SubRect, list, {0, 0, -1, -1});
                EXPECT_EQ(list, normal);
            }
        }
    }
}

TEST(RectList, sixteenSpansInARow) {
    RasterRectList columns;
    for (int i = 0; i < 16; ++i)
        columns.entries[i] = {10 * i, 0, 5, 20};
    struct {
        RasterRectList list;
        Entry end = {}; // of whoever reads on behind the list
    } memory = {columns};
    RasterRectList &list = memory.list;
    // From the first row on, the split finds no free span.
    expectPanic("VERIFY lib/raster/rasterRect", [&] {
        apply(Raster_SubRect, list, {1, -5, 2, 10});
    });
    // Further down the sixteen entries are too many before it comes to that.
    EXPECT_EQ(apply(Raster_SubRect, list, {1, 5, 2, 10}), 0u);
    EXPECT_EQ(list, columns);
    // A seventeenth rectangle takes full part, whether it fits or not.
    EXPECT_EQ(apply(Raster_AddRect, list, {0, 0, 150, 20}), 3100u);
    list = columns;
    EXPECT_EQ(apply(Raster_AddRect, list, {200, 0, 5, 30}), 205u * 30u);
}

} // namespace
} // namespace quillon::test
