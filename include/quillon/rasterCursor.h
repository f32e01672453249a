/** @file rasterCursor.h
 *
 * Mouse cursors: their planes, where they lie on the screen, drawing, scaling.
 *
 * A cursor is one 32-bit image with alpha, or two planes, an AND mask and an XOR
 * mask.  The images of a cursor record have 32 bits per pixel and rows of
 * width * 4 bytes, without a gap.
 *
 * Included by raster.h.
 */
#ifndef QUILLON_RASTER_CURSOR_H
#define QUILLON_RASTER_CURSOR_H

#include <quillon/export.h>

#include <stdint.h>

/* C99 has no anonymous members officially, C++ no anonymous structs. */
#if defined(__GNUC__)
#define QUILLON_ANONYMOUS __extension__
#else
#define QUILLON_ANONYMOUS
#endif

QUILLON_BEGIN_DECLS

/** The types of a cursor. */
enum {
    RASTER_CURSOR_ANDXOR = 0, /**< AND and XOR masks */
    RASTER_CURSOR_ALPHA = 1   /**< one image with alpha */
};

/** A cursor.
 *
 * The images of the two types share their place.  A record of the alpha type
 * ends behind alphaImage: nobody who is given one may touch what follows, as it
 * need not be there.
 */
typedef struct RasterCursor {
    uint32_t type;     /**< RASTER_CURSOR_ANDXOR or RASTER_CURSOR_ALPHA */
    uint32_t hotspotX; /**< column of the hot spot inside the image */
    uint32_t hotspotY; /**< row of the hot spot inside the image */
    uint32_t width;    /**< in pixels */
    uint32_t height;   /**< in pixels */
    QUILLON_ANONYMOUS union {
        uint8_t *alphaImage; /**< B G R A, colours premultiplied */
        QUILLON_ANONYMOUS struct {
            uint32_t planeInfo0; /**< the caller's; only carried along */
            uint32_t planeInfo1; /**< the caller's; only carried along */
            uint8_t *andImage;   /**< AND mask, 32 bits per pixel */
            uint8_t *xorImage;   /**< XOR mask, 32 bits per pixel */
        };
    };
} RasterCursor;

/** The part of a cursor that is on the screen. */
typedef struct RasterCursorBox {
    uint32_t dstX;   /**< left edge on the screen */
    uint32_t dstY;   /**< top edge on the screen */
    uint32_t width;  /**< visible columns */
    uint32_t height; /**< visible rows */
    uint32_t srcX;   /**< first visible column of the cursor's image */
    uint32_t srcY;   /**< first visible row of the cursor's image */
} RasterCursorBox;

/** The size of a screen, in pixels. */
typedef struct RasterCursorScreen {
    uint32_t width;
    uint32_t height;
} RasterCursorScreen;

/** @name Planes
 *
 * A plane has its rows padded to whole 32-bit words, and no other gap.  In a
 * plane of depth 1, bit 7 of a byte is its leftmost pixel.
 * @{
 */

/** The size of a plane: (width * depth + 31) / 32 * 4 bytes for each row.
 *
 * @param depth  bits per pixel, any number
 * @return bytes; 0xFFFFFFFF, which no plane has, when the size or one of the
 *         intermediate results (width * depth + 31 among them) exceeds 32 bits
 */
QUILLON_API uint32_t Raster_CalculateCursorSize(uint32_t width, uint32_t height, uint32_t depth);

/** Expands a plane of depth 1: all bits of a pixel become 1 where the bit is
 * set, 0 where it is clear.
 *
 * The padding of the output's rows stays as it was.
 *
 * @param depth      of the output; pixels take depth / 8 bytes, truncated, and
 *                   nothing is written where that is not 1 to 4
 * @param bits       the plane of depth 1; must not overlap the output
 * @param dstBuffer  gets the plane
 * @param dstSize    bytes available; less than the plane takes is a Panic.  A
 *                   plane too large for Raster_CalculateCursorSize is not
 *                   written, whatever dstSize is.
 */
QUILLON_API void Raster_ExpandCursorBitPlane(uint32_t width, uint32_t height, uint32_t depth,
                                             const uint8_t *bits, uint8_t *dstBuffer,
                                             uint32_t dstSize);

