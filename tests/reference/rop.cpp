#include "reference/rop.h"

#include "reference/pixels.h"
#include "reference/raster.h"

namespace quillon::reference {
namespace {

constexpr uint32 kCopy = 3, kNoop = 5, kLast = 15;

// Each bit of the code says what becomes of one pair of operand bits.
uint32 combined(uint32 rop, uint32 s, uint32 d) {
    uint32 result = 0;
    if ((rop & 8) != 0)
        result |= ~s & ~d;
    if ((rop & 4) != 0)
        result |= ~s & d;
    if ((rop & 2) != 0)
        result |= s & ~d;
    if ((rop & 1) != 0)
        result |= s & d;
    return result;
}

} // namespace

void rectRopFill(uint8 *frameBuffer, int32 lineIncrement, int32 bytesPerPixel, uint32 pixel,
                 uint32 rop, uint32 x, uint32 y, uint32 width, uint32 height) {
    if (rop == kNoop || rop > kLast)
        return;
    uint8 *first = pixelAt(frameBuffer, lineIncrement, bytesPerPixel, x, y);
    const int64_t step = wholePixelLine(lineIncrement, bytesPerPixel);
    for (uint64_t row = 0; row < height; ++row)
        for (uint64_t column = 0; column < width; ++column) {
            uint8 *dst = pixelAt(first, step, bytesPerPixel, column, row);
            store(dst, bytesPerPixel, combined(rop, pixel, load(dst, bytesPerPixel)));
        }
}

void rectRopCopy(uint8 *dstBuffer, int32 dstLineIncrement, const uint8 *srcBuffer,
                 int32 srcLineIncrement, int32 bytesPerPixel, uint32 srcX, uint32 srcY, uint32 rop,
                 uint32 dstX, uint32 dstY, uint32 width, uint32 height) {
    if (rop == kCopy)
        return rectCopy(dstBuffer, dstLineIncrement, srcBuffer, srcLineIncrement, bytesPerPixel,
                        srcX, srcY, dstX, dstY, width, height);
    if (rop == kNoop || rop > kLast || width == 0 || height == 0)
        return;

    const bool upwards = srcY < dstY;
    const bool leftwards = srcY == dstY && dstX > srcX;
    const uint64_t firstRow = upwards ? uint64_t{height} - 1 : 0;
    const uint64_t firstColumn = leftwards ? uint64_t{width} - 1 : 0;
    const auto stepOf = [&](int64_t line) {
        return wholePixelLine(upwards ? -line : line, bytesPerPixel);
    };
    const int32 pixelStep = leftwards ? -bytesPerPixel : bytesPerPixel;
    uint8 *dstFirst =
        pixelAt(dstBuffer, dstLineIncrement, bytesPerPixel, dstX + firstColumn, dstY + firstRow);
    const uint8 *srcFirst =
        pixelAt(srcBuffer, srcLineIncrement, bytesPerPixel, srcX + firstColumn, srcY + firstRow);

    for (uint64_t row = 0; row < height; ++row)
        for (uint64_t column = 0; column < width; ++column) {
            uint8 *dst = pixelAt(dstFirst, stepOf(dstLineIncrement), pixelStep, column, row);
            const uint8 *src = pixelAt(srcFirst, stepOf(srcLineIncrement), pixelStep, column, row);
            if (bytesPerPixel != 3) {
                store(dst, bytesPerPixel,
                      combined(rop, load(src, bytesPerPixel), load(dst, bytesPerPixel)));
                continue;
            }
            for (int i = 0; i < 3; ++i) { // one byte is stored before the next is read
                const int at = leftwards ? 2 - i : i;
                dst[at] = static_cast<uint8>(combined(rop, src[at], dst[at]));
            }
        }
}

} // namespace quillon::reference
