// The formats in which a caller's error is reported, each with the unit and the
// source line of the check that found it.
//
// A host's Panic leaves by an exception, a jump or the end of the process.  The
// checks return after it all the same, so that a Panic that comes back does no
// harm.
#pragma once

#include "hearth.h"

namespace quillon {

[[gnu::cold]] inline void panicNotImplemented(const char *unit, int line = __builtin_LINE()) {
    Panic("NOT_IMPLEMENTED %s:%d\n", unit, line);
}

[[gnu::cold]] inline void panicVerify(const char *unit, int line = __builtin_LINE()) {
    Panic("VERIFY %s:%d\n", unit, line);
}

[[gnu::cold]] inline void panicVerifyBug(const char *unit, int bugNr, int line = __builtin_LINE()) {
    Panic("VERIFY %s:%d bugNr=%d\n", unit, line, bugNr);
}

} // namespace quillon
