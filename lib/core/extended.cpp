#include "core/extended.h"

#include <bit>
#include <cmath>
#include <limits>
#include <utility>

namespace quillon {
namespace {

constexpr uint64_t kTopBit = uint64_t{1} << 63;

} // namespace

Extended Extended::normalised(bool negative, int exponent, uint64_t value) {
    if (value == 0)
        return {false, 0, 0};
    const int zeros = std::countl_zero(value);
    return {negative, exponent - zeros, value << zeros};
}

Extended Extended::rounded(bool negative, int exponent, uint64_t significand, uint64_t rest) {
    constexpr uint64_t kHalf = kTopBit;
    const bool isUp = rest > kHalf || (rest == kHalf && (significand & 1) != 0);
    if (isUp && ++significand == 0)
        return {negative, exponent + 1, kTopBit};
    return {negative, exponent, significand};
}

Extended Extended::rounded(bool negative, int exponent, Wide value) {
    const auto top = static_cast<uint64_t>(value >> 64);
    if (top == 0)
        return normalised(negative, exponent, static_cast<uint64_t>(value));
    const int zeros = std::countl_zero(top);
    value <<= zeros;
    return rounded(negative, exponent - zeros + 64, static_cast<uint64_t>(value >> 64),
                   static_cast<uint64_t>(value));
}

Extended::Extended(double value) : Extended(false, 0, 0) {
    // Sign, 11 bits of exponent, 52 of mantissa, which is lacking its top bit
    // unless the exponent is 0.
    const auto bits = std::bit_cast<uint64_t>(value);
    const auto exponent = static_cast<int>(bits >> 52 & 0x7FF);
    const uint64_t mantissa = bits & ((uint64_t{1} << 52) - 1);
    const bool negative = bits >> 63 != 0;
    *this = exponent == 0 ? normalised(negative, -1074, mantissa)
                          : Extended(negative, exponent - 1086, mantissa << 11 | kTopBit);
}

Extended Extended::negated() const {
    return {!negative_ && significand_ != 0, exponent_, significand_};
}

Extended operator+(Extended a, Extended b) {
    if (b.significand_ == 0)
        return a;
    if (a.significand_ == 0)
        return b;
    if (a.exponent_ < b.exponent_ ||
        (a.exponent_ == b.exponent_ && a.significand_ < b.significand_))
        std::swap(a, b);

    // One bit is left above for a carry.  Of what b loses below, it only counts
    // whether it was nothing: that is kept in the lowest bit, which lies far
    // behind the place of rounding.
    const Extended::Wide large = Extended::Wide{a.significand_} << 63;
    Extended::Wide small = Extended::Wide{b.significand_} << 63;
    const int distance = a.exponent_ - b.exponent_;
    if (distance >= 127) {
        small = 1;
    } else {
        const bool isExact = (small >> distance) << distance == small;
        small = (small >> distance) | (isExact ? 0 : 1);
    }
    return Extended::rounded(a.negative_, a.exponent_ - 63,
                             a.negative_ == b.negative_ ? large + small : large - small);
}

Extended operator*(Extended a, Extended b) {
    return Extended::rounded(a.negative_ != b.negative_, a.exponent_ + b.exponent_,
                             Extended::Wide{a.significand_} * b.significand_);
}

Extended operator/(Extended a, Extended b) {
    if (a.significand_ == 0)
        return a;
    // The shift makes a quotient of exactly 64 bits.
    const int shift = a.significand_ < b.significand_ ? 64 : 63;
    const Extended::Wide dividend = Extended::Wide{a.significand_} << shift;
    const auto quotient = static_cast<uint64_t>(dividend / b.significand_);
    const auto remainder =
        static_cast<uint64_t>(dividend - Extended::Wide{quotient} * b.significand_);

    // The bits behind the quotient, as far as rounding asks for them: nothing,
    // below a half, a half, above.
    const uint64_t toNext = b.significand_ - remainder;
    uint64_t rest = 0;
    if (remainder != 0)
        rest = remainder < toNext ? 1 : kTopBit + (remainder > toNext ? 1 : 0);
    return Extended::rounded(a.negative_ != b.negative_, a.exponent_ - b.exponent_ - shift,
                             quotient, rest);
}

double Extended::toDouble() const {
    constexpr int kDropped = 64 - std::numeric_limits<double>::digits;
    constexpr uint64_t kHalf = uint64_t{1} << (kDropped - 1);
    const uint64_t rest = significand_ & (2 * kHalf - 1);
    uint64_t kept = significand_ >> kDropped;
    if (rest > kHalf || (rest == kHalf && (kept & 1) != 0))
        ++kept;
    const double magnitude = std::ldexp(static_cast<double>(kept), exponent_ + kDropped);
    return negative_ ? -magnitude : magnitude;
}

uint32_t Extended::truncated() const {
    if (exponent_ <= -64 || exponent_ >= 32)
        return 0;
    const uint64_t whole = exponent_ < 0 ? significand_ >> -exponent_ : significand_ << exponent_;
    return static_cast<uint32_t>(negative_ ? 0 - whole : whole);
}

} // namespace quillon
