// Arithmetic on int32 coordinates whose results may leave int32: they either
// wrap or stop at the limits, and neither is left to undefined behaviour.
#pragma once

#include "quillonTypes.h"

#include <algorithm>
#include <cstdint>
#include <limits>

namespace quillon {

inline constexpr int32 kCoordinateMin = std::numeric_limits<int32>::min();
inline constexpr int32 kCoordinateMax = std::numeric_limits<int32>::max();

inline int32 wrappingAdd(int32 a, int32 b) {
    return static_cast<int32>(static_cast<uint32>(a) + static_cast<uint32>(b));
}

inline int32 wrappingSubtract(int32 a, int32 b) {
    return static_cast<int32>(static_cast<uint32>(a) - static_cast<uint32>(b));
}

inline int32 saturate(int64_t value) {
    return static_cast<int32>(std::clamp<int64_t>(value, kCoordinateMin, kCoordinateMax));
}

// Stores value, stopped at the limits; true when it did not have to be.
inline bool storeSaturated(int32 &dst, int64_t value) {
    dst = saturate(value);
    return dst == value;
}

} // namespace quillon
