// BMP files, byte by byte and as pictures, and the writing of image files.

#include "hearth.h"
#include "imageUtil.h"
#include "support/faults.h"
#include "support/messages.h"
#include "support/testImage.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <fstream>
#include <iterator>
#include <string>
#include <unistd.h>

using namespace quillon::test;

namespace {

using Bytes = std::vector<uint8>;

bool writesShort = false;

// The lowest file descriptor that is free tells whether one has been left open.
int freeDescriptor() {
    const int descriptor = dup(STDIN_FILENO);
    close(descriptor);
    return descriptor;
}

// The file, or nothing when there is none for the image.
Bytes bmpOf(const ImageInfo *image) {
    DynBuf buffer = {};
    const bool isWritten = ImageUtil_ConstructBMPBuffer(image, &buffer);
    EXPECT_EQ(buffer.data != nullptr, isWritten);
    const Bytes bytes(buffer.data, buffer.data + buffer.size);
    DynBuf_Destroy(&buffer);
    return bytes;
}

} // namespace

// In the place of libhearth's.
int FileIO_Write(FileIODescriptor *file, const void *source, size_t count, size_t *actual) {
    const ssize_t written = write(file->fd, source, count - (writesShort ? 1 : 0));
    *actual = static_cast<size_t>(std::max<ssize_t>(written, 0));
    return written < 0 ? errno : 0;
}

namespace {

TEST(Bmp, EveryFormat) {
    forEachCase(600, [](Random &random) {
        const Format format = kFormats[random.below(std::size(kFormats))];
        const uint32 inRow = 1 + random.below(40), height = 1 + random.below(20);
        const TestImage image(random, format, inRow, height, random.below(5)); // odd distances too
        ImageInfo info = image.info;
        // Of rows that lie closer than they are long, what there is comes first.
        const uint32 width = info.width = inRow + (random.oneIn(4) ? 4 + random.below(9) : 0);
        const bool isIndexed = format.bpp == 8;
        const uint32 numColors = info.numColors =
            isIndexed ? random.oneOf({256u, 257u, 0xFFFFFFFFu}) : 0;
        const Bytes file = bmpOf(&info);

        const uint32 offset = 54 + std::min(numColors, 256u) * 4;
        const uint32 rowBytes = (width * (isIndexed ? 1 : 3) + 3) / 4 * 4;
        ASSERT_EQ(file.size(), offset + rowBytes * height);
        const uint32 imageBytes = rowBytes * height;
        const uint32 planesAndBits = isIndexed ? 8u << 16 | 1 : 24u << 16 | 1;
        const uint32 sizes[] = {offset + imageBytes, 0, offset, 40, width, height, planesAndBits};
        const uint32 rest[] = {0, imageBytes, 0, 0, std::min(numColors, 256u), 0};
        EXPECT_EQ(Bytes(&file[0], &file[2]), (Bytes{'B', 'M'}));
        EXPECT_EQ(std::memcmp(&file[2], sizes, sizeof sizes), 0);
        EXPECT_EQ(std::memcmp(&file[30], rest, sizeof rest), 0);
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
            for (uint32 i = isCopied ? info.bytesPerLine : converted * 3; i < rowBytes; ++i)
                EXPECT_EQ(row[i], 0);
        }
    });
}

TEST(Bmp, WhatHasNoFile) {
    Random random(4);
    TestImage image(random, {24, 24}, 4, 4);
    const uint32 kSizes[][3] = {{0x55555556, 4, 24}, // rows of 2^32 + 2 bytes
                                {0xFFFFFFFF, 4, 24},
                                {4, 0xFFFFFFFF, 24},
                                {0x7FFFFFFF, 0x7FFFFFFF, 24},
                                {0x10000, 0x10000, 24},
                                {4, 4, 7}};
    for (const auto &[width, height, bpp] : kSizes) {
        ImageInfo info = image.info;
        info.width = width, info.height = height, info.bpp = bpp;
        EXPECT_TRUE(bmpOf(&info).empty()) << width << " x " << height;
    }
    // The exception must find nothing held; the leak sanitizer would tell.
    image.info.depth = 12;
    image.info.bpp = 16;
    expectPanic("NOT_IMPLEMENTED lib/raster/rasterConv", [&] { bmpOf(&image.info); });
    image.info.data = nullptr;
    EXPECT_TRUE(bmpOf(&image.info).empty());
}

TEST(Bmp, MemoryFaults) {
    Random random(5);
    const TestImage image(random, {8, 8}, 20, 20);
    forEachMemoryFault([&] {
        DynBuf buffer = {};
        const bool isWritten = ImageUtil_ConstructBMPBuffer(&image.info, &buffer);
        EXPECT_EQ(buffer.data != nullptr, isWritten);
        DynBuf_Destroy(&buffer);
        return isWritten;
    });
}

TEST(ImageFile, IsWrittenOverOrTheFailureLogged) {
    const std::string path = testing::TempDir() + "quillonWrite" + std::to_string(getpid());
    const auto content = [&] {
        std::ifstream file(path, std::ios::binary);
        return Bytes(std::istreambuf_iterator<char>(file), {});
    };
    Random random(6);
    const TestImage image(random, {24, 32}, 9, 5);
    const auto write = [&](uint32 format, const std::string &name) {
        return ImageUtil_WriteImage(&image.info, name.c_str(), format);
    };
    expectPanic("NOT_IMPLEMENTED lib/image/imageUtil", [&] { write(2, path); });
    EXPECT_FALSE(ImageUtil_WritePNG(nullptr, path.c_str(), nullptr));
    EXPECT_NE(access(path.c_str(), F_OK), 0);
    const int descriptor = freeDescriptor();

    std::ofstream(path) << std::string(100000, 'x');
    ASSERT_TRUE(write(IMAGEUTIL_FORMAT_BMP, path));
    EXPECT_EQ(content(), bmpOf(&image.info));
    ASSERT_TRUE(write(IMAGEUTIL_FORMAT_PNG, path));
    EXPECT_EQ(content().at(25), 2); // no alpha by default
    const ImageUtilPngOptions options = {.compressionLevel = 0, .stripAlpha = false};
    ASSERT_TRUE(ImageUtil_WritePNG(&image.info, path.c_str(), &options));
    EXPECT_EQ(content().at(25), 6);
    EXPECT_TRUE(logs.empty());

    EXPECT_FALSE(write(IMAGEUTIL_FORMAT_PNG, "/nowhere/at.all"));
    EXPECT_FALSE(write(IMAGEUTIL_FORMAT_PNG, "/dev/full"));
    writesShort = true;
    EXPECT_FALSE(write(IMAGEUTIL_FORMAT_BMP, path));
    EXPECT_EQ(freeDescriptor(), descriptor);
    EXPECT_EQ(content().size() + 1, bmpOf(&image.info).size()); // it is not removed
    const std::vector<std::string> expected = {
        "ImageUtilWriteBuf: Failed open file '/nowhere/at.all': No such file or directory (2)\n",
        "ImageUtilWriteBuf: Failed to write file '/dev/full': No space left on device (28)\n",
        "ImageUtilWriteBuf: Wrong number of image bytes written to '" + path + "': Success (0)\n"};
    EXPECT_EQ(logs, expected);
    std::remove(path.c_str());
}

} // namespace
