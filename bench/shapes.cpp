#include "shapes.h"

#include "arena.h"
#include "comparison.h"
#include "operations/operations.h"

#include <algorithm>
#include <map>

namespace quillon::bench {
namespace {

constexpr uint32_t kHeight = 16;
constexpr double kTry = 4000;    // nanoseconds, of the sweep
constexpr double kLongTry = 1e6; // of the growth
constexpr double kSlow = 1.5;

constexpr uint32_t kSides[] = {16, 32, 64, 128, 256, 512, 1024, 2048, 4096, 8192};
constexpr const char *kShown[] = {
    "fill 32",          "alpha fill",       "raster fill xor 32", "copy 32",
    "scroll up",        "blend noise",      "bits noise to 32",   "stencil text to 32",
    "convert 16 to 32", "convert 32 to 24", "index to 32",        "nearest by 1.5",
    "linear by 1.5",    "box by 0.75",      "YUY2 to 32",         "YV12 to 32"};

constexpr const char *kIntroduction =
    "# Growth\n\nWritten by `scripts/bench --growth --report=docs`; do not edit. Nanoseconds a "
    "pixel "
    "of squares of contiguous rows, again and again on the same memory, so that the steps are "
    "those from one cache to the next. The empty call has a width of 0; its number is the "
    "nanoseconds of the call.\n\n";

// Nanoseconds of a call: the fastest of several tries, as others were disturbed.
double timeOf(const Operation &operation, double tryNanoseconds) {
    const std::vector<Work> works = {operation.contenders[0].prepare(makeJobs(operation)[0])};
    size_t place = 0;
    double least = 1e9 * secondsPerCall(works, 2, place);
    const auto calls = static_cast<size_t>(std::max(tryNanoseconds / least, 1.0));
    for (int i = 0; i < 5; ++i)
        least = std::min(least, 1e9 * secondsPerCall(works, calls, place));
    return least;
}

// 0 where the area has no such operation, or is too large for it.
double timeOf(const std::string &name, const Area &area, double tryNanoseconds) {
    for (const Operation &operation : pixelOperations(area))
        if (operation.name == name && placeBytes(operation) <= arenaBytes())
            return timeOf(operation, tryNanoseconds);
    return 0;
}

// Compares the times of every operation at areas that differ by little from one to
// the next with those of the areas around.
size_t sweepAreas(const std::vector<Area> &areas) {
    std::map<std::string, std::vector<std::pair<double, const Area *>>> series;
    for (const Area &area : areas)
        for (const Operation &operation : pixelOperations(area))
            series[operation.name].push_back({timeOf(operation, kTry), &area});
    size_t slow = 0;
    for (const auto &[name, times] : series) {
        for (size_t i = 0; i < times.size(); ++i) {
            auto [time, area] = times[i];
            std::vector<double> around;
            for (size_t j = i < 16 ? 0 : i - 16; j < std::min(i + 17, times.size()); ++j)
                around.push_back(times[j].first);
            // What seems slow is measured again: most often the machine was disturbed.
            for (int again = 0; again < 3 && time > kSlow * median(around); ++again)
                time = std::min(time, timeOf(name, *area, 10 * kTry));
            if (time > kSlow * median(around)) {
                std::printf("%s, %s, width %u, byte %u: %.1f ns, usual %.1f\n", name.c_str(),
                            area->name.c_str(), area->width, area->offset, time, median(around));
                ++slow;
            }
        }
    }
    return slow;
}

} // namespace

size_t sweep() {
    std::vector<std::vector<Area>> series(6);
    for (uint32_t width = 1; width <= 300; ++width) {
        series[0].push_back({"contiguous rows", width, kHeight});
        series[1].push_back({"in a surface", width, kHeight, 600});
        series[2].push_back({"odd stride", width, kHeight, 300, false, 0, 1});
    }
    for (uint32_t offset = 0; offset < 64; ++offset) {
        series[3].push_back({"alignments", 16, kHeight, 300, false, offset});
        series[4].push_back({"alignments", 61, kHeight, 300, false, offset});
        series[5].push_back({"alignments", 250, kHeight, 300, false, offset});
    }
    size_t slow = 0;
    for (const std::vector<Area> &areas : series)
        slow += sweepAreas(areas);
    std::printf("%zu slow shapes\n", slow);
    return slow;
}

std::string growthPage() {
    std::string head = "| Operation | empty call |", line = "\n|---|--:|", rows;
    for (const uint32_t side : kSides) {
        head += text(" ", side, " |");
        line += "--:|";
    }
    for (const char *name : kShown) {
        const double empty = timeOf(name, {"", 0, 1}, kLongTry);
        rows += text("\n| ", name, " | ", empty > 0 ? fixed(empty, 1) : "", " |");
        for (const uint32_t side : kSides) {
            const double time = timeOf(name, {"", side, side}, kLongTry);
            rows += text(" ", time > 0 ? fixed(time / side / side, 3) : "", " |");
        }
    }
    return text(kIntroduction, head, line, rows, "\n");
}

} // namespace quillon::bench
