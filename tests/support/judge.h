// What the programs that try cases of operations/ do each in their own way:
//
//                   tests                    fuzzers               fingerprint
//
//   forEachTarget   on all that there are    on one of the input   on the one in use
//   withoutMemory   fails where some is      just calls            just calls
//                   asked for
//   compare         fails the test           ends the program      adds what came to
//                                                                  the sum
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <string>

namespace quillon::test {

// Runs it on instruction sets.
void forEachTarget(const std::function<void()> &run);

// Makes a call that may not ask for memory.
void withoutMemory(const std::function<void()> &call);

// Looks at bytes that came of a call, beside those that should have.
void compare(const void *actual, const void *expected, size_t size,
             const std::function<std::string()> &description);

// The same for a number, or a record without padding.
template <class T>
void compare(const T &actual, const T &expected, const char *description) {
    compare(&actual, &expected, sizeof(T), [=] { return description; });
}

// Says where bytes differ.
inline std::string firstDifference(const void *actual, const void *expected, size_t size) {
    const auto *a = static_cast<const uint8_t *>(actual);
    const auto at = static_cast<size_t>(
        std::mismatch(a, a + size, static_cast<const uint8_t *>(expected)).first - a);
    return "byte " + std::to_string(at) + " of " + std::to_string(size) + " is " +
           std::to_string(a[at]) + ", should be " +
           std::to_string(static_cast<const uint8_t *>(expected)[at]);
}

} // namespace quillon::test
