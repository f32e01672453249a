#include "comparison.h"

#include "memory.h"
#include "memoryLimits.h"

#include <algorithm>
#include <chrono>
#include <cstring>

namespace quillon::bench {
namespace {

constexpr int kRounds = 21;
constexpr double kTurnSeconds = 150e-6;

double median(std::vector<double> values) {
    const auto middle = values.begin() + static_cast<ptrdiff_t>(values.size() / 2);
    std::nth_element(values.begin(), middle, values.end());
    return *middle;
}

// Somebody at the places of an operation, with the times that were measured.
struct Runner {
    const Contender *contender;
    bool isLimit;
    bool bytesDiffer;
    std::vector<Work> works; // one a place
    size_t calls;            // in a turn
    std::vector<double> seconds;
};

// Seconds a call; place goes on to the next for each.
double timed(const Runner &runner, size_t calls, size_t &place) {
    using Clock = std::chrono::steady_clock;
    const auto begin = Clock::now();
    for (size_t call = 0; call < calls; ++call) {
        runner.works[place]();
        benchmark::ClobberMemory();
        if (++place == runner.works.size())
            place = 0;
    }
    const std::chrono::duration<double> elapsed = Clock::now() - begin;
    return elapsed.count() / static_cast<double>(calls);
}

std::vector<uint8_t> rowsOf(const Buffer &buffer) {
    std::vector<uint8_t> bytes;
    for (size_t y = 0; y < buffer.height; ++y) {
        const uint8_t *row = buffer.data + y * buffer.step;
        bytes.insert(bytes.end(), row, row + buffer.rowBytes);
    }
    return bytes;
}

bool agree(Agreement agreement, const std::vector<uint8_t> &ours, const std::vector<uint8_t> &theirs) {
    if (agreement == Agreement::Exact)
        return ours == theirs;
    for (size_t i = 0; i < ours.size(); ++i) {
        if (i % 4 != 3 && ours[i] != theirs[i])
            return false;
    }
    return true;
}

// Marks those whose bytes should be ours and are not.
void compareBytes(std::vector<Runner> &runners, Places &places) {
    const auto bytesOf = [&](const Runner &runner) {
        places.reset();
        runner.works[0]();
        return rowsOf(places.job(0).dst);
    };
    const auto mustAgree = [](const Runner &runner) {
        return !runner.isLimit && runner.contender->agreement != Agreement::Approximate;
    };
    if (std::none_of(runners.begin() + 1, runners.end(), mustAgree))
        return;
    const std::vector<uint8_t> ours = bytesOf(runners.front());
    for (auto runner = runners.begin() + 1; runner != runners.end(); ++runner)
        runner->bytesDiffer =
            mustAgree(*runner) && !agree(runner->contender->agreement, ours, bytesOf(*runner));
}

std::vector<Runner> makeReady(const std::vector<Contender> &contenders, bool areLimits,
                              const Places &places) {
    std::vector<Runner> runners;
    for (const Contender &contender : contenders) {
        Runner runner = {&contender, areLimits, false, {}, 1, {}};
        for (size_t place = 0; place < places.count(); ++place)
            runner.works.push_back(contender.prepare(places.job(place)));
        runners.push_back(std::move(runner));
    }
    return runners;
}

// One turn of about the same length for each, after having warmed up.
void calibrate(std::vector<Runner> &runners, size_t &place) {
    for (Runner &runner : runners) {
        timed(runner, 2, place);
        const double seconds = std::max(timed(runner, 4, place), 1e-9);
        runner.calls = static_cast<size_t>(std::clamp(kTurnSeconds / seconds, 1.0, 1e6));
    }
}

Result resultOf(const Operation &operation, const std::vector<Runner> &runners) {
    const Runner &ours = runners.front();
    Result result = {
        operation.name, operation.family, operation.area, 1e9 * median(ours.seconds), {}, 0, 0};
    for (auto runner = runners.begin() + 1; runner != runners.end(); ++runner) {
        std::vector<double> ratios;
        for (size_t round = 0; round < ours.seconds.size(); ++round)
            ratios.push_back(runner->seconds[round] / ours.seconds[round]);
        const Standing standing = {runner->contender->name, 1e9 * median(runner->seconds),
                                   median(ratios), runner->isLimit, runner->bytesDiffer};
        double &best = standing.isLimit ? result.limitSpeed : result.peerSpeed;
        best = best == 0 ? standing.ourSpeed : std::min(best, standing.ourSpeed);
        result.others.push_back(standing);
    }
    return result;
}

void compare(benchmark::State &state, const Operation &operation, std::vector<Result> &results) {
    Places places(operation);
    const std::vector<Contender> limits = limitsOf(operation);
    std::vector<Runner> runners = makeReady(operation.contenders, false, places);
    std::vector<Runner> limitRunners = makeReady(limits, true, places);
    std::move(limitRunners.begin(), limitRunners.end(), std::back_inserter(runners));

    size_t place = 0;
    compareBytes(runners, places);
    calibrate(runners, place);
    size_t first = 0;
    for (auto _ : state) {
        for (size_t turn = 0; turn < runners.size(); ++turn) {
            Runner &runner = runners[(first + turn) % runners.size()];
            runner.seconds.push_back(timed(runner, runner.calls, place));
        }
        ++first;
        state.SetIterationTime(runners.front().seconds.back());
    }

    const Result result = resultOf(operation, runners);
    for (const Standing &other : result.others)
        state.counters["speed against " + other.name] = other.ourSpeed;
    results.push_back(result);
}

} // namespace

const Standing *Result::best(bool limit) const {
    const Standing *best = nullptr;
    for (const Standing &other : others) {
        if (other.isLimit == limit && (best == nullptr || other.ourSpeed < best->ourSpeed))
            best = &other;
    }
    return best;
}

void registerComparisons(const Plan &plan, std::vector<Result> &results) {
    for (const Operation &operation : plan) {
        const std::string name = operation.name + "/" + operation.area.name;
        benchmark::RegisterBenchmark(
            name.c_str(), [&](benchmark::State &state) { compare(state, operation, results); })
            ->UseManualTime()
            ->Iterations(kRounds);
    }
}

} // namespace quillon::bench
