#include "operations.h"
#include "reference/pixels.h"
#include <quillon/raster.h>

namespace quillon::test {
namespace {

// A code is all of its 32 bits: 0x103 is not RASTER_ROP_COPY.
uint32_t drawRop(Random &random) {
    if (random.oneIn(16))
        return random.oneOf({16u, 17u, 0x103u, 0x10006u, 0x80000000u, UINT32_MAX});
    return random.below(16);
}

bool isIdle(uint32_t rop) {
    return rop == RASTER_ROP_NOOP || rop > 15;
}

Operation ropFill(uint32_t rop, uint32_t pixel, uint32_t bytes) {
    return {"fill " + std::to_string(bytes) + ", code " + std::to_string(rop),
            {{.bytes = bytes, .rule = RowRule::kRoundedSteps, .isTouched = !isIdle(rop)}},
            [=](const Surfaces &at, Size size) {
                Raster_RectROPfill(at[0].buffer, at[0].signedStride(), static_cast<int32_t>(bytes),
                                   pixel, rop, at[0].x, at[0].y, size.width, size.height);
            },
            [=](const Pixels &old) { return reference::combined(rop, pixel, old[0]); }};
}

// The source is not touched where it does not count.
Operation ropCopy(uint32_t rop, uint32_t bytes) {
    const bool isPlain = rop == RASTER_ROP_COPY;
    const RowRule rule = isPlain ? RowRule::kExact : RowRule::kRoundedSteps;
    const bool isSourceIn = rop != RASTER_ROP_CLEAR && rop != RASTER_ROP_INVERT &&
                            rop != RASTER_ROP_SET && !isIdle(rop);
    return {"copy " + std::to_string(bytes) + ", code " + std::to_string(rop),
            {{.bytes = bytes, .rule = rule, .isTouched = !isIdle(rop)},
             {.bytes = bytes, .rule = rule, .isTouched = isSourceIn}},
            [=](const Surfaces &at, Size size) {
                Raster_RectROPcopy(at[0].buffer, at[0].signedStride(), at[1].buffer,
                                   at[1].signedStride(), static_cast<int32_t>(bytes), at[1].x,
                                   at[1].y, rop, at[0].x, at[0].y, size.width, size.height);
            },
            [=](const Pixels &old) { return reference::combined(rop, old[1], old[0]); },
            isPlain ? Walk::kRowByRow : Walk::kAwayFromSource};
}

} // namespace

// On large surfaces the copy of the inverse is half of the cases: it does not read its
// destination, and may go around the caches, but not where the source is yet to be
// read there.
void tryRop(Random &random, std::optional<Shape> shape) {
    const uint32_t bytes = 1 + random.below(4);
    uint32_t rop = drawRop(random);
    const uint32_t pixel = random.oneIn(4) ? random.below(256) * 0x01010101 : random.word();
    if (shape == Shape::kLarge && random.oneIn(2))
        rop = RASTER_ROP_COPY_INVERTED;
    tryOperation(random, random.oneIn(4) ? ropFill(rop, pixel, bytes) : ropCopy(rop, bytes), shape);
}

void family::rop(Random &random) {
    tryRop(random);
}

} // namespace quillon::test
