/** @file face/rect.hpp
 *
 * Points, sizes and rectangles.  Part of quillon.hpp, which states the conventions.
 *
 * Arithmetic saturates at the limits of int32_t, as in rect.h.
 */
#ifndef QUILLON_FACE_RECT_HPP
#define QUILLON_FACE_RECT_HPP

#include <quillon/rect.h>

#include <algorithm>
#include <cstdint>
#include <limits>

/** Inlined also where the compiler would not: a rectangle that is passed in memory costs
 * more than what is done with it. */
#if defined(__GNUC__)
#define QUILLON_INLINE inline __attribute__((always_inline))
#else
#define QUILLON_INLINE inline
#endif

namespace quillon {

/** Functions that the face is made of; not for callers. */
namespace detail {

constexpr int32_t saturate(int64_t value) {
    constexpr int64_t kLow = std::numeric_limits<int32_t>::min();
    constexpr int64_t kHigh = std::numeric_limits<int32_t>::max();
    return static_cast<int32_t>(std::clamp(value, kLow, kHigh));
}

} // namespace detail

/** A pixel position, or the offset between two. */
struct Point : ::RectPoint {
    constexpr Point() : ::RectPoint() {}
    constexpr Point(int32_t column, int32_t row) : ::RectPoint{column, row} {}
    constexpr Point(const ::RectPoint &point) : ::RectPoint(point) {}

    friend constexpr Point operator+(Point a, Point b) {
        return {detail::saturate(int64_t{a.x} + b.x), detail::saturate(int64_t{a.y} + b.y)};
    }
    friend constexpr Point operator-(Point a, Point b) {
        return {detail::saturate(int64_t{a.x} - b.x), detail::saturate(int64_t{a.y} - b.y)};
    }
    constexpr Point operator-() const { return Point() - *this; }
    friend constexpr bool operator==(Point a, Point b) { return a.x == b.x && a.y == b.y; }
    friend constexpr bool operator!=(Point a, Point b) { return !(a == b); }
};

/** A size in pixels. */
struct Size {
    int32_t width = 0;
    int32_t height = 0;

    /** Tests whether there is no pixel: a side is below 1. */
    constexpr bool isEmpty() const { return width <= 0 || height <= 0; }

    friend constexpr bool operator==(Size a, Size b) {
        return a.width == b.width && a.height == b.height;
    }
    friend constexpr bool operator!=(Size a, Size b) { return !(a == b); }
};

/** A rectangle of columns and rows; half-open, as the Rect of rect.h, which it is.
 *
 * The functions of rect.h take it as it is.
 */
struct Rect : ::Rect {
    /** The empty rectangle, all zero. */
    constexpr Rect() : ::Rect() {}
    /** A rectangle by its corner and size; a negative size counts as 0. */
    constexpr Rect(int32_t x, int32_t y, int32_t width, int32_t height)
        : ::Rect{x, y, detail::saturate(int64_t{x} + std::max(width, 0)),
                 detail::saturate(int64_t{y} + std::max(height, 0))} {}
    constexpr Rect(Point corner, Size size) : Rect(corner.x, corner.y, size.width, size.height) {}
    constexpr Rect(const ::Rect &rect) : ::Rect(rect) {}

    /** A rectangle by its edges, of which right and bottom are exclusive. */
    static constexpr Rect fromEdges(int32_t left, int32_t top, int32_t right, int32_t bottom) {
        Rect rect;
        rect.left = left;
        rect.top = top;
        rect.right = right;
        rect.bottom = bottom;
        return rect;
    }

    /** The number of columns; 0 where right is not above left. */
    constexpr int32_t width() const { return extent(left, right); }
    /** The number of rows; 0 where bottom is not above top. */
    constexpr int32_t height() const { return extent(top, bottom); }
    constexpr Size size() const { return {width(), height()}; }
    constexpr Point corner() const { return {left, top}; }
    constexpr bool isEmpty() const { return right <= left || bottom <= top; }

    constexpr bool contains(Point point) const {
        return point.x >= left && point.x < right && point.y >= top && point.y < bottom;
    }
    /** Tests whether the edges of a rectangle lie within those of this one. */
    constexpr bool contains(const Rect &inner) const {
        return inner.left >= left && inner.right <= right && inner.top >= top &&
               inner.bottom <= bottom;
    }
    constexpr bool intersects(const Rect &other) const { return !intersected(other).isEmpty(); }

