/** @file rect.h
 *
 * Integer rectangles and points.
 *
 * A Rect is half-open: it covers left <= x < right and top <= y < bottom.  It
 * is empty when right <= left or bottom <= top; nothing normalises it, and the
 * functions that do not speak of emptiness take the fields as they are.
 *
 * Coordinates saturate at the limits of int32_t instead of wrapping, unless a
 * function says otherwise.  A clamped coordinate is stored all the same, and
 * the result tells of it.
 *
 * All records are the caller's.  No function allocates, keeps a pointer or has
 * any state; calls may run at once as long as they do not share an output.
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
    int32_t right;  /**< column just behind the last one inside */
    int32_t bottom; /**< row just below the last one inside */
} Rect;

/** A pixel position, or an offset between two. */
typedef struct RectPoint {
    int32_t x;
    int32_t y;
} RectPoint;

/** Sets a rectangle from its corner and size.
 *
 * A negative size counts as 0.  right and bottom stop at the largest int32_t
 * instead of wrapping.
 */
QUILLON_API void Rect_SetFromXYWH(Rect *rect, int32_t x, int32_t y, int32_t width, int32_t height);

/** True when both rectangles are empty, or when all four fields agree. */
QUILLON_API bool Rect_IsEqual(const Rect *a, const Rect *b);

/** True when both rectangles are empty, or when right - left and bottom - top
 * agree.  The differences are taken in 32 bits and wrap, so an empty and a
 * non-empty rectangle can agree where a difference leaves the int32_t range.
 */
QUILLON_API bool Rect_IsSizeEqual(const Rect *a, const Rect *b);

/** Moves src by delta into dst, each field saturating by itself.
 *
 * A clamped rectangle can thus change its size.
 *
 * @param dst    output; may be src, must not overlay delta
 * @param delta  columns and rows to move by
 * @return true when no field was clamped
 */
QUILLON_API bool Rect_Translate(Rect *dst, const Rect *src, const RectPoint *delta);

/** Moves src by minus delta into dst, each field saturating by itself.
 *
 * The negation wraps: a delta of -2147483648 stays what it is and moves towards
 * smaller coordinates.
 *
 * @param dst  output; may be src, and may overlay delta
 * @return true when no field was clamped
 */
QUILLON_API bool Rect_TranslateInv(Rect *dst, const Rect *src, const RectPoint *delta);

/** Intersects a and b.
 *
 * All four fields are stored also when the intersection is empty; they then
 * are the larger left and top and the smaller right and bottom, not zeros.
 *
 * @param dst  output, or null to test for overlap only; may be a or b
 * @return true when the intersection is not empty
 */
QUILLON_API bool Rect_Intersect(Rect *dst, const Rect *a, const Rect *b);

/** Grows dst to cover src too.
 *
 * An empty src changes nothing; an empty dst becomes a copy of src, even if
 * that is empty as well.
 */
QUILLON_API void Rect_Union(Rect *dst, const Rect *src);

/** True when the four fields of inner lie within those of outer.  Emptiness is
 * not looked at: an empty inner whose fields lie inside counts as contained.
 */
QUILLON_API bool Rect_ContainsRect(const Rect *outer, const Rect *inner);

/** True when the point is one of the rectangle's pixels. */
QUILLON_API bool Rect_ContainsPoint(const Rect *rect, const RectPoint *point);

/** The smallest rectangle that spans the fields of a and b.
 *
 * Unlike Rect_Union, an empty input counts with its coordinates.
 *
 * @param dst  output; may be a or b
 */
QUILLON_API void Rect_BoundingBox(Rect *dst, const Rect *a, const Rect *b);

/** Chessboard distance, in pixels, from a point to a rectangle.
 *
 * 0 on the outermost pixels of the rectangle, positive outside, and inside
 * minus the number of pixels to the nearest outermost one.  An empty rectangle
 * gets no special treatment.  The differences saturate; a coordinate of
 * -2147483648 to be subtracted is negated with wrapping first.
 */
QUILLON_API int32_t Rect_PointDistance(const Rect *rect, const RectPoint *point);

/** Does nothing.  It gives a host something to call in order to see that the
 * library is there.
 */
QUILLON_API void Rect_Test(void);

/** @name Diffs and mapping
 *
 * A pair of rectangles stands for a change (old and new) or a mapping (source
 * and target), which is applied to a third rectangle or to a point.
 *
 * The extent of a rectangle on an axis is right - left or bottom - top, but 0
 * when it covers nothing on that axis, and at most 2147483647.  Quotients are
 * truncated towards zero unless a function says otherwise.
 *
 * Inputs are read before anything is stored, so outputs may be inputs.
 * @{
 */

/** Adds the plain difference of two rectangles to a third, each field by itself:
 * dst = rect + newRect - oldRect.
 *
 * @return true when no field was clamped
 */
QUILLON_API bool Rect_ApplyDiff(Rect *dst, const Rect *newRect, const Rect *oldRect,
                                const Rect *rect);

/** Adds the difference of two points to a third: dst = point + newPoint -
 * oldPoint.
 *
 * @return true when no coordinate was clamped
 */
QUILLON_API bool Rect_ApplyDiffToPoint(RectPoint *dst, const RectPoint *newPoint,
                                       const RectPoint *oldPoint, const RectPoint *point);

/** Applies the change from oldRect to newRect to rect, in proportion to its size.
 *
 * Each field gets dst = rect + (newRect - oldRect) * n / d with the extents n of
 * rect and d of oldRect on the field's axis: a rectangle of half the size moves
 * its edges by half as much.  Where n and d agree, or d is 0, the difference is
 * added as it is.
 *
 * The order of the rectangles differs from that of Rect_ApplyDiff.
 *
 * @return true when no field was clamped
 */
QUILLON_API bool Rect_ApplyDiffEx(Rect *dst, const Rect *rect, const Rect *oldRect,
                                  const Rect *newRect);

/** Clips a source rectangle and cuts its target rectangle accordingly.
 *
 * source as a whole maps to target as a whole.  The edges of the mapped part are
 * rounded outward to whole pixels of the target.
 *
 * @param dstSource  gets the intersection of source and clip; may be null
 * @param dstTarget  gets the part of target that it maps to; may be null
 * @return true when both are not empty; otherwise both become all zero
 */
QUILLON_API bool Rect_IntersectPair(Rect *dstSource, const Rect *source, const Rect *clip,
                                    Rect *dstTarget, const Rect *target);

/** Maps a point from the space of source to that of target, axis by axis.
 *
 * Into a larger extent the first pixel maps to the first and the last to the
 * last, that is with the factor (t - 1) / (s - 1) for the extents t of target
 * and s of source; otherwise the factor is t / s.  A divisor below 1 counts as
 * 1.  The scaled offset is rounded down, the result saturates.  The point may
 * lie outside source, but its offset from the corner of source wraps at 32 bits.
 */
QUILLON_API void Rect_ScalePoint(const Rect *source, const Rect *target, const RectPoint *point,
                                 RectPoint *dst);

/** Expresses the part of rect within base relative to the corner of base.
 *
 * @param dst      gets that part, all zero when there is none
 * @param clipped  gets the intersection as Rect_Intersect stores it; not null
 * @return true when rect and base overlap
 */
QUILLON_API bool Rect_MapRect(const Rect *base, const Rect *rect, Rect *dst, Rect *clipped);

/** @} */

QUILLON_END_DECLS

#endif /* QUILLON_RECT_H */
