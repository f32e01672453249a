// Random cases that can be had again.  A case is drawn from its number and the
// seed alone, so a failure is reproduced by running that case by itself:
//
//     QUILLON_TEST_SEED=<seed> QUILLON_TEST_CASE=<number> <test program>
//
// Another seed gives other cases.  QUILLON_TEST_THINNING=<n> runs one n-th of them,
// where the processor is an emulated one.
#pragma once

#include <gtest/gtest.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <initializer_list>
#include <optional>

namespace quillon::test {

class Random {
public:
    explicit Random(uint64_t seed) : state_(seed) {}

    uint64_t bits() {
        // SplitMix64: a counter, thoroughly mixed.
        uint64_t z = state_ += 0x9E3779B97F4A7C15;
        z = (z ^ (z >> 30)) * 0xBF58476D1CE4E5B9;
        z = (z ^ (z >> 27)) * 0x94D049BB133111EB;
        return z ^ (z >> 31);
    }

    uint32_t word() { return static_cast<uint32_t>(bits() >> 32); }

    // 0 to count - 1, close enough to evenly.
    uint32_t below(uint32_t count) {
        return static_cast<uint32_t>((uint64_t{word()} * count) >> 32);
    }

    // Both limits included.
    int32_t between(int32_t low, int32_t high) {
        const auto count = static_cast<uint32_t>(int64_t{high} - low + 1);
        return static_cast<int32_t>(low + int64_t{count == 0 ? word() : below(count)});
    }

    bool oneIn(uint32_t count) { return below(count) == 0; }

    template <class T>
    T oneOf(std::initializer_list<T> values) {
        return values.begin()[below(static_cast<uint32_t>(values.size()))];
    }
    template <class Values>
    auto oneOf(const Values &values) {
        return std::data(values)[below(static_cast<uint32_t>(std::size(values)))];
    }

    void fill(void *memory, size_t size) {
        auto *bytes = static_cast<uint8_t *>(memory);
        for (size_t i = 0; i < size; i += sizeof(uint64_t)) {
            const uint64_t word = bits();
            std::memcpy(bytes + i, &word, std::min(size - i, sizeof(word)));
        }
    }

private:
    uint64_t state_;
};

uint64_t baseSeed();                // QUILLON_TEST_SEED, or a fixed one
std::optional<uint64_t> onlyCase(); // QUILLON_TEST_CASE
uint64_t thinned(uint64_t count);   // QUILLON_TEST_THINNING

// What is running, for the report of a crash (a fence that bit).
struct Running {
    const char *target = "any";
    uint64_t number = 0; // of the case
};
extern volatile Running running;
void reportCrashes();

// Runs run(random) for the cases 0 to count - 1, until one fails.
template <class Run>
void forEachCase(uint64_t count, const Run &run) {
    reportCrashes();
    const std::optional<uint64_t> only = onlyCase();
    for (uint64_t number = only.value_or(0); number < (only ? *only + 1 : thinned(count));
         ++number) {
        running.number = number;
        // Mixed once more, lest neighbouring cases share their numbers.
        Random random(Random(baseSeed() + number).bits());
        run(random);
        if (testing::Test::HasFailure()) {
            ADD_FAILURE() << "QUILLON_TEST_SEED=" << baseSeed() << " QUILLON_TEST_CASE=" << number;
            break;
        }
    }
}

} // namespace quillon::test
