/** @file rasterCursor.h
 *
 * Mouse cursors: the size and expansion of their planes, clipping to the screen, drawing
 * and scaling.  Part of raster.h, which includes this header and states the conventions.
 *
 * A cursor is one 32-bit image with alpha, or two images, an AND mask and an XOR mask.
 * All images of a cursor record have 32 bits per pixel and a stride of width * 4.
 */
#ifndef QUILLON_RASTER_CURSOR_H
#define QUILLON_RASTER_CURSOR_H

#include <quillon/export.h>

#include <stdint.h>

/* Anonymous members are not in C99, anonymous structs not in C++. */
#if defined(__GNUC__)
#define QUILLON_ANONYMOUS __extension__
#else
#define QUILLON_ANONYMOUS
#endif

QUILLON_BEGIN_DECLS

/** The types of a cursor. */
typedef enum RasterCursorType {
    RASTER_CURSOR_ANDXOR = 0, /**< AND and XOR masks */
    RASTER_CURSOR_ALPHA = 1   /**< one image with alpha */
} RasterCursorType;

/** A cursor.
 *
 * The members of the two types share their memory.  A record of the alpha type may end
 * behind alphaImage: what follows must not be accessed.
 */
typedef struct RasterCursor {
    uint32_t type;     /**< a RasterCursorType */
    uint32_t hotspotX; /**< column of the hot spot inside the image */
    uint32_t hotspotY; /**< row of the hot spot inside the image */
    uint32_t width;    /**< in pixels */
    uint32_t height;   /**< in pixels */
    QUILLON_ANONYMOUS union {
        uint8_t *alphaImage; /**< B G R A, colour premultiplied */
        QUILLON_ANONYMOUS struct {
            uint32_t planeInfo0; /**< the caller's; only copied */
            uint32_t planeInfo1; /**< the caller's; only copied */
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
 * The rows of a plane are padded to whole 32-bit words; there is no other padding.  In a
 * plane of depth 1 the leftmost pixel of a byte is in bit 7.
 * @{
 */

/** Computes the size of a plane: height rows of (width * depth + 31) / 32 * 4 bytes, the
 * quotient truncated.
 *
 * @param width, height  size in pixels
 * @param depth          bits per pixel, any number
 * @return bytes; 0xFFFFFFFF, which is no plane's size, when width * depth + 31 or the size
 *         does not fit 32 bits
 */
QUILLON_API uint32_t Raster_CalculateCursorSize(uint32_t width, uint32_t height, uint32_t depth);

/** Expands a plane of depth 1: a set bit becomes a pixel with all bits 1, a clear bit a
 * pixel with all bits 0.
 *
 * The padding of the output's rows is not written.
 *
 * @param width, height  size in pixels
 * @param depth          of the output, whose pixels have depth / 8 bytes, truncated;
 *                       nothing is written where that is not 1 to 4
 * @param bits           the plane of depth 1; only read; must not overlap the output
 * @param dstBuffer      receives the plane
 * @param dstSize        bytes that dstBuffer has; fewer than the plane needs is a Panic.
 *                       A plane whose size does not fit 32 bits is not written, whatever
 *                       dstSize is.
 */
QUILLON_API void Raster_ExpandCursorBitPlane(uint32_t width, uint32_t height, uint32_t depth,
                                             const uint8_t *bits, uint8_t *dstBuffer,
                                             uint32_t dstSize);

/** Writes both planes of a cursor at one depth: the AND plane and, directly behind it, the
 * XOR plane.
 *
 * A plane of the output's depth is copied with its padding; one of depth 1 is expanded as
 * by Raster_ExpandCursorBitPlane; one of any other depth is a Panic.  At depth 32 both
 * planes can be used as images of a RasterCursor.
 *
 * @param width, height  size in pixels
 * @param andDepth       depth of andData
 * @param andData        the AND plane; only read; must not overlap the output
 * @param xorDepth       depth of xorData, checked after the AND plane has been written
 * @param xorData        the XOR plane; only read; must not overlap the output
 * @param depth          of the output
 * @param dstBuffer      receives the planes
 * @param dstSize        bytes that dstBuffer has; fewer than both planes need is a Panic.
 *                       Planes whose size together does not fit 32 bits are not written,
 *                       whatever dstSize is.
 */
QUILLON_API void Raster_ExpandPlanarCursorData(uint32_t width, uint32_t height, uint32_t andDepth,
                                               const uint8_t *andData, uint32_t xorDepth,
                                               const uint8_t *xorData, uint32_t depth,
                                               uint8_t *dstBuffer, uint32_t dstSize);

/** @} */

/** @name Drawing
 * @{
 */

/** Clips a cursor to the screen.
 *
 * The top left pixel of its image is at (x - hotspotX, y - hotspotY), computed in 32 bits
 * with wrapping.  What is left of column 0 or above row 0 is cut off; a width or height
 * above 2147483647 after that counts as 0.
 *
 * @param screen  size of the screen
 * @param cursor  only its hot spot and size are read
 * @param x, y    position of the pointer on the screen
 * @param box     output; unchanged when no part is visible
 * @return 1 when some part of the cursor is visible, 0 otherwise
 */
QUILLON_API uint32_t Raster_ComputeCursorBox(const RasterCursorScreen *screen,
                                             const RasterCursor *cursor, int32_t x, int32_t y,
                                             RasterCursorBox *box);

/** Composes a cursor over a 32-bit surface.
 *
 * A cursor of type RASTER_CURSOR_ANDXOR gives, for all 32 bits of a pixel:
 *
 *     dst = (dst & andImage) ^ xorImage
 *
 * A cursor of any other type is blended by Raster_AlphaBlendOver, which leaves the alpha
 * byte of the destination.
 *
 * With a composeBuffer, the part of the surface under the cursor is copied to its pixel
 * (0, 0) and the cursor is drawn over the copy; the surface is only read.
 *
 * Stride: exact for the copy and the blend; masks follow Raster_RectROPcopy, which is
 * exact at a multiple of 4.
 *
 * @param frameBuffer           pixel (0, 0) of the surface
 * @param lineIncrement         its stride
 * @param composeBuffer         pixel (0, 0) of a surface of at least the size of box, or
 *                              null
 * @param composeLineIncrement  its stride; ignored when composeBuffer is null
 * @param cursor                only read; its images must not overlap the surface that is
 *                              drawn to.  A cursor wider than 536870911 pixels, whose
 *                              stride does not fit int32_t, is not drawn, and nothing is
 *                              copied.
 * @param box                   from Raster_ComputeCursorBox for this cursor and surface
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
 * Each image gets a border of pixels that leave the screen unchanged and is then scaled
 * by Raster_Scale: filtered with alpha, by the nearest sample for masks.  With the
 * maximum truncated, the border on each side has, in source pixels:
 *
 *     border = max(1 / scale, scale) + 1
 *
 * The new size is (size + 2 * border) * scale, rounded up, and the new hot spot is
 * (hotspot + border) * scale, truncated.  The new cursor is thus larger than the scaled
 * image by the scaled border.
 *
 * Where Raster_Scale refuses the sizes or factors, the new images have their full size and
 * leave the screen unchanged everywhere.
 *
 * @param cursor          only read; any type but RASTER_CURSOR_ALPHA has masks
 * @param scaleX, scaleY  new pixels per old pixel
 * @return the new cursor, of type RASTER_CURSOR_ALPHA or RASTER_CURSOR_ANDXOR, whose
 *         images and record the caller releases, each with free().  Null when memory
 *         cannot be allocated, a factor is not a number above 0, or on one axis the
 *         border exceeds 2147483647 pixels, the image with its borders 4294967295 or the
 *         new image 536870911.
 */
QUILLON_API RasterCursor *Raster_ScaleCursor(const RasterCursor *cursor, double scaleX,
                                             double scaleY);

/** @} */

QUILLON_END_DECLS

#undef QUILLON_ANONYMOUS

#endif /* QUILLON_RASTER_CURSOR_H */
