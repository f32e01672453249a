#include "support/random.h"

#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <unistd.h>

namespace quillon::test {
namespace {

constexpr uint64_t kSeed = 20240229;

std::optional<uint64_t> numberFrom(const char *name) {
    const char *text = std::getenv(name); // NOLINT(concurrency-mt-unsafe): nobody sets it
    if (text == nullptr)
        return std::nullopt;
    return std::stoull(text);
}

// Written by the tests, read by the handler of a crash.
const char *volatile currentStep = nullptr;
volatile uint64_t currentNumber = 0;
const char *volatile currentTarget = nullptr;
struct sigaction previous;

// Says what crashed, and leaves the rest (a core, a sanitizer's report) to
// whoever was in charge before: the faulting instruction runs again.
void report(int /*signal*/) {
    char text[160];
    int length = snprintf(text, sizeof(text), "crashed: target %s, QUILLON_TEST_SEED=%llu",
                          currentTarget == nullptr ? "not set" : currentTarget,
                          static_cast<unsigned long long>(baseSeed()));
    const auto room = sizeof(text) - static_cast<size_t>(length);
    if (currentStep != nullptr)
        length += snprintf(text + length, room, " %s=%llu\n", currentStep,
                           static_cast<unsigned long long>(currentNumber));
    else
        length += snprintf(text + length, room, "\n");
    [[maybe_unused]] const ssize_t written =
        write(STDERR_FILENO, text, static_cast<size_t>(length));
    sigaction(SIGSEGV, &previous, nullptr);
}

void installReport() {
    [[maybe_unused]] static const bool once = [] {
        struct sigaction action = {};
        action.sa_handler = report;
        return sigaction(SIGSEGV, &action, &previous) == 0;
    }();
}

} // namespace

uint64_t baseSeed() {
    static const uint64_t seed = numberFrom("QUILLON_TEST_SEED").value_or(kSeed);
    return seed;
}

std::optional<uint64_t> onlyCase() {
    static const std::optional<uint64_t> number = numberFrom("QUILLON_TEST_CASE");
    return number;
}

void noteStep(const char *what, uint64_t number) {
    installReport();
    currentStep = what;
    currentNumber = number;
}

void noteTarget(const char *name) {
    currentTarget = name;
}

} // namespace quillon::test
