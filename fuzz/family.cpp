// Random calls of one family of operations/, drawn from the input, on an instruction
// set that the input names.  Whatever differs from its plain statement is a finding,
// as is a Panic that no call asked for.
//
// QUILLON_FAMILY is the family's name.

#include "operations.h"
#include "support/judge.h"
#include "support/targets.h"

#include <cstdio>
#include <cstdlib>
#include <cstring>

using namespace quillon::test;

void quillon::test::forEachTarget(const std::function<void()> &run) {
    run();
}

void quillon::test::withoutMemory(const std::function<void()> &call) {
    call();
}

void quillon::test::compare(const void *actual, const void *expected, size_t size,
                            const std::function<std::string()> &description) {
    if (size == 0 || std::memcmp(actual, expected, size) == 0)
        return;
    fprintf(stderr, "on %s: %s; %s\n", running.target,
            firstDifference(actual, expected, size).c_str(), description().c_str());
    std::abort();
}

// Only the driver asks for memory all the time.
extern "C" const char *__asan_default_options() {
    return "malloc_context_size=2:quarantine_size_mb=4";
}

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size) {
    Random random(data, size);
    const OnTarget on(random.oneOf(kTargets));
    family::QUILLON_FAMILY(random);
    return 0;
}
