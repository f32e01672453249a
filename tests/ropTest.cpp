#include "operations.h"
#include "support/messages.h"
#include <quillon/raster.h>

namespace quillon::test {
namespace {

TEST(Rop, matchesReference) {
    warnings.clear();
    forEachCase(30000, [](Random &random) { tryRop(random); });
    EXPECT_TRUE(warnings.empty());
}

TEST(Rop, matchesReferenceOnLargeSurfaces) {
    forEachCase(32, [](Random &random) { tryRop(random, Shape::kLarge); });
}

// Ahead of any store, whatever there is to do, leftwards too; but the plain copy
// takes any count.
TEST(Rop, refusesPixelSizes) {
    const FencedBuffer fence(1);
    uint8_t *nowhere = fence.end();
    const auto refuses = [](const auto &call) {
        expectPanic("NOT_IMPLEMENTED lib/raster/rasterops", call);
        EXPECT_EQ(warnings, (Messages{"Raster: Unsupported frame buffer depth\n"}));
    };
    for (const int32_t bytes : {0, 5, -1, 0x101, INT32_MIN, INT32_MAX})
        for (const uint32_t width : {0u, 1u})
            for (const uint32_t rop : {0u, 3u, 5u, 6u, 0x103u}) {
                refuses([&] { Raster_RectROPfill(nowhere, 4, bytes, 0, rop, 0, 0, width, 1); });
                for (const uint32_t dstX : {2u, 4u}) {
                    const auto copy = [&](uint32_t columns) {
                        Raster_RectROPcopy(nowhere, 4, nowhere, 4, bytes, 3, 5, rop, dstX, 5,
                                           columns, 1);
                    };
                    rop == RASTER_ROP_COPY ? copy(0) : refuses([&] { copy(width); });
                }
            }
}

} // namespace
} // namespace quillon::test