/** Brings both planes of a cursor to one depth.
 *
 * The output is the AND plane and, directly behind it, the XOR plane; at depth
 * 32 both are what RasterCursor wants.  A plane that has the depth already is
 * copied with its padding, one of depth 1 is expanded as by
 * Raster_ExpandCursorBitPlane, one of another depth is a Panic.  A bad xorDepth
 * is only looked at when the AND plane has been written.
 *
 * @param andData, xorData  the planes, at andDepth and xorDepth; must not
 *                   overlap the output
 * @param dstSize    bytes available; less than both planes take is a Panic.
 *                   Planes that take more than 32 bits tell are not written,
 *                   whatever dstSize is.
 */
QUILLON_API void Raster_ExpandPlanarCursorData(uint32_t width, uint32_t height, uint32_t andDepth,
                                               const uint8_t *andData, uint32_t xorDepth,
                                               const uint8_t *xorData, uint32_t depth,
                                               uint8_t *dstBuffer, uint32_t dstSize);

/** @} */

/** @name Drawing
 * @{
 */

/** Cuts a cursor to the screen.
 *
 * Its image has the top left corner at (x - hotspotX, y - hotspotY), in 32 bits
 * that wrap.  A part of more than 2147483647 columns or rows counts as none.
 *
 * @param cursor  only its hot spot and size are read
 * @param x, y    position of the pointer on the screen
 * @param box     output; untouched when no part is visible
 * @return 1 when some part of the cursor is on the screen, 0 otherwise
 */
QUILLON_API uint32_t Raster_ComputeCursorBox(const RasterCursorScreen *screen,
                                             const RasterCursor *cursor, int32_t x, int32_t y,
                                             RasterCursorBox *box);

/** Composes a cursor over a 32-bit surface.
 *
 * Masks give (surface & andImage) ^ xorImage, over all bits of a pixel.  A
 * cursor of any other type is blended as by Raster_AlphaBlendOver, which leaves
 * the top byte of the surface's pixels as it is.
 *
 * With a composeBuffer the part of the surface under the cursor is copied there,
 * to (0, 0), and the cursor drawn there; the surface is only read then.
 *
 * Rows: exact for the copy and the blend.  Masks take the rows of
 * Raster_RectROPcopy: exact where the line increment is a multiple of 4.
 *
 * @param composeBuffer  a surface of at least the box's size, or null
 * @param composeLineIncrement  ignored without a composeBuffer
 * @param cursor  its images must not overlap the surface drawn to.  One wider
 *                than 536870911 pixels, whose rows no line increment spans, is
 *                not drawn, and nothing is copied.
 * @param box     of Raster_ComputeCursorBox for this cursor and surface
 */
QUILLON_API void Raster_DrawCursor(uint8_t *frameBuffer, int32_t lineIncrement,
                                   uint8_t *composeBuffer, int32_t composeLineIncrement,
                                   const RasterCursor *cursor, const RasterCursorBox *box);

/** @} */

/** @name Scaling
 * @{
 */

/** Makes a cursor of another size.
 *
 * The image is surrounded by pixels that leave the screen unchanged, and both
 * are scaled, an image with alpha filtered, masks by the nearest sample.  The
 * border has max(1 / scale, scale) + 1 pixels of the source, truncated, on each
 * side, so the new cursor is larger than the scaled image, with its hot spot
 * moved by the scaled border.
 *
 * Where Raster_Scale takes no such sizes or factors (see there), the new images
 * have their full size and leave the screen unchanged everywhere.
 *
 * @param cursor  only read; any type but RASTER_CURSOR_ALPHA has masks
 * @param scaleX, scaleY  new pixels per pixel
 * @return the new cursor, of type RASTER_CURSOR_ALPHA or RASTER_CURSOR_ANDXOR;
 *         the caller releases the images and the record, each with free().
 *         Null when memory cannot be had, when a factor is not a number above
 *         0, or when a side passes what can be told: 2147483647 pixels for the
 *         border, 4294967295 for the image within it, 536870911 for the new
 *         image.
 */
QUILLON_API RasterCursor *Raster_ScaleCursor(const RasterCursor *cursor, double scaleX,
                                             double scaleY);

/** @} */

QUILLON_END_DECLS

#undef QUILLON_ANONYMOUS

#endif /* QUILLON_RASTER_CURSOR_H */
