// Images made out of others, against a plain painter.

#include "imageUtil.h"
#include "raster.h"
#include "support/faults.h"
#include "support/messages.h"
#include "support/testImage.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <cstring>
#include <deque>
#include <limits>

using namespace quillon::test;

namespace {

constexpr int32 kMin = std::numeric_limits<int32>::min();
constexpr int32 kMax = std::numeric_limits<int32>::max();

// An image that gives its pixels back.
struct Result : ImageInfo {
    Result() { std::memset(static_cast<ImageInfo *>(this), 0, sizeof(ImageInfo)); }
    ~Result() { ImageUtil_FreeImageData(this); }
    Result(const Result &) = delete;
    Result &operator=(const Result &) = delete;
};

// Images and their positions, as Combine takes them.
struct Collage {
    void add(const ImageInfo &image, int32 x, int32 y) {
        images.push_back(image);
        positions.push_back({x, y});
    }
    bool combine(ImageInfo *result) const {
        return ImageUtil_Combine(images.data(), positions.data(),
                                 static_cast<uint32>(images.size()), result);
    }

    std::vector<ImageInfo> images;
    std::vector<RectPoint> positions;
};

bool isIn(int64_t value, int64_t low, uint32 extent) {
    return value >= low && value < low + extent;
}

// The bytes of a canvas pixel: of the last image there, or zeros.
std::array<uint8, 4> expectedPixel(const Collage &collage, int32 x, int32 y, bool needsAlpha) {
    for (size_t i = collage.images.size(); i-- > 0;) {
        const ImageInfo &image = collage.images[i];
        const RectPoint at = collage.positions[i];
        if (image.data == nullptr || !isIn(x, at.x, image.width) || !isIn(y, at.y, image.height)) {
            continue;
        }
        const uint32 column = static_cast<uint32>(x - at.x);
        const uint32 row = static_cast<uint32>(y - at.y);
        if (needsAlpha) {
            const Color color = colorAt(image, column, row);
            return {color.blue, color.green, color.red, 255};
        }
        std::array<uint8, 4> bytes = {};
        const uint32 bytesPerPixel = image.bpp / 8;
        std::memcpy(bytes.data(),
                    image.data + size_t{row} * image.bytesPerLine + column * bytesPerPixel,
                    bytesPerPixel);
        return bytes;
    }
    return {};
}

void expectCanvas(const Collage &collage, const ImageInfo &canvas) {
    int32 left = kMax, top = kMax, right = kMin, bottom = kMin;
    uint32 area = 0;
    for (size_t i = 0; i < collage.images.size(); ++i) {
        const ImageInfo &image = collage.images[i];
        const RectPoint at = collage.positions[i];
        left = std::min(left, at.x);
        top = std::min(top, at.y);
        right = std::max(right, at.x + static_cast<int32>(image.width));
        bottom = std::max(bottom, at.y + static_cast<int32>(image.height));
        area += image.width * image.height;
    }
    const ImageInfo &first = collage.images[0];
    ASSERT_EQ(canvas.width, static_cast<uint32>(right - left));
    ASSERT_EQ(canvas.height, static_cast<uint32>(bottom - top));
    const bool needsAlpha = area != canvas.width * canvas.height && first.bpp != 32;
    EXPECT_EQ(canvas.bpp, needsAlpha ? 32 : first.bpp);
    EXPECT_EQ(canvas.depth, needsAlpha ? 24 : first.depth);
    EXPECT_EQ(canvas.flags, 0u);
    EXPECT_EQ(canvas.numColors, 0u);
    const uint32 bytesPerPixel = canvas.bpp / 8;
    ASSERT_EQ(canvas.bytesPerLine, (canvas.width * bytesPerPixel + 3) / 4 * 4);
    for (int32 y = top; y < bottom; ++y) {
        const uint8 *const row = canvas.data + static_cast<size_t>(y - top) * canvas.bytesPerLine;
        for (int32 x = left; x < right; ++x) {
            const auto expected = expectedPixel(collage, x, y, needsAlpha);
            ASSERT_EQ(std::memcmp(row + static_cast<uint32>(x - left) * bytesPerPixel,
                                  expected.data(), bytesPerPixel),
                      0)
                << "pixel " << x << ", " << y;
        }
        for (uint32 i = canvas.width * bytesPerPixel; i < canvas.bytesPerLine; ++i) {
            EXPECT_EQ(row[i], 0);
        }
    }
}

TEST(Combine, LikeAPainter) {
    forEachCase(600, [](Random &random) {
        const Format format = kFormats[random.below(std::size(kFormats))];
        std::deque<TestImage> images;
        Collage collage;
        int32 nextX = -7; // side by side, which covers without a gap, or anywhere
        const bool isTight = random.oneIn(3);
        for (uint32 i = 0, count = 1 + random.below(4); i < count; ++i) {
            const uint32 width = 1 + random.below(12);
            const uint32 height = isTight ? 6 : 1 + random.below(12);
            ImageInfo &image =
                images.emplace_back(random, format, width, height, 4 * random.below(3)).info;
            if (random.oneIn(6)) {
                image.data = nullptr;
            }
            const int32 x = isTight ? nextX : random.between(-15, 15);
            collage.add(image, x, isTight ? 3 : random.between(-15, 15));
            nextX += static_cast<int32>(width);
        }
        Result canvas;
        ASSERT_TRUE(collage.combine(&canvas));
        expectCanvas(collage, canvas);
    });
}

TEST(Combine, NothingGivesAnEmptyRecord) {
    ImageInfo result;
    std::memset(&result, 0x5A, sizeof result);
    EXPECT_TRUE(ImageUtil_Combine(nullptr, nullptr, 0, &result));
    const ImageInfo zero = {};
    EXPECT_EQ(std::memcmp(&result, &zero, sizeof zero), 0);
}

// At the end of the coordinates an image is cut off, and so is its painting.
TEST(Combine, CutAtTheLimitOfCoordinates) {
    Random random(1);
    TestImage image(random, {24, 32}, 10, 4);
    Collage collage;
    collage.add(image.info, kMax - 3, kMax - 2);
    Result canvas;
    ASSERT_TRUE(collage.combine(&canvas));
    EXPECT_EQ(canvas.width, 3u);
    EXPECT_EQ(canvas.height, 2u);
    EXPECT_EQ(std::memcmp(canvas.data, image.info.data, 12), 0);
    EXPECT_EQ(std::memcmp(canvas.data + 12, image.info.data + 40, 12), 0);
}

TEST(Combine, NeverReadsOrWritesOutside) {
    forEachCase(3000, [](Random &random) {
        const int32 kCoordinates[] = {kMin, kMin + 9, -9, 0, 5, kMax - 9, kMax};
        const uint32 kSizes[] = {0, 1, 7, 0x7FFFFFFF, 0x80000000, 0xFFFFFFF9, 0xFFFFFFFF};
        std::deque<TestImage> images;
        Collage collage;
        for (uint32 i = 0, count = 1 + random.below(3); i < count; ++i) {
            const Format format = kFormats[random.below(std::size(kFormats))];
            ImageInfo &image = images.emplace_back(random, format, 6, 5).info;
            // Widths beyond the rows, and formats that differ: rows bound both.
            image.width = kSizes[random.below(std::size(kSizes))];
            if (random.oneIn(4)) {
                image.height = kSizes[random.below(std::size(kSizes))];
                image.data = nullptr;
            }
            collage.add(image, kCoordinates[random.below(std::size(kCoordinates))],
                        kCoordinates[random.below(std::size(kCoordinates))]);
        }
        Result canvas;
        if (!collage.combine(&canvas)) {
            EXPECT_EQ(canvas.data, nullptr);
        }
    });
}

TEST(Combine, CanvasNotToBeHad) {
    Random random(2);
    TestImage image(random, {24, 24}, 10, 10);
    Collage collage;
    collage.add(image.info, kMin, 0);
    collage.add(image.info, kMax - 10, 0);
    ImageInfo result;
    std::memset(&result, 0x5A, sizeof result);
    EXPECT_FALSE(collage.combine(&result)); // 4 times 2^31 - 1 bytes a row
    EXPECT_EQ(result.width, 0x5A5A5A5Au);

    Result canvas;
    bool isMade = false;
    collage.positions = {{0, 0}, {5, 0}};
    forEachMemoryFault(
        [&] {
            isMade = collage.combine(&canvas);
            ImageUtil_FreeImageData(&canvas);
        },
        [&](bool failed) { EXPECT_EQ(isMade, !failed); });
}

TEST(Combine, UnknownDepthIsAPanic) {
    Random random(3);
    TestImage image(random, {16, 16}, 4, 4);
    image.info.depth = 12;
    Collage collage;
    collage.add(image.info, 0, 0);
    Result canvas;
    EXPECT_TRUE(collage.combine(&canvas)); // nothing to convert
    collage.add(image.info, 9, 0);
    panicLine(expectPanic([&] { collage.combine(&canvas); }),
              "NOT_IMPLEMENTED lib/raster/rasterConv");
}

// The arguments of a crop, all of the image and its own size by default.
struct Request {
    int32 left = 0, top = 0, right = -1, bottom = -1;
    int32 dstLeft = 0, dstTop = 0, width = -1, height = -1;

