// What memory allows.
#pragma once

#include "operation.h"

namespace quillon::bench {

// The ways to move the memory of an operation's rows and do nothing else, of which
// the fastest is its limit.
std::vector<Contender> limitsOf(const Operation &operation);

} // namespace quillon::bench
