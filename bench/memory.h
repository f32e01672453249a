// Memory for jobs: one place that stays in the caches, or many in turn.
#pragma once

#include "job.h"

#include <memory>

namespace quillon::bench {

// Places for the planes of an operation, filled with their contents.
class Places {
public:
    explicit Places(const Operation &operation);

    // What one place takes; not more than arenaBytes().
    static size_t bytesOf(const Operation &operation);

    size_t count() const { return jobs.size(); }
    const Job &job(size_t place) const { return jobs[place]; }

    // Fills the destination at place 0 anew.
    void reset();

private:
    const Plane &dstPlane;
    std::vector<Job> jobs;
};

// Bytes that uncached measurements rotate through, twice the last cache.
size_t arenaBytes();

} // namespace quillon::bench
