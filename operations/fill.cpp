#include "operations.h"
#include <quillon/raster.h>

namespace quillon::test {
namespace {

Operation drawFill(Random &random) {
    const uint32_t bytes = 1 + random.below(4), alpha = random.below(256);
    const uint32_t pixel = random.oneIn(4) ? alpha * 0x01010101 : random.word();
    if (random.oneIn(3))
        return {"alpha fill",
                {{4}},
                [=](const Surfaces &at, Size size) {
                    Raster_RectFillAlpha(at[0].buffer, at[0].signedStride(),
                                         static_cast<uint8_t>(alpha), at[0].x, at[0].y, size.width,
                                         size.height);
                },
                [=](const Pixels &old) { return (old[0] & 0xFFFFFF) | alpha << 24; }};
    return {"fill " + std::to_string(bytes),
            {{.bytes = bytes, .rule = RowRule::kRoundedSteps}},
            [=](const Surfaces &at, Size size) {
                Raster_RectFill(at[0].buffer, at[0].signedStride(), static_cast<int32_t>(bytes),
                                pixel, at[0].x, at[0].y, size.width, size.height);
            },
            [=](const Pixels & /*old*/) { return pixel; }};
}

} // namespace

void tryFill(Random &random, std::optional<Shape> shape) {
    tryOperation(random, drawFill(random), shape);
}

void family::fill(Random &random) {
    tryFill(random);
}

} // namespace quillon::test
