// What is shown of the results.
#pragma once

#include "comparison.h"

namespace quillon::bench {

// Means, medians, and the operations slower than they are to be, by instruction set.
std::string summaryText(const std::vector<Result> &results);

// The page of all results; peers are the names and versions of the other libraries.
std::string performancePage(const std::vector<Result> &results, const std::string &peers);

} // namespace quillon::bench
