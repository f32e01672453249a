/** @file rect.h
 *
 * Integer rectangles and points.
 *
 * A Rect is half-open: it covers left <= x < right and top <= y < bottom.  It is empty
 * when right <= left or bottom <= top.  Rectangles are never normalised: a function whose
 * description does not mention emptiness uses the fields as they are.
 *
 * Coordinates saturate at the limits of int32_t instead of wrapping, unless a function
 * says otherwise.  A clamped coordinate is stored, and where the function has a bool
 * result that result is false.
 *
 * Pointers are not checked for null.  No function allocates, keeps a pointer or has
 * state; calls may run at once as long as they share no output.
 */
#ifndef QUILLON_RECT_H
#define QUILLON_RECT_H

#include <quillon/export.h>

#include <stdbool.h>
#include <stdint.h>

QUILLON_BEGIN_DECLS

/** A half-open rectangle of columns and rows. */
typedef struct Rect {
    int32_t left;   /**< first column inside */
    int32_t top;    /**< first row inside */
    int32_t right;  /**< last column inside, plus 1 */
    int32_t bottom; /**< last row inside, plus 1 */
} Rect;

/** A pixel position, or the offset between two. */
typedef struct RectPoint {
    int32_t x; /**< column */
    int32_t y; /**< row */
} RectPoint;

/** Sets a rectangle from its corner and size.
 *
 * @param rect           output
 * @param x, y           left column and top row
 * @param width, height  size in pixels; a negative one counts as 0
 */
QUILLON_API void Rect_SetFromXYWH(Rect *rect, int32_t x, int32_t y, int32_t width, int32_t height);

/** Tests whether two rectangles are both empty or have four equal fields. */
QUILLON_API bool Rect_IsEqual(const Rect *a, const Rect *b);

/** Tests whether two rectangles are both empty or have equal right - left and equal
 * bottom - top.
 *
 * The differences wrap at 32 bits: where one does, an empty and a non-empty rectangle can
 * be equal in size.
 */
QUILLON_API bool Rect_IsSizeEqual(const Rect *a, const Rect *b);

/** Moves a rectangle: dst = src + delta.
 *
 * Each field saturates by itself, so a clamped rectangle can change its size.
 *
 * @param dst    output; may be src, must not overlap delta
 * @param src    the rectangle
 * @param delta  columns and rows to move by
 * @return true when no field was clamped
 */
QUILLON_API bool Rect_Translate(Rect *dst, const Rect *src, const RectPoint *delta);

/** Moves a rectangle back: dst = src + (-delta).
 *
 * The negation wraps: that of -2147483648 is -2147483648, which moves towards smaller
 * coordinates.  Each field saturates by itself.
 *
 * @param dst    output; may be src, may overlap delta
 * @param src    the rectangle
 * @param delta  columns and rows to move back by
 * @return true when no field was clamped
 */
QUILLON_API bool Rect_TranslateInv(Rect *dst, const Rect *src, const RectPoint *delta);

/** Intersects two rectangles: the larger left and top, the smaller right and bottom.
 *
 * An empty intersection is stored in this form too, not as zeros.
 *
 * @param dst   output, or null to test for overlap only; may be a or b
 * @param a, b  the rectangles
 * @return true when the intersection is not empty
 */
QUILLON_API bool Rect_Intersect(Rect *dst, const Rect *a, const Rect *b);

/** Grows a rectangle to the bounding box of itself and another.
 *
 * @param dst  changed in place; when it is empty it becomes a copy of src
 * @param src  when it is empty, and dst is not, nothing changes
 */
QUILLON_API void Rect_Union(Rect *dst, const Rect *src);

/** Tests whether the fields of inner lie within those of outer.  An empty inner is not
 * treated specially.
 */
QUILLON_API bool Rect_ContainsRect(const Rect *outer, const Rect *inner);

/** Tests whether a point is a pixel of a rectangle. */
QUILLON_API bool Rect_ContainsPoint(const Rect *rect, const RectPoint *point);

/** Computes the bounding box of two rectangles: the smaller left and top, the larger right
 * and bottom.
 *
 * Unlike in Rect_Union, an empty rectangle counts with its fields.
 *
 * @param dst   output; may be a or b
 * @param a, b  the rectangles
 */
QUILLON_API void Rect_BoundingBox(Rect *dst, const Rect *a, const Rect *b);

