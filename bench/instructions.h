// Executed instructions in place of time: what can be measured of a processor that
// is only emulated.
#pragma once

#include "operation.h"

namespace quillon::bench {

// Prints a line for each contender of each operation whose area is in a cache: area,
// operation, contender and pixels, separated by tabs and without an end of line, which
// bench/emulator/countInstructions.cpp adds after the instructions of one call.
void markInstructions(const std::vector<Operation> &operations);

} // namespace quillon::bench
