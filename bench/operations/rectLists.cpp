// Raster_AddRect and Raster_SubRect.
#include "operations.h"

#include <quillon/raster.h>
#include "rectSequences.h"

#include <algorithm>
#include <random>

namespace quillon::bench {
namespace {

// Damage of a screen: small rectangles close to each other.
std::vector<ListStep> damage() {
    std::mt19937 random(1);
    std::vector<ListStep> steps;
    for (int i = 0; i < 8; ++i) {
        const auto below = [&](uint32_t bound) { return static_cast<int32_t>(random() % bound); };
        steps.push_back({false, 16 * below(12), 16 * below(8), 16 + 16 * below(4), 16});
    }
    return steps;
}

std::vector<ListStep> grid() {
    std::vector<ListStep> steps;
    for (int32_t y = 0; y < 3; ++y) {
        for (int32_t x = 0; x < 4; ++x)
            steps.push_back({false, 100 * x, 100 * y, 60, 60});
    }
    return steps;
}

std::vector<ListStep> touching() {
    std::vector<ListStep> steps;
    for (int32_t y = 0; y < 4; ++y) {
        for (int32_t x = 0; x < 4; ++x)
            steps.push_back({false, 64 * x, 64 * y, 64, 64});
    }
    return steps;
}

std::vector<ListStep> shuffledGrid() {
    std::vector<ListStep> steps = grid();
    std::shuffle(steps.begin(), steps.end(), std::mt19937(2));
    return steps;
}

// Damage that comes in clusters far from each other.
std::vector<ListStep> clusters() {
    std::mt19937 random(3);
    std::vector<ListStep> steps;
    for (int i = 0; i < 12; ++i) {
        const auto below = [&](uint32_t bound) { return static_cast<int32_t>(random() % bound); };
        steps.push_back({false, 600 * (i % 3) + below(60), 400 * (i % 2) + below(40), 40, 20});
    }
    return steps;
}

std::vector<ListStep> crossingBars() {
    return {{false, 0, 100, 1000, 20}, {false, 100, 0, 20, 600}, {false, 0, 400, 1000, 20}};
}

std::vector<ListStep> holes() {
    std::vector<ListStep> steps = {{false, 0, 0, 1000, 600}};
    for (int32_t i = 0; i < 3; ++i)
        steps.push_back({true, 100 + 250 * i, 100 + 150 * i, 50, 50});
    return steps;
}

std::vector<ListStep> holesInARow() {
    std::vector<ListStep> steps = {{false, 0, 0, 1000, 600}};
    for (int32_t i = 0; i < 8; ++i)
        steps.push_back({true, 50 + 110 * i, 200, 50, 50});
    return steps;
}

// Cuts between the rectangles of a grid.
std::vector<ListStep> missedCuts() {
    std::vector<ListStep> steps = grid();
    for (int32_t i = 0; i < 8; ++i)
        steps.push_back({true, 65 + 100 * (i % 3), 70 * (i % 4), 30, 50});
    return steps;
}

std::vector<ListStep> typing() {
    std::vector<ListStep> steps;
    for (int32_t i = 0; i < 40; ++i)
        steps.push_back({false, 8 * i, 300, 8, 16});
    return steps;
}

} // namespace

const std::vector<RectSequence> &rectSequences() {
    static const std::vector<RectSequence> sequences = {
        {"one", {{false, 10, 20, 300, 200}}},
        {"two apart", {{false, 10, 20, 300, 200}, {false, 10, 400, 300, 200}}},
        {"damage", damage()},
        {"grid", grid()},
        {"shuffled grid", shuffledGrid()},
        {"touching tiles", touching()},
        {"clusters", clusters()},
        {"crossing bars", crossingBars()},
        {"holes", holes()},
        {"holes in a row", holesInARow()},
        {"missed cuts", missedCuts()},
        {"typing", typing()},
    };
    return sequences;
}

void addRectLists(Plan &plan) {
    const Area area = {"", 64, 1, 0, false};
    for (const RectSequence &sequence : rectSequences()) {
        plan.push_back({"rectangles " + sequence.name,
                        "rectangles",
                        area,
                        {plane(area, 8, noise)},
                        Traffic::None,
                        {{"quillon", Agreement::Exact, [&](const Job & /*job*/) -> Work {
                              return [&steps = sequence.steps] {
                                  RasterRectList list;
                                  Raster_ClearRectList(&list);
                                  for (const ListStep &step : steps) {
                                      const auto change =
                                          step.cut ? Raster_SubRect : Raster_AddRect;
                                      change(&list, step.x, step.y, step.width, step.height);
                                  }
                                  benchmark::DoNotOptimize(list);
                              };
                          }}}});
    }
}

} // namespace quillon::bench
