// Fill, copy, alpha fill, blend and raster operations against their reference.

#include "raster.h"
#include "reference/raster.h"
#include "reference/rop.h"
#include "support/messages.h"
#include "support/surfaces.h"

#include <set>

namespace quillon::test {
namespace {

uint32 randomPixel(Random &random) {
    return random.oneIn(4) ? random.below(256) * 0x01010101 : random.word();
}

// A code is all of its 32 bits: 0x103 is not RASTER_ROP_COPY.
uint32 randomRop(Random &random) {
    return random.oneIn(16) ? random.oneOf({16u, 17u, 0x103u, 0x10006u, 0x80000000u, UINT32_MAX})
                            : random.below(16);
}

bool isIdle(uint32 rop) {
    return rop == RASTER_ROP_NOOP || rop > 15;
}

Operation fill(Random &random, uint32 bytes) {
    const uint32 pixel = randomPixel(random);
    return {"fill " + std::to_string(bytes),
            {{bytes, RowRule::kRoundedSteps}},
            Raster_RectFill,
            reference::rectFill,
            [=](auto function, const Surfaces &at, Size size) {
                function(at[0].buffer, at[0].signedLine(), static_cast<int32>(bytes), pixel,
                         at[0].x, at[0].y, size.width, size.height);
            }};
}

Operation fillAlpha(Random &random) {
    const auto alpha = static_cast<uint8>(random.word());
    return {"alpha fill",
            {{4}},
            Raster_RectFillAlpha,
            reference::rectFillAlpha,
            [=](auto function, const Surfaces &at, Size size) {
                function(at[0].buffer, at[0].signedLine(), alpha, at[0].x, at[0].y, size.width,
                         size.height);
            }};
}

Operation copy(uint32 bytes) {
    return {"copy " + std::to_string(bytes),
            {{bytes}, {bytes}},
            Raster_RectCopy,
            reference::rectCopy,
            [=](auto function, const Surfaces &at, Size size) {
                function(at[0].buffer, at[0].signedLine(), at[1].buffer, at[1].signedLine(),
                         static_cast<int32>(bytes), at[1].x, at[1].y, at[0].x, at[0].y, size.width,
                         size.height);
            }};
}

Operation blend() {
    return {"blend",
            {{4}, {4}},
            Raster_AlphaBlendOver,
            reference::alphaBlendOver,
            [](auto function, const Surfaces &at, Size size) {
                function(at[0].buffer, at[0].x, at[0].y, at[0].signedLine(), at[1].buffer, at[1].x,
                         at[1].y, at[1].signedLine(), size.width, size.height);
            }};
}

Operation ropFill(uint32 rop, uint32 pixel, uint32 bytes) {
    return {"fill, code " + std::to_string(rop) + ", " + std::to_string(bytes),
            {{.bytes = bytes, .rule = RowRule::kRoundedSteps, .isTouched = !isIdle(rop)}},
            Raster_RectROPfill,
            reference::rectRopFill,
            [=](auto function, const Surfaces &at, Size size) {
                function(at[0].buffer, at[0].signedLine(), static_cast<int32>(bytes), pixel, rop,
                         at[0].x, at[0].y, size.width, size.height);
            }};
}

// The source is not touched where it does not count.
Operation ropCopy(uint32 rop, uint32 bytes) {
    const RowRule rule = rop == RASTER_ROP_COPY ? RowRule::kExact : RowRule::kRoundedSteps;
    const bool isSourceIn = rop != RASTER_ROP_CLEAR && rop != RASTER_ROP_INVERT &&
                            rop != RASTER_ROP_SET && !isIdle(rop);
    return {"copy, code " + std::to_string(rop) + ", " + std::to_string(bytes),
            {{.bytes = bytes, .rule = rule, .isTouched = !isIdle(rop)},
             {.bytes = bytes, .rule = rule, .isTouched = isSourceIn}},
            Raster_RectROPcopy,
            reference::rectRopCopy,
            [=](auto function, const Surfaces &at, Size size) {
                function(at[0].buffer, at[0].signedLine(), at[1].buffer, at[1].signedLine(),
                         static_cast<int32>(bytes), at[1].x, at[1].y, rop, at[0].x, at[0].y,
                         size.width, size.height);
            }};
}

TEST(Raster, matchesReference) {
    holdToReference(16000, [](Random &random) {
        const uint32 bytes = 1 + random.below(4);
        switch (random.below(8)) {
        case 0:
        case 1:
            return fill(random, bytes);
        case 2:
            return fillAlpha(random);
        case 3:
        case 4: // the count of bytes is not checked: 7 is as good as 4
            return copy(random.oneIn(8) ? 7 : bytes);
        default:
            return blend();
        }
    });
}

TEST(RasterOperations, matchReference) {
    clearMessages();
    holdToReference(24000, [](Random &random) {
        const uint32 bytes = 1 + random.below(4), rop = randomRop(random);
        return random.oneIn(4) ? ropFill(rop, randomPixel(random), bytes) : ropCopy(rop, bytes);
    });
    EXPECT_TRUE(warnings().empty());
}

// Each operation by its name, in bits that go through all pairs.
TEST(RasterOperations, areWhatTheirNamesSay) {
    constexpr uint8 s = 0b0011, d = 0b0101;
    const std::pair<uint32, int> results[] = {
        {RASTER_ROP_CLEAR, 0},
        {RASTER_ROP_AND, s & d},
        {RASTER_ROP_AND_REVERSE, s & ~d},
        {RASTER_ROP_COPY, s},
        {RASTER_ROP_AND_INVERTED, ~s & d},
        {RASTER_ROP_NOOP, d},
        {RASTER_ROP_XOR, s ^ d},
        {RASTER_ROP_OR, s | d},
        {RASTER_ROP_NOR, ~(s | d)},
        {RASTER_ROP_EQUIV, ~(s ^ d)},
        {RASTER_ROP_INVERT, ~d},
        {RASTER_ROP_OR_REVERSE, s | ~d},
        {RASTER_ROP_COPY_INVERTED, ~s},
        {RASTER_ROP_OR_INVERTED, ~s | d},
        {RASTER_ROP_NAND, ~(s & d)},
        {RASTER_ROP_SET, 0xFF},
    };
    for (const auto &[rop, result] : results) {
        uint8 copied = d, filled = d;
        Raster_RectROPcopy(&copied, 1, &s, 1, 1, 0, 0, rop, 0, 0, 1, 1);
        Raster_RectROPfill(&filled, 1, 1, s, rop, 0, 0, 1, 1);
        EXPECT_EQ(copied, static_cast<uint8>(result)) << rop;
        EXPECT_EQ(filled, copied) << rop;
    }
}

// Every alpha over every destination value.
TEST(AlphaBlendOver, everyProduct) {
    constexpr uint32 kSide = 256;
    std::vector<uint32> src(kSide * kSide), before(src.size());
    Random random(baseSeed());
    for (uint32 i = 0; i < src.size(); ++i) {
        src[i] = i / kSide << 24 | random.below(1 << 24);
        before[i] = i % kSide * 0x01010101;
    }
    const auto blended = [&](auto function) {
        std::vector<uint32> dst = before;
        function(reinterpret_cast<uint8 *>(dst.data()), 0, 0, kSide * 4,
                 reinterpret_cast<const uint8 *>(src.data()), 0, 0, kSide * 4, kSide, kSide);
        return dst;
    };
    const std::vector<uint32> expected = blended(reference::alphaBlendOver);
    forEachTarget([&] { EXPECT_TRUE(blended(Raster_AlphaBlendOver) == expected); });
}

// A line increment of 66 at 4 bytes per pixel, where 64 and -68 are the nearest
// whole steps, and the mirror image of it.
TEST(RasterOperations, stepsOfWholePixels) {
    constexpr ptrdiff_t kRows = 300;
    struct {
        int32 line;
        uint32 dstY, rop;
        ptrdiff_t rows[3]; // written, from the buffer
    } const cases[] = {{66, 1, RASTER_ROP_COPY_INVERTED, {198, 130, 62}}, // upwards
                       {66, 0, RASTER_ROP_COPY_INVERTED, {0, 64, 128}},
                       {66, 1, RASTER_ROP_COPY, {66, 132, 198}},
                       {-66, 1, RASTER_ROP_COPY_INVERTED, {-198, -134, -70}},
                       {-66, 0, RASTER_ROP_COPY_INVERTED, {0, -68, -136}}};
    for (const auto &[line, dstY, rop, rows] : cases) {
        std::vector<uint8> memory(2 * kRows), expected(memory.size());
        const std::vector<uint8> src(12, rop == RASTER_ROP_COPY ? 0xFF : 0);
        for (const ptrdiff_t row : rows)
            std::fill_n(expected.data() + kRows + row, 4, 0xFF);
        Raster_RectROPcopy(memory.data() + kRows, line, src.data(), 0, 4, 0, 0, rop, 0, dstY, 1, 3);
        EXPECT_EQ(memory, expected) << "line " << line << ", y " << dstY << ", code " << rop;
    }
}

TEST(RectCopy, countOfBytesOfZeroOrLessCopiesNothing) {
    const FencedBuffer fence(1);
    for (const int32 bytes : {0, -1, -4}) {
        Raster_RectCopy(fence.end(), 1, fence.end(), 1, bytes, 0, 0, 0, 0, 2, 1);
        Raster_RectROPcopy(fence.end(), 1, fence.end(), 1, bytes, 0, 0, RASTER_ROP_COPY, 0, 0, 2,
                           1);
    }
}

// Ahead of any store, and whatever there is to do; by one check each in the
// fill, the raster fill, and the raster copy leftwards and otherwise.
TEST(RasterOperations, unsupportedDepth) {
    const FencedBuffer fence(1);
    uint8 *nowhere = fence.end();
    const auto lineOf = [](const auto &call) {
        const int line = panicLine(expectPanic(call), "NOT_IMPLEMENTED lib/raster/rasterops");
        EXPECT_EQ(warnings(), std::vector<std::string>{"Raster: Unsupported frame buffer depth\n"});
        return line;
    };
    std::set<int> lines[4], all;
    for (const int32 bytes : {0, 5, -1, 7, 8, 32, 0x101, INT32_MIN, INT32_MAX})
        for (const uint32 width : {0u, 1u})
            for (const uint32 rop : {0u, 3u, 5u, 6u, 15u, 16u, 0x103u}) {
                const bool isPlain = rop == RASTER_ROP_COPY;
                lines[0].insert(
                    lineOf([&] { Raster_RectFill(nowhere, 4, bytes, 0, 0, 0, width, 1); }));
                lines[isPlain ? 0 : 1].insert(
                    lineOf([&] { Raster_RectROPfill(nowhere, 4, bytes, 0, rop, 0, 0, width, 1); }));
                for (const uint32 dstX : {2u, 3u, 4u, UINT32_MAX})
                    for (const uint32 dstY : {4u, 5u, 6u})
                        if (!isPlain) // which has no check
                            lines[dstX > 3 && dstY == 5 ? 2 : 3].insert(lineOf([&] {
                                Raster_RectROPcopy(nowhere, 4, nowhere, 4, bytes, 3, 5, rop, dstX,
                                                   dstY, width, 1);
                            }));
            }
    for (const std::set<int> &each : lines) {
        EXPECT_EQ(each.size(), 1U);
        all.insert(each.begin(), each.end());
    }
    EXPECT_EQ(all.size(), 4U);
}

} // namespace
} // namespace quillon::test
