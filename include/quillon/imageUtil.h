/** @file imageUtil.h
 *
 * Images: reading and writing PNG, writing BMP, composing and scaling.
 *
 * Pixels are stored blue first: B G R in three bytes, B G R A in four.  If red and blue
 * look swapped, the pixels came from or went to a library that stores red first.
 *
 * No function keeps a pointer or has state.  Calls may run at once as long as they share
 * no output; inputs are only read.  Pointers are not checked for null unless a function
 * says so.
 *
 * A function that fails returns false.  Failures of file output are also reported through
 * Log (see hearth/hearth.h); nothing else is.  libpng's error and warning handlers are left
 * at their defaults: on reading and on writing PNG it prints lines that begin "libpng error:"
 * or "libpng warning:" to standard error, past Log, about what is wrong with a file.
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

/** Flags of an image. */
typedef enum ImageUtilFlag {
    /** The rows run from the bottom of the picture to the top. */
    IMAGEUTIL_FLAG_BOTTOM_UP = 1
} ImageUtilFlag;

/** An image: its size, its format, its palette, and one block of pixels.
 *
 * | depth    | bpp | a pixel in memory                                       |
 * |----------|-----|---------------------------------------------------------|
 * | 8        | 8   | one byte, an index into palette                         |
 * | 15 or 16 | 16  | two bytes, low byte first: see depth in rasterConvert.h |
 * | 24       | 24  | B G R                                                   |
 * | 24       | 32  | B G R A                                                 |
 *
 * Ownership: the pixels of a record that a function of this header has filled are the
 * caller's, to be released with ImageUtil_FreeImageData.  A record may be copied, but only
 * one of the copies may be released.
 */
typedef struct ImageInfo {
    uint32_t width;        /**< pixels per row */
    uint32_t height;       /**< rows */
    uint32_t depth;        /**< significant colour bits of a pixel */
    uint32_t bpp;          /**< bits of storage per pixel */
    uint32_t bytesPerLine; /**< stride: bytes from a row to the next */
    uint32_t flags;        /**< ImageUtilFlag bits; other bits are ignored */
    uint32_t numColors;    /**< palette entries in use, at most 256 */
    ImageUtilColor palette[256];
    uint8_t *data; /**< row r starts at data + r * bytesPerLine; null without pixels */
} ImageInfo;

/** @name Reading PNG
 * @{
 */

/** Flags for reading, combined with |.  Other bits are ignored. */
typedef enum ImageUtilReadFlag {
    /** An RGBA file keeps its alpha: bpp 32.  Without this flag it is dropped: bpp 24. */
    IMAGEUTIL_READ_KEEP_ALPHA = 1,
    /** An RGB file gets an alpha of 255: bpp 32.  Without this flag: bpp 24. */
    IMAGEUTIL_READ_ADD_ALPHA = 2,
    /** The top row of the picture is stored last.  The record's flags stay 0: before the
     * image is written, the caller sets IMAGEUTIL_FLAG_BOTTOM_UP.
     */
    IMAGEUTIL_READ_BOTTOM_UP = 4
} ImageUtilReadFlag;

/** Reads a PNG file, as ImageUtil_ReadPNGBuffer does for the contents of the file.
 *
 * @param image     output; unchanged when the file is empty or cannot be opened or read
 * @param fileName  of the file, which is read up to its size modulo 2^32
 * @param flags     ImageUtilReadFlag bits
 * @return true with image filled, or false
 */
QUILLON_API bool ImageUtil_ReadPNG(ImageInfo *image, const char *fileName, uint32_t flags);

