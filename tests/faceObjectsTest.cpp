// The objects of the C++ face: rectangles, regions, images and their files, scaling,
// video frames and cursors.
#include "support/anywhere.h"
#include "support/fence.h"

#include <gtest/gtest.h>

#include <cstdio>
#include <string>
#include <vector>

namespace {

using namespace quillon;
using test::anyPoint;
using test::anyRect;
using test::FencedBuffer;
using test::kMax;
using test::kMin;
using test::Random;
using QRect = quillon::Rect;

// 32-bit pixels, which end at a fence.
struct Fenced {
    Fenced(Random &random, Size pixels)
        : size(pixels), memory(size_t{4} * u(size.width) * u(size.height)) {
        random.fill(memory.data(), memory.size());
    }
    static uint32_t u(int32_t value) { return static_cast<uint32_t>(value); }
    Surface surface() { return {memory.data(), 4 * size.width, size, Format::kBgra32}; }

    Size size;
    FencedBuffer memory;
};

uint32_t pixelAt(const ConstSurface &surface, int32_t x, int32_t y) {
    uint32_t pixel = 0;
    std::memcpy(&pixel, surface.row(y) + std::ptrdiff_t{4} * x, sizeof pixel);
    return pixel;
}

// Compares 32-bit pixels.
void expectEqual(const ConstSurface &a, const ConstSurface &b) {
    ASSERT_EQ(a.size(), b.size());
    for (int32_t y = 0; y < a.height(); ++y)
        for (int32_t x = 0; x < a.width(); ++x)
            ASSERT_EQ(pixelAt(a, x, y), pixelAt(b, x, y)) << x << ", " << y;
}

TEST(FaceObjects, RectanglesAreThoseOfTheCInterface) {
    test::forEachCase(20000, [](Random &random) {
        const QRect a = anyRect(random), b = anyRect(random);
        const Point p = anyPoint(random), offset = anyPoint(random);
        ::Rect made, both, moved, box = a;
        Rect_SetFromXYWH(&made, p.x, p.y, offset.x, offset.y);
        EXPECT_EQ(QRect(p.x, p.y, offset.x, offset.y), made);
        EXPECT_EQ(a.intersects(b), Rect_Intersect(&both, &a, &b));
        EXPECT_EQ(a.intersected(b), both);
        Rect_Translate(&moved, &a, &offset);
        EXPECT_EQ(a.translated(offset), moved);
        Rect_Union(&box, &b);
        EXPECT_EQ(a.united(b), box);
        EXPECT_EQ(a.contains(p), Rect_ContainsPoint(&a, &p));
        EXPECT_EQ(a.contains(b), Rect_ContainsRect(&a, &b));
        EXPECT_EQ(a == b, Rect_IsEqual(&a, &b));
    });
}

TEST(FaceObjects, RegionsAreSetsOfPixels) {
    test::forEachCase(3000, [](Random &random) {
        Region region;
        bool cells[16][16] = {};
        const auto paint = [&](const QRect &rect, bool value) {
            for (int32_t y = 0; y < 16; ++y)
                for (int32_t x = 0; x < 16; ++x)
                    if (rect.contains({x, y}))
                        cells[y][x] = value;
        };
        for (uint32_t step = random.below(6); step > 0; --step) {
            const QRect rect(random.between(0, 12), random.between(0, 12), random.between(0, 4),
                             random.between(0, 4));
            if (random.oneIn(3)) {
                paint(rect, !region.subtract(rect));
            } else {
                region.add(rect);
                paint(rect, true);
            }
        }
        uint64_t area = 0;
        for (int32_t y = 0; y < 16; ++y)
            for (int32_t x = 0; x < 16; ++x) {
                EXPECT_EQ(region.contains({x, y}), cells[y][x]);
                area += cells[y][x];
            }
        EXPECT_EQ(region.area(), area);
        Region copy;
        copy.add(region);
        EXPECT_EQ(copy, region);
    });
}

TEST(FaceObjects, RegionsEndAtTheirLimits) {
    Region region(QRect::fromEdges(kMin, kMin, kMax, kMax));
    EXPECT_EQ(region.bounds(), Region::limits());
    EXPECT_EQ(region.area(), uint64_t{0x7FFFFFFE} * 0x7FFFFFFE);
    EXPECT_TRUE(region.subtract({0, 0, 1, 1}));
    EXPECT_FALSE(region.contains({0, 0}));
    EXPECT_EQ(region.area(), uint64_t{0x7FFFFFFE} * 0x7FFFFFFE - 1);
    // A region of 15 rectangles cannot be cut into 16.
    region.clear();
    for (int32_t i = 0; i < 15; ++i)
        region.add({4 * i, 4 * i, 3, 3});
    const Region before = region;
    EXPECT_FALSE(region.subtract({1, 1, 1, 1}));
    EXPECT_EQ(region, before);
    EXPECT_TRUE(region.subtract({3, 3, 1, 1}));
}

TEST(FaceObjects, ImagesMoveAndGiveTheirPixelsBack) {
    std::optional<Image> image = Image::create({5, 3});
    ASSERT_TRUE(image);
    EXPECT_EQ(image->fill(0xFF010203), image->bounds());
    Image other = std::move(*image);
    EXPECT_TRUE(image->isEmpty());
    EXPECT_EQ(pixelAt(other, 4, 2), 0xFF010203);
    other = Image();
    EXPECT_TRUE(other.isEmpty());
    EXPECT_FALSE(Image::create({0x20000000, 1}));
    EXPECT_TRUE(Image::create({0, 5}));
}

// All formats, both directions of rows, files and memory.
TEST(FaceObjects, ImagesGoToFilesAndBack) {
    Random random(1);
    Palette palette;
    random.fill(palette.data(), sizeof palette);
    for (const Format format : {Format::kBgra32, Format::kBgr24, Format::kRgb16, Format::kRgb15,
                                Format::kSmall8, Format::kSmall6, Format::kSmall3, Format::kIndex8})
        for (const int32_t stride : {64, -64}) {
            uint8_t pixels[7 * 64];
            random.fill(pixels, sizeof pixels);
            const ConstSurface surface(stride < 0 ? pixels + 6 * 64 : pixels, stride, {13, 7},
                                       format, &palette);
            std::optional<Image> expected = Image::copyOf(surface, Format::kBgra32);
            ASSERT_TRUE(expected);
            if (format == Format::kIndex8) // files have no alpha in their palettes
                expected->fillAlpha(expected->bounds(), 255);
            const std::optional<Bytes> png = surface.encodePng(), bmp = surface.encodeBmp();
            ASSERT_TRUE(png && bmp);
            const std::optional<Image> read = Image::decodePng(png->data(), png->size());
            ASSERT_TRUE(read);
            expectEqual(*read, *expected);
            EXPECT_FALSE(Image::decodePng(png->data(), png->size() / 2));
            const bool isIndexed = bytesPerPixel(format) == 1;
            EXPECT_EQ(bmp->size(), isIndexed ? 54 + 1024 + 7 * 16u : 54 + 7 * 40u);

            const std::string file = testing::TempDir() + "face.png";
            EXPECT_TRUE(surface.writePng(file.c_str(), Alpha::kDrop));
            const std::optional<Image> opaque = Image::readPng(file.c_str());
            ASSERT_TRUE(opaque);
            expected->fillAlpha(expected->bounds(), 255);
            expectEqual(*opaque, *expected);
            std::remove(file.c_str());
        }
    EXPECT_FALSE(Image::readPng("no such file"));
    EXPECT_FALSE(Surface().encodePng());
    EXPECT_FALSE(Surface().writeBmp("no such file"));
}

// Raster_Scale over a source whose last column is repeated.
TEST(FaceObjects, ScalesAsTheScalerDoesWithOneColumnMore) {
    test::forEachCase(1500, [](Random &random) {
        Fenced source(random, {random.between(1, 60), random.between(1, 60)});
        Fenced dst(random, {random.between(1, 40), random.between(1, 40)});
        const Size size = {random.between(1, 90), random.between(2, 90)};
        const QRect to({random.between(-60, 50), random.between(-60, 50)}, size);
        const auto filter = random.oneOf({Filter::kNearest, Filter::kSmooth});

        const bool isPadded = filter == Filter::kSmooth && source.size.width > size.width;
        std::optional<Image> padded = Image::create({source.size.width + 1, source.size.height});
        std::optional<Image> scaled = Image::create(size), expected = Image::copyOf(dst.surface());
        ASSERT_TRUE(padded && scaled && expected);
        padded->copy({1, 0}, source.surface());
        padded->copy({0, 0}, source.surface());
        padded->copy({source.size.width, 0}, source.surface(),
                     {source.size.width - 1, 0, 1, source.size.height});
        ASSERT_EQ(
            Raster_Scale(scaled->pixels(), scaled->stride(), Fenced::u(size.width),
                         Fenced::u(size.height), 0, 0, size.width, size.height, padded->pixels(),
                         padded->stride(), Fenced::u(source.size.width + (isPadded ? 1 : 0)),
                         Fenced::u(source.size.height), double{1} * size.width / source.size.width,
                         double{1} * size.height / source.size.height,
                         filter == Filter::kSmooth ? 1 : 0),
            1u);
        const QRect drawn = expected->copy(to.corner(), *scaled);
        EXPECT_EQ(dst.surface().copyScaled(to, source.surface(), filter), drawn);
        expectEqual(dst.surface(), *expected);
        // An image has the column already, and whatever is in it does not count.
        std::optional<Image> image = Image::copyOf(source.surface());
        ASSERT_TRUE(image);
        for (int32_t y = 0; y < image->height(); ++y)
            random.fill(image->row(y) + std::ptrdiff_t{4} * image->width(), 4);
        EXPECT_EQ(dst.surface().copyScaled(to, *image, filter), drawn);
        expectEqual(dst.surface(), *expected);
    });
}

TEST(FaceObjects, KeepsWhiteWhiteInEveryReduction) {
    const Size sizes[][2] = {{{1280, 1024}, {1024, 600}}, {{640, 480}, {320, 240}},
                             {{100, 100}, {99, 99}},      {{700, 4000}, {7, 5}},
                             {{50, 32766}, {49, 1}},      {{33, 33}, {1, 1}}};
    for (const auto &[from, to] : sizes)
        for (const Format format : {Format::kBgra32, Format::kBgr24, Format::kSmall6}) {
            std::optional<Image> source = Image::create(from, format), result = Image::create(to);
            ASSERT_TRUE(source && result);
            source->fill(0xFFFFFFFF);
            const ConstSurface foreign(source->pixels(), source->stride(), from, format);
            for (const ConstSurface &white : {ConstSurface(*source), foreign}) {
                ASSERT_EQ(result->copyScaled(result->bounds(), white), result->bounds());
                for (int32_t y = 0; y < to.height; ++y)
                    for (std::ptrdiff_t i = 0; i < std::ptrdiff_t{4} * to.width; ++i)
                        // Weights of 8 bits, which are truncated, take some levels off everywhere.
                        ASSERT_GE(result->row(y)[i], 245) << from.width << ": " << i << ", " << y;
            }
        }
}

TEST(FaceObjects, ScalesOntoOtherFormatsAndRefusesTooLargeOnes) {
    Random random(1);
    Fenced source(random, {30, 20});
    uint16_t scaled[50 * 40] = {}, expected[50 * 40] = {};
    Surface narrow(scaled, 100, {50, 40}, Format::kRgb16);
    std::optional<Image> wide = Image::create({50, 40});
    ASSERT_TRUE(wide);
    const QRect to(-5, 10, 45, 60), seen(0, 10, 40, 30);
    EXPECT_EQ(wide->copyScaled(to, source.surface()), seen);
    EXPECT_EQ(narrow.copyScaled(to, source.surface()), seen);
    Surface(expected, 100, {50, 40}, Format::kRgb16).copy({0, 0}, *wide);
    EXPECT_EQ(std::memcmp(scaled, expected, sizeof scaled), 0);
    EXPECT_FALSE(wide->copyScaled({0, 0, 32767, 5}, source.surface()));
    EXPECT_FALSE(wide->copyScaled(QRect::fromEdges(kMin, 0, kMax, 5), source.surface()));
    EXPECT_EQ(wide->copyScaled({100, 100, 5, 5}, source.surface()), QRect());
    EXPECT_EQ(wide->copyScaled(wide->bounds(), Surface()), QRect());
}

// ---- Video ----------------------------------------------------------------

uint32_t colorOf(int32_t y, int32_t u, int32_t v) {
    const auto channel = [c = 298 * (y - 16) + 128](int32_t term) {
        return static_cast<uint32_t>(std::clamp((c + term) >> 8, 0, 255));
    };
    u -= 128;
    v -= 128;
    return 0xFF000000 | channel(409 * v) << 16 | channel(-100 * u - 208 * v) << 8 |
           channel(516 * u);
}

TEST(FaceObjects, VideoHasItsColors) {
    test::forEachCase(1500, [](Random &random) {
        const auto format = random.oneOf(
            {VideoFormat::kI420, VideoFormat::kYv12, VideoFormat::kNv12, VideoFormat::kYuy2,
             VideoFormat::kUyvy, VideoFormat::kYvyu, VideoFormat::kVyuy});
        const Size size = {random.oneIn(4) ? random.between(500, 530) : random.between(1, 20),
                           random.between(1, 9)};
        const int32_t half = (size.width + 1) / 2, lines = (size.height + 1) / 2;
        const FencedBuffer memory(VideoFrame::byteCount(format, size));
        random.fill(memory.data(), memory.size());
        const uint8_t *const data = memory.data();
        const auto expectedAt = [&](int32_t x, int32_t y) {
            const bool isYFirst = format == VideoFormat::kYuy2 || format == VideoFormat::kYvyu;
            const bool isVFirst = format == VideoFormat::kYv12 || format == VideoFormat::kYvyu ||
                                  format == VideoFormat::kVyuy;
            if (format > VideoFormat::kNv12) {
                const uint8_t *const pair = data + 4 * (y * half + x / 2);
                const uint8_t *const chroma = pair + (isYFirst ? 1 : 0);
                return colorOf(pair[x % 2 * 2 + (isYFirst ? 0 : 1)], chroma[isVFirst ? 2 : 0],
                               chroma[isVFirst ? 0 : 2]);
            }
            const int32_t step = format == VideoFormat::kNv12 ? 2 : 1;
            const int32_t second = step == 2 ? 1 : half * lines;
            const uint8_t *const chroma =
                data + size.width * size.height + step * (y / 2 * half + x / 2);
            return colorOf(data[y * size.width + x], chroma[isVFirst ? second : 0],
                           chroma[isVFirst ? 0 : second]);
        };
        Fenced dst(random, {random.between(1, 560), random.between(1, 12)});
        std::optional<Image> expected = Image::copyOf(dst.surface());
        ASSERT_TRUE(expected);
        const Point to = {random.oneIn(5) ? test::anyCoordinate(random) : random.between(-300, 30),
                          random.between(-8, 8)};
        const QRect drawn = QRect(to, size).intersected(expected->bounds());
        for (int32_t y = drawn.top; y < drawn.bottom; ++y)
            for (int32_t x = drawn.left; x < drawn.right; ++x)
                expected->fill({x, y, 1, 1}, expectedAt(x - to.x, y - to.y));
        EXPECT_EQ(dst.surface().copyVideo(to, VideoFrame(data, format, size)), drawn);
        expectEqual(dst.surface(), *expected);
    });
}

// As other programs make them: the bars of a test picture.
TEST(FaceObjects, VideoOfKnownColorsWithStrides) {
    const uint8_t red[] = {81, 81, 0, 81, 81}, u[] = {90}, uv[] = {90, 240};
    for (const VideoFrame &frame : {VideoFrame::planar({2, 2}, {red, 3}, {u, 1}, {uv + 1, 1}),
                                    VideoFrame::planar({2, 2}, {red, 3}, {uv, 2})}) {
        uint32_t pixels[4] = {};
        Surface screen(pixels, 8, {2, 2}, Format::kBgra32);
        EXPECT_EQ(screen.copyVideo({0, 0}, frame), screen.bounds());
        for (const uint32_t pixel : pixels)
            EXPECT_EQ(pixel, 0xFFFF0000);
    }
}

// ---- Cursors --------------------------------------------------------------

TEST(FaceObjects, CursorsAreDrawnWhereTheyAreSeen) {
    test::forEachCase(3000, [](Random &random) {
        const Size size = {random.between(1, 20), random.between(1, 20)};
        Fenced first(random, size), second(random, size), dst(random, {40, 30});
        const Point hotSpot = {random.between(0, 9), random.between(0, 9)};
        const bool hasAlpha = random.oneIn(2);
        const std::optional<Cursor> cursor =
            hasAlpha ? Cursor::withAlpha(first.surface(), hotSpot)
                     : Cursor::withMasks(first.surface(), second.surface(), hotSpot);
        ASSERT_TRUE(cursor);
        const Point at = anyPoint(random);
        const Point corner = cursor->bounds(at).corner();
        const bool isWrapping = at.x < kMin + 20 || at.y < kMin + 20;
        std::optional<Image> expected = Image::copyOf(dst.surface());
        ASSERT_TRUE(expected);
        QRect drawn;
        if (!isWrapping && hasAlpha) {
            drawn = expected->blend(corner, first.surface());
        } else if (!isWrapping) {
            expected->combine(corner, first.surface(), Rop::kAnd);
            drawn = expected->combine(corner, second.surface(), Rop::kXor);
        }
        EXPECT_EQ(dst.surface().draw(at, *cursor), drawn);
        expectEqual(dst.surface(), *expected);
    });
}

TEST(FaceObjects, CursorsFromBitsScaleAndMove) {
    const uint8_t andBits[] = {0xF0, 0x90, 0x90, 0xF0}, xorBits[] = {0x00, 0x60, 0x60, 0x00};
    std::optional<Cursor> cursor =
        Cursor::withMasks(Bitmap(andBits, {4, 4}), Bitmap(xorBits, {4, 4}), {1, 1});
    ASSERT_TRUE(cursor);
    uint32_t pixels[16] = {};
    Surface screen(pixels, 16, {4, 4}, Format::kBgra32);
    screen.fill(0xFF808080);
    EXPECT_EQ(screen.draw({1, 1}, *cursor), screen.bounds());
    EXPECT_EQ(pixels[0], 0xFF808080);
    EXPECT_EQ(pixels[5], 0xFFFFFFFF);

    const std::optional<Cursor> large = cursor->scaled(2, 2);
    ASSERT_TRUE(large);
    EXPECT_EQ(large->size(), Size({20, 20})); // a border of 3 on each side
    EXPECT_EQ(large->hotSpot(), Point(8, 8));
    EXPECT_FALSE(cursor->scaled(0, 1));

    const Cursor moved = std::move(*cursor);
    EXPECT_TRUE(screen.draw({1, 1}, *cursor).isEmpty());
    EXPECT_EQ(screen.draw({1, 1}, moved), screen.bounds());

    // With alpha, on a format that is not of 32 bits.
    uint16_t narrow[16] = {};
    Surface window(narrow, 8, {4, 4}, Format::kRgb16);
    screen.fill(0xFFFF0000);
    const std::optional<Cursor> red = Cursor::withAlpha(screen, {3, 3});
    ASSERT_TRUE(red);
    EXPECT_EQ(window.draw({4, 4}, *red), QRect(1, 1, 3, 3));
    EXPECT_EQ(narrow[0], 0);
    EXPECT_EQ(narrow[15], 0xF800);
}

} // namespace