/** Computes the chessboard distance from a point to a rectangle:
 *
 *     max(top - y, left - x, y - (bottom - 1), x - (right - 1))
 *
 * It is 0 on the outermost pixels of the rectangle, positive outside, and inside minus
 * the number of pixels to the nearest outermost one.  An empty rectangle is not treated
 * specially.
 *
 * The differences saturate, except that the subtrahend -2147483648 is negated with
 * wrapping; -2147483648 - 1 is -2147483648.
 *
 * @return the distance in pixels
 */
QUILLON_API int32_t Rect_PointDistance(const Rect *rect, const RectPoint *point);

/** Does nothing.  A host can call it to check that the library is linked. */
QUILLON_API void Rect_Test(void);

/** @name Diffs and mapping
 *
 * A pair of rectangles describes a change (old and new) or a mapping (source and target),
 * which is applied to a third rectangle or to a point.
 *
 * The extent of a rectangle on an axis is right - left or bottom - top, at least 0 and at
 * most 2147483647.  Quotients are truncated towards zero unless a function says otherwise.
 *
 * All inputs are read before anything is stored, so an output may be an input.  Two
 * outputs of one call must not overlap.
 * @{
 */

/** Applies a change to a rectangle, field by field: dst = rect + newRect - oldRect.
 *
 * @param dst               output
 * @param newRect, oldRect  the change
 * @param rect              the rectangle
 * @return true when no field was clamped
 */
QUILLON_API bool Rect_ApplyDiff(Rect *dst, const Rect *newRect, const Rect *oldRect,
                                const Rect *rect);

/** Applies a change to a point: dst = point + newPoint - oldPoint.
 *
 * @param dst                 output
 * @param newPoint, oldPoint  the change
 * @param point               the point
 * @return true when no coordinate was clamped
 */
QUILLON_API bool Rect_ApplyDiffToPoint(RectPoint *dst, const RectPoint *newPoint,
                                       const RectPoint *oldPoint, const RectPoint *point);

/** Applies a change to a rectangle in proportion to its size.
 *
 * With n and d the extents of rect and oldRect on the axis of a field:
 *
 *     dst = rect + (newRect - oldRect) * n / d
 *
 * Where n = d, or d = 0, the difference is added unscaled.  The order of the arguments is
 * not that of Rect_ApplyDiff.
 *
 * @param dst               output
 * @param rect              the rectangle
 * @param oldRect, newRect  the change
 * @return true when no field was clamped
 */
QUILLON_API bool Rect_ApplyDiffEx(Rect *dst, const Rect *rect, const Rect *oldRect,
                                  const Rect *newRect);

/** Clips a source rectangle and computes the part of a target rectangle that corresponds.
 *
 * All of source maps to all of target.  The edges of the mapped part are rounded outward
 * to whole target pixels.
 *
 * @param dstSource  receives the intersection of source and clip; may be null
 * @param source     the source rectangle
 * @param clip       what it is clipped to
 * @param dstTarget  receives the part of target; may be null
 * @param target     the target rectangle
 * @return true when neither is empty; otherwise both are set to zeros
 */
QUILLON_API bool Rect_IntersectPair(Rect *dstSource, const Rect *source, const Rect *clip,
                                    Rect *dstTarget, const Rect *target);

/** Maps a point from one rectangle to another.
 *
 * On each axis, with s and t the extents of source and target, and the quotient rounded
 * down:
 *
 *     dst = target.left + (point - source.left) * (t - 1) / (s - 1)    where t > s
 *     dst = target.left + (point - source.left) * t / s                otherwise
 *
 * So into a larger extent the first pixel maps to the first and the last to the last.  A
 * divisor below 1 counts as 1.  The point may lie outside source; the difference
 * point - source.left wraps at 32 bits.
 *
 * @param source, target  the mapping
 * @param point           the point
 * @param dst             output
 */
QUILLON_API void Rect_ScalePoint(const Rect *source, const Rect *target, const RectPoint *point,
                                 RectPoint *dst);

/** Computes the part of a rectangle within a base rectangle, relative to the top left
 * corner of the base.
 *
 * @param base     the base
 * @param rect     the rectangle
 * @param dst      receives that part; zeros when there is none
 * @param clipped  receives the intersection as Rect_Intersect stores it; not null
 * @return true when rect and base overlap
 */
QUILLON_API bool Rect_MapRect(const Rect *base, const Rect *rect, Rect *dst, Rect *clipped);

/** @} */

QUILLON_END_DECLS

#endif /* QUILLON_RECT_H */
