/** @file rasterConvert.h
 *
 * Pixel formats, and conversion between them.  Part of raster.h, which includes this
 * header and states the conventions.
 *
 * A pixel format is named by its depth:
 *
 * | depth | bytes | red      | green    | blue     | rest, byte order                |
 * |-------|-------|----------|----------|----------|---------------------------------|
 * | 3     | 1     | 0x04     | 0x20     | 0x80     | written as 0                    |
 * | 6     | 1     | 0x30     | 0x0C     | 0x03     | written as 0                    |
 * | 8     | 1     | 0x07     | 0x38     | 0xC0     | none                            |
 * | 15    | 2     | 0x7C00   | 0x03E0   | 0x001F   | ignored, written as 0           |
 * | 16    | 2     | 0xF800   | 0x07E0   | 0x001F   | none                            |
 * | 24    | 3     | 0xFF0000 | 0x00FF00 | 0x0000FF | none; B G R in memory           |
 * | 32    | 4     | 0xFF0000 | 0x00FF00 | 0x0000FF | alpha on top; B G R A in memory |
 *
 * A channel is narrowed by dropping its low bits and widened by repeating its top bits
 * below itself.  There is no rounding and no dithering.
 *
 * With pseudoColor, source pixels are one-byte indices into a palette: an array of 32-bit
 * pixels that the caller owns.  It must cover every index in use; entries below the
 * lowest of these, or above the highest, are not read.  Without pseudoColor the palette
 * is not read and may be null.  No destination has a palette.
 */
#ifndef QUILLON_RASTER_CONVERT_H
#define QUILLON_RASTER_CONVERT_H

#include <quillon/export.h>

#include <stdbool.h>
#include <stdint.h>

QUILLON_BEGIN_DECLS

/** @name Modes and single pixels
 * @{
 */

/** Tests whether a surface format is supported: depth 24 in 24 or 32 bits, depth 15 or
 * 16 in 16 bits, or with pseudoColor any depth in 8 bits.
 *
 * @param depth         significant colour bits of a pixel
 * @param bitsPerPixel  bits of storage of a pixel
 * @param pseudoColor   whether pixels are palette indices
 */
QUILLON_API bool Raster_IsModeReasonable(int32_t depth, int32_t bitsPerPixel, bool pseudoColor);

/** Converts one pixel value.
 *
 * The top byte of a 24-bit or 32-bit result is 0 from depths 15 and 16; from 24, 32 and
 * a palette it is that of the source value.  Between equal depths the value is returned
 * unchanged.
 *
 * @param pixel        the value, in the low bits; with pseudoColor an index, which is not
 *                     cut to 8 bits
 * @param srcDepth     15, 16, 24 or 32, with pseudoColor 8; anything else is a Warning and
 *                     a Panic
 * @param dstDepth     one of the seven formats; anything else is a Warning and a Panic
 * @param pseudoColor  whether pixel is a palette index
 * @param palette      the palette; only read
 */
QUILLON_API uint32_t Raster_ConvertOnePixel(uint32_t pixel, int32_t srcDepth, int32_t dstDepth,
                                            bool pseudoColor, const uint32_t *palette);

/** How to place a colour component in a channel of a pixel, modulo 2^32:
 *
 *     ((component * multiplier) >> shift) & mask
 */
typedef struct RasterRGBParam {
    uint32_t multiplier;
    uint32_t shift;
    uint32_t mask;
} RasterRGBParam;

/** Computes how to place a colour component in a channel.
 *
 * A component is truncated to a narrower channel and repeated to fill a wider one.
 * Nothing is checked.
 *
 * @param param          output
 * @param componentBits  bits of the component, 1 to 31
 * @param mask           the channel: the lowest run of set bits, other bits are ignored;
 *                       neither 0 nor all ones, and the length of the run, rounded up to
 *                       a multiple of componentBits, at most 31
 */
QUILLON_API void RasterRGB_MakeRGBParam(RasterRGBParam *param, int32_t componentBits,
                                        uint32_t mask);

/** @} */

/** @name Rectangles
 *
 * Overlap: where the formats differ the rectangles must not overlap.  If they do, the
 * result is unspecified; still nothing outside them is read or written.
 *
 * Stride: rounded, except between equal formats and in Raster_ConvertIndexTo32, where it
 * is exact.  Strides and coordinates are unsigned.
 *
 * Alpha: a 32-bit destination gets 255 from depths 15, 16 and 24, the alpha of the source
 * from 32, and the top byte of the entry from a palette.
 *
 * Depths are checked first: an invalid one is a Warning and a Panic also for an empty
 * rectangle.
 * @{
 */

