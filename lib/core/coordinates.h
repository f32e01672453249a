// Arithmetic on int32_t coordinates whose results may leave int32_t: they either
// wrap or stop at the limits, and neither is left to undefined behaviour.
#pragma once

#include <algorithm>
#include <cstdint>
#include <limits>

namespace quillon {

inline constexpr int32_t kCoordinateMin = std::numeric_limits<int32_t>::min();
inline constexpr int32_t kCoordinateMax = std::numeric_limits<int32_t>::max();

inline int32_t wrappingAdd(int32_t a, int32_t b) {
    return static_cast<int32_t>(static_cast<uint32_t>(a) + static_cast<uint32_t>(b));
}

inline int32_t wrappingSubtract(int32_t a, int32_t b) {
    return static_cast<int32_t>(static_cast<uint32_t>(a) - static_cast<uint32_t>(b));
}

inline int32_t saturate(int64_t value) {
    return static_cast<int32_t>(std::clamp<int64_t>(value, kCoordinateMin, kCoordinateMax));
}

// Stores value, stopped at the limits; true when it did not have to be.
inline bool storeSaturated(int32_t &dst, int64_t value) {
    dst = saturate(value);
    return dst == value;
}

} // namespace quillon
