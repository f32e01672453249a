/** @file raster.h
 *
 * Raster operations on surfaces in ordinary memory.
 *
 * This header declares fill, copy, blend, raster operations and bit expansion, and
 * includes the rest of the family.  Its conventions hold for all of it.
 *
 * **Surfaces.**  A surface is not a record.  It is passed as the address of its pixel
 * (0, 0), a stride, and a pixel size or depth.  The stride is the distance in bytes
 * from a row to the next; it is the argument lineIncrement, and may be negative where
 * its type is signed.  Pixel (x, y) starts at
 *
 *     buffer + y * lineIncrement + x * bytesPerPixel
 *
 * computed at pointer width.  No alignment is required.
 *
 * **Byte order.**  Pixels are little-endian: a 24-bit pixel is B G R in memory, a
 * 32-bit pixel B G R A.  If red and blue look swapped, the pixels came from a library
 * that stores red first.
 *
 * **Memory.**  Nothing is clipped.  A rectangle must lie inside memory that the caller
 * provides; no byte outside it is read or written.  Pointers are not checked for null,
 * but an empty rectangle accesses no memory.  No function keeps a pointer, and none
 * allocates except Raster_Scale and Raster_ScaleCursor.
 *
 * **Strides that are not a multiple of the pixel size.**  Where the rows of a rectangle
 * then lie differs by function.  Each states one of:
 *   - exact: every row where the formula above puts it;
 *   - rounded after the first row: the first row where the formula puts it, each
 *     later row by a rounded stride further on;
 *   - rounded: the formula with a rounded stride, for all rows.
 *
 * To round is to take the largest multiple of the pixel size that is not above the
 * stride, at 2 and 4 bytes per pixel.  At 1 and 3 bytes per pixel every stride is
 * exact.
 *
 * **Errors.**  Where a function documents a Panic (see hearth/hearth.h), that argument
 * is a programming error.  It is reported before any memory is written unless the
 * function says otherwise.
 *
 * **Threads.**  No function has state, except that Raster_YUVtoRGB logs each kind of
 * failure once per process.  Calls may run at once on separate memory.
 */
#ifndef QUILLON_RASTER_H
#define QUILLON_RASTER_H

#include <quillon/export.h>
#include <quillon/rasterConvert.h>
#include <quillon/rasterCursor.h>
#include <quillon/rasterRectList.h>
#include <quillon/rasterScale.h>
#include <quillon/rasterVideo.h>

#include <stdint.h>

QUILLON_BEGIN_DECLS

/** @name Fill, copy, blend
 * @{
 */

/** Fills a rectangle with one pixel value.
 *
 * Stride: rounded after the first row.
 *
 * @param frameBuffer    pixel (0, 0) of the surface
 * @param lineIncrement  its stride
 * @param bytesPerPixel  1 to 4; anything else is a Warning and a Panic, also for an
 *                       empty rectangle
 * @param pixel          the value; its low bytesPerPixel bytes are stored, lowest first
 * @param x, y           left column and top row
 * @param width, height  pixels and rows
 */
QUILLON_API void Raster_RectFill(uint8_t *frameBuffer, int32_t lineIncrement, int32_t bytesPerPixel,
                                 uint32_t pixel, uint32_t x, uint32_t y, uint32_t width,
                                 uint32_t height);

/** Copies a rectangle between two surfaces or within one.
 *
 * Overlap: on one surface the result is that of a copy through a temporary buffer.
 * Rectangles that overlap on surfaces of different strides are copied row by row, from
 * the last row when srcY < dstY, otherwise from the first.
 *
 * Stride: exact.
 *
 * @param dstBuffer         pixel (0, 0) of the destination
 * @param dstLineIncrement  its stride
 * @param srcBuffer         pixel (0, 0) of the source; only read
 * @param srcLineIncrement  its stride
 * @param bytesPerPixel     any number of bytes, not checked; 0 or less copies nothing
 * @param srcX, srcY        left column and top row in the source
 * @param dstX, dstY        left column and top row in the destination
 * @param width, height     pixels and rows
 */
QUILLON_API void Raster_RectCopy(uint8_t *dstBuffer, int32_t dstLineIncrement,
                                 const uint8_t *srcBuffer, int32_t srcLineIncrement,
                                 int32_t bytesPerPixel, uint32_t srcX, uint32_t srcY, uint32_t dstX,
                                 uint32_t dstY, uint32_t width, uint32_t height);

/** Sets the alpha byte of 32-bit pixels and leaves their colour.
 *
 * Stride: exact.
 *
 * @param frameBuffer    pixel (0, 0) of the surface
 * @param lineIncrement  its stride
 * @param alpha          the new alpha byte
 * @param x, y           left column and top row
 * @param width, height  pixels and rows
 */
QUILLON_API void Raster_RectFillAlpha(uint8_t *frameBuffer, int32_t lineIncrement, uint8_t alpha,
                                      uint32_t x, uint32_t y, uint32_t width, uint32_t height);

/** Blends premultiplied 32-bit pixels over 32-bit pixels.
 *
 * For each of B, G and R, with the quotient truncated:
 *
 *     dst = min(255, src + dst * (255 - srcAlpha) / 255)
 *
 * The alpha byte of the destination keeps its value.
 *
 * Overlap: the result is that of processing the rows from top to bottom and each row
 * from left to right, where both pixels are read before the destination is written.
 *
 * Stride: exact.
 *
 * @param dstBuffer         pixel (0, 0) of the destination
 * @param dstX, dstY        left column and top row in the destination
 * @param dstLineIncrement  its stride
 * @param srcBuffer         pixel (0, 0) of the source; only read
 * @param srcX, srcY        left column and top row in the source
 * @param srcLineIncrement  its stride
 * @param width, height     pixels and rows
 */
