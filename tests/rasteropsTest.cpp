// Fill, copy, alpha fill, blend and raster operations against their reference.

#include <quillon/raster.h>
#include "reference/pixels.h"
#include "support/messages.h"
#include "support/surfaces.h"

#include <algorithm>

namespace quillon::test {
namespace {

// A code is all of its 32 bits: 0x103 is not RASTER_ROP_COPY.
uint32_t randomRop(Random &random) {
    if (random.oneIn(16))
        return random.oneOf({16u, 17u, 0x103u, 0x10006u, 0x80000000u, UINT32_MAX});
    return random.below(16);
}

bool isIdle(uint32_t rop) {
    return rop == RASTER_ROP_NOOP || rop > 15;
}

// By the function that takes a code, or the plain one.
Operation fill(uint32_t rop, uint32_t pixel, uint32_t bytes, bool hasCode) {
    return {"fill " + std::to_string(bytes) + ", code " + std::to_string(rop),
            {{.bytes = bytes, .rule = RowRule::kRoundedSteps, .isTouched = !isIdle(rop)}},
            [=](const Surfaces &at, Size size) {
                const auto call = [&](auto function, auto... code) {
                    function(at[0].buffer, at[0].signedLine(), static_cast<int32_t>(bytes), pixel,
                             code..., at[0].x, at[0].y, size.width, size.height);
                };
                hasCode ? call(Raster_RectROPfill, rop) : call(Raster_RectFill);
            },
            [=](const Pixels &old) { return reference::combined(rop, pixel, old[0]); }};
}

// The source is not touched where it does not count.
Operation copy(uint32_t rop, uint32_t bytes, bool hasCode) {
    const bool isPlain = rop == RASTER_ROP_COPY;
    const RowRule rule = isPlain ? RowRule::kExact : RowRule::kRoundedSteps;
    const bool isSourceIn = rop != RASTER_ROP_CLEAR && rop != RASTER_ROP_INVERT &&
                            rop != RASTER_ROP_SET && !isIdle(rop);
    return {"copy " + std::to_string(bytes) + ", code " + std::to_string(rop),
            {{.bytes = bytes, .rule = rule, .isTouched = !isIdle(rop)},
             {.bytes = bytes, .rule = rule, .isTouched = isSourceIn}},
            [=](const Surfaces &at, Size size) {
                const auto call = [&](auto function, auto... code) {
                    function(at[0].buffer, at[0].signedLine(), at[1].buffer, at[1].signedLine(),
                             static_cast<int32_t>(bytes), at[1].x, at[1].y, code..., at[0].x, at[0].y,
                             size.width, size.height);
                };
                hasCode ? call(Raster_RectROPcopy, rop) : call(Raster_RectCopy);
            },
            [=](const Pixels &old) { return reference::combined(rop, old[1], old[0]); },
            isPlain ? Walk::kRowByRow : Walk::kAwayFromSource};
}

Operation fillAlpha(uint32_t alpha) {
    return {"alpha fill",
            {{4}},
            [=](const Surfaces &at, Size size) {
                Raster_RectFillAlpha(at[0].buffer, at[0].signedLine(), static_cast<uint8_t>(alpha),
                                     at[0].x, at[0].y, size.width, size.height);
            },
            [=](const Pixels &old) { return (old[0] & 0xFFFFFF) | alpha << 24; }};
}

Operation blend() {
    return {"blend",
            {{4}, {4}},
            [](const Surfaces &at, Size size) {
                Raster_AlphaBlendOver(at[0].buffer, at[0].x, at[0].y, at[0].signedLine(),
                                      at[1].buffer, at[1].x, at[1].y, at[1].signedLine(),
                                      size.width, size.height);
            },
            [](const Pixels &old) { return reference::blended(old[1], old[0]); }};
}

TEST(Raster, matchesReference) {
    warnings.clear();
    holdToReference(40000, [](Random &random) {
        const uint32_t bytes = 1 + random.below(4), rop = randomRop(random);
        const uint32_t pixel = random.oneIn(4) ? random.below(256) * 0x01010101 : random.word();
        switch (random.below(12)) {
        case 0:
            return fill(RASTER_ROP_COPY, pixel, bytes, false);
        case 1:
            return fillAlpha(random.below(256));
        case 2: // the count of bytes is not checked: 7 is as good as 4
            return copy(RASTER_ROP_COPY, random.oneIn(8) ? 7 : bytes, false);
        case 3:
        case 4:
            return blend();
        case 5:
        case 6:
            return fill(rop, pixel, bytes, true);
        default:
            return copy(rop, bytes, true);
        }
    });
    EXPECT_TRUE(warnings.empty());
}

// Every alpha over every destination value.
TEST(AlphaBlendOver, everyProduct) {
    constexpr uint32_t kSide = 256;
    std::vector<uint32_t> src(kSide * kSide), before(src.size()), expected(src.size());
    Random random(baseSeed());
    for (uint32_t i = 0; i < src.size(); ++i) {
        src[i] = i / kSide << 24 | random.below(1 << 24);
        before[i] = i % kSide * 0x01010101;
        expected[i] = reference::blended(src[i], before[i]);
    }
    forEachTarget([&] {
        std::vector<uint32_t> dst = before;
        Raster_AlphaBlendOver(reinterpret_cast<uint8_t *>(dst.data()), 0, 0, kSide * 4,
                              reinterpret_cast<const uint8_t *>(src.data()), 0, 0, kSide * 4, kSide,
                              kSide);
        EXPECT_TRUE(dst == expected);
    });
}

// An operation that does not read its destination may go around the caches, but not
// where the source is yet to be read there: a few bytes to the left and to the right.
TEST(Raster, invertsLargeSurfacesOverThemselves) {
    constexpr uint32_t kWidth = 1024, kHeight = 800, kLine = 4 * kWidth;
    std::vector<uint32_t> before(kWidth * kHeight + 2);
    Random random(baseSeed());
    std::generate(before.begin(), before.end(), [&] { return random.word(); });
    forEachTarget([&] {
        for (const size_t to : {size_t{0}, size_t{2}}) {
            const size_t from = 2 - to;
            std::vector<uint32_t> pixels = before;
            const auto at = [&](size_t start) { return reinterpret_cast<uint8_t *>(&pixels[start]); };
            Raster_RectROPcopy(at(to), kLine, at(from), kLine, 4, 0, 0, RASTER_ROP_COPY_INVERTED, 0,
                               0, kWidth, kHeight);
            std::vector<uint32_t> expected = before;
            for (size_t i = 0; i < before.size() - 2; ++i)
                expected[to + i] = ~expected[from + i];
            EXPECT_TRUE(pixels == expected) << "to pixel " << to;
        }
    });
}

// Ahead of any store, and whatever there is to do; but a copy takes any count,
// and copies nothing if it is not positive.
TEST(Raster, unsupportedDepth) {
    const FencedBuffer fence(1);
    uint8_t *nowhere = fence.end();
    const auto refuses = [](const auto &call) {
        expectPanic("NOT_IMPLEMENTED lib/raster/rasterops", call);
        EXPECT_EQ(warnings, std::vector<std::string>{"Raster: Unsupported frame buffer depth\n"});
    };
    for (const int32_t bytes : {0, 5, -1, 7, 0x101, INT32_MIN, INT32_MAX})
        for (const uint32_t width : {0u, 1u}) {
            refuses([&] { Raster_RectFill(nowhere, 4, bytes, 0, 0, 0, width, 1); });
            for (const uint32_t rop : {0u, 3u, 5u, 6u, 0x103u}) {
                refuses([&] { Raster_RectROPfill(nowhere, 4, bytes, 0, rop, 0, 0, width, 1); });
                for (const uint32_t dstX : {2u, 4u}) { // leftwards, too
                    const auto copyBytes = [&] {
                        Raster_RectROPcopy(nowhere, 4, nowhere, 4, bytes, 3, 5, rop, dstX, 5, width,
                                           1);
                    };
                    if (rop != RASTER_ROP_COPY)
                        refuses(copyBytes);
                    else if (bytes <= 0 || width == 0)
                        copyBytes();
                }
            }
        }
}

} // namespace
} // namespace quillon::test
