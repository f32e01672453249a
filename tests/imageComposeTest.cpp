// Images made out of others, against a plain painter.

#include "imageUtil.h"
#include "raster.h"
#include "support/faults.h"
#include "support/messages.h"
#include "support/testImage.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <cfloat>
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

// The bytes of a canvas pixel: of the last image there, or zeros.
std::array<uint8, 4> expectedPixel(const std::vector<ImageInfo> &images,
                                   const std::vector<RectPoint> &positions, int32 x, int32 y,
                                   bool needsAlpha) {
    std::array<uint8, 4> bytes = {};
    for (size_t i = 0; i < images.size(); ++i) {
        const ImageInfo &image = images[i];
        const auto column = static_cast<uint32>(x - positions[i].x);
        const auto row = static_cast<uint32>(y - positions[i].y);
        if (image.data == nullptr || column >= image.width || row >= image.height) {
            continue; // the negative ones too
        }
        if (needsAlpha) {
            const Color color = colorAt(image, column, row);
            bytes = {color.blue, color.green, color.red, 255};
        } else {
            const uint32 pixelBytes = image.bpp / 8;
            std::memcpy(bytes.data(),
                        image.data + size_t{row} * image.bytesPerLine + column * pixelBytes,
                        pixelBytes);
        }
    }
    return bytes;
}

TEST(Combine, LikeAPainter) {
    forEachCase(600, [](Random &random) {
        const Format format = kFormats[random.below(std::size(kFormats))];
        std::deque<TestImage> blocks;
        std::vector<ImageInfo> images;
        std::vector<RectPoint> positions;
        int32 left = kMax, top = kMax, right = kMin, bottom = kMin, nextX = -7;
        uint32 area = 0;
        const bool isTight = random.oneIn(3); // side by side, which leaves no gap
        for (uint32 i = 0, count = 1 + random.below(4); i < count; ++i) {
            const uint32 width = 1 + random.below(12), height = isTight ? 6 : 1 + random.below(12);
            blocks.emplace_back(random, format, width, height, 4 * random.below(3));
            images.push_back(blocks.back().info);
            if (random.oneIn(6)) {
                images[i].data = nullptr;
            }
            const RectPoint at = {isTight ? nextX : random.between(-15, 15),
                                  isTight ? 3 : random.between(-15, 15)};
            positions.push_back(at);
            left = std::min(left, at.x);
            top = std::min(top, at.y);
            right = std::max(right, nextX = at.x + static_cast<int32>(width));
            bottom = std::max(bottom, at.y + static_cast<int32>(height));
            area += width * height;
        }
        Result canvas;
        ASSERT_TRUE(ImageUtil_Combine(images.data(), positions.data(),
                                      static_cast<uint32>(images.size()), &canvas));
        ASSERT_EQ(canvas.width, static_cast<uint32>(right - left));
        ASSERT_EQ(canvas.height, static_cast<uint32>(bottom - top));
        const bool needsAlpha = area != canvas.width * canvas.height && format.bpp != 32;
        EXPECT_EQ(canvas.bpp, needsAlpha ? 32 : format.bpp);
        EXPECT_EQ(canvas.depth, needsAlpha ? 24 : format.depth);
        EXPECT_EQ(canvas.flags, 0u);
        EXPECT_EQ(canvas.numColors, 0u);
        const uint32 pixelBytes = canvas.bpp / 8;
        ASSERT_EQ(canvas.bytesPerLine, (canvas.width * pixelBytes + 3) / 4 * 4);
        std::vector<uint8> expected(size_t{canvas.bytesPerLine} * canvas.height);
        for (int32 y = top; y < bottom; ++y) {
            for (int32 x = left; x < right; ++x) {
                const auto pixel = expectedPixel(images, positions, x, y, needsAlpha);
                std::memcpy(&expected[static_cast<uint32>(y - top) * canvas.bytesPerLine +
                                      static_cast<uint32>(x - left) * pixelBytes],
                            pixel.data(), pixelBytes);
            }
        }
        ASSERT_EQ(std::memcmp(canvas.data, expected.data(), expected.size()), 0);
    });
}

TEST(Combine, NeverReadsOrWritesOutside) {
    forEachCase(3000, [](Random &random) {
        std::deque<TestImage> blocks;
        std::vector<ImageInfo> images;
        std::vector<RectPoint> positions;
        const auto coordinate = [&] {
            return random.oneOf({kMin, kMin + 9, -9, 0, 5, kMax - 9, kMax});
        };
        const auto size = [&] {
            return random.oneOf({0u, 1u, 7u, 0x7FFFFFFFu, 0x80000000u, 0xFFFFFFF9u, 0xFFFFFFFFu});
        };
        for (uint32 i = 0, count = 1 + random.below(3); i < count; ++i) {
            const Format format = kFormats[random.below(std::size(kFormats))];
            blocks.emplace_back(random, format, 6, 5);
            images.push_back(blocks.back().info);
            // Widths beyond the rows, and formats that differ: rows bound both.
            images[i].width = size();
            if (random.oneIn(4)) {
                images[i].height = size();
                images[i].data = nullptr;
            }
            positions.push_back({coordinate(), coordinate()});
        }
        Result canvas;
        if (!ImageUtil_Combine(images.data(), positions.data(), static_cast<uint32>(images.size()),
                               &canvas)) {
            EXPECT_EQ(canvas.data, nullptr);
        }
    });
}

