// Images made out of others, against a plain painter.

#include "support/faults.h"
#include "support/longDouble.h"
#include "support/messages.h"
#include "support/testImage.h"
#include <quillon/imageUtil.h>
#include <quillon/raster.h>

#include <algorithm>
#include <cstring>
#include <deque>
#include <limits>
#include <vector>

using namespace quillon::test;

namespace {

constexpr int32_t kMin = std::numeric_limits<int32_t>::min();
constexpr int32_t kMax = std::numeric_limits<int32_t>::max();

// An image that gives its pixels back.
struct Result : ImageInfo {
    Result() { std::memset(static_cast<ImageInfo *>(this), 0x5A, sizeof(ImageInfo)); }
    ~Result() { std::free(isMade ? data : nullptr); }
    Result(const Result &) = delete;
    Result &operator=(const Result &) = delete;

    // Notes the outcome of a call; without success it must have left the record.
    bool made(bool outcome) {
        isMade = outcome;
        const Result untouched;
        EXPECT_NE(std::memcmp(this, &untouched, sizeof(ImageInfo)) == 0, isMade);
        return isMade;
    }
    bool isMade = false;
};

// Images and where they go on a canvas.
struct Collage {
    void add(Random &random, Format format, uint32_t width, uint32_t height, RectPoint at) {
        blocks.emplace_back(random, format, width, height, 4 * random.below(3));
        images.push_back(blocks.back().info);
        positions.push_back(at);
    }
    bool combine(Result &canvas) const {
        return canvas.made(ImageUtil_Combine(images.data(), positions.data(),
                                             static_cast<uint32_t>(images.size()), &canvas));
    }
    std::deque<TestImage> blocks;
    std::vector<ImageInfo> images;
    std::vector<RectPoint> positions;
};

TEST(Combine, LikeAPainter) {
    forEachCase(600, [](Random &random) {
        const Format format = random.oneOf(kFormats);
        Collage collage;
        int32_t left = kMax, top = kMax, right = kMin, bottom = kMin, nextX = -7;
        uint32_t area = 0;
        const bool isTight = random.oneIn(3); // side by side, which leaves no gap
        for (uint32_t i = 0, count = 1 + random.below(4); i < count; ++i) {
            const uint32_t width = 1 + random.below(12),
                           height = isTight ? 6 : 1 + random.below(12);
            const RectPoint at = {isTight ? nextX : random.between(-15, 15),
                                  isTight ? 3 : random.between(-15, 15)};
            collage.add(random, format, width, height, at);
            if (random.oneIn(6))
                collage.images[i].data = nullptr;
            left = std::min(left, at.x);
            top = std::min(top, at.y);
            right = std::max(right, nextX = at.x + static_cast<int32_t>(width));
            bottom = std::max(bottom, at.y + static_cast<int32_t>(height));
            area += width * height;
        }
        Result canvas;
        ASSERT_TRUE(collage.combine(canvas));
        ASSERT_EQ(canvas.width, static_cast<uint32_t>(right - left));
        ASSERT_EQ(canvas.height, static_cast<uint32_t>(bottom - top));
        const bool needsAlpha = area != canvas.width * canvas.height && format.bpp != 32;
        EXPECT_EQ(canvas.bpp, needsAlpha ? 32 : format.bpp);
        EXPECT_EQ(canvas.depth, needsAlpha ? 24 : format.depth);
        EXPECT_EQ(canvas.flags, 0u);
        EXPECT_EQ(canvas.numColors, 0u);
        const uint32_t pixelBytes = canvas.bpp / 8;
        ASSERT_EQ(canvas.bytesPerLine, (canvas.width * pixelBytes + 3) / 4 * 4);

        std::vector<uint8_t> expected(size_t{canvas.bytesPerLine} * canvas.height);
        for (size_t i = 0; i < collage.images.size(); ++i) {
            const ImageInfo &image = collage.images[i];
            const auto atX = static_cast<uint32_t>(collage.positions[i].x - left);
            const auto atY = static_cast<uint32_t>(collage.positions[i].y - top);
            for (uint32_t y = 0; y < image.height && image.data != nullptr; ++y)
                for (uint32_t x = 0; x < image.width; ++x) {
                    const uint8_t *pixel = image.data + y * image.bytesPerLine + x * pixelBytes;
                    const Color opaque = colorAt(image, x, y);
                    std::memcpy(&expected[(atY + y) * canvas.bytesPerLine + (atX + x) * pixelBytes],
                                needsAlpha ? &opaque.blue : pixel, pixelBytes);
                }
        }
        ASSERT_EQ(std::memcmp(canvas.data, expected.data(), expected.size()), 0);
    });
}

TEST(Combine, NeverReadsOrWritesOutside) {
    forEachCase(1000, [](Random &random) {
        const auto coordinate = [&] {
            return random.oneOf({kMin, kMin + 9, -9, 0, 5, kMax - 9, kMax});
        };
        const auto size = [&] {
            return random.oneOf({0u, 1u, 7u, 0x7FFFFFFFu, 0x80000000u, 0xFFFFFFF9u, 0xFFFFFFFFu});
        };
        Collage collage;
        for (uint32_t i = 0, count = 1 + random.below(3); i < count; ++i) {
            const Format format = random.oneOf(kFormats);
            collage.add(random, format, 6, 5, {coordinate(), coordinate()});
            // Widths beyond the rows, and formats that differ: rows bound both.
            collage.images[i].width = size();
            if (random.oneIn(4)) {
                collage.images[i].height = size();
                collage.images[i].data = nullptr;
            }
        }
        Result canvas;
        collage.combine(canvas);
    });
}

TEST(Combine, AtTheLimits) {
    Random random(1);
    Collage collage;
    for (const int32_t x : {0, 5})
        collage.add(random, {24, 32}, 10, 4, {x, 0});
    // Rows of 2^33 - 4 bytes, and of 2^32 + 4.
    for (const auto &[first, second] :
         {std::pair(kMin, kMax - 10), std::pair(0, 0x40000001 - 10)}) {
        collage.positions = {{first, 0}, {second, 0}};
        Result canvas;
        EXPECT_FALSE(collage.combine(canvas));
    }
    Result empty, cut;
    EXPECT_TRUE(empty.made(ImageUtil_Combine(nullptr, nullptr, 0, &empty)));
    const ImageInfo zero = {};
    EXPECT_EQ(std::memcmp(&empty, &zero, sizeof zero), 0);

    // At the end of the coordinates an image is cut off, and so is its painting.
    const ImageInfo &image = collage.images[0];
    const RectPoint end = {kMax - 3, kMax - 2};
    ASSERT_TRUE(cut.made(ImageUtil_Combine(&image, &end, 1, &cut)));
    EXPECT_TRUE(cut.width == 3 && cut.height == 2);
    EXPECT_EQ(std::memcmp(cut.data + 12, image.data + image.bytesPerLine, 12), 0);

    // Strides beyond int32_t, of any of the images.
    collage.positions = {{0, 0}, {10, 0}};
    for (ImageInfo &far : collage.images) {
        const ImageInfo whole = far;
        far.bytesPerLine = 0x80000000;
        far.height = 1;
        Result canvas;
        EXPECT_FALSE(collage.combine(canvas));
        far = whole;
    }

    collage.images[0].depth = 12;
    collage.images[0].bpp = 16;
    collage.positions = {{0, 0}, {19, 0}};
    expectPanic("NOT_IMPLEMENTED lib/raster/rasterConv", [&] {
        Result canvas;
        ImageUtil_Combine(collage.images.data(), collage.positions.data(), 2, &canvas);
    });
}

// The arguments of a crop, all of the image and its own size by default.
struct Request {
    int32_t left = 0, top = 0, right = -1, bottom = -1;
    int32_t dstLeft = 0, dstTop = 0, width = -1, height = -1;