QUILLON_API void Raster_AlphaBlendOver(uint8_t *dstBuffer, uint32_t dstX, uint32_t dstY,
                                       int32_t dstLineIncrement, const uint8_t *srcBuffer,
                                       uint32_t srcX, uint32_t srcY, int32_t srcLineIncrement,
                                       uint32_t width, uint32_t height);

/** @} */

/** @name Raster operations
 *
 * A raster operation combines S, the source, and D, the destination, bit by bit; the
 * result replaces D.  A code above 15 does nothing, as RASTER_ROP_NOOP does.
 * @{
 */

/** The sixteen raster operations.
 *
 * A code is the truth table of its operation: the result for the bits s of S and d of D
 * is bit 3 - (2 * s + d) of the code.
 */
typedef enum RasterRop {
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
} RasterRop;

/** Combines a rectangle with one pixel value.
 *
 * Stride: rounded after the first row.
 *
 * @param frameBuffer    pixel (0, 0) of the surface, D
 * @param lineIncrement  its stride
 * @param bytesPerPixel  1 to 4; anything else is a Warning and a Panic, whatever the
 *                       code and also for an empty rectangle
 * @param pixel          S; its low bytesPerPixel bytes are used
 * @param rop            a RasterRop; all 32 bits count
 * @param x, y           left column and top row
 * @param width, height  pixels and rows
 */
QUILLON_API void Raster_RectROPfill(uint8_t *frameBuffer, int32_t lineIncrement,
                                    int32_t bytesPerPixel, uint32_t pixel, uint32_t rop, uint32_t x,
                                    uint32_t y, uint32_t width, uint32_t height);

/** Combines a rectangle with one of another surface or of the same one.
 *
 * RASTER_ROP_COPY is Raster_RectCopy, with its stride rule and its overlap rule and
 * without a check of bytesPerPixel.  The rest of this comment is about the other codes.
 * RASTER_ROP_CLEAR, RASTER_ROP_INVERT and RASTER_ROP_SET do not read the source.
 *
 * Overlap: within one surface whose stride is a multiple of the pixel size, the result
 * is that of combining the rectangles as they were before the call.  Any other overlap
 * gives the result of this order: rows from the last when srcY < dstY, otherwise from
 * the first; in a row from the right when srcY = dstY and dstX > srcX, otherwise from
 * the left.  A pixel of 1, 2 or 4 bytes is read whole before it is written; one of 3
 * bytes is processed byte by byte in the direction of the row.
 *
 * Stride: rounded after the first row in the above order.  From the last row upwards,
 * it is the negated stride that is rounded.
 *
 * @param dstBuffer         pixel (0, 0) of the destination, D
 * @param dstLineIncrement  its stride
 * @param srcBuffer         pixel (0, 0) of the source, S; only read
 * @param srcLineIncrement  its stride
 * @param bytesPerPixel     1 to 4; anything else is a Warning and a Panic, whatever the
 *                          code (other than RASTER_ROP_COPY) and also for an empty
 *                          rectangle
 * @param srcX, srcY        left column and top row in the source
 * @param rop               a RasterRop; all 32 bits count
 * @param dstX, dstY        left column and top row in the destination
 * @param width, height     pixels and rows
 */
QUILLON_API void Raster_RectROPcopy(uint8_t *dstBuffer, int32_t dstLineIncrement,
                                    const uint8_t *srcBuffer, int32_t srcLineIncrement,
                                    int32_t bytesPerPixel, uint32_t srcX, uint32_t srcY,
                                    uint32_t rop, uint32_t dstX, uint32_t dstY, uint32_t width,
                                    uint32_t height);

/** @} */

/** @name Bit expansion
 *
 * A bitmap has one bit per pixel.  Each of its rows starts on a byte, with the leftmost
 * pixel in bit 7.  The first (width + 7) / 8 bytes of a row are read; the bits behind
 * its last pixel are ignored.
 *
 * There are no coordinates: srcBits is the first byte of the bitmap, dstBuffer the first
 * pixel of the rectangle.  Bitmap and surface must not overlap.
 *
 * Stride: exact, for the bitmap and for the surface.
 * @{
 */

/** Writes one pixel value where a bit is set and another where it is clear.
 *
 * @param srcBits           first byte of the bitmap; only read
 * @param srcLineIncrement  stride of the bitmap
 * @param dstBuffer         first pixel of the rectangle
 * @param dstLineIncrement  stride of the surface
 * @param bytesPerPixel     1 to 4; anything else writes nothing
 * @param width             pixels; below 1 nothing is written
 * @param height            rows
 * @param foreground        value for a set bit; its low bytesPerPixel bytes are stored,
 *                          lowest first
 * @param background        value for a clear bit, stored likewise
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
 * A pixel under a clear bit is neither read nor written: it may be in use by another
 * thread, or lie in memory that is not writable.
 *
 * @param srcBits           first byte of the bitmap; only read
 * @param srcLineIncrement  stride of the bitmap
 * @param dstBuffer         first pixel of the rectangle
 * @param dstLineIncrement  stride of the surface
 * @param bytesPerPixel     1 to 4; anything else writes nothing
 * @param width             pixels; below 1 nothing is written
 * @param height            rows
 * @param pixel             the value; its low bytesPerPixel bytes are stored, lowest
 *                          first
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

QUILLON_END_DECLS

#endif /* QUILLON_RASTER_H */
