// BMP files, byte by byte and as pictures, and the writing of image files.

#include "hearth.h"
#include "imageUtil.h"
#include "support/faults.h"
#include "support/messages.h"
#include "support/pngFile.h"
#include "support/testImage.h"

#include <gtest/gtest.h>

#include <cstring>
#include <fstream>
#include <iterator>
#include <string>
#include <unistd.h>

using namespace quillon::test;

namespace {

using Bytes = std::vector<uint8>;

// The file, or nothing when there is none for the image.
Bytes bmpOf(const ImageInfo &image) {
    DynBuf buffer = {};
    if (!ImageUtil_ConstructBMPBuffer(&image, &buffer)) {
        EXPECT_EQ(buffer.data, nullptr);
        return {};
    }
    const Bytes bytes(buffer.data, buffer.data + buffer.size);
    DynBuf_Destroy(&buffer);
    return bytes;
}

uint32 field(const Bytes &file, size_t offset, uint32 bytes) {
    uint32 value = 0;
    for (uint32 i = 0; i < bytes; ++i) {
        value |= uint32{file[offset + i]} << (8 * i);
    }
    return value;
}

TEST(Bmp, KnownFileAt24Bits) {
    uint8 pixels[16] = {1, 2, 3, 4, 5, 6, 0xEE, 0xEE, 7, 8, 9, 10, 11, 12, 0xEE, 0xEE};
    ImageInfo image = {};
    image.width = image.height = 2;
    image.depth = image.bpp = 24;
    image.bytesPerLine = 8;
    image.data = pixels;
    const Bytes expected = {'B', 'M', 70, 0,  0,  0,  0,    0,    0, 0, 54, 0, 0, 0, // file
                            40,  0,   0,  0,  2,  0,  0,    0,    2, 0, 0,  0, 1, 0, // image
                            24,  0,   0,  0,  0,  0,  16,   0,    0, 0, 0,  0, 0, 0,
                            0,   0,   0,  0,  0,  0,  0,    0,    0, 0, 0,  0, //
                            7,   8,   9,  10, 11, 12, 0xEE, 0xEE,              // bottom row
                            1,   2,   3,  4,  5,  6,  0xEE, 0xEE};
    EXPECT_EQ(bmpOf(image), expected);
}

TEST(Bmp, KnownFileAt8Bits) {
    uint8 pixels[8] = {0, 1, 2, 0xEE, 3, 2, 1, 0xDD};
    ImageInfo image = {};
    image.width = 3;
    image.height = 2;
    image.depth = image.bpp = 8;
    image.bytesPerLine = 4;
    image.flags = IMAGEUTIL_FLAG_BOTTOM_UP;
    image.numColors = 4;
    image.palette[3] = {30, 31, 32, 0};
    image.data = pixels;
    const Bytes file = bmpOf(image);
    ASSERT_EQ(file.size(), 78u);
    EXPECT_EQ(field(file, 2, 4), 78u);
    EXPECT_EQ(field(file, 10, 4), 70u);
    EXPECT_EQ(field(file, 28, 2), 8u);
    EXPECT_EQ(field(file, 34, 4), 8u);
    EXPECT_EQ(field(file, 46, 4), 4u);
    EXPECT_EQ(Bytes(file.begin() + 66, file.end()),
              (Bytes{30, 31, 32, 0, 0, 1, 2, 0xEE, 3, 2, 1, 0xDD}));

    image.numColors = 0;
    EXPECT_EQ(field(bmpOf(image), 10, 4), 54u);
    image.numColors = 0xFFFFFFFF; // as many as there are
    EXPECT_EQ(field(bmpOf(image), 46, 4), 256u);
}

TEST(Bmp, EveryFormat) {
    forEachCase(400, [](Random &random) {
        const Format format = kFormats[random.below(std::size(kFormats))];
        const uint32 width = 1 + random.below(40);
        const uint32 height = 1 + random.below(20);
        TestImage image(random, format, width, height, random.below(5)); // odd distances too
        image.info.flags ^= random.below(2);
        const Bytes file = bmpOf(image.info);

        const bool isIndexed = format.bpp == 8;
        const uint32 rowBytes = (width * (isIndexed ? 1 : 3) + 3) / 4 * 4;
        ASSERT_EQ(file.size(), 54 + image.info.numColors * 4 + rowBytes * height);
        EXPECT_EQ(field(file, 18, 4), width);
        EXPECT_EQ(field(file, 22, 4), height);
        EXPECT_EQ(field(file, 28, 2), isIndexed ? 8u : 24u);
        const uint8 *const pixels = file.data() + field(file, 10, 4);
        for (uint32 y = 0; y < height; ++y) {
            const uint8 *const row = pixels + (height - 1 - y) * rowBytes;
            for (uint32 x = 0; x < width; ++x) {
                const uint8 *const p = isIndexed ? &file[54 + 4 * row[x]] : row + x * 3;
                Color expected = pictureColorAt(image.info, x, y);
                expected.alpha = 255;
                ASSERT_EQ((Color{p[0], p[1], p[2], 255}), expected) << x << ", " << y;
            }
            for (uint32 i = width * 3; format.bpp != 24 && !isIndexed && i < rowBytes; ++i) {
                EXPECT_EQ(row[i], 0) << "padding of a converted row";
            }
        }
    });
}

// A record whose rows lie closer than they are long: what there is comes first,
// and nothing behind the block is read.
TEST(Bmp, RowsTooShort) {
    Random random(3);
    for (const Format format : kFormats) {
        TestImage image(random, format, 8, 3);
        image.info.width = 12;
        const Bytes file = bmpOf(image.info);
        const uint32 bytesPerPixel = format.bpp == 8 ? 1 : 3;
        ASSERT_EQ(file.size(), 54 + image.info.numColors * 4 + 36 * bytesPerPixel);
        for (size_t i = 1; i <= 4 * bytesPerPixel; ++i) {
            EXPECT_EQ(file[file.size() - i], 0);
        }
    }
}

TEST(Bmp, WhatHasNoFile) {
    Random random(4);
    const auto expectRefusal = [&](auto change) {
        TestImage image(random, {24, 24}, 4, 4);
        change(image.info);
        EXPECT_TRUE(bmpOf(image.info).empty());
    };
    for (const uint32 bpp : {0u, 1u, 4u, 7u}) {
        expectRefusal([&](ImageInfo &image) { image.bpp = bpp; });
    }
    expectRefusal([](ImageInfo &image) { image.data = nullptr; });
    expectRefusal([](ImageInfo &image) { image.width = 0x55555556; }); // rows of 2^32 + 2 bytes
    expectRefusal([](ImageInfo &image) { image.width = 0xFFFFFFFF; });
    expectRefusal([](ImageInfo &image) { image.height = 0xFFFFFFFF; });
    expectRefusal([](ImageInfo &image) { image.width = image.height = 0x7FFFFFFF; });
    expectRefusal([](ImageInfo &image) { image.width = image.height = 0x10000; });

    DynBuf buffer = {};
    EXPECT_FALSE(ImageUtil_ConstructBMPBuffer(nullptr, &buffer));
    const TestImage image(random, {24, 24}, 4, 4);
    EXPECT_FALSE(ImageUtil_ConstructBMPBuffer(&image.info, nullptr));
}

TEST(Bmp, MemoryFaults) {
    Random random(5);
    for (const Requests requests : {Requests::kAll, Requests::kHearth}) {
        const TestImage image(random, {8, 8}, 20, 20);
        bool failed = true;
        for (uint64_t n = 0; failed; ++n) {
            DynBuf buffer = {};
            const MemoryFault fault(n, requests);
            const bool isWritten = ImageUtil_ConstructBMPBuffer(&image.info, &buffer);
            failed = fault.happened();
            EXPECT_EQ(isWritten, !failed) << n;
            EXPECT_EQ(buffer.data != nullptr, isWritten);
            DynBuf_Destroy(&buffer);
            EXPECT_EQ(fault.blocksHeld(), 0);
            EXPECT_TRUE(failed || requests == Requests::kAll || n == 4)
                << "headers, palette, pixels";
        }
    }
}

class ImageFile : public testing::Test {
protected:
    ~ImageFile() override {
        setFileFault(FileFault::kNone);
        std::remove(path_.c_str());
    }

