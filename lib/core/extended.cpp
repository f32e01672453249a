#include "core/extended.h"

#include <bit>
#include <cmath>
#include <limits>
#include <utility>

namespace quillon {
namespace {

constexpr uint64_t kHalf = uint64_t{1} << 63;

} // namespace

Extended::Extended(bool negative, int exponent, Wide value)
    : negative_(false), exponent_(0), significand_(0) {
    if (value == 0)
        return;
    const auto top = static_cast<uint64_t>(value >> 64);
    const int zeros =
        top != 0 ? std::countl_zero(top) : 64 + std::countl_zero(static_cast<uint64_t>(value));
    value <<= zeros;
    negative_ = negative;
    exponent_ = exponent - zeros + 64;
    significand_ = static_cast<uint64_t>(value >> 64);
    const auto rest = static_cast<uint64_t>(value);
    if (rest > kHalf || (rest == kHalf && (significand_ & 1) != 0)) {
        if (++significand_ == 0) {
            significand_ = kHalf;
            ++exponent_;
        }
    }
}

Extended::Extended(double value) : negative_(false), exponent_(0), significand_(0) {
    int exponent = 0;
    const double fraction = std::frexp(std::fabs(value), &exponent);
    // 53 bits at most, so the product is a whole number.
    *this = Extended(std::signbit(value), exponent - 64,
                     static_cast<uint64_t>(std::ldexp(fraction, 64)));
}

Extended Extended::negated() const {
    Extended result = *this;
    result.negative_ = !negative_ && significand_ != 0;
    return result;
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
    return {a.negative_, a.exponent_ - 63,
            a.negative_ == b.negative_ ? large + small : large - small};
}

Extended operator*(Extended a, Extended b) {
    return {a.negative_ != b.negative_, a.exponent_ + b.exponent_,
            Extended::Wide{a.significand_} * b.significand_};
}

Extended operator/(Extended a, Extended b) {
    // The shift makes a quotient of exactly 64 bits.
    const int shift = a.significand_ < b.significand_ ? 64 : 63;
    const Extended::Wide dividend = Extended::Wide{a.significand_} << shift;
    const auto quotient = static_cast<uint64_t>(dividend / b.significand_);
    const auto remainder =
        static_cast<uint64_t>(dividend - Extended::Wide{quotient} * b.significand_);

    // The bits behind the quotient, as far as rounding asks for them: nothing,
    // below a half, a half, above.
    const uint64_t toHalf = b.significand_ - remainder;
    uint64_t rest = 0;
    if (remainder != 0)
        rest = remainder < toHalf ? 1 : kHalf + (remainder > toHalf ? 1 : 0);
    return {a.negative_ != b.negative_, a.exponent_ - b.exponent_ - shift - 64,
            (Extended::Wide{quotient} << 64) | rest};
}

double Extended::toDouble() const {
    constexpr int kDropped = 64 - std::numeric_limits<double>::digits;
    constexpr uint64_t kDroppedHalf = uint64_t{1} << (kDropped - 1);
    const uint64_t rest = significand_ & (2 * kDroppedHalf - 1);
    uint64_t kept = significand_ >> kDropped;
    if (rest > kDroppedHalf || (rest == kDroppedHalf && (kept & 1) != 0))
        ++kept;
    const double magnitude = std::ldexp(static_cast<double>(kept), exponent_ + kDropped);
    return negative_ ? -magnitude : magnitude;
}

uint32 Extended::truncated() const {
    if (exponent_ <= -64 || exponent_ >= 32)
        return 0;
    const uint64_t whole = exponent_ < 0 ? significand_ >> -exponent_ : significand_ << exponent_;
    return static_cast<uint32>(negative_ ? 0 - whole : whole);
}

} // namespace quillon
