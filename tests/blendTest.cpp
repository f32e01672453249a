#include "operations.h"
#include "reference/pixels.h"
#include "support/judge.h"
#include <quillon/raster.h>

#include <gtest/gtest.h>

namespace quillon::test {
namespace {

TEST(Blend, matchesReference) {
    forEachCase(12000, [](Random &random) { tryBlend(random); });
}

TEST(Blend, matchesReferenceOnLargeSurfaces) {
    forEachCase(12, [](Random &random) { tryBlend(random, Shape::kLarge); });
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
