// PNG files of every kind, whole and broken, into image records, and images of
// every format into PNG streams, which libpng alone reads back.

#include "hearth.h"
#include "imageUtil.h"
#include "support/faults.h"
#include "support/messages.h"
#include "support/pngFile.h"
#include "support/testImage.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <csetjmp>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <map>
#include <memory>
#include <string>

using namespace quillon::test;

namespace {

using Bytes = std::vector<uint8>;

// A record as a test begins with it, to be overwritten or not.
ImageInfo recordOf(uint8 byte) {
    ImageInfo image;
    std::memset(&image, byte, sizeof image);
    return image;
}
constexpr uint8 kUntouched = 0x5A;

bool isRecordOf(const ImageInfo &image, uint8 byte) {
    const Bytes expected(sizeof image, byte);
    return std::memcmp(&image, expected.data(), sizeof image) == 0;
}

// Where the compressed pixels begin.
size_t pixelStream(const Bytes &file) {
    const char kChunk[] = {'I', 'D', 'A', 'T'};
    const auto found = std::search(file.begin(), file.end(), kChunk, kChunk + 4);
    return static_cast<size_t>(found - file.begin()) + 4;
}

// --- Reading

// Reads from a block of exactly the file's size, so that a sanitizer sees any
// byte read behind it.
bool readBuffer(ImageInfo *image, const Bytes &file, uint32 flags) {
    *image = recordOf(kUntouched);
    const std::unique_ptr<uint8[]> exact(new uint8[file.size()]);
    std::copy(file.begin(), file.end(), exact.get());
    return ImageUtil_ReadPNGBuffer(image, exact.get(), static_cast<uint32>(file.size()), flags);
}

// The bytes of a pixel as the record has to hold them.
Bytes expectedPixel(const PngPicture &picture, const uint16 *samples, uint32 flags) {
    // To the nearest, as v / 65535 = r / 255 has it.
    const auto at8Bits = [&](uint16 sample) {
        return static_cast<uint8>(picture.bitDepth == 16 ? (sample + 128) / 257 : sample);
    };
    if (picture.colorType == PNG_COLOR_TYPE_PALETTE) {
        return {at8Bits(samples[0])};
    }
    Bytes bytes = {at8Bits(samples[2]), at8Bits(samples[1]), at8Bits(samples[0])};
    if (picture.colorType == PNG_COLOR_TYPE_RGB && (flags & IMAGEUTIL_READ_ADD_ALPHA) != 0) {
        bytes.push_back(255);
    }
    if (picture.colorType == PNG_COLOR_TYPE_RGB_ALPHA && (flags & IMAGEUTIL_READ_KEEP_ALPHA) != 0) {
        bytes.push_back(at8Bits(samples[3]));
    }
    return bytes;
}

void expectRecord(const ImageInfo &image, const PngPicture &picture, uint32 flags) {
    const auto pixelBytes =
        static_cast<uint32>(expectedPixel(picture, picture.pixel(0, 0), flags).size());
    EXPECT_EQ(image.width, picture.width);
    EXPECT_EQ(image.height, picture.height);
    EXPECT_EQ(image.depth, pixelBytes == 1 ? 8u : 24u);
    EXPECT_EQ(image.bpp, pixelBytes * 8);
    EXPECT_EQ(image.flags, 0u);
    ASSERT_EQ(image.bytesPerLine, (picture.width * pixelBytes + 3) / 4 * 4);
    ASSERT_EQ(image.numColors, pixelBytes == 1 ? picture.palette.size() : 0);
    for (uint32 i = 0; i < image.numColors; ++i) {
        const png_color &color = picture.palette[i];
        const uint8 expected[4] = {color.blue, color.green, color.red, 0};
        EXPECT_EQ(std::memcmp(&image.palette[i], expected, 4), 0);
    }
    for (uint32 y = 0; y < picture.height; ++y) {
        Bytes expected;
        for (uint32 x = 0; x < picture.width; ++x) {
            const Bytes pixel = expectedPixel(picture, picture.pixel(x, y), flags);
            expected.insert(expected.end(), pixel.begin(), pixel.end());
        }
        expected.resize(image.bytesPerLine, kStale); // padding is left alone
        const bool isReversed = (flags & IMAGEUTIL_READ_BOTTOM_UP) != 0;
        const uint8 *const row =
            image.data + size_t{isReversed ? picture.height - 1 - y : y} * image.bytesPerLine;
        ASSERT_EQ(Bytes(row, row + image.bytesPerLine), expected) << "row " << y;
    }
}

constexpr int kReadable[][2] = {{PNG_COLOR_TYPE_RGB, 8},       {PNG_COLOR_TYPE_RGB, 16},
                                {PNG_COLOR_TYPE_RGB_ALPHA, 8}, {PNG_COLOR_TYPE_RGB_ALPHA, 16},
                                {PNG_COLOR_TYPE_PALETTE, 1},   {PNG_COLOR_TYPE_PALETTE, 2},
                                {PNG_COLOR_TYPE_PALETTE, 4},   {PNG_COLOR_TYPE_PALETTE, 8}};
constexpr int kGrey[][2] = {
    {PNG_COLOR_TYPE_GRAY, 1}, {PNG_COLOR_TYPE_GRAY, 16}, {PNG_COLOR_TYPE_GRAY_ALPHA, 8}};

Bytes smallFile(int colorType = PNG_COLOR_TYPE_RGB, int bitDepth = 8) {
    Random random(11);
    return encodePng(randomPicture(random, 5, 7, colorType, bitDepth));
}

TEST(PngRead, EveryFormatAndFlag) {
    testing::internal::CaptureStderr();
    forEachCase(600, [](Random &random) {
        // Chunks that suggest colours or make some of them transparent change
        // nothing; bits of the flags that mean nothing do not either.
        const auto &[colorType, bitDepth] = kReadable[random.below(std::size(kReadable))];
        PngPicture picture = randomPicture(random, 1 + random.below(20), 1 + random.below(20),
                                           colorType, bitDepth, random.oneIn(2));
        picture.hasTransparency = colorType != PNG_COLOR_TYPE_RGB_ALPHA && random.oneIn(2);
        if (picture.palette.empty() && random.oneIn(2)) {
            picture.palette.resize(3);
        }
        const uint32 flags = random.below(8) | (random.oneIn(2) ? 0xFFFFFFF8u : 0);
        ImageInfo image;
        ASSERT_TRUE(readBuffer(&image, encodePng(picture), flags));
        expectRecord(image, picture, flags);
        ImageUtil_FreeImageData(&image);
        EXPECT_EQ(image.data, nullptr);
        ImageUtil_FreeImageData(&image);
    });
    EXPECT_EQ(testing::internal::GetCapturedStderr(), "") << "libpng has nothing to complain of";
}

TEST(PngRead, WhatIsRefused) {
    Bytes file = smallFile();
    ImageInfo image = recordOf(kUntouched);
    EXPECT_FALSE(ImageUtil_ReadPNGBuffer(&image, nullptr, 100, 0));
    EXPECT_FALSE(ImageUtil_ReadPNGBuffer(&image, file.data(), 0, 0));
    EXPECT_FALSE(ImageUtil_ReadPNGBuffer(nullptr, file.data(), 100, 0));
    EXPECT_TRUE(isRecordOf(image, kUntouched));

    for (const auto &[colorType, bitDepth] : kGrey) {
        EXPECT_FALSE(readBuffer(&image, smallFile(colorType, bitDepth), 0));
        EXPECT_TRUE(isRecordOf(image, 0));
    }
    file[0] ^= 1;
    EXPECT_FALSE(readBuffer(&image, file, 0));
    EXPECT_TRUE(isRecordOf(image, 0));

    // 65536 rows of 65536 bytes are one byte too many, counted in 32 bits.
    PngPicture large;
    large.colorType = PNG_COLOR_TYPE_RGB_ALPHA;
    large.width = 65536 / 4;
    for (const uint32 height : {65536u, 999999u}) {
        large.height = height;
        EXPECT_FALSE(readBuffer(&image, encodePng(large), IMAGEUTIL_READ_KEEP_ALPHA));
        EXPECT_EQ(image.data, nullptr);
        EXPECT_EQ(image.height, height);
    }
}

// What was decoded ahead of the error stays with the caller.
TEST(PngRead, DamagedOrEndingEarlyAtEveryLength) {
    for (const auto &[colorType, bitDepth] : kReadable) {
        const Bytes whole = smallFile(colorType, bitDepth);
        const size_t pixels = pixelStream(whole);
        for (size_t length = whole.size(); length > 0; --length) {
            Bytes file(whole.begin(), whole.begin() + static_cast<ptrdiff_t>(length));
            if (length == whole.size()) {
                file[length - 13] ^= 1; // the check sum of the pixels
            }
            ImageInfo image;
            EXPECT_FALSE(readBuffer(&image, file, IMAGEUTIL_READ_KEEP_ALPHA)) << length;
            EXPECT_EQ(image.data != nullptr, length >= pixels) << length;
            EXPECT_TRUE(length < pixels || (image.width == 5 && image.height == 7));
            EXPECT_TRUE(length >= 8 || isRecordOf(image, 0));
            ImageUtil_FreeImageData(&image);
        }
    }
}

TEST(PngRead, Files) {
    const std::string path = testing::TempDir() + "quillonRead" + std::to_string(getpid());
    const Bytes content = smallFile(PNG_COLOR_TYPE_RGB_ALPHA, 16);
    const auto read = [&](ImageInfo *image) {
        return ImageUtil_ReadPNG(image, path.c_str(), IMAGEUTIL_READ_KEEP_ALPHA);
    };
    ImageInfo image = recordOf(kUntouched);
    EXPECT_FALSE(read(&image));
    std::ofstream file(path, std::ios::binary);
    EXPECT_FALSE(read(&image)); // empty
    file.write(reinterpret_cast<const char *>(content.data()), std::ssize(content)).flush();
    for (const FileFault fault : {FileFault::kSizeFails, FileFault::kReadFails}) {
        fileFault = fault;
        EXPECT_FALSE(read(&image));
    }
    EXPECT_TRUE(isRecordOf(image, kUntouched));
    fileFault = FileFault::kReadShort;
    EXPECT_FALSE(read(&image));
    fileFault = FileFault::kNone;
    EXPECT_NE(image.data, nullptr); // only the last check sum is short of a byte
    ImageUtil_FreeImageData(&image);

    bool isRead = false;
    forEachMemoryFault(
        [&] {
            isRead = read(&image);
            ImageUtil_FreeImageData(&image);
        },
        [&](bool failed) { EXPECT_EQ(isRead, !failed); });
    EXPECT_EQ(filesOpen, 0);
    // The file's bytes, the state, the pixels, the rows.
    for (const uint64_t request : {0u, 1u, 2u, 3u}) {
        image = recordOf(kUntouched);
        const MemoryFault fault(request, Requests::kHearth);
        EXPECT_FALSE(read(&image));
        EXPECT_TRUE(request == 0 || image.data == nullptr);
        EXPECT_EQ(image.height, request == 0 ? 0x5A5A5A5Au : request == 1 ? 0u : 7u);
    }
    std::remove(path.c_str());
}

// --- Writing

bool construct(const ImageInfo &image, const ImageUtilPngOptions *options, Bytes &file) {
    DynBuf buffer = {};
    std::memset(&buffer, 0x5A, sizeof buffer);
    const bool isWritten = ImageUtil_ConstructPNGBuffer(&image, options, &buffer);
    EXPECT_EQ(buffer.data != nullptr, isWritten);
    file.assign(buffer.data, buffer.data + buffer.size);
    DynBuf_Destroy(&buffer);
    return isWritten;
}

void expectSamePicture(const PngPicture &png, const ImageInfo &image) {
    ASSERT_EQ(png.width, image.width);
    ASSERT_EQ(png.height, image.height);
    for (uint32 y = 0; y < image.height; ++y) {
        for (uint32 x = 0; x < image.width; ++x) {
            const uint16 *const s = png.pixel(x, y);
            Color color = {0, 0, 0, 255}, expected = pictureColorAt(image, x, y);
            if (png.colorType == PNG_COLOR_TYPE_PALETTE) {
                const png_color &entry = png.palette[s[0]];
                color = {entry.blue, entry.green, entry.red, 255};
            } else {
                color = {static_cast<uint8>(s[2]), static_cast<uint8>(s[1]),
                         static_cast<uint8>(s[0]), 255};
            }
            if (png.colorType == PNG_COLOR_TYPE_RGB_ALPHA) {
                color.alpha = static_cast<uint8>(s[3]);
            } else {
                expected.alpha = 255;
            }
            ASSERT_EQ(color, expected) << "pixel " << x << ", " << y;
        }
    }
}

TEST(PngWrite, EveryFormat) {
    forEachCase(400, [](Random &random) {
        const Format format = kFormats[random.below(std::size(kFormats))];
        const uint32 padding = random.below(4);
        TestImage image(random, format, 1 + random.below(40), 1 + random.below(20), padding);
        ImageInfo &info = image.info;
        if (format.bpp == 8 && random.oneIn(4)) {
            std::memset(info.data, 0, image.pixels.size());
            info.numColors = random.oneOf({1u, 16u, 257u, 0xFFFFFFFFu});
        }
        const int32 level = random.between(-2, 12);
        const ImageUtilPngOptions options = {level, random.oneIn(2)};
        const bool isDefault = random.oneIn(3);
        Bytes file;
        ASSERT_TRUE(construct(info, isDefault ? nullptr : &options, file));
        const PngPicture png = decodePng(file.data(), file.size());
        const bool hasAlpha = format.bpp == 32 && !isDefault && !options.stripAlpha;
        EXPECT_EQ(png.colorType, format.bpp == 8 ? PNG_COLOR_TYPE_PALETTE
                                 : hasAlpha      ? PNG_COLOR_TYPE_RGB_ALPHA
                                                 : PNG_COLOR_TYPE_RGB);
        EXPECT_EQ(png.bitDepth, 8);
        EXPECT_FALSE(png.interlaced);
        EXPECT_EQ(png.palette.size(), std::min(info.numColors, 256u));
        info.bytesPerLine -= format.bpp == 16 ? info.bytesPerLine % 2 : 0; // counts as even
        expectSamePicture(png, info);

        // Bits 6 and 7 of the second byte of a zlib stream tell the effort made.
        const int effort = file[pixelStream(file) + 1] >> 6;
        if (isDefault || level < 0 || level > 9 || level == 6) {
            EXPECT_EQ(effort, 2);
        } else if (level < 2 || level > 6) {
            EXPECT_EQ(effort, level < 2 ? 0 : 3);
        }
    });
}

TEST(PngWrite, WhatCannotBeWritten) {
    Random random(8);
    const auto expectRefusal = [&](auto change) {
        TestImage image(random, {24, 24}, 4, 4);
        change(image.info);
        Bytes file;
        EXPECT_FALSE(construct(image.info, nullptr, file));
    };
    expectRefusal([](ImageInfo &image) { image.width = 0; });
    expectRefusal([](ImageInfo &image) { image.height = 0; });
    expectRefusal([](ImageInfo &image) { image.height = 0xFFFFFFFF; });
    expectRefusal([](ImageInfo &image) { image.data = nullptr; });
    expectRefusal([](ImageInfo &image) { image.bytesPerLine = 11; }); // shorter than its pixels
    expectRefusal([](ImageInfo &image) { image.bpp = 8; });           // without colours
    expectRefusal([](ImageInfo &image) { image.bpp = 16, image.depth = 32; });
    expectRefusal([](ImageInfo &image) { // found out when the pixels are written already
        image.bpp = 8;
        image.numColors = 3;
        image.data[0] = 3;
    });
    DynBuf buffer = {};
    TestImage image(random, {16, 16}, 4, 4);
    EXPECT_FALSE(ImageUtil_ConstructPNGBuffer(nullptr, nullptr, &buffer));
    EXPECT_FALSE(ImageUtil_ConstructPNGBuffer(&image.info, nullptr, nullptr));

    // The exception must find nothing held; the leak sanitizer would tell.
    image.info.depth = 12;
    const std::string message =
        expectPanic([&] { ImageUtil_ConstructPNGBuffer(&image.info, nullptr, &buffer); });
    panicLine(message, "NOT_IMPLEMENTED lib/raster/rasterConv");
    EXPECT_EQ(warnings(),
              std::vector<std::string>{"Raster convert pixels invalid source depth 12\n"});
}

TEST(PngWrite, MemoryFaults) {
    Random random(9);
    for (const Format format : {Format{8, 8}, Format{15, 16}, Format{24, 32}}) {
        const TestImage image(random, format, 20, 20);
        bool isWritten = false;
        forEachMemoryFault(
            [&] {
                DynBuf buffer;
                isWritten = ImageUtil_ConstructPNGBuffer(&image.info, nullptr, &buffer);
                EXPECT_EQ(buffer.data != nullptr, isWritten);
                DynBuf_Destroy(&buffer);
            },
            [&](bool failed) { EXPECT_EQ(isWritten, !failed); });
    }
}

// Memory operations that keep the books, and fail from one request on.
struct Memory {
    static void *request(void *self, void *block, size_t size) {
        auto &memory = *static_cast<Memory *>(self);
        EXPECT_TRUE(block == nullptr || memory.blocks.count(block) == 1);
        if (memory.requestsLeft-- <= 0) {
            return nullptr;
        }
        memory.blocks.erase(block);
        void *const resized = std::realloc(block, size);
        memory.blocks[resized] = size;
        return resized;
    }
    static void release(void *self, void *block) {
        EXPECT_TRUE(block == nullptr || static_cast<Memory *>(self)->blocks.erase(block) == 1);
        std::free(block);
    }

