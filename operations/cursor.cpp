// Cursors: planes against the expansion of bits, boxes and drawing pixel by pixel,
// scaling against its composition from a padded image and the scaler.

#include "operations.h"
#include "reference/pixels.h"
#include "support/judge.h"
#include "support/longDouble.h"
#include "testCursor.h"
#include <quillon/raster.h>

#include <algorithm>
#include <cmath>
#include <cstring>

namespace quillon::test {
namespace {

constexpr uint32_t kNoSize = 0xFFFFFFFF;

using Bytes = std::vector<uint8_t>;

Bytes bytesOf(const FencedBuffer &buffer) {
    return {buffer.data(), buffer.end()};
}

void compareBytes(const uint8_t *actual, const Bytes &expected, const char *what) {
    compare(actual, expected.data(), expected.size(), [=] { return what; });
}

uint32_t modelSize(uint32_t width, uint32_t height, uint32_t depth) {
    const uint64_t bits = uint64_t{width} * depth + 31, row = bits / 32 * 4;
    const bool hasSize = bits <= kNoSize && (height == 0 || row <= kNoSize / height);
    return hasSize ? static_cast<uint32_t>(row * height) : kNoSize;
}

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

// One axis of a scaled cursor.
struct ScaledAxis {
    ScaledAxis(uint32_t srcSize, uint32_t srcHotspot, double scale)
        : border(static_cast<uint32_t>(std::max<long double>(in80Bits(1.0L / scale), scale)) + 1),
          padded(srcSize + 2 * border),
          // rounded up from the product as a double
          size(static_cast<uint32_t>(
              std::ceil(static_cast<double>(in80Bits(1.0L * padded * scale))))),
          hotspot(static_cast<uint32_t>(in80Bits(1.0L * (srcHotspot + border) * scale))) {}
    uint32_t border, padded, size, hotspot;
};

} // namespace

// Padding is left alone by an expansion, and goes along in a copy.
void tryCursorPlanes(Random &random) {
    const auto any = [&] { return random.word() >> random.below(32); };
    const uint32_t anyWidth = any(), anyHeight = any(), anyDepth = any();
    compare(Raster_CalculateCursorSize(anyWidth, anyHeight, anyDepth),
            modelSize(anyWidth, anyHeight, anyDepth), "size of a plane");

    const uint32_t width = random.below(80), height = random.below(6);
    const uint32_t depth = random.oneOf({1u, 8u, 15u, 16u, 24u, 32u, random.below(50)});
    const uint32_t size = modelSize(width, height, depth);
    const FencedBuffer bits(modelSize(width, height, 1)), plane(size), dst(size_t{size} * 2);
    for (const FencedBuffer *buffer : {&bits, &plane, &dst})
        random.fill(buffer->data(), buffer->size());
    const bool areBits[] = {random.oneIn(2), random.oneIn(2)};
    const uint8_t *const data[] = {(areBits[0] ? bits : plane).data(),
                                   (areBits[1] ? bits : plane).data()};
    const Bytes before = bytesOf(dst);
    const auto expand = [&](uint8_t *part) {
        Raster_BitsToPixels(bits.data(), static_cast<int32_t>(modelSize(width, 1, 1)), part,
                            static_cast<int32_t>(modelSize(width, 1, depth)),
                            static_cast<int32_t>(depth / 8), static_cast<int32_t>(width), height,
                            0xFFFFFFFF, 0);
    };
    Bytes expanded = before;
    expand(expanded.data());
    Bytes planar = expanded;
    for (const size_t i : {0u, 1u}) {
        uint8_t *const part = planar.data() + i * size;
        areBits[i] && depth != 1 ? expand(part) : (void)std::copy_n(data[i], size, part);
    }
    forEachTarget([&] {
        std::copy(before.begin(), before.end(), dst.data());
        Raster_ExpandCursorBitPlane(width, height, depth, bits.data(), dst.data(), size);
        compareBytes(dst.data(), expanded, "expanded plane");
        Raster_ExpandPlanarCursorData(width, height, areBits[0] ? 1 : depth, data[0],
                                      areBits[1] ? 1 : depth, data[1], depth, dst.data(), 2 * size);
        compareBytes(dst.data(), planar, "planes");
    });
}

void tryCursorBox(Random &random) {
    const auto draw = [&] {
        const uint32_t base = random.oneOf({0u, 0u, 0x7FFFFFFFu, 0x80000000u, random.word()});
        return base + random.below(12) - 3;
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
    compare(Raster_ComputeCursorBox(&screen, &cursor, x, y, &box), isVisible ? 1u : 0u,
            "whether a cursor is visible");
    compare(box, expected, "box of a cursor");
}

// Over every edge of a screen.
void tryDrawCursor(Random &random) {
    const uint32_t type = random.below(2), width = 1 + random.below(40);
    const TestCursor source(random, type, width, 1 + random.below(9));
    RasterCursor &cursor = source.record;
    const RasterCursorScreen screen = {1 + random.below(50), 1 + random.below(12)};
    const int32_t x = random.between(-50, 100), y = random.between(-12, 24);
    RasterCursorBox box{};
    if (Raster_ComputeCursorBox(&screen, &cursor, x, y, &box) == 0)
        return;
    const bool isAlpha = type == RASTER_CURSOR_ALPHA;
    if (isAlpha)
        cursor.type = random.oneOf({type, 2u, 0x80000000u}); // alpha, too

    const FencedBuffer frame(size_t{4} * screen.width * screen.height);
    const FencedBuffer compose(size_t{4} * box.width * box.height);
    random.fill(frame.data(), frame.size());
    const int32_t stride = 4 * static_cast<int32_t>(screen.width);
    const int32_t anyStride = random.between(-9, 9);
    const Bytes before = bytesOf(frame);
    Bytes drawn = before, composed(compose.size());
    const auto pixel =
        [](uint8_t * image, uint32_t columns, uint32_t column, uint32_t row) -> auto & {
        return reinterpret_cast<uint32_t *>(image)[size_t{row} * columns + column];
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
    forEachTarget([&] {
        std::copy(before.begin(), before.end(), frame.data());
        Raster_DrawCursor(frame.data(), stride, compose.data(), 4 * static_cast<int32_t>(box.width),
                          &cursor, &box);
        compareBytes(frame.data(), before, "screen that a cursor is composed from");
        compareBytes(compose.data(), composed, "cursor composed over a screen");
        Raster_DrawCursor(frame.data(), stride, nullptr, anyStride, &cursor, &box);
        compareBytes(frame.data(), drawn, "cursor drawn on a screen");
    });
}

void tryScaledCursor(Random &random, const CursorScaling &c) {
    const TestCursor source(random, c.type, c.width, c.height);
    RasterCursor &from = source.record;
    if (random.oneIn(4))
        from.hotspotY = kNoSize; // one row above the image
    if (c.type == RASTER_CURSOR_ANDXOR)
        from.type = random.oneOf({c.type, 2u}); // not alpha, so of two masks
    const ScaledCursor result(Raster_ScaleCursor(&from, c.scaleX, c.scaleY));
    compare(result != nullptr, true, "whether there is a scaled cursor");
    if (result == nullptr)
        return;
    const ScaledAxis x(c.width, from.hotspotX, c.scaleX), y(c.height, from.hotspotY, c.scaleY);
    const uint32_t fields[] = {result->type, result->hotspotX, result->hotspotY, result->width,
                               result->height};
    const uint32_t expectedFields[] = {c.type, x.hotspot, y.hotspot, x.size, y.size};
    compare(fields, expectedFields, sizeof fields, [] { return "record of a scaled cursor"; });

    // The source with its border, through the scaler; where that refuses, what
    // changes nothing on the screen.
    const auto compareImage = [&](const FencedBuffer &image, uint8_t fill, uint32_t filter,
                                  const uint8_t *scaledImage) {
        Bytes padded(size_t{4} * x.padded * y.padded, fill);
        for (size_t row = 0; row < c.height; ++row)
            std::copy_n(image.data() + 4 * c.width * row, 4 * c.width,
                        &padded[4 * ((y.border + row) * x.padded + x.border)]);
        Bytes expected(size_t{4} * x.size * y.size, fill);
        Raster_Scale(expected.data(), static_cast<int32_t>(4 * x.size), x.size, y.size, 0, 0,
                     static_cast<int32_t>(x.size), static_cast<int32_t>(y.size), padded.data(),
                     static_cast<int32_t>(4 * x.padded), x.padded, y.padded, c.scaleX, c.scaleY,
                     filter);
        compareBytes(scaledImage, expected, "image of a scaled cursor");
    };
    if (c.type == RASTER_CURSOR_ALPHA)
        return compareImage(source.images[0], 0, 2, result->alphaImage);
    compare(result->planeInfo0, from.planeInfo0, "planeInfo0");
    compare(result->planeInfo1, from.planeInfo1, "planeInfo1");
    compareImage(source.images[0], 0xFF, 0, result->andImage);
    compareImage(source.images[1], 0, 0, result->xorImage);
}

void tryScaleCursor(Random &random) {
    const auto scale = [&] {
        const double plain = random.oneOf({1.0, 2.0, 3.0, 0.5, 0.1, 0.2, 0.3, 1.0 / 3, 1.5});
        const double near = std::nextafter(plain, random.oneIn(2) ? 0 : 9);
        const int exponent = random.between(-3, 1);
        const double any = std::ldexp(random.word() | 0x80000000, exponent - 31);
        return random.oneOf({plain, plain, near, any});
    };
    tryScaledCursor(random,
                    {random.below(2), random.below(33), random.below(20), scale(), scale()});
}

void family::cursor(Random &random) {
    random.oneOf({tryCursorPlanes, tryCursorBox, tryDrawCursor, tryScaleCursor})(random);
}

} // namespace quillon::test
