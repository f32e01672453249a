// An operation done by every contender in one run.
//
// Contenders take turns of a fraction of a millisecond, round after round, so that
// a slower moment of the machine hits all of them.  Speeds are compared within a
// round; the median over the rounds counts.
#pragma once

#include "operation.h"

namespace quillon::bench {

// The fastest of the limits or of the peers.
struct Standing {
    double speed = 0; // ours divided by theirs: 2 where we take half their time
    std::string name; // of nobody: speed 0
};

struct Result {
    const Operation *operation;
    int64_t target;     // the instruction set of ours and of the limits
    double nanoseconds; // a call of ours
    Standing limit, peer;
    bool bytesDiffer; // from those of a peer whose bytes equal ours
};

// Seconds a call; the works are called in turn, from the place on.
double secondsPerCall(const std::vector<Work> &works, size_t calls, size_t &place);

double median(std::vector<double> values);

// Registers the operations with Google Benchmark, an iteration being a round and a
// counter the speed beside a contender.  Results are appended as they come.
void registerComparisons(const std::vector<Operation> &operations, int64_t target,
                         std::vector<Result> &results);

} // namespace quillon::bench
