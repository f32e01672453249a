#include "operations.h"
#include "support/faults.h"
#include "support/judge.h"
#include <quillon/raster.h>

#include <cmath>
#include <limits>

namespace quillon::test {
namespace {

constexpr double kMinScale = 1.0 / 32767;
constexpr double kNan = std::numeric_limits<double>::quiet_NaN();

TEST(Scale, equalsItsStatement) {
    forEachCase(9000, tryScale);
    Random random(baseSeed());
    // Vertical positions that wrap in the midst of a span, from the last row, which
    // the cache must still hold, to the first.
    for (const uint32_t height : {21u, 22u, 23u, 43u})
        tryScaling(random, {{5, height, 20}, {5, 3, 20}, 0, 1637, 1, 0.05, 2});
    // Every eighth pixel of rows that begin anywhere in a cache line.
    for (uint32_t width = 520; width < 600; ++width) {
        const auto stride = static_cast<int32_t>(4 * width);
        tryScaling(random, {{width, 3, stride}, {76, 1, 304}, 0, 0, 0.125, 0.125, 0});
    }
    // The whole of a source that is as wide as can be.
    for (const double scale : {std::nextafter(kMinScale, 1), 0.5, 1.0 / 3000, 1.0 / 257, 1.0})
        for (const uint32_t width : {1u, 40u, 32767u})
            for (const uint32_t filter : {0u, 2u})
                tryScaling(
                    random,
                    {{32767, 2, 4 * 32767}, {width, 2, 4 * 32767}, 0, 0, scale, scale, filter});
}

// Large enough to be written around the caches, from rows at odd addresses.
TEST(Scale, largeSurfacesEqualTheirStatement) {
    Random random(baseSeed());
    for (const double scale : {3.0, 0.9, 0.5, 0.3, 0.25, 0.125, 0.0625})
        for (const uint32_t filter : {0u, 2u}) {
            const auto srcWidth = static_cast<uint32_t>(1200 / scale) - 1;
            const int32_t stride = 4 * 1200 + random.oneOf({0, 4, 13, 64});
            tryScaling(random, {{srcWidth, 20, static_cast<int32_t>(4 * srcWidth)},
                                {1200, 340, stride},
                                random.oneIn(4) ? 7 : 0,
                                0,
                                scale,
                                scale,
                                filter});
        }
}

// Memory is asked for only where rows are mixed.
TEST(Scale, writesNothingWithoutMemory) {
    for (const uint32_t filter : {0u, 2u})
        for (const double scaleY : {0.25, 0.5, 0.9, 1.0, 1.5, 3.0})
            forEachTarget([&] {
                uint8_t src[64] = {1}, dst[64] = {};
                const MemoryFault fault(0, true);
                const uint32_t result =
                    Raster_Scale(dst, 16, 4, 4, 0, 0, 4, 4, src, 16, 4, 4, 1, scaleY, filter);
                EXPECT_EQ(fault.happened, filter != 0 && scaleY != 1);
                EXPECT_EQ(result, fault.happened ? 0u : 1u);
                EXPECT_EQ(dst[0] != 0, !fault.happened);
            });
}

// Sizes are looked at first, then factors, then what is empty.
TEST(Scale, refusals) {
    enum Outcome { kRefused, kNothingToDo, kWritten };
    const auto outcome = [](Size dstSize, Size srcSize, double scaleX, double scaleY,
                            int32_t right) {
        uint8_t src[64] = {1}, dst[64] = {};
        const uint32_t result =
            Raster_Scale(dst, 16, dstSize.width, dstSize.height, 0, 0, right, 4, src, 16,
                         srcSize.width, srcSize.height, scaleX, scaleY, 0);
        return static_cast<Outcome>(result + dst[0]);
    };
    constexpr Size k4x4 = {4, 4};
    EXPECT_EQ(outcome({32768, 4}, k4x4, 1, 1, 4), kRefused);
    EXPECT_EQ(outcome(k4x4, {32768, 4}, 1, 1, 4), kRefused);
    EXPECT_EQ(outcome(k4x4, {4, 0x80000000}, 1, 1, 0), kRefused);
    EXPECT_EQ(outcome(k4x4, {4, 0}, 1, -1, 0), kRefused);
    EXPECT_EQ(outcome(k4x4, k4x4, 1, 1, 0), kNothingToDo);
    EXPECT_EQ(outcome(k4x4, {0, 4}, 1, 1, 4), kNothingToDo);
    EXPECT_EQ(outcome({4, 0}, k4x4, 1, 1, 4), kNothingToDo);
    EXPECT_EQ(outcome(k4x4, k4x4, kMinScale, 1, 4), kRefused);
    EXPECT_EQ(outcome(k4x4, k4x4, 65536, std::nextafter(kMinScale, 1), 4), kWritten);
    EXPECT_EQ(outcome(k4x4, k4x4, 1, std::nextafter(65536.0, 1e9), 4), kRefused);
    EXPECT_EQ(outcome(k4x4, k4x4, kNan, 1, 4), kRefused);
}

std::vector<int32_t> mapped(Rect rect, uint32_t width, uint32_t height, double scaleX,
                            double scaleY) {
    Raster_ScaleSrcCoordinates(&rect, width, height, scaleX, scaleY);
    return {rect.left, rect.top, rect.right, rect.bottom};
}

TEST(ScaleSrcCoordinates, equalsItsModel) {
    using Fields = std::vector<int32_t>;
    // Factors that are no numbers leave the rectangle alone; huge ones are cut at
    // the scaled image, whose size wraps.
    EXPECT_EQ(mapped({10, 11, 20, 21}, 100, 50, kNan, 1), (Fields{10, 11, 20, 21}));
    EXPECT_EQ(mapped({10, 11, 20, 21}, 100, 50, 1, HUGE_VAL), (Fields{10, 11, 20, 21}));
    EXPECT_EQ(mapped({0, 0, 10, 10}, 100, 50, 1e300, 1), (Fields{0, 0, 0, 11}));
    forEachCase(100000, tryScaleSrcCoordinates);
}

} // namespace
} // namespace quillon::test
