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
    switch (random.below(5)) {
    case 0:
        mantissa &= random.bits() & random.bits() & random.bits();
        break;
    case 1:
        mantissa |= random.bits() | random.bits() | random.bits();
        break;
    case 2:
        mantissa = (uint64_t{1} << 52) + static_cast<uint64_t>(random.between(-3, 3));
        break;
    case 3:
        mantissa = (uint64_t{1} << random.below(53)) - random.below(2);
        break;
    default:
        break;
    }
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
        EXPECT_EQ(actual.truncated(), static_cast<uint32>(static_cast<int64_t>(expected)));
    }
}

TEST(Extended, equalsTheHardware) {
    forEachCase(200000, [](Random &random) {
        const double a = hardDouble(random), b = hardDouble(random), c = hardDouble(random);
        SCOPED_TRACE(testing::Message() << std::hexfloat << a << " " << b << " " << c);
        const long double wideA = a, wideB = b, wideC = c;
        expectSame(Extended(a), wideA);
        expectSame(Extended(a) + Extended(b), wideA + wideB);
        expectSame(Extended(a) * Extended(b), wideA * wideB);
        if (b != 0)
            expectSame(Extended(a) / Extended(b), wideA / wideB);
        // With all 64 bits in use on one side: ties and long cancellations.
        expectSame(Extended(a) * Extended(b) + Extended(c), wideA * wideB + wideC);
        expectSame(Extended(a) * Extended(b) - Extended(a * b), wideA * wideB - a * b);
        if (b != 0 && c != 0)
            expectSame(Extended(a) / Extended(b) / Extended(c), wideA / wideB / wideC);
    });
}

TEST(Extended, equalsTheHardwareOnIntegers) {
    forEachCase(200000, [](Random &random) {
        const uint32 a = random.word() >> random.below(32), b = random.word() >> random.below(32);
        const auto c = static_cast<int32>(random.word()) >> random.below(32);
        const double scale = hardDouble(random);
        expectSame(Extended(a) * Extended(scale), static_cast<long double>(a) * scale);
        expectSame(Extended(c) * Extended(scale), static_cast<long double>(c) * scale);
        if (b != 0) {
            EXPECT_EQ(extendedQuotient(a, b), static_cast<double>(static_cast<long double>(a) / b));
        }
    });
}

#endif

TEST(Extended, knownValues) {
    const auto step = [](double scale) {
        return (Extended(65536.0) / Extended(scale)).truncated();
    };
    EXPECT_EQ(step(0.1), 655359u);
    EXPECT_EQ(step(0.2), 327679u);
    EXPECT_EQ(step(3.0), 21845u);
    EXPECT_EQ(step(65536.0), 1u);
    EXPECT_EQ(step(std::nextafter(65536.0, 1e9)), 0u);

    // A whole number only after rounding: the exact quotient lies just below.
    EXPECT_EQ(step(0x1.e51d6e711b4cbp+3), 4323u);

    EXPECT_EQ((Extended(int32{-7}) * Extended(0.5)).truncated(), static_cast<uint32>(-3));
    EXPECT_EQ(Extended(-0x1.8p40).truncated(), 0u);
    EXPECT_EQ(Extended(INT32_MIN).toDouble(), -0x1p31);
    EXPECT_EQ((Extended(1e308) * Extended(1e308)).toDouble(), HUGE_VAL);

    // Ties at the 64th bit, to the even neighbour on either side.
    const Extended one(1.0), halfUlp(0x1p-64), ulp(0x1p-63);
    EXPECT_EQ((one + halfUlp - one).toDouble(), 0);
    EXPECT_EQ((one + ulp + halfUlp - one).toDouble(), 0x1p-62);
    EXPECT_EQ((one + Extended(0x1.0000000000001p-64) - one).toDouble(), 0x1p-63);

    // Rounded twice: at 64 bits to the middle between two doubles, then to the
    // even one, where rounding once goes up.
    EXPECT_EQ((one + Extended(0x1p-53) + Extended(0x1p-70)).toDouble(), 1.0);
}

} // namespace
} // namespace quillon::test
