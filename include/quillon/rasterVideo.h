/** @file rasterVideo.h
 *
 * Video: conversion of YUV frames to RGB, and colour keying.  Part of raster.h, which
 * includes this header and states the conventions.
 */
#ifndef QUILLON_RASTER_VIDEO_H
#define QUILLON_RASTER_VIDEO_H

#include <quillon/export.h>

#include <stdint.h>

QUILLON_BEGIN_DECLS

/** @name YUV frames
 *
 * A frame is one block of memory without padding.  Its size follows from ew and eh, the
 * width and height rounded up to even numbers:
 *
 * | format | bytes           | content                                            |
 * |--------|-----------------|----------------------------------------------------|
 * | YUY2   | ew * height * 2 | interleaved: Y0 U Y1 V for two pixels of a row     |
 * | UYVY   | ew * height * 2 | interleaved: U Y0 V Y1 for two pixels of a row     |
 * | YV12   | ew * eh * 3 / 2 | planar: Y of ew by eh; V, then U of ew/2 by eh/2   |
 *
 * In YV12 one sample of V and one of U belong to a block of 2 by 2 pixels.
 * @{
 */

/** Frame formats: the four characters of the name, the first one in the low byte. */
typedef enum RasterVideoFormat {
    RASTER_VIDEO_YUY2 = 0x32595559,
    RASTER_VIDEO_UYVY = 0x59565955,
    RASTER_VIDEO_YV12 = 0x32315659
} RasterVideoFormat;

/** Converts a frame to packed RGB pixels.
 *
 * With c = Y - 16, the shifts rounding down and the results clamped to 0..255:
 *
 *     low  = (298 * c + 409 * (U - 128) + 128) >> 8
 *     mid  = (298 * c - 208 * (U - 128) - 100 * (V - 128) + 128) >> 8
 *     high = (298 * c + 516 * (V - 128) + 128) >> 8
 *
 * **U and V are exchanged**, compared with RasterRGB_YUVtoBGRX and with other programs: red,
 * (81, 90, 240), gives high 255, mid 63, low 15.  A frame with U and V exchanged gives the
 * right colours, those of that function but rounded, with red in the low field and blue in
 * the high one.  So for right colours pass I420 as YV12, YVYU as YUY2 and VYUY as UYVY, and
 * take the output for R G B; or exchange red and blue of it.  Surface::copyVideo of
 * quillon.hpp has the right colours for each format.
 *
 * | bppdepth | bytes | high   | mid    | low    | rest                 |
 * |----------|-------|--------|--------|--------|----------------------|
 * | 15       | 2     | 0xF800 | 0x07C0 | 0x003E | bit 0, written as 0  |
 * | 16       | 2     | 0xF800 | 0x07E0 | 0x001F | none                 |
 * | 24       | 3     | byte 2 | byte 1 | byte 0 | none                 |
 * | 32       | 4     | byte 2 | byte 1 | byte 0 | byte 3, written as 0 |
 *
 * A field is narrowed by dropping its low bits.  Depth 15 differs from the format of that
 * depth in rasterConvert.h: its fields are one bit higher.
 *
 * The rows of the output are contiguous.  A YUY2 or UYVY frame is read as
 * width * height / 2 pairs of pixels without regard to rows, so the last of an odd number
 * of pixels is not written.  Of a YV12 frame, the last column of an odd width and the last
 * row of an odd height are not written.
 *
 * An unknown depth or format writes nothing; the first of each in the process is reported
 * through Log.  The depth is checked first.
 *
 * Overlap: the frame and the output must not overlap; this is not checked.
 *
 * @param srcBuffer      the frame; only read
 * @param dstBuffer      width * height pixels
 * @param width, height  size in pixels
 * @param format         a RasterVideoFormat
 * @param bppdepth       15, 16, 24 or 32
 */
QUILLON_API void Raster_YUVtoRGB(const uint8_t *srcBuffer, uint8_t *dstBuffer, uint32_t width,
                                 uint32_t height, uint32_t format, int32_t bppdepth);

/** Converts one YUV triple to a 32-bit pixel whose alpha is 0.
 *
 * With t = (y - 16) * 298, d = u - 128 and e = v - 128, modulo 2^32, the shifts rounding
 * down and the results clamped to 0..255:
 *
 *     red   = (t + 409 * e) >> 8
 *     green = (t - 100 * d - 208 * e) >> 8
 *     blue  = (t + 516 * d) >> 8
 *
 * Unlike in Raster_YUVtoRGB there is no rounding term: white, (235, 128, 128), gives
 * 0x00FEFEFE.
 *
 * @param y, u, v  the triple; any values
 * @return 0x00RRGGBB, in memory B G R 0
 */
QUILLON_API uint32_t RasterRGB_YUVtoBGRX(int32_t y, int32_t u, int32_t v);

/** @} */

/** @name Colour key
 * @{
 */

/** Composes an overlay and a background: a pixel comes from the overlay where the key
 * surface has the key colour, otherwise from the background.
 *
 * Every pixel of the rectangle is written, all four bytes of it.  The rectangle is at
 * (x, y) on all surfaces except the overlay, where it is at (0, 0).
 *
 * Overlap: dstBuffer may be background.  Any other overlap gives the result of processing
 * the rows from top to bottom and each row from left to right, where a pixel is read from
 * the other surfaces before it is written.
 *
 * Stride: exact.
 *
 * @param background               pixel (0, 0) of the background, 32 bits; only read
 * @param dstBuffer                pixel (0, 0) of the destination, 32 bits
 * @param overlay                  pixel (0, 0) of the overlay, 32 bits; only read
 * @param keySurface               pixel (0, 0) of the key surface; only read
 * @param backgroundLineIncrement  stride of the background
 * @param dstLineIncrement         stride of the destination
 * @param overlayLineIncrement     stride of the overlay
 * @param keyLineIncrement         stride of the key surface
 * @param key                      the key colour: at keyDepth 32 its low 24 bits are
 *                                 compared, otherwise all 32 with the zero-extended pixel
 * @param x, y                     left column and top row
 * @param width, height            pixels and rows
 * @param keyDepth                 bits per pixel of the key surface: 32 or 16; anything
 *                                 else means 8
 */
QUILLON_API void Raster_ApplyColorKey(const uint8_t *background, uint8_t *dstBuffer,
                                      const uint8_t *overlay, const uint8_t *keySurface,
                                      int32_t backgroundLineIncrement, int32_t dstLineIncrement,
                                      int32_t overlayLineIncrement, int32_t keyLineIncrement,
                                      uint32_t key, uint32_t x, uint32_t y, uint32_t width,
                                      uint32_t height, uint32_t keyDepth);

/** @} */

QUILLON_END_DECLS

#endif /* QUILLON_RASTER_VIDEO_H */
