// BMP files, byte by byte and as pictures, and the writing of image files.

#include "hearth.h"
#include "imageUtil.h"
#include "support/faults.h"
#include "support/messages.h"
#include "support/pngFile.h"
#include "support/testImage.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <fstream>
#include <iterator>
#include <string>
#include <unistd.h>

using namespace quillon::test;

namespace {

using Bytes = std::vector<uint8>;

// The file, or nothing when there is none for the image.
Bytes bmpOf(const ImageInfo *image) {
    DynBuf buffer = {};
    const bool isWritten = ImageUtil_ConstructBMPBuffer(image, &buffer);
    EXPECT_EQ(buffer.data != nullptr, isWritten);
    const Bytes bytes(buffer.data, buffer.data + buffer.size);
    DynBuf_Destroy(&buffer);
    return bytes;
}

TEST(Bmp, KnownFile) {
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
    EXPECT_EQ(bmpOf(&image), expected);
}

TEST(Bmp, EveryFormat) {
    forEachCase(600, [](Random &random) {
        const Format format = kFormats[random.below(std::size(kFormats))];
        const uint32 inRow = 1 + random.below(40), height = 1 + random.below(20);
        const TestImage image(random, format, inRow, height, random.below(5)); // odd distances too
        // Of rows that lie closer than they are long, what there is comes first.
        const uint32 width = inRow + (random.oneIn(4) ? 4 + random.below(9) : 0);
        ImageInfo info = image.info;
        info.width = width;
        const bool isIndexed = format.bpp == 8;
        const uint32 numColors = isIndexed ? random.oneOf({256u, 256u, 257u, 0xFFFFFFFFu}) : 0;
        info.numColors = numColors;
        const Bytes file = bmpOf(&info);

        const uint32 offset = 54 + std::min(numColors, 256u) * 4;
        const uint32 rowBytes = (width * (isIndexed ? 1 : 3) + 3) / 4 * 4;
        ASSERT_EQ(file.size(), offset + rowBytes * height);
        const auto field = [&](size_t at) {
            return file[at] | file[at + 1] << 8 | file[at + 2] << 16 | file[at + 3] << 24;
        };
        const std::pair<size_t, size_t> kFields[] = {{2, file.size()},
                                                     {10, offset},
                                                     {18, width},
                                                     {22, height},
                                                     {28, isIndexed ? 8 : 24},
                                                     {34, rowBytes * height},
                                                     {46, std::min(numColors, 256u)}};
        for (const auto &[at, value] : kFields) {
            EXPECT_EQ(field(at), static_cast<int>(value)) << "field " << at;
        }
        for (uint32 y = 0; y < height; ++y) {
            const uint8 *const row = &file[offset + (height - 1 - y) * rowBytes];
            for (uint32 x = 0; x < inRow; ++x) {
                const uint8 *const p = isIndexed ? &file[54 + 4 * row[x]] : row + x * 3;
                const Color expected = pictureColorAt(info, x, y);
                ASSERT_EQ((Color{p[0], p[1], p[2], expected.alpha}), expected) << x << ", " << y;
            }
            // Behind them: padding of the image where rows are copied, then zeros.
            const bool isCopied = isIndexed || format.bpp == 24;
            const uint32 converted = std::min(width, info.bytesPerLine / (format.bpp / 8));
            uint32 i = isCopied ? info.bytesPerLine : converted * 3;
            for (; i < rowBytes; ++i) {
                EXPECT_EQ(row[i], 0);
            }
        }
    });
}

TEST(Bmp, WhatHasNoFile) {
    Random random(4);
    const TestImage image(random, {24, 24}, 4, 4);
    const auto expectRefusal = [&](auto change) {
        ImageInfo changed = image.info;
        change(changed);
        EXPECT_TRUE(bmpOf(&changed).empty());
    };
    for (const uint32 bpp : {0u, 1u, 7u}) {
        expectRefusal([&](ImageInfo &info) { info.bpp = bpp; });
    }
    const uint32 kSizes[][2] = {{0x55555556, 4}, // rows of 2^32 + 2 bytes
                                {0xFFFFFFFF, 4},
                                {4, 0xFFFFFFFF},
                                {0x7FFFFFFF, 0x7FFFFFFF},
                                {0x10000, 0x10000}};
    for (const auto &[width, height] : kSizes) {
        expectRefusal(
            [w = width, h = height](ImageInfo &info) { info.width = w, info.height = h; });
    }
    expectRefusal([](ImageInfo &info) { info.data = nullptr; });
    EXPECT_TRUE(bmpOf(nullptr).empty());
    EXPECT_FALSE(ImageUtil_ConstructBMPBuffer(&image.info, nullptr));

    // The exception must find nothing held; the leak sanitizer would tell.
    const TestImage unknown(random, {12, 16}, 4, 4);
    panicLine(expectPanic([&] { bmpOf(&unknown.info); }), "NOT_IMPLEMENTED lib/raster/rasterConv");
}

TEST(Bmp, MemoryFaults) {
    Random random(5);
    const TestImage image(random, {8, 8}, 20, 20);
    DynBuf buffer = {};
    bool isWritten = false;
    forEachMemoryFault(
        [&] {
            isWritten = ImageUtil_ConstructBMPBuffer(&image.info, &buffer);
            EXPECT_EQ(buffer.data != nullptr, isWritten);
            DynBuf_Destroy(&buffer);
        },
        [&](bool failed) { EXPECT_EQ(isWritten, !failed); });
}

TEST(ImageFile, IsWrittenOverOrTheFailureLogged) {
    const std::string path = testing::TempDir() + "quillonWrite" + std::to_string(getpid());
    const auto content = [&] {
        std::ifstream file(path, std::ios::binary);
        return Bytes(std::istreambuf_iterator<char>(file), {});
    };
    const auto colorType = [&] {
        const Bytes png = content();
        return decodePng(png.data(), png.size()).colorType;
    };
    Random random(6);
    const TestImage image(random, {24, 32}, 9, 5);
    clearMessages();
    for (const uint32 format : {2u, 0xFFFFFFFFu}) {
        const std::string message =
            expectPanic([&] { ImageUtil_WriteImage(nullptr, path.c_str(), format); });
        panicLine(message, "NOT_IMPLEMENTED lib/image/imageUtil");
    }
    EXPECT_FALSE(ImageUtil_WriteImage(nullptr, path.c_str(), IMAGEUTIL_FORMAT_PNG));
    EXPECT_FALSE(ImageUtil_WriteImage(nullptr, path.c_str(), IMAGEUTIL_FORMAT_BMP));
    EXPECT_FALSE(ImageUtil_WritePNG(nullptr, path.c_str(), nullptr));
    EXPECT_NE(access(path.c_str(), F_OK), 0);

    std::ofstream(path) << std::string(100000, 'x');
    ASSERT_TRUE(ImageUtil_WriteImage(&image.info, path.c_str(), IMAGEUTIL_FORMAT_BMP));
    EXPECT_EQ(content(), bmpOf(&image.info));
    ASSERT_TRUE(ImageUtil_WriteImage(&image.info, path.c_str(), IMAGEUTIL_FORMAT_PNG));
    EXPECT_EQ(colorType(), PNG_COLOR_TYPE_RGB);
    const ImageUtilPngOptions options = {.compressionLevel = 0, .stripAlpha = false};
    ASSERT_TRUE(ImageUtil_WritePNG(&image.info, path.c_str(), &options));
    EXPECT_EQ(colorType(), PNG_COLOR_TYPE_RGB_ALPHA);
    EXPECT_TRUE(logs().empty());

    EXPECT_FALSE(ImageUtil_WritePNG(&image.info, "/nowhere/at.all", nullptr));
    fileFault = FileFault::kWriteFails;
    EXPECT_FALSE(ImageUtil_WriteImage(&image.info, path.c_str(), IMAGEUTIL_FORMAT_PNG));
    fileFault = FileFault::kWriteShort;
    EXPECT_FALSE(ImageUtil_WriteImage(&image.info, path.c_str(), IMAGEUTIL_FORMAT_BMP));
    fileFault = FileFault::kNone;
    EXPECT_EQ(filesOpen, 0);
    EXPECT_EQ(content().size() + 1, bmpOf(&image.info).size()); // it is not removed
    const std::vector<std::string> expected = {
        "ImageUtilWriteBuf: Failed open file '/nowhere/at.all': No such file or directory (2)\n",
        "ImageUtilWriteBuf: Failed to write file '" + path + "': No space left on device (28)\n",
        "ImageUtilWriteBuf: Wrong number of image bytes written to '" + path + "': Success (0)\n"};
    EXPECT_EQ(logs(), expected);
    std::remove(path.c_str());
}

} // namespace
