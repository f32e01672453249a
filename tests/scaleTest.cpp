// The scaler against its plain statement, on every instruction set, and the
// values that a caller can rely on.

#include "reference/scale.h"
#include "hearth.h"
#include "raster.h"
#include "support/fence.h"
#include "support/random.h"
#include "support/surfaces.h"
#include "support/targets.h"

#include <cmath>
#include <cstdlib>
#include <limits>
#include <vector>

namespace {

bool memoryIsOut = false;

} // namespace

// In the place of libhearth's.
void *UtilSafeMalloc0(size_t size) {
    return memoryIsOut ? nullptr : std::malloc(size);
}

namespace quillon::test {
namespace {

constexpr double kMinScale = 1.0 / 32767;

// --- One call of Raster_Scale, its images in fenced memory

// How rows lie in memory: any increment, also 0, negative, or less than a row.
struct Rows {
    uint32 width, height;
    int32 increment;

    size_t bytes() const {
        return static_cast<size_t>(std::abs(increment)) * (height - 1) + size_t{4} * width;
    }
    // Row 0, when the rows take up all of a block of this size.
    size_t first() const {
        return increment < 0 ? static_cast<size_t>(-increment) * (height - 1) : 0;
    }
};

struct ScaleCase {
    Rows src, dst; // dst: of the rectangle alone
    int32 left, top;
    double scaleX, scaleY;
    uint32 filter;
    bool isFlushBehind; // which end of the images is at the fence
};

std::ostream &operator<<(std::ostream &out, const ScaleCase &c) {
    return out << "src " << c.src.width << "x" << c.src.height << " step " << c.src.increment
               << ", dst " << c.dst.width << "x" << c.dst.height << " step " << c.dst.increment
               << " at " << c.left << "," << c.top << ", scale " << std::hexfloat << c.scaleX << " "
               << c.scaleY << ", filter " << c.filter;
}

template <class Scale>
uint32 run(const ScaleCase &c, uint8 *dst, const uint8 *src, const Scale &scale) {
    // Pixel (0, 0) may be an address outside of memory.
    const int64_t offset = int64_t{c.dst.increment} * c.top + int64_t{4} * c.left;
    auto *origin = reinterpret_cast<uint8 *>(reinterpret_cast<uintptr_t>(dst + c.dst.first()) -
                                             static_cast<uintptr_t>(offset));
    return scale(origin, c.dst.increment, 32767, 32767, c.left, c.top,
                 c.left + static_cast<int32>(c.dst.width), c.top + static_cast<int32>(c.dst.height),
                 src + c.src.first(), c.src.increment, c.src.width, c.src.height, c.scaleX,
                 c.scaleY, c.filter);
}

void expectAsStated(const ScaleCase &c, Random &random) {
    SCOPED_TRACE(c);
    const auto flush =
        c.isFlushBehind ? FencedBuffer::Flush::kBehind : FencedBuffer::Flush::kBefore;
    const FencedBuffer src(c.src.bytes(), flush);
    const FencedBuffer dst(c.dst.bytes(), flush);
    random.fill(src.data(), src.size());
    random.fill(dst.data(), dst.size());
    if (random.oneIn(4)) // all the same, and as bright as can be
        std::fill(src.data(), src.end(), uint8{255});
    std::vector<uint8> expected(dst.data(), dst.end());
    ASSERT_EQ(run(c, expected.data(), src.data(), reference::scale), 1u);
    ASSERT_EQ(run(c, dst.data(), src.data(), Raster_Scale), 1u);
    for (size_t i = 0; i < expected.size(); ++i)
        ASSERT_EQ(dst.data()[i], expected[i]) << "at byte " << i;
    EXPECT_TRUE(dst.canariesIntact());
}

// Factors where something changes, and any others.
double drawScale(Random &random) {
    static constexpr double kFactors[] = {
        1,        2,         0.5,       1.0 / 3,     0.1,       0.2,       3,        0.999,
        1.001,    1.5,       0.75,      1.0 / 4,     1.0 / 5,   0.4,       1.0 / 32, 1.0 / 33,
        1.0 / 64, 1.0 / 256, 1.0 / 257, 1.0 / 257.5, 1.0 / 258, 1.0 / 600, 65536,    40000};
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

int32 drawIncrement(Random &random, uint32 width) {
    return static_cast<int32>(randomLine(random, size_t{4} * width, true));
}

// Where the rectangle starts: mostly near the source, else anywhere, so that
// positions pass every limit.
int32 drawCorner(Random &random, double scale, uint32 srcSize) {
    if (random.oneIn(3))
        return 0;
    if (random.oneIn(6))
        return random.between(-100, 32767);
    const double size = std::fmin(srcSize * scale, 32700);
    return random.between(0, static_cast<int32>(size));
}

TEST(Scale, equalsItsStatement) {
    forEachTarget([] {
        forEachCase(6000, [](Random &random) {
            ScaleCase c{};
            c.src.width = 1 + random.below(random.oneIn(8) ? 700 : 70);
            c.src.height = 1 + random.below(random.oneIn(8) ? 70 : 20);
            c.src.increment = drawIncrement(random, c.src.width);
            c.dst.width = 1 + random.below(70);
            c.dst.height = 1 + random.below(12);
            c.dst.increment = drawIncrement(random, c.dst.width);
            c.scaleX = drawScale(random);
            c.scaleY = random.oneIn(3) ? c.scaleX : drawScale(random);
            c.left = drawCorner(random, c.scaleX, c.src.width);
            c.top = drawCorner(random, c.scaleY, c.src.height);
            c.filter = random.oneOf({0u, 0u, 1u, 2u, 2u, 256u, 0x80000000u});
            c.isFlushBehind = random.oneIn(2);
            expectAsStated(c, random);
        });
    });
}

// The whole width of a source that is as wide as can be.
TEST(Scale, equalsItsStatementAtTheLimits) {
    forEachTarget([] {
        forEachCase(20, [](Random &random) {
            const double scale =
                random.oneOf({std::nextafter(kMinScale, 1), 0.5, 1.0 / 3000, 1.0 / 257, 1.0});
            ScaleCase c{{32767, 2, 4 * 32767}, {32767, 2, 4 * 32767}, 0, 0, scale, scale, 0, true};
            c.filter = random.below(3);
            c.dst.width = random.oneOf({1u, 40u, 32767u});
            expectAsStated(c, random);
        });
    });
}

// Vertical positions that wrap in the midst of a span, from the last row, which
// the cache must still hold, to the first.
TEST(Scale, spansThatWrap) {
    forEachTarget([] {
        Random random(1);
        for (const uint32 height : {21u, 22u, 23u, 43u})
            expectAsStated({{5, height, 20}, {5, 3, 20}, 0, 1637, 1, 0.05, 2, true}, random);
    });
}

// --- Images in plain memory, for known values

struct Image {
    Image(uint32 imageWidth, uint32 imageHeight, uint32 pixel = 0)
        : width(imageWidth), height(imageHeight), pixels(size_t{imageWidth} * imageHeight, pixel) {}

    uint32 at(uint32 x, uint32 y) const { return pixels[size_t{y} * width + x]; }
    auto *bytes() { return reinterpret_cast<uint8 *>(pixels.data()); }

    uint32 width, height;
    std::vector<uint32> pixels;
};

Image counted(uint32 width, uint32 height) {
    Image image(width, height);
    for (size_t i = 0; i < image.pixels.size(); ++i)
        image.pixels[i] = static_cast<uint32>(i);
    return image;
}

Image scaled(Image src, uint32 width, uint32 height, double scaleX, double scaleY, uint32 filter) {
    Image dst(width, height);
    EXPECT_EQ(Raster_Scale(dst.bytes(), static_cast<int32>(4 * width), width, height, 0, 0,
                           static_cast<int32>(width), static_cast<int32>(height), src.bytes(),
                           static_cast<int32>(4 * src.width), src.width, src.height, scaleX, scaleY,
                           filter),
              1u);
    return dst;
}

TEST(Scale, factorOneCopies) {
    const Image src = counted(37, 5);
    for (const uint32 filter : {0u, 1u, 2u})
        EXPECT_EQ(scaled(src, 37, 5, 1, 1, filter).pixels, src.pixels);
}

TEST(Scale, stepsAreTruncatedAfterRoundingAt64Bits) {
    const Image dst = scaled(counted(64, 1), 5, 1, 0.1, 1, 0);
    EXPECT_EQ(dst.pixels, (std::vector<uint32>{0, 9, 19, 29, 39}));
}

TEST(Scale, enlargementLosesUpToTwoLevels) {
    const Image dst = scaled(Image(6, 6, 0xFFFFFFFF), 12, 12, 2, 2, 2);
    EXPECT_EQ(dst.at(5, 5), 0xFDFDFDFDu);
    EXPECT_EQ(dst.at(0, 5), 0xFEFEFEFEu); // edge columns are copied
    EXPECT_EQ(dst.at(11, 5), 0xFEFEFEFEu);
    EXPECT_EQ(dst.at(5, 0), 0xFDFDFDFDu); // edge rows are blended with themselves
    const Image row = scaled(Image(6, 1, 0xFFFFFFFF), 12, 1, 2, 1, 2);
    EXPECT_EQ(row.at(0, 0), 0xFFFFFFFFu);
    EXPECT_EQ(row.at(1, 0), 0xFEFEFEFEu);
    EXPECT_EQ(row.at(11, 0), 0xFFFFFFFFu);

    // Halfway between 0 and 200, with weights 127 and 128 of 256.
    Image edge(2, 1);
    edge.pixels[1] = 200;
    EXPECT_EQ(scaled(edge, 4, 1, 2, 1, 2).pixels, (std::vector<uint32>{0, 0, 100, 200}));
}

TEST(Scale, reductionAverages) {
    // Columns count whole, rows as 255 of 256; the last column is copied.
    Image src(5, 2);
    src.pixels = {0x10FF0201, 0x20FF0403, 0, 0, 7, 0x10FF0201, 0x20FF0403, 0, 0, 7};
    EXPECT_EQ(scaled(src, 3, 1, 0.5, 1, 2).pixels, (std::vector<uint32>{0x18FF0302, 0, 7}));
    EXPECT_EQ(scaled(src, 1, 1, 0.5, 0.5, 2).at(0, 0), 0x17FE0201u);

    // The last column is in no average, so what reaches to it comes out dark.
    const Image bright = scaled(Image(4, 1, 0xFFFFFFFF), 2, 1, 1.0 / 2, 1, 2);
    EXPECT_EQ(bright.pixels, (std::vector<uint32>{0xFFFFFFFF, 0x7F7F7F7F}));
}

TEST(Scale, averagesOf32RowsAtMost) {
    EXPECT_EQ(scaled(Image(1, 64, 0xFFFFFFFF), 1, 1, 1, 1.0 / 64, 2).at(0, 0), 0x7F7F7F7Fu);
}

TEST(Scale, averagesOfAnyNumberOfColumns) {
    for (const uint32 width : {256u, 258u, 600u, 32766u}) {
        SCOPED_TRACE(width);
        const double scale = 1.0 / width;
        const uint32 level = scaled(Image(width + 1, 1, 0x00FFFFFF), 1, 1, scale, 1, 2).at(0, 0);
        EXPECT_EQ(level & 0xFF00FFFF, (level >> 16 & 0xFF) * 0x0101); // no channel disturbs another
        EXPECT_GE(level & 0xFF, width == 32766 ? 253u : 250u);
    }
}

TEST(Scale, aPartIsThatPartOfTheWhole) {
    forEachCase(300, [](Random &random) {
        const Image src = counted(33, 21);
        Image whole(60, 50), part(60, 50, 0xABABABAB);
        const double scale = random.oneOf({0.3, 0.5, 0.7, 1.0, 1.3, 2.0, 5.0});
        const uint32 filter = random.below(2);
        const auto scaleTo = [&](Image &dst, int32 left, int32 top, int32 right, int32 bottom) {
            EXPECT_EQ(Raster_Scale(dst.bytes(), 240, 60, 50, left, top, right, bottom,
                                   Image(src).bytes(), 132, 33, 21, scale, scale, filter),
                      1u);
        };
        const int32 left = random.between(0, 59), right = random.between(left + 1, 60);
        const int32 top = random.between(0, 49), bottom = random.between(top + 1, 50);
        scaleTo(whole, 0, 0, 60, 50);
        scaleTo(part, left, top, right, bottom);
        for (int32 y = 0; y < 50; ++y)
            for (int32 x = 0; x < 60; ++x) {
                const bool isInside = left <= x && x < right && top <= y && y < bottom;
                const auto column = static_cast<uint32>(x), row = static_cast<uint32>(y);
                ASSERT_EQ(part.at(column, row), isInside ? whole.at(column, row) : 0xABABABAB);
            }
    });
}

// --- What is refused, and in which order it is looked at

TEST(Scale, refusals) {
    struct {
        uint32 dstWidth, dstHeight, srcWidth, srcHeight;
        double scaleX, scaleY;
        int32 right;
        uint32 result;
        bool isWritten;
    } const cases[] = {
        {4, 4, 4, 4, 1, 1, 4, 1, true},
        {32767, 32767, 4, 4, 1, 1, 4, 1, true},
        {32768, 4, 4, 4, 1, 1, 4, 0, false},
        {4, 32768, 4, 4, 1, 1, 4, 0, false},
        {4, 4, 32768, 4, 1, 1, 4, 0, false},
        {4, 4, 4, 32768, 1, 1, 4, 0, false},
        {4, 4, 4, 0x80000000, 1, 1, 0, 0, false}, // sizes first,
        {4, 4, 4, 4, 0, 1, 0, 0, false},          // then factors,
        {4, 4, 4, 0, 1, -1, 0, 0, false},
        {4, 4, 4, 4, 1, 1, 0, 1, false}, // then what is empty
        {4, 4, 4, 4, 1, 1, -1, 1, false},
        {4, 4, 0, 4, 1, 1, 4, 1, false},
        {4, 4, 4, 0, 1, 1, 4, 1, false},
        {0, 4, 4, 4, 1, 1, 4, 1, false},
        {4, 0, 4, 4, 1, 1, 4, 1, false},
        {4, 4, 4, 4, kMinScale, 1, 4, 0, false},
        {4, 4, 4, 4, 1, std::nextafter(kMinScale, 1), 4, 1, true},
        {4, 4, 4, 4, 65536, 65536, 4, 1, true},
        {4, 4, 4, 4, std::nextafter(65536.0, 1e9), 1, 4, 0, false},
        {4, 4, 4, 4, 1, std::numeric_limits<double>::infinity(), 4, 0, false},
        {4, 4, 4, 4, std::numeric_limits<double>::quiet_NaN(), 1, 4, 0, false},
        {4, 4, 4, 4, 1, std::numeric_limits<double>::quiet_NaN(), 4, 0, false},
    };
    for (const uint32 filter : {0u, 2u})
        for (const auto &c : cases) {
            SCOPED_TRACE(testing::Message() << "case " << &c - cases << ", filter " << filter);
            Image src = counted(4, 4), dst(4, 4, 0xABABABAB);
            EXPECT_EQ(Raster_Scale(dst.bytes(), 16, c.dstWidth, c.dstHeight, 0, 0, c.right, 4,
                                   src.bytes(), 16, c.srcWidth, c.srcHeight, c.scaleX, c.scaleY,
                                   filter),
                      c.result);
            EXPECT_EQ(dst.pixels != Image(4, 4, 0xABABABAB).pixels, c.isWritten);
        }
}

TEST(Scale, withoutMemory) {
    Image src = counted(4, 4), dst(4, 4, 0xABABABAB);
    const auto result = [&](double scaleY, uint32 filter) {
        memoryIsOut = true;
        const uint32 value = Raster_Scale(dst.bytes(), 16, 4, 4, 0, 0, 4, 4, src.bytes(), 16, 4, 4,
                                          0.75, scaleY, filter);
        memoryIsOut = false;
        return value;
    };
    EXPECT_EQ(result(0.5, 2), 0u);
    EXPECT_EQ(result(2, 2), 0u);
    EXPECT_EQ(dst.pixels, Image(4, 4, 0xABABABAB).pixels);
    // Rows that are not mixed need none.
    EXPECT_EQ(result(2, 0), 1u);
    EXPECT_EQ(result(1, 2), 1u);
    EXPECT_NE(dst.pixels, Image(4, 4, 0xABABABAB).pixels);
}

// --- Raster_ScaleSrcCoordinates

std::vector<int32> fields(const Rect &rect) {
    return {rect.left, rect.top, rect.right, rect.bottom};
}

TEST(ScaleSrcCoordinates, equalsItsStatement) {
    forEachCase(100000, [](Random &random) {
        const auto coordinate = [&] {
            return random.oneIn(3) ? static_cast<int32>(random.word()) >> random.below(31)
                                   : random.between(-20, 2000);
        };
        const Rect old{coordinate(), coordinate(), coordinate(), coordinate()};
        const uint32 width = random.below(3000), height = random.below(3000);
        // Also negative; but no coordinate leaves 64 bits.
        const double scaleX = drawScale(random) * random.oneOf({1, 1, 1, -1});
        const double scaleY = drawScale(random);
        Rect actual = old, expected = old;
        Raster_ScaleSrcCoordinates(&actual, width, height, scaleX, scaleY);
        reference::scaleSrcCoordinates(&expected, width, height, scaleX, scaleY);
        EXPECT_EQ(fields(actual), fields(expected))
            << testing::PrintToString(fields(old)) << " in " << width << "x" << height
            << std::hexfloat << ", scale " << scaleX << " " << scaleY;
    });
}

TEST(ScaleSrcCoordinates, knownValues) {
    const auto mapped = [](Rect rect, double scaleX, double scaleY) {
        Raster_ScaleSrcCoordinates(&rect, 100, 50, scaleX, scaleY);
        return fields(rect);
    };
    using Fields = std::vector<int32>;
    EXPECT_EQ(mapped({0, 0, 100, 50}, 2, 2), (Fields{0, 0, 200, 100}));
    EXPECT_EQ(mapped({10, 10, 20, 20}, 2, 0.5), (Fields{18, 4, 42, 11}));
    EXPECT_EQ(mapped({200, 100, -20, -9}, 2, 1), (Fields{398, 99, -38, -8}));
    EXPECT_EQ(mapped({10, 10, 20, 20}, 0.1, 1.0 / 3), (Fields{0, 2, 3, 8}));
    // Factors that are no numbers leave the rectangle alone.
    const double nan = std::numeric_limits<double>::quiet_NaN();
    EXPECT_EQ(mapped({10, 11, 20, 21}, nan, 1), (Fields{10, 11, 20, 21}));
    EXPECT_EQ(mapped({10, 11, 20, 21}, 1, HUGE_VAL), (Fields{10, 11, 20, 21}));
    // Huge ones are cut at the scaled image, whose size wraps.
    EXPECT_EQ(mapped({0, 0, 10, 10}, 1e300, 1), (Fields{0, 0, 0, 11}));
}

} // namespace
} // namespace quillon::test
