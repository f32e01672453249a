// Images of every format into BMP and PNG streams and files.

#include "support/messages.h"
#include "support/testImage.h"
#include <hearth/hearth.h>
#include <quillon/imageUtil.h>

#include <algorithm>
#include <cerrno>
#include <csetjmp>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <iterator>
#include <png.h>
#include <string>
#include <unistd.h>

using namespace quillon::test;

namespace {

using Bytes = std::vector<uint8_t>;

bool encode(const ImageInfo &image, uint32_t format, DynBuf *buffer,
            const ImageUtilPngOptions *options = nullptr) {
    return format == IMAGEUTIL_FORMAT_PNG ? ImageUtil_ConstructPNGBuffer(&image, options, buffer)
                                          : ImageUtil_ConstructBMPBuffer(&image, buffer);
}

// Empty where it failed.
Bytes fileOf(const ImageInfo &image, uint32_t format,
             const ImageUtilPngOptions *options = nullptr) {
    DynBuf buffer = {};
    const bool isWritten = encode(image, format, &buffer, options);
    EXPECT_EQ(buffer.data != nullptr, isWritten);
    const Bytes bytes(buffer.data, buffer.data + buffer.size);
    DynBuf_Destroy(&buffer);
    return bytes;
}

TEST(ImageWrite, BmpOfEveryFormat) {
    forEachCase(600, [](Random &random) {
        const Format format = random.oneOf(kFormats);
        const uint32_t inRow = 1 + random.below(40), height = 1 + random.below(20);
        const TestImage image(random, format, inRow, height, random.below(5)); // odd distances too
        ImageInfo info = image.info;
        // Of rows that lie closer than they are long, what there is comes first.
        info.width = inRow + (random.oneIn(4) ? 4 + random.below(9) : 0);
        const bool isIndexed = format.bpp == 8;
        info.numColors = isIndexed ? random.oneOf({256u, 257u, 0xFFFFFFFFu}) : 0;
        Bytes file = fileOf(info, IMAGEUTIL_FORMAT_BMP);

        const uint32_t bits = isIndexed ? 8 : 24, colors = isIndexed ? 256 : 0;
        const uint32_t offset = 54 + colors * 4, rowBytes = (info.width * bits / 8 + 3) / 4 * 4;
        const uint32_t imageBytes = rowBytes * height;
        const uint32_t sizes[] = {offset + imageBytes, 0,      offset,        40,
                                  info.width,          height, bits << 16 | 1};
        const uint32_t rest[] = {0, imageBytes, 0, 0, colors, 0};
        ASSERT_EQ(file.size(), offset + imageBytes);
        EXPECT_TRUE(file[0] == 'B' && file[1] == 'M');
        EXPECT_EQ(std::memcmp(&file[2], sizes, sizeof sizes), 0);
        EXPECT_EQ(std::memcmp(&file[30], rest, sizeof rest), 0);
        ImageInfo read = {};
        read.width = inRow, read.height = height, read.bpp = bits, read.bytesPerLine = rowBytes;
        read.data = &file[offset];
        std::memcpy(read.palette, &file[54], colors * sizeof read.palette[0]);
        expectColors(read, true,
                     [&](uint32_t x, uint32_t y) { return pictureColorAt(info, x, y); });
        // Behind them: padding of the image where rows are copied, then zeros.
        const uint32_t converted = std::min(info.width, info.bytesPerLine / (format.bpp / 8)) * 3;
        const uint32_t end = format.bpp == bits ? info.bytesPerLine : converted;
        for (uint32_t i = 0; i < imageBytes; ++i)
            EXPECT_TRUE(i % rowBytes < end || read.data[i] == 0);
    });
}

TEST(ImageWrite, PngOfEveryFormat) {
    forEachCase(400, [](Random &random) {
        const Format format = random.oneOf(kFormats);
        TestImage image(random, format, 1 + random.below(40), 1 + random.below(20),
                        random.below(4));
        ImageInfo &info = image.info;
        if (format.bpp == 8 && random.oneIn(4)) {
            std::memset(info.data, 0, image.pixels.size());
            info.numColors = random.oneOf({1u, 16u, 257u, 0xFFFFFFFFu});
        }
        const int32_t level = random.between(-2, 12);
        const ImageUtilPngOptions options = {level, random.oneIn(2)};
        const bool isDefault = random.oneIn(3);
        const Bytes file = fileOf(info, IMAGEUTIL_FORMAT_PNG, isDefault ? nullptr : &options);
        const bool hasAlpha = format.bpp == 32 && !isDefault && !options.stripAlpha;
        const int colorType = format.bpp == 8 ? PNG_COLOR_TYPE_PALETTE
                              : hasAlpha      ? PNG_COLOR_TYPE_RGB_ALPHA
                                              : PNG_COLOR_TYPE_RGB;
        ASSERT_GT(file.size(), 40u);
        EXPECT_EQ(Bytes(&file[24], &file[29]),
                  (Bytes{8, static_cast<uint8_t>(colorType), 0, 0, 0}));
        info.bytesPerLine -= format.bpp == 16 ? info.bytesPerLine % 2 : 0; // counts as even
        ImageInfo read;
        ASSERT_TRUE(ImageUtil_ReadPNGBuffer(&read, file.data(), static_cast<uint32_t>(file.size()),
                                            IMAGEUTIL_READ_KEEP_ALPHA));
        ASSERT_TRUE(read.width == info.width && read.height == info.height);
        ASSERT_EQ(read.numColors, std::min(info.numColors, 256u));
        expectColors(read, false,
                     [&](uint32_t x, uint32_t y) { return pictureColorAt(info, x, y); });
        ImageUtil_FreeImageData(&read);

        // Bits 6 and 7 of the second byte of a zlib stream tell the effort made.
        const char kChunk[] = {'I', 'D', 'A', 'T'};
        const int effort = std::search(file.begin(), file.end(), kChunk, kChunk + 4)[5] >> 6;
        const bool isLevel = !isDefault && level >= 0 && level <= 9 && level != 6;
        const bool isSlow = isLevel && level > 6, isFast = isLevel && level < 2;
        EXPECT_TRUE(effort == (isSlow ? 3 : isFast ? 0 : 2) || (isLevel && level < 6 && !isFast));
    });
}

TEST(ImageWrite, WhatCannotBeWritten) {
    Random random(4);
    TestImage image(random, {24, 24}, 4, 4);
    image.info.data[0] = 3;
    const auto isRefused = [&](uint32_t format, uint32_t width, uint32_t height,
                               uint32_t depth = 24, uint32_t bpp = 24, uint32_t bytesPerLine = 12,
                               uint32_t numColors = 0) {
        ImageInfo info = image.info;
        info.width = width, info.height = height, info.depth = depth, info.bpp = bpp;
        info.bytesPerLine = bytesPerLine, info.numColors = numColors;
        return fileOf(info, format).empty();
    };
    constexpr uint32_t kBmp = IMAGEUTIL_FORMAT_BMP, kPng = IMAGEUTIL_FORMAT_PNG;
    EXPECT_TRUE(isRefused(kBmp, 0x55555556, 4)); // rows of 2^32 + 2 bytes
    EXPECT_TRUE(isRefused(kBmp, 0x7FFFFFFF, 0x7FFFFFFF));
    EXPECT_TRUE(isRefused(kBmp, 0x10000, 0x10000));
    EXPECT_TRUE(isRefused(kBmp, 4, 4, 7, 7));
    EXPECT_TRUE(isRefused(kPng, 0, 4));
    EXPECT_TRUE(isRefused(kPng, 4, 0xFFFFFFFF));
    EXPECT_TRUE(isRefused(kPng, 4, 4, 24, 24, 11)); // shorter than its pixels
    EXPECT_TRUE(isRefused(kPng, 4, 4, 32, 16));
    EXPECT_TRUE(isRefused(kPng, 4, 4, 8, 8));        // without colours
    EXPECT_TRUE(isRefused(kPng, 4, 4, 8, 8, 12, 3)); // found out when pixels are written already
    for (const uint32_t format : {kPng, kBmp}) {
        // The exception must find nothing held; the leak sanitizer would tell.
        expectPanic("NOT_IMPLEMENTED lib/raster/rasterConv",
                    [&] { isRefused(format, 4, 4, 12, 16); });
        ImageInfo info = image.info;
        info.data = nullptr;
        EXPECT_TRUE(fileOf(info, format).empty());
        DynBuf buffer = {};
        EXPECT_FALSE(format == kPng ? ImageUtil_ConstructPNGBuffer(nullptr, nullptr, &buffer)
                                    : ImageUtil_ConstructBMPBuffer(nullptr, &buffer));
        EXPECT_FALSE(encode(image.info, format, nullptr));
    }
}

// Found by fuzzing: rows of no bytes were copied from null.
TEST(ImageWrite, BmpWithoutColumnsOrPixels) {
    ImageInfo image = {};
    image.height = 13;
    image.depth = image.bpp = 24;
    EXPECT_EQ(fileOf(image, IMAGEUTIL_FORMAT_BMP).size(), 54u);
}

// The block stays for the caller to release; what is in it is given up.
TEST(ImageWrite, PngStreamBeyond4GiB) {
    png_structp png = png_create_write_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr);
    const ImageUtilMemOps noMemory = {};
    uint8_t block[4] = {};
    for (const size_t length : {size_t{16}, ~size_t{0}}) {
        ImageUtilPngBuffer buffer = {block, 0xFFFFFFF8u, 0xFFFFFFF8u, &noMemory};
        png_set_write_fn(png, &buffer, ImageUtilBufferWriteCallback, nullptr);
        if (setjmp(png_jmpbuf(png)) == 0) {
            ImageUtilBufferWriteCallback(png, block, length);
            ADD_FAILURE() << "no error";
        }
        EXPECT_TRUE(buffer.data == block && buffer.size == 0 && buffer.capacity == 0);
    }
    png_destroy_write_struct(&png, nullptr);
}

