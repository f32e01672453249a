// The judge of the tests.

#include "support/judge.h"

#include "support/faults.h"
#include "support/random.h"
#include "support/targets.h"

#include <gtest/gtest.h>

#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <cstring>

namespace quillon::test {
namespace {

std::optional<uint64_t> numberFrom(const char *name) {
    const char *text = std::getenv(name); // NOLINT(concurrency-mt-unsafe): nobody sets it
    return text == nullptr ? std::nullopt : std::optional<uint64_t>(std::stoull(text));
}

struct sigaction previous;

// Says what crashed, and leaves the rest (a core, a sanitizer's report) to
// whoever was in charge before: the faulting instruction runs again.
void report(int /*signal*/) {
    fprintf(stderr, "crashed: target %s, QUILLON_TEST_SEED=%ju QUILLON_TEST_CASE=%ju\n",
            running.target, uintmax_t{baseSeed()}, uintmax_t{running.number});
    sigaction(SIGSEGV, &previous, nullptr);
}

void reportCrashes() {
    struct sigaction action = {};
    action.sa_handler = report;
    [[maybe_unused]] static const int once = sigaction(SIGSEGV, &action, &previous);
}

} // namespace

uint64_t baseSeed() {
    static const uint64_t seed = numberFrom("QUILLON_TEST_SEED").value_or(20240229);
    return seed;
}

void forEachCase(uint64_t count, const std::function<void(Random &)> &run) {
    reportCrashes();
    static const std::optional<uint64_t> only = numberFrom("QUILLON_TEST_CASE");
    static const uint64_t share = numberFrom("QUILLON_TEST_THINNING").value_or(1);
    const uint64_t end = only ? *only + 1 : (count + share - 1) / share;
    for (uint64_t number = only.value_or(0); number < end; ++number) {
        running.number = number;
        // Mixed once more, so that neighbouring cases do not share their numbers.
        Random random(Random(baseSeed() + number).bits());
        run(random);
        if (testing::Test::HasFailure()) {
            ADD_FAILURE() << "QUILLON_TEST_SEED=" << baseSeed() << " QUILLON_TEST_CASE=" << number;
            break;
        }
    }
}

void forEachTarget(const std::function<void()> &run) {
    ASSERT_FALSE(kTargets.empty());
    for (const int64_t target : kTargets) {
        const OnTarget on(target);
        SCOPED_TRACE(hwy::TargetName(target));
        run();
        if (testing::Test::HasFailure())
            return;
    }
}

void withoutMemory(const std::function<void()> &call) {
    const MemoryFault none(UINT64_MAX);
    call();
    EXPECT_EQ(none.requestsLeft, UINT64_MAX) << "memory was asked for";
}

void compare(const void *actual, const void *expected, size_t size,
             const std::function<std::string()> &description) {
    if (size != 0 && std::memcmp(actual, expected, size) != 0)
        ADD_FAILURE() << firstDifference(actual, expected, size) << "; " << description();
}

} // namespace quillon::test
