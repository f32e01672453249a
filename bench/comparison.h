// An operation done by everybody who can do it, in one run.
//
// All contenders take turns for a short while each, round after round, so that a
// slower moment of the machine is one for all of them.  Speeds are compared within
// a round, and of the rounds the median counts.
#pragma once

#include "job.h"

#include <benchmark/benchmark.h>

namespace quillon::bench {

// All that is to be measured, in the order that it is to be shown.
using Plan = std::vector<Operation>;

// How fast somebody is beside us.
struct Standing {
    std::string name;
    double nanoseconds; // a call
    double ourSpeed;    // ours divided by theirs: 2 where we take half their time
    bool isLimit;
    bool bytesDiffer; // and should not
};

struct Result {
    std::string operation, family;
    Area area;
    double nanoseconds; // of ours
    std::vector<Standing> others;
    double limitSpeed; // ours divided by the best limit's, 0 without one
    double peerSpeed;  // ours divided by the best peer's, 0 without one

    const Standing *best(bool limit) const;
};

// Registers the plan with Google Benchmark, an iteration being a round.  Results
// are appended as the benchmarks run.
void registerComparisons(const Plan &plan, std::vector<Result> &results);

} // namespace quillon::bench
