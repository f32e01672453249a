// The support itself: a fence that does not bite would let every other test pass.

#include "support/fence.h"
#include "support/judge.h"
#include "support/surfaces.h"
#include "support/targets.h"
#include <quillon/raster.h>

#include <gtest/gtest-spi.h>

#include <iostream>
#include <set>

namespace quillon::test {
namespace {

void touch(volatile uint8_t *address) {
    *address = static_cast<uint8_t>(*address + 1);
}

TEST(FenceDeathTest, bites) {
    const FencedBuffer behind(100), before(100, FencedBuffer::Flush::kBefore);
    EXPECT_DEATH(touch(behind.end()), "");
    EXPECT_DEATH(touch(before.data() - 1), "");

    const TwinMemory twin(pageSize(), 2, 2 * pageSize());
    const auto compareTwin = [&] { twin.compare([] { return "memory and model"; }); };
    compareTwin();
    EXPECT_DEATH(touch(twin.run(1) - 1), "");
    EXPECT_DEATH(touch(twin.run(1) + twin.runBytes()), "");
    touch(twin.run(1) + 7);
    EXPECT_NONFATAL_FAILURE(compareTwin(), "byte 7 ");
}

TEST(Fence, canaries) {
    EXPECT_NONFATAL_FAILURE(touch(FencedBuffer(100).data() - 1), "ahead");
    EXPECT_NONFATAL_FAILURE(touch(FencedBuffer(100, FencedBuffer::Flush::kBefore).end()), "behind");
}

// The library follows forEachTarget, to kernels of each target's own, of which the
// first are those that it chooses by itself.
TEST(Targets, areThoseOfTheLibrary) {
    const auto indexOfKernel = [] {
        uint8_t pixel = 0;
        Raster_RectFill(&pixel, 1, 1, 7, 0, 0, 1, 1);
        return hwy::GetChosenTarget().GetIndex();
    };
    std::set<size_t> indices;
    std::cout << "Every test runs on:";
    forEachTarget([&] {
        indices.insert(indexOfKernel());
        std::cout << ' ' << running.target;
    });
    std::cout << std::endl;
    EXPECT_EQ(indices.size(), kTargets.size());
    // A single target is called without being chosen.
    if (kTargets.size() > 1) {
        EXPECT_EQ(*indices.begin(), indexOfKernel());
    }
#ifdef HWY_WANT_AVX3_DL
    EXPECT_EQ(kTargets.front() == HWY_AVX3_DL, (hwy::SupportedTargets() & HWY_AVX3_DL) != 0);
#endif
}

} // namespace
} // namespace quillon::test
