/* A C program with nothing of its own: fills a surface and makes a BMP of it. */
#include <hearth/hearth.h>
#include <quillon/imageUtil.h>
#include <quillon/raster.h>

#include <stdio.h>
#include <string.h>

int main(void) {
    uint8_t pixels[2 * 8] = {0};
    ImageInfo image = {0};
    DynBuf file;

    image.width = image.height = 2;
    image.depth = 24;
    image.bpp = 24;
    image.bytesPerLine = 8;
    image.data = pixels;
    Raster_RectFill(pixels, 8, 3, 0x102030, 1, 0, 1, 2);

    if (!ImageUtil_ConstructBMPBuffer(&image, &file)) {
        return 1;
    }
    const bool good = file.size == 54 + 16 && memcmp(file.data, "BM", 2) == 0 &&
                      memcmp(file.data + 54, "\0\0\0\x30\x20\x10\0\0", 8) == 0;
    DynBuf_Destroy(&file);
    puts(good ? "client: good" : "client: not the expected file");
    return good ? 0 : 1;
}
