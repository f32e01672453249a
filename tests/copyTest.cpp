#include "operations.h"

#include <gtest/gtest.h>

namespace quillon::test {
namespace {

TEST(Copy, matchesReference) {
    forEachCase(12000, [](Random &random) { tryCopy(random); });
}

TEST(Copy, matchesReferenceOnLargeSurfaces) {
    forEachCase(24, [](Random &random) { tryCopy(random, Shape::kLarge); });
}

} // namespace
} // namespace quillon::test
