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

std::vector<uint8> bytesOf(const FencedBuffer &buffer) {
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

TEST(CursorSize, knownValuesAndLimits) {
    EXPECT_EQ(Raster_CalculateCursorSize(32, 32, 1), 128u);
    EXPECT_EQ(Raster_CalculateCursorSize(33, 1, 1), 8u);
    EXPECT_EQ(Raster_CalculateCursorSize(5, 3, 24), 48u);
    EXPECT_EQ(Raster_CalculateCursorSize(0, kNoSize, kNoSize), 0u);
    EXPECT_EQ(Raster_CalculateCursorSize(0x10000, 0x10000, 1), 0x20000000u);
    EXPECT_EQ(Raster_CalculateCursorSize(0x10000, 0x10000, 0x10000), kNoSize);
    EXPECT_EQ(Raster_CalculateCursorSize(0xFFFFFFE0, 1, 1), 0x1FFFFFFCu);
    EXPECT_EQ(Raster_CalculateCursorSize(0xFFFFFFE1, 0, 1), kNoSize);
    EXPECT_EQ(Raster_CalculateCursorSize(1, 0x3FFFFFFF, 32), 0xFFFFFFFCu);
    EXPECT_EQ(Raster_CalculateCursorSize(1, 0x40000000, 32), kNoSize);
}

TEST(CursorSize, equalsItsModel) {
    forEachCase(300000, [](Random &random) {
        const auto draw = [&] { return random.word() >> random.below(32); };
        const uint32 width = draw(), height = draw(), depth = draw();
        ASSERT_EQ(Raster_CalculateCursorSize(width, height, depth), modelSize(width, height, depth))
            << width << "x" << height << "x" << depth;
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

uint32 drawDepth(Random &random) {
    return random.oneIn(2) ? random.oneOf({1u, 8u, 15u, 16u, 24u, 32u}) : random.below(50);
}

// Padding is left alone by an expansion, and goes along in a copy.
TEST(CursorPlanes, areExpandedOrCopied) {
    forEachCase(20000, [](Random &random) {
        const uint32 width = random.below(80), height = random.below(6);
        const uint32 depth = drawDepth(random);
        SCOPED_TRACE(testing::Message() << width << "x" << height << "x" << depth);
        const uint32 size = modelSize(width, height, depth);
        const FencedBuffer bits(modelSize(width, height, 1)), plane(size), dst(size_t{size} * 2);
        for (const FencedBuffer *buffer : {&bits, &plane, &dst})
            random.fill(buffer->data(), buffer->size());

        std::vector<uint8> expected = bytesOf(dst);
        modelExpansion(width, height, depth, bits.data(), expected.data());
        Raster_ExpandCursorBitPlane(width, height, depth, bits.data(), dst.data(),
                                    size + random.below(2));
        ASSERT_EQ(bytesOf(dst), expected);

        const bool areBits[] = {random.oneIn(2), random.oneIn(2)};
        for (const bool &isBits : areBits) {
            uint8 *part = expected.data() + (&isBits == areBits ? 0 : size);
            if (isBits && depth == 1)
                std::copy(bits.data(), bits.end(), part);
            else if (isBits)
                modelExpansion(width, height, depth, bits.data(), part);
            else
                std::copy(plane.data(), plane.end(), part);
        }
        Raster_ExpandPlanarCursorData(width, height, areBits[0] ? 1 : depth,
                                      (areBits[0] ? bits : plane).data(), areBits[1] ? 1 : depth,
                                      (areBits[1] ? bits : plane).data(), depth, dst.data(),
                                      2 * size + random.below(2));
        ASSERT_EQ(bytesOf(dst), expected);
    });
}

TEST(CursorPlanes, panics) {
    const std::vector<uint8> bits(8, 0xFF);
    std::vector<uint8> dst(64, 0xAB);
    const std::vector<uint8> untouched = dst;
    std::set<int> lines;
    const auto planar = [&](uint32 andDepth, uint32 xorDepth, uint32 size, const char *format) {
        const std::string message = expectPanic([&] {
            Raster_ExpandPlanarCursorData(4, 2, andDepth, bits.data(), xorDepth, bits.data(), 32,
                                          dst.data(), size);
        });
        lines.insert(panicLine(message, std::string(format) + " lib/raster/rasterCursor"));
    };
    const std::string message =
        expectPanic([&] { Raster_ExpandCursorBitPlane(4, 2, 32, bits.data(), dst.data(), 31); });
    lines.insert(panicLine(message, "VERIFY lib/raster/rasterCursor"));
    planar(1, 1, 63, "VERIFY");
    planar(8, 8, 63, "VERIFY"); // the size is looked at first
    planar(8, 8, 64, "NOT_IMPLEMENTED");
    planar(0, 1, 64, "NOT_IMPLEMENTED");
    EXPECT_EQ(dst, untouched);

    planar(1, 8, 64, "NOT_IMPLEMENTED");
    EXPECT_EQ(lines.size(), 4u);
    EXPECT_EQ(lines.count(0), 0u);
    std::vector<uint8> andOnly = untouched;
    std::fill_n(andOnly.begin(), 32, uint8{0xFF});
    EXPECT_EQ(dst, andOnly);
}

// Such planes would reach beyond any dstSize.  Null pointers, as nothing may be
// read either.
TEST(CursorPlanes, whatNoSizeTellsIsNotWritten) {
    const struct {
        uint32 width, height, depth;
    } planes[] = {{32, 0x10000000, 32}, {kNoSize, 1, 32}, {0x20000000, 1, 8}, {kNoSize, 1, 1}};
    for (const auto &[width, height, depth] : planes) {
        Raster_ExpandCursorBitPlane(width, height, depth, nullptr, nullptr, kNoSize);
        for (const uint32 dataDepth : {uint32{1}, depth})
            Raster_ExpandPlanarCursorData(width, height, dataDepth, nullptr, dataDepth, nullptr,
                                          depth, nullptr, kNoSize);
    }
    // Each plane has a size, but both together have none.
    Raster_ExpandPlanarCursorData(32, 0x1000000, 1, nullptr, 32, nullptr, 32, nullptr, kNoSize);
    EXPECT_GT(panicLine(expectPanic([] {
                            Raster_ExpandPlanarCursorData(kNoSize, 1, 8, nullptr, 1, nullptr, 32,
                                                          nullptr, kNoSize);
                        }),
                        "NOT_IMPLEMENTED lib/raster/rasterCursor"),
              0);
    EXPECT_GT(panicLine(expectPanic([] {
                            Raster_ExpandCursorBitPlane(kNoSize, 1, 32, nullptr, nullptr,
                                                        kNoSize - 1);
                        }),
                        "VERIFY lib/raster/rasterCursor"),
              0);
}

// --- Boxes

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

std::vector<uint32> fields(const RasterCursorBox &box) {
    return {box.dstX, box.dstY, box.width, box.height, box.srcX, box.srcY};
}

void expectBox(const RasterCursorScreen &screen, const RasterCursor &cursor, int32 x, int32 y) {
    const RasterCursorBox untouched = {1, 2, 3, 4, 5, 6};
    RasterCursorBox box = untouched, expected = untouched, model{};
    const bool hasColumns = modelVisible(x, cursor.hotspotX, cursor.width, screen.width, model.dstX,
                                         model.width, model.srcX);
    const bool hasRows = modelVisible(y, cursor.hotspotY, cursor.height, screen.height, model.dstY,
                                      model.height, model.srcY);
    const bool isSeen = hasColumns && hasRows;
    if (isSeen)
        expected = model;
    ASSERT_EQ(Raster_ComputeCursorBox(&screen, &cursor, x, y, &box), isSeen ? 1u : 0u);
    ASSERT_EQ(fields(box), fields(expected))
        << screen.width << "x" << screen.height << ", cursor " << cursor.width << "x"
        << cursor.height << " at " << x << "," << y << " - " << cursor.hotspotX << ","
        << cursor.hotspotY;
}

TEST(CursorBox, aroundEveryEdge) {
    RasterCursor cursor{};
    for (const uint32 screen : {0u, 1u, 5u})
        for (cursor.width = 0; cursor.width <= 7; ++cursor.width)
            for (cursor.hotspotX = 0; cursor.hotspotX <= 8; ++cursor.hotspotX)
                for (int32 x = -10; x <= 20; ++x) {
                    cursor.height = 3;
                    cursor.hotspotY = 1;
                    expectBox({screen, 5}, cursor, x, 2);
                    std::swap(cursor.width, cursor.height);
                    std::swap(cursor.hotspotX, cursor.hotspotY);
                    expectBox({5, screen}, cursor, 2, x);
                    std::swap(cursor.width, cursor.height);
                    std::swap(cursor.hotspotX, cursor.hotspotY);
                }
    cursor.hotspotX = 5, cursor.hotspotY = 3, cursor.width = cursor.height = 16;
    const RasterCursorScreen screen = {640, 480};
    RasterCursorBox box{};
    EXPECT_EQ(Raster_ComputeCursorBox(&screen, &cursor, 0, 0, &box), 1u);
    EXPECT_EQ(fields(box), (std::vector<uint32>{0, 0, 11, 13, 5, 3}));
}

TEST(CursorBox, atTheLimits) {
    forEachCase(300000, [](Random &random) {
        const auto draw = [&] {
            const uint32 near = random.oneOf({0u, 0x7FFFFFFFu, 0x80000000u, 0u, random.word()});
            return near + random.below(7) - 3;
        };
        RasterCursor cursor{};
        cursor.hotspotX = draw(), cursor.hotspotY = draw();
        cursor.width = draw(), cursor.height = draw();
        expectBox({draw(), draw()}, cursor, static_cast<int32>(draw()), static_cast<int32>(draw()));
    });
}

// --- Cursors with random images, the record and both images fenced

class TestCursor {
public:
    TestCursor(Random &random, uint32 type, bool hasMasks, uint32 width, uint32 height)
        : memory_(hasMasks ? sizeof(RasterCursor) : kAlphaRecordSize),
          first_(size_t{4} * width * height), second_(hasMasks ? first_.size() : 0) {
        random.fill(first_.data(), first_.size());
        random.fill(second_.data(), second_.size());
        RasterCursor &cursor = record();
        cursor.type = type;
        cursor.hotspotX = random.below(width + 1);
        cursor.hotspotY = random.below(height + 1);
        cursor.width = width;
        cursor.height = height;
        if (hasMasks) {
            cursor.planeInfo0 = random.word();
            cursor.planeInfo1 = random.word();
            cursor.andImage = first_.data();
            cursor.xorImage = second_.data();
        } else {
            cursor.alphaImage = first_.data();
        }
        kept_ = bytes();
    }

    RasterCursor &record() const { return *reinterpret_cast<RasterCursor *>(memory_.data()); }
    testing::AssertionResult isUntouched() const {
        return bytes() == kept_ ? testing::AssertionSuccess()
                                : testing::AssertionFailure() << "the cursor was written to";
    }

private:
    std::vector<uint8> bytes() const {
        std::vector<uint8> all;
        for (const FencedBuffer *part : {&memory_, &first_, &second_})
            all.insert(all.end(), part->data(), part->end());
        return all;
    }

    FencedBuffer memory_, first_, second_;
    std::vector<uint8> kept_;
};

uint32 pixelOf(const uint8 *image, size_t index) {
    uint32 pixel = 0;
    std::memcpy(&pixel, image + 4 * index, sizeof pixel);
    return pixel;
}

// --- Drawing

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
        const uint32 type = random.oneOf({0u, 0u, 1u, 1u, 2u, 0x80000000u});
        const TestCursor source(random, type, type == 0, 1 + random.below(40), 1 + random.below(9));
        const RasterCursor &cursor = source.record();
        const Frame frame(random, 1 + random.below(50), 1 + random.below(12));
        const int32 x = random.between(-50, 100), y = random.between(-12, 24);
        const RasterCursorScreen screen = {frame.width, frame.height};
        RasterCursorBox box{};
        if (Raster_ComputeCursorBox(&screen, &cursor, x, y, &box) == 0)
            return;

        // The cursor's pixels, wherever the screen has them.
        const std::vector<uint8> before = bytesOf(frame.memory);
        std::vector<uint8> drawn = before;
        for (uint32 row = 0; row < cursor.height; ++row)
            for (uint32 column = 0; column < cursor.width; ++column) {
                const int64_t atX = int64_t{x} - cursor.hotspotX + column;
                const int64_t atY = int64_t{y} - cursor.hotspotY + row;
                if (atX < 0 || atX >= frame.width || atY < 0 || atY >= frame.height)
                    continue;
                uint8 *pixel = drawn.data() + frame.offset(atX, atY);
                const uint32 value =
                    modelPixel(cursor, size_t{row} * cursor.width + column, pixelOf(pixel, 0));
                std::memcpy(pixel, &value, sizeof value);
            }

        const Frame compose(random, box.width, box.height);
        std::vector<uint8> composed = bytesOf(compose.memory);
        for (uint32 row = 0; row < box.height; ++row)
            std::memcpy(composed.data() + compose.offset(0, row),
                        drawn.data() + frame.offset(box.dstX, box.dstY + row),
                        size_t{4} * box.width);

        Raster_DrawCursor(frame.origin(), frame.line, compose.origin(), compose.line, &cursor,
                          &box);
        ASSERT_EQ(bytesOf(frame.memory), before);
        ASSERT_EQ(bytesOf(compose.memory), composed);
        Raster_DrawCursor(frame.origin(), frame.line, nullptr, random.between(-9, 9), &cursor,
                          &box);
        ASSERT_EQ(bytesOf(frame.memory), drawn);
        ASSERT_TRUE(source.isUntouched());
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
            uint8 compose[8] = {};
            Raster_DrawCursor(nullptr, 4, compose, 4, &cursor, &box);
        }
}

// --- Scaling

struct Release {
    void operator()(RasterCursor *cursor) const {
        if (cursor != nullptr && cursor->type == RASTER_CURSOR_ALPHA) {
            std::free(cursor->alphaImage);
        } else if (cursor != nullptr) {
            std::free(cursor->andImage);
            std::free(cursor->xorImage);
        }
        std::free(cursor);
    }
};
using Scaled = std::unique_ptr<RasterCursor, Release>;

Scaled scaled(const TestCursor &source, double scaleX, double scaleY) {
    return Scaled(Raster_ScaleCursor(&source.record(), scaleX, scaleY));
}

TEST(CursorScaling, knownSizes) {
    const struct {
        double scale;
        uint32 border, size, hotspotX, hotspotY;
    } cases[] = {
        {1.0, 2, 36, 6, 8},    {2.0, 3, 76, 14, 18},   {0.5, 3, 19, 3, 4},
        {0.3, 4, 12, 2, 2}, // 40 * 0.3 rounds to 12, but 10 * 0.3 does not to 3
        {0.1, 10, 6, 1, 1}, // 1 / 0.1 is a little below 10,
        {0.2, 5, 9, 1, 2},  // 1 / 0.2 below 5
        {3.7, 4, 148, 29, 37}, {1.0 / 3, 4, 14, 2, 3},
    };
    Random random(1);
    for (const uint32 type : {0u, 1u, 2u}) {
        const TestCursor source(random, type, type != 1, 32, 32);
        source.record().hotspotX = 4;
        source.record().hotspotY = 6;
        for (const auto &c : cases) {
            SCOPED_TRACE(c.scale);
            const Scaled cursor = scaled(source, c.scale, c.scale);
            ASSERT_NE(cursor, nullptr);
            EXPECT_EQ(cursor->type, type == 1 ? 1u : 0u);
            EXPECT_EQ(cursor->width, c.size);
            EXPECT_EQ(cursor->height, c.size);
            EXPECT_EQ(cursor->hotspotX, c.hotspotX);
            EXPECT_EQ(cursor->hotspotY, c.hotspotY);
        }
        source.record().hotspotX = 0xFFFFFFFF; // one column left of the image
        EXPECT_EQ(scaled(source, 2, 1)->hotspotX, 4u);
    }
}

TEST(CursorScaling, factorOneAddsABorder) {
    Random random(1);
    const TestCursor source(random, RASTER_CURSOR_ANDXOR, true, 5, 3);
    const Scaled cursor = scaled(source, 1, 1);
    ASSERT_NE(cursor, nullptr);
    for (uint32 y = 0; y < 7; ++y)
        for (uint32 x = 0; x < 9; ++x) {
            const bool isInside = 2 <= x && x < 7 && 2 <= y && y < 5;
            const size_t from = isInside ? size_t{y - 2} * 5 + x - 2 : 0, at = size_t{y} * 9 + x;
            EXPECT_EQ(pixelOf(cursor->andImage, at),
                      isInside ? pixelOf(source.record().andImage, from) : 0xFFFFFFFF);
            EXPECT_EQ(pixelOf(cursor->xorImage, at),
                      isInside ? pixelOf(source.record().xorImage, from) : 0);
        }
}

// The source with its border, through the scaler.
std::vector<uint8> modelImage(const RasterCursor &source, const RasterCursor &result,
                              const uint8 *image, uint32 borderX, uint32 borderY, double scaleX,
                              double scaleY, uint8 fill, uint32 filter) {
    const uint32 width = source.width + 2 * borderX, height = source.height + 2 * borderY;
    std::vector<uint8> padded(size_t{4} * width * height, fill);
    for (uint32 y = 0; y < source.height; ++y)
        std::copy_n(image + size_t{4} * source.width * y, 4 * source.width,
                    padded.data() + size_t{4} * ((borderY + y) * width + borderX));
    std::vector<uint8> output(size_t{4} * result.width * result.height);
    EXPECT_EQ(Raster_Scale(output.data(), static_cast<int32>(4 * result.width), result.width,
                           result.height, 0, 0, static_cast<int32>(result.width),
                           static_cast<int32>(result.height), padded.data(),
                           static_cast<int32>(4 * width), width, height, scaleX, scaleY, filter),
              1u);
    return output;
}

std::vector<uint8> imageOf(const RasterCursor &cursor, const uint8 *image) {
    return {image, image + size_t{4} * cursor.width * cursor.height};
}

double drawScale(Random &random) {
    const double scale = random.oneOf({1.0, 2.0, 3.0, 5.0, 0.5, 0.1, 0.2, 0.3, 0.7, 1.0 / 3, 1.5});
    switch (random.below(4)) {
    case 0:
        return std::nextafter(scale, random.oneIn(2) ? 0 : 9);
    case 1:
        return std::exp2(random.between(-300, 250) / 100.0);
    default:
        return scale;
    }
}

uint32 modelBorder(double scale) {
    return static_cast<uint32>(std::max(1.0L / scale, static_cast<long double>(scale))) + 1;
}

TEST(CursorScaling, isAPaddedImageScaled) {
    if (LDBL_MANT_DIG != 64)
        GTEST_SKIP() << "the model needs a 64-bit significand";
    forEachCase(3000, [](Random &random) {
        const uint32 type = random.oneOf({0u, 1u, 2u});
        const TestCursor source(random, type, type != 1, random.below(33), random.below(20));
        const RasterCursor &from = source.record();
        const double scaleX = drawScale(random), scaleY = drawScale(random);
        SCOPED_TRACE(testing::Message() << from.width << "x" << from.height << " by " << scaleX
                                        << "," << scaleY << ", type " << type);
        const Scaled result = scaled(source, scaleX, scaleY);
        ASSERT_NE(result, nullptr);
        ASSERT_TRUE(source.isUntouched());

        const uint32 borderX = modelBorder(scaleX), borderY = modelBorder(scaleY);
        const auto product = [](uint32 a, double b) { return static_cast<long double>(a) * b; };
        const auto ceiling = [](long double value) { // of the value as a double
            return static_cast<uint32>(std::ceil(static_cast<double>(value)));
        };
        ASSERT_EQ(result->width, ceiling(product(from.width + 2 * borderX, scaleX)));
        ASSERT_EQ(result->height, ceiling(product(from.height + 2 * borderY, scaleY)));
        ASSERT_EQ(result->hotspotX, static_cast<uint32>(product(from.hotspotX + borderX, scaleX)));
        ASSERT_EQ(result->hotspotY, static_cast<uint32>(product(from.hotspotY + borderY, scaleY)));

        const auto expectImage = [&](const uint8 *got, const uint8 *image, uint8 fill,
                                     uint32 filter) {
            ASSERT_EQ(imageOf(*result, got), modelImage(from, *result, image, borderX, borderY,
                                                        scaleX, scaleY, fill, filter));
        };
        if (type == RASTER_CURSOR_ALPHA) {
            expectImage(result->alphaImage, from.alphaImage, 0, 2);
            return;
        }
        EXPECT_EQ(result->planeInfo0, from.planeInfo0);
        EXPECT_EQ(result->planeInfo1, from.planeInfo1);
        expectImage(result->andImage, from.andImage, 0xFF, 0);
        expectImage(result->xorImage, from.xorImage, 0, 0);
    });
}

// The scaler's largest size, and what it refuses: then the images change nothing
// on the screen.
TEST(CursorScaling, whereTheScalerRefuses) {
    const struct {
        uint32 width, height;
        double scaleX, scaleY;
        uint32 scaledWidth, scaledHeight;
        bool isRefused;
    } cases[] = {
        {32763, 1, 1, 1, 32767, 5, false}, {32764, 1, 1, 1, 32768, 5, true},
        {1, 32764, 1, 1, 5, 32768, true},  {8, 8, 0x1p-14, 1, 3, 12, true},
        {8, 8, 1, 1e-8, 12, 3, true},      {8, 8, 200, 1, 82000, 12, true},
    };
    Random random(1);
    for (const auto &c : cases)
        for (const uint32 type : {0u, 1u}) {
            SCOPED_TRACE(testing::Message() << "case " << &c - cases << ", type " << type);
            const TestCursor source(random, type, type == 0, c.width, c.height);
            const Scaled cursor = scaled(source, c.scaleX, c.scaleY);
            ASSERT_NE(cursor, nullptr);
            EXPECT_EQ(cursor->width, c.scaledWidth);
            EXPECT_EQ(cursor->height, c.scaledHeight);
            const auto expectFilled = [&](const uint8 *image, uint8 fill) {
                const std::vector<uint8> got = imageOf(*cursor, image);
                EXPECT_EQ(got == std::vector<uint8>(got.size(), fill), c.isRefused);
            };
            if (type == RASTER_CURSOR_ALPHA) {
                expectFilled(cursor->alphaImage, 0);
            } else {
                expectFilled(cursor->andImage, 0xFF);
                expectFilled(cursor->xorImage, 0);
            }
        }
}

TEST(CursorScaling, withoutASizeThereIsNoCursor) {
    constexpr double kInfinity = std::numeric_limits<double>::infinity();
    const struct {
        uint32 size;
        double scale;
    } cases[] = {
        {8, 0},       {8, -0.0},      {8, -1},
        {8, -1e300},  {8, kInfinity}, {8, -kInfinity},
        {8, DBL_MAX}, {8, 1e10},      {8, std::nan("")},
        {8, DBL_MIN}, {8, 1e-10},     {8, std::numeric_limits<double>::denorm_min()},
        {8, 65536},   {8, 2e9},       {kNoSize, 1},
        {8, -1e-300}, {kNoSize, 0.5}, {0x20000000, 1},
    };
    Random random(1);
    for (const uint32 type : {0u, 1u}) {
        const TestCursor source(random, type, type == 0, 8, 8);
        for (const auto &c : cases)
            for (const bool isColumns : {true, false}) {
                SCOPED_TRACE(testing::Message() << c.size << " by " << c.scale);
                (isColumns ? source.record().width : source.record().height) = c.size;
                const MemoryFault fault(0, Requests::kHearth);
                EXPECT_EQ(scaled(source, isColumns ? c.scale : 1, isColumns ? 1 : c.scale),
                          nullptr);
                EXPECT_FALSE(fault.happened()); // none was made
                source.record().width = source.record().height = 8;
            }
    }
}

TEST(CursorScaling, withoutMemory) {
    Random random(1);
    for (const uint32 type : {0u, 1u}) {
        const TestCursor source(random, type, type == 0, 8, 8);
        int failures = 0;
        bool hasResult = false;
        forEachMemoryFault([&] { hasResult = scaled(source, 0.75, 2) != nullptr; },
                           [&](bool failed) {
                               EXPECT_NE(hasResult, failed);
                               failures += failed ? 1 : 0;
                           });
        // The record; an image, its padded one, and what the scaler takes, or
        // two images and padded ones.
        EXPECT_GE(failures, type == RASTER_CURSOR_ALPHA ? 4 : 5);
    }
}

} // namespace
} // namespace quillon::test