TEST(ImageWrite, FilesOrALoggedFailure) {
    const std::string path = testing::TempDir() + "quillonWrite" + std::to_string(getpid());
    const auto content = [&] {
        std::ifstream file(path, std::ios::binary);
        return Bytes(std::istreambuf_iterator<char>(file), {});
    };
    Random random(6);
    const TestImage image(random, {24, 32}, 9, 5);
    const auto write = [&](uint32_t format, const std::string &name) {
        return ImageUtil_WriteImage(&image.info, name.c_str(), format);
    };
    expectPanic("NOT_IMPLEMENTED lib/image/imageUtil", [&] { write(2, path); });
    EXPECT_FALSE(ImageUtil_WritePNG(nullptr, path.c_str(), nullptr));
    EXPECT_NE(access(path.c_str(), F_OK), 0);

    std::ofstream(path) << std::string(100000, 'x');
    ASSERT_TRUE(write(IMAGEUTIL_FORMAT_BMP, path));
    EXPECT_EQ(content(), fileOf(image.info, IMAGEUTIL_FORMAT_BMP));
    ASSERT_TRUE(write(IMAGEUTIL_FORMAT_PNG, path));
    EXPECT_EQ(content().at(25), 2); // no alpha by default
    const ImageUtilPngOptions options = {.compressionLevel = 0, .stripAlpha = false};
    ASSERT_TRUE(ImageUtil_WritePNG(&image.info, path.c_str(), &options));
    EXPECT_EQ(content().at(25), 6);
    EXPECT_TRUE(logs.empty());

    EXPECT_FALSE(write(IMAGEUTIL_FORMAT_PNG, "/nowhere/at.all"));
    EXPECT_FALSE(write(IMAGEUTIL_FORMAT_PNG, "/dev/full"));
    const std::vector<std::string> expected = {
        "ImageUtilWriteBuf: Failed open file '/nowhere/at.all': No such file or directory (2)\n",
        "ImageUtilWriteBuf: Failed to write file '/dev/full': No space left on device (28)\n"};
    EXPECT_EQ(logs, expected);
    std::remove(path.c_str());
}

} // namespace
