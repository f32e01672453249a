// Cursors: planes against the expansion of bits, boxes and drawing pixel by pixel,
// scaling against its composition from a padded image and the scaler.

#include "reference/pixels.h"
#include "support/faults.h"
#include "support/fence.h"
#include "support/longDouble.h"
#include "support/messages.h"
#include "support/random.h"
#include <quillon/raster.h>

#include <algorithm>
#include <cfloat>
#include <cmath>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <vector>

namespace quillon::test {
namespace {

constexpr uint32_t kNoSize = 0xFFFFFFFF;
constexpr uint32_t kTypes[] = {RASTER_CURSOR_ALPHA, RASTER_CURSOR_ANDXOR};

using Bytes = std::vector<uint8_t>;

Bytes bytesOf(const FencedBuffer &buffer) {
    return {buffer.data(), buffer.end()};
}

// --- Planes

uint32_t modelSize(uint32_t width, uint32_t height, uint32_t depth) {
    const uint64_t bits = uint64_t{width} * depth + 31, row = bits / 32 * 4;
    const bool hasSize = bits <= kNoSize && (height == 0 || row <= kNoSize / height);
    return hasSize ? static_cast<uint32_t>(row * height) : kNoSize;
}

TEST(CursorPlanes, haveASize) {
    forEachCase(300000, [](Random &random) {
        const auto draw = [&] { return random.word() >> random.below(32); };
        const uint32_t width = draw(), height = draw(), depth = draw();
        ASSERT_EQ(Raster_CalculateCursorSize(width, height, depth),
                  modelSize(width, height, depth));
    });
}

// Padding is left alone by an expansion, and goes along in a copy.
TEST(CursorPlanes, areExpandedOrCopied) {
    forEachCase(20000, [](Random &random) {
        const uint32_t width = random.below(80), height = random.below(6);
        const uint32_t depth = random.oneOf({1u, 8u, 15u, 16u, 24u, 32u, random.below(50)});
        const uint32_t size = modelSize(width, height, depth);
        const FencedBuffer bits(modelSize(width, height, 1)), plane(size), dst(size_t{size} * 2);
        for (const FencedBuffer *buffer : {&bits, &plane, &dst})
            random.fill(buffer->data(), buffer->size());
        const bool areBits[] = {random.oneIn(2), random.oneIn(2)};
        const uint8_t *const data[] = {(areBits[0] ? bits : plane).data(),
                                       (areBits[1] ? bits : plane).data()};

        Bytes expected = bytesOf(dst);
        const auto expand = [&](uint8_t *part) {
            Raster_BitsToPixels(bits.data(), static_cast<int32_t>(modelSize(width, 1, 1)), part,
                                static_cast<int32_t>(modelSize(width, 1, depth)),
                                static_cast<int32_t>(depth / 8), static_cast<int32_t>(width),
                                height, 0xFFFFFFFF, 0);
        };
        expand(expected.data());
        Raster_ExpandCursorBitPlane(width, height, depth, bits.data(), dst.data(), size);
        ASSERT_EQ(bytesOf(dst), expected);
        for (const size_t i : {0u, 1u}) {
            uint8_t *const part = expected.data() + i * size;
            areBits[i] && depth != 1 ? expand(part) : (void)std::copy_n(data[i], size, part);
        }
        Raster_ExpandPlanarCursorData(width, height, areBits[0] ? 1 : depth, data[0],
                                      areBits[1] ? 1 : depth, data[1], depth, dst.data(), 2 * size);
        ASSERT_EQ(bytesOf(dst), expected);
    });
}

TEST(CursorPlanes, panics) {
    const Bytes bits(8, 0xFF);
    Bytes dst(64, 0xAB);
    const auto expand = [&](const char *start, uint32_t andDepth, uint32_t size) {
        expectPanic(start, [&] {
            Raster_ExpandPlanarCursorData(4, 2, andDepth, bits.data(), 8, bits.data(), 32,
                                          dst.data(), size);
        });
        return std::count(dst.begin(), dst.end(), 0xFF);
    };
    EXPECT_EQ(expand("VERIFY lib/raster/rasterCursor", 8, 63), 0); // the size comes first
    EXPECT_EQ(expand("NOT_IMPLEMENTED lib/raster/rasterCursor", 8, 64), 0);
    EXPECT_EQ(expand("NOT_IMPLEMENTED lib/raster/rasterCursor", 1, 64), 32);
    expectPanic("VERIFY lib/raster/rasterCursor",
                [&] { Raster_ExpandCursorBitPlane(4, 2, 32, bits.data(), dst.data(), 31); });
}

// Such planes would reach beyond any dstSize, one of them or only both together.
// Null pointers, as nothing may be read either.
TEST(CursorPlanes, whatNoSizeTellsIsNotWritten) {
    const uint32_t planes[][3] = {
        {32, 0x10000000, 32}, {kNoSize, 1, 32}, {0x20000000, 1, 8}, {kNoSize, 1, 1}};
    for (const auto &[width, height, depth] : planes)
        for (const uint32_t data : {uint32_t{1}, depth}) {
            Raster_ExpandCursorBitPlane(width, height, depth, nullptr, nullptr, kNoSize);
            Raster_ExpandPlanarCursorData(width, height, data, nullptr, data, nullptr, depth,
                                          nullptr, kNoSize);
        }
    Raster_ExpandPlanarCursorData(32, 0x1000000, 1, nullptr, 32, nullptr, 32, nullptr, kNoSize);
}

// --- Boxes and drawing

// A cursor with random images, each fenced, as are the 32 bytes of the record that
// an alpha cursor has.
struct TestCursor {
    TestCursor(Random &random, uint32_t type, uint32_t width, uint32_t height)
        : memory(type == RASTER_CURSOR_ALPHA ? 32 : sizeof(RasterCursor)),
          images{FencedBuffer(size_t{4} * width * height),
                 FencedBuffer(size_t{4} * width * height)},
          record(*reinterpret_cast<RasterCursor *>(memory.data())) {
        for (const FencedBuffer *part : {&memory, &images[0], &images[1]})
            random.fill(part->data(), part->size());
        record.type = type;
        record.hotspotX = random.below(width + 1);
        record.hotspotY = random.below(height + 1);
        record.width = width;
        record.height = height;
        (type == RASTER_CURSOR_ALPHA ? record.alphaImage : record.andImage) = images[0].data();
        if (type == RASTER_CURSOR_ANDXOR)
            record.xorImage = images[1].data();
    }

