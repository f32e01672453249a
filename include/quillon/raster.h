/** @file raster.h
 *
 * Raster operations on surfaces in ordinary memory.
 *
 * There is no surface record.  A surface is a pointer to the first byte of its
 * pixel (0, 0), a line increment (bytes from a pixel to the one below it) and a
 * pixel size or layout.  Pixel (x, y) starts at
 *
 *     buffer + y * lineIncrement + x * bytesPerPixel
 *
 * computed at pointer width.  No alignment is demanded.  Pixels are
 * little-endian: a 24-bit pixel is B G R in memory, a 32-bit one B G R A.  If
 * red and blue look swapped, the pixels came from a library that has red first.
 *
 * Nothing clips: a rectangle must lie inside memory that the caller provides,
 * and no byte outside it is read or written.  No pointer is tested for null,
 * but an empty rectangle touches no memory.  No function allocates (the scalers
 * apart) or has any state; calls may run at once on separate memory.
 *
 * How rows follow each other when a line increment is not a whole number of
 * pixels differs by family, and each function tells:
 *   - exact: by the line increment, at every pixel size;
 *   - rounded steps: the first row exactly, then by the line increment rounded
 *     down to whole pixels, at 2 and 4 bytes per pixel;
 *   - rounded: by the line increment rounded down to whole pixels, for the
 *     first row too, at 2 and 4 bytes per pixel.
 *
 * An argument that no caller may pass (a depth outside the tables) ends in
 * Warning and Panic, see hearth.h, before anything is written.
 */
#ifndef QUILLON_RASTER_H
#define QUILLON_RASTER_H

#include <quillon/export.h>
#include <quillon/rasterCursor.h>
#include <quillon/rasterVideo.h>
#include <quillon/rect.h>

#include <stdbool.h>
#include <stdint.h>

QUILLON_BEGIN_DECLS

/** @name Fill, copy, alpha
 * @{
 */

/** Fills a rectangle with one pixel value.
 *
 * Rows: rounded steps.
 *
 * @param bytesPerPixel  1 to 4, anything else is a Panic
 * @param pixel          of which the low bytesPerPixel bytes are stored, low
 *                       byte first
 */
QUILLON_API void Raster_RectFill(uint8_t *frameBuffer, int32_t lineIncrement, int32_t bytesPerPixel,
                                 uint32_t pixel, uint32_t x, uint32_t y, uint32_t width,
                                 uint32_t height);

/** Copies a rectangle between two surfaces or within one.
 *
 * Safe for overlap: on one surface the result is that of a copy through a
 * temporary buffer.  Rectangles on surfaces of different line increments that
 * overlap in memory are copied row by row, from the last row when srcY < dstY,
 * from the first otherwise.  Line increments may be negative.
 *
 * Rows: exact.
 *
 * @param bytesPerPixel  scales byte counts and is not checked; 0 or less copies
 *                       nothing
 */
QUILLON_API void Raster_RectCopy(uint8_t *dstBuffer, int32_t dstLineIncrement,
                                 const uint8_t *srcBuffer, int32_t srcLineIncrement,
                                 int32_t bytesPerPixel, uint32_t srcX, uint32_t srcY, uint32_t dstX,
                                 uint32_t dstY, uint32_t width, uint32_t height);

/** Sets the alpha byte of 32-bit pixels; their colour stays.
 *
 * Rows: exact.
 */
QUILLON_API void Raster_RectFillAlpha(uint8_t *frameBuffer, int32_t lineIncrement, uint8_t alpha,
                                      uint32_t x, uint32_t y, uint32_t width, uint32_t height);

/** Composites premultiplied 32-bit pixels over 32-bit pixels.
 *
 * For each colour byte: dst = min(255, src + dst * (255 - srcAlpha) / 255), the
 * division dropping its remainder.  The alpha byte of the destination keeps its
 * value.
 *
 * Where the surfaces overlap, the outcome is that of going through the rows
 * from top to bottom and through each row from left to right, each pixel of
 * both surfaces being read whole before it is written.
 *
 * Rows: exact.
 */