/** Decodes a PNG in memory.
 *
 * RGB, RGBA and palette files are read.  Grey files, with or without alpha, are refused.
 * 16 bits per channel are reduced to 8.  A palette file gives one byte per pixel.
 * Transparency chunks are ignored.
 *
 * Texts, profiles, suggested palettes and the like are neither kept nor inflated: beside
 * the pixels, and libpng's buffers for two rows of them, decoding takes less than 16 MB,
 * whatever is in the file.  Where more than 64 KB of compressed pixels follow behind the
 * picture, they are not inflated either, and whether their stream comes to an end is not
 * looked at.
 *
 * bytesPerLine is a multiple of 4; the padding at the end of a row is not written.
 *
 * | image after false      | cause                                                             |
 * |------------------------|-------------------------------------------------------------------|
 * | unchanged              | image or buffer null, or size 0                                   |
 * | all zero               | not a PNG, a grey one, an error ahead of the pixels, or no memory |
 * | filled, without pixels | no memory for the pixels, or they would exceed 4 GiB              |
 * | filled                 | an error in the pixels, of which a part is written                |
 *
 * Without pixels, bytesPerLine is 0 and data null.  In the last case the caller owns
 * image->data as after a success; what was not written of it is not initialised.
 *
 * @param image   output; overwritten without releasing what it held
 * @param buffer  the PNG; only read
 * @param size    bytes in buffer
 * @param flags   ImageUtilReadFlag bits
 * @return true with image filled, of which the caller owns image->data, or false
 */
QUILLON_API bool ImageUtil_ReadPNGBuffer(ImageInfo *image, const uint8_t *buffer, uint32_t size,
                                         uint32_t flags);

/** Releases image->data with free() and sets it to null; does nothing when it is null.
 * No other field changes.
 */
QUILLON_API void ImageUtil_FreeImageData(ImageInfo *image);

/** The state of ImageUtilReadPngCallback, to which libpng's io pointer must point. */
typedef struct ImageUtilPngReadState {
    const uint8_t *buffer; /**< the PNG */
    uint32_t offset;       /**< bytes already read */
    uint32_t size;         /**< bytes in buffer */
} ImageUtilPngReadState;

/** A read function for png_set_read_fn that reads from memory.
 *
 * @param png     the decoder, with an ImageUtilPngReadState as its io pointer
 * @param dest    receives the bytes
 * @param length  how many; when fewer are left, png_error is called
 */
QUILLON_API void ImageUtilReadPngCallback(struct png_struct_def *png, uint8_t *dest, size_t length);

/** @} */

/** @name Writing PNG
 *
 * An image of up to 8 bpp is read as one byte per pixel and written as a palette PNG; one
 * of 16 or 24 bpp as an RGB PNG; one of 32 bpp as an RGB or RGBA PNG.  The top row of the
 * picture is written first, whichever way the rows of the image run.
 *
 * Encoding fails for an image without pixels, with a bytesPerLine below the bytes of its
 * width, or with a pixel above the palette's number of colours.  A depth that
 * Raster_ConvertPixels does not convert is a Warning and a Panic where bpp is not 8, 24 or
 * 32.
 * @{
 */

/** How to encode a PNG. */
typedef struct ImageUtilPngOptions {
    /** 0 (none) to 9 (smallest); anything else is libpng's default. */
    int32_t compressionLevel;
    /** Whether the alpha of a 32-bit image is dropped (RGB) or kept (RGBA). */
    bool stripAlpha;
} ImageUtilPngOptions;

/** Memory operations of the caller, used during one call. */
typedef struct ImageUtilMemOps {
    void *context; /**< first argument of the three functions; not read */
    /** Returns a block of size bytes, or null. */
    void *(*alloc)(void *context, size_t size);
    /** Releases a block; must accept a null block. */
    void (*free)(void *context, void *block);
    /** Resizes a block, or returns null and leaves it; must accept a null block. */
    void *(*realloc)(void *context, void *block, size_t size);
} ImageUtilMemOps;

/** Encodes an image as PNG into a byte buffer.
 *
 * @param image    only read; null is a failure
 * @param options  null for the default: libpng's compression, alpha dropped
 * @param buffer   output; overwritten without releasing what it held; null is a failure
 * @return true with the PNG in buffer, which the caller releases with DynBuf_Destroy; false
 *         with an empty buffer, or with an unchanged one when image is null
 */
