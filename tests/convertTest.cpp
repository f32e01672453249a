// Conversions between pixel layouts against their reference.

#include "reference/pixels.h"
#include "support/messages.h"
#include "support/surfaces.h"
#include <quillon/raster.h>

#include <numeric>

namespace quillon::test {
namespace {

constexpr int32_t kLayouts[] = {3, 6, 8, 15, 16, 24, 32};
constexpr int32_t kSources[] = {15, 16, 24, 32};

uint32_t bytesOf(int32_t depth) {
    return depth <= 8 ? 1 : static_cast<uint32_t>(depth + 1) / 8;
}

// From a layout, or a palette, to a layout.
struct Pair {
    int32_t srcDepth, dstDepth;
    bool pseudoColor;
    const uint32_t *palette = nullptr;
};

// By one of the functions that do the pair.
void convert(const Pair &pair, uint32_t way, const Surfaces &at, Size size) {
    const auto &[src, dst, pseudo, palette] = pair;
    const Surface &to = at[0], &from = at[1];
    const auto call = [&](auto function, auto... depths) {
        function(to.buffer, to.unsignedStride(), from.buffer, from.unsignedStride(), depths...,
                 from.x, from.y, to.x, to.y, size.width, size.height);
    };
    if (way == 1 && dst == 32)
        call(Raster_ConvertPixelsTo32, src, pseudo, palette);
    else if (way == 2 && dst == 32 && pseudo)
        call(Raster_ConvertIndexTo32, palette);
    else if (way == 2 && src == dst && !pseudo)
        call(RasterCopyPixels, src);
    else if (way != 0 && src == 32 && !pseudo)
        Raster_ConvertPixelsFrom32(to.buffer, to.unsignedStride(), dst, from.buffer,
                                   from.unsignedStride(), from.x, from.y, to.x, to.y, size.width,
                                   size.height);
    else
        Raster_ConvertPixels(to.buffer, to.unsignedStride(), dst, from.buffer,
                             from.unsignedStride(), src, pseudo, palette, from.x, from.y, to.x,
                             to.y, size.width, size.height);
}

uint32_t convertedByReference(const Pair &pair, uint32_t pixel) {
    const auto &[src, dst, pseudo, palette] = pair;
    if (pseudo)
        return reference::converted(palette[pixel], 32, dst);
    return src == dst ? pixel : reference::converted(pixel, src, dst);
}

// Palettes of which there are no entries but those that pixels use, on one side.
struct Palette {
    const FencedBuffer behindFence{256 * sizeof(uint32_t), FencedBuffer::Flush::kBefore};
    const FencedBuffer aheadOfFence{256 * sizeof(uint32_t)};

