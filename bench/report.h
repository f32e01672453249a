// What is shown of the results.
#pragma once

#include "comparison.h"

namespace quillon::bench {

// Geometric means, and the operations slower than they are to be.
std::string summaryText(const std::vector<Result> &results);

// The page of all results.
std::string performancePage(const std::vector<Result> &results);

} // namespace quillon::bench
