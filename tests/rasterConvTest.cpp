// Conversions between pixel layouts against their reference.

#include "raster.h"
#include "reference/raster.h"
#include "support/messages.h"
#include "support/surfaces.h"

#include <map>
#include <numeric>
#include <set>

namespace quillon::test {
namespace {

constexpr int32 kLayouts[] = {3, 6, 8, 15, 16, 24, 32};
constexpr int32 kSources[] = {15, 16, 24, 32};

bool isOneOf(const auto &depths, int32 depth) {
    return std::find(std::begin(depths), std::end(depths), depth) != std::end(depths);
}

uint32 bytesOf(int32 depth) {
    return depth <= 8 ? 1 : static_cast<uint32>(depth + 1) / 8;
}

// From a layout, or a palette, to a layout.
struct Pair {
    int32 srcDepth, dstDepth;
    bool pseudoColor;
    const uint32 *palette;
};

// By one of the functions that do the pair.
void convert(const Pair &pair, uint32 way, const Surfaces &at, Size size) {
    const auto &[src, dst, pseudo, palette] = pair;
    const Surface &to = at[0], &from = at[1];
    const auto call = [&](auto function, auto... depths) {
        function(to.buffer, to.unsignedLine(), from.buffer, from.unsignedLine(), depths..., from.x,
                 from.y, to.x, to.y, size.width, size.height);
    };
    if (way == 1 && dst == 32)
        call(Raster_ConvertPixelsTo32, src, pseudo, palette);
    else if (way == 2 && dst == 32 && pseudo)
        call(Raster_ConvertIndexTo32, palette);
    else if (way == 2 && src == dst && !pseudo)
        call(RasterCopyPixels, src);
    else if (way != 0 && src == 32 && !pseudo)
        Raster_ConvertPixelsFrom32(to.buffer, to.unsignedLine(), dst, from.buffer,
                                   from.unsignedLine(), from.x, from.y, to.x, to.y, size.width,
                                   size.height);
    else
        Raster_ConvertPixels(to.buffer, to.unsignedLine(), dst, from.buffer, from.unsignedLine(),
                             src, pseudo, palette, from.x, from.y, to.x, to.y, size.width,
                             size.height);
}

void convertByReference(const Pair &pair, uint32 /*way*/, const Surfaces &at, Size size) {
    reference::convertPixels(at[0].buffer, at[0].unsignedLine(), pair.dstDepth, at[1].buffer,
                             at[1].unsignedLine(), pair.srcDepth, pair.pseudoColor, pair.palette,
                             at[1].x, at[1].y, at[0].x, at[0].y, size.width, size.height);
}

TEST(ConvertPixels, matchesReference) {
    const FencedBuffer colors(256 * sizeof(uint32));
    const FencedBuffer highColors(256 * sizeof(uint32), FencedBuffer::Flush::kBefore);
    holdToReference(20000, [&](Random &random) {
        Pair pair = {kSources[random.below(4)], kLayouts[random.below(7)], random.oneIn(4),
                     nullptr};
        if (random.oneIn(8))
            pair.srcDepth = pair.dstDepth;
        if (!pair.pseudoColor && pair.srcDepth <= 8)
            pair.dstDepth = pair.srcDepth;
        Part src = {pair.pseudoColor ? 1 : bytesOf(pair.srcDepth)};
        if (pair.pseudoColor) {
            pair.srcDepth = random.oneOf({8, 4, 0, -15, INT32_MIN}); // all mean one byte
            // There are no entries but those that pixels use, on one side at least.
            const uint32 edge = random.below(256);
            if (random.oneIn(2)) {
                src.count = edge + 1;
                random.fill(colors.data(), colors.size());
                pair.palette = reinterpret_cast<const uint32 *>(colors.end()) - src.count;
            } else {
                src.low = edge;
                src.count = 256 - edge;
                random.fill(highColors.data(), highColors.size());
                pair.palette = reinterpret_cast<const uint32 *>(highColors.data()) - src.low;
            }
        }
        const bool isCopy = !pair.pseudoColor && pair.srcDepth == pair.dstDepth;
        const bool isExact = isCopy || (pair.pseudoColor && pair.dstDepth == 32);
        src.rule = isExact ? RowRule::kExact : RowRule::kRounded;
        const uint32 way = random.below(3);
        Operation operation(
            std::to_string(pair.srcDepth) + " to " + std::to_string(pair.dstDepth),
            {{bytesOf(pair.dstDepth), src.rule}, src}, convert, convertByReference,
            [=](auto function, const Surfaces &at, Size size) { function(pair, way, at, size); });
        operation.mayOverlap = isCopy;
        operation.isSigned = false;
        return operation;
    });
}

// All there is in 16 bits, as a rectangle and one by one.
TEST(ConvertPixels, every16BitPixel) {
    constexpr uint32 kSide = 256;
    std::vector<uint16> pixels(kSide * kSide);
    std::iota(pixels.begin(), pixels.end(), uint16{0});
    for (const int32 srcDepth : {15, 16})
        for (const int32 dstDepth : kLayouts) {
            const Pair pair = {srcDepth, dstDepth, false, nullptr};
            const auto converted = [&](auto function) {
                const uint32 line = kSide * bytesOf(dstDepth);
                std::vector<uint8> dst(size_t{kSide} * line);
                function(pair, 0,
                         {{dst.data(), dst.data(), line, 0, 0},
                          {reinterpret_cast<uint8 *>(pixels.data()), nullptr, 2 * kSide, 0, 0}},
                         {kSide, kSide});
                return dst;
            };
            const std::vector<uint8> expected = converted(convertByReference);
            forEachTarget([&] { EXPECT_TRUE(converted(convert) == expected) << dstDepth; });
            for (uint32 pixel = 0; pixel <= 0xFFFF; ++pixel)
                ASSERT_EQ(Raster_ConvertOnePixel(pixel, srcDepth, dstDepth, false, nullptr),
                          reference::convertOnePixel(pixel, srcDepth, dstDepth));
        }
}

TEST(ConvertOnePixel, matchesReference) {
    uint32 palette[300]; // an index is not cut to a byte
    forEachCase(20000, [&](Random &random) {
        const uint32 pixel = random.word(), index = random.below(300);
        const int32 dst = kLayouts[random.below(7)], src = kSources[random.below(4)];
        palette[index] = pixel;
        EXPECT_EQ(Raster_ConvertOnePixel(pixel, src, dst, false, nullptr),
                  reference::convertOnePixel(pixel, src, dst));
        EXPECT_EQ(Raster_ConvertOnePixel(index, 8, dst, true, palette),
                  reference::convertOnePixel(pixel, 32, dst));
    });
    // And it is unsigned.
    const uint32 entry = 0x12345678, index = 0xC0000001;
    const auto *far = reinterpret_cast<const uint32 *>(reinterpret_cast<uintptr_t>(&entry) -
                                                       uint64_t{index} * sizeof(uint32));
    EXPECT_EQ(Raster_ConvertOnePixel(index, 8, 32, true, far), entry);
}

TEST(Conversions, knownValues) {
    struct {
        int32 srcDepth, dstDepth;
        uint32 pixel, inRectangle, alone;
    } const cases[] = {
        {16, 32, 0x0821, 0xFF080408, 0x080408},
        {15, 32, 0x8421, 0xFF080808, 0x080808},
        {15, 16, 0x0200, 0x0420, 0x0420},
        {16, 3, 0x8410, 0xA4, 0xA4},
        {16, 6, 0x8410, 0x2A, 0x2A},
        {24, 16, 0xFF0807, 0xF840, 0xF840},
        {32, 15, 0x00070707, 0, 0},
        {32, 24, 0xAA123456, 0x123456, 0xAA123456}, // alone, the top byte goes along
        {32, 8, 0x123456, 0x48, 0x48},
        {32, 6, 0x123456, 0x01, 0x01},
    };
    const auto rectangle = [](int32 srcDepth, int32 dstDepth, uint32 pixel) {
        uint32 result = 0;
        Raster_ConvertPixels(reinterpret_cast<uint8 *>(&result), 4, dstDepth,
                             reinterpret_cast<const uint8 *>(&pixel), 4, srcDepth, false, nullptr,
                             0, 0, 0, 0, 1, 1);
        return result;
    };
    for (const auto &[srcDepth, dstDepth, pixel, inRectangle, alone] : cases) {
        EXPECT_EQ(rectangle(srcDepth, dstDepth, pixel), inRectangle) << srcDepth << ' ' << dstDepth;
        EXPECT_EQ(Raster_ConvertOnePixel(pixel, srcDepth, dstDepth, false, nullptr), alone);
    }
    EXPECT_EQ(rectangle(12, 12, 0xABCD), 0xCDu); // a copy of one byte, whatever 12 may be
    EXPECT_EQ(rectangle(4, 4, 0xAB), 0u);        // and of none
    EXPECT_EQ(rectangle(-16, -16, 0xABCD), 0u);
}

TEST(IsModeReasonable, isTrueForNoOtherMode) {
    for (int32 depth = -2; depth <= 40; ++depth)
        for (int32 bits = -2; bits <= 40; ++bits) {
            const bool direct = (depth == 24 && (bits == 24 || bits == 32)) ||
                                ((depth == 15 || depth == 16) && bits == 16);
            EXPECT_EQ(Raster_IsModeReasonable(depth, bits, false), direct) << depth << ' ' << bits;
            EXPECT_EQ(Raster_IsModeReasonable(depth, bits, true), bits == 8) << bits;
        }
}

// Every channel that the limits allow: its bits, from the top, are those of the
// component over and over.
TEST(MakeRGBParam, placesEveryComponent) {
    Random random(baseSeed());
    for (uint32 bits = 1; bits <= 31; ++bits)
        for (uint32 width = 1; (width + bits - 1) / bits * bits <= 31; ++width)
            for (uint32 low = 0; low + width <= 32; ++low) {
                const auto run = static_cast<uint32>(((uint64_t{1} << width) - 1) << low);
                // Further bits, not next to the run, are no part of the channel.
                const uint32 above = ~static_cast<uint32>((uint64_t{2} << (low + width)) - 1);
                const uint32 mask = run | (random.word() & above);
                RasterRGBParam param = {};
                RasterRGB_MakeRGBParam(&param, static_cast<int32>(bits), mask);
                ASSERT_EQ(param.mask, mask);
                ASSERT_LT(param.shift, 32u);
                const uint32 most = (1u << bits) - 1;
                for (const uint32 component : {1u, most, 1u << (bits - 1), random.word() & most}) {
                    uint32 expected = 0;
                    for (uint32 i = 0; i < width; ++i)
                        expected |= (component >> (bits - 1 - i % bits) & 1)
                                    << (low + width - 1 - i);
                    ASSERT_EQ(((component * param.multiplier) >> param.shift) & run, expected)
                        << bits << " bits, mask " << mask << ", component " << component;
                }
            }
    // The product is shifted only as far as it has to be.
    const uint32 cases[][4] = {{8, 0xF800, 0x100, 0}, {8, 0x001F, 1, 3}, {5, 0xFF00, 0x840, 0}};
    for (const auto &[bits, mask, multiplier, shift] : cases) {
        RasterRGBParam param = {};
        RasterRGB_MakeRGBParam(&param, static_cast<int32>(bits), mask);
        EXPECT_EQ(param.multiplier, multiplier);
        EXPECT_EQ(param.shift, shift);
    }
}

// What a failing call says, and from which line: the source is looked at first,
// both are ahead of any store, and no two checks share a line.
TEST(Conversions, tellTheirChecksApart) {
    const FencedBuffer fence(1);
    uint8 *nowhere = fence.end();
    const uint32 palette[] = {0};
    std::map<std::string, std::set<int>> lines;
    const auto refuses = [&](const std::string &check, const std::string &text, int32 depth,
                             const auto &call) {
        for (const uint32 side : {0u, 1u})
            lines[check].insert(panicLine(expectPanic([&] {
                                              call(Size{side, side});
                                          }),
                                          "NOT_IMPLEMENTED lib/raster/rasterConv"));
        EXPECT_EQ(warnings(), std::vector<std::string>{"Raster convert " + text + ' ' +
                                                       std::to_string(depth) + '\n'});
    };
    constexpr int32 kDepths[] = {INT32_MIN, -8, 0,  1,  3,  4,  6,  7,  8,        9,
                                 12,        15, 16, 17, 24, 25, 32, 33, INT32_MAX};
    const auto check = [&](int32 src, int32 dst, bool pseudo) {
        const char *const kPseudo = "pixels invalid depth for pseudo color";
        const std::string row = std::to_string(pseudo || src == 32 ? 24 : src);
        const auto alone = [&](Size) { Raster_ConvertOnePixel(0, src, dst, pseudo, palette); };
        if (pseudo && src != 8)
            refuses("one, palette", kPseudo, src, alone);
        else if (!pseudo && !isOneOf(kSources, src))
            refuses("one, source", "one pixel invalid source depth", src, alone);
        else if (!isOneOf(kLayouts, dst))
            refuses("one from " + row, "one pixel invalid depth", dst, alone);

        for (const uint32 way : {0u, 1u}) {
            const auto rectangle = [&](Size size) {
                const Surface at = {nowhere, nowhere, 4, 0, 0};
                convert({src, dst, pseudo, palette}, way, {at, at}, size);
            };
            const std::string to = dst == 32 ? "to 32, " : "to any, ";
            if (pseudo && src > 8)
                refuses(to + "palette", kPseudo, src, rectangle);
            else if (!pseudo && src != dst && !isOneOf(kSources, src))
                refuses(to + "source", "pixels invalid source depth", src, rectangle);
            else if ((pseudo || src != dst) && !isOneOf(kLayouts, dst))
                refuses(pseudo ? "from palette" : "from " + std::to_string(src),
                        "pixels invalid depth", dst, rectangle);
        }
    };
    for (const int32 src : kDepths)
        for (const int32 dst : kDepths)
            for (const bool pseudo : {false, true})
                check(src, dst, pseudo);

    std::set<int> all;
    for (const auto &[name, each] : lines) {
        EXPECT_EQ(each.size(), 1U) << name;
        all.insert(each.begin(), each.end());
    }
    EXPECT_EQ(lines.size(), 14U);
    EXPECT_EQ(all.size(), 14U);
}

} // namespace
} // namespace quillon::test
