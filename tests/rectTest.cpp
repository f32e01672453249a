// Rectangle geometry at small coordinates and at the limits, against integers
// wide enough for every result.
#include "rect.h"

#include "support/random.h"

#include <algorithm>
#include <cstring>
#include <limits>

using namespace quillon::test;

// In the namespace of the records, where the macros look for them.
static bool operator==(const Rect &a, const Rect &b) {
    return std::memcmp(&a, &b, sizeof(a)) == 0;
}

namespace {

using Wide = __int128;

constexpr int32 kMin = std::numeric_limits<int32>::min();
constexpr int32 kMax = std::numeric_limits<int32>::max();

Rect randomRect(Random &random) {
    const bool isSmall = random.oneIn(2);
    const auto coordinate = [&] {
        return isSmall ? random.between(-3, 12)
                       : random.oneOf({kMin, kMin + 1, 0, kMax - 1, kMax, random.between(-20, 20),
                                       random.between(kMin, kMax)});
    };
    Rect rect = {coordinate(), coordinate(), coordinate(), coordinate()};
    if (!random.oneIn(4)) {
        rect = {std::min(rect.left, rect.right), std::min(rect.top, rect.bottom),
                std::max(rect.left, rect.right), std::max(rect.top, rect.bottom)};
    }
    return rect;
}

bool isEmpty(const Rect &rect) {
    return rect.right <= rect.left || rect.bottom <= rect.top;
}

Wide wrapped(Wide value) {
    return static_cast<int32>(static_cast<uint32>(value));
}

Wide extent(Wide low, Wide high) {
    return std::clamp<Wide>(high - low, 0, kMax);
}

// The rectangle of value(field, low, high), clamped, where low and high are the
// fields of the same axis; isExact when none had to be clamped.
template <class Value>
Rect fieldwise(const Value &value, bool &isExact) {
    isExact = true;
    const auto clamped = [&](int32 Rect::*field, int32 Rect::*low, int32 Rect::*high) {
        const Wide wanted = value(field, low, high), kept = std::clamp<Wide>(wanted, kMin, kMax);
        isExact = isExact && kept == wanted;
        return static_cast<int32>(kept);
    };
    return {clamped(&Rect::left, &Rect::left, &Rect::right),
            clamped(&Rect::top, &Rect::top, &Rect::bottom),
            clamped(&Rect::right, &Rect::left, &Rect::right),
            clamped(&Rect::bottom, &Rect::top, &Rect::bottom)};
}

TEST(Rect, comparesAndCombines) {
    forEachCase(100000, [](Random &random) {
        const Rect a = randomRect(random), b = random.oneIn(4) ? a : randomRect(random);
        const Rect inner = {std::max(a.left, b.left), std::max(a.top, b.top),
                            std::min(a.right, b.right), std::min(a.bottom, b.bottom)};
        const Rect outer = {std::min(a.left, b.left), std::min(a.top, b.top),
                            std::max(a.right, b.right), std::max(a.bottom, b.bottom)};
        Rect dst = a;
        EXPECT_EQ(Rect_Intersect(&dst, &dst, &b), !isEmpty(inner));
        EXPECT_EQ(dst, inner);
        EXPECT_EQ(Rect_Intersect(nullptr, &a, &b), !isEmpty(inner));
        Rect_BoundingBox(&dst, &a, &b);
        EXPECT_EQ(dst, outer);
        dst = a;
        Rect_Union(&dst, &b);
        EXPECT_EQ(dst, isEmpty(a) ? b : isEmpty(b) ? a : outer);
        EXPECT_EQ(Rect_ContainsRect(&a, &b), inner == b);

        const bool areEmpty = isEmpty(a) && isEmpty(b);
        EXPECT_EQ(Rect_IsEqual(&a, &b), areEmpty || a == b);
        const bool haveOneSize = wrapped(Wide{a.right} - a.left - b.right + b.left) == 0 &&
                                 wrapped(Wide{a.bottom} - a.top - b.bottom + b.top) == 0;
        EXPECT_EQ(Rect_IsSizeEqual(&a, &b), areEmpty || haveOneSize);
    });
}

// The distance is what a rectangle has to grow by to just contain the point.
TEST(Rect, knowsWhereAPointLies) {
    forEachCase(100000, [](Random &random) {
        const Rect rect = randomRect(random), corner = randomRect(random);
        const RectPoint point = {corner.left, corner.top};
        const auto isWithin = [&](Wide growth) {
            return rect.left - growth <= point.x && point.x < rect.right + growth &&
                   rect.top - growth <= point.y && point.y < rect.bottom + growth;
        };
        EXPECT_EQ(Rect_ContainsPoint(&rect, &point), isWithin(0));
        if (std::min(point.x, point.y) == kMin || std::min(rect.right, rect.bottom) <= kMin + 1)
            return; // what has no negation is below
        const int32 distance = Rect_PointDistance(&rect, &point);
        EXPECT_TRUE(isWithin(distance) || distance == kMax);
        EXPECT_TRUE(!isWithin(Wide{distance} - 1) || distance == kMin);
    });
    // What has no negation moves down, not up.
    const Rect rect = {-10, -10, 10, 10}, least = {kMin, kMin, kMin, kMin};
    const RectPoint corner = {kMin, kMin}, zero = {0, 0};
    EXPECT_EQ(Rect_PointDistance(&rect, &corner), kMin);
    EXPECT_EQ(Rect_PointDistance(&least, &zero), kMin);
}

TEST(Rect, movesSaturate) {
    forEachCase(100000, [](Random &random) {
        const Rect rect = randomRect(random), from = randomRect(random), to = randomRect(random);
        bool isExact = false;
        const auto moved = [&](auto delta) {
            return fieldwise([&](auto f, auto low, auto) { return Wide{rect.*f} + delta(f, low); },
                             isExact);
        };
        union {
            RectPoint delta;
            Rect dst;
        };
        dst = to;
        Rect expected = moved([&](auto, auto low) { return to.*low; });
        Rect same = rect;
        EXPECT_EQ(Rect_Translate(&same, &same, &delta), isExact);
        EXPECT_EQ(same, expected);
        expected = moved([&](auto, auto low) { return wrapped(-Wide{to.*low}); });
        EXPECT_EQ(Rect_TranslateInv(&dst, &rect, &delta), isExact);
        EXPECT_EQ(dst, expected);

        expected = moved([&](auto f, auto) { return Wide{to.*f} - from.*f; });
        dst = to;
        EXPECT_EQ(Rect_ApplyDiff(&dst, &dst, &from, &rect), isExact);
        EXPECT_EQ(dst, expected);
        const RectPoint at = {rect.left, rect.bottom}, old = {from.left, from.bottom};
        RectPoint end = {to.left, to.bottom};
        isExact = Rect_ApplyDiffToPoint(&end, &end, &old, &at);
        EXPECT_TRUE(end.x == expected.left && end.y == expected.bottom);
        EXPECT_EQ(isExact, end.x - Wide{at.x} == Wide{to.left} - old.x &&
                               end.y - Wide{at.y} == Wide{to.bottom} - old.y);

        Rect_SetFromXYWH(&dst, rect.left, rect.top, to.left, to.top);
        expected =
            fieldwise([&](auto f, auto low,
                          auto) { return Wide{rect.*low} + (f == low ? 0 : std::max(to.*low, 0)); },
                      isExact);
        EXPECT_EQ(dst, expected);
    });
}

TEST(RectMap, scaledDifferences) {
    forEachCase(200000, [](Random &random) {
        const Rect rect = randomRect(random), from = randomRect(random), to = randomRect(random);
        const auto change = [](const Rect &base, const Rect &old, const Rect &changed) {
            return [&](auto f, auto low, auto high) {
                const Wide n = extent(base.*low, base.*high), d = extent(old.*low, old.*high);
                const Wide delta = Wide{changed.*f} - old.*f;
                return base.*f + (d == 0 ? delta : delta * n / d);
            };
        };
        bool isExact = false;
        const Rect expected = fieldwise(change(rect, from, to), isExact);
        for (int k = 0; k < 3; ++k) { // in place of each input
            Rect in[] = {rect, from, to};
            EXPECT_EQ(Rect_ApplyDiffEx(&in[k], &in[0], &in[1], &in[2]), isExact);
            EXPECT_EQ(in[k], expected);
        }

        // A clipped source is such a change of the source.
        Rect part, mapped = {}, dstSource, dstTarget;
        bool isMapped = Rect_Intersect(&part, &from, &rect) && !isEmpty(to);
        if (isMapped) {
            mapped = fieldwise(change(to, from, part), isExact);
            isMapped = !isEmpty(mapped);
        }
        EXPECT_EQ(Rect_IntersectPair(&dstSource, &from, &rect, &dstTarget, &to), isMapped);
        EXPECT_EQ(dstSource, isMapped ? part : Rect{});
        EXPECT_EQ(dstTarget, isMapped ? mapped : Rect{});
        EXPECT_EQ(Rect_IntersectPair(nullptr, &from, &rect, nullptr, &to), isMapped);
    });
}

TEST(RectMap, positions) {
    forEachCase(200000, [](Random &random) {
        const Rect source = randomRect(random), target = randomRect(random),
                   from = randomRect(random);
        RectPoint point = {from.left, from.top};
        bool isExact = false;
        Rect expected = fieldwise(
            [&](auto, auto low, auto high) {
                Wide s = extent(source.*low, source.*high), t = extent(target.*low, target.*high);
                if (s < t) // first to first and last to last
                    --s, --t;
                s = std::max<Wide>(s, 1);
                const Wide product = t * wrapped(Wide{from.*low} - source.*low);
                const Wide rest = (product % s + s) % s;
                return target.*low + (product - rest) / s;
            },
            isExact);
        Rect_ScalePoint(&source, &target, &point, &point);
        EXPECT_TRUE(point.x == expected.left && point.y == expected.top);

        Rect common, dst, clipped = source;
        const bool isOverlap = Rect_Intersect(&common, &source, &target);
        expected = fieldwise(
            [&](auto f, auto low, auto high) {
                return wrapped(Wide{common.*low} - source.*low) +
                       (f == low ? 0 : extent(common.*low, common.*high));
            },
            isExact);
        EXPECT_EQ(Rect_MapRect(&clipped, &target, &dst, &clipped), isOverlap);
        EXPECT_EQ(dst, isOverlap ? expected : Rect{});
        EXPECT_EQ(clipped, common);
    });
}

} // namespace
