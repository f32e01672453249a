// Pixels in memory, for the plain statements of the pixel operations.
#pragma once

#include <quillonTypes.h>

namespace quillon::reference {

// The first byte of pixel (x, y).  In whole addresses that wrap around: pixel
// (0, 0) may lie outside of memory as long as the rectangle does not.
template <class Byte>
Byte *pixelAt(Byte *buffer, int64_t lineIncrement, int32 bytesPerPixel, uint64_t x, uint64_t y) {
    return reinterpret_cast<Byte *>(reinterpret_cast<uintptr_t>(buffer) +
                                    y * static_cast<uint64_t>(lineIncrement) +
                                    x * static_cast<uint64_t>(bytesPerPixel));
}

inline uint32 load(const uint8 *address, int32 bytes) {
    uint32 pixel = 0;
    for (int32 i = 0; i < bytes; ++i)
        pixel |= uint32{address[i]} << (8 * i);
    return pixel;
}

inline void store(uint8 *address, int32 bytes, uint32 pixel) {
    for (int32 i = 0; i < bytes; ++i)
        address[i] = static_cast<uint8>(pixel >> (8 * i));
}

// A line increment in whole pixels, rounded down, where pixels are units of 2 or
// 4 bytes; as it is where they are bytes.
inline int64_t wholePixelLine(int64_t lineIncrement, int32 bytes) {
    if (bytes != 2 && bytes != 4)
        return lineIncrement;
    const int64_t rest = ((lineIncrement % bytes) + bytes) % bytes; // 0 to bytes - 1
    return lineIncrement - rest;
}

} // namespace quillon::reference
