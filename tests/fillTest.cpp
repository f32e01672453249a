#include "operations.h"
#include "support/messages.h"
#include <quillon/raster.h>

namespace quillon::test {
namespace {

TEST(Fill, matchesReference) {
    forEachCase(12000, [](Random &random) { tryFill(random); });
}

TEST(Fill, matchesReferenceOnLargeSurfaces) {
    forEachCase(24, [](Random &random) { tryFill(random, Shape::kLarge); });
}

// Ahead of any store, and whatever there is to do.
TEST(Fill, refusesPixelSizes) {
    const FencedBuffer fence(1);
    for (const int32_t bytes : {0, 5, -1, 0x101, INT32_MIN, INT32_MAX})
        for (const uint32_t width : {0u, 1u}) {
            expectPanic("NOT_IMPLEMENTED lib/raster/rasterops",
                        [&] { Raster_RectFill(fence.end(), 4, bytes, 0, 0, 0, width, 1); });
            EXPECT_EQ(warnings, (Messages{"Raster: Unsupported frame buffer depth\n"}));
        }
}

} // namespace
} // namespace quillon::test
