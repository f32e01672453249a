#include "targets.h"

#include <algorithm>
#include <map>

namespace quillon::bench {
namespace {

struct FamilyTargets {
    Target cached, uncached, small;
};

const std::map<std::string, FamilyTargets> kTargets = {
    {"fill", {{0.9, 0}, {0.95, 0}, {0.7, 1}}},
    {"raster fill", {{0.9, 0}, {0.95, 0}, {0.7, 1}}},
    {"raster copy", {{0.9, 0}, {0.95, 0}, {0.7, 1}}},
    {"raster fill, rarer codes", {{0.9, 4}, {0.95, 0}, {0.7, 1}}},
    {"raster copy, rarer codes", {{0.9, 4}, {0.95, 0}, {0.7, 1}}},
    {"copy", {{0.97, 0}, {0.97, 0}, {0.97, 0}}},
    {"scroll", {{0, 0.97}, {0, 0.97}, {0, 0.97}}},
    {"blend noise", {{0, 1.2}, {1, 0}, {0, 1.3}}},
    {"blend interface", {{0, 1}, {1, 0}, {0, 1.3}}},
    {"bits", {{0.7, 8}, {0.9, 0}, {0, 4}}},
    {"stencil", {{0.7, 8}, {0.9, 0}, {0, 4}}},
    {"convert", {{0, 1.2}, {1, 0}, {0, 1}}},
    {"convert 24 and 32", {{0, 1}, {1, 0}, {0, 1}}},
    {"convert to small", {{0, 8}, {0.9, 0}, {0, 4}}},
    {"index", {{0, 1.2}, {0, 1}, {0, 1}}},
    {"index to 24", {{0, 2}, {0, 1}, {0, 1}}},
    {"index to small", {{0, 1.2}, {0, 1}, {0, 1}}},
    {"nearest", {{0, 1.2}, {0, 1.2}, {0, 1.2}}},
    {"nearest by 2", {{0, 1}, {0, 1}, {0, 1}}},
    {"linear", {{0, 1.3}, {0, 1.3}, {0, 1}}},
    {"box", {{0, 2}, {0, 2}, {0, 2}}},
    {"box by 2", {{0, 0.8}, {0, 0.8}, {0, 0.8}}},
    {"packed video to 32", {{0, 1}, {1, 0}, {0, 1}}},
    {"packed video", {{0, 2}, {0.9, 0}, {0, 1.5}}},
    {"planar video", {{0, 2}, {0.9, 0}, {0, 1.5}}},
    {"planar video to 32", {{0, 1}, {0.9, 0}, {0, 1.5}}},
    {"key", {{0.95, 0}, {0.95, 0}, {0, 3}}},
    {"rectangles", {{0, 1}, {0, 1}, {0, 1}}},
    {"PNG", {{0, 0.98}, {0, 0.98}, {0, 0.98}}},
    {"image", {{0, 0.5}, {0, 0.5}, {0, 0.5}}}, // one pass stands as a peer
};

} // namespace

Target targetOf(const Result &result) {
    const auto found = kTargets.find(result.family);
    if (found == kTargets.end())
        return {};
    const FamilyTargets &targets = found->second;
    return result.area.uncached      ? targets.uncached
           : result.area.width <= 32 ? targets.small
                                     : targets.cached;
}

double reached(const Result &result) {
    const Target target = targetOf(result);
    double least = 1e9;
    if (target.limit > 0 && result.limitSpeed > 0)
        least = std::min(least, result.limitSpeed / target.limit);
    if (target.peer > 0 && result.peerSpeed > 0)
        least = std::min(least, result.peerSpeed / target.peer);
    return least;
}

} // namespace quillon::bench
