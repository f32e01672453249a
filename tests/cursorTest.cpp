// Cursors: planes, boxes and drawing against models that go pixel by pixel,
// scaling against its composition from a padded image and the scaler.

#include "raster.h"
#include "support/faults.h"
#include "support/fence.h"
#include "support/messages.h"
#include "support/random.h"

#include <algorithm>
#include <cfloat>
#include <cmath>
#include <cstdlib>
#include <cstring>
#include <limits>
#include <memory>
#include <set>
#include <vector>

namespace quillon::test {
namespace {

constexpr uint32 kNoSize = 0xFFFFFFFF;
constexpr size_t kAlphaRecordSize = 32;

using Bytes = std::vector<uint8>;

Bytes bytesOf(const FencedBuffer &buffer) {
    return {buffer.data(), buffer.end()};
}

// --- Planes

// In 32 bits, step by step.
uint32 modelSize(uint32 width, uint32 height, uint32 depth) {
    uint32 bits = 0, padded = 0, size = 0;
    if (__builtin_mul_overflow(width, depth, &bits) || __builtin_add_overflow(bits, 31u, &padded) ||
        __builtin_mul_overflow((padded >> 5) << 2, height, &size))
        return kNoSize;
    return size;
}

TEST(CursorPlanes, haveASize) {
    EXPECT_EQ(Raster_CalculateCursorSize(5, 3, 24), 48u);
    EXPECT_EQ(Raster_CalculateCursorSize(1, 0x40000000, 32), kNoSize);
    forEachCase(300000, [](Random &random) {
        const auto draw = [&] { return random.word() >> random.below(32); };
        const uint32 width = draw(), height = draw(), depth = draw();
        ASSERT_EQ(Raster_CalculateCursorSize(width, height, depth),
                  modelSize(width, height, depth));
    });
}

// What a plane looks like when bits have been expanded over what it held.
void modelExpansion(uint32 width, uint32 height, uint32 depth, const uint8 *bits, uint8 *dst) {
    const uint32 pixelBytes = depth / 8 <= 4 ? depth / 8 : 0;
    for (uint32 y = 0; y < height; ++y)
        for (uint32 x = 0; x < width; ++x) {
            const uint8 byte = bits[size_t{y} * modelSize(width, 1, 1) + x / 8];
            const bool isSet = (byte >> (7 - x % 8) & 1) != 0;
            std::fill_n(dst + size_t{y} * modelSize(width, 1, depth) + size_t{x} * pixelBytes,
                        pixelBytes, isSet ? uint8{0xFF} : uint8{0});
        }
}

// Padding is left alone by an expansion, and goes along in a copy.
TEST(CursorPlanes, areExpandedOrCopied) {
    forEachCase(20000, [](Random &random) {
        const uint32 width = random.below(80), height = random.below(6);
        const uint32 depth = random.oneOf({1u, 8u, 15u, 16u, 24u, 32u, random.below(50)});
        const uint32 size = modelSize(width, height, depth);
        const FencedBuffer bits(modelSize(width, height, 1)), plane(size), dst(size_t{size} * 2);
        for (const FencedBuffer *buffer : {&bits, &plane, &dst})
            random.fill(buffer->data(), buffer->size());

        Bytes expected = bytesOf(dst);
        modelExpansion(width, height, depth, bits.data(), expected.data());
        Raster_ExpandCursorBitPlane(width, height, depth, bits.data(), dst.data(), size);
        ASSERT_EQ(bytesOf(dst), expected);

        const bool areBits[] = {random.oneIn(2), random.oneIn(2)};
        for (const size_t i : {0u, 1u}) {
            uint8 *const part = expected.data() + i * size;
            if (areBits[i] && depth != 1)
                modelExpansion(width, height, depth, bits.data(), part);
            else
                std::copy_n((areBits[i] ? bits : plane).data(), size, part);
        }
        Raster_ExpandPlanarCursorData(width, height, areBits[0] ? 1 : depth,
                                      (areBits[0] ? bits : plane).data(), areBits[1] ? 1 : depth,
                                      (areBits[1] ? bits : plane).data(), depth, dst.data(),
                                      2 * size);
        ASSERT_EQ(bytesOf(dst), expected);
    });
}

TEST(CursorPlanes, panics) {
    const Bytes bits(8, 0xFF);
    Bytes dst(64, 0xAB), expected = dst;
    std::set<int> lines;
    const auto expectIn = [&](const char *kind, auto call) {
        lines.insert(panicLine(expectPanic(call), std::string(kind) + " lib/raster/rasterCursor"));
    };
    const auto planar = [&](uint32 andDepth, uint32 xorDepth, uint32 size) {
        return [=, &bits, &dst] {
            Raster_ExpandPlanarCursorData(4, 2, andDepth, bits.data(), xorDepth, bits.data(), 32,
                                          dst.data(), size);
        };
    };
    expectIn("VERIFY", [&] { Raster_ExpandCursorBitPlane(4, 2, 32, bits.data(), dst.data(), 31); });
    expectIn("VERIFY", planar(8, 8, 63)); // the size is looked at first
    expectIn("NOT_IMPLEMENTED", planar(8, 8, 64));
    EXPECT_EQ(dst, expected);
    expectIn("NOT_IMPLEMENTED", planar(1, 8, 64));
    std::fill_n(expected.begin(), 32, uint8{0xFF});
    EXPECT_EQ(dst, expected);
    EXPECT_EQ(lines.size(), 4u);
}

// Such planes would reach beyond any dstSize.  Null pointers, as nothing may be
// read either.
TEST(CursorPlanes, whatNoSizeTellsIsNotWritten) {
    const uint32 planes[][3] = {
        {32, 0x10000000, 32}, {kNoSize, 1, 32}, {0x20000000, 1, 8}, {kNoSize, 1, 1}};
    for (const auto &[width, height, depth] : planes) {
        Raster_ExpandCursorBitPlane(width, height, depth, nullptr, nullptr, kNoSize);
        for (const uint32 dataDepth : {uint32{1}, depth})
            Raster_ExpandPlanarCursorData(width, height, dataDepth, nullptr, dataDepth, nullptr,
                                          depth, nullptr, kNoSize);
    }
    // Each plane has a size, but both together have none.
    Raster_ExpandPlanarCursorData(32, 0x1000000, 1, nullptr, 32, nullptr, 32, nullptr, kNoSize);
}

// --- Cursors with random images, the record and both images fenced

class TestCursor {
public:
    TestCursor(Random &random, uint32 type, uint32 width, uint32 height)
        : memory_(type == RASTER_CURSOR_ALPHA ? kAlphaRecordSize : sizeof(RasterCursor)),
          first_(size_t{4} * width * height),
          second_(type == RASTER_CURSOR_ALPHA ? 0 : first_.size()) {
        for (const FencedBuffer *part : {&memory_, &first_, &second_})
            random.fill(part->data(), part->size());
        RasterCursor &cursor = record();
        cursor.type = type;
        cursor.hotspotX = random.below(width + 1);
        cursor.hotspotY = random.below(height + 1);
        cursor.width = width;
        cursor.height = height;
        if (type == RASTER_CURSOR_ALPHA) {
            cursor.alphaImage = first_.data();
        } else {
            cursor.andImage = first_.data();
            cursor.xorImage = second_.data();
        }
    }
    RasterCursor &record() const { return *reinterpret_cast<RasterCursor *>(memory_.data()); }

private:
    FencedBuffer memory_, first_, second_;
};

// --- Boxes and drawing

// One axis, at 64 bits: false when nothing is visible.
bool modelVisible(int32 position, uint32 hotspot, uint32 size, uint32 screen, uint32 &dst,
                  uint32 &visible, uint32 &src) {
    const int64_t start = static_cast<int32>(static_cast<uint32>(position) - hotspot);
    const int64_t first = std::max<int64_t>(start, 0), end = start + int64_t{size};
    const int64_t last = std::min<int64_t>(end, screen);
    dst = static_cast<uint32>(first);
    visible = static_cast<uint32>(last - first);
    src = static_cast<uint32>(first - start);
    return first < last && end - first <= std::numeric_limits<int32>::max();
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
        const auto x = static_cast<int32>(draw()), y = static_cast<int32>(draw());
        RasterCursorBox box{}, expected{};
        const bool hasColumns = modelVisible(x, cursor.hotspotX, cursor.width, screen.width,
                                             expected.dstX, expected.width, expected.srcX);
        const bool hasRows = modelVisible(y, cursor.hotspotY, cursor.height, screen.height,
                                          expected.dstY, expected.height, expected.srcY);
        if (!hasColumns || !hasRows)
            expected = {}; // untouched
        ASSERT_EQ(Raster_ComputeCursorBox(&screen, &cursor, x, y, &box),
                  hasColumns && hasRows ? 1u : 0u);
        ASSERT_EQ(std::memcmp(&box, &expected, sizeof box), 0);
    });
}

