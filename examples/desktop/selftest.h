// A test that the screen, painted piece by piece, equals one drawn anew.
#ifndef DESKTOP_SELFTEST_H
#define DESKTOP_SELFTEST_H

#include "desktop.h"

namespace desktop {

// Does random actions and compares the screen after each; says what came of it.
// Returns false when there was a difference.
bool passSelftest(Desktop &desktop, int32_t actions, uint32_t seed);

} // namespace desktop

#endif // DESKTOP_SELFTEST_H
