#include "operations.h"
#include <quillon/raster.h>

namespace quillon::test {
namespace {

// Now and then the key has more bits than a pixel.  Of 32 bits the top byte does
// not count.
Operation drawKey(Random &random) {
    const uint32_t depth = random.oneOf({32u, 16u, 8u, 24u, 15u, 0u, UINT32_MAX});
    const uint32_t bytes = depth == 32 ? 4 : depth == 16 ? 2 : 1;
    const uint32_t pixelBits = UINT32_MAX >> (32 - 8 * bytes);
    const uint32_t keyBits = random.oneIn(8) ? UINT32_MAX : pixelBits;
    const uint32_t key = random.word() & keyBits;
    const uint32_t compared = bytes == 4 ? 0x00FFFFFF : UINT32_MAX;
    const uint32_t near = key ^ 1u << random.below(8 * bytes);
    return {.name = "key of depth " + std::to_string(depth),
            .parts = {{4}, {4}, {4}, {.bytes = bytes, .runs = {key, key, near}}},
            .library =
                [=](const Surfaces &at, Size size) {
                    Raster_ApplyColorKey(at[1].buffer, at[0].buffer, at[2].first, at[3].buffer,
                                         at[1].signedStride(), at[0].signedStride(),
                                         at[2].signedStride(), at[3].signedStride(), key, at[0].x,
                                         at[0].y, size.width, size.height, depth);
                },
            .reference =
                [=](const Pixels &old) {
                    return (old[3] & compared) == (key & compared) ? old[2] : old[1];
                },
            .isOneCorner = true};
}

} // namespace

void tryColorKey(Random &random, std::optional<Shape> shape) {
    tryOperation(random, drawKey(random), shape);
}

void family::colorKey(Random &random) {
    tryColorKey(random);
}

} // namespace quillon::test
