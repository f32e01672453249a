// What every file of this room needs of an ImageInfo.
#pragma once

#include <quillon/imageUtil.h>

#include <cstddef>
#include <cstdint>

namespace quillon {

inline constexpr uint32_t kMaxColors = 256;

// Rows of images and files start at multiples of four bytes.
constexpr uint64_t roundUpTo4(uint64_t bytes) {
    return (bytes + 3) & ~uint64_t{3};
}

inline bool isBottomUp(const ImageInfo &image) {
    return (image.flags & IMAGEUTIL_FLAG_BOTTOM_UP) != 0;
}

inline const uint8_t *rowAt(const ImageInfo &image, uint32_t row) {
    return image.data + size_t{row} * image.bytesPerLine;
}

} // namespace quillon
