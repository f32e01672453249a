#include <quillon/imageUtil.h>
#include <quillon/raster.h>

#include <stdio.h>
#include <stdlib.h>

enum { kFrame = 8 };

/* Frames a PNG: colour or palette, with its alpha if it has some. */
int main(int argc, char **argv) {
    if (argc != 3) {
        fprintf(stderr, "usage: %s IN.png OUT.png\n", argv[0]);
        return 2;
    }
    ImageInfo picture = {0};
    if (!ImageUtil_ReadPNG(&picture, argv[1], IMAGEUTIL_READ_KEEP_ALPHA)) {
        fprintf(stderr, "%s cannot be read, or is not a PNG in colour\n", argv[1]);
        ImageUtil_FreeImageData(&picture);
        return 1;
    }
    ImageInfo framed = {.depth = 24, .bpp = 32}; /* B G R A in memory */
    framed.width = picture.width + 2 * kFrame;
    framed.height = picture.height + 2 * kFrame;
    framed.bytesPerLine = framed.width * 4;
    framed.data = calloc(framed.height, framed.bytesPerLine);

    bool isWritten = false;
    if (framed.data != NULL) {
        /* The palette of an indexed file, as 32-bit pixels. */
        uint32_t palette[256];
        for (int i = 0; i < 256; ++i) {
            const ImageUtilColor c = picture.palette[i];
            palette[i] = 0xFF000000u | (uint32_t)c.red << 16 | (uint32_t)c.green << 8 | c.blue;
        }
        Raster_RectFill(framed.data, (int32_t)framed.bytesPerLine, 4, 0xFF205080, 0, 0,
                        framed.width, framed.height);
        Raster_ConvertPixelsTo32(framed.data, framed.bytesPerLine, picture.data,
                                 picture.bytesPerLine, (int32_t)picture.bpp, picture.bpp == 8,
                                 palette, 0, 0, kFrame, kFrame, picture.width, picture.height);
        const ImageUtilPngOptions keepAlpha = {-1, false};
        isWritten = ImageUtil_WritePNG(&framed, argv[2], &keepAlpha);
    }
    if (!isWritten)
        fprintf(stderr, "%s cannot be written\n", argv[2]);
    ImageUtil_FreeImageData(&framed);
    ImageUtil_FreeImageData(&picture);
    return isWritten ? 0 : 1;
}
