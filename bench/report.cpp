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
    "- 1920x1080: each call on memory that has left every cache\n\n";

constexpr const char *kHeadOfTable =
    "| Operation | A call, ns | / limit | / best peer |\n|---|--:|--:|--:|\n";

std::string standingText(const Standing &standing) {
    return standing.speed == 0 ? "" : text(fixed(standing.speed, 2), " (", standing.name, ")");
}

// The geometric mean of the speeds that there are of a family and an area ("": all),
// followed by their count.
std::string meanText(const std::vector<Result> &results, Standing Result::*standing,
                     const std::string &family = "", const std::string &area = "") {
    double sum = 0;
    int count = 0;
    for (const Result &result : results) {
        const double speed = (result.*standing).speed;
        if (speed > 0 && (family.empty() || result.operation->family == family) &&
            (area.empty() || result.operation->area.name == area)) {
            sum += std::log(speed);
            ++count;
        }
    }
    return count == 0 ? "" : text(fixed(std::exp(sum / count), 2), " (", count, ")");
}

std::string processorName() {
    std::ifstream info("/proc/cpuinfo");
    for (std::string line; std::getline(info, line);)
        if (line.starts_with("model name"))
            return line.substr(line.find(':') + 2);
    return "an unnamed processor";
}

void addOnce(std::vector<std::string> &values, const std::string &value) {
    if (std::ranges::find(values, value) == values.end())
        values.push_back(value);
}

} // namespace

std::string summaryText(const std::vector<Result> &results) {
    std::string lines =
        text("Geometric means (of so many measurements): ", meanText(results, &Result::limit),
             " of the limit, ", meanText(results, &Result::peer), " times the best peer. Below ",
             kPeerFloor, " of the best peer or, uncached, ", kLimitFloor, " of the limit:\n\n");
    for (const auto &[operation, nanoseconds, limit, peer, bytesDiffer] : results) {
        const bool isLimit =
            operation->area.isUncached && limit.speed > 0 && limit.speed < kLimitFloor;
        if (isLimit || (peer.speed > 0 && peer.speed < kPeerFloor))
            lines += text("- ", operation->name, ", ", operation->area.name, ": ",
                          standingText(isLimit ? limit : peer), "\n");
    }
    return lines;
}

std::string performancePage(const std::vector<Result> &results) {
    std::vector<std::string> families, areas;
    for (const Result &result : results) {
        addOnce(families, result.operation->family);
        addOnce(areas, result.operation->area.name);
    }
    std::string head = "| Family |", line = "\n|---|", rows, tables;
    for (const std::string &family : families) {
        rows += text("\n| ", family, " |");
        for (const std::string &area : areas)
            rows += text(" ", meanText(results, &Result::peer, family, area), " |");
    }
    for (const std::string &area : areas) {
        head += text(" ", area, " |");
        line += "--:|";
        tables += text("\n## ", area, "\n\n", kHeadOfTable);
        for (const auto &[operation, nanoseconds, limit, peer, bytesDiffer] : results)
            if (operation->area.name == area)
                tables += text("| ", operation->name, " | ",
                               fixed(nanoseconds, nanoseconds < 100 ? 1 : 0), " | ",
                               standingText(limit), " | ", standingText(peer), " |\n");
    }
    return text("# Performance\n\nWritten by `scripts/bench --report=docs`; do not edit.\n\n"
                "Measured on one core of ",
                processorName(), " (", hwy::TargetName(hwy::SupportedAndGeneratedTargets()[0]),
                "). Peers: ", peerText(), ".\n\n", kIntroduction, summaryText(results),
                "\n## Beside the best peer\n\nGeometric means, and the counts of operations that "
                "peers have.\n\n",
                head, line, rows, "\n", tables);
}

} // namespace quillon::bench