QUILLON_API void Raster_AlphaBlendOver(uint8_t *dstBuffer, uint32_t dstX, uint32_t dstY,
                                       int32_t dstLineIncrement, const uint8_t *srcBuffer,
                                       uint32_t srcX, uint32_t srcY, int32_t srcLineIncrement,
                                       uint32_t width, uint32_t height);

/** @} */

/** @name Raster operations
 *
 * A raster operation combines two operands bit by bit: S, the source, and D,
 * what the destination holds; the result replaces D.  The code is its truth
 * table: bit 3 - (2 * s + d) is the result for the operand bits s and d.
 *
 * Codes above 15 do nothing, as RASTER_ROP_NOOP does.
 * @{
 */

/** The sixteen raster operations. */
enum {
    RASTER_ROP_CLEAR = 0,          /**< 0 */
    RASTER_ROP_AND = 1,            /**< S & D */
    RASTER_ROP_AND_REVERSE = 2,    /**< S & ~D */
    RASTER_ROP_COPY = 3,           /**< S */
    RASTER_ROP_AND_INVERTED = 4,   /**< ~S & D */
    RASTER_ROP_NOOP = 5,           /**< D; nothing is read or written */
    RASTER_ROP_XOR = 6,            /**< S ^ D */
    RASTER_ROP_OR = 7,             /**< S | D */
    RASTER_ROP_NOR = 8,            /**< ~(S | D) */
    RASTER_ROP_EQUIV = 9,          /**< ~(S ^ D) */
    RASTER_ROP_INVERT = 10,        /**< ~D */
    RASTER_ROP_OR_REVERSE = 11,    /**< S | ~D */
    RASTER_ROP_COPY_INVERTED = 12, /**< ~S */
    RASTER_ROP_OR_INVERTED = 13,   /**< ~S | D */
    RASTER_ROP_NAND = 14,          /**< ~(S & D) */
    RASTER_ROP_SET = 15            /**< all bits 1 */
};

/** Combines a rectangle with one pixel value.
 *
 * Rows: rounded steps.
 *
 * @param bytesPerPixel  1 to 4, anything else is a Panic, whatever the code and
 *                       the size of the rectangle
 * @param pixel          S, of which the low bytesPerPixel bytes count
 * @param rop            the code, all 32 bits of it
 */
QUILLON_API void Raster_RectROPfill(uint8_t *frameBuffer, int32_t lineIncrement,
                                    int32_t bytesPerPixel, uint32_t pixel, uint32_t rop, uint32_t x,
                                    uint32_t y, uint32_t width, uint32_t height);

/** Combines a rectangle with one of another surface or of the same one.
 *
 * On one surface whose line increment is a whole number of pixels, the result
 * is that of combining the rectangles as they were, however they overlap.
 * Surfaces that overlap in any other way are gone through in a fixed order:
 * from the last row where srcY < dstY; else from the first row, and in it from
 * the right where srcY = dstY and dstX > srcX; from the left otherwise.  A pixel
 * of 1, 2 or 4 bytes is read whole before it is written, one of 3 bytes byte by
 * byte, in the direction of the row.
 *
 * RASTER_ROP_COPY is Raster_RectCopy, with its row rule and without a check of
 * the pixel size.  Codes 0, 10 and 15 do not read the source.
 *
 * Rows: the first one walked exactly, then by the signed step rounded down to
 * whole pixels, at 2 and 4 bytes per pixel; going upwards the step is the
 * negated line increment.
 *
 * @param bytesPerPixel  1 to 4, anything else is a Panic (unless the code is
 *                       RASTER_ROP_COPY), whatever the size of the rectangle
 * @param rop            the code, all 32 bits of it
 */
QUILLON_API void Raster_RectROPcopy(uint8_t *dstBuffer, int32_t dstLineIncrement,
                                    const uint8_t *srcBuffer, int32_t srcLineIncrement,
                                    int32_t bytesPerPixel, uint32_t srcX, uint32_t srcY,
                                    uint32_t rop, uint32_t dstX, uint32_t dstY, uint32_t width,
                                    uint32_t height);

/** @} */