QUILLON_API bool ImageUtil_ConstructPNGBuffer(const ImageInfo *image,
                                              const ImageUtilPngOptions *options,
                                              struct DynBuf *buffer);

/** Encodes an image as PNG into a block from the caller's memory operations.
 *
 * All memory that libquillon needs comes from these operations; libpng's does not.
 *
 * @param image    only read; null is a failure
 * @param options  null for the default: libpng's compression, alpha dropped
 * @param outData  receives the block, which the caller owns; not written on failure
 * @param outSize  receives the number of bytes in the block; 0 on failure
 * @param memOps   the operations, all of them set
 * @return true with the PNG in the block, or false with all memory released
 */
QUILLON_API bool ImageUtil_ConstructPNGBufferWithMemOps(const ImageInfo *image,
                                                        const ImageUtilPngOptions *options,
                                                        uint8_t **outData, uint32_t *outSize,
                                                        const ImageUtilMemOps *memOps);

/** The state of ImageUtilBufferWriteCallback, to which libpng's io pointer must point. */
typedef struct ImageUtilPngBuffer {
    uint8_t *data;                 /**< the block, from memOps */
    uint32_t size;                 /**< bytes in use */
    uint32_t capacity;             /**< bytes allocated */
    const ImageUtilMemOps *memOps; /**< only realloc is called */
} ImageUtilPngBuffer;

/** A write function for png_set_write_fn that appends to a block of the caller's memory
 * operations.
 *
 * When the block cannot grow, or would exceed 4 GiB, size and capacity are set to 0 and
 * png_error is called; data keeps the block, for the caller to release.
 *
 * @param png     the encoder, with an ImageUtilPngBuffer as its io pointer
 * @param source  the bytes to append; only read
 * @param length  how many
 */
QUILLON_API void ImageUtilBufferWriteCallback(struct png_struct_def *png, uint8_t *source,
                                              size_t length);

/** A write function for png_set_write_fn that appends to a DynBuf.
 *
 * @param png     the encoder, with a DynBuf as its io pointer
 * @param source  the bytes to append; only read
 * @param length  how many; when the buffer cannot grow, png_error is called
 */
QUILLON_API void ImageUtilDynBufWriteCallback(struct png_struct_def *png, uint8_t *source,
                                              size_t length);

/** @} */

/** @name Writing BMP and files
 * @{
 */

/** File formats of ImageUtil_WriteImage. */
typedef enum ImageUtilFormat {
    IMAGEUTIL_FORMAT_PNG = 0, /**< with the default options */
    IMAGEUTIL_FORMAT_BMP = 1
} ImageUtilFormat;

/** Encodes an image as a BMP file into a byte buffer.
 *
 * An 8-bit image becomes an 8-bit BMP with its palette, any other a 24-bit BMP: alpha is
 * dropped, 16 bits are widened.  Where bytesPerLine is below the bytes of the width, a row
 * of the file holds what the row of the image has, and then zeros.
 *
 * Encoding fails below 8 bpp, without pixels, and where a width or height exceeds
 * 2147483647 or the file 4 GiB.  A depth that Raster_ConvertPixels does not convert is a
 * Warning and a Panic where bpp is not 8 or 24.
 *
 * @param image   only read; null is a failure
 * @param buffer  output; overwritten without releasing what it held; null is a failure
 * @return true with the file in buffer, which the caller releases with DynBuf_Destroy;
 *         false with an empty buffer when it could not grow, otherwise with an unchanged
 *         one
 */
QUILLON_API bool ImageUtil_ConstructBMPBuffer(const ImageInfo *image, struct DynBuf *buffer);

/** Writes an image to a file, which is created or overwritten.
 *
 * A failure to open or write the file is logged.  After a failure to write it may be
 * incomplete; it is not removed.
 *
 * @param image     only read; null is a failure, for which no file is created
 * @param fileName  of the file
 * @param format    an ImageUtilFormat; anything else is a Panic, checked first
 * @return true when the whole file was written
 */
