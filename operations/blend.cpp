#include "operations.h"
#include "reference/pixels.h"
#include <quillon/raster.h>

namespace quillon::test {
namespace {

// Runs of pixels that are clear, without alpha but not clear, or opaque.
Operation drawBlend(Random &random) {
    const uint32_t alphaless = random.word() >> 8, opaque = random.word() | 0xFF000000;
    return {"blend",
            {{4}, {.bytes = 4, .runs = {0, alphaless, opaque}}},
            [](const Surfaces &at, Size size) {
                Raster_AlphaBlendOver(at[0].buffer, at[0].x, at[0].y, at[0].signedStride(),
                                      at[1].buffer, at[1].x, at[1].y, at[1].signedStride(),
                                      size.width, size.height);
            },
            [](const Pixels &old) { return reference::blended(old[1], old[0]); }};
}

} // namespace

void tryBlend(Random &random, std::optional<Shape> shape) {
    tryOperation(random, drawBlend(random), shape);
}

void family::blend(Random &random) {
    tryBlend(random);
}

} // namespace quillon::test
