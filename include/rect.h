/** @file rect.h
 *
 * Integer rectangles and points.
 *
 * A Rect is half-open: it covers left <= x < right and top <= y < bottom.  It
 * is empty when right <= left or bottom <= top; nothing normalises it, and the
 * functions that do not speak of emptiness take the fields as they are.
 *
 * Coordinates saturate at the limits of int32 instead of wrapping, unless a
 * function says otherwise.  A clamped coordinate is stored all the same, and
 * the result tells of it.
 *
 * All records are the caller's.  No function allocates, keeps a pointer or has
 * any state; calls may run at once as long as they do not share an output.
 */
#ifndef QUILLON_RECT_H
#define QUILLON_RECT_H

#include "quillonTypes.h"

QUILLON_BEGIN_DECLS

/** A half-open rectangle of columns and rows. */
typedef struct Rect {
    int32 left;   /**< first column inside */
    int32 top;    /**< first row inside */
    int32 right;  /**< column just behind the last one inside */
    int32 bottom; /**< row just below the last one inside */
} Rect;

/** A pixel position, or an offset between two. */
typedef struct RectPoint {
    int32 x;
    int32 y;
} RectPoint;

/** Sets a rectangle from its corner and size.
 *
 * A negative size counts as 0.  right and bottom stop at the largest int32
 * instead of wrapping.
 */
QUILLON_API void Rect_SetFromXYWH(Rect *rect, int32 x, int32 y, int32 width, int32 height);

/** True when both rectangles are empty, or when all four fields agree. */
QUILLON_API bool Rect_IsEqual(const Rect *a, const Rect *b);

/** True when both rectangles are empty, or when right - left and bottom - top
 * agree.  The differences are taken in 32 bits and wrap, so an empty and a
 * non-empty rectangle can agree where a difference leaves the int32 range.
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
QUILLON_API int32 Rect_PointDistance(const Rect *rect, const RectPoint *point);

/** Does nothing.  It gives a host something to call in order to see that the
 * library is there.
 */
QUILLON_API void Rect_Test(void);

QUILLON_END_DECLS

#endif /* QUILLON_RECT_H */
