// What the memory allows: loops that move the bytes of a job and do nothing else.
#pragma once

#include "job.h"

namespace quillon::bench {

// The limits that hold for an operation: plain and streaming loops over the same
// bytes, and memset or memcpy where those move the same.
std::vector<Contender> limitsOf(const Operation &operation);

} // namespace quillon::bench
