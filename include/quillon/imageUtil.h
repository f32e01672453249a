/** @file imageUtil.h
 *
 * Images: reading and writing PNG, writing BMP, composing and scaling.
 *
 * Pixels are packed blue first: B G R in three bytes, B G R A in four.  If red
 * and blue look swapped, the pixels went through a library that has red first.
 *
 * Every function is a plain call on the memory named by its arguments; none
 * keeps a pointer or has any state.  Calls may run at once as long as they do
 * not share an output; an input is only read.
 *
 * A function that cannot do its work gives false.  Nothing is logged, apart
 * from the failures of file output, which go to Log.
 */
#ifndef QUILLON_IMAGE_UTIL_H
#define QUILLON_IMAGE_UTIL_H

#include <quillon/export.h>
#include <quillon/rect.h>

#include <stdbool.h>
#include <stddef.h>
#include <stdint.h>

QUILLON_BEGIN_DECLS

struct DynBuf;         /* the byte buffer of <hearth/hearth.h> */
struct png_struct_def; /* libpng's png_struct; its pointer is png_structp */

/** One palette colour, in the order of a BMP palette. */
typedef struct ImageUtilColor {
    uint8_t blue;
    uint8_t green;
    uint8_t red;
    uint8_t reserved; /**< 0 */
} ImageUtilColor;

enum {
    /** Rows run from the bottom of the picture to the top. */
    IMAGEUTIL_FLAG_BOTTOM_UP = 1
};

/** An image: its size, its format, its palette, and one block of pixels.
 *
 * | depth    | bpp | a pixel in memory                                |
 * |----------|-----|--------------------------------------------------|
 * | 8        | 8   | one byte, an index into palette                  |
 * | 15 or 16 | 16  | little-endian, x1r5g5b5 or r5g6b5 (red on top)   |
 * | 24       | 24  | B G R                                            |
 * | 24       | 32  | B G R A                                          |
 *
 * The record is the caller's.  data is heap memory that belongs to whoever
 * holds the record; ImageUtil_FreeImageData gives it back.  A record may be
 * copied, but only one copy may be freed.
 */
typedef struct ImageInfo {
    uint32_t width;        /**< pixels per row */
    uint32_t height;       /**< rows */
    uint32_t depth;        /**< significant colour bits of a pixel */
    uint32_t bpp;          /**< bits of storage per pixel */
    uint32_t bytesPerLine; /**< bytes from one row to the next */
    uint32_t flags;        /**< IMAGEUTIL_FLAG_BOTTOM_UP; other bits mean nothing */
    uint32_t numColors;    /**< palette entries in use, at most 256 */
    ImageUtilColor palette[256];
    uint8_t *data; /**< row r starts at data + r * bytesPerLine; null for no pixels */
} ImageInfo;

/** @name Reading PNG
 * @{
 */

/** Read flags, or-ed together.  Other bits mean nothing. */
enum {
    /** A file with alpha keeps it: bpp 32.  Otherwise it is dropped: bpp 24. */
    IMAGEUTIL_READ_KEEP_ALPHA = 1,
    /** An RGB file gets an alpha byte of 255: bpp 32.  Otherwise bpp 24. */
    IMAGEUTIL_READ_ADD_ALPHA = 2,
    /** The picture's top row becomes the last row of the block.  The record
     * does not say so: a caller who hands it on to an encoder sets
     * IMAGEUTIL_FLAG_BOTTOM_UP itself.
     */
    IMAGEUTIL_READ_BOTTOM_UP = 4
};

/** Reads a PNG file.  See ImageUtil_ReadPNGBuffer.
 *
 * @return false, with image untouched, when the file cannot be opened or read
 */
QUILLON_API bool ImageUtil_ReadPNG(ImageInfo *image, const char *fileName, uint32_t flags);

/** Decodes a PNG that lies in memory.
 *
 * RGB, RGBA and palette files are read; grey ones, with or without alpha, are
 * refused.  16 bits a channel are reduced to 8.  A palette file gives one byte
 * a pixel; transparency chunks are ignored.  bytesPerLine is a multiple of 4;
 * bytes between the end of a row and the next are not cleared.
 *
 * | image after false          | when                                        |
 * |----------------------------|---------------------------------------------|
 * | untouched                  | image or buffer null, or size 0             |
 * | all zero                   | no PNG signature, no memory, a grey file    |
 * | partly filled, data null   | an error in the header, or no memory for the pixels |
 * | filled, data set           | an error in the pixels; the rows up to it are written |
 *
 * In the last case the caller gives the block back as after a success.
 *
 * @param image   output; overwritten without being freed
 * @param buffer  the PNG, only read
 * @param size    its bytes; nothing behind them is touched
 * @return true with image filled; the caller then owns image->data
 */
