// Rectangle geometry at small coordinates and at the limits, against integers
// wide enough for every result.
#include <quillon/rect.h>

#include "support/random.h"

#include <algorithm>
#include <cstring>
#include <limits>

using namespace quillon::test;

// In the namespace of the records, where the macros look for it.
static bool operator==(const Rect &a, const Rect &b) {
    return std::memcmp(&a, &b, sizeof(a)) == 0;
}

namespace {

using Wide = __int128;

constexpr int32_t kMin = std::numeric_limits<int32_t>::min();
constexpr int32_t kMax = std::numeric_limits<int32_t>::max();

Rect randomRect(Random &random) {
    const bool isSmall = random.oneIn(2);
    const auto coordinate = [&] {
        return isSmall ? random.between(-3, 12)
                       : random.oneOf({kMin, kMin + 1, 0, kMax - 1, kMax, random.between(-20, 20),
                                       random.between(kMin, kMax)});
    };
    Rect rect = {coordinate(), coordinate(), coordinate(), coordinate()};
    if (!random.oneIn(4))
        rect = {std::min(rect.left, rect.right), std::min(rect.top, rect.bottom),
                std::max(rect.left, rect.right), std::max(rect.top, rect.bottom)};
    return rect;
}

bool isEmpty(const Rect &rect) {
    return rect.right <= rect.left || rect.bottom <= rect.top;
}

Wide wrapped(Wide value) {
    return static_cast<int32_t>(static_cast<uint32_t>(value));
}

// --- The model: the same for both axes

struct Axis {
    Wide low, high;

    Wide extent() const { return std::clamp<Wide>(high - low, 0, kMax); }
};

struct Result {
    Rect rect; // clamped
    bool isExact;
};

template <class Model, class... Rects>
Result modelled(const Model &model, const Rects &...rects) {
    const Axis x = model(Axis{rects.left, rects.right}...);
    const Axis y = model(Axis{rects.top, rects.bottom}...);
    const auto kept = [](Wide value) {
        return static_cast<int32_t>(std::clamp<Wide>(value, kMin, kMax));
    };
    const Rect rect = {kept(x.low), kept(y.low), kept(x.high), kept(y.high)};
    return {rect, rect.left == x.low && rect.top == y.low && rect.right == x.high &&
                      rect.bottom == y.high};
}

void expectResult(bool isExact, const Rect &rect, const Result &expected) {
    EXPECT_EQ(isExact, expected.isExact);
    EXPECT_EQ(rect, expected.rect);
}

Axis intersection(Axis a, Axis b) {
    return {std::max(a.low, b.low), std::min(a.high, b.high)};
}

// In proportion to the sizes of base and old.
Axis changed(Axis base, Axis old, Axis end) {
    const Wide n = old.extent() == 0 ? 1 : base.extent(), d = std::max<Wide>(old.extent(), 1);
    return {base.low + (end.low - old.low) * n / d, base.high + (end.high - old.high) * n / d};
}

TEST(Rect, comparesAndCombines) {
    forEachCase(100000, [](Random &random) {
        const Rect a = randomRect(random), b = random.oneIn(4) ? a : randomRect(random);
        const Rect inner = modelled(intersection, a, b).rect;
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
        const int32_t distance = Rect_PointDistance(&rect, &point);
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
        union { // the outputs may be inputs
            RectPoint delta;
            Rect dst;
        };
        dst = to;
        Rect same = rect;
        expectResult(Rect_Translate(&same, &same, &delta), same,
                     modelled(
                         [](Axis r, Axis t) {
                             return Axis{r.low + t.low, r.high + t.low};
                         },
                         rect, to));
        const auto back = [](Axis r, Axis t) {
            return Axis{r.low + wrapped(-t.low), r.high + wrapped(-t.low)};
        };
        bool isExact = Rect_TranslateInv(&dst, &rect, &delta);
        expectResult(isExact, dst, modelled(back, rect, to));

        const auto moved = [](Axis r, Axis f, Axis t) {
            return Axis{r.low + t.low - f.low, r.high + t.high - f.high};
        };
        dst = to;
        isExact = Rect_ApplyDiff(&dst, &dst, &from, &rect);
        expectResult(isExact, dst, modelled(moved, rect, from, to));
        const RectPoint at = {rect.left, rect.top}, old = {from.left, from.top};
        RectPoint end = {to.left, to.top};
        isExact = Rect_ApplyDiffToPoint(&end, &end, &old, &at);
        const Result expected = modelled(
            [&](auto... axes) {
                return Axis{moved(axes...).low, 0};
            },
            rect, from, to);
        expectResult(isExact, {end.x, end.y, 0, 0}, expected);

        Rect_SetFromXYWH(&dst, rect.left, rect.top, to.left, to.top);
        const auto sized = [](Axis r, Axis t) {
            return Axis{r.low, r.low + std::max<Wide>(t.low, 0)};
        };
        EXPECT_EQ(dst, modelled(sized, rect, to).rect);
    });
}

TEST(RectMap, scaledDifferences) {
    forEachCase(200000, [](Random &random) {
        const Rect rect = randomRect(random), from = randomRect(random), to = randomRect(random);
        for (int k = 0; k < 3; ++k) { // in place of each input
            Rect in[] = {rect, from, to};
            const bool isExact = Rect_ApplyDiffEx(&in[k], &in[0], &in[1], &in[2]);
            expectResult(isExact, in[k], modelled(changed, rect, from, to));
        }

        // A clipped source is such a change of the source.
        Rect part, dstSource, dstTarget;
        const bool isSeen = Rect_Intersect(&part, &from, &rect) && !isEmpty(to);
        const Rect mapped = isSeen ? modelled(changed, to, from, part).rect : Rect{};
        const bool isMapped = !isEmpty(mapped);
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
        const auto scaled = [](Axis s, Axis t, Axis position) {
            const Wide inset = s.extent() < t.extent() ? 1 : 0; // first to first, last to last
            const Wide d = std::max<Wide>(s.extent() - inset, 1);
            const Wide product = (t.extent() - inset) * wrapped(position.low - s.low);
            return Axis{t.low + (product - (product % d + d) % d) / d, 0};
        };
        RectPoint point = {from.left, from.top};
        Rect_ScalePoint(&source, &target, &point, &point);
        EXPECT_EQ((Rect{point.x, point.y, 0, 0}), modelled(scaled, source, target, from).rect);

        const auto mapped = [](Axis s, Axis t) {
            const Axis common = intersection(s, t);
            const Wide low = wrapped(common.low - s.low);
            return Axis{low, low + common.extent()};
        };
        const Rect common = modelled(intersection, source, target).rect;
        Rect dst, clipped = source;
        EXPECT_EQ(Rect_MapRect(&clipped, &target, &dst, &clipped), !isEmpty(common));
        EXPECT_EQ(dst, isEmpty(common) ? Rect{} : modelled(mapped, source, target).rect);
        EXPECT_EQ(clipped, common);
    });
}

} // namespace