/** @name Bit expansion
 *
 * A bitmap has one bit per pixel; a row begins on a byte, and bit 7 of a byte
 * is its leftmost pixel.  Of each row the first (width + 7) / 8 bytes are read,
 * and the bits behind the last pixel are ignored.  bitmap and surface must not
 * overlap.
 *
 * There are no coordinates: srcBits and dstBuffer are the first bitmap byte and
 * the first pixel of the rectangle.  A width below 1 writes nothing.
 *
 * Rows: exact, on both sides.
 * @{
 */

/** Writes foreground where a bit is set and background where it is clear.
 *
 * @param bytesPerPixel  1 to 4; anything else writes nothing
 * @param foreground, background  of which the low bytesPerPixel bytes are stored
 */
QUILLON_API void Raster_BitsToPixels(const uint8_t *srcBits, int32_t srcLineIncrement,
                                     uint8_t *dstBuffer, int32_t dstLineIncrement,
                                     int32_t bytesPerPixel, int32_t width, uint32_t height,
                                     uint32_t foreground, uint32_t background);

/** Raster_BitsToPixels at 1 byte per pixel. */
QUILLON_API void RasterBitsToPixels8(const uint8_t *srcBits, int32_t srcLineIncrement,
                                     uint8_t *dstBuffer, int32_t dstLineIncrement, int32_t width,
                                     uint32_t height, uint32_t foreground, uint32_t background);

/** Raster_BitsToPixels at 2 bytes per pixel. */
QUILLON_API void RasterBitsToPixels16(const uint8_t *srcBits, int32_t srcLineIncrement,
                                      uint8_t *dstBuffer, int32_t dstLineIncrement, int32_t width,
                                      uint32_t height, uint32_t foreground, uint32_t background);

/** Raster_BitsToPixels at 3 bytes per pixel. */
QUILLON_API void RasterBitsToPixels24(const uint8_t *srcBits, int32_t srcLineIncrement,
                                      uint8_t *dstBuffer, int32_t dstLineIncrement, int32_t width,
                                      uint32_t height, uint32_t foreground, uint32_t background);

/** Raster_BitsToPixels at 4 bytes per pixel. */
QUILLON_API void RasterBitsToPixels32(const uint8_t *srcBits, int32_t srcLineIncrement,
                                      uint8_t *dstBuffer, int32_t dstLineIncrement, int32_t width,
                                      uint32_t height, uint32_t foreground, uint32_t background);

/** Writes a pixel value where a bit is set.
 *
 * Memory under a clear bit is neither read nor written, so that it may belong
 * to another thread or lie in a page that cannot be written.
 *
 * @param bytesPerPixel  1 to 4; anything else writes nothing
 * @param pixel          of which the low bytesPerPixel bytes are stored
 */
QUILLON_API void Raster_BitsToPixelsStencil(const uint8_t *srcBits, int32_t srcLineIncrement,
                                            uint8_t *dstBuffer, int32_t dstLineIncrement,
                                            int32_t bytesPerPixel, int32_t width, uint32_t height,
                                            uint32_t pixel);

/** Raster_BitsToPixelsStencil at 1 byte per pixel. */
QUILLON_API void RasterBitsToPixelsStencil8(const uint8_t *srcBits, int32_t srcLineIncrement,
                                            uint8_t *dstBuffer, int32_t dstLineIncrement,
                                            int32_t width, uint32_t height, uint32_t pixel);

/** Raster_BitsToPixelsStencil at 2 bytes per pixel. */
QUILLON_API void RasterBitsToPixelsStencil16(const uint8_t *srcBits, int32_t srcLineIncrement,
                                             uint8_t *dstBuffer, int32_t dstLineIncrement,
                                             int32_t width, uint32_t height, uint32_t pixel);

/** Raster_BitsToPixelsStencil at 3 bytes per pixel. */
QUILLON_API void RasterBitsToPixelsStencil24(const uint8_t *srcBits, int32_t srcLineIncrement,
                                             uint8_t *dstBuffer, int32_t dstLineIncrement,
                                             int32_t width, uint32_t height, uint32_t pixel);

/** Raster_BitsToPixelsStencil at 4 bytes per pixel. */
QUILLON_API void RasterBitsToPixelsStencil32(const uint8_t *srcBits, int32_t srcLineIncrement,
                                             uint8_t *dstBuffer, int32_t dstLineIncrement,
                                             int32_t width, uint32_t height, uint32_t pixel);

