// The support itself: a fence that does not bite would let every other test pass.

#include "support/fence.h"
#include "support/surfaces.h"

#include <gtest/gtest-spi.h>

namespace quillon::test {
namespace {

void touch(uint8_t *address) {
    *const_cast<volatile uint8_t *>(address) = 1;
}

void look(const uint8_t *address) {
    (void)*const_cast<const volatile uint8_t *>(address);
}

TEST(FenceDeathTest, bites) {
    const FencedBuffer behind(100), before(100, FencedBuffer::Flush::kBefore);
    touch(behind.end() - 1);
    touch(before.data());
    EXPECT_DEATH(touch(behind.end()), "");
    EXPECT_DEATH(look(before.data() - 1), "");

    const TwinMemory twin(pageSize(), 2, 2 * pageSize());
    EXPECT_TRUE(twin.agree());
    for (uint8_t *run : {twin.run(0), twin.run(1)}) {
        EXPECT_DEATH(look(run - 1), "");
        EXPECT_DEATH(touch(run + twin.runBytes()), "");
    }
    touch(twin.run(1) + 7);
    EXPECT_FALSE(twin.agree());
}

TEST(Fence, canaries) {
    EXPECT_NONFATAL_FAILURE(touch(FencedBuffer(100).data() - 1), "ahead");
    EXPECT_NONFATAL_FAILURE(touch(FencedBuffer(100, FencedBuffer::Flush::kBefore).end()), "behind");
}

} // namespace
} // namespace quillon::test
