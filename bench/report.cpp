#include "report.h"

#include "peers/peers.h"

#include <hwy/targets.h>

#include <algorithm>
#include <cmath>
#include <fstream>

namespace quillon::bench {
namespace {

// The speeds to be reached beside the best peer and, uncached, beside the limit.
constexpr double kPeerFloor = 0.97; // measurements scatter by some percent
constexpr double kLimitFloor = 0.9;

constexpr const char *kIntroduction =
    "Numbers are speeds, ours divided by theirs: 2 means half their time. They are medians over "
    "rounds in which all contenders take turns. The limit is the fastest of several ways to read "
    "the vectors of the sources (and of a destination that is read) and to write those of the "
    "destination, row by row, without doing anything else: by stores of 64 or 32 bytes, by "
    "non-temporal stores, with and without prefetches, by memset or memcpy. There is none where "
    "the content decides which memory is touched. Peers often do less: they round less exactly, "
    "or leave the top byte of a pixel undefined; where they have to give the same bytes, these "
    "are compared.\n\n"
    "- 32x32: a rectangle in a surface 1920 pixels wide; the cost of a call\n"
    "- 256x128: in cache; once with contiguous rows, once in a surface 1920 pixels wide\n"
    "- 1920x1080: each call on memory that has left every cache\n\n"
    "AVX3 is AVX-512. Where it is not the best instruction set, AVX2 is forced upon this library "
    "and the limits, while the peers keep theirs. Means are geometric. For arm64, "
    "[arm64.md](arm64.md) counts instructions. What bounds the operations that "
    "memory does not is in [limits.md](limits.md).\n\n";

constexpr const char *kHeadOfTable =
    "| Operation | A call, ns | / limit | / best peer |\n|---|--:|--:|--:|\n";

std::string standingText(const Standing &standing) {
    return standing.speed == 0 ? "" : text(fixed(standing.speed, 2), " (", standing.name, ")");
}

using Results = std::vector<Result>;
using Key = std::string (*)(const Result &);

std::string targetOf(const Result &result) {
    return hwy::TargetName(result.target);
}
std::string familyOf(const Result &result) {
    return result.operation->family;
}
std::string areaOf(const Result &result) {
    return result.operation->area.name;
}

// The results by their keys, in the order in which these come first.
std::vector<std::pair<std::string, Results>> groups(const Results &results, Key key) {
    std::vector<std::pair<std::string, Results>> groups;
    for (const Result &result : results) {
        const std::string name = key(result);
        auto group = std::ranges::find(groups, name, &std::pair<std::string, Results>::first);
        if (group == groups.end())
            group = groups.insert(group, {name, {}});
        group->second.push_back(result);
    }
    return groups;
}

std::vector<double> speeds(const Results &results, Standing Result::*standing) {
    std::vector<double> speeds;
    for (const Result &result : results)
        if ((result.*standing).speed > 0)
            speeds.push_back((result.*standing).speed);
    return speeds;
}

double geometricMean(const std::vector<double> &speeds) {
    double sum = 0;
    for (const double speed : speeds)
        sum += std::log(speed);
    return std::exp(sum / static_cast<double>(speeds.size()));
}

// Mean, median and count.
std::string averageText(const Results &results, Standing Result::*standing) {
    const std::vector<double> all = speeds(results, standing);
    return all.empty() ? "| | | "
                       : text("| ", fixed(geometricMean(all), 2), " | ", fixed(median(all), 2),
                              " | ", all.size(), " ");
}

bool isBelowFloor(const Result &result) {
    return (result.peer.speed > 0 && result.peer.speed < kPeerFloor) ||
           (result.operation->area.isUncached && result.limit.speed > 0 &&
            result.limit.speed < kLimitFloor);
}

std::string processorName() {
    std::ifstream info("/proc/cpuinfo");
    for (std::string line; std::getline(info, line);)
        if (line.starts_with("model name"))
            return line.substr(line.find(':') + 2);
    return "an unnamed processor";
}

} // namespace

std::string summaryText(const Results &results) {
    std::string averages, slow;
    for (const auto &[target, ofTarget] : groups(results, targetOf)) {
        averages += text("| ", target, " | all ", averageText(ofTarget, &Result::limit),
                         averageText(ofTarget, &Result::peer), "|\n");
        for (const auto &[family, ofFamily] : groups(ofTarget, familyOf))
            averages +=
                text("| ", target, " | ", family, " ", averageText(ofFamily, &Result::limit),
                     averageText(ofFamily, &Result::peer), "|\n");
        for (const Result &result : ofTarget)
            if (isBelowFloor(result))
                slow +=
                    text("| ", target, " | ", result.operation->name, ", ", areaOf(result), " | ",
                         standingText(result.limit), " | ", standingText(result.peer), " |\n");
    }
    return text("| Instruction set | Family | / limit: mean | median | rows | / best peer: mean | "
                "median | rows |\n|---|---|--:|--:|--:|--:|--:|--:|\n",
                averages, "\nBelow ", kPeerFloor, " of the best peer or, uncached, ", kLimitFloor,
                " of the limit:\n\n| Instruction set | Operation | / limit | / best peer |\n"
                "|---|---|--:|--:|\n",
                slow);
}

std::string performancePage(const Results &results, const std::string &peers) {
    std::string tables;
    for (const auto &[target, ofTarget] : groups(results, targetOf))
        for (const auto &[area, ofArea] : groups(ofTarget, areaOf)) {
            tables += text("\n## ", target, ", ", area, "\n\n", kHeadOfTable);
            for (const Result &result : ofArea)
                tables +=
                    text("| ", result.operation->name, " | ",
                         fixed(result.nanoseconds, result.nanoseconds < 100 ? 1 : 0), " | ",
                         standingText(result.limit), " | ", standingText(result.peer), " |\n");
        }
    return text("# Performance\n\nWritten by `scripts/bench --report=docs`; do not edit.\n\n"
                "Measured on one core of ",
                processorName(), ". Peers: ", peers, ".\n\n", kIntroduction, summaryText(results),
                tables);
}

} // namespace quillon::bench