QUILLON_API bool ImageUtil_WriteImage(const ImageInfo *image, const char *fileName,
                                      uint32_t format);

/** Writes an image to a PNG file, as ImageUtil_WriteImage does, with options.
 *
 * @param image     only read; null is a failure, for which no file is created
 * @param fileName  of the file
 * @param options   null for the default: libpng's compression, alpha dropped
 * @return true when the whole file was written
 */
QUILLON_API bool ImageUtil_WritePNG(const ImageInfo *image, const char *fileName,
                                    const ImageUtilPngOptions *options);

/** @} */

/** @name Composing
 * @{
 */

/** Copies images onto one new canvas.
 *
 * The canvas is the bounding box of all images and has the format of images[0], which all
 * images must have.  Later images overwrite earlier ones; nothing is blended.
 *
 * Where the areas of the images do not add up to that of the canvas (there are gaps or
 * overlaps), and images[0] is not of 32 bpp, the images are converted to a canvas of 32
 * bpp: 8-bit images each through its own palette, all with alpha 255.  A depth that
 * Raster_ConvertPixels does not convert is a Warning and a Panic then.  Otherwise pixels
 * are copied as they are; a result of 8 bpp has no palette.  Pixels that no image covers
 * are all zero.
 *
 * An image with null data extends the canvas but is not copied.  An image whose
 * bytesPerLine is below the bytes of its width is copied as far as its rows go.
 *
 * @param images     the images; only read
 * @param positions  for each image, where its top left pixel goes; may be negative.  What
 *                   exceeds the coordinates of int32_t is cut off.
 * @param count      number of images; 0 gives an all-zero result and true
 * @param result     output; flags, numColors and palette are 0; the caller owns
 *                   result->data; unchanged on failure
 * @return false when memory cannot be allocated, or a stride, of an image or of the
 *         canvas, exceeds 2147483647
 */
QUILLON_API bool ImageUtil_Combine(const ImageInfo *images, const RectPoint *positions,
                                   uint32_t count, ImageInfo *result);

/** Cuts a rectangle, the crop, out of a 32-bit image and scales it.
 *
 * Scaling is filtered, see Raster_Scale: where the width shrinks, the last column comes out
 * dark (white at half the size as 126), alpha included, and a height that shrinks by more
 * than 32 does as a whole.  Surface::copyScaled of quillon.hpp avoids both.  Without an output size
 * the crop keeps its size; with a width or a height alone, the other one is in proportion,
 * truncated, with the product taken modulo 2^32.
 *
 * @param src                  taken to have 32 bits per pixel, whatever its bpp; only
 *                             read; with a crop as wide as the image that is not scaled,
 *                             its rows must be contiguous
 * @param srcLeft, srcTop      first column and row of the crop
 * @param srcRight, srcBottom  end of the crop, exclusive; -1 means the edge of the image
 * @param dstLeft, dstTop      must be 0
 * @param dstRight             output width; -1 means not given
 * @param dstBottom            output height; -1 means not given
 * @param result               output; flags, numColors and palette are 0; the caller owns
 *                             result->data; unchanged on failure
 * @return false when dstLeft or dstTop is not 0, the crop is empty or not inside the image,
 *         an output size is 0 or too large (at most 32767 where the crop is scaled), src
 *         has no pixels or a bytesPerLine below the end of the crop, or memory cannot be
 *         allocated
 */
QUILLON_API bool ImageUtil_CropAndScaleImage(const ImageInfo *src, int32_t srcLeft, int32_t srcTop,
                                             int32_t srcRight, int32_t srcBottom, int32_t dstLeft,
                                             int32_t dstTop, int32_t dstRight, int32_t dstBottom,
                                             ImageInfo *result);

/** @} */

QUILLON_END_DECLS

#endif /* QUILLON_IMAGE_UTIL_H */