/** Converts a rectangle from one pixel format to another.
 *
 * @param dstBuffer         pixel (0, 0) of the destination
 * @param dstLineIncrement  its stride
 * @param dstDepth          3, 6, 8, 15, 16, 24 or 32
 * @param srcBuffer         pixel (0, 0) of the source; only read
 * @param srcLineIncrement  its stride
 * @param srcDepth          15, 16, 24 or 32; or dstDepth, which makes this a call of
 *                          RasterCopyPixels; with pseudoColor any value up to 8
 * @param pseudoColor       whether source pixels are palette indices
 * @param palette           the palette; only read
 * @param srcX, srcY        left column and top row in the source
 * @param dstX, dstY        left column and top row in the destination
 * @param width, height     pixels and rows
 */
QUILLON_API void Raster_ConvertPixels(uint8_t *dstBuffer, uint32_t dstLineIncrement,
                                      int32_t dstDepth, const uint8_t *srcBuffer,
                                      uint32_t srcLineIncrement, int32_t srcDepth, bool pseudoColor,
                                      const uint32_t *palette, uint32_t srcX, uint32_t srcY,
                                      uint32_t dstX, uint32_t dstY, uint32_t width,
                                      uint32_t height);

/** Raster_ConvertPixels to 32 bits.
 *
 * @param dstBuffer         pixel (0, 0) of the destination
 * @param dstLineIncrement  its stride
 * @param srcBuffer         pixel (0, 0) of the source; only read
 * @param srcLineIncrement  its stride
 * @param srcDepth          15, 16, 24 or 32; with pseudoColor any value up to 8
 * @param pseudoColor       whether source pixels are palette indices
 * @param palette           the palette; only read
 * @param srcX, srcY        left column and top row in the source
 * @param dstX, dstY        left column and top row in the destination
 * @param width, height     pixels and rows
 */
QUILLON_API void Raster_ConvertPixelsTo32(uint8_t *dstBuffer, uint32_t dstLineIncrement,
                                          const uint8_t *srcBuffer, uint32_t srcLineIncrement,
                                          int32_t srcDepth, bool pseudoColor,
                                          const uint32_t *palette, uint32_t srcX, uint32_t srcY,
                                          uint32_t dstX, uint32_t dstY, uint32_t width,
                                          uint32_t height);

/** Raster_ConvertPixels from 32 bits.
 *
 * @param dstBuffer         pixel (0, 0) of the destination
 * @param dstLineIncrement  its stride
 * @param dstDepth          3, 6, 8, 15, 16, 24 or 32
 * @param srcBuffer         pixel (0, 0) of the source; only read
 * @param srcLineIncrement  its stride
 * @param srcX, srcY        left column and top row in the source
 * @param dstX, dstY        left column and top row in the destination
 * @param width, height     pixels and rows
 */
QUILLON_API void Raster_ConvertPixelsFrom32(uint8_t *dstBuffer, uint32_t dstLineIncrement,
                                            int32_t dstDepth, const uint8_t *srcBuffer,
                                            uint32_t srcLineIncrement, uint32_t srcX, uint32_t srcY,
                                            uint32_t dstX, uint32_t dstY, uint32_t width,
                                            uint32_t height);

/** Replaces one-byte palette indices by whole 32-bit palette entries, top byte included.
 *
 * Stride: exact.
 *
 * @param dstBuffer         pixel (0, 0) of the destination, 32 bits
 * @param dstLineIncrement  its stride
 * @param srcBuffer         pixel (0, 0) of the source, one byte each; only read
 * @param srcLineIncrement  its stride
 * @param palette           the palette; only read
 * @param srcX, srcY        left column and top row in the source
 * @param dstX, dstY        left column and top row in the destination
 * @param width, height     pixels and rows
 */
QUILLON_API void Raster_ConvertIndexTo32(uint8_t *dstBuffer, uint32_t dstLineIncrement,
                                         const uint8_t *srcBuffer, uint32_t srcLineIncrement,
                                         const uint32_t *palette, uint32_t srcX, uint32_t srcY,
                                         uint32_t dstX, uint32_t dstY, uint32_t width,
                                         uint32_t height);

/** Copies a rectangle between surfaces of one pixel format.
 *
 * Overlap: allowed, as in Raster_RectCopy.
 *
 * Stride: exact.
 *
 * @param dstBuffer         pixel (0, 0) of the destination
 * @param dstLineIncrement  its stride
 * @param srcBuffer         pixel (0, 0) of the source; only read
 * @param srcLineIncrement  its stride
 * @param depth             not checked; a pixel has 1 byte at depths 3 and 6, 2 at 15, and
 *                          depth / 8, truncated, at any other depth; where that is 0 or
 *                          less nothing is copied
 * @param srcX, srcY        left column and top row in the source
 * @param dstX, dstY        left column and top row in the destination
 * @param width, height     pixels and rows
 */
QUILLON_API void RasterCopyPixels(uint8_t *dstBuffer, uint32_t dstLineIncrement,
                                  const uint8_t *srcBuffer, uint32_t srcLineIncrement,
                                  int32_t depth, uint32_t srcX, uint32_t srcY, uint32_t dstX,
                                  uint32_t dstY, uint32_t width, uint32_t height);

/** @} */

QUILLON_END_DECLS

#endif /* QUILLON_RASTER_CONVERT_H */
