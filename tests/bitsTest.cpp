#include "operations.h"
#include "support/judge.h"
#include <quillon/raster.h>

#include <atomic>
#include <gtest/gtest.h>
#include <thread>

namespace quillon::test {
namespace {

TEST(Bits, matchesReference) {
    forEachCase(16000, [](Random &random) { tryBits(random); });
}

TEST(Bits, matchesReferenceOnLargeSurfaces) {
    forEachCase(24, [](Random &random) { tryBits(random, Shape::kLarge); });
}

TEST(Stencil, touchesNoPageWhereAllBitsAreClear) {
    forEachCase(6000, tryStencilBesidePage);
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
            Raster_BitsToPixelsStencil(bitmap.data(), 0, surface.data(), 0,
                                       static_cast<int32_t>(bytes), kWidth, 1, 0x12345678);
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