// A surface in fenced memory, its rows in either direction.
struct Frame {
    Frame(Random &random, uint32 frameWidth, uint32 frameHeight)
        : width(frameWidth), height(frameHeight),
          line(4 * static_cast<int32>(width + random.below(4)) * (random.oneIn(3) ? -1 : 1)),
          memory(static_cast<size_t>(std::abs(line)) * (height - 1) + size_t{4} * width,
                 random.oneOf({FencedBuffer::Flush::kBefore, FencedBuffer::Flush::kBehind})) {
        random.fill(memory.data(), memory.size());
    }
    size_t offset(int64_t x, int64_t y) const {
        const int64_t first = line < 0 ? -int64_t{line} * (height - 1) : 0;
        return static_cast<size_t>(first + y * line + 4 * x);
    }
    uint8 *origin() const { return memory.data() + offset(0, 0); }

    uint32 width, height;
    int32 line;
    FencedBuffer memory;
};

uint32 pixelOf(const uint8 *image, size_t index) {
    uint32 pixel = 0;
    std::memcpy(&pixel, image + 4 * index, sizeof pixel);
    return pixel;
}

uint32 modelPixel(const RasterCursor &cursor, size_t index, uint32 under) {
    if (cursor.type == RASTER_CURSOR_ANDXOR)
        return (under & pixelOf(cursor.andImage, index)) ^ pixelOf(cursor.xorImage, index);
    const uint32 over = pixelOf(cursor.alphaImage, index);
    uint32 result = under & 0xFF000000;
    for (uint32 shift = 0; shift < 24; shift += 8) {
        const uint32 shown = (under >> shift & 0xFF) * (255 - (over >> 24)) / 255;
        result |= std::min((over >> shift & 0xFF) + shown, uint32{255}) << shift;
    }
    return result;
}