    /** The part that both cover; where there is none, all zero. */
    constexpr Rect intersected(const Rect &other) const {
        const Rect both = fromEdges(std::max(left, other.left), std::max(top, other.top),
                                    std::min(right, other.right), std::min(bottom, other.bottom));
        return both.isEmpty() ? Rect() : both;
    }
    /** The bounding box of both, of which an empty one does not count. */
    constexpr Rect united(const Rect &other) const {
        if (isEmpty() || other.isEmpty())
            return isEmpty() ? other : *this;
        return fromEdges(std::min(left, other.left), std::min(top, other.top),
                         std::max(right, other.right), std::max(bottom, other.bottom));
    }
    constexpr Rect translated(Point offset) const {
        const Point first = corner() + offset, end = Point(right, bottom) + offset;
        return fromEdges(first.x, first.y, end.x, end.y);
    }
    /** Grown by so many pixels on each side; shrunk where they are negative. */
    constexpr Rect grown(int32_t pixels) const {
        const Point first = corner() - Point(pixels, pixels);
        const Point end = Point(right, bottom) + Point(pixels, pixels);
        return fromEdges(first.x, first.y, end.x, end.y);
    }

    /** See Rect_PointDistance. */
    int32_t distanceTo(Point point) const { return Rect_PointDistance(this, &point); }
    /** This rectangle changed as another one was, edge by edge: see Rect_ApplyDiff. */
    Rect changedLike(const Rect &oldRect, const Rect &newRect) const {
        Rect result;
        Rect_ApplyDiff(&result, &newRect, &oldRect, this);
        return result;
    }
    /** The same in proportion to the sizes: see Rect_ApplyDiffEx. */
    Rect scaledLike(const Rect &oldRect, const Rect &newRect) const {
        Rect result;
        Rect_ApplyDiffEx(&result, this, &oldRect, &newRect);
        return result;
    }
    /** The point of target that corresponds to a point of this one: see Rect_ScalePoint. */
    Point mapTo(const Rect &target, Point point) const {
        Point result;
        Rect_ScalePoint(this, &target, &point, &result);
        return result;
    }

    /** Equal edges, or both empty. */
    friend constexpr bool operator==(const Rect &a, const Rect &b) {
        return (a.isEmpty() && b.isEmpty()) ||
               (a.left == b.left && a.top == b.top && a.right == b.right && a.bottom == b.bottom);
    }
    friend constexpr bool operator!=(const Rect &a, const Rect &b) { return !(a == b); }

private:
    static constexpr int32_t extent(int32_t first, int32_t end) {
        return detail::saturate(std::max(int64_t{end} - first, int64_t{0}));
    }
};

namespace detail {

/** A rectangle of a source, clipped to it and to where it goes on a destination. */
struct Placed {
    int32_t srcX, srcY, dstX, dstY, width, height;

    constexpr bool isEmpty() const { return width <= 0 || height <= 0; }
    constexpr Rect drawn() const { return {dstX, dstY, width, height}; }
};

/** The range of one axis that begins at first and ends ahead of end on the source, and
 * begins at to on the destination. */
QUILLON_INLINE constexpr void clipAxis(int32_t dstSize, int32_t to, int32_t srcSize, int32_t first,
                                       int32_t end, int32_t &dst, int32_t &src, int32_t &count) {
    const int64_t offset = int64_t{to} - first;
    const int64_t low = std::max({int64_t{first}, int64_t{0}, -offset});
    const int64_t high = std::min({int64_t{end}, int64_t{srcSize}, dstSize - offset});
    if (low >= high)
        return;
    src = static_cast<int32_t>(low);
    dst = static_cast<int32_t>(low + offset);
    count = static_cast<int32_t>(high - low);
}

QUILLON_INLINE constexpr Placed place(Size dst, Point to, Size src, const Rect &from) {
    Placed placed = {};
    clipAxis(dst.width, to.x, src.width, from.left, from.right, placed.dstX, placed.srcX,
             placed.width);
    clipAxis(dst.height, to.y, src.height, from.top, from.bottom, placed.dstY, placed.srcY,
             placed.height);
    return placed.isEmpty() ? Placed{} : placed;
}

/** An argument of the C interface: a number that clipping has made 0 or more. */
constexpr uint32_t u32(int32_t value) {
    return static_cast<uint32_t>(value);
}

} // namespace detail
} // namespace quillon

#endif /* QUILLON_FACE_RECT_HPP */
