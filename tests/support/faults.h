// Memory that fails where a test wants it to.
//
// A test program that links this has its own malloc, calloc, realloc and free;
// not under a sanitizer, which brings its own.  And it has its own UtilSafeMalloc0,
// UtilSafeCalloc0 and DynBuf_Append, which pass on to libhearth's.  Blocks of
// UtilSafeMalloc0 come filled with kStale.
#pragma once

#include <gtest/gtest.h>
#include <hearth/hearth.h>

#include <cstdint>

namespace quillon::test {

inline constexpr uint8_t kStale = 0xA5;

// Bytes of such a block are undefined to valgrind until they are written.  Has it take
// these as they are, for a test of what nothing writes.
void acceptStale(const void *bytes, size_t size);

// UtilSafeMalloc0 gives null for more.
inline size_t mostBytesPerBlock = SIZE_MAX;

// While one lives, the n-th request for memory, from 0, fails: that one alone.
// All requests count, or only those to libhearth.
struct MemoryFault {
    explicit MemoryFault(uint64_t n, bool ofHearth = false);
    ~MemoryFault();
    MemoryFault(const MemoryFault &) = delete;
    MemoryFault &operator=(const MemoryFault &) = delete;

    uint64_t requestsLeft; // until the one that fails
    const bool isOfHearth;
    bool happened = false;
    // Blocks taken since construction and not given back, the bytes in them, and the
    // most that these have been.  0 under a sanitizer, which finds leaks itself.
    int64_t blocksHeld = 0, bytesHeld = 0, mostBytes = 0;
};

// Calls run() once for each request for memory it makes, with that one failing,
// and once more with none failing.  run() gives back what it got, and tells
// whether there was anything.  Returns the number of requests.
template <class Run>
uint64_t forEachMemoryFault(const Run &run) {
    uint64_t n = 0;
    for (bool failed = true; failed && !testing::Test::HasFailure(); n += failed ? 1 : 0) {
        const MemoryFault fault(n);
        const bool succeeded = run();
        failed = fault.happened;
        EXPECT_EQ(fault.blocksHeld, 0) << "request " << n;
        EXPECT_EQ(succeeded, !failed) << "request " << n;
    }
    return n;
}

} // namespace quillon::test