TEST(CursorDrawing, equalsItsModelAtEveryEdge) {
    forEachCase(20000, [](Random &random) {
        const TestCursor source(random, random.below(2), 1 + random.below(40), 1 + random.below(9));
        const RasterCursor &cursor = source.record();
        const Frame frame(random, 1 + random.below(50), 1 + random.below(12));
        const int32 x = random.between(-50, 100), y = random.between(-12, 24);
        const RasterCursorScreen screen = {frame.width, frame.height};
        RasterCursorBox box{};
        if (Raster_ComputeCursorBox(&screen, &cursor, x, y, &box) == 0)
            return;
        if (cursor.type == RASTER_CURSOR_ALPHA && random.oneIn(2))
            source.record().type = random.oneOf({2u, 0x80000000u}); // alpha, too

        const Bytes before = bytesOf(frame.memory);
        const Frame compose(random, box.width, box.height);
        Bytes drawn = before, composed = bytesOf(compose.memory);
        for (uint32 row = 0; row < box.height; ++row)
            for (uint32 column = 0; column < box.width; ++column) {
                uint8 *const pixel = &drawn[frame.offset(box.dstX + column, box.dstY + row)];
                const size_t index = size_t{box.srcY + row} * cursor.width + box.srcX + column;
                const uint32 value = modelPixel(cursor, index, pixelOf(pixel, 0));
                std::memcpy(pixel, &value, sizeof value);
                std::memcpy(&composed[compose.offset(column, row)], &value, sizeof value);
            }

        Raster_DrawCursor(frame.origin(), frame.line, compose.origin(), compose.line, &cursor,
                          &box);
        ASSERT_EQ(bytesOf(frame.memory), before);
        ASSERT_EQ(bytesOf(compose.memory), composed);
        Raster_DrawCursor(frame.origin(), frame.line, nullptr, random.between(-9, 9), &cursor,
                          &box);
        ASSERT_EQ(bytesOf(frame.memory), drawn);
    });
}