    bool run(const ImageInfo &image, ImageInfo *result) const {
        return ImageUtil_CropAndScaleImage(&image, left, top, right, bottom, dstLeft, dstTop, width,
                                           height, result);
    }
};

TEST(CropAndScale, CutsExactly) {
    forEachCase(300, [](Random &random) {
        TestImage image(random, {24, 32}, 1 + random.below(20), 1 + random.below(20),
                        4 * random.below(3));
        const int32 imageWidth = static_cast<int32>(image.info.width);
        const int32 imageHeight = static_cast<int32>(image.info.height);
        Request request;
        request.left = random.between(0, imageWidth - 1);
        request.right = random.between(request.left + 1, imageWidth);
        request.top = random.between(0, imageHeight - 1);
        request.bottom = random.between(request.top + 1, imageHeight);
        if (request.right - request.left == imageWidth) {
            return; // needs rows end to end; WholeImage has them
        }
        Result cut;
        ASSERT_TRUE(request.run(image.info, &cut));
        ASSERT_EQ(cut.width, static_cast<uint32>(request.right - request.left));
        ASSERT_EQ(cut.height, static_cast<uint32>(request.bottom - request.top));
        ASSERT_EQ(cut.bytesPerLine, cut.width * 4);
        for (uint32 y = 0; y < cut.height; ++y) {
            for (uint32 x = 0; x < cut.width; ++x) {
                ASSERT_EQ(colorAt(cut, x, y),
                          colorAt(image.info, x + static_cast<uint32>(request.left),
                                  y + static_cast<uint32>(request.top)));
            }
        }
    });
}

TEST(CropAndScale, WholeImage) {
    Random random(4);
    TestImage image(random, {24, 32}, 9, 7);
    image.info.numColors = 5;
    Result copy;
    ASSERT_TRUE(Request{}.run(image.info, &copy));
    EXPECT_EQ(std::memcmp(copy.data, image.info.data, image.pixels.size()), 0);
    EXPECT_EQ(copy.depth, 24u);
    EXPECT_EQ(copy.bpp, 32u);
    EXPECT_EQ(copy.flags, 0u);
    EXPECT_EQ(copy.numColors, 0u);
}

TEST(CropAndScale, SizesByProportion) {
    Random random(5);
    TestImage image(random, {24, 32}, 100, 50);
    const int32 kCases[][6] = {// crop width and height, size asked for, size
                               {100, 50, 40, -1, 40, 20},   {100, 50, -1, 25, 50, 25},
                               {3, 3, 2, -1, 2, 2},         {3, 2, 2, -1, 2, 1},
                               {100, 50, 7, 11, 7, 11},     {7, 3, -1, -1, 7, 3},
                               {1, 50, 655, -1, 655, 32750}};
    for (const auto &c : kCases) {
        const Request request = {.right = c[0], .bottom = c[1], .width = c[2], .height = c[3]};
        Result scaled;
        ASSERT_TRUE(request.run(image.info, &scaled));
        EXPECT_EQ(scaled.width, static_cast<uint32>(c[4]));
        EXPECT_EQ(scaled.height, static_cast<uint32>(c[5]));
        EXPECT_EQ(scaled.bytesPerLine, scaled.width * 4);
    }
}

#if defined(__x86_64__)
// The factors are quotients in the 80-bit format, rounded to double.
TEST(CropAndScale, ScalesLikeTheScaler) {
    forEachCase(200, [](Random &random) {
        TestImage image(random, {24, 32}, 40, 30);
        Request request = {.left = random.between(0, 19), .top = random.between(0, 14)};
        request.right = random.between(20, 40);
        request.bottom = random.between(15, 30);
        request.width = random.between(1, 90);
        request.height = random.between(1, 90);
        Result scaled;
        ASSERT_TRUE(request.run(image.info, &scaled));

        const int32 cropWidth = request.right - request.left;
        const int32 cropHeight = request.bottom - request.top;
        std::vector<uint8> expected(scaled.bytesPerLine * scaled.height);
        const auto factor = [](int32 to, int32 from) {
            return static_cast<double>(static_cast<long double>(to) / from);
        };
        ASSERT_EQ(Raster_Scale(expected.data(), request.width * 4, scaled.width, scaled.height, 0,
                               0, request.width, request.height,
                               image.info.data + request.top * 160 + request.left * 4, 160,
                               static_cast<uint32>(cropWidth), static_cast<uint32>(cropHeight),
                               factor(request.width, cropWidth), factor(request.height, cropHeight),
                               2),
                  1u);
        EXPECT_EQ(std::memcmp(scaled.data, expected.data(), expected.size()), 0);
    });
}
#endif

TEST(CropAndScale, Refusals) {
    Random random(6);
    TestImage image(random, {24, 32}, 100, 50);
    const Request kRefused[] = {
        {.left = -1},
        {.top = -1},
        {.left = 5, .right = 5},
        {.top = 5, .bottom = 4},
        {.right = -2},
        {.bottom = kMin},
        {.right = 101},
        {.bottom = 51},
        {.left = 100},
        {.left = kMax},
        {.top = 50},
        {.dstLeft = 1},
        {.dstTop = -1},
        {.width = 0},
        {.height = 0},
        {.top = 49, .width = 99},       // the height would be 0
        {.left = 99, .height = 49},     // the width would be 0
        {.width = 32768, .height = 10}, // more than the scaler takes
        {.width = 10, .height = 32768},
        {.width = -2}, // a huge size, not a missing one
        {.height = -2},
        {.width = -2, .height = -2},
        {.width = kMin, .height = kMin}, // 4 times the width is 0 in 32 bits
        {.width = kMin, .height = 1},
        {.width = 0x40000000, .height = 4},
        {.width = 1, .height = kMax},
    };
    for (const Request &request : kRefused) {
        ImageInfo result;
        std::memset(&result, 0x5A, sizeof result);
        const ImageInfo before = result;
        EXPECT_FALSE(request.run(image.info, &result)) << "number " << &request - kRefused;
        EXPECT_EQ(std::memcmp(&result, &before, sizeof result), 0);
    }
    const auto expectRefusal = [&](auto change) {
        ImageInfo changed = image.info;
        change(changed);
        Result result;
        EXPECT_FALSE(Request{}.run(changed, &result));
        EXPECT_FALSE((Request{.width = 20}).run(changed, &result));
    };
    expectRefusal([](ImageInfo &info) { info.data = nullptr; });
    expectRefusal([](ImageInfo &info) { info.width = 0; });
    expectRefusal([](ImageInfo &info) { info.height = 0; });
    expectRefusal([](ImageInfo &info) { info.bytesPerLine = 300; }); // 3 bytes a pixel
}

TEST(CropAndScale, MemoryFaults) {
    Random random(7);
    const TestImage image(random, {24, 32}, 20, 20);
    for (const int32 width : {-1, 15}) {
        const Request request = {.width = width};
        Result result;
        bool isMade = false;
        forEachMemoryFault(
            [&] {
                isMade = request.run(image.info, &result);
                ImageUtil_FreeImageData(&result);
            },
            [&](bool failed) { EXPECT_EQ(isMade, !failed); });
    }
}

} // namespace
