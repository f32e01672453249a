#include "comparison.h"

#include "arena.h"
#include "memoryLimits.h"

#include <hwy/targets.h>

#include <algorithm>
#include <chrono>

namespace quillon::bench {
namespace {

constexpr int kRounds = 21;
constexpr double kTurnSeconds = 150e-6;

struct Runner {
    Contender contender;
    std::vector<Work> works; // one a job
    size_t calls;            // in a turn
    std::vector<double> seconds;
};

std::vector<Runner> makeRunners(const Operation &operation, const std::vector<Job> &jobs) {
    std::vector<Contender> contenders = operation.contenders;
    std::ranges::move(limitsOf(operation), std::back_inserter(contenders));
    std::vector<Runner> runners;
    size_t place = 0;
    for (const Contender &contender : contenders) {
        Runner runner = {contender, {}, 1, {}};
        for (const Job &job : jobs)
            runner.works.push_back(contender.prepare(job));
        secondsPerCall(runner.works, 2, place);
        const double seconds = std::max(secondsPerCall(runner.works, 4, place), 1e-9);
        runner.calls = static_cast<size_t>(std::clamp(kTurnSeconds / seconds, 1.0, 1e6));
        runners.push_back(runner);
    }
    return runners;
}

// What the runner makes of the initial content.
std::vector<uint8_t> output(const Runner &runner, const Plane &plane, const Job &job) {
    const Buffer &dst = job.dst();
    plane.content(dst.data, dst.bytes());
    const Prepare &prepareCheck = runner.contender.prepareCheck;
    prepareCheck ? prepareCheck(job)() : runner.works[0]();
    std::vector<uint8_t> bytes;
    for (size_t y = 0; y < dst.height; ++y)
        bytes.insert(bytes.end(), dst.row(y), dst.row(y) + dst.rowBytes);
    return bytes;
}

double speed(const Runner &ours, const Runner &theirs) {
    std::vector<double> ratios;
    for (size_t round = 0; round < ours.seconds.size(); ++round)
        ratios.push_back(theirs.seconds[round] / ours.seconds[round]);
    return median(ratios);
}

void compare(benchmark::State &state, const Operation &operation, int64_t target,
             std::vector<Result> &results) {
    hwy::SetSupportedTargetsForTest(target);
    const std::vector<Job> jobs = makeJobs(operation);
    std::vector<Runner> runners = makeRunners(operation, jobs);
    const Runner &ours = runners[0];
    size_t place = 0, first = 0;
    for (auto _ : state) {
        for (size_t turn = 0; turn < runners.size(); ++turn) {
            Runner &runner = runners[(first + turn) % runners.size()];
            runner.seconds.push_back(secondsPerCall(runner.works, runner.calls, place));
        }
        ++first;
        state.SetIterationTime(ours.seconds.back());
    }
    Result result = {&operation, target, 1e9 * median(ours.seconds), {}, {}, false};
    state.counters["ns"] = result.nanoseconds;
    for (size_t i = 1; i < runners.size(); ++i) {
        const auto &[name, prepare, kind, prepareCheck] = runners[i].contender;
        Standing &best = kind == Kind::Limit ? result.limit : result.peer;
        const double beside = state.counters[name] = speed(ours, runners[i]);
        if (best.speed == 0 || beside < best.speed)
            best = {beside, name};
        if (kind == Kind::Exact && output(runners[i], operation.planes[0], jobs[0]) !=
                                       output(ours, operation.planes[0], jobs[0])) {
            result.bytesDiffer = true;
            state.SetLabel(text("the bytes of ", name, " differ"));
        }
    }
    results.push_back(result);
}

} // namespace

double secondsPerCall(const std::vector<Work> &works, size_t calls, size_t &place) {
    using Clock = std::chrono::steady_clock;
    const auto begin = Clock::now();
    for (size_t call = 0; call < calls; ++call) {
        works[place]();
        benchmark::ClobberMemory();
        if (++place == works.size())
            place = 0;
    }
    const std::chrono::duration<double> elapsed = Clock::now() - begin;
    return elapsed.count() / static_cast<double>(calls);
}

double median(std::vector<double> values) {
    const auto middle = values.begin() + static_cast<ptrdiff_t>(values.size() / 2);
    std::nth_element(values.begin(), middle, values.end());
    return *middle;
}

void registerComparisons(const std::vector<Operation> &operations, int64_t target,
                         std::vector<Result> &results) {
    for (const Operation &operation : operations) {
        const auto run = [&operation, target, &results](benchmark::State &state) {
            compare(state, operation, target, results);
        };
        benchmark::RegisterBenchmark(
            text(hwy::TargetName(target), "/", operation.name, "/", operation.area.name).c_str(),
            run)
            ->UseManualTime()
            ->Iterations(kRounds);
    }
}

} // namespace quillon::bench
