// How the channels of a pixel become those of another format: all that can be worked
// out from the masks when this is compiled.
#pragma once

#include "convert/pixelFormats.h"

#include <algorithm>
#include <bit>
#include <cstddef>
#include <cstdint>

namespace quillon {

// ---- One pixel ------------------------------------------------------------

// A shift to the right, or to the left where the distance is negative.
constexpr uint32_t shiftRight(uint32_t value, int distance) {
    return distance >= 0 ? value >> distance : value << -distance;
}

// The bit just above a channel.
constexpr int channelEnd(uint32_t mask) {
    return static_cast<int>(std::bit_width(mask));
}

// A conversion is the Or of some moves of the pixel: shifted to the right (see
// above), and masked.
struct ChannelMove {
    int distance;
    uint32_t mask;
};
struct ChannelMoves {
    static constexpr size_t kMost = 24; // red, green and blue, each to 8 bits from 1
    ChannelMove moves[kMost];
    size_t count;
};

// Each channel is moved so that its top bit becomes the top bit of the new channel.
// Narrowing drops the low bits; widening repeats the channel in the new low bits, so
// that zero stays zero and the largest value the largest.  By these two rules a
// detour through wider channels gives the same bits as the direct way.
constexpr ChannelMoves channelMoves(const ChannelMasks &from, const ChannelMasks &to) {
    ChannelMoves all = {};
    const auto add = [&](int distance, uint32_t mask) {
        for (size_t i = 0; i < all.count; ++i)
            if (all.moves[i].distance == distance) {
                all.moves[i].mask |= mask;
                return;
            }
        all.moves[all.count++] = {distance, mask};
    };
    const auto addChannel = [&](uint32_t fromMask, uint32_t toMask) {
        int distance = channelEnd(fromMask) - channelEnd(toMask);
        uint32_t moved = shiftRight(fromMask, distance);
        for (uint32_t open = toMask; open != 0; open &= ~moved) {
            if (open != toMask) {
                distance += std::popcount(fromMask);
                moved >>= std::popcount(fromMask);
            }
            add(distance, moved & open);
        }
    };
    addChannel(from.red, to.red);
    addChannel(from.green, to.green);
    addChannel(from.blue, to.blue);
    return all;
}

template <PixelFormat kFrom, PixelFormat kTo>
inline constexpr ChannelMoves kChannelMoves = channelMoves(traitsOf(kFrom).masks,
                                                           traitsOf(kTo).masks);

// A pixel of one format in another.  Where the channels are the same, all bits of the
// pixel stay, whether or not they belong to a channel; else the others become 0.
template <PixelFormat kFrom, PixelFormat kTo, size_t kMove = 0>
constexpr uint32_t convertPixel(uint32_t pixel) {
    if constexpr (traitsOf(kFrom).masks == traitsOf(kTo).masks) {
        return pixel;
    } else if constexpr (kMove == kChannelMoves<kFrom, kTo>.count) {
        return 0;
    } else {
        constexpr ChannelMove move = kChannelMoves<kFrom, kTo>.moves[kMove];
        return (shiftRight(pixel, move.distance) & move.mask) |
               convertPixel<kFrom, kTo, kMove + 1>(pixel);
    }
}

// ---- Widening by products -------------------------------------------------

// Factors by which the channels of 16 bits become bytes.  A byte is the channel and
// below it, for the bits that are still open, the channel again: the upper bits of a
// product with two powers of two, that many apart.
struct WideningFactors {
    // Of 16 bits, shifted left until nothing but blue is left.  The byte is the upper
    // half of the 32-bit product.
    int blueShift;
    uint32_t blue;
    // Of 16 bits, shifted right until the smaller power is a whole number, and masked.
    // The byte is the upper one of the 16-bit product.
    int greenShift;
    uint32_t greenMask, green;
    // Of 16 bits, masked.  The byte is the upper half of the 32-bit product.
    uint32_t redMask, red;
};

// Nothing lies below blue.
constexpr WideningFactors wideningFactors(const ChannelMasks &from) {
    const auto factor = [](uint32_t mask, int power) {
        return 1U << power | 1U << (power - std::popcount(mask));
    };
    const int greenEnd = channelEnd(from.green);
    const int greenShift = std::max(0, greenEnd + std::popcount(from.green) - 16);
    return {.blueShift = 16 - channelEnd(from.blue),
            .blue = factor(from.blue, 8),
            .greenShift = greenShift,
            .greenMask = from.green >> greenShift,
            .green = factor(from.green, 16 - greenEnd + greenShift),
            .redMask = from.red,
            .red = factor(from.red, 24 - channelEnd(from.red))};
}

// ---- Narrowing by products ------------------------------------------------

// A narrower pixel is a weighted sum of the bytes of a 32-bit pixel, so many bits too
// far up that no weight of a channel is below 1: in one byte channels end at bit 2 or
// above, in two bytes at bit 5.  Formats of the same size differ by nothing but the
// weights.
constexpr int narrowingDistance(int32_t bytesPerPixel) {
    return bytesPerPixel == 1 ? 6 : 3;
}

struct NarrowingWeights {
    uint32_t mask;         // of the bits that survive
    uint32_t bytes, pairs; // as weightedByteSum takes them
};

// None for formats of more than two bytes.
constexpr NarrowingWeights narrowingWeights(const FormatTraits &format) {
    if (format.bytesPerPixel > 2)
        return {};
    const ChannelMasks &to = format.masks;
    const int red = channelEnd(to.red), green = channelEnd(to.green), blue = channelEnd(to.blue);
    const uint32_t mask = shiftRight(to.red, red - 24) | shiftRight(to.green, green - 16) |
                          shiftRight(to.blue, blue - 8);
    // Powers of two: the top of a byte goes to the end of its channel.  The weight of a
    // byte is at most 64, so that red can need that of its pair, too.
    const int up = narrowingDistance(format.bytesPerPixel) - 8;
    const int redOfByte = std::min(red + up, 6);
    return {mask, 1U << (blue + up) | 1U << (green + up + 8) | 1U << (redOfByte + 16),
            1U | 1U << (red + up - redOfByte + 16)};
}

} // namespace quillon
