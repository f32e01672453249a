"""Calls libquillon from Python by ctypes, on the memory of numpy arrays.

    python3 numpyPixels.py IN.png OUT.png

Reads a picture, fills a strip of it, darkens its middle by a blend, and writes it.
"""
import argparse
import ctypes

import numpy

#! [load]
quillon = ctypes.CDLL("libquillon.so.1")

# Without these ctypes passes every argument as an int.
i32, u32, pointer = ctypes.c_int32, ctypes.c_uint32, ctypes.c_void_p
quillon.Raster_RectFill.argtypes = [pointer, i32, i32, u32, u32, u32, u32, u32]
quillon.Raster_RectFill.restype = None
quillon.Raster_AlphaBlendOver.argtypes = [pointer, u32, u32, i32, pointer, u32, u32, i32, u32, u32]
quillon.Raster_AlphaBlendOver.restype = None
#! [load]


#! [surface]
def surface(pixels, x, y, width, height):
    """The address and stride of an array (rows, columns, bytes), for a rectangle in it.

    The library clips nothing: a rectangle that leaves the array is refused here.
    """
    rows, columns, size = pixels.shape
    if not (pixels.dtype == numpy.uint8 and pixels.strides[1:] == (size, 1)):
        raise ValueError("the bytes of a row must lie side by side")
    if x < 0 or y < 0 or width < 0 or height < 0 or x + width > columns or y + height > rows:
        raise ValueError("the rectangle leaves the picture")
    return pixels.ctypes.data, pixels.strides[0]


def fill(pixels, value, x, y, width, height):
    if not pixels.flags.writeable:
        raise ValueError("the array is only to be read")
    address, stride = surface(pixels, x, y, width, height)
    quillon.Raster_RectFill(address, stride, pixels.shape[2], value, x, y, width, height)


def blend(ground, x, y, top):
    """Lays premultiplied B G R A pixels over others."""
    if ground.shape[2] != 4 or top.shape[2] != 4 or not ground.flags.writeable:
        raise ValueError("both need 4 bytes a pixel, and the ground to be writeable")
    height, width, _ = top.shape
    address, stride = surface(ground, x, y, width, height)
    source, sourceStride = surface(top, 0, 0, width, height)
    quillon.Raster_AlphaBlendOver(address, x, y, stride, source, 0, 0, sourceStride, width, height)
#! [surface]


#! [image]
class ImageInfo(ctypes.Structure):
    """The record of imageUtil.h, field by field."""
    _fields_ = [("width", u32), ("height", u32), ("depth", u32), ("bpp", u32),
                ("bytesPerLine", u32), ("flags", u32), ("numColors", u32),
                ("palette", u32 * 256), ("data", pointer)]


READ_KEEP_ALPHA, READ_ADD_ALPHA, FORMAT_PNG = 1, 2, 0
quillon.ImageUtil_ReadPNG.restype = quillon.ImageUtil_WriteImage.restype = ctypes.c_bool


def read(name):
    """The pixels of a PNG in colour as an array (rows, columns, 4)."""
    image = ImageInfo()
    flags = READ_KEEP_ALPHA | READ_ADD_ALPHA
    if not quillon.ImageUtil_ReadPNG(ctypes.byref(image), name.encode(), u32(flags)):
        raise ValueError(name + ": not a PNG in colour")
    try:
        if image.bpp != 32:
            raise ValueError(name + ": has a palette")
        rows = (ctypes.c_uint8 * (image.height * image.bytesPerLine)).from_address(image.data)
        pixels = numpy.frombuffer(rows, numpy.uint8).reshape(image.height, image.bytesPerLine)
        return pixels[:, :image.width * 4].reshape(image.height, image.width, 4).copy()
    finally:
        quillon.ImageUtil_FreeImageData(ctypes.byref(image))


def write(pixels, name):
    """Writes a PNG without alpha, which is what ImageUtil_WriteImage makes."""
    height, width, _ = pixels.shape
    address, stride = surface(pixels, 0, 0, width, height)
    image = ImageInfo(width=width, height=height, depth=24, bpp=32, bytesPerLine=stride,
                      data=address)
    if not quillon.ImageUtil_WriteImage(ctypes.byref(image), name.encode(), u32(FORMAT_PNG)):
        raise OSError(name + ": cannot be written")
#! [image]


def main():
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("input", metavar="IN.png")
    parser.add_argument("output", metavar="OUT.png")
    parser.add_argument("--version", action="version", version="%(prog)s for libquillon 1")
    files = parser.parse_args()
    picture = read(files.input)
    height, width, _ = picture.shape
    # A part of an array is a surface too.
    middle = picture[height // 4:height - height // 4, width // 4:width - width // 4]
    shade = numpy.zeros_like(middle)
    shade[..., 3] = 128
    blend(middle, 0, 0, shade)
    fill(picture, 0xFF2F6690, 0, 0, width, height // 8)
    write(picture, files.output)


if __name__ == "__main__":
    main()
