// Rectangle geometry at small coordinates and at the limits, against integers wide
// enough for every result.

#include "operations.h"
#include "support/judge.h"
#include <quillon/rect.h>

#include <algorithm>
#include <cstring>
#include <limits>

namespace quillon::test {
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

bool isSame(const Rect &a, const Rect &b) {
    return std::memcmp(&a, &b, sizeof(Rect)) == 0;
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

void compareResult(bool isExact, const Rect &rect, const Result &expected, const char *function) {
    compare(isExact, expected.isExact, function);
    compare(rect, expected.rect, function);
}

Axis intersection(Axis a, Axis b) {
    return {std::max(a.low, b.low), std::min(a.high, b.high)};
}

// In proportion to the sizes of base and old.
Axis changed(Axis base, Axis old, Axis end) {
    const Wide n = old.extent() == 0 ? 1 : base.extent(), d = std::max<Wide>(old.extent(), 1);
    return {base.low + (end.low - old.low) * n / d, base.high + (end.high - old.high) * n / d};
}

} // namespace

void tryRectSets(Random &random) {
    const Rect a = randomRect(random), b = random.oneIn(4) ? a : randomRect(random);
    const Rect inner = modelled(intersection, a, b).rect;
    const Rect outer = {std::min(a.left, b.left), std::min(a.top, b.top),
                        std::max(a.right, b.right), std::max(a.bottom, b.bottom)};
    Rect dst = a;
    compare(Rect_Intersect(&dst, &dst, &b), !isEmpty(inner), "Rect_Intersect");
    compare(dst, inner, "Rect_Intersect");
    compare(Rect_Intersect(nullptr, &a, &b), !isEmpty(inner), "Rect_Intersect of null");
    Rect_BoundingBox(&dst, &a, &b);
    compare(dst, outer, "Rect_BoundingBox");
    dst = a;
    Rect_Union(&dst, &b);
    compare(dst, isEmpty(a) ? b : isEmpty(b) ? a : outer, "Rect_Union");
    compare(Rect_ContainsRect(&a, &b), isSame(inner, b), "Rect_ContainsRect");

    const bool areEmpty = isEmpty(a) && isEmpty(b);
    compare(Rect_IsEqual(&a, &b), areEmpty || isSame(a, b), "Rect_IsEqual");
    const bool haveOneSize = wrapped(Wide{a.right} - a.left - b.right + b.left) == 0 &&
                             wrapped(Wide{a.bottom} - a.top - b.bottom + b.top) == 0;
    compare(Rect_IsSizeEqual(&a, &b), areEmpty || haveOneSize, "Rect_IsSizeEqual");
    Rect_Test();
}

// The distance is what a rectangle has to grow by to just contain the point.
void tryRectPoints(Random &random) {
    const Rect rect = randomRect(random), corner = randomRect(random);
    const RectPoint point = {corner.left, corner.top};
    const auto isWithin = [&](Wide growth) {
        return rect.left - growth <= point.x && point.x < rect.right + growth &&
               rect.top - growth <= point.y && point.y < rect.bottom + growth;
    };
    compare(Rect_ContainsPoint(&rect, &point), isWithin(0), "Rect_ContainsPoint");
    if (std::min(point.x, point.y) == kMin || std::min(rect.right, rect.bottom) <= kMin + 1)
        return; // what has no negation is a test of its own
    const int32_t distance = Rect_PointDistance(&rect, &point);
    const bool isFarEnough = isWithin(distance) || distance == kMax;
    const bool isTooFar = isWithin(Wide{distance} - 1) && distance != kMin;
    compare(isFarEnough && !isTooFar ? distance : ~distance, distance, "Rect_PointDistance");
}

void tryRectMoves(Random &random) {
    const Rect rect = randomRect(random), from = randomRect(random), to = randomRect(random);
    union { // the outputs may be inputs
        RectPoint delta;
        Rect dst;
    };
    dst = to;
    Rect same = rect;
    const auto ahead = [](Axis r, Axis t) { return Axis{r.low + t.low, r.high + t.low}; };
    bool isExact = Rect_Translate(&same, &same, &delta);
    compareResult(isExact, same, modelled(ahead, rect, to), "Rect_Translate");
    const auto back = [](Axis r, Axis t) {
        return Axis{r.low + wrapped(-t.low), r.high + wrapped(-t.low)};
    };
    isExact = Rect_TranslateInv(&dst, &rect, &delta);
    compareResult(isExact, dst, modelled(back, rect, to), "Rect_TranslateInv");

    const auto moved = [](Axis r, Axis f, Axis t) {
        return Axis{r.low + t.low - f.low, r.high + t.high - f.high};
    };
    dst = to;
    isExact = Rect_ApplyDiff(&dst, &dst, &from, &rect);
    compareResult(isExact, dst, modelled(moved, rect, from, to), "Rect_ApplyDiff");
    const RectPoint at = {rect.left, rect.top}, old = {from.left, from.top};
    RectPoint end = {to.left, to.top};
    isExact = Rect_ApplyDiffToPoint(&end, &end, &old, &at);
    const auto movedLow = [&](auto... axes) { return Axis{moved(axes...).low, 0}; };
    compareResult(isExact, {end.x, end.y, 0, 0}, modelled(movedLow, rect, from, to),
                  "Rect_ApplyDiffToPoint");

    Rect_SetFromXYWH(&dst, rect.left, rect.top, to.left, to.top);
    const auto sized = [](Axis r, Axis t) { return Axis{r.low, r.low + std::max<Wide>(t.low, 0)}; };
    compare(dst, modelled(sized, rect, to).rect, "Rect_SetFromXYWH");
}

void tryRectMaps(Random &random) {
    const Rect rect = randomRect(random), from = randomRect(random), to = randomRect(random);
    for (int k = 0; k < 3; ++k) { // in place of each input
        Rect in[] = {rect, from, to};
        const bool isExact = Rect_ApplyDiffEx(&in[k], &in[0], &in[1], &in[2]);
        compareResult(isExact, in[k], modelled(changed, rect, from, to), "Rect_ApplyDiffEx");
    }

    // A clipped source is such a change of the source.
    Rect part, dstSource, dstTarget;
    const bool isSeen = Rect_Intersect(&part, &from, &rect) && !isEmpty(to);
    const Rect mapped = isSeen ? modelled(changed, to, from, part).rect : Rect{};
    const bool isMapped = !isEmpty(mapped);
    compare(Rect_IntersectPair(&dstSource, &from, &rect, &dstTarget, &to), isMapped,
            "Rect_IntersectPair");
    compare(dstSource, isMapped ? part : Rect{}, "Rect_IntersectPair, source");
    compare(dstTarget, isMapped ? mapped : Rect{}, "Rect_IntersectPair, target");
    compare(Rect_IntersectPair(nullptr, &from, &rect, nullptr, &to), isMapped,
            "Rect_IntersectPair of null");

    const auto scaled = [](Axis s, Axis t, Axis position) {
        const Wide inset = s.extent() < t.extent() ? 1 : 0; // first to first, last to last
        const Wide d = std::max<Wide>(s.extent() - inset, 1);
        const Wide product = (t.extent() - inset) * wrapped(position.low - s.low);
        return Axis{t.low + (product - (product % d + d) % d) / d, 0};
    };
    RectPoint point = {from.left, from.top};
    Rect_ScalePoint(&rect, &to, &point, &point);
    compare(Rect{point.x, point.y, 0, 0}, modelled(scaled, rect, to, from).rect, "Rect_ScalePoint");

    const auto relative = [](Axis s, Axis t) {
        const Axis common = intersection(s, t);
        const Wide low = wrapped(common.low - s.low);
        return Axis{low, low + common.extent()};
    };
    const Rect common = modelled(intersection, rect, to).rect;
    Rect dst, clipped = rect;
    compare(Rect_MapRect(&clipped, &to, &dst, &clipped), !isEmpty(common), "Rect_MapRect");
    compare(dst, isEmpty(common) ? Rect{} : modelled(relative, rect, to).rect, "Rect_MapRect");
    compare(clipped, common, "Rect_MapRect, clipped");
}

void family::rect(Random &random) {
    random.oneOf({tryRectSets, tryRectPoints, tryRectMoves, tryRectMaps})(random);
}

} // namespace quillon::test