// Row 1 of such an image is further than a line increment reaches.
TEST(CursorDrawing, imagesTooWideAreNotDrawn) {
    const RasterCursorBox box = {0, 0, 1, 2, 0, 0};
    for (const uint32 type : {0u, 1u})
        for (const uint32 width : {0x20000000u, 0x40000001u, 0xFFFFFFFFu}) {
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
    return Scaled(Raster_ScaleCursor(&source.record(), scaleX, scaleY));
}

// One axis of the result, for a long double of 64 significant bits.
struct ModelAxis {
    ModelAxis(uint32 srcSize, uint32 srcHotspot, double scale)
        : border(static_cast<uint32>(std::max(1.0L / scale, 1.0L * scale)) + 1),
          padded(srcSize + 2 * border),
          // rounded up from the product as a double
          size(static_cast<uint32>(std::ceil(static_cast<double>(1.0L * padded * scale)))),
          hotspot(static_cast<uint32>(1.0L * (srcHotspot + border) * scale)) {}
    uint32 border, padded, size, hotspot;
};

// The source with its border, through the scaler; where that refuses, what
// changes nothing on the screen.
void expectImage(const RasterCursor &source, double scaleX, double scaleY, const uint8 *image,
                 uint8 fill, uint32 filter, const uint8 *scaledImage) {
    const ModelAxis x(source.width, 0, scaleX), y(source.height, 0, scaleY);
    Bytes padded(size_t{4} * x.padded * y.padded, fill);
    for (uint32 row = 0; row < source.height; ++row)
        std::copy_n(image + size_t{4} * source.width * row, 4 * source.width,
                    &padded[size_t{4} * ((y.border + row) * x.padded + x.border)]);
    Bytes expected(size_t{4} * x.size * y.size, fill);
    Raster_Scale(expected.data(), static_cast<int32>(4 * x.size), x.size, y.size, 0, 0,
                 static_cast<int32>(x.size), static_cast<int32>(y.size), padded.data(),
                 static_cast<int32>(4 * x.padded), x.padded, y.padded, scaleX, scaleY, filter);
    ASSERT_EQ(std::memcmp(scaledImage, expected.data(), expected.size()), 0);
}

void expectScaled(Random &random, uint32 type, uint32 width, uint32 height, double scaleX,
                  double scaleY) {
    const TestCursor source(random, type, width, height);
    const RasterCursor &from = source.record();
    const Scaled result = scaled(source, scaleX, scaleY);
    ASSERT_NE(result, nullptr);
    const ModelAxis x(width, from.hotspotX, scaleX), y(height, from.hotspotY, scaleY);
    ASSERT_EQ(result->type, type);
    ASSERT_EQ(result->width, x.size);
    ASSERT_EQ(result->height, y.size);
    ASSERT_EQ(result->hotspotX, x.hotspot);
    ASSERT_EQ(result->hotspotY, y.hotspot);
    if (type == RASTER_CURSOR_ALPHA) {
        expectImage(from, scaleX, scaleY, from.alphaImage, 0, 2, result->alphaImage);
        return;
    }
    EXPECT_EQ(result->planeInfo0, from.planeInfo0);
    EXPECT_EQ(result->planeInfo1, from.planeInfo1);
    expectImage(from, scaleX, scaleY, from.andImage, 0xFF, 0, result->andImage);
    expectImage(from, scaleX, scaleY, from.xorImage, 0, 0, result->xorImage);
}

TEST(CursorScaling, isAPaddedImageScaled) {
    if (LDBL_MANT_DIG != 64)
        GTEST_SKIP() << "the model needs a 64-bit significand";
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
    for (const uint32 type : {0u, 1u}) {
        expectScaled(random, type, 32763, 1, 1, 1);
        expectScaled(random, type, 32764, 1, 1, 1);
        expectScaled(random, type, 1, 32764, 1, 1);
        expectScaled(random, type, 8, 8, 0x1p-14, 1);
        expectScaled(random, type, 8, 8, 200, 1);
    }
}

TEST(CursorScaling, knownSizes) {
    Random random(1);
    const TestCursor source(random, RASTER_CURSOR_ANDXOR, 32, 32);
    source.record().hotspotX = 4;
    source.record().hotspotY = 0xFFFFFFFF; // one row above the image
    source.record().type = 2;              // not alpha, so of two masks
    const double cases[][4] = {{2, 76, 14, 4}, {0.3, 12, 2, 0}, {0.1, 6, 1, 0}, {0.2, 9, 1, 0}};
    for (const auto &[scale, size, hotspotX, hotspotY] : cases) {
        const Scaled cursor = scaled(source, scale, scale);
        ASSERT_NE(cursor, nullptr);
        EXPECT_EQ(cursor->type, RASTER_CURSOR_ANDXOR);
        EXPECT_EQ(cursor->width, size);
        EXPECT_EQ(cursor->hotspotX, hotspotX);
        EXPECT_EQ(cursor->hotspotY, hotspotY);
    }
}

TEST(CursorScaling, withoutASizeThereIsNoCursor) {
    constexpr double kInfinity = std::numeric_limits<double>::infinity();
    const struct {
        uint32 size;
        double scale;
    } cases[] = {{8, 0},     {8, -1},      {8, kInfinity}, {8, DBL_MAX},   {8, std::nan("")},
                 {8, 1e10},  {8, 1e-10},   {8, DBL_MIN},   {8, 65536},     {8, 2e9},
                 {8, -1e-9}, {kNoSize, 1}, {kNoSize, .5},  {0x20000000, 1}};
    Random random(1);
    for (const uint32 type : {0u, 1u})
        for (const auto &c : cases)
            for (const bool isColumns : {true, false}) {
                const TestCursor source(random, type, 8, 8);
                (isColumns ? source.record().width : source.record().height) = c.size;
                const MemoryFault fault(0);
                EXPECT_EQ(scaled(source, isColumns ? c.scale : 1, isColumns ? 1 : c.scale),
                          nullptr);
                EXPECT_FALSE(fault.happened); // none was made
            }
}

TEST(CursorScaling, withoutMemory) {
    Random random(1);
    for (const uint32 type : {0u, 1u}) {
        const TestCursor source(random, type, 8, 8);
        bool hasResult = false;
        forEachMemoryFault([&] { hasResult = scaled(source, 0.75, 2) != nullptr; },
                           [&](bool failed) { EXPECT_NE(hasResult, failed); });
    }
}

} // namespace
} // namespace quillon::test
