// Memory for the buffers of an operation.
#pragma once

#include "operation.h"

namespace quillon::bench {

// Bytes that uncached measurements rotate through: twice the last cache.
size_t arenaBytes();

// Bytes of all planes of an operation in the arena.
size_t placeBytes(const Operation &operation);

// The jobs of an operation, with their contents: one, or as many as fit in the
// arena where the area is uncached.  Valid until the next call.
std::vector<Job> makeJobs(const Operation &operation);

} // namespace quillon::bench