TEST(Combine, AtTheLimits) {
    Random random(1);
    TestImage image(random, {24, 32}, 10, 4);
    const auto combine = [&](uint32 count, std::array<RectPoint, 2> positions, ImageInfo &result) {
        const ImageInfo images[] = {image.info, image.info};
        return ImageUtil_Combine(images, positions.data(), count, &result);
    };
    ImageInfo result;
    std::memset(&result, 0x5A, sizeof result);
    EXPECT_FALSE(combine(2, {{{kMin, 0}, {kMax - 10, 0}}}, result));    // rows of 2^33 - 4 bytes
    EXPECT_FALSE(combine(2, {{{0, 0}, {0x40000001 - 10, 0}}}, result)); // and of 2^32 + 4
    EXPECT_EQ(result.width, 0x5A5A5A5Au);
    EXPECT_TRUE(combine(0, {}, result));
    const ImageInfo zero = {};
    EXPECT_EQ(std::memcmp(&result, &zero, sizeof zero), 0);

    // At the end of the coordinates an image is cut off, and so is its painting.
    Result canvas;
    ASSERT_TRUE(combine(1, {{{kMax - 3, kMax - 2}}}, canvas));
    EXPECT_EQ(canvas.width, 3u);
    EXPECT_EQ(canvas.height, 2u);
    EXPECT_EQ(std::memcmp(canvas.data + 12, image.info.data + 40, 12), 0);
    ImageUtil_FreeImageData(&canvas);

    bool isMade = false;
    forEachMemoryFault(
        [&] {
            isMade = combine(2, {{{0, 0}, {5, 0}}}, canvas);
            ImageUtil_FreeImageData(&canvas);
        },
        [&](bool failed) { EXPECT_EQ(isMade, !failed); });

    image.info.depth = 12;
    image.info.bpp = 16;
    EXPECT_TRUE(combine(1, {}, canvas)); // nothing to convert
    panicLine(expectPanic([&] {
                  combine(2, {{{0, 0}, {19, 0}}}, canvas);
              }),
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

// A crop comes through the scaler with factors in the 80-bit format, rounded to
// double, and as it is with its own size.
TEST(CropAndScale, CutsAndScales) {
    if (LDBL_MANT_DIG != 64) {
        GTEST_SKIP() << "the factors need a 64-bit significand";
    }
    forEachCase(600, [](Random &random) {
        const uint32 imageWidth = 2 + random.below(40), imageHeight = 2 + random.below(40);
        TestImage image(random, {24, 32}, imageWidth, imageHeight, 4 * random.below(3));
        Request request;
        request.right = random.between(1, static_cast<int32>(imageWidth) - 1);
        request.left = random.between(0, request.right - 1);
        request.bottom = random.between(1, static_cast<int32>(imageHeight));
        request.top = random.between(0, request.bottom - 1);
        const int32 cropWidth = request.right - request.left;
        const int32 cropHeight = request.bottom - request.top;
        if (request.bottom == static_cast<int32>(imageHeight) && random.oneIn(2)) {
            request.bottom = -1;
        }
        // One side follows the other by proportion.
        request.width = random.oneOf({-1, cropWidth, random.between(1, 90)});
        request.height = random.oneOf({-1, cropHeight, random.between(1, 90)});
        int32 width = request.width, height = request.height;
        if (width == -1) {
            width = height == -1 ? cropWidth : height * cropWidth / cropHeight;
        }
        if (height == -1) {
            height = request.width == -1 ? cropHeight : cropHeight * width / cropWidth;
        }
        Result made;
        ASSERT_EQ(request.run(image.info, &made), width > 0 && height > 0);
        if (made.data == nullptr) {
            return;
        }
        ASSERT_EQ(made.width, static_cast<uint32>(width));
        ASSERT_EQ(made.height, static_cast<uint32>(height));
        ASSERT_EQ(made.bytesPerLine, made.width * 4);
        EXPECT_EQ(made.depth, 24u);
        EXPECT_EQ(made.bpp, 32u);
        EXPECT_EQ(made.flags, 0u);
        EXPECT_EQ(made.numColors, 0u);

        std::vector<uint8> expected(made.bytesPerLine * made.height);
        const uint8 *const first = image.info.data +
                                   static_cast<uint32>(request.top) * image.info.bytesPerLine +
                                   static_cast<uint32>(request.left) * 4;
        const auto line = static_cast<int32>(image.info.bytesPerLine);
        if (width == cropWidth && height == cropHeight) {
            Raster_RectCopy(expected.data(), width * 4, first, line, 4, 0, 0, 0, 0, made.width,
                            made.height);
        } else {
            ASSERT_EQ(Raster_Scale(expected.data(), width * 4, made.width, made.height, 0, 0, width,
                                   height, first, line, static_cast<uint32>(cropWidth),
                                   static_cast<uint32>(cropHeight),
                                   static_cast<double>(1.0L * width / cropWidth),
                                   static_cast<double>(1.0L * height / cropHeight), 2),
                      1u);
        }
        EXPECT_EQ(std::memcmp(made.data, expected.data(), expected.size()), 0);
    });
}

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
        {.top = kMax},
        {.dstLeft = 1},
        {.dstTop = -1},
        {.width = 0},
        {.height = 0},
        {.width = 32768, .height = 10}, // more than the scaler takes
        {.width = 10, .height = 32768},
        {.width = -2, .height = -2},     // huge, not missing
        {.width = kMin, .height = kMin}, // 4 times the width is 0 in 32 bits
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

TEST(CropAndScale, WholeImageAndMemoryFaults) {
    Random random(7);
    const TestImage image(random, {24, 32}, 20, 20);
    for (const int32 width : {-1, 15}) {
        const Request request = {.width = width};
        bool isMade = false;
        forEachMemoryFault(
            [&] {
                Result result;
                isMade = request.run(image.info, &result);
                EXPECT_TRUE(!isMade || width != -1 ||
                            std::memcmp(result.data, image.info.data, image.pixels.size()) == 0);
            },
            [&](bool failed) { EXPECT_EQ(isMade, !failed); });
    }
}

} // namespace