/** @} */

/** @name Pixel layouts
 *
 * A layout is named by its depth:
 *
 * | depth | bytes | red      | green    | blue     | rest                          |
 * |-------|-------|----------|----------|----------|-------------------------------|
 * | 3     | 1     | 0x04     | 0x20     | 0x80     | written as 0                  |
 * | 6     | 1     | 0x30     | 0x0C     | 0x03     | written as 0                  |
 * | 8     | 1     | 0x07     | 0x38     | 0xC0     | none                          |
 * | 15    | 2     | 0x7C00   | 0x03E0   | 0x001F   | ignored, written as 0         |
 * | 16    | 2     | 0xF800   | 0x07E0   | 0x001F   | none                          |
 * | 24    | 3     | 0xFF0000 | 0x00FF00 | 0x0000FF | none; B G R in memory         |
 * | 32    | 4     | 0xFF0000 | 0x00FF00 | 0x0000FF | alpha on top; B G R A in memory |
 *
 * A channel narrows by dropping its low bits, and widens by repeating its top
 * bits below itself; there is no rounding and no dithering.
 *
 * A palette is an array of 32-bit pixels, the caller's, indexed by a one-byte
 * source pixel; pseudoColor says that the source pixels are such indices.
 * There is no pseudo-colour destination.  Entries that no pixel uses are not
 * read; without pseudoColor the palette is not looked at and may be null.
 * @{
 */

/** Whether a mode is one that the raster code works in: depth 24 in 24 or 32
 * bits, depth 15 or 16 in 16 bits, or any depth in 8 bits of pseudo colour.
 *
 * @param depth         significant colour bits
 * @param bitsPerPixel  bits of storage
 */
QUILLON_API bool Raster_IsModeReasonable(int32_t depth, int32_t bitsPerPixel, bool pseudoColor);

/** Converts one pixel value.
 *
 * From 15 and 16 the alpha of a 32-bit result is 0.  From 24, 32 and a palette
 * the top byte goes along to 24 and 32.  Equal depths give the value unchanged.
 *
 * @param pixel     in the low bits; with pseudoColor the index, which is not
 *                  cut to 8 bits: the palette must cover it
 * @param srcDepth  15, 16, 24 or 32, or 8 with pseudoColor; else a Panic
 * @param dstDepth  one of the seven layouts; else a Panic
 */
QUILLON_API uint32_t Raster_ConvertOnePixel(uint32_t pixel, int32_t srcDepth, int32_t dstDepth,
                                            bool pseudoColor, const uint32_t *palette);

/** How to place a colour component in a channel:
 * ((component * multiplier) >> shift) & mask, multiplied modulo 2^32.
 */
typedef struct RasterRGBParam {
    uint32_t multiplier;
    uint32_t shift;
    uint32_t mask;
} RasterRGBParam;

/** Works out how to place a component in a channel.
 *
 * Only the lowest run of set bits of mask counts as the channel.  The component
 * is truncated to a narrower channel, repeated to fill a wider one.
 *
 * @param param          output
 * @param componentBits  bits of the component, 1 to 31
 * @param mask           neither 0 nor all ones; the channel's bits, rounded up
 *                       to a multiple of componentBits, must not be above 31
 */
QUILLON_API void RasterRGB_MakeRGBParam(RasterRGBParam *param, int32_t componentBits,
                                        uint32_t mask);

/** @} */

/** @name Conversion of rectangles
 *
 * Line increments and coordinates are unsigned.  Rows: rounded, except where
 * the layouts are equal and from a palette to 32 bits, where they are exact.
 * Where layouts differ, the two rectangles must not overlap: the result is
 * unspecified then.
 *
 * From 15, 16 and 24 the alpha of a 32-bit pixel is 255; from a palette and
 * from 32 it goes along.
 *
 * Depths are looked at before anything else, so a wrong one is a Panic also for
 * an empty rectangle.
 * @{
 */

/** Converts a rectangle from one layout to another.
 *
 * @param dstDepth  3, 6, 8, 15, 16, 24 or 32
 * @param srcDepth  15, 16, 24 or 32; or the same as dstDepth, which is a plain
 *                  copy; or at most 8 with pseudoColor, one byte an index
 * @param palette   must cover every index in the rectangle
 */
