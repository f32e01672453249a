// The 64-bit arithmetic against a processor that has it, and a few results that
// every processor has to give.

#include "core/extended.h"
#include "support/random.h"

#include <cfloat>
#include <cmath>

namespace quillon::test {
namespace {

#if LDBL_MANT_DIG == 64

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

void expectSame(Extended actual, long double expected) {
    // Together they show all 64 bits: the double, and what it leaves.
    const auto high = static_cast<double>(expected);
    const auto low = static_cast<double>(expected - high);
    EXPECT_EQ(actual.toDouble(), high);
    EXPECT_EQ((actual - Extended(high)).toDouble(), low);
    EXPECT_EQ(actual.isNegative(), expected < 0);
    if (std::fabs(expected) < 0x1p63L) {
        EXPECT_EQ(actual.truncated(), static_cast<uint32_t>(static_cast<int64_t>(expected)));
    }
}

TEST(Extended, equalsTheHardware) {
    forEachCase(200000, [](Random &random) {
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
        EXPECT_EQ(extendedQuotient(m, n), static_cast<double>(static_cast<long double>(m) / n));
    });
}

#endif

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
