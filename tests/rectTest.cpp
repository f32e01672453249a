// Rectangle geometry: known values, sets of pixels where coordinates are small,
// and wide integers where they are not.
#include "rect.h"

#include "support/random.h"

#include <algorithm>
#include <cstring>
#include <limits>
#include <ostream>

using namespace quillon::test;

// In the namespace of the records, where the macros look for them.
static bool operator==(const Rect &a, const Rect &b) {
    return std::memcmp(&a, &b, sizeof(a)) == 0;
}
static bool operator==(const RectPoint &a, const RectPoint &b) {
    return a.x == b.x && a.y == b.y;
}
static std::ostream &operator<<(std::ostream &out, const Rect &r) {
    return out << r.left << ", " << r.top << ", " << r.right << ", " << r.bottom;
}
static std::ostream &operator<<(std::ostream &out, const RectPoint &p) {
    return out << p.x << ", " << p.y;
}

namespace {

using Wide = __int128;

constexpr int32 kMin = std::numeric_limits<int32>::min();
constexpr int32 kMax = std::numeric_limits<int32>::max();

int32 randomCoordinate(Random &random) {
    return random.oneOf({kMin, kMin + 1, -1, 0, 1, kMax - 1, kMax, random.between(-20, 20),
                         random.between(kMax - 20, kMax), random.between(kMin, kMax)});
}

RectPoint randomPoint(Random &random) {
    return {randomCoordinate(random), randomCoordinate(random)};
}

Rect randomRect(Random &random) {
    Rect rect = {randomCoordinate(random), randomCoordinate(random), randomCoordinate(random),
                 randomCoordinate(random)};
    if (!random.oneIn(4)) {
        if (rect.left > rect.right)
            std::swap(rect.left, rect.right);
        if (rect.top > rect.bottom)
            std::swap(rect.top, rect.bottom);
    }
    return rect;
}

Rect randomSmallRect(Random &random) {
    return {random.between(-3, 9), random.between(-3, 9), random.between(-1, 12),
            random.between(-1, 12)};
}

bool isEmpty(const Rect &rect) {
    return rect.right <= rect.left || rect.bottom <= rect.top;
}

// The values a function should store, and whether all of them fitted.
struct Expected {
    bool isExact = true;

