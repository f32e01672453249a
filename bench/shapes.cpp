#include "shapes.h"

#include "memory.h"
#include "operations/operations.h"
#include "peers/peers.h"

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <fstream>
#include <map>

namespace quillon::bench {
namespace {

// The fastest of several tries: slower ones were disturbed.
double nanoseconds(const Work &work, double tryNanoseconds) {
    using Clock = std::chrono::steady_clock;
    const auto timed = [&](size_t calls) {
        const auto begin = Clock::now();
        for (size_t call = 0; call < calls; ++call) {
            work();
            benchmark::ClobberMemory();
        }
        const std::chrono::duration<double, std::nano> elapsed = Clock::now() - begin;
        return elapsed.count() / static_cast<double>(calls);
    };
    double least = timed(2);
    const auto calls = static_cast<size_t>(std::max(tryNanoseconds / least, 1.0));
    for (int i = 0; i < 5; ++i)
        least = std::min(least, timed(calls));
    return least;
}

// ---- Sweep ----------------------------------------------------------------

constexpr uint32_t kWidths = 300;
constexpr uint32_t kHeight = 16;
constexpr double kTry = 4000;

// Nanoseconds of a call for every width, those of one operation and one layout.
struct Series {
    std::vector<double> ours = std::vector<double>(kWidths + 1);
    std::vector<double> plain = std::vector<double>(kWidths + 1); // 0: no such loop
};
using AllSeries = std::map<std::string, Series>;

double median(std::vector<double> values) {
    std::sort(values.begin(), values.end());
    return values[values.size() / 2];
}

// The time for a pixel of widths up to a quarter smaller or larger.
double neighbours(const std::vector<double> &times, uint32_t width) {
    const uint32_t reach = std::min(width / 4, 16U);
    std::vector<double> pixelTimes;
    for (uint32_t near = width - reach; near <= std::min(width + reach, kWidths); ++near) {
        if (near != width)
            pixelTimes.push_back(times[near] / near);
    }
    return median(pixelTimes);
}

// Each width, as an operation of that area.
void measureWidth(const Area &area, AllSeries &series) {
    Plan plan;
    addPixelOperations(plan, area);
    Offers plain;
    offerPlainLoops(plain);
    for (const Operation &operation : plan) {
        Places places(operation);
        const auto timed = [&](const Contender &contender) {
            return nanoseconds(contender.prepare(places.job(0)), kTry);
        };
        Series &at = series[operation.name];
        at.ours[area.width] = timed(operation.contenders[0]);
        const auto loop = plain.find(operation.name);
        if (loop != plain.end())
            at.plain[area.width] = timed(loop->second[0]);
    }
}

// The time of the named operation's call at an area; 0 where that has no such.
double timeOf(const std::string &name, const Area &area, double tryNanoseconds) {
    Plan plan;
    addPixelOperations(plan, area);
    for (const Operation &operation : plan) {
        if (operation.name != name || Places::bytesOf(operation) > arenaBytes())
            continue;
        const Places places(operation);
        return nanoseconds(operation.contenders[0].prepare(places.job(0)), tryNanoseconds);
    }
    return 0;
}

struct Layout {
    const char *name;
    uint32_t surfaceWidth, extraStep;

