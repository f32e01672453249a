// The speeds that we hold ourselves to.
#pragma once

#include "comparison.h"

namespace quillon::bench {

// Ratios of speed, ours divided by theirs; 0 where there is none to hold to.
struct Target {
    double limit, peer;
};

Target targetOf(const Result &result);

// How far the result is from its target: below 1, it is missed.
double reached(const Result &result);

} // namespace quillon::bench
