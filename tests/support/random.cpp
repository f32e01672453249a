#include "support/random.h"

#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <string>

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

} // namespace

volatile Running running;

void reportCrashes() {
    struct sigaction action = {};
    action.sa_handler = report;
    [[maybe_unused]] static const int once = sigaction(SIGSEGV, &action, &previous);
}

uint64_t baseSeed() {
    static const uint64_t seed = numberFrom("QUILLON_TEST_SEED").value_or(20240229);
    return seed;
}

std::optional<uint64_t> onlyCase() {
    static const std::optional<uint64_t> number = numberFrom("QUILLON_TEST_CASE");
    return number;
}

uint64_t thinned(uint64_t count) {
    static const uint64_t share = numberFrom("QUILLON_TEST_THINNING").value_or(1);
    return (count + share - 1) / share;
}

} // namespace quillon::test
