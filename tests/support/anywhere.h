// Points and rectangles of the C++ face that may lie anywhere.
#pragma once

#include "support/random.h"
#include <quillon/quillon.hpp>

#include <limits>

namespace quillon::test {

inline constexpr int32_t kMin = std::numeric_limits<int32_t>::min();
inline constexpr int32_t kMax = std::numeric_limits<int32_t>::max();

// Mostly near the surfaces of the tests; at the limits, or wherever.
inline int32_t anyCoordinate(Random &random) {
    const uint32_t kind = random.below(8);
    return kind == 0   ? random.oneOf({kMin, kMin + 1, kMax, kMax - 1, 0})
           : kind == 1 ? random.between(kMin, kMax)
                       : random.between(-30, 50);
}
inline Point anyPoint(Random &random) {
    return {anyCoordinate(random), anyCoordinate(random)};
}
inline quillon::Rect anyRect(Random &random) {
    const Point corner = anyPoint(random), end = anyPoint(random);
    return quillon::Rect::fromEdges(corner.x, corner.y, end.x, end.y);
}

} // namespace quillon::test
