/** @file rasterRectList.h
 *
 * Regions of pixels as lists of at most 16 rectangles.  Part of raster.h, which includes
 * this header.
 *
 * A list is a record of fixed size without pointers; it can be copied, and all-zero memory
 * is the empty region.  No function allocates.
 *
 * A list as Raster_AddRect and Raster_SubRect store it is in normal form:
 *   - At most 15 entries are in use.  They come first; the others are all zero.
 *   - Entries are ordered by y, then by x.
 *   - Entries do not overlap, and no two touch within a row.
 *   - An entry extends down over all following rows that hold a span with its left and
 *     right edges.  Stacked rectangles with equal edges are therefore one entry.
 *
 * A region has one normal form, so two such lists hold the same region exactly when their
 * bytes are equal.  One exception: the first rectangle added to an empty list is stored
 * without clearing the other entries.
 *
 * A list may also be filled by hand: in any order, with overlaps, with up to 16 entries.
 * The first entry with a width below 1 ends the list; a list whose first entry has a
 * height below 1 is empty.  The next call stores normal form.
 *
 * Right and bottom edges should fit int32_t.  Those that do not wrap, and such an entry
 * usually covers nothing.
 */
#ifndef QUILLON_RASTER_RECT_LIST_H
#define QUILLON_RASTER_RECT_LIST_H

#include <quillon/export.h>

#include <stdint.h>

QUILLON_BEGIN_DECLS

/** One rectangle of a list: columns x to x + width - 1, rows y to y + height - 1. */
typedef struct RasterRectListEntry {
    int32_t x;
    int32_t y;
    int32_t width;
    int32_t height;
} RasterRectListEntry;

/** A region.  256 bytes. */
typedef struct RasterRectList {
    RasterRectListEntry entries[16];
} RasterRectList;

/** Sets a list to the empty region, all entries zero. */
QUILLON_API void Raster_ClearRectList(RasterRectList *list);

/** Adds a rectangle to a region.
 *
 * Where the normal form has more than 15 entries, the bounding box of the region is stored
 * instead: one entry, which also covers pixels that were never added.  Where the width or
 * height of that box does not fit int32_t, the list is left unchanged.
 *
 * @param list           the region, changed in place
 * @param x, y           left column and top row
 * @param width, height  size in pixels; when either is 0 nothing is added; otherwise a
 *                       negative one is a Panic with the list unchanged
 * @return the number of pixels in the region, modulo 2^32; 0 with the list unchanged when
 *         width or height is 0 or the bounding box cannot be stored
 */
QUILLON_API uint32_t Raster_AddRect(RasterRectList *list, int32_t x, int32_t y, int32_t width,
                                    int32_t height);

/** Removes a rectangle from a region.
 *
 * Where the normal form has more than 15 entries, the list is left unchanged: it still
 * holds the rectangle.  A result of 0 with a list that is not empty therefore means that
 * nothing was removed (or that the number of pixels is a multiple of 2^32).
 *
 * A list filled by hand whose 16 entries are 16 spans of one row is a Panic, with the list
 * unchanged, where one of the spans would have to be split.
 *
 * @param list           the region, changed in place
 * @param x, y           left column and top row
 * @param width, height  size in pixels; a negative one removes nothing, but the list is
 *                       brought to normal form
 * @return the number of pixels in the region, modulo 2^32; 0 with the list unchanged when
 *         width or height is 0 or the region cannot be stored; 0 too when the region is
 *         empty
 */
QUILLON_API uint32_t Raster_SubRect(RasterRectList *list, int32_t x, int32_t y, int32_t width,
                                    int32_t height);

QUILLON_END_DECLS

#endif /* QUILLON_RASTER_RECT_LIST_H */