    Area area(uint32_t width, uint32_t offset = 0) const {
        return {"", width, kHeight, surfaceWidth, false, offset, extraStep};
    }
};

// A second and third look at what seems slow: most often something else was.
double looked(const std::string &operation, const Area &area, double time) {
    for (int i = 0; i < 3; ++i)
        time = std::min(time, timeOf(operation, area, 10 * kTry));
    return time;
}

struct Finding {
    double factor;
    std::string text;
};

void findSlow(const std::string &operation, const Layout &layout, const Series &series,
              std::vector<Finding> &findings) {
    const auto judge = [&](uint32_t width, double bound, const char *whose) {
        double ours = series.ours[width];
        if (bound > 0 && ours > bound)
            ours = looked(operation, layout.area(width), ours);
        if (bound <= 0 || ours <= bound)
            return;
        char text[200];
        std::snprintf(text, sizeof(text), "%s, %s, width %u: %.1f ns, %s %.1f", operation.c_str(),
                      layout.name, width, ours, whose, bound);
        findings.push_back({ours / bound, text});
    };
    for (uint32_t width = 1; width <= kWidths; ++width) {
        if (width >= 4)
            judge(width, 2 * width * neighbours(series.ours, width), "twice its neighbours");
        judge(width, series.plain[width], "a plain loop");
    }
}

// Each alignment, against the others of the same width.
void sweepAlignments(const Layout &layout, std::vector<Finding> &findings) {
    for (const uint32_t width : {16U, 61U, 250U}) {
        std::map<std::string, std::vector<double>> times;
        for (uint32_t offset = 0; offset < 64; ++offset) {
            AllSeries series;
            measureWidth(layout.area(width, offset), series);
            for (const auto &[operation, at] : series)
                times[operation].push_back(at.ours[width]);
        }
        for (const auto &[operation, at] : times) {
            const double bound = 2 * median(at);
            for (uint32_t offset = 0; offset < 64; ++offset) {
                if (at[offset] <= bound)
                    continue;
                const double ours = looked(operation, layout.area(width, offset), at[offset]);
                char text[200];
                std::snprintf(text, sizeof(text),
                              "%s, width %u, byte %u: %.1f ns, twice the others %.1f",
                              operation.c_str(), width, offset, ours, bound);
                if (ours > bound)
                    findings.push_back({ours / bound, text});
            }
        }
    }
}

// ---- Growth ---------------------------------------------------------------

constexpr double kLongTry = 1e6;
constexpr uint32_t kSides[] = {16, 32, 64, 128, 256, 512, 1024, 2048, 4096, 8192};

bool isShown(const std::string &operation) {
    constexpr const char *kShown[] = {
        "fill 32",          "alpha fill",       "raster fill xor 32", "copy 32",
        "scroll up",        "blend noise",      "bits noise to 32",   "stencil text to 32",
        "convert 16 to 32", "convert 32 to 24", "index to 32",        "nearest by 1.5",
        "linear by 1.5",    "box by 0.75",      "YUY2 to 32",         "YV12 to 32"};
    return std::find(std::begin(kShown), std::end(kShown), operation) != std::end(kShown);
}

// A row of the table: first a call that has nothing to do, then the squares.
std::string growthRow(const std::string &name) {
    char text[32];
    const double empty = timeOf(name, {"", 0, 1, 0, false}, kLongTry);
    std::snprintf(text, sizeof(text), " | %.1f", empty);
    std::string row = "| " + name + (empty > 0 ? text : " | ");
    for (const uint32_t side : kSides) {
        const double pixels = double{1} * side * side;
        const double time = timeOf(name, {"", side, side, 0, false}, kLongTry);
        std::snprintf(text, sizeof(text), " | %.3f", time / pixels);
        row += time > 0 ? text : " | ";
    }
    return row + " |\n";
}

} // namespace

int sweep() {
    constexpr Layout kLayouts[] = {
        {"packed", 0, 0}, {"in a surface", 2 * kWidths, 0}, {"odd line increments", kWidths, 1}};

    std::vector<Finding> findings;
    for (const Layout &layout : kLayouts) {
        AllSeries series;
        for (uint32_t width = 1; width <= kWidths; ++width) {
            if (width % 10 == 0) {
                std::fprintf(stderr, "\r%s: width %u of %u ", layout.name, width, kWidths);
                std::fflush(stderr);
            }
            measureWidth(layout.area(width), series);
        }
        std::fprintf(stderr, "\n");
        for (const auto &[operation, at] : series)
            findSlow(operation, layout, at, findings);
    }
    std::fprintf(stderr, "alignments\n");
    sweepAlignments({"", kWidths, 0}, findings);

    std::sort(findings.begin(), findings.end(),
              [](const Finding &a, const Finding &b) { return a.factor > b.factor; });
    for (const Finding &finding : findings)
        std::printf("%5.2f  %s\n", finding.factor, finding.text.c_str());
    std::printf("%zu slow corners\n", findings.size());
    return findings.empty() ? 0 : 1;
}

int growth(const std::string &folder) {
    std::string page =
        "# Growth\n\nWritten by `scripts/bench --growth --report=docs`; not by hand. "
        "Nanoseconds a pixel of squares whose rows lie end to end, again and again "
        "on the same memory, so that the steps are those from one cache to the "
        "next; the first number is the nanoseconds of a call that has nothing to "
        "do, its width being 0.\n\n| Operation | empty call";
    for (const uint32_t side : kSides)
        page += " | " + std::to_string(side);
    page += " |\n|---|--:";
    for (size_t i = 0; i < std::size(kSides); ++i)
        page += "|--:";
    page += "|\n";
    std::printf("%s", page.c_str());

    Plan names;
    addPixelOperations(names, kAreas[0]);
    for (const Operation &named : names) {
        if (!isShown(named.name))
            continue;
        const std::string row = growthRow(named.name);
        std::printf("%s", row.c_str());
        std::fflush(stdout);
        page += row;
    }
    if (!folder.empty())
        std::ofstream(folder + "/growth.md") << page;
    return 0;
}

} // namespace quillon::bench
