// Sequences of rectangles that are added to or cut from a list, as hosts do.
#pragma once

#include <cstdint>

#include <string>
#include <vector>

namespace quillon::bench {

struct ListStep {
    bool cut;
    int32_t x, y, width, height;
};

struct RectSequence {
    std::string name;
    std::vector<ListStep> steps;
};

// None needs more than 15 rectangles at any time.
const std::vector<RectSequence> &rectSequences();

} // namespace quillon::bench
