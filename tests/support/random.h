// Numbers at random that can be had again: from a seed, or from the bytes of a
// fuzzer's input.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <functional>
#include <initializer_list>
#include <optional>

namespace quillon::test {

class Random {
public:
    explicit Random(uint64_t seed) : state_(seed) {}

    // Takes numbers from an input, which has to stay: a byte for a small one.  What
    // comes behind its end, and the contents of memory, it decides by its sum alone.
    Random(const uint8_t *input, size_t size) : next_(input), end_(input + size) {
        for (size_t i = 0; i < size; ++i)
            state_ = (state_ ^ input[i]) * 0x100000001B3;
    }

    uint64_t bits() { return next_ == end_ ? generated() : taken(sizeof(uint64_t)); }

    uint32_t word() { return static_cast<uint32_t>(bits() >> 32); }

    // 0 to count - 1, close enough to evenly.
    uint32_t below(uint32_t count) {
        if (next_ == end_)
            return scaled(generated() >> 32, count, 32);
        const uint32_t bytes = count <= 1u << 8 ? 1 : count <= 1u << 16 ? 2 : 4;
        return scaled(taken(bytes), count, 8 * bytes);
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
        uint64_t word = 0;
        for (; size >= sizeof(word); size -= sizeof(word), bytes += sizeof(word)) {
            word = generated();
            std::memcpy(bytes, &word, sizeof(word));
        }
        for (word = size == 0 ? 0 : generated(); size > 0; --size, word >>= 8)
            *bytes++ = static_cast<uint8_t>(word);
    }

private:
    static uint32_t scaled(uint64_t value, uint32_t count, uint32_t valueBits) {
        return static_cast<uint32_t>((value * count) >> valueBits);
    }

    // SplitMix64: a counter, thoroughly mixed.
    uint64_t generated() {
        uint64_t z = state_ += 0x9E3779B97F4A7C15;
        z = (z ^ (z >> 30)) * 0xBF58476D1CE4E5B9;
        z = (z ^ (z >> 27)) * 0x94D049BB133111EB;
        return z ^ (z >> 31);
    }

    uint64_t taken(size_t bytes) {
        uint64_t value = 0;
        for (; bytes > 0 && next_ != end_; --bytes)
            value = value << 8 | *next_++;
        return value << (8 * bytes); // zeros behind the end
    }

    uint64_t state_ = 0;
    const uint8_t *next_ = nullptr, *end_ = nullptr;
};

// Runs run(random) for the cases 0 to count - 1, until one fails.  A case is drawn
// from its number and the seed alone, so a failure is reproduced by running that
// case by itself; another seed gives other cases:
//
//     QUILLON_TEST_SEED=<seed> QUILLON_TEST_CASE=<number> <test program>
//
// QUILLON_TEST_THINNING=<n> runs one n-th of them, where the processor is an emulated
// one.
void forEachCase(uint64_t count, const std::function<void(Random &)> &run);

uint64_t baseSeed(); // QUILLON_TEST_SEED, or a fixed one

// What is running, for the report of a crash (a fence that bit).
struct Running {
    const char *target = "any";
    uint64_t number = 0; // of the case
};
inline volatile Running running;

} // namespace quillon::test
