// Text from values.
#pragma once

#include <cstdio>
#include <sstream>
#include <string>

namespace quillon::bench {

template <class... Parts>
std::string text(const Parts &...parts) {
    std::ostringstream stream;
    (stream << ... << parts);
    return stream.str();
}

inline std::string fixed(double value, int digits) {
    char buffer[32];
    std::snprintf(buffer, sizeof(buffer), "%.*f", digits, value);
    return buffer;
}

} // namespace quillon::bench
