// Arithmetic with a 64-bit significand, rounded to nearest even: what the
// 80-bit format of the x87 gives, computed in integers, so that every processor
// gives the same.
//
// Scale factors are doubles, but what is derived from them is meant to be
// rounded at 64 bits and truncated after that: 65536.0 / 0.1 is 655359, where
// division of doubles gives 655360.  docs/numbers.md has the reasoning.
//
// Exponents have no limit that a few operations on doubles could reach, so
// nothing overflows and nothing becomes denormal.  There are no infinities (one
// counts as 2^1024) and no NaN; zero has no sign.
#pragma once

#include <cstdint>

namespace quillon {

class Extended {
public:
    // All exact.
    explicit Extended(double value); // no NaN
    explicit Extended(uint32_t value) : Extended(normalised(false, 0, value)) {}
    explicit Extended(int32_t value)
        : Extended(normalised(value < 0, 0,
                              value < 0 ? 0 - static_cast<uint32_t>(value)
                                        : static_cast<uint32_t>(value))) {}

    friend Extended operator+(Extended a, Extended b);
    friend Extended operator-(Extended a, Extended b) { return a + b.negated(); }
    friend Extended operator*(Extended a, Extended b);
    friend Extended operator/(Extended a, Extended b); // b must not be 0

    bool isNegative() const { return negative_; }

    // Rounded once more, to nearest even at 53 bits.  Infinite beyond the range
    // of double; below its normal range the last bit may be wrong.
    double toDouble() const;

    // Truncated towards zero; of the whole number the low 32 bits, in two's
    // complement.
    uint32_t truncated() const;

private:
    using Wide = unsigned __int128;

    Extended(bool negative, int exponent, uint64_t significand)
        : negative_(negative), exponent_(exponent), significand_(significand) {}

    // value * 2^exponent.
    static Extended normalised(bool negative, int exponent, uint64_t value);

    // The number nearest to value * 2^exponent.
    static Extended rounded(bool negative, int exponent, Wide value);

    // The number nearest to (significand + rest / 2^64) * 2^exponent; the
    // significand has its top bit set.
    static Extended rounded(bool negative, int exponent, uint64_t significand, uint64_t rest);

    Extended negated() const;

    bool negative_;
    int exponent_;
    // 0, or with its top bit set: the number is significand_ * 2^exponent_.
    uint64_t significand_;
};

// A quotient of sizes as a double, rounded at 64 bits on its way.
// The denominator must not be 0.
inline double extendedQuotient(uint32_t numerator, uint32_t denominator) {
    return (Extended(numerator) / Extended(denominator)).toDouble();
}

} // namespace quillon
