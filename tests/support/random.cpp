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
    const char *text = std::getenv(name);
    if (text == nullptr)
        return std::nullopt;
    return std::stoull(text);
}

// Written by the cases, read by the handler of a crash.
volatile uint64_t currentCase = 0;
const char *volatile currentTarget = "every target";
struct sigaction previous;

// Says which case crashed, and leaves the rest (a core, a sanitizer's report) to
// whoever was in charge before: the faulting instruction runs again.
void report(int) {
    char text[160];
    const int length = snprintf(text, sizeof(text),
                                "crashed on %s: QUILLON_TEST_SEED=%llu QUILLON_TEST_CASE=%llu\n",
                                currentTarget, static_cast<unsigned long long>(baseSeed()),
                                static_cast<unsigned long long>(currentCase));
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

void noteCase(uint64_t number) {
    installReport();
    currentCase = number;
}

void noteTarget(const char *name) {
    currentTarget = name;
}

} // namespace quillon::test