    // And the bytes that pixels may have.
    const uint32_t *draw(Random &random, Part &part) const {
        const bool isLow = random.oneIn(2);
        const FencedBuffer &colors = isLow ? aheadOfFence : behindFence;
        random.fill(colors.data(), colors.size());
        const uint32_t edge = random.below(256);
        part.low = isLow ? 0 : edge;
        part.count = isLow ? edge + 1 : 256 - edge;
        const uint8_t *first = isLow ? colors.end() - 4 * size_t{part.count} : colors.data();
        return reinterpret_cast<const uint32_t *>(first) - part.low;
    }
};

Operation conversion(Random &random, Pair pair, const Palette &palette) {
    Part src = {pair.pseudoColor ? 1 : bytesOf(pair.srcDepth)};
    if (pair.pseudoColor)
        pair.palette = palette.draw(random, src);
    const bool isCopy = !pair.pseudoColor && pair.srcDepth == pair.dstDepth;
    const bool isExact = isCopy || (pair.pseudoColor && pair.dstDepth == 32);
    src.rule = isExact ? RowRule::kExact : RowRule::kRounded;
    const uint32_t way = random.below(3);
    return {std::to_string(pair.srcDepth) + " to " + std::to_string(pair.dstDepth),
            {{bytesOf(pair.dstDepth), src.rule}, src},
            [=](const Surfaces &at, Size size) { convert(pair, way, at, size); },
            [=](const Pixels &old) { return convertedByReference(pair, old[1]); },
            isCopy ? Walk::kRowByRow : Walk::kForward,
            isCopy,
            false};
}

TEST(Convert, matchesReference) {
    const Palette palette;
    holdToReference(20000, [&](Random &random) {
        Pair pair = {random.oneOf(kSources), random.oneOf(kLayouts), random.oneIn(4)};
        if (pair.pseudoColor)
            pair.srcDepth = random.oneOf({8, 4, 0, -15, INT32_MIN}); // all mean one byte
        else if (random.oneIn(8))                                    // any depth can be copied
            pair.srcDepth = pair.dstDepth = random.oneOf({3, 8, 12, 15, 16, 20, 24, 32});
        return conversion(random, pair, palette);
    });
}

TEST(Convert, matchesReferenceOnLargeSurfaces) {
    const Palette palette;
    holdToReference(
        5 * 7,
        [&](Random &random) {
            const auto number = static_cast<uint32_t>(running.number);
            const int32_t srcDepth = number < 28 ? kSources[number / 7] : 8;
            return conversion(random, {srcDepth, kLayouts[number % 7], srcDepth == 8}, palette);
        },
        Shape::kLarge);
}

// All there is in 16 bits, as a rectangle and one by one.
TEST(Convert, every16BitPixel) {
    constexpr uint32_t kSide = 256;
    std::vector<uint16_t> pixels(kSide * kSide);
    std::iota(pixels.begin(), pixels.end(), uint16_t{0});
    for (const int32_t srcDepth : {15, 16})
        for (const int32_t dstDepth : kLayouts) {
            const Pair pair = {srcDepth, dstDepth, false};
            const uint32_t bytes = bytesOf(dstDepth), line = kSide * bytes;
            std::vector<uint8_t> expected(size_t{kSide} * line), dst(expected.size());
            for (uint32_t pixel = 0; pixel <= 0xFFFF; ++pixel) {
                const uint32_t wanted = convertedByReference(pair, pixel);
                std::memcpy(&expected[size_t{pixel} * bytes], &wanted, bytes);
                ASSERT_EQ(Raster_ConvertOnePixel(pixel, srcDepth, dstDepth, false, nullptr),
                          reference::convertedAlone(pixel, srcDepth, dstDepth));
            }
            forEachTarget([&] {
                convert(pair, 0,
                        {{dst.data(), nullptr, line, 0, 0},
                         {reinterpret_cast<uint8_t *>(pixels.data()), nullptr, 2 * kSide, 0, 0}},
                        {kSide, kSide});
                EXPECT_TRUE(dst == expected) << srcDepth << " to " << dstDepth;
            });
        }
}

TEST(ConvertOnePixel, matchesReference) {
    uint32_t palette[300]; // an index is not cut to a byte
    forEachCase(20000, [&](Random &random) {
        const uint32_t pixel = random.word(), index = random.below(300);
        const int32_t dst = random.oneOf(kLayouts), src = random.oneOf(kSources);
        palette[index] = pixel;
        EXPECT_EQ(Raster_ConvertOnePixel(pixel, src, dst, false, nullptr),
                  reference::convertedAlone(pixel, src, dst));
        EXPECT_EQ(Raster_ConvertOnePixel(index, 8, dst, true, palette),
                  reference::convertedAlone(pixel, 32, dst));
    });
    // And it is unsigned.
    const uint32_t entry = 0x12345678, index = 0xC0000001;
    const auto *far = reinterpret_cast<const uint32_t *>(reinterpret_cast<uintptr_t>(&entry) -
                                                         uint64_t{index} * sizeof(uint32_t));
    EXPECT_EQ(Raster_ConvertOnePixel(index, 8, 32, true, far), entry);
}

TEST(IsModeReasonable, isTrueForNoOtherMode) {
    int32_t reasonable = 0;
    for (int32_t depth = -2; depth <= 40; ++depth)
        for (int32_t bits = -2; bits <= 40; ++bits)
            reasonable += Raster_IsModeReasonable(depth, bits, false) ? depth * 100 + bits : 0;
    EXPECT_EQ(reasonable, 1516 + 1616 + 2424 + 2432);
    EXPECT_TRUE(Raster_IsModeReasonable(99, 8, true) && !Raster_IsModeReasonable(8, 16, true));
}

// Every channel that the limits allow: its bits, from the top, are those of the
// component over and over.
TEST(MakeRGBParam, placesEveryComponent) {
    Random random(baseSeed());
    for (uint32_t bits = 1; bits <= 31; ++bits)
        for (uint32_t width = 1; (width + bits - 1) / bits * bits <= 31; ++width)
            for (uint32_t low = 0; low + width <= 32; ++low) {
                const auto run = static_cast<uint32_t>(((uint64_t{1} << width) - 1) << low);
                // Further bits, not next to the run, are no part of the channel.
                const uint32_t above = ~static_cast<uint32_t>((uint64_t{2} << (low + width)) - 1);
                RasterRGBParam param = {};
                const uint32_t mask = run | (random.word() & above), most = (1u << bits) - 1;
                RasterRGB_MakeRGBParam(&param, static_cast<int32_t>(bits), mask);
                ASSERT_TRUE(param.mask == mask && param.shift < 32);
                ASSERT_TRUE(param.shift == 0 || param.multiplier % 2 == 1) << "not least";
                for (const uint32_t component : {1u, most, most / 2 + 1, random.word() & most}) {
                    uint32_t expected = 0;
                    for (uint32_t i = 0; i < width; ++i)
                        expected = expected << 1 | (component >> (bits - 1 - i % bits) & 1);
                    ASSERT_EQ(((component * param.multiplier) >> param.shift) & run,
                              expected << low)
                        << bits << " bits, mask " << mask << ", component " << component;
                }
            }
}

// What a failing call says, of one pixel and of a rectangle: the source is looked
// at first, both are ahead of any store.  Equal depths of any kind are a copy.
TEST(Convert, refusesUnknownDepths) {
    const FencedBuffer fence(1);
    const Surface nowhere = {fence.end(), fence.end(), 4, 0, 0};
    const uint32_t palette[] = {0};
    const auto refuses = [&](const std::string &text, const auto &call) {
        if (text.empty())
            return call();
        expectPanic("NOT_IMPLEMENTED lib/raster/rasterConv", call);
        EXPECT_EQ(warnings, Messages{"Raster convert " + text + '\n'});
    };
    const std::string one = "one pixel ", many = "pixels ", depth = "invalid depth ",
                      source = "invalid source depth ", pseudo = "invalid depth for pseudo color ";
    const std::tuple<Pair, std::string, std::string> cases[] = {
        {{15, 7, false}, one + depth + "7", many + depth + "7"},
        {{24, 33, false}, one + depth + "33", many + depth + "33"},
        {{32, -8, false}, one + depth + "-8", many + depth + "-8"},
        {{8, 7, true}, one + depth + "7", many + depth + "7"},
        {{8, 7, false}, one + source + "8", many + source + "8"},
        {{17, 32, false}, one + source + "17", many + source + "17"},
        {{9, 32, true}, many + pseudo + "9", many + pseudo + "9"},
        {{INT32_MIN, 1, true}, many + pseudo + "-2147483648", many + depth + "1"},
        {{-16, -16, false}, one + source + "-16", ""}};
    for (auto [pair, ofOne, ofMany] : cases) {
        pair.palette = palette;
        refuses(ofOne, [&, &c = pair] {
            Raster_ConvertOnePixel(0, c.srcDepth, c.dstDepth, c.pseudoColor, palette);
        });
        for (const uint32_t way : {0u, 1u})
            for (const uint32_t side : {0u, 1u})
                refuses(ofMany, [&, &c = pair] {
                    convert(c, way, {nowhere, nowhere}, {side, side});
                });
    }
}

} // namespace
} // namespace quillon::test
