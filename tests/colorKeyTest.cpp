#include "operations.h"

#include <gtest/gtest.h>

namespace quillon::test {
namespace {

TEST(ColorKey, matchesReference) {
    forEachCase(20000, [](Random &random) { tryColorKey(random); });
}

TEST(ColorKey, matchesReferenceOnLargeSurfaces) {
    forEachCase(24, [](Random &random) { tryColorKey(random, Shape::kLarge); });
}

} // namespace
} // namespace quillon::test
