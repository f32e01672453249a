// The 64-bit arithmetic against a processor that has it, and results that every
// processor has to give.

#include "core/extended.h"
#include "support/longDouble.h"
#include "support/random.h"

#include <bit>
#include <cfloat>
#include <cmath>
#include <gtest/gtest.h>

namespace quillon::test {
namespace {

// Doubles that are hard to round: few bits, runs of ones, neighbours of powers
// of two, and any bits at all; mostly of similar size, so that sums interact.
double hardDouble(Random &random) {
    uint64_t mantissa = random.bits() >> 11;
    if (random.oneIn(3))
        mantissa &= random.bits() & random.bits() & random.bits();
    else if (random.oneIn(3))
        mantissa |= random.bits() | random.bits() | random.bits();
    else if (random.oneIn(2))
        mantissa = (uint64_t{1} << random.below(53)) + static_cast<uint64_t>(random.between(-3, 3));
    const int range = random.oneIn(4) ? 300 : 16;
    const double value =
        std::ldexp(static_cast<double>(mantissa), random.between(-range, range) - 52);
    return random.oneIn(2) ? -value : value;
}

uint64_t checksum; // of all results

void expectSame(Extended actual, long double expected) {
    // Together they show all 64 bits: the double, and what it leaves.
    const double high = actual.toDouble(), low = (actual - Extended(high)).toDouble();
    for (const uint64_t part : {std::bit_cast<uint64_t>(high), std::bit_cast<uint64_t>(low),
                                uint64_t{actual.isNegative()}, uint64_t{actual.truncated()}})
        checksum = Random(checksum ^ part).bits();
    if (LDBL_MANT_DIG != 64)
        return;
    EXPECT_EQ(high, static_cast<double>(expected));
    EXPECT_EQ(low, static_cast<double>(expected - high));
    EXPECT_EQ(actual.isNegative(), expected < 0);
    if (std::fabs(expected) < 0x1p63L) {
        EXPECT_EQ(actual.truncated(), static_cast<uint32_t>(static_cast<int64_t>(expected)));
    }
}

void checkOperations(Random &random) {
    const double a = hardDouble(random), b = hardDouble(random), c = hardDouble(random);
    const uint32_t m = random.word() >> random.below(32), n = 1 + (m >> random.below(32));
    const auto i = static_cast<int32_t>(random.word()) >> random.below(32);
    const long double wideA = a, wideB = b;
    expectSame(Extended(a), wideA);
    expectSame(Extended(a) + Extended(b), wideA + wideB);
    expectSame(Extended(m) * Extended(b), m * wideB);
    expectSame(Extended(i) * Extended(b), i * wideB);
    // With all 64 bits in use on one side: ties and long cancellations.
    expectSame(Extended(a) * Extended(b) + Extended(c), wideA * wideB + c);
    expectSame(Extended(a) * Extended(b) - Extended(a * b), wideA * wideB - a * b);
    if (b != 0 && c != 0)
        expectSame(Extended(a) / Extended(b) / Extended(c), wideA / wideB / c);
    expectSame(Extended(extendedQuotient(m, n)), static_cast<double>(in80Bits(1.0L * m / n)));
}

TEST(Extended, equalsTheHardware) {
    forEachCase(200000, checkOperations);
}

TEST(Extended, isTheSameOnEveryProcessor) {
    checksum = 0;
    Random random(1);
    for (int i = 0; i < 10000; ++i)
        checkOperations(random);
    EXPECT_EQ(checksum, 4954589746176389372u); // as on x86-64, where the hardware agrees
}

TEST(Extended, knownValues) {
    // A whole number only after rounding: the exact quotient lies just below.
    EXPECT_EQ((Extended(65536.0) / Extended(0x1.e51d6e711b4cbp+3)).truncated(), 4323u);
    EXPECT_EQ((Extended(1e308) * Extended(1e308)).toDouble(), HUGE_VAL);
    // A tie at the 64th bit, to the even neighbour above.
    const Extended one(1.0), halfUlp(0x1p-64), ulp(0x1p-63);
    EXPECT_EQ((one + ulp + halfUlp - one).toDouble(), 0x1p-62);
    // Rounded twice: at 64 bits to the middle between two doubles, then to the
    // even one, where rounding once goes up.
    EXPECT_EQ((one + Extended(0x1p-53) + Extended(0x1p-70)).toDouble(), 1.0);
}

} // namespace
} // namespace quillon::test
