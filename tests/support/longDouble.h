// Arithmetic in the 80-bit format, for models that are stated in it.
#pragma once

#include <cmath>

namespace quillon::test {

// A result of one operation on integers and doubles, rounded to the 64 significant
// bits that the format has; a long double of another processor has more.
inline long double in80Bits(long double value) {
    int exponent = 0;
    const long double fraction = std::frexp(value, &exponent);
    return std::ldexp(std::nearbyint(std::ldexp(fraction, 64)), exponent - 64);
}

} // namespace quillon::test
