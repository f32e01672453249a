#include "operations.h"

#include <algorithm>
#include <random>

namespace quillon::bench {
namespace {

RegionSequences makeSequences() {
    const RegionStep window = {false, 0, 0, 1000, 600};
    RegionSequences sequences = {
        {"one", {{false, 10, 20, 300, 200}}},
        {"two apart", {{false, 10, 20, 300, 200}, {false, 10, 400, 300, 200}}},
        {"crossing bars",
         {{false, 0, 100, 1000, 20}, {false, 100, 0, 20, 600}, {false, 0, 400, 1000, 20}}},
        {"holes", {window}},
        {"holes in a row", {window}}};
    std::mt19937 random(1);
    const auto below = [&](uint32_t bound) { return static_cast<int32_t>(random() % bound); };
    for (int32_t i = 0; i < 40; ++i) {
        const auto add = [&](const char *name, int32_t count, const RegionStep &step) {
            if (i < count)
                sequences[name].push_back(step);
        };
        add("damage", 8, {false, 16 * below(12), 16 * below(8), 16 + 16 * below(4), 16});
        add("clusters", 12, {false, 600 * (i % 3) + below(60), 400 * (i % 2) + below(40), 40, 20});
        add("grid", 12, {false, 100 * (i % 4), 100 * (i / 4), 60, 60});
        add("touching tiles", 16, {false, 64 * (i % 4), 64 * (i / 4), 64, 64});
        add("typing", 40, {false, 8 * i, 300, 8, 16});
        add("holes", 3, {true, 100 + 250 * i, 100 + 150 * i, 50, 50});
        add("holes in a row", 8, {true, 50 + 110 * i, 200, 50, 50});
    }
    sequences["missed cuts"] = sequences["shuffled grid"] = sequences["grid"];
    for (int32_t i = 0; i < 8; ++i)
        sequences["missed cuts"].push_back({true, 65 + 100 * (i % 3), 70 * (i % 4), 30, 50});
    std::ranges::shuffle(sequences["shuffled grid"], random);
    return sequences;
}

} // namespace

const RegionSequences &regionSequences() {
    static const RegionSequences sequences = makeSequences();
    return sequences;
}

void addRegions(Plan &plan) {
    for (const auto &[name, steps] : regionSequences())
        plan.add(text("rectangles ", name), "rectangles", Traffic::None, {{8, noise}},
                 [&steps = steps] {
                     RasterRectList list;
                     Raster_ClearRectList(&list);
                     for (const auto &[isCut, x, y, width, height] : steps)
                         (isCut ? Raster_SubRect : Raster_AddRect)(&list, x, y, width, height);
                     benchmark::DoNotOptimize(list);
                 });
}

} // namespace quillon::bench
