// Bit and stencil expansion against their reference.

#include "support/messages.h"
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

// By the general function, or the one that has the pixel size in its name.
Operation expansion(Random &random, bool isStencil) {
    const uint32_t member = random.below(4), pixel = random.word(), background = random.word();
    const auto bytes = static_cast<int32_t>(member + 1);
    const bool isNamed = random.oneIn(2);
    return {(isStencil ? "stencil " : "opaque ") + std::to_string(bytes),
            {{.bytes = member + 1}, {.bytes = 0, .runs = {0x00, 0xFF}}},
            [=](const Surfaces &at, Size size) {
                const auto expand = [&](auto function, auto... rest) {
                    function(at[1].first, at[1].signedStride(), at[0].first, at[0].signedStride(),
                             rest...);
                };
                const auto width = static_cast<int32_t>(size.width);
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
    return expansion(random, random.oneIn(2));
}

TEST(Bits, matchesReference) {
    holdToReference(16000, drawExpansion);
}

TEST(Bits, matchesReferenceOnLargeSurfaces) {
    holdToReference(24, drawExpansion, Shape::kLarge);
}

// A page of which pixels under set bits are part, amid inaccessible ones where
// all bits are clear.
TEST(Stencil, touchesNoPageWhereAllBitsAreClear) {
    const FencedBuffer page(pageSize());
    const auto end = static_cast<int32_t>(page.size());
    forEachTarget([&] {
        forEachCase(6000, [&](Random &random) {
            const Operation call = expansion(random, true);
            const auto bytes = static_cast<int32_t>(call.parts[0].bytes);
            const auto width = random.between(1, 300);
            // The first byte's place in the page, across one of its ends.
            const int32_t start = random.oneOf({0, end}) - random.between(0, width * bytes);
            std::vector<uint8_t> bitmap(64);
            random.fill(bitmap.data(), bitmap.size());
            plantRuns(random, bitmap.data(), bitmap.size(), 1, {0x00, 0xFF});
            random.fill(page.data(), page.size());
            std::vector<uint8_t> expected(page.data(), page.end());
            for (int32_t x = 0, at = start; x < width; ++x, at += bytes) {
                uint8_t &bits = bitmap[static_cast<size_t>(x / 8)];
                const auto bit = static_cast<uint8_t>(0x80 >> x % 8);
                if (at < 0 || at + bytes > end)
                    bits &= static_cast<uint8_t>(~bit);
                const uint32_t pixel = call.reference({0, 1});
                if ((bits & bit) != 0)
                    std::memcpy(&expected[static_cast<size_t>(at)], &pixel, call.parts[0].bytes);
            }
            call.library(
                {{nullptr, page.data() + start, 0, 0, 0}, {nullptr, bitmap.data(), 0, 0, 0}},
                {static_cast<uint32_t>(width), 1});
            EXPECT_TRUE(std::equal(page.data(), page.end(), expected.begin()))
                << call.name << ", from byte " << start << " of the page";
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

// Widths below 1 and unknown pixel sizes: nothing is looked at, or said.
TEST(Bits, touchesNothingWhereThereIsNothingToDo) {
    const FencedBuffer fence(1);
    uint8_t *nowhere = fence.end();
    warnings.clear();
    const auto call = [&](int32_t bytes, int32_t width) {
        Raster_BitsToPixels(nowhere, 8, nowhere, 64, bytes, width, 9, 1, 2);
        Raster_BitsToPixelsStencil(nowhere, 8, nowhere, 64, bytes, width, 9, 1);
    };
    for (const int32_t bytes : {1, 2, 3, 4})
        for (const int32_t width : {-1, -8, INT32_MIN})
            call(bytes, width);
    for (const int32_t bytes : {0, 5, -1, 8, 0x101, INT32_MIN, INT32_MAX})
        call(bytes, 9);
    EXPECT_TRUE(warnings.empty());
}

} // namespace
} // namespace quillon::test