QUILLON_API void Raster_ConvertPixels(uint8_t *dstBuffer, uint32_t dstLineIncrement,
                                      int32_t dstDepth, const uint8_t *srcBuffer,
                                      uint32_t srcLineIncrement, int32_t srcDepth, bool pseudoColor,
                                      const uint32_t *palette, uint32_t srcX, uint32_t srcY,
                                      uint32_t dstX, uint32_t dstY, uint32_t width,
                                      uint32_t height);

/** Converts a rectangle of any source layout to 32 bits.
 *
 * @param srcDepth  15, 16, 24 or 32, or at most 8 with pseudoColor
 */
QUILLON_API void Raster_ConvertPixelsTo32(uint8_t *dstBuffer, uint32_t dstLineIncrement,
                                          const uint8_t *srcBuffer, uint32_t srcLineIncrement,
                                          int32_t srcDepth, bool pseudoColor,
                                          const uint32_t *palette, uint32_t srcX, uint32_t srcY,
                                          uint32_t dstX, uint32_t dstY, uint32_t width,
                                          uint32_t height);

/** Converts a rectangle of 32-bit pixels to any layout.
 *
 * @param dstDepth  3, 6, 8, 15, 16, 24 or 32
 */
QUILLON_API void Raster_ConvertPixelsFrom32(uint8_t *dstBuffer, uint32_t dstLineIncrement,
                                            int32_t dstDepth, const uint8_t *srcBuffer,
                                            uint32_t srcLineIncrement, uint32_t srcX, uint32_t srcY,
                                            uint32_t dstX, uint32_t dstY, uint32_t width,
                                            uint32_t height);

/** Expands palette indices to whole palette entries, top byte included.
 *
 * Rows: exact.
 */
QUILLON_API void Raster_ConvertIndexTo32(uint8_t *dstBuffer, uint32_t dstLineIncrement,
                                         const uint8_t *srcBuffer, uint32_t srcLineIncrement,
                                         const uint32_t *palette, uint32_t srcX, uint32_t srcY,
                                         uint32_t dstX, uint32_t dstY, uint32_t width,
                                         uint32_t height);

/** Copies a rectangle between surfaces of one layout; overlap is safe as in
 * Raster_RectCopy.
 *
 * Rows: exact.
 *
 * @param depth  not checked: 3 and 6 are one byte a pixel, 15 is two, anything
 *               else depth / 8, truncated; 0 or less copies nothing
 */
QUILLON_API void RasterCopyPixels(uint8_t *dstBuffer, uint32_t dstLineIncrement,
                                  const uint8_t *srcBuffer, uint32_t srcLineIncrement,
                                  int32_t depth, uint32_t srcX, uint32_t srcY, uint32_t dstX,
                                  uint32_t dstY, uint32_t width, uint32_t height);

/** @} */

/** @name Scaling
 * @{
 */

/** Resamples a 32-bit image into a rectangle of another.
 *
 * All four channels of a pixel are treated alike.  Each axis is resampled by
 * itself: with filter 0 by the nearest sample; otherwise it is copied at factor
 * 1, interpolated when it grows, averaged when it shrinks.  Destination pixel 0
 * lies at source position 0, and only the rectangle is written: scaling a part
 * writes there exactly what scaling the whole does.
 *
 * The arithmetic is integer and the same on every processor.  Weights are 8
 * bits wide and products are truncated, so an interpolated or averaged value
 * may come out one or two levels low.  A shrink by more than 32 averages only
 * the first 32 rows of each span, and comes out darker accordingly.
 *
 * Where rows are mixed (filtered, at a vertical factor other than 1), takes at
 * most one block of scratch memory for the call: a few destination rows, 33 at
 * most.
 *
 * Rows: exact; the line increments may be negative, srcLineIncrement may be 0.
 *
 * @param dstWidth, dstHeight  size of the destination; only tested, at most 32767
 * @param left, top, right, bottom  the rectangle to write, right and bottom
 *                exclusive, inside the destination; an empty one writes nothing
 * @param srcWidth, srcHeight  size of the source, at most 32767; the images
 *                must not overlap
 * @param scaleX, scaleY  destination pixels per source pixel, above 1/32767 and
 *                at most 65536
 * @param filter  0 for nearest sampling, anything else for filtered
 * @return 1 when the arguments are acceptable, also when there was nothing to
 *         do; 0, with nothing written, when a size or factor is out of range or
 *         the scratch memory cannot be had
 */
