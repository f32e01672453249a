/** @file rasterVideo.h
 *
 * Video: YUV frames to RGB pixels, and an overlay shown through a key colour.
 * Part of raster.h, which includes it and tells the conventions.
 */
#ifndef QUILLON_RASTER_VIDEO_H
#define QUILLON_RASTER_VIDEO_H

#include <quillon/export.h>

#include <stdint.h>

QUILLON_BEGIN_DECLS

/** @name YUV frames
 *
 * A frame is one block of memory without padding.  evenWidth and evenHeight are
 * its width and height rounded up to even numbers:
 *
 * | format | bytes of the frame               | layout                             |
 * |--------|----------------------------------|------------------------------------|
 * | YUY2   | 2 * evenWidth * height           | two pixels in four bytes: Y0 U Y1 V |
 * | UYVY   | the same                         | two pixels in four bytes: U Y0 V Y1 |
 * | YV12   | evenWidth * evenHeight * 3 / 2   | a plane of Y; one of V, one of U, both of half the
 * width and height |
 * @{
 */

/** Frame formats: the four characters of the name, the first one lowest. */
enum {
    RASTER_VIDEO_YUY2 = 0x32595559,
    RASTER_VIDEO_UYVY = 0x59565955,
    RASTER_VIDEO_YV12 = 0x32315659
};

/** Converts a whole frame to packed RGB pixels.
 *
 * With c = Y - 16, each shift rounding down and each result held to 0 to 255:
 *
 *     low  = (298 * c + 409 * (U - 128) + 128) >> 8
 *     mid  = (298 * c - 208 * (U - 128) - 100 * (V - 128) + 128) >> 8
 *     high = (298 * c + 516 * (V - 128) + 128) >> 8
 *
 * Against RasterRGB_YUVtoBGRX, U and V have changed places: a frame in which they
 * are exchanged gives that function's colours (rounded), with red in the low
 * field and blue in the high one.
 *
 * | bppdepth | bytes | high   | mid    | low    | rest                            |
 * |----------|-------|--------|--------|--------|---------------------------------|
 * | 15       | 2     | 0xF800 | 0x07C0 | 0x003E | bit 0, written as 0             |
 * | 16       | 2     | 0xF800 | 0x07E0 | 0x001F | none                            |
 * | 24       | 3     | byte 2 | byte 1 | byte 0 | none                            |
 * | 32       | 4     | byte 2 | byte 1 | byte 0 | byte 3, written as 0            |
 *
 * A field narrows by dropping its low bits.  Depth 15 is not the layout that
 * the other functions know by that number: it lies one bit higher.
 *
 * The output has no line increment: its rows lie end to end.  So do the pixels
 * of a YUY2 or UYVY frame as they are read, in (width * height) / 2 pairs,
 * whatever the width; the last of an odd number of pixels is not written.  Of a
 * YV12 frame, the last column of an odd width and the last row of an odd height
 * are not written.
 *
 * An unknown depth or format writes nothing; the first one of each in the life
 * of the process is reported to Log.  The depth is looked at first.
 *
 * @param srcBuffer  the frame
 * @param dstBuffer  width * height pixels; must not overlap the frame
 * @param format     RASTER_VIDEO_YUY2, RASTER_VIDEO_UYVY or RASTER_VIDEO_YV12
 * @param bppdepth   15, 16, 24 or 32
 */
QUILLON_API void Raster_YUVtoRGB(const uint8_t *srcBuffer, uint8_t *dstBuffer, uint32_t width,
                                 uint32_t height, uint32_t format, int32_t bppdepth);

/** Converts one YUV triple to a 32-bit pixel whose alpha is 0.
 *
 * With t = (y - 16) * 298, d = u - 128 and e = v - 128, modulo 2^32, each shift
 * rounding down and each result held to 0 to 255:
 *
 *     red   = (t + 409 * e) >> 8
 *     green = (t - 100 * d - 208 * e) >> 8
 *     blue  = (t + 516 * d) >> 8
 *
 * There is no rounding term, as there is in Raster_YUVtoRGB: white, which is
 * (235, 128, 128), comes out as 0x00FEFEFE.
 */
QUILLON_API uint32_t RasterRGB_YUVtoBGRX(int32_t y, int32_t u, int32_t v);

/** @} */

/** @name Colour key
 * @{
 */

/** Composes an overlay and a background by the colours of a third surface.
 *
 * Where the key surface holds the key colour, the pixel comes from the overlay,
 * elsewhere from the background; every pixel of the rectangle is written, with
 * its top byte.  background, dstBuffer and overlay have 32 bits per pixel.  The
 * rectangle lies at (x, y) on all surfaces but the overlay, which is as large
 * as the rectangle and begins with it.
 *
 * dstBuffer may be background.  Where surfaces overlap otherwise, the outcome
 * is that of going through the rows from top to bottom and through each row
 * from left to right, each pixel being read from the other surfaces before it
 * is written.
 *
 * Rows: exact; line increments may be negative.
 *
 * @param key       of which the low 24 bits count at keyDepth 32; otherwise all
 *                  32 bits, so that a key wider than the pixels never matches
 * @param keyDepth  bits per pixel of keySurface: 32, 16, and anything else
 *                  means 8
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