    int requestsLeft;
    std::map<void *, size_t> blocks = {};
    ImageUtilMemOps ops = {this,
                           [](void *self, size_t size) { return request(self, nullptr, size); },
                           release, request};
};

TEST(PngWrite, MemoryOfTheCaller) {
    Random random(11);
    const TestImage image(random, {16, 16}, 50, 40);
    bool isWritten = false;
    for (int requests = 0; !isWritten && !HasFailure(); ++requests) {
        Memory memory = {requests};
        uint8 *const kNoBlock = image.info.data;
        uint8 *data = kNoBlock;
        uint32 size = 77;
        isWritten =
            ImageUtil_ConstructPNGBufferWithMemOps(&image.info, nullptr, &data, &size, &memory.ops);
        if (isWritten) {
            EXPECT_GE(requests, 4);
            EXPECT_EQ(memory.blocks.size(), 1u);
            EXPECT_LE(size, memory.blocks.at(data));
            expectSamePicture(decodePng(data, size), image.info);
            Memory::release(&memory, data);
        } else {
            EXPECT_LE(memory.requestsLeft, 0);
            EXPECT_EQ(data, kNoBlock);
            EXPECT_EQ(size, 0u);
        }
        EXPECT_TRUE(memory.blocks.empty());
    }
}

// The block stays for the caller to release; what is in it is given up.
TEST(PngWrite, StreamBeyond4GiB) {
    png_structp png = png_create_write_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr);
    Memory memory = {0};
    uint8 block[4] = {};
    for (const size_t length : {size_t{16}, ~size_t{0}}) {
        ImageUtilPngBuffer buffer = {block, 0xFFFFFFF8u, 0xFFFFFFF8u, &memory.ops};
        png_set_write_fn(png, &buffer, ImageUtilBufferWriteCallback, nullptr);
        if (setjmp(png_jmpbuf(png)) == 0) {
            ImageUtilBufferWriteCallback(png, block, length);
            ADD_FAILURE() << "no error";
        }
        EXPECT_EQ(buffer.data, block);
        EXPECT_EQ(buffer.size, 0u);
        EXPECT_EQ(buffer.capacity, 0u);
    }
    png_destroy_write_struct(&png, nullptr);
}

} // namespace
