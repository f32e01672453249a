/** @file rasterScale.h
 *
 * Scaling of 32-bit images.  Part of raster.h, which includes this header and states the
 * conventions.
 */
#ifndef QUILLON_RASTER_SCALE_H
#define QUILLON_RASTER_SCALE_H

#include <quillon/export.h>
#include <quillon/rect.h>

#include <stdint.h>

QUILLON_BEGIN_DECLS

/** Scales a 32-bit image into a rectangle of another.
 *
 * Each axis is scaled by itself.  With filter 0 it takes the nearest sample; otherwise it
 * is copied at factor 1, interpolated when it grows and averaged when it shrinks.  All
 * four channels of a pixel are treated alike.  Destination pixel 0 lies at source position
 * 0, and only the rectangle is written: scaling a part writes the same pixels there as
 * scaling the whole.
 *
 * The arithmetic is integer and gives the same result on every processor.  Weights have 8
 * bits and products are truncated, so an interpolated or averaged value can be some levels
 * low: white can become 249.
 *
 * **Dark right edge.**  Where the width shrinks, the last source column enters no average,
 * so the last destination column is darker, alpha included, by the share that it should have
 * had: white becomes 51 at 1280 to 1024 pixels, 126 at 640 to 320, 0 at 100 to 99.  To avoid
 * it, hand over one more column, the last one repeated: srcWidth + 1, with the same factors.
 * Surface::copyScaled of quillon.hpp does so.
 *
 * **Dark reductions.**  A vertical shrink by more than 32 averages only the first 32 rows of each
 * span, divided by the number of all of them, which darkens the result.  Reduce in two steps.
 *
 * Filtered, and at a vertical factor other than 1, the call may allocate one block of
 * scratch memory, of at most 33 rows of the rectangle, which it frees before it returns.
 *
 * Overlap: the images must not overlap; this is not checked.
 *
 * Stride: exact.
 *
 * @param dstBuffer           pixel (0, 0) of the destination
 * @param dstLineIncrement    its stride
 * @param dstWidth, dstHeight its size in pixels, at most 32767; only tested
 * @param left, top           first column and row to write, at least 0
 * @param right, bottom       end of the rectangle, exclusive; must lie inside the
 *                            destination, which is not checked
 * @param srcBuffer           pixel (0, 0) of the source; only read
 * @param srcLineIncrement    its stride; may be 0
 * @param srcWidth, srcHeight its size in pixels, at most 32767
 * @param scaleX, scaleY      destination pixels per source pixel, above 1/32767 and at
 *                            most 65536
 * @param filter              0 for the nearest sample, anything else for filtered
 * @return 1 when sizes and factors are in range, also when the rectangle or an image is
 *         empty; 0, with nothing written, when they are not or when memory cannot be
 *         allocated
 */
QUILLON_API uint32_t Raster_Scale(uint8_t *dstBuffer, int32_t dstLineIncrement, uint32_t dstWidth,
                                  uint32_t dstHeight, int32_t left, int32_t top, int32_t right,
                                  int32_t bottom, const uint8_t *srcBuffer,
                                  int32_t srcLineIncrement, uint32_t srcWidth, uint32_t srcHeight,
                                  double scaleX, double scaleY, uint32_t filter);

/** Computes the destination rectangle that depends on a source rectangle when an image is
 * scaled.
 *
 * That is the scaled rectangle, grown on each side by max(1, scale) destination pixels,
 * left and top raised to 0, right and bottom lowered to the size of the scaled image.
 * left and top have no upper limit, right and bottom no lower one.
 *
 * @param rect                the rectangle, changed in place; unchanged when a factor is
 *                            infinite or NaN
 * @param srcWidth, srcHeight size of the source in pixels
 * @param scaleX, scaleY      destination pixels per source pixel
 */
QUILLON_API void Raster_ScaleSrcCoordinates(Rect *rect, uint32_t srcWidth, uint32_t srcHeight,
                                            double scaleX, double scaleY);

QUILLON_END_DECLS

#endif /* QUILLON_RASTER_SCALE_H */
