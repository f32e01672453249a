// Bit and stencil expansion against their reference.

#include "support/surfaces.h"
#include <quillon/raster.h>

#include <atomic>
#include <thread>

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

Operation drawExpansion(Random &random) {
    return expansion(random, random.oneIn(2), random.oneIn(64));
}

TEST(Bits, matchesReference) {
    holdToReference(16000, drawExpansion);
}

TEST(Bits, matchesReferenceOnLargeSurfaces) {
    holdToReference(24, drawExpansion, Shape::kLarge);
}

// Pixels under clear bits lie beyond a fence.
TEST(Stencil, touchesNoPageWhereAllBitsAreClear) {
    forEachCase(6000, [](Random &random) {
        const Operation call = expansion(random, true, false);
        const uint32_t bytes = call.parts[0].bytes, inside = random.below(150);
        const uint32_t outside = random.below(150), width = inside + outside;
        const bool isAhead = random.oneIn(2);
        const FencedBuffer page(size_t{inside} * bytes, isAhead ? FencedBuffer::Flush::kBefore
                                                                : FencedBuffer::Flush::kBehind);
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
            call.library({{nullptr, first, 0, 0, 0}, {nullptr, bitmap.data(), 0, 0, 0}},
                         {width, 1});
            EXPECT_TRUE(std::equal(page.data(), page.end(), expected.begin()))
                << call.name << ", " << inside << " pixels inside, " << outside << " outside";
        });
    });
}

// Pixels under clear bits belong to others: what another thread writes there is
// never lost to a pixel that is read and written back.
TEST(Stencil, leavesClearPixelsToAnotherThread) {
    constexpr uint32_t kWidth = 64;
    constexpr int kRounds = 1000; // of the other thread
    const auto check = [&](size_t bytes, uint8_t pattern) {
        std::vector<uint8_t> bitmap(kWidth / 8, pattern), surface(kWidth * bytes);
        std::vector<uint8_t *> others;
        for (size_t i = 0; i < surface.size(); ++i)
            if ((pattern << (i / bytes % 8) & 0x80) == 0)
                others.push_back(&surface[i]);
        std::atomic<int> rounds = -1, lost = 0; // -1: not yet started
        std::thread other([&] {
            for (rounds = 0; rounds < kRounds; ++rounds) {
                const auto value = static_cast<uint8_t>(rounds);
                for (uint8_t *byte : others)
                    std::atomic_ref(*byte).store(value, std::memory_order_relaxed);
                for (uint8_t *byte : others)
                    lost += std::atomic_ref(*byte).load(std::memory_order_relaxed) != value;
            }
        });
        while (rounds < 0)
            std::this_thread::yield();
        while (rounds < kRounds)
            kStencil[bytes - 1](bitmap.data(), 0, surface.data(), 0, kWidth, 1, 0x12345678);
        other.join();
        EXPECT_EQ(lost, 0) << bytes << " bytes per pixel";
    };
    forEachTarget([&] {
        for (const size_t bytes : {1u, 2u, 3u, 4u})
            for (const uint8_t pattern : {uint8_t{0x00}, uint8_t{0x55}, uint8_t{0x7E}})
                check(bytes, pattern);
    });
}

} // namespace
} // namespace quillon::test
