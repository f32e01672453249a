// The support itself: a fence that does not bite would let every other test pass.

#include "support/fence.h"
#include "support/surfaces.h"

#include <gtest/gtest-spi.h>

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
    EXPECT_TRUE(twin.agree());
    EXPECT_DEATH(touch(twin.run(1) - 1), "");
    EXPECT_DEATH(touch(twin.run(1) + twin.runBytes()), "");
    touch(twin.run(1) + 7);
    EXPECT_FALSE(twin.agree());
}

TEST(Fence, canaries) {
    EXPECT_NONFATAL_FAILURE(touch(FencedBuffer(100).data() - 1), "ahead");
    EXPECT_NONFATAL_FAILURE(touch(FencedBuffer(100, FencedBuffer::Flush::kBefore).end()), "behind");
}

} // namespace
} // namespace quillon::test
