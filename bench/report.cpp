#include "report.h"

#include "peers/peers.h"
#include "targets.h"

#include <algorithm>
#include <cmath>
#include <cstdio>

namespace quillon::bench {
namespace {

std::string timeText(double nanoseconds) {
    char text[32];
    if (nanoseconds < 1e3)
        std::snprintf(text, sizeof(text), "%.1f ns", nanoseconds);
    else if (nanoseconds < 1e6)
        std::snprintf(text, sizeof(text), "%.2f us", nanoseconds / 1e3);
    else
        std::snprintf(text, sizeof(text), "%.2f ms", nanoseconds / 1e6);
    return text;
}

std::string standingText(const Standing *standing) {
    if (standing == nullptr)
        return "";
    char text[64];
    std::snprintf(text, sizeof(text), "%.2f %s", standing->ourSpeed, standing->name.c_str());
    return text;
}

void printResult(const Result &result) {
    std::printf("%-28s %-16s %10s   %-22s %-18s %s\n", result.operation.c_str(), result.area.name,
                timeText(result.nanoseconds).c_str(), standingText(result.best(true)).c_str(),
                standingText(result.best(false)).c_str(),
                reached(result) < 1 ? "below target" : "");
    for (const Standing &other : result.others) {
        if (other.bytesDiffer)
            std::printf("%-28s the bytes of %s differ\n", "", other.name.c_str());
    }
    std::fflush(stdout);
}

double geometricMean(const std::vector<double> &values) {
    double sum = 0;
    for (const double value : values)
        sum += std::log(value);
    return values.empty() ? 0 : std::exp(sum / static_cast<double>(values.size()));
}

} // namespace

bool Reporter::ReportContext(const Context & /*context*/) {
    for (const Peer &peer : peers()) {
        if (peer.offer == nullptr)
            std::printf("Left out, because it was not installed: %s\n", peer.name);
    }
    std::printf("%-28s %-16s %10s   %-22s %-18s\n", "operation", "size", "a call", "speed / limit",
                "speed / best peer");
    return true;
}

void Reporter::ReportRuns(const std::vector<Run> & /*runs*/) {
    printResult(results.back());
}

std::string summaryText(const std::vector<Result> &results) {
    std::vector<double> limits, peerSpeeds;
    for (const Result &result : results) {
        if (result.limitSpeed > 0)
            limits.push_back(result.limitSpeed);
        if (result.peerSpeed > 0)
            peerSpeeds.push_back(result.peerSpeed);
    }
    char text[200];
    std::snprintf(text, sizeof(text),
                  "Geometric means: %.2f of the limit (%zu measurements), %.2f times the best peer "
                  "(%zu measurements).\n",
                  geometricMean(limits), limits.size(), geometricMean(peerSpeeds),
                  peerSpeeds.size());
    return text;
}

void printSummary(const std::vector<Result> &results) {
    std::printf("\n%s", summaryText(results).c_str());
    std::vector<const Result *> missed;
    for (const Result &result : results) {
        if (reached(result) < 1)
            missed.push_back(&result);
    }
    std::sort(missed.begin(), missed.end(),
              [](const Result *a, const Result *b) { return reached(*a) < reached(*b); });
    std::printf("%zu of %zu below their target, the furthest first:\n", missed.size(),
                results.size());
    for (const Result *result : missed) {
        const Target target = targetOf(*result);
        std::printf("%5.2f  ", reached(*result));
        std::printf("(limit %.2f, peer %.2f)  ", target.limit, target.peer);
        printResult(*result);
    }
}

} // namespace quillon::bench
