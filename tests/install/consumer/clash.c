/* A host with a Log of its own, which has nothing to do with libquillon's.  Ends with the
 * number of times that libquillon calls it. */
#include <quillon/imageUtil.h>

#ifndef LINKAGE
#define LINKAGE
#endif

static int calls;

LINKAGE void Log(int level);

void Log(int level) {
    (void)level;
    ++calls;
}

int main(void) {
    uint8_t pixel[4] = {0};
    ImageInfo image = {0};

    image.width = image.height = 1;
    image.depth = image.bpp = 24;
    image.bytesPerLine = 4;
    image.data = pixel;
    /* A file that cannot be written is worth a message. */
    return ImageUtil_WriteImage(&image, "/no/such/folder/a.bmp", IMAGEUTIL_FORMAT_BMP) ? 100
                                                                                       : calls;
}
