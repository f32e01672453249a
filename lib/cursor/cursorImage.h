// The images of a cursor record: 32-bit pixels in contiguous rows.
#pragma once

#include <cstdint>
#include <limits>

namespace quillon {

inline constexpr int32_t kCursorPixelBytes = 4;

// The stride of a wider image cannot be represented in int32_t, the type of every
// line increment.
inline constexpr uint32_t kMaxCursorWidth = std::numeric_limits<int32_t>::max() / kCursorPixelBytes;

// The stride of an image; without meaning, as it wraps, above kMaxCursorWidth.
constexpr int32_t cursorImageStride(uint32_t width) {
    return static_cast<int32_t>(width * kCursorPixelBytes);
}

} // namespace quillon
