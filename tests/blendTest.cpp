// The blend against its reference.

#include "reference/pixels.h"
#include "support/surfaces.h"
#include <quillon/raster.h>

namespace quillon::test {
namespace {

// Runs of pixels that are clear, without alpha but not clear, or opaque.
Operation drawBlend(Random &random) {
    return {"blend",
            {{4}, {.bytes = 4, .runs = {0, random.word() >> 8, random.word() | 0xFF000000}}},
            [](const Surfaces &at, Size size) {
                Raster_AlphaBlendOver(at[0].buffer, at[0].x, at[0].y, at[0].signedStride(),
                                      at[1].buffer, at[1].x, at[1].y, at[1].signedStride(),
                                      size.width, size.height);
            },
            [](const Pixels &old) { return reference::blended(old[1], old[0]); }};
}

TEST(Blend, matchesReference) {
    holdToReference(12000, drawBlend);
}

TEST(Blend, matchesReferenceOnLargeSurfaces) {
    holdToReference(12, drawBlend, Shape::kLarge);
}

// Every alpha over every destination value.
TEST(Blend, everyProduct) {
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

} // namespace
} // namespace quillon::test
