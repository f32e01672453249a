#include "operations.h"
#include <quillon/raster.h>

namespace quillon::test {
namespace {

// The count of bytes is not checked: 7 is as good as 4, and none that is not
// positive copies anything.
Operation drawCopy(Random &random) {
    const int32_t bytes =
        random.oneIn(16) ? random.oneOf({7, 0, -1, INT32_MIN}) : random.between(1, 4);
    const Part part = {.bytes = static_cast<uint32_t>(bytes), .isTouched = bytes > 0};
    return {"copy " + std::to_string(bytes),
            {part, part},
            [=](const Surfaces &at, Size size) {
                Raster_RectCopy(at[0].buffer, at[0].signedStride(), at[1].buffer,
                                at[1].signedStride(), bytes, at[1].x, at[1].y, at[0].x, at[0].y,
                                size.width, size.height);
            },
            [](const Pixels &old) { return old[1]; },
            Walk::kRowByRow};
}

} // namespace

void tryCopy(Random &random, std::optional<Shape> shape) {
    tryOperation(random, drawCopy(random), shape);
}

void family::copy(Random &random) {
    tryCopy(random);
}

} // namespace quillon::test
