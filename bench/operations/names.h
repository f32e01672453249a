// Names of operations, by which peers say what they can do.
#pragma once

#include <cstdint>

#include <string>

namespace quillon::bench {

// "and", "and reverse" ...
std::string ropName(uint32_t rop);

// Those that peers have, too, and the others are looked at apart.
std::string ropFamily(const std::string &operation, uint32_t rop);

bool ropReadsDestination(uint32_t rop);

// "index", "15", "16", "24", "32"; the destination depths 3, 6 and 8 are colours
// of two or three bits a field.
constexpr int32_t kIndex = 0;
std::string conversionName(int32_t srcDepth, int32_t dstDepth);

// Filters and factors of scaling.
inline constexpr double kNearestFactors[] = {3, 2, 1.5, 0.75, 0.5, 0.3, 0.125};
inline constexpr double kLinearFactors[] = {3, 2, 1.5, 1.1};
inline constexpr double kBoxFactors[] = {0.9, 0.75, 0.5, 0.3, 0.2, 0.125};
std::string scaleName(const std::string &filter, double factor);

} // namespace quillon::bench
