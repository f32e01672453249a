// What the compiler works out for a pair of pixel formats, for masks that no format has:
// the next format may have them.

#include "convert/channels.h"
#include "support/random.h"

#include <gtest/gtest.h>

namespace quillon::test {
namespace {

// Bit i of a wider or narrower channel, from the top, is bit i of the channel, which
// begins again where it ends.
uint32_t resized(uint32_t pixel, uint32_t from, uint32_t to) {
    uint32_t result = 0;
    for (int i = 0; i < std::popcount(to); ++i) {
        const int bit = channelEnd(from) - 1 - i % std::popcount(from);
        result |= (pixel >> bit & 1) << (channelEnd(to) - 1 - i);
    }
    return result;
}

uint32_t resized(uint32_t pixel, const ChannelMasks &from, const ChannelMasks &to) {
    return resized(pixel, from.red, to.red) | resized(pixel, from.green, to.green) |
           resized(pixel, from.blue, to.blue);
}

uint32_t maskOf(int begin, int end) {
    return (1U << end) - (1U << begin);
}

// Three channels of so many bits each, in any order, with gaps.
ChannelMasks masksOf(Random &random, int leastBits, int mostBits, int pixelBits) {
    for (;;) {
        uint32_t masks[3];
        for (uint32_t &mask : masks) {
            const int bits = random.between(leastBits, std::min(mostBits, pixelBits));
            const int begin = random.between(0, pixelBits - bits);
            mask = maskOf(begin, begin + bits);
        }
        if ((masks[0] & masks[1]) == 0 && ((masks[0] | masks[1]) & masks[2]) == 0)
            return {masks[0], masks[1], masks[2]};
    }
}

constexpr int kTrials = 20000;

TEST(Channels, areMovedAndRepeated) {
    Random random(1);
    for (int trial = 0; trial < kTrials; ++trial) {
        const int fromBits = random.between(3, 31);
        const ChannelMasks from = masksOf(random, 1, 8, fromBits);
        const ChannelMasks to = masksOf(random, 1, 8, random.between(3, 31));
        const ChannelMoves moves = channelMoves(from, to);
        const uint32_t pixel = random.word();
        uint32_t moved = 0;
        for (size_t i = 0; i < moves.count; ++i)
            moved |= shiftRight(pixel, moves.moves[i].distance) & moves.moves[i].mask;
        ASSERT_EQ(moved, resized(pixel, from, to)) << "trial " << trial;
    }
}

TEST(Channels, widenByProducts) {
    Random random(2);
    for (int trial = 0; trial < kTrials; ++trial) {
        const int blueEnd = random.between(4, 8),
                  greenEnd = blueEnd + random.between(4, 16 - blueEnd - 4);
        const ChannelMasks from = {maskOf(std::max(greenEnd, 16 - random.between(4, 8)), 16),
                                   maskOf(std::max(blueEnd, greenEnd - 8), greenEnd),
                                   maskOf(0, blueEnd)};
        const WideningFactors factors = wideningFactors(from);
        const uint32_t pixel = random.below(0x10000);
        const uint32_t blue = (pixel << factors.blueShift & 0xFFFF) * factors.blue >> 16;
        const uint32_t green = (pixel >> factors.greenShift & factors.greenMask) * factors.green;
        const uint32_t red = (pixel & factors.redMask) * factors.red >> 16;
        ASSERT_EQ(red << 16 | (green & 0xFF00) | blue, resized(pixel, from, kMasksOfBytes))
            << std::hex << from.red << ' ' << from.green << ' ' << from.blue;
    }
}

TEST(Channels, narrowByProducts) {
    Random random(3);
    for (int trial = 0; trial < kTrials;) {
        const int32_t bytes = random.between(1, 2);
        const ChannelMasks to = masksOf(random, 1, 8, 8 * bytes);
        // What the products can do: see narrowingDistance.
        const int least = bytes == 1 ? 2 : 5, most = bytes == 1 ? 8 : 11;
        const int blue = channelEnd(to.blue), green = channelEnd(to.green);
        if (std::min({blue, green, channelEnd(to.red)}) < least || std::max(blue, green) > most)
            continue;
        ++trial;
        const NarrowingWeights weights =
            narrowingWeights({PixelFormat::kNone, kNoDepth, bytes, to, false, true, false});
        const uint32_t pixel = random.word(), bits = pixel & weights.mask;
        const auto product = [&](int byte) {
            return (bits >> 8 * byte & 0xFF) * (weights.bytes >> 8 * byte & 0xFF);
        };
        ASSERT_LT(product(0) + product(1), 0x8000U);
        const uint32_t sum = (product(0) + product(1)) * (weights.pairs & 0xFFFF) +
                             product(2) * (weights.pairs >> 16);
        ASSERT_EQ(sum >> narrowingDistance(bytes), resized(pixel, kMasksOfBytes, to))
            << std::hex << to.red << ' ' << to.green << ' ' << to.blue;
    }
}

} // namespace
} // namespace quillon::test