QUILLON_API uint32_t Raster_Scale(uint8_t *dstBuffer, int32_t dstLineIncrement, uint32_t dstWidth,
                                  uint32_t dstHeight, int32_t left, int32_t top, int32_t right,
                                  int32_t bottom, const uint8_t *srcBuffer,
                                  int32_t srcLineIncrement, uint32_t srcWidth, uint32_t srcHeight,
                                  double scaleX, double scaleY, uint32_t filter);

/** Maps a rectangle of source coordinates to the destination pixels that depend
 * on it when the source is scaled: scaled, grown by one source pixel (at least
 * one destination pixel) on each side, and cut to the scaled image.
 *
 * left and top have no upper limit, right and bottom no lower one.  Factors that
 * are infinite or no number leave the rectangle as it is.
 *
 * @param rect  in source coordinates; changed in place to destination ones
 */
QUILLON_API void Raster_ScaleSrcCoordinates(Rect *rect, uint32_t srcWidth, uint32_t srcHeight,
                                            double scaleX, double scaleY);

/** @} */

/** @name Rectangle lists
 *
 * A region of pixels in a record of fixed size, without allocation.  It may lie
 * anywhere and be copied; all-zero memory is the empty region.
 *
 * A list that comes out of Raster_AddRect or Raster_SubRect is in normal form:
 *   - at most 15 entries are in use.  They stand first; the rest is all zero.
 *   - They are ordered by y, then by x.
 *   - They do not overlap, and within a row they do not touch either.
 *   - Each runs down as far as the rows hold a span with exactly its left and
 *     right edges.  So stacked rectangles of equal edges are one entry, and
 *     others never are.
 * One region has one normal form: two such lists hold the same pixels exactly
 * when their bytes are equal.  (The first rectangle added to an empty list is
 * stored without touching the other entries.)
 *
 * A list may be filled by hand, in any order, with overlaps, and with all 16
 * entries; the next call brings it to normal form.  The first entry of a width
 * below 1 ends a list, and one that starts with an entry of a height below 1 is
 * empty.
 *
 * Right and bottom edges should stay within int32_t.  An edge beyond it wraps, and
 * such an entry as a rule covers nothing.
 * @{
 */

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

/** Makes a list the empty region. */
QUILLON_API void Raster_ClearRectList(RasterRectList *list);

/** Adds a rectangle to a region.
 *
 * A region of more than 15 entries in normal form is replaced by its bounding
 * box: a single entry, which covers pixels that were never added.  Should even
 * the box be wider or higher than int32_t can tell, the list stays as it was.
 *
 * @param width, height  not negative: a Panic with the list as it was, unless
 *                       the other one is 0
 * @return the number of pixels of the region, modulo 2^32; 0 with the list as it
 *         was when width or height is 0, or when the box cannot be stored
 */
QUILLON_API uint32_t Raster_AddRect(RasterRectList *list, int32_t x, int32_t y, int32_t width,
                                    int32_t height);

/** Cuts a rectangle out of a region.
 *
 * A negative width or height cuts nothing.
 *
 * A region of more than 15 entries in normal form cannot be stored: the list
 * stays as it was, still holding the rectangle, and the result is 0.  A result
 * of 0 with a list that is not empty thus says that the cut was not made (or
 * that there was none to make, with a width or height of 0).
 *
 * A list filled by hand whose 16 entries make up 16 spans in one row is a Panic,
 * with the list as it was, when one of them would have to be split.
 *
 * @return the number of pixels of the region, modulo 2^32; 0 with the list as it
 *         was when width or height is 0, or when the region cannot be stored
 */
QUILLON_API uint32_t Raster_SubRect(RasterRectList *list, int32_t x, int32_t y, int32_t width,
                                    int32_t height);

/** @} */

QUILLON_END_DECLS

#endif /* QUILLON_RASTER_H */