    FencedBuffer memory, images[2];
    RasterCursor &record;
};

// The part of an axis that is on the screen, and where it is in the cursor.
struct Span {
    uint32_t dst, size, src;
};

Span modelSpan(int32_t position, uint32_t hotspot, uint32_t size, uint32_t screen) {
    const int64_t start = static_cast<int32_t>(static_cast<uint32_t>(position) - hotspot);
    const int64_t first = std::max<int64_t>(start, 0), end = start + size;
    if (first >= std::min<int64_t>(end, screen) || end - first > INT32_MAX)
        return {};
    return {static_cast<uint32_t>(first),
            static_cast<uint32_t>(std::min<int64_t>(end, screen) - first),
            static_cast<uint32_t>(first - start)};
}

TEST(CursorDrawing, boxesEqualTheirModel) {
    forEachCase(300000, [](Random &random) {
        const auto draw = [&] {
            return random.oneOf({0u, 0u, 0x7FFFFFFFu, 0x80000000u, random.word()}) +
                   random.below(12) - 3;
        };
        RasterCursor cursor{};
        cursor.hotspotX = draw(), cursor.hotspotY = draw();
        cursor.width = draw(), cursor.height = draw();
        const RasterCursorScreen screen = {draw(), draw()};
        const auto x = static_cast<int32_t>(draw()), y = static_cast<int32_t>(draw());
        const Span columns = modelSpan(x, cursor.hotspotX, cursor.width, screen.width);
        const Span rows = modelSpan(y, cursor.hotspotY, cursor.height, screen.height);
        const bool isVisible = columns.size != 0 && rows.size != 0;
        RasterCursorBox box{}, expected{}; // untouched
        if (isVisible)
            expected = {columns.dst, rows.dst, columns.size, rows.size, columns.src, rows.src};
        ASSERT_EQ(Raster_ComputeCursorBox(&screen, &cursor, x, y, &box), isVisible ? 1u : 0u);
        ASSERT_EQ(std::memcmp(&box, &expected, sizeof box), 0);
    });
}

TEST(CursorDrawing, equalsItsModelAtEveryEdge) {
    forEachCase(10000, [](Random &random) {
        const TestCursor source(random, random.below(2), 1 + random.below(40), 1 + random.below(9));
        RasterCursor &cursor = source.record;
        const RasterCursorScreen screen = {1 + random.below(50), 1 + random.below(12)};
        const int32_t x = random.between(-50, 100), y = random.between(-12, 24);
        RasterCursorBox box{};
        if (Raster_ComputeCursorBox(&screen, &cursor, x, y, &box) == 0)
            return;
        const bool isAlpha = cursor.type == RASTER_CURSOR_ALPHA;
        if (isAlpha)
            cursor.type = random.oneOf({cursor.type, 2u, 0x80000000u}); // alpha, too

        const FencedBuffer frame(size_t{4} * screen.width * screen.height);
        const FencedBuffer compose(size_t{4} * box.width * box.height);
        random.fill(frame.data(), frame.size());
        const Bytes before = bytesOf(frame);
        Bytes drawn = before, composed(compose.size());
        const auto pixel =
            [](uint8_t * image, uint32_t width, uint32_t column, uint32_t row) -> auto & {
            return reinterpret_cast<uint32_t *>(image)[size_t{row} * width + column];
        };
        for (uint32_t i = 0; i < box.width * box.height; ++i) {
            const uint32_t column = i % box.width, row = i / box.width;
            const auto from = [&](const FencedBuffer &image) {
                return pixel(image.data(), cursor.width, box.srcX + column, box.srcY + row);
            };
            uint32_t &to = pixel(drawn.data(), screen.width, box.dstX + column, box.dstY + row);
            const uint32_t over = from(source.images[0]);
            to = isAlpha ? reference::blended(over, to) : (to & over) ^ from(source.images[1]);
            pixel(composed.data(), box.width, column, row) = to;
        }
        const int32_t stride = 4 * static_cast<int32_t>(screen.width);
        Raster_DrawCursor(frame.data(), stride, compose.data(), 4 * static_cast<int32_t>(box.width),
                          &cursor, &box);
        ASSERT_EQ(bytesOf(frame), before);
        ASSERT_EQ(bytesOf(compose), composed);
        Raster_DrawCursor(frame.data(), stride, nullptr, random.between(-9, 9), &cursor, &box);
        ASSERT_EQ(bytesOf(frame), drawn);
    });
}

// Row 1 of such an image is further than a line increment reaches.
TEST(CursorDrawing, imagesTooWideAreNotDrawn) {
    const RasterCursorBox box = {0, 0, 1, 2, 0, 0};
    for (const uint32_t type : kTypes)
        for (const uint32_t width : {0x20000000u, 0x40000001u, 0xFFFFFFFFu}) {
            RasterCursor cursor{};
            cursor.type = type;
            cursor.width = width;
            Raster_DrawCursor(nullptr, 4, nullptr, 0, &cursor, &box);
        }
}

// --- Scaling

struct Release {
    void operator()(RasterCursor *cursor) const {
        std::free(cursor->type == RASTER_CURSOR_ALPHA ? cursor->alphaImage : cursor->andImage);
        std::free(cursor->type == RASTER_CURSOR_ALPHA ? nullptr : cursor->xorImage);
        std::free(cursor);
    }
};
using Scaled = std::unique_ptr<RasterCursor, Release>;

Scaled scaled(const TestCursor &source, double scaleX, double scaleY) {
    return Scaled(Raster_ScaleCursor(&source.record, scaleX, scaleY));
}

// One axis of the result, in 80 bits.
struct ModelAxis {
    ModelAxis(uint32_t srcSize, uint32_t srcHotspot, double scale)
        : border(static_cast<uint32_t>(std::max<long double>(in80Bits(1.0L / scale), scale)) + 1),
          padded(srcSize + 2 * border),
          // rounded up from the product as a double
          size(static_cast<uint32_t>(
              std::ceil(static_cast<double>(in80Bits(1.0L * padded * scale))))),
          hotspot(static_cast<uint32_t>(in80Bits(1.0L * (srcHotspot + border) * scale))) {}
    uint32_t border, padded, size, hotspot;
};

void expectScaled(Random &random, uint32_t type, uint32_t width, uint32_t height, double scaleX,
                  double scaleY) {
    const TestCursor source(random, type, width, height);
    RasterCursor &from = source.record;
    if (random.oneIn(4))
        from.hotspotY = kNoSize; // one row above the image
    if (type == RASTER_CURSOR_ANDXOR)
        from.type = random.oneOf({type, 2u}); // not alpha, so of two masks
    const Scaled result = scaled(source, scaleX, scaleY);
    ASSERT_NE(result, nullptr);
    const ModelAxis x(width, from.hotspotX, scaleX), y(height, from.hotspotY, scaleY);
    ASSERT_EQ(result->type, type);
    ASSERT_TRUE(result->width == x.size && result->height == y.size);
    ASSERT_TRUE(result->hotspotX == x.hotspot && result->hotspotY == y.hotspot);

    // The source with its border, through the scaler; where that refuses, what
    // changes nothing on the screen.
    const auto expectImage = [&](const FencedBuffer &image, uint8_t fill, uint32_t filter,
                                 const uint8_t *scaledImage) {
        Bytes padded(size_t{4} * x.padded * y.padded, fill);
        for (size_t row = 0; row < height; ++row)
            std::copy_n(image.data() + 4 * width * row, 4 * width,
                        &padded[4 * ((y.border + row) * x.padded + x.border)]);
        Bytes expected(size_t{4} * x.size * y.size, fill);
        Raster_Scale(expected.data(), static_cast<int32_t>(4 * x.size), x.size, y.size, 0, 0,
                     static_cast<int32_t>(x.size), static_cast<int32_t>(y.size), padded.data(),
                     static_cast<int32_t>(4 * x.padded), x.padded, y.padded, scaleX, scaleY,
                     filter);
        ASSERT_EQ(std::memcmp(scaledImage, expected.data(), expected.size()), 0);
    };
    if (type == RASTER_CURSOR_ALPHA)
        return expectImage(source.images[0], 0, 2, result->alphaImage);
    EXPECT_TRUE(result->planeInfo0 == from.planeInfo0 && result->planeInfo1 == from.planeInfo1);
    expectImage(source.images[0], 0xFF, 0, result->andImage);
    expectImage(source.images[1], 0, 0, result->xorImage);
}

TEST(CursorScaling, isAPaddedImageScaled) {
    forEachCase(3000, [](Random &random) {
        const auto scale = [&] {
            const double plain = random.oneOf({1.0, 2.0, 3.0, 0.5, 0.1, 0.2, 0.3, 1.0 / 3, 1.5});
            return random.oneOf({plain, plain, std::nextafter(plain, random.oneIn(2) ? 0 : 9),
                                 std::exp2(random.between(-300, 250) / 100.0)});
        };
        expectScaled(random, random.below(2), random.below(33), random.below(20), scale(), scale());
    });
    // Around the scaler's largest size and factors.
    Random random(1);
    for (const uint32_t type : kTypes) {
        for (const uint32_t size : {32763u, 32764u}) {
            expectScaled(random, type, size, 1, 1, 1);
            expectScaled(random, type, 1, size, 1, 1);
        }
        expectScaled(random, type, 8, 8, 0x1p-14, 1);
        expectScaled(random, type, 8, 8, 200, 1);
    }
}

// Where there is no size, no memory is asked for; where there is, any of it may
// fail.
TEST(CursorScaling, withoutASizeOrMemoryThereIsNoCursor) {
    const std::pair<uint32_t, double> cases[] = {
        {8, 0},     {8, -1},      {8, HUGE_VAL}, {8, DBL_MAX},   {8, std::nan("")},
        {8, 1e10},  {8, 1e-10},   {8, DBL_MIN},  {8, 65536},     {8, 2e9},
        {8, -1e-9}, {kNoSize, 1}, {kNoSize, .5}, {0x20000000, 1}};
    Random random(1);
    for (const uint32_t type : kTypes) {
        const TestCursor source(random, type, 8, 8);
        forEachMemoryFault([&] { return scaled(source, 0.75, 2) != nullptr; });
        for (const auto &[size, scale] : cases)
            for (const bool isWide : {true, false}) {
                source.record.width = isWide ? size : 8;
                source.record.height = isWide ? 8 : size;
                const MemoryFault fault(0);
                EXPECT_EQ(scaled(source, isWide ? scale : 1, isWide ? 1 : scale), nullptr);
                EXPECT_FALSE(fault.happened);
            }
    }
}

} // namespace
} // namespace quillon::test