QUILLON_API bool ImageUtil_ReadPNGBuffer(ImageInfo *image, const uint8_t *buffer, uint32_t size,
                                         uint32_t flags);

/** Frees image->data and sets it to null.  Does nothing when it is null; no
 * other field changes.
 */
QUILLON_API void ImageUtil_FreeImageData(ImageInfo *image);

/** Where a decoding stands; what libpng's io pointer has to point to while
 * ImageUtilReadPngCallback is installed.
 */
typedef struct ImageUtilPngReadState {
    const uint8_t *buffer; /**< the PNG */
    uint32_t offset;       /**< bytes already handed to libpng */
    uint32_t size;         /**< bytes there are */
} ImageUtilPngReadState;

/** A read function for png_set_read_fn that reads from memory.
 *
 * Copies length bytes to dest.  When fewer are left, calls png_error.
 */
QUILLON_API void ImageUtilReadPngCallback(struct png_struct_def *png, uint8_t *dest, size_t length);

/** @} */

/** @name Writing PNG
 *
 * An image of up to 8 bpp becomes a palette PNG, one of 24 or 16 bpp an RGB
 * PNG, one of 32 bpp an RGB or RGBA PNG.  The top row of the picture comes
 * first, whichever way the rows of the image run.
 *
 * There is no PNG, and the result is false, for an image without pixels, with
 * rows shorter than its pixels, or with a pixel that the palette has no colour
 * for.
 * @{
 */

/** How to encode a PNG. */
typedef struct ImageUtilPngOptions {
    /** 0 (none) to 9 (smallest); anything else leaves libpng's default. */
    int32_t compressionLevel;
    /** Whether a 32-bit image loses its fourth byte (RGB) or keeps it as alpha (RGBA). */
    bool stripAlpha;
} ImageUtilPngOptions;

/** Memory operations of the caller's, in use for the length of one call. */
typedef struct ImageUtilMemOps {
    void *context; /**< first argument of the three functions; not looked at */
    /** A block of size bytes, or null. */
    void *(*alloc)(void *context, size_t size);
    /** Releases a block; must accept null. */
    void (*free)(void *context, void *block);
    /** Resizes a block, or gives null and leaves it; must accept a null block. */
    void *(*realloc)(void *context, void *block, size_t size);
} ImageUtilMemOps;

/** Encodes an image as PNG into a byte buffer.
 *
 * @param image    only read; a null one gives false
 * @param options  null for the default: libpng's compression, alpha stripped
 * @param buffer   output, overwritten without being destroyed; a null one gives
 *                 false.  After true the caller releases it with
 *                 DynBuf_Destroy; after a failure it is empty.
 */
QUILLON_API bool ImageUtil_ConstructPNGBuffer(const ImageInfo *image,
                                              const ImageUtilPngOptions *options,
                                              struct DynBuf *buffer);

/** Encodes an image as PNG into memory that the caller's operations provide.
 *
 * libquillon's own memory comes from the same operations; libpng's does not.
 *
 * @param outData  gets the address of the block on success: the caller's, to be
 *                 released with its own memory operations; not written otherwise
 * @param outSize  gets the number of bytes in it, 0 on failure
 * @param memOps   all four fields; none of outData, outSize and memOps is
 *                 tested for null
 */
QUILLON_API bool ImageUtil_ConstructPNGBufferWithMemOps(const ImageInfo *image,
                                                        const ImageUtilPngOptions *options,
                                                        uint8_t **outData, uint32_t *outSize,
                                                        const ImageUtilMemOps *memOps);

/** The stream that ImageUtilBufferWriteCallback appends to. */
typedef struct ImageUtilPngBuffer {
    uint8_t *data;     /**< the block so far, from memOps */
    uint32_t size;     /**< bytes in it */
    uint32_t capacity; /**< bytes it has room for */
    const ImageUtilMemOps *memOps;
} ImageUtilPngBuffer;

/** A write function for png_set_write_fn whose io pointer is an
 * ImageUtilPngBuffer.  When the block cannot grow, or would pass 4 GiB, it sets
 * size and capacity to 0 and calls png_error; data keeps the block, for the
 * caller to release.
 */
QUILLON_API void ImageUtilBufferWriteCallback(struct png_struct_def *png, uint8_t *source,
                                              size_t length);