    int32 operator()(Wide value) {
        if (value > kMax || value < kMin)
            isExact = false;
        return value > kMax ? kMax : value < kMin ? kMin : static_cast<int32>(value);
    }
};

Wide wrapped(Wide value) {
    return static_cast<int32>(static_cast<uint32>(value));
}

Wide floorDivided(Wide a, Wide b) {
    return a / b - (a % b != 0 && (a < 0) != (b < 0));
}

Wide extent(int32 low, int32 high) {
    return low >= high ? 0 : std::min<Wide>(Wide{high} - low, kMax);
}

// --- Primitives --------------------------------------------------------------

TEST(Rect, setFromXYWHStopsAtTheLimit) {
    forEachCase(100000, [](Random &random) {
        const RectPoint corner = randomPoint(random), size = randomPoint(random);
        Expected clamp;
        const Rect expected = {corner.x, corner.y, clamp(corner.x + std::max<Wide>(size.x, 0)),
                               clamp(corner.y + std::max<Wide>(size.y, 0))};
        Rect rect;
        Rect_SetFromXYWH(&rect, corner.x, corner.y, size.x, size.y);
        EXPECT_EQ(rect, expected);
    });
}

TEST(Rect, translationsSaturate) {
    forEachCase(100000, [](Random &random) {
        const Rect src = randomRect(random);
        const RectPoint delta = randomPoint(random);
        for (const bool isInverse : {false, true}) {
            const Wide dx = isInverse ? wrapped(-Wide{delta.x}) : delta.x;
            const Wide dy = isInverse ? wrapped(-Wide{delta.y}) : delta.y;
            Expected clamp;
            const Rect expected = {clamp(src.left + dx), clamp(src.top + dy), clamp(src.right + dx),
                                   clamp(src.bottom + dy)};
            const auto function = isInverse ? Rect_TranslateInv : Rect_Translate;
            Rect dst;
            EXPECT_EQ(function(&dst, &src, &delta), clamp.isExact);
            EXPECT_EQ(dst, expected) << src << " by " << delta;
            Rect same = src;
            function(&same, &same, &delta);
            EXPECT_EQ(same, expected) << "in place";
        }
    });
}

TEST(Rect, translateInvReadsADeltaInsideItsOutput) {
    union {
        RectPoint delta = {3, 4};
        Rect dst;
    } overlaid;
    const Rect src = {10, 10, 20, 20};
    EXPECT_TRUE(Rect_TranslateInv(&overlaid.dst, &src, &overlaid.delta));
    EXPECT_EQ(overlaid.dst, (Rect{7, 6, 17, 16}));
}

TEST(Rect, comparesEmptyRectanglesAsOne) {
    forEachCase(100000, [](Random &random) {
        const Rect a = randomRect(random);
        const Rect b = random.oneIn(2) ? a : randomRect(random);
        const bool areEmpty = isEmpty(a) && isEmpty(b);
        EXPECT_EQ(Rect_IsEqual(&a, &b), areEmpty || a == b) << a << " and " << b;
        const bool haveOneSize = wrapped(Wide{a.right} - a.left - b.right + b.left) == 0 &&
                                 wrapped(Wide{a.bottom} - a.top - b.bottom + b.top) == 0;
        EXPECT_EQ(Rect_IsSizeEqual(&a, &b), areEmpty || haveOneSize) << a << " and " << b;
    });
    // Differences wrap: 2^32 - 1 columns look like -1.
    const Rect wide = {kMin, 0, kMax, 5}, negative = {1, 0, 0, 5};
    EXPECT_TRUE(Rect_IsSizeEqual(&wide, &negative));
}

// Each function against what it means for the pixels of a small field.
TEST(Rect, agreesWithSetsOfPixels) {
    forEachCase(20000, [](Random &random) {
        const Rect a = randomSmallRect(random), b = randomSmallRect(random);
        Rect common, both = a, bounds;
        const bool isOverlap = Rect_Intersect(&common, &a, &b);
        EXPECT_EQ(Rect_Intersect(nullptr, &a, &b), isOverlap);
        Rect_Union(&both, &b);
        Rect_BoundingBox(&bounds, &a, &b);
        bool isAnyCommon = false, isInnerMissing = false;
        for (int y = -4; y <= 12; ++y) {
            for (int x = -4; x <= 12; ++x) {
                const RectPoint point = {x, y};
                const auto contains = [&](const Rect &rect) {
                    return Rect_ContainsPoint(&rect, &point);
                };
                ASSERT_EQ(contains(common), contains(a) && contains(b));
                ASSERT_TRUE(contains(both) || !(contains(a) || contains(b)));
                ASSERT_TRUE(contains(bounds) || !(contains(a) || contains(b)));
                isAnyCommon |= contains(common);
                isInnerMissing |= contains(b) && !contains(a);
            }
        }
        EXPECT_EQ(isOverlap, isAnyCommon);
        if (!isEmpty(a) && !isEmpty(b)) {
            EXPECT_EQ(Rect_ContainsRect(&a, &b), !isInnerMissing);
            EXPECT_EQ(both, bounds);
        }
    });
}

TEST(Rect, emptyRectanglesKeepTheirFields) {
    const Rect a = {0, 0, 10, 10}, apart = {20, 20, 30, 30}, nothing = {5, 5, 5, 5};
    const Rect unit = {0, 0, 1, 1}, outside = {9, 9, 9, 11};
    Rect dst;
    EXPECT_FALSE(Rect_Intersect(&dst, &a, &apart));
    EXPECT_EQ(dst, (Rect{20, 20, 10, 10}));
    dst = nothing;
    Rect_Union(&dst, &unit);
    EXPECT_EQ(dst, unit);
    Rect_Union(&dst, &nothing);
    EXPECT_EQ(dst, unit);
    dst = nothing;
    Rect_Union(&dst, &outside);
    EXPECT_EQ(dst, outside) << "an empty output takes even an empty rectangle";
    Rect_BoundingBox(&dst, &nothing, &unit);
    EXPECT_EQ(dst, (Rect{0, 0, 5, 5}));
    EXPECT_TRUE(Rect_ContainsRect(&a, &nothing));
    EXPECT_FALSE(Rect_ContainsRect(&a, &outside));
}

TEST(Rect, pointDistanceCountsPixels) {
    // The shortest chessboard distance to a pixel on the rim.
    for (int32 width = 1; width <= 6; ++width) {
        for (int32 height = 1; height <= 6; ++height) {
            const Rect rect = {2, 3, 2 + width, 3 + height};
            for (int32 y = -4; y < 16; ++y) {
                for (int32 x = -4; x < 16; ++x) {
                    const RectPoint point = {x, y};
                    int32 nearest = kMax;
                    for (int32 j = rect.top; j < rect.bottom; ++j) {
                        for (int32 i = rect.left; i < rect.right; ++i) {
                            if (i == rect.left || i == rect.right - 1 || j == rect.top ||
                                j == rect.bottom - 1)
                                nearest = std::min(nearest, std::max(abs(i - x), abs(j - y)));
                        }
                    }
                    const bool isInside = Rect_ContainsPoint(&rect, &point);
                    ASSERT_EQ(Rect_PointDistance(&rect, &point), isInside ? -nearest : nearest);
                }
            }
        }
    }
    const Rect nothing = {5, 5, 5, 5};
    const RectPoint five = {5, 5};
    EXPECT_EQ(Rect_PointDistance(&nothing, &five), 1);
}

TEST(Rect, pointDistanceAtTheLimits) {
    forEachCase(100000, [](Random &random) {
        const Rect rect = randomRect(random);
        const RectPoint point = randomPoint(random);
        Expected clamp;
        const auto gap = [&](Wide a, Wide b) { return clamp(a + wrapped(-b)); };
        const Wide lastRow = std::max<Wide>(Wide{rect.bottom} - 1, kMin);
        const Wide lastColumn = std::max<Wide>(Wide{rect.right} - 1, kMin);
        EXPECT_EQ(Rect_PointDistance(&rect, &point),
                  std::max({gap(rect.top, point.y), gap(rect.left, point.x), gap(point.y, lastRow),
                            gap(point.x, lastColumn)}))
            << rect << " from " << point;
    });
    // Subtracting the smallest coordinate moves down, not up.
    const Rect rect = {-10, -10, 10, 10};
    const RectPoint corner = {kMin, kMin};
    EXPECT_EQ(Rect_PointDistance(&rect, &corner), kMin);
}

// --- Diffs and mapping -------------------------------------------------------

TEST(RectMap, applyDiffSaturatesOnce) {
    forEachCase(100000, [](Random &random) {
        const Rect rect = randomRect(random), from = randomRect(random), to = randomRect(random);
        const auto moved = [&](int32 Rect::*f) { return Wide{rect.*f} + to.*f - from.*f; };
        Expected clamp;
        const Rect expected = {clamp(moved(&Rect::left)), clamp(moved(&Rect::top)),
                               clamp(moved(&Rect::right)), clamp(moved(&Rect::bottom))};
        Rect dst;
        EXPECT_EQ(Rect_ApplyDiff(&dst, &to, &from, &rect), clamp.isExact);
        EXPECT_EQ(dst, expected) << rect << " as " << from << " to " << to;

        const RectPoint points[] = {
            {rect.left, rect.top}, {from.left, from.top}, {to.left, to.top}};
        Expected clampPoint;
        const RectPoint expectedPoint = {clampPoint(moved(&Rect::left)),
                                         clampPoint(moved(&Rect::top))};
        RectPoint dstPoint;
        EXPECT_EQ(Rect_ApplyDiffToPoint(&dstPoint, &points[2], &points[1], &points[0]),
                  clampPoint.isExact);
        EXPECT_EQ(dstPoint, expectedPoint);
    });
}

TEST(RectMap, applyDiffExScalesTheDifference) {
    const RectPoint offset = {5, -7};
    forEachCase(200000, [&](Random &random) {
        const Rect rect = randomRect(random), to = randomRect(random);
        Rect from = randomRect(random);
        if (random.oneIn(8)) // of the same size
            Rect_Translate(&from, &rect, &offset);
        Expected clamp;
        const auto moved = [&](int32 Rect::*f, int32 Rect::*low, int32 Rect::*high) {
            const Wide n = extent(rect.*low, rect.*high), d = extent(from.*low, from.*high);
            const Wide delta = Wide{to.*f} - from.*f;
            return clamp(rect.*f + (d == 0 ? delta : delta * n / d));
        };
        const Rect expected = {moved(&Rect::left, &Rect::left, &Rect::right),
                               moved(&Rect::top, &Rect::top, &Rect::bottom),
                               moved(&Rect::right, &Rect::left, &Rect::right),
                               moved(&Rect::bottom, &Rect::top, &Rect::bottom)};
        Rect dst;
        EXPECT_EQ(Rect_ApplyDiffEx(&dst, &rect, &from, &to), clamp.isExact);
        EXPECT_EQ(dst, expected) << rect << " as " << from << " to " << to;
        for (int k = 0; k < 3; ++k) {
            Rect in[] = {rect, from, to};
            Rect_ApplyDiffEx(&in[k], &in[0], &in[1], &in[2]);
            EXPECT_EQ(in[k], expected) << "in place of input " << k;
        }
    });
    // -3 / 2 is -1, not -2.
    const Rect rect = {0, 0, 1, 1}, from = {0, 0, 2, 2}, to = {-3, -3, 5, 5};
    Rect dst;
    EXPECT_TRUE(Rect_ApplyDiffEx(&dst, &rect, &from, &to));
    EXPECT_EQ(dst, (Rect{-1, -1, 2, 2}));
}

TEST(RectMap, intersectPairRoundsOutward) {
    forEachCase(200000, [](Random &random) {
        const bool isSmall = random.oneIn(2);
        const auto any = [&] { return isSmall ? randomSmallRect(random) : randomRect(random); };
        const Rect source = any(), clip = any(), target = any();
        Rect part;
        bool isMapped = Rect_Intersect(&part, &source, &clip) && !isEmpty(target);
        Rect mapped = {};
        if (isMapped) {
            // Low edges are rounded down, high edges up.
            const auto scaled = [](Wide delta, Wide n, Wide d) {
                return delta < 0 ? -floorDivided(-delta * n, d) : floorDivided(delta * n, d);
            };
            const Wide sourceWidth = extent(source.left, source.right);
            const Wide sourceHeight = extent(source.top, source.bottom);
            const Wide width = extent(target.left, target.right);
            const Wide height = extent(target.top, target.bottom);
            Expected clamp;
            mapped = {
                clamp(target.left + scaled(Wide{part.left} - source.left, width, sourceWidth)),
                clamp(target.top + scaled(Wide{part.top} - source.top, height, sourceHeight)),
                clamp(target.right + scaled(Wide{part.right} - source.right, width, sourceWidth)),
                clamp(target.bottom +
                      scaled(Wide{part.bottom} - source.bottom, height, sourceHeight))};
            isMapped = !isEmpty(mapped);
        }
        Rect dstSource, dstTarget;
        EXPECT_EQ(Rect_IntersectPair(&dstSource, &source, &clip, &dstTarget, &target), isMapped)
            << source << " clipped to " << clip << " for " << target;
        EXPECT_EQ(dstSource, isMapped ? part : Rect{});
        EXPECT_EQ(dstTarget, isMapped ? mapped : Rect{});
        EXPECT_EQ(Rect_IntersectPair(nullptr, &source, &clip, nullptr, &target), isMapped);
    });
    // A sliver of the source keeps a whole pixel of the target, at both ends.
    const Rect source = {0, 0, 100, 100}, target = {0, 0, 50, 50};
    const Rect first = {1, 1, 2, 2}, last = {99, 99, 100, 100};
    Rect dst;
    EXPECT_TRUE(Rect_IntersectPair(nullptr, &source, &first, &dst, &target));
    EXPECT_EQ(dst, (Rect{0, 0, 1, 1}));
    EXPECT_TRUE(Rect_IntersectPair(nullptr, &source, &last, &dst, &target));
    EXPECT_EQ(dst, (Rect{49, 49, 50, 50}));
}

TEST(RectMap, scalePointRoundsDown) {
    forEachCase(200000, [](Random &random) {
        const Rect source = randomRect(random), target = randomRect(random);
        const RectPoint point = randomPoint(random);
        Expected clamp;
        const auto scaled = [&](int32 p, int32 low, int32 high, int32 toLow, int32 toHigh) {
            Wide s = extent(low, high), t = extent(toLow, toHigh);
            if (s < t) {
                --s;
                --t;
            }
            return clamp(toLow + floorDivided(t * wrapped(Wide{p} - low), std::max<Wide>(s, 1)));
        };
        const RectPoint expected = {
            scaled(point.x, source.left, source.right, target.left, target.right),
            scaled(point.y, source.top, source.bottom, target.top, target.bottom)};
        RectPoint dst;
        Rect_ScalePoint(&source, &target, &point, &dst);
        EXPECT_EQ(dst, expected) << point << " from " << source << " to " << target;
    });
    struct {
        Rect source, target;
        int32 from, to;
    } const known[] = {
        {{0, 0, 10, 10}, {0, 0, 100, 100}, 9, 99}, {{0, 0, 10, 10}, {0, 0, 100, 100}, -1, -11},
        {{0, 0, 100, 100}, {0, 0, 10, 10}, 99, 9}, {{0, 0, 100, 100}, {0, 0, 10, 10}, -1, -1},
        {{5, 5, 15, 15}, {0, 0, 10, 10}, 7, 2},    {{0, 0, 1, 1}, {0, 0, 10, 10}, 1, 9},
        {{0, 0, 0, 0}, {0, 0, 10, 10}, 2, 18},     {{0, 0, 9, 9}, {3, 3, 3, 3}, 7, 3},
    };
    for (const auto &k : known) {
        RectPoint point = {k.from, k.from};
        Rect_ScalePoint(&k.source, &k.target, &point, &point);
        EXPECT_EQ(point, (RectPoint{k.to, k.to}));
    }
}

TEST(RectMap, mapRectIsRelativeToTheBase) {
    forEachCase(100000, [](Random &random) {
        const Rect base = randomRect(random), rect = randomRect(random);
        Rect common, dst, clipped;
        const bool isOverlap = Rect_Intersect(&common, &base, &rect);
        Rect expected = {};
        if (isOverlap) {
            Expected clamp;
            const Wide left = wrapped(Wide{common.left} - base.left);
            const Wide top = wrapped(Wide{common.top} - base.top);
            expected = {clamp(left), clamp(top), clamp(left + extent(common.left, common.right)),
                        clamp(top + extent(common.top, common.bottom))};
        }
        EXPECT_EQ(Rect_MapRect(&base, &rect, &dst, &clipped), isOverlap);
        EXPECT_EQ(dst, expected) << rect << " in " << base;
        EXPECT_EQ(clipped, common);
    });
    const Rect base = {10, 10, 30, 30}, rect = {20, 20, 40, 40};
    Rect dst, clipped;
    EXPECT_TRUE(Rect_MapRect(&base, &rect, &dst, &clipped));
    EXPECT_EQ(dst, (Rect{10, 10, 20, 20}));
}

} // namespace
