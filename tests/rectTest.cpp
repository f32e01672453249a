// Rectangle geometry against integers wide enough for every result.

#include "operations.h"
#include <quillon/rect.h>

#include <gtest/gtest.h>

namespace quillon::test {
namespace {

TEST(Rect, comparesAndCombines) {
    forEachCase(100000, tryRectSets);
}

TEST(Rect, knowsWhereAPointLies) {
    forEachCase(100000, tryRectPoints);
    // What has no negation moves down, not up.
    const Rect rect = {-10, -10, 10, 10}, least = {INT32_MIN, INT32_MIN, INT32_MIN, INT32_MIN};
    const RectPoint corner = {INT32_MIN, INT32_MIN}, zero = {0, 0};
    EXPECT_EQ(Rect_PointDistance(&rect, &corner), INT32_MIN);
    EXPECT_EQ(Rect_PointDistance(&least, &zero), INT32_MIN);
}

TEST(Rect, movesSaturate) {
    forEachCase(100000, tryRectMoves);
}

TEST(Rect, mapsDifferencesAndPositions) {
    forEachCase(200000, tryRectMaps);
}

} // namespace
} // namespace quillon::test
