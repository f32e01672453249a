#include "operations.h"

#include <algorithm>

namespace quillon::bench {

std::vector<Operation> pixelOperations(const Area &area) {
    Plan plan = {area};
    for (const auto add : {addFills, addRops, addCopies, addBlends, addBits, addConversions,
                           addScaling, addVideo, addColorKeys})
        add(plan);
    return plan.operations;
}

std::vector<Operation> allOperations() {
    const Area areas[] = {{"32x32", 32, 32, 1920},
                          {"256x128", 256, 128},
                          {"256x128 in 1920", 256, 128, 1920},
                          {"1920x1080", 1920, 1080, 0, true}};
    Plan plan = {{"lists of rectangles", 1, 1}};
    for (const Area &area : areas)
        std::ranges::move(pixelOperations(area), std::back_inserter(plan.operations));
    addRegions(plan);
    addImages(plan);
    plan.area = {"calls of the C++ face", 8, 8, 640};
    addFace(plan);
    return plan.operations;
}

} // namespace quillon::bench
