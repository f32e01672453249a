// Raster operations pixel by pixel: for processors without vectors, and for rows
// whose overlap makes the order of the pixels count.
#pragma once

#include "rop/ropKernels.h"

#include <cstddef>
#include <cstdint>
#include <cstring>

namespace quillon {

// A row of pixels that are read whole before they are written.
template <class Pixel>
void ropRowPlain(uint32_t rop, uint8_t *dst, const uint8_t *src, size_t rowBytes,
                 RowDirection direction) {
    for (size_t i = 0; i < rowBytes; i += sizeof(Pixel)) {
        const size_t at =
            direction == RowDirection::kLeftToRight ? i : rowBytes - sizeof(Pixel) - i;
        Pixel s, d;
        std::memcpy(&s, src + at, sizeof(Pixel));
        std::memcpy(&d, dst + at, sizeof(Pixel));
        const RopConstant constant = ropConstant(rop, s);
        const auto combined = static_cast<Pixel>((d & constant.keep) ^ constant.flip);
        std::memcpy(dst + at, &combined, sizeof(Pixel));
    }
}

// By the size of a pixel.  Three bytes count one by one.  Not to be inlined: it is
// rare, and would take registers from the kernels.
[[gnu::noinline]] inline void ropRowPlain(uint32_t rop, uint8_t *dst, const uint8_t *src,
                                          size_t rowBytes, int32_t bytesPerPixel,
                                          RowDirection direction) {
    if (bytesPerPixel == 2)
        ropRowPlain<uint16_t>(rop, dst, src, rowBytes, direction);
    else if (bytesPerPixel == 4)
        ropRowPlain<uint32_t>(rop, dst, src, rowBytes, direction);
    else
        ropRowPlain<uint8_t>(rop, dst, src, rowBytes, direction);
}

} // namespace quillon
