#include "operations.h"
#include "support/judge.h"
#include <quillon/raster.h>

#include <cstring>

namespace quillon::test {
namespace {

using Opaque = decltype(&RasterBitsToPixels8);
using Stencil = decltype(&RasterBitsToPixelsStencil8);
constexpr Opaque kOpaque[] = {RasterBitsToPixels8, RasterBitsToPixels16, RasterBitsToPixels24,
                              RasterBitsToPixels32};
constexpr Stencil kStencil[] = {RasterBitsToPixelsStencil8, RasterBitsToPixelsStencil16,
                                RasterBitsToPixelsStencil24, RasterBitsToPixelsStencil32};

// By the general function, or the one that has the pixel size in its name.  Widths
// below 1 and unknown pixel sizes leave nothing to do.
Operation expansion(Random &random, bool isStencil, bool isIdle) {
    const uint32_t member = random.below(4), pixel = random.word(), background = random.word();
    const bool isNamed = random.oneIn(2), isNegative = isIdle && (isNamed || random.oneIn(2));
    const int32_t bytes = isIdle && !isNegative
                              ? random.oneOf({0, 5, -1, 8, 0x101, INT32_MIN, INT32_MAX})
                              : static_cast<int32_t>(member + 1);
    return {(isStencil ? "stencil " : "opaque ") + std::to_string(bytes),
            {{.bytes = member + 1, .isTouched = !isIdle},
             {.bytes = 0, .isTouched = !isIdle, .runs = {0x00, 0xFF}}},
            [=](const Surfaces &at, Size size) {
                const auto expand = [&](auto function, auto... rest) {
                    function(at[1].first, at[1].signedStride(), at[0].first, at[0].signedStride(),
                             rest...);
                };
                const int32_t width =
                    static_cast<int32_t>(size.width) | (isNegative ? INT32_MIN : 0);
                if (isStencil && isNamed)
                    expand(kStencil[member], width, size.height, pixel);
                else if (isStencil)
                    expand(Raster_BitsToPixelsStencil, bytes, width, size.height, pixel);
                else if (isNamed)
                    expand(kOpaque[member], width, size.height, pixel, background);
                else
                    expand(Raster_BitsToPixels, bytes, width, size.height, pixel, background);
            },
            [=](const Pixels &old) {
                const uint32_t clear = isStencil ? old[0] : background;
                return old[1] != 0 ? pixel : clear;
            },
            Walk::kForward,
            false};
}

} // namespace

void tryBits(Random &random, std::optional<Shape> shape) {
    const bool isStencil = random.oneIn(2), isIdle = random.oneIn(64);
    tryOperation(random, expansion(random, isStencil, isIdle), shape);
}

// The pixels that are not on the page are under clear bits.
void tryStencilBesidePage(Random &random) {
    const Operation call = expansion(random, true, false);
    const uint32_t bytes = call.parts[0].bytes, inside = random.below(150);
    const uint32_t outside = random.below(150), width = inside + outside;
    const bool isAhead = random.oneIn(2);
    const FencedBuffer page(size_t{inside} * bytes,
                            isAhead ? FencedBuffer::Flush::kBefore : FencedBuffer::Flush::kBehind);
    std::vector<uint8_t> bitmap(width / 8 + 1), before(page.size());
    random.fill(bitmap.data(), bitmap.size());
    plantRuns(random, bitmap.data(), bitmap.size(), 1, {0x00, 0xFF});
    random.fill(before.data(), before.size());
    std::vector<uint8_t> expected = before;
    for (uint32_t x = 0, i = 0; x < width; ++x) {
        const auto bit = static_cast<uint8_t>(0x80 >> x % 8);
        if (isAhead ? x < outside : x >= inside)
            bitmap[x / 8] &= static_cast<uint8_t>(~bit);
        else if (const uint32_t pixel = call.reference({0, 1}); (bitmap[x / 8] & bit) != 0)
            std::memcpy(&expected[bytes * i++], &pixel, bytes);
        else
            ++i;
    }
    forEachTarget([&] {
        std::copy(before.begin(), before.end(), page.data());
        uint8_t *const first = page.data() - (isAhead ? size_t{outside} * bytes : 0);
        call.library({{nullptr, first, 0, 0, 0}, {nullptr, bitmap.data(), 0, 0, 0}}, {width, 1});
        compare(page.data(), expected.data(), page.size(), [&] {
            return call.name + ", " + std::to_string(inside) + " pixels inside, " +
                   std::to_string(outside) + " outside";
        });
    });
}

void family::bits(Random &random) {
    random.oneIn(4) ? tryStencilBesidePage(random) : tryBits(random);
}

} // namespace quillon::test
