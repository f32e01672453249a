// What the units of this room share, and what other rooms need of the conversions
// beside the entries.
#pragma once

#include <cstdint>

namespace quillon {

// True where Raster_ConvertPixels converts pixels of the depth, without a palette,
// to another depth.  Otherwise raises its Warning and its Panic, with the given line
// as that of the check, and returns false if the Panic returns.  For callers that
// are to fail before they hold anything that a Panic would leak.
bool checkSourceDepth(int32_t depth, int line = __builtin_LINE());

// Raises a Warning, whose format holds one %d for the depth, and a Panic.
[[gnu::cold]] void rejectDepth(const char *format, int32_t depth, int line = __builtin_LINE());

inline constexpr char kBadPseudoDepth[] =
    "Raster convert pixels invalid depth for pseudo color %d\n";

} // namespace quillon
