// When to write around the caches.
#pragma once

#include "legacy/surface.h"

namespace quillon {

// Writing through the caches reads each line first and drives another one out.
// That pays as long as the surface stays in a cache of the core itself; one larger
// than those is written faster around them, and leaves them to the host.
inline constexpr size_t kStreamedBytes = size_t{3} << 19;

// Whether to stream to a rectangle that is written without being read.
constexpr bool isStreamed(size_t rowBytes, size_t height) {
    return rowBytes >= 256 && rowBytes * height >= kStreamedBytes;
}

// Bytes to ask for ahead of those at hand in long rows of a surface that is in some
// cache.  The processor asks ahead itself, but only inside a page.
inline constexpr ptrdiff_t kAheadInCaches = 768;

} // namespace quillon
