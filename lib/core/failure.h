// How a caller's error is reported: the format, the unit that the message names,
// and the source line of the check that found it.
//
// A host's Panic leaves by an exception, a jump or the end of the process.  The
// checks return after it all the same, so that a Panic that comes back does no
// harm.
#pragma once

#include <hearth/hearth.h>

namespace quillon {

// The units that messages name.  They are part of the interface, whatever file
// the check stands in.
inline constexpr char kUnitRasterOps[] = "lib/raster/rasterops";
inline constexpr char kUnitRasterConv[] = "lib/raster/rasterConv";
inline constexpr char kUnitRasterRect[] = "lib/raster/rasterRect";
inline constexpr char kUnitRasterCursor[] = "lib/raster/rasterCursor";
inline constexpr char kUnitImageUtil[] = "lib/image/imageUtil";

[[gnu::cold]] inline void panicNotImplemented(const char *unit, int line = __builtin_LINE()) {
    Panic("NOT_IMPLEMENTED %s:%d\n", unit, line);
}

[[gnu::cold]] inline void panicVerify(const char *unit, int line = __builtin_LINE()) {
    Panic("VERIFY %s:%d\n", unit, line);
}

[[gnu::cold]] inline void panicVerifyBug(const char *unit, int bugNr, int line = __builtin_LINE()) {
    Panic("VERIFY %s:%d bugNr=%d\n", unit, line, bugNr);
}

// Reports a pixel size that fills and raster operations do not have.
[[gnu::cold]] inline void rejectPixelSize(int line = __builtin_LINE()) {
    Warning("Raster: Unsupported frame buffer depth\n");
    panicNotImplemented(kUnitRasterOps, line);
}

} // namespace quillon
