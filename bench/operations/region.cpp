#include "../regions.h"
#include "operations.h"

#include <algorithm>
#include <random>

namespace quillon::bench {
namespace {

class ListRegion {
public:
    ListRegion() { Raster_ClearRectList(&list); }
    void add(const RegionStep &step) {
        sum = Raster_AddRect(&list, step.x, step.y, step.width, step.height);
    }
    void cut(const RegionStep &step) {
        sum = Raster_SubRect(&list, step.x, step.y, step.width, step.height);
    }
    uint32_t area() const { return sum; }

private:
    RasterRectList list;
    uint32_t sum = 0;
};

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
        add("clusters", 10, {false, 600 * (i % 3) + below(60), 400 * (i % 2) + below(40), 40, 20});
        add("grid", 12, {false, 100 * (i % 4), 100 * (i / 4), 60, 60});
        add("15 tiles in order", 15, {false, 100 * (i % 5), 100 * (i / 5), 60, 60});
        add("diagonal", 15, {false, 20 * i, 20 * i, 10, 10});
        add("touching diagonal", 15, {false, 20 * i, 20 * i, 20, 20});
        add("overlaps", 7, {false, 50 * i, 30 * i, 300, 200});
        add("inside", 10, {false, 100 * (i % 4), 100 * (i / 4), 60, 60});
        add("touching tiles", 16, {false, 64 * (i % 4), 64 * (i / 4), 64, 64});
        add("typing", 40, {false, 8 * i, 300, 8, 16});
        add("holes", 3, {true, 100 + 250 * i, 100 + 150 * i, 50, 50});
        add("holes in a row", 8, {true, 50 + 110 * i, 200, 50, 50});
    }
    for (int32_t i = 0; i < 30; ++i)
        sequences["inside"].push_back({false, 100 * (i % 4) + i, 100 * (i % 2) + i, 30, 30});
    // Each round covers five tiles, and the round before.
    for (int32_t i = 0; i < 30; ++i)
        sequences["covering"].push_back(
            i % 6 < 5 ? RegionStep{false, 600 * (i / 6) + 100 * (i % 6), 20, 60, 60}
                      : RegionStep{false, 0, 0, 600 * (i / 6) + 580, 100});
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
        plan.add(text("rectangles ", name), "rectangles", Traffic::None, {{32, noise}},
                 regionWork<ListRegion>(steps))
            .contenders[0]
            .prepareCheck = regionCheck<ListRegion>(steps);
}

} // namespace quillon::bench
