#include "reference/bits.h"

#include "reference/pixels.h"

namespace quillon::reference {
namespace {

bool isSet(const uint8 *rowBits, int32 column) {
    return ((rowBits[column / 8] >> (7 - column % 8)) & 1) != 0;
}

// Calls paint(address, set) for every pixel.
template <class Paint>
void forEachBit(const uint8 *srcBits, int32 srcLineIncrement, uint8 *dstBuffer,
                int32 dstLineIncrement, int32 bytesPerPixel, int32 width, uint32 height,
                const Paint &paint) {
    for (int64_t row = 0; row < height; ++row)
        for (int32 column = 0; column < width; ++column)
            paint(dstBuffer + row * dstLineIncrement + int64_t{column} * bytesPerPixel,
                  isSet(srcBits + row * srcLineIncrement, column));
}

} // namespace

void bitsToPixels(const uint8 *srcBits, int32 srcLineIncrement, uint8 *dstBuffer,
                  int32 dstLineIncrement, int32 bytesPerPixel, int32 width, uint32 height,
                  uint32 foreground, uint32 background) {
    forEachBit(srcBits, srcLineIncrement, dstBuffer, dstLineIncrement, bytesPerPixel, width, height,
               [=](uint8 *pixel, bool set) {
                   store(pixel, bytesPerPixel, set ? foreground : background);
               });
}

void bitsToPixelsStencil(const uint8 *srcBits, int32 srcLineIncrement, uint8 *dstBuffer,
                         int32 dstLineIncrement, int32 bytesPerPixel, int32 width, uint32 height,
                         uint32 pixel) {
    forEachBit(srcBits, srcLineIncrement, dstBuffer, dstLineIncrement, bytesPerPixel, width, height,
               [=](uint8 *address, bool set) {
                   if (set)
                       store(address, bytesPerPixel, pixel);
               });
}

} // namespace quillon::reference
