// Rectangles and points: construction, comparison, translation, clipping.
//
// An output may be an input too, so all inputs are read before anything is stored.
#include <quillon/rect.h>

#include "core/coordinates.h"

#include <algorithm>
#include <cstddef>

// The layout of the records is part of the interface.
static_assert(offsetof(Rect, bottom) == 12 && sizeof(Rect) == 16);
static_assert(offsetof(RectPoint, y) == 4 && sizeof(RectPoint) == 8);

namespace quillon {
namespace {

bool isEmpty(const Rect &rect) {
    return rect.right <= rect.left || rect.bottom <= rect.top;
}

bool translate(Rect &dst, const Rect &src, int64_t dx, int64_t dy) {
    Rect moved;
    const bool isLeftExact = storeSaturated(moved.left, src.left + dx);
    const bool isTopExact = storeSaturated(moved.top, src.top + dy);
    const bool isRightExact = storeSaturated(moved.right, src.right + dx);
    const bool isBottomExact = storeSaturated(moved.bottom, src.bottom + dy);
    dst = moved;
    return isLeftExact && isTopExact && isRightExact && isBottomExact;
}

// The last column or row inside.  There is none before the smallest coordinate.
int32_t lastInside(int32_t end) {
    return end == kCoordinateMin ? end : end - 1;
}

// a - b, saturated, with the negation of b wrapping: the smallest coordinate, as b,
// makes the result smaller than a.
int32_t gap(int32_t a, int32_t b) {
    return saturate(int64_t{a} + wrappingSubtract(0, b));
}

} // namespace
} // namespace quillon

using namespace quillon;

void Rect_SetFromXYWH(Rect *rect, int32_t x, int32_t y, int32_t width, int32_t height) {
    *rect = {.left = x,
             .top = y,
             .right = saturate(int64_t{x} + std::max(width, 0)),
             .bottom = saturate(int64_t{y} + std::max(height, 0))};
}

bool Rect_IsEqual(const Rect *a, const Rect *b) {
    if (isEmpty(*a) && isEmpty(*b))
        return true;
    return a->left == b->left && a->top == b->top && a->right == b->right && a->bottom == b->bottom;
}

bool Rect_IsSizeEqual(const Rect *a, const Rect *b) {
    if (isEmpty(*a) && isEmpty(*b))
        return true;
    return wrappingSubtract(a->right, a->left) == wrappingSubtract(b->right, b->left) &&
           wrappingSubtract(a->bottom, a->top) == wrappingSubtract(b->bottom, b->top);
}

bool Rect_Translate(Rect *dst, const Rect *src, const RectPoint *delta) {
    return translate(*dst, *src, delta->x, delta->y);
}

bool Rect_TranslateInv(Rect *dst, const Rect *src, const RectPoint *delta) {
    return translate(*dst, *src, wrappingSubtract(0, delta->x), wrappingSubtract(0, delta->y));
}

bool Rect_Intersect(Rect *dst, const Rect *a, const Rect *b) {
    const Rect common = {.left = std::max(a->left, b->left),
                         .top = std::max(a->top, b->top),
                         .right = std::min(a->right, b->right),
                         .bottom = std::min(a->bottom, b->bottom)};
    if (dst != nullptr)
        *dst = common;
    return !isEmpty(common);
}

void Rect_Union(Rect *dst, const Rect *src) {
    if (isEmpty(*dst))
        *dst = *src;
    else if (!isEmpty(*src))
        Rect_BoundingBox(dst, dst, src);
}

bool Rect_ContainsRect(const Rect *outer, const Rect *inner) {
    return outer->left <= inner->left && outer->top <= inner->top && outer->right >= inner->right &&
           outer->bottom >= inner->bottom;
}

bool Rect_ContainsPoint(const Rect *rect, const RectPoint *point) {
    return rect->left <= point->x && point->x < rect->right && rect->top <= point->y &&
           point->y < rect->bottom;
}

void Rect_BoundingBox(Rect *dst, const Rect *a, const Rect *b) {
    *dst = {.left = std::min(a->left, b->left),
            .top = std::min(a->top, b->top),
            .right = std::max(a->right, b->right),
            .bottom = std::max(a->bottom, b->bottom)};
}

int32_t Rect_PointDistance(const Rect *rect, const RectPoint *point) {
    return std::max({gap(rect->top, point->y), gap(rect->left, point->x),
                     gap(point->y, lastInside(rect->bottom)),
                     gap(point->x, lastInside(rect->right))});
}

void Rect_Test(void) {}
