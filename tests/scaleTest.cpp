// The scaler against its plain statement, on every instruction set, and the
// values that a caller can rely on.

#include "reference/scale.h"
#include "support/faults.h"
#include "support/longDouble.h"
#include "support/surfaces.h"
#include <quillon/raster.h>

#include <cmath>
#include <limits>
#include <vector>

namespace quillon::test {
namespace {

constexpr double kMinScale = 1.0 / 32767;
constexpr double kNan = std::numeric_limits<double>::quiet_NaN();

// How rows lie in memory: any stride, also 0, negative, or less than a row.
struct Rows {
    uint32_t width, height;
    int32_t stride;

    size_t toLast() const { return static_cast<size_t>(std::abs(stride)) * (height - 1); }
    size_t bytes() const { return toLast() + size_t{4} * width; }
    // Row 0, when the rows take up all of a block of this size.
    size_t first() const { return stride < 0 ? toLast() : 0; }
};

struct ScaleCase {
    Rows src, dst; // dst: of the rectangle alone
    int32_t left, top;
    double scaleX, scaleY;
    uint32_t filter;
};

uint32_t run(const ScaleCase &c, uint8_t *dst, const uint8_t *src, decltype(Raster_Scale) scale) {
    // Pixel (0, 0) may be an address outside of memory.
    const int64_t offset = int64_t{c.dst.stride} * c.top + int64_t{4} * c.left;
    auto *origin = reinterpret_cast<uint8_t *>(reinterpret_cast<uintptr_t>(dst + c.dst.first()) -
                                               static_cast<uintptr_t>(offset));
    return scale(origin, c.dst.stride, 32767, 32767, c.left, c.top,
                 c.left + static_cast<int32_t>(c.dst.width),
                 c.top + static_cast<int32_t>(c.dst.height), src + c.src.first(), c.src.stride,
                 c.src.width, c.src.height, c.scaleX, c.scaleY, c.filter);
}

// In fenced memory, either end of which is at the fence.
void expectAsStated(const ScaleCase &c, Random &random) {
    const auto flush =
        random.oneIn(2) ? FencedBuffer::Flush::kBehind : FencedBuffer::Flush::kBefore;
    const FencedBuffer src(c.src.bytes(), flush), dst(c.dst.bytes(), flush);
    random.fill(src.data(), src.size());
    random.fill(dst.data(), dst.size());
    if (random.oneIn(4)) // all the same, and as bright as can be
        std::fill(src.data(), src.end(), uint8_t{255});
    else if (random.oneIn(3))
        plantRuns(random, src.data(), src.size() / 4, 4, {0, 0xFFFFFFFF, random.word()});
    const std::vector<uint8_t> before(dst.data(), dst.end());
    std::vector<uint8_t> expected = before;
    run(c, expected.data(), src.data(), reference::scale);
    forEachTarget([&] {
        for (const bool hasMemory : {false, true}) {
            std::copy(before.begin(), before.end(), dst.data());
            const MemoryFault fault(hasMemory ? UINT64_MAX : 0, true);
            const uint32_t result = run(c, dst.data(), src.data(), Raster_Scale);
            EXPECT_EQ(result, fault.happened ? 0u : 1u);
            EXPECT_TRUE(!fault.happened || (c.filter != 0 && c.scaleY != 1)) << "nothing is mixed";
            const std::vector<uint8_t> &wanted = fault.happened ? before : expected;
            EXPECT_TRUE(std::equal(dst.data(), dst.end(), wanted.begin()))
                << "src " << c.src.width << " x " << c.src.height << " stride " << c.src.stride
                << ", dst " << c.dst.width << " x " << c.dst.height << " stride " << c.dst.stride
                << " at " << c.left << ", " << c.top << ", scale " << c.scaleX << ' ' << c.scaleY
                << ", filter " << c.filter;
        }
    });
}

// Factors where something changes, and any others.
double drawScale(Random &random) {
    static constexpr double kFactors[] = {1,           2,         0.5,       1.0 / 3,   0.1,
                                          0.2,         3,         0.999,     1.001,     1.5,
                                          0.75,        1.0 / 4,   1.0 / 5,   0.4,       1.0 / 32,
                                          1.0 / 33,    1.0 / 8,   1.0 / 64,  1.0 / 256, 1.0 / 257,
                                          1.0 / 257.5, 1.0 / 258, 1.0 / 600, 65536,     40000};
    switch (random.below(8)) {
    case 0:
        return std::nextafter(random.oneOf({1.0, 2.0, 0.5, kMinScale}), 2);
    case 1:
        return std::nextafter(random.oneOf({1.0, 2.0, 0.5, 65536.0}), 0);
    case 2:
    case 3:
        return std::exp2(random.between(-600, 600) / 100.0);
    default:
        return kFactors[random.below(std::size(kFactors))];
    }
}

Rows drawRows(Random &random, uint32_t width, uint32_t height) {
    const int32_t row = static_cast<int32_t>(4 * width);
    const int32_t stride =
        random.oneOf({row, row, row + 4, row + random.between(0, 99), random.between(0, row)});
    return {width, height, random.oneIn(4) ? -stride : stride};
}

// Where the rectangle starts: mostly near the source, else anywhere, so that
// positions pass every limit.
int32_t drawCorner(Random &random, double scale, uint32_t srcSize) {
    if (random.oneIn(3))
        return 0;
    if (random.oneIn(6))
        return random.between(-100, 32767);
    return random.between(0, static_cast<int32_t>(std::fmin(srcSize * scale, 32700)));
}

TEST(Scale, equalsItsStatement) {
    forEachCase(9000, [](Random &random) {
        ScaleCase c{};
        c.src = drawRows(random, 1 + random.below(random.oneIn(8) ? 2700 : 70),
                         1 + random.below(random.oneIn(8) ? 70 : 20));
        c.dst =
            drawRows(random, 1 + random.below(random.oneIn(8) ? 300 : 70), 1 + random.below(12));
        c.scaleX = drawScale(random);
        c.scaleY = random.oneIn(3) ? c.scaleX : drawScale(random);
        c.left = drawCorner(random, c.scaleX, c.src.width);
        c.top = drawCorner(random, c.scaleY, c.src.height);
        c.filter = random.oneOf({0u, 0u, 1u, 2u, 2u, 256u, 0x80000000u});
        expectAsStated(c, random);
    });
    Random random(baseSeed());
    // Vertical positions that wrap in the midst of a span, from the last row, which
    // the cache must still hold, to the first.
    for (const uint32_t height : {21u, 22u, 23u, 43u})
        expectAsStated({{5, height, 20}, {5, 3, 20}, 0, 1637, 1, 0.05, 2}, random);
    // The whole of a source that is as wide as can be.
    for (const double scale : {std::nextafter(kMinScale, 1), 0.5, 1.0 / 3000, 1.0 / 257, 1.0})
        for (const uint32_t width : {1u, 40u, 32767u})
            for (const uint32_t filter : {0u, 2u})
                expectAsStated(
                    {{32767, 2, 4 * 32767}, {width, 2, 4 * 32767}, 0, 0, scale, scale, filter},
                    random);
}

// Large enough to be written around the caches, from rows at odd addresses.
TEST(Scale, largeSurfacesEqualTheirStatement) {
    Random random(baseSeed());
    for (const double scale : {3.0, 0.9, 0.5, 0.3, 0.25, 0.125, 0.0625})
        for (const uint32_t filter : {0u, 2u}) {
            const auto srcWidth = static_cast<uint32_t>(1200 / scale) - 1;
            const int32_t stride = 4 * 1200 + random.oneOf({0, 4, 13, 64});
            expectAsStated({{srcWidth, 20, static_cast<int32_t>(4 * srcWidth)},
                            {1200, 340, stride},
                            random.oneIn(4) ? 7 : 0,
                            0,
                            scale,
                            scale,
                            filter},
                           random);
        }
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

// One axis in 80 bits.
std::pair<int32_t, int32_t> modelRange(int32_t first, int32_t end, uint32_t size,
                                       long double scale) {
    const long double margin = std::max(scale, 1.0L),
                      low = in80Bits(in80Bits(first * scale) - margin);
    const auto most = static_cast<uint32_t>(static_cast<int64_t>(in80Bits(size * scale)));
    const double high = std::ceil(static_cast<double>(in80Bits(in80Bits(end * scale) + margin)));
    return {low < 0 ? 0 : static_cast<int32_t>(static_cast<int64_t>(low)),
            static_cast<int32_t>(high > most ? most : static_cast<int64_t>(high))};
}

TEST(ScaleSrcCoordinates, equalsItsModel) {
    using Fields = std::vector<int32_t>;
    // Factors that are no numbers leave the rectangle alone; huge ones are cut at
    // the scaled image, whose size wraps.
    EXPECT_EQ(mapped({10, 11, 20, 21}, 100, 50, kNan, 1), (Fields{10, 11, 20, 21}));
    EXPECT_EQ(mapped({10, 11, 20, 21}, 100, 50, 1, HUGE_VAL), (Fields{10, 11, 20, 21}));
    EXPECT_EQ(mapped({0, 0, 10, 10}, 100, 50, 1e300, 1), (Fields{0, 0, 0, 11}));
    forEachCase(100000, [](Random &random) {
        const auto coordinate = [&] {
            return random.oneIn(3) ? static_cast<int32_t>(random.word()) >> random.below(31)
                                   : random.between(-20, 2000);
        };
        const Rect old{coordinate(), coordinate(), coordinate(), coordinate()};
        const uint32_t width = random.below(3000), height = random.below(3000);
        // Also negative; but no coordinate leaves 64 bits.
        const double scaleX = drawScale(random) * random.oneOf({1, 1, 1, -1});
        const double scaleY = drawScale(random);
        const auto [left, right] = modelRange(old.left, old.right, width, scaleX);
        const auto [top, bottom] = modelRange(old.top, old.bottom, height, scaleY);
        EXPECT_EQ(mapped(old, width, height, scaleX, scaleY), (Fields{left, top, right, bottom}));
    });
}

} // namespace
} // namespace quillon::test
