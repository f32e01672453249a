// What a raster operation does, worked out from its code.
#pragma once

#include <quillon/raster.h>

#include <cstdint>

namespace quillon {

// The result for one bit of source and destination: the code is its truth table.
constexpr bool ropBit(uint32_t rop, bool s, bool d) {
    return (rop >> (3 - (2 * int{s} + int{d})) & 1) != 0;
}

// Against a constant S, each bit of D is kept, or inverted, or replaced by 0 or
// 1: D becomes (D & keep) ^ flip.
struct RopConstant {
    uint32_t keep;
    uint32_t flip;
};

constexpr RopConstant ropConstant(uint32_t rop, uint32_t s) {
    const auto all = [](bool bit) { return bit ? ~uint32_t{0} : uint32_t{0}; };
    const auto flip = [&](bool sBit) { return all(ropBit(rop, sBit, false)); };
    const auto keep = [&](bool sBit) { return flip(sBit) ^ all(ropBit(rop, sBit, true)); };
    return {(s & keep(true)) | (~s & keep(false)), (s & flip(true)) | (~s & flip(false))};
}

constexpr bool ropIgnoresDestination(uint32_t rop) {
    return ropBit(rop, false, false) == ropBit(rop, false, true) &&
           ropBit(rop, true, false) == ropBit(rop, true, true);
}

constexpr bool ropIgnoresSource(uint32_t rop) {
    return ropBit(rop, false, false) == ropBit(rop, true, false) &&
           ropBit(rop, false, true) == ropBit(rop, true, true);
}

constexpr bool ropDoesNothing(uint32_t rop) {
    return rop > RASTER_ROP_SET || rop == RASTER_ROP_NOOP;
}

} // namespace quillon
