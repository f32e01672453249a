// What is done to regions, and how a library does it.
#pragma once

#include "operation.h"

#include <cstring>
#include <map>

namespace quillon::bench {

// A rectangle that is added to a region or cut out of it.
struct RegionStep {
    bool isCut;
    int32_t x, y, width, height;
};
using RegionSteps = std::vector<RegionStep>;
// By name; none is of more than 15 rectangles at any time.
using RegionSequences = std::map<std::string, RegionSteps>;
const RegionSequences &regionSequences();

// A Region is empty at first, and has add, cut and area.
template <class Region>
void follow(Region &region, const RegionSteps &steps) {
    for (const RegionStep &step : steps)
        step.isCut ? region.cut(step) : region.add(step);
}

template <class Region>
Prepare regionWork(const RegionSteps &steps) {
    return prepare([&steps] {
        Region region;
        follow(region, steps);
        benchmark::DoNotOptimize(&region);
    });
}

// Leaves the number of pixels in the destination.
template <class Region>
Prepare regionCheck(const RegionSteps &steps) {
    return prepare([&steps](const Buffer &dst) {
        Region region;
        follow(region, steps);
        const uint32_t area = region.area();
        std::memcpy(dst.data, &area, sizeof(area));
    });
}

} // namespace quillon::bench