    Bytes content() const {
        std::ifstream file(path_, std::ios::binary);
        return Bytes(std::istreambuf_iterator<char>(file), {});
    }
    bool exists() const { return access(path_.c_str(), F_OK) == 0; }

    const std::string path_ = testing::TempDir() + "quillonWrite" + std::to_string(getpid());
    Random random_{6};
    TestImage image_{random_, {24, 32}, 9, 5};
};

TEST_F(ImageFile, IsWrittenOver) {
    std::ofstream(path_) << std::string(100000, 'x');
    ASSERT_TRUE(ImageUtil_WriteImage(&image_.info, path_.c_str(), IMAGEUTIL_FORMAT_BMP));
    EXPECT_EQ(content(), bmpOf(image_.info));

    ASSERT_TRUE(ImageUtil_WriteImage(&image_.info, path_.c_str(), IMAGEUTIL_FORMAT_PNG));
    Bytes png = content();
    EXPECT_EQ(decodePng(png.data(), png.size()).colorType, PNG_COLOR_TYPE_RGB);

    const ImageUtilPngOptions options = {.compressionLevel = 0, .stripAlpha = false};
    ASSERT_TRUE(ImageUtil_WritePNG(&image_.info, path_.c_str(), &options));
    png = content();
    EXPECT_EQ(decodePng(png.data(), png.size()).colorType, PNG_COLOR_TYPE_RGB_ALPHA);
    EXPECT_EQ(filesOpen(), 0);
}

TEST_F(ImageFile, UnknownFormatIsAPanicAheadOfAll) {
    for (const uint32 format : {2u, 0xFFFFFFFFu}) {
        const std::string message =
            expectPanic([&] { ImageUtil_WriteImage(nullptr, path_.c_str(), format); });
        panicLine(message, "NOT_IMPLEMENTED lib/image/imageUtil");
        EXPECT_FALSE(exists());
    }
}

TEST_F(ImageFile, NoImageMakesNoFile) {
    clearMessages();
    EXPECT_FALSE(ImageUtil_WriteImage(nullptr, path_.c_str(), IMAGEUTIL_FORMAT_PNG));
    EXPECT_FALSE(ImageUtil_WriteImage(nullptr, path_.c_str(), IMAGEUTIL_FORMAT_BMP));
    EXPECT_FALSE(ImageUtil_WritePNG(nullptr, path_.c_str(), nullptr));
    EXPECT_FALSE(exists());
    EXPECT_TRUE(logs().empty());
}

TEST_F(ImageFile, FailuresAreLogged) {
    clearMessages();
    EXPECT_FALSE(ImageUtil_WritePNG(&image_.info, "/nowhere/at.all", nullptr));
    setFileFault(FileFault::kWriteFails);
    EXPECT_FALSE(ImageUtil_WriteImage(&image_.info, path_.c_str(), IMAGEUTIL_FORMAT_PNG));
    setFileFault(FileFault::kWriteShort);
    EXPECT_FALSE(ImageUtil_WriteImage(&image_.info, path_.c_str(), IMAGEUTIL_FORMAT_BMP));
    EXPECT_EQ(filesOpen(), 0);
    EXPECT_EQ(content().size() + 1, bmpOf(image_.info).size()); // it is not removed
    const std::vector<std::string> expected = {
        "ImageUtilWriteBuf: Failed open file '/nowhere/at.all': No such file or directory (2)\n",
        "ImageUtilWriteBuf: Failed to write file '" + path_ + "': No space left on device (28)\n",
        "ImageUtilWriteBuf: Wrong number of image bytes written to '" + path_ + "': Success (0)\n"};
    EXPECT_EQ(logs(), expected);
}

} // namespace
