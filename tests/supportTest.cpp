// The support itself: a fence that does not bite, or cases that
// cannot be had again, would let every other test pass.

#include "support/fence.h"
#include "support/random.h"
#include "support/surfaces.h"

#include <set>

namespace quillon::test {
namespace {

void touch(uint8_t *address) {
    *const_cast<volatile uint8_t *>(address) = 1;
}

uint8_t look(const uint8_t *address) {
    return *const_cast<const volatile uint8_t *>(address);
}

TEST(FenceDeathTest, bites) {
    const FencedBuffer behind(100), before(100, FencedBuffer::Flush::kBefore);
    touch(behind.data());
    touch(behind.end() - 1);
    touch(before.data());
    touch(before.end() - 1);
    EXPECT_DEATH(touch(behind.end()), "");
    EXPECT_DEATH(look(behind.end()), "");
    EXPECT_DEATH(touch(before.data() - 1), "");
    EXPECT_DEATH(look(before.data() - 1), "");

    const FencedBuffer pages(pageSize());
    EXPECT_DEATH(look(pages.end()), "");
    EXPECT_DEATH(look(pages.data() - 1), "");

    const TwinMemory twin(pageSize(), 2, 2 * pageSize());
    for (uint8_t *run : {twin.run(0), twin.run(1)}) {
        EXPECT_DEATH(look(run - 1), "");
        EXPECT_DEATH(touch(run + twin.runBytes()), "");
    }
    EXPECT_TRUE(twin.agree());
    touch(twin.run(1) + 7);
    EXPECT_FALSE(twin.agree());
}

TEST(Fence, canaries) {
    const FencedBuffer behind(100), before(100, FencedBuffer::Flush::kBefore);
    EXPECT_TRUE(behind.canariesIntact());
    EXPECT_TRUE(before.canariesIntact());
    touch(behind.data() - 1);
    touch(before.end());
    EXPECT_FALSE(behind.canariesIntact());
    EXPECT_FALSE(before.canariesIntact());
}

TEST(Random, isReproducible) {
    if (onlyCase())
        GTEST_SKIP() << "one case only";
    std::vector<uint32_t> first, second;
    forEachCase(50, [&](Random &random) { first.push_back(random.word()); });
    forEachCase(50, [&](Random &random) { second.push_back(random.word()); });
    EXPECT_EQ(first, second);
    EXPECT_EQ(std::set<uint32_t>(first.begin(), first.end()).size(), 50u);
}

} // namespace
} // namespace quillon::test