    bool run(const ImageInfo &image, Result &result) const {
        return result.made(ImageUtil_CropAndScaleImage(&image, left, top, right, bottom, dstLeft,
                                                       dstTop, width, height, &result));
    }
};

// A crop comes through the scaler, with factors in the 80-bit format, rounded to
// double.
TEST(CropAndScale, CutsAndScales) {
    forEachCase(600, [](Random &random) {
        const int32_t imageWidth = random.between(2, 41), imageHeight = random.between(2, 41);
        const uint32_t padding = 4 * random.below(3);
        const TestImage image(random, {24, 32}, static_cast<uint32_t>(imageWidth),
                              static_cast<uint32_t>(imageHeight), padding);
        Request request;
        request.right = random.between(1, imageWidth - (padding == 0 ? 0 : 1));
        request.left = random.between(0, request.right - 1);
        request.bottom = random.between(1, imageHeight);
        request.top = random.between(0, request.bottom - 1);
        const int32_t cropWidth = request.right - request.left;
        const int32_t cropHeight = request.bottom - request.top;
        if (request.bottom == imageHeight && random.oneIn(2))
            request.bottom = -1;
        if (request.right == imageWidth && random.oneIn(2))
            request.right = -1;
        // One side follows the other by proportion.
        const int32_t width = request.width = random.oneOf({-1, cropWidth, random.between(1, 90)});
        const int32_t height = request.height =
            random.oneOf({-1, cropHeight, random.between(1, 90)});
        const int32_t endWidth = width != -1    ? width
                                 : height != -1 ? height * cropWidth / cropHeight
                                                : cropWidth;
        const int32_t endHeight = height != -1  ? height
                                  : width != -1 ? cropHeight * width / cropWidth
                                                : cropHeight;
        Result made;
        ASSERT_EQ(request.run(image.info, made), endWidth > 0 && endHeight > 0);
        if (!made.isMade)
            return;
        ASSERT_EQ(made.width, static_cast<uint32_t>(endWidth));
        ASSERT_EQ(made.height, static_cast<uint32_t>(endHeight));
        ASSERT_EQ(made.bytesPerLine, made.width * 4);
        EXPECT_TRUE(made.depth == 24 && made.bpp == 32 && made.flags == 0 && made.numColors == 0);

        std::vector<uint8_t> expected(made.bytesPerLine * made.height);
        const ImageInfo &info = image.info;
        const uint8_t *const first =
            info.data + request.top * static_cast<ptrdiff_t>(info.bytesPerLine) + request.left * 4;
        ASSERT_EQ(Raster_Scale(expected.data(), endWidth * 4, made.width, made.height, 0, 0,
                               endWidth, endHeight, first, static_cast<int32_t>(info.bytesPerLine),
                               static_cast<uint32_t>(cropWidth), static_cast<uint32_t>(cropHeight),
                               static_cast<double>(in80Bits(1.0L * endWidth / cropWidth)),
                               static_cast<double>(in80Bits(1.0L * endHeight / cropHeight)), 2),
                  1u);
        EXPECT_EQ(std::memcmp(made.data, expected.data(), expected.size()), 0);
    });
}

TEST(CropAndScale, Refusals) {
    Random random(6);
    TestImage image(random, {24, 32}, 100, 50);
    const Request kRefused[] = {
        {.top = 5, .bottom = 5},
        {.right = -2},
        {.bottom = 51},
        {.dstLeft = 1},
        {.dstTop = -1},
        {.height = 0},
        {.width = 32768, .height = 10},  // more than the scaler takes
        {.width = -2, .height = -2},     // huge, not missing
        {.width = kMin, .height = kMin}, // 4 times the width is 0 in 32 bits
        {.width = 0x40000000, .height = 4},
        {.width = 1, .height = kMax},
    };
    for (const Request &request : kRefused) {
        Result result;
        EXPECT_FALSE(request.run(image.info, result)) << "number " << &request - kRefused;
    }
    ImageInfo far = image.info; // one row of it
    far.bytesPerLine = 0x80000000;
    Result scaled;
    EXPECT_FALSE((Request{.bottom = 1, .width = 20, .height = 1}).run(far, scaled));
    for (const Request &request : {Request{}, Request{.width = 20}}) {
        ImageInfo empty = image.info, narrow = image.info;
        empty.data = nullptr;
        narrow.bytesPerLine = 300; // 3 bytes a pixel
        Result result;
        EXPECT_FALSE(request.run(empty, result));
        EXPECT_FALSE(request.run(narrow, result));
    }
}

} // namespace
