// Changes and positions applied from one rectangle to another.
//
// Most functions handle one axis, as both are alike.  Products and sums fit 64 bits: a
// difference of coordinates is below 2^32 and an extent below 2^31.
//
// An output may be an input too, so all inputs are read before anything is stored.
#include <quillon/rect.h>

#include "core/coordinates.h"

#include <algorithm>

namespace quillon {
namespace {

// A rectangle on one axis.
struct Range {
    int32_t lo;
    int32_t hi;

    bool empty() const { return lo >= hi; }

    // From 0 to the largest int32_t.
    int64_t extent() const { return empty() ? 0 : saturate(int64_t{hi} - lo); }
};

Range columns(const Rect &rect) {
    return {.lo = rect.left, .hi = rect.right};
}
Range rows(const Rect &rect) {
    return {.lo = rect.top, .hi = rect.bottom};
}

Rect fromRanges(Range x, Range y) {
    return {.left = x.lo, .top = y.lo, .right = x.hi, .bottom = y.hi};
}

// delta * numerator / denominator, truncated; delta itself when the two are equal or
// the denominator is 0.
int64_t scaled(int64_t delta, int64_t numerator, int64_t denominator) {
    if (numerator == denominator || denominator == 0)
        return delta;
    return delta * numerator / denominator;
}

// Applies the change of a range, from one to another, in proportion to the sizes of
// range and from.  True when nothing was clamped.
bool applyScaledDiff(Range &dst, Range range, Range from, Range to) {
    const int64_t n = range.extent();
    const int64_t d = from.extent();
    const bool isLoExact =
        storeSaturated(dst.lo, range.lo + scaled(int64_t{to.lo} - from.lo, n, d));
    const bool isHiExact =
        storeSaturated(dst.hi, range.hi + scaled(int64_t{to.hi} - from.hi, n, d));
    return isLoExact && isHiExact;
}

int32_t scaleCoordinate(Range source, Range target, int32_t coordinate) {
    const int64_t s = source.extent();
    const int64_t t = target.extent();
    // Into a larger range the mapping runs from first pixel to first pixel and
    // from last pixel to last pixel, not from end to end.
    const int64_t adjust = s < t ? -1 : 0;
    const int64_t denominator = std::max<int64_t>(s + adjust, 1);
    int64_t numerator = (t + adjust) * wrappingSubtract(coordinate, source.lo);
    if (numerator < 0)
        numerator -= denominator - 1; // round down, not towards zero
    return saturate(target.lo + numerator / denominator);
}

// The size of a range that is not empty.
int32_t sizeOf(Range range) {
    return static_cast<int32_t>(range.extent());
}

void storeUnlessNull(Rect *dst, const Rect &value) {
    if (dst != nullptr)
        *dst = value;
}

} // namespace
} // namespace quillon

using namespace quillon;

bool Rect_ApplyDiff(Rect *dst, const Rect *newRect, const Rect *oldRect, const Rect *rect) {
    const auto moved = [=](int32_t Rect::*field) {
        return int64_t{rect->*field} + newRect->*field - oldRect->*field;
    };
    Rect result;
    const bool isLeftExact = storeSaturated(result.left, moved(&Rect::left));
    const bool isTopExact = storeSaturated(result.top, moved(&Rect::top));
    const bool isRightExact = storeSaturated(result.right, moved(&Rect::right));
    const bool isBottomExact = storeSaturated(result.bottom, moved(&Rect::bottom));
    *dst = result;
    return isLeftExact && isTopExact && isRightExact && isBottomExact;
}

bool Rect_ApplyDiffToPoint(RectPoint *dst, const RectPoint *newPoint, const RectPoint *oldPoint,
                           const RectPoint *point) {
    RectPoint result;
    const bool isXExact = storeSaturated(result.x, int64_t{point->x} + newPoint->x - oldPoint->x);
    const bool isYExact = storeSaturated(result.y, int64_t{point->y} + newPoint->y - oldPoint->y);
    *dst = result;
    return isXExact && isYExact;
}

bool Rect_ApplyDiffEx(Rect *dst, const Rect *rect, const Rect *oldRect, const Rect *newRect) {
    Range x;
    Range y;
    const bool isXExact = applyScaledDiff(x, columns(*rect), columns(*oldRect), columns(*newRect));
    const bool isYExact = applyScaledDiff(y, rows(*rect), rows(*oldRect), rows(*newRect));
    *dst = fromRanges(x, y);
    return isXExact && isYExact;
}

bool Rect_IntersectPair(Rect *dstSource, const Rect *source, const Rect *clip, Rect *dstTarget,
                        const Rect *target) {
    Rect part;
    if (Rect_Intersect(&part, source, clip) && !columns(*target).empty() &&
        !rows(*target).empty()) {
        // The part lies within the source, so its edges move inward and truncation
        // rounds them outward: a part of less than one pixel maps to one pixel.
        Range x;
        Range y;
        applyScaledDiff(x, columns(*target), columns(*source), columns(part));
        applyScaledDiff(y, rows(*target), rows(*source), rows(part));
        if (!x.empty() && !y.empty()) {
            storeUnlessNull(dstTarget, fromRanges(x, y));
            storeUnlessNull(dstSource, part);
            return true;
        }
    }
    storeUnlessNull(dstTarget, Rect{});
    storeUnlessNull(dstSource, Rect{});
    return false;
}

void Rect_ScalePoint(const Rect *source, const Rect *target, const RectPoint *point,
                     RectPoint *dst) {
    *dst = {.x = scaleCoordinate(columns(*source), columns(*target), point->x),
            .y = scaleCoordinate(rows(*source), rows(*target), point->y)};
}

bool Rect_MapRect(const Rect *base, const Rect *rect, Rect *dst, Rect *clipped) {
    const Rect origin = *base;
    Rect common;
    const bool isOverlap = Rect_Intersect(&common, rect, base);
    *clipped = common;
    if (!isOverlap) {
        *dst = {};
        return false;
    }
    Rect_SetFromXYWH(dst, wrappingSubtract(common.left, origin.left),
                     wrappingSubtract(common.top, origin.top), sizeOf(columns(common)),
                     sizeOf(rows(common)));
    return true;
}
