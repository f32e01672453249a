#include <quillon/imageUtil.h>

int main(int argc, char **argv) {
    ImageInfo picture = {0}, small = {0};
    bool done = argc == 3 && ImageUtil_ReadPNG(&picture, argv[1], IMAGEUTIL_READ_ADD_ALPHA) &&
                picture.bpp == 32 && picture.width >= 20 && picture.height >= 20 &&
                /* All but a margin of 10 pixels, 320 wide, as high as it comes out. */
                ImageUtil_CropAndScaleImage(&picture, 10, 10, (int32_t)picture.width - 10,
                                            (int32_t)picture.height - 10, 0, 0, 320, -1, &small) &&
                ImageUtil_WriteImage(&small, argv[2], IMAGEUTIL_FORMAT_PNG);
    ImageUtil_FreeImageData(&small);
    ImageUtil_FreeImageData(&picture);
    return done ? 0 : 1;
}