/** A write function for png_set_write_fn whose io pointer is a DynBuf.  Calls
 * png_error when the buffer cannot grow.
 */
QUILLON_API void ImageUtilDynBufWriteCallback(struct png_struct_def *png, uint8_t *source,
                                              size_t length);

/** @} */

/** @name Writing BMP and files
 * @{
 */

/** File formats of ImageUtil_WriteImage. */
enum { IMAGEUTIL_FORMAT_PNG = 0, IMAGEUTIL_FORMAT_BMP = 1 };

/** Encodes an image as a BMP file in a byte buffer.
 *
 * An 8-bit image becomes an 8-bit BMP with its palette, everything else a
 * 24-bit one: a fourth byte is dropped, 16 bits are widened.
 *
 * @param image   only read; a null one gives false.  Below 8 bpp, or with
 *                sizes beyond 32 bits, there is no such file: false.
 * @param buffer  output, overwritten without being destroyed; a null one gives
 *                false.  After true the caller releases it with
 *                DynBuf_Destroy.  It is untouched when the image has no BMP
 *                form or memory for its rows cannot be had, and empty when it
 *                could not grow.
 */
QUILLON_API bool ImageUtil_ConstructBMPBuffer(const ImageInfo *image, struct DynBuf *buffer);

/** Writes an image to a file, which is created or overwritten.
 *
 * A failure to open or write it is logged.  A file whose writing failed may be
 * left partly written.
 *
 * @param format  IMAGEUTIL_FORMAT_PNG (with the default options) or
 *                IMAGEUTIL_FORMAT_BMP; any other value is a Panic, before
 *                anything else is looked at
 */
QUILLON_API bool ImageUtil_WriteImage(const ImageInfo *image, const char *fileName,
                                      uint32_t format);

/** Writes an image to a PNG file, as ImageUtil_WriteImage does, with options. */
QUILLON_API bool ImageUtil_WritePNG(const ImageInfo *image, const char *fileName,
                                    const ImageUtilPngOptions *options);

/** @} */

/** @name Composing
 * @{
 */

/** Pastes images onto one new canvas.
 *
 * The canvas is the bounding box of all the images; images[0] alone decides
 * its format.  Later images overwrite earlier ones; nothing is blended.  When
 * the summed areas of the images differ from the canvas (a gap or an overlap)
 * and the format has no alpha of its own, the canvas becomes 32-bit with alpha
 * 255 where an image lies and 0 elsewhere.  8-bit images are then expanded,
 * each through its own palette; without a gap their indices are copied, and
 * the result has no palette.
 *
 * All images must have the format of images[0].  One with null data widens the
 * canvas but paints nothing.
 *
 * @param positions  where the top left pixel of each image goes; may be
 *                   negative.  Painting is clipped to the canvas.
 * @param count      number of images; 0 gives an all-zero result and true
 * @param result     output; flags, numColors and palette are 0; the caller owns
 *                   result->data.  Untouched on failure.
 * @return false when the canvas cannot be had
 */
QUILLON_API bool ImageUtil_Combine(const ImageInfo *images, const RectPoint *positions,
                                   uint32_t count, ImageInfo *result);

/** Cuts a rectangle out of a 32-bit image and scales it.
 *
 * Scaling is filtered (see Raster_Scale).  Of the output size, one side may be
 * left to follow by proportion, truncated; with both left open the crop keeps
 * its size.
 *
 * @param src  32 bits per pixel, whatever its bpp says; only read.  When the
 *             crop is as wide as the image and is not scaled, its rows must lie
 *             end to end.
 * @param srcLeft, srcTop, srcRight, srcBottom  the crop, right and bottom
 *             exclusive; -1 for srcRight or srcBottom means the image's edge
 * @param dstLeft, dstTop  must be 0
 * @param dstRight, dstBottom  the output size; -1 means not given
 * @param result  output; the caller owns result->data.  Untouched on failure.
 * @return false for a crop outside the image or empty, an output size of 0 or
 *         too large (32767 where it is scaled), null pixels, or no memory
 */
QUILLON_API bool ImageUtil_CropAndScaleImage(const ImageInfo *src, int32_t srcLeft, int32_t srcTop,
                                             int32_t srcRight, int32_t srcBottom, int32_t dstLeft,
                                             int32_t dstTop, int32_t dstRight, int32_t dstBottom,
                                             ImageInfo *result);

/** @} */

QUILLON_END_DECLS

#endif /* QUILLON_IMAGE_UTIL_H */
