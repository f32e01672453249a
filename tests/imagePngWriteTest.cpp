// Images of every format into PNG streams, read back by libpng alone.

#include "hearth.h"
#include "imageUtil.h"
#include "support/faults.h"
#include "support/messages.h"
#include "support/pngFile.h"
#include "support/testImage.h"

#include <gtest/gtest.h>

#include <csetjmp>
#include <cstdlib>
#include <cstring>
#include <limits>
#include <map>

using namespace quillon::test;

namespace {

constexpr ImageUtilPngOptions kKeepAlpha = {.compressionLevel = -1, .stripAlpha = false};

// A byte buffer that is released at the end of the test.
struct Buffer : DynBuf {
    Buffer() { std::memset(static_cast<DynBuf *>(this), 0x5A, sizeof(DynBuf)); }
    ~Buffer() {
        if (isOurs) {
            DynBuf_Destroy(this);
        }
    }
    Buffer(const Buffer &) = delete;
    Buffer &operator=(const Buffer &) = delete;
    bool isOurs = false;
};

bool construct(const ImageInfo &image, const ImageUtilPngOptions *options, Buffer &buffer) {
    buffer.isOurs = true;
    return ImageUtil_ConstructPNGBuffer(&image, options, &buffer);
}

void expectEmpty(const DynBuf &buffer) {
    EXPECT_EQ(buffer.data, nullptr);
    EXPECT_EQ(buffer.size, 0u);
}

void expectSamePicture(const PngPicture &png, const ImageInfo &image) {
    ASSERT_EQ(png.width, image.width);
    ASSERT_EQ(png.height, image.height);
    for (uint32 y = 0; y < image.height; ++y) {
        for (uint32 x = 0; x < image.width; ++x) {
            const uint16 *const s = png.pixel(x, y);
            Color color = {};
            if (png.colorType == PNG_COLOR_TYPE_PALETTE) {
                const png_color &entry = png.palette[s[0]];
                color = {entry.blue, entry.green, entry.red, 255};
            } else {
                color = {static_cast<uint8>(s[2]), static_cast<uint8>(s[1]),
                         static_cast<uint8>(s[0]), 255};
            }
            Color expected = pictureColorAt(image, x, y);
            if (png.colorType == PNG_COLOR_TYPE_RGB_ALPHA) {
                color.alpha = static_cast<uint8>(s[3]);
            } else {
                expected.alpha = 255;
            }
            ASSERT_EQ(color, expected) << "pixel " << x << ", " << y;
        }
    }
}

int expectedColorType(const ImageInfo &image, bool stripAlpha) {
    if (image.bpp <= 8) {
        return PNG_COLOR_TYPE_PALETTE;
    }
    return image.bpp == 32 && !stripAlpha ? PNG_COLOR_TYPE_RGB_ALPHA : PNG_COLOR_TYPE_RGB;
}

TEST(PngWrite, EveryFormat) {
    forEachCase(400, [](Random &random) {
        const Format format = kFormats[random.below(std::size(kFormats))];
        const uint32 padding = random.below(4) * (format.bpp == 16 ? 2 : 1);
        TestImage image(random, format, 1 + random.below(40), 1 + random.below(20), padding);
        image.info.flags ^= random.below(2); // bottom-up or not
        const ImageUtilPngOptions options = {.compressionLevel = random.between(-2, 12),
                                             .stripAlpha = random.oneIn(2)};
        const bool isDefault = random.oneIn(3);
        Buffer buffer;
        ASSERT_TRUE(construct(image.info, isDefault ? nullptr : &options, buffer));
        const PngPicture png = decodePng(buffer.data, buffer.size);
        EXPECT_EQ(png.colorType, expectedColorType(image.info, isDefault || options.stripAlpha));
        EXPECT_EQ(png.bitDepth, 8);
        EXPECT_FALSE(png.interlaced);
        EXPECT_EQ(png.palette.size(), image.info.numColors);
        expectSamePicture(png, image.info);
    });
}

// Two bytes a pixel from rows at odd distances: the distance counts as even.
TEST(PngWrite, OddLineIncrementAt16Bits) {
    Random random(5);
    TestImage image(random, {16, 16}, 6, 4, 5);
    Buffer buffer;
    ASSERT_TRUE(construct(image.info, nullptr, buffer));
    image.info.bytesPerLine -= 1;
    expectSamePicture(decodePng(buffer.data, buffer.size), image.info);
}

TEST(PngWrite, ColorsOfThePalette) {
    Random random(6);
    TestImage image(random, {8, 8}, 3, 3);
    std::memset(image.info.data, 0, image.pixels.size());
    for (const uint32 numColors : {1u, 16u, 256u, 257u, 0xFFFFFFFFu}) {
        image.info.numColors = numColors;
        Buffer buffer;
        ASSERT_TRUE(construct(image.info, nullptr, buffer));
        EXPECT_EQ(decodePng(buffer.data, buffer.size).palette.size(), std::min(numColors, 256u));
    }
}

// Bits 6 and 7 of the second byte of a zlib stream tell the effort made.
int compressionEffort(const Buffer &buffer) {
    const char *const end = buffer.data + buffer.size;
    const char kChunk[] = {'I', 'D', 'A', 'T'};
    const char *const found = std::search<const char *>(buffer.data, end, kChunk, kChunk + 4);
    return static_cast<uint8>(found[5]) >> 6;
}

TEST(PngWrite, CompressionLevels) {
    Random random(7);
    const TestImage image(random, {24, 24}, 30, 30);
    const std::pair<int32, int> kLevels[] = {
        {0, 0}, {1, 0}, {9, 3}, {10, 2}, {-1, 2}, {std::numeric_limits<int32>::min(), 2}};
    for (const auto &[level, effort] : kLevels) {
        const ImageUtilPngOptions options = {.compressionLevel = level, .stripAlpha = true};
        Buffer buffer;
        ASSERT_TRUE(construct(image.info, &options, buffer));
        EXPECT_EQ(compressionEffort(buffer), effort) << "level " << level;
    }
}

TEST(PngWrite, WhatCannotBeWritten) {
    Random random(8);
    const auto expectRefusal = [&](auto change) {
        TestImage image(random, {24, 24}, 4, 4);
        change(image.info);
        Buffer buffer;
        EXPECT_FALSE(construct(image.info, nullptr, buffer));
        expectEmpty(buffer);
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

    Buffer untouched;
    const Buffer pattern;
    EXPECT_FALSE(ImageUtil_ConstructPNGBuffer(nullptr, nullptr, &untouched));
    EXPECT_EQ(std::memcmp(&untouched, &pattern, sizeof(DynBuf)), 0);
    const TestImage image(random, {24, 24}, 4, 4);
    EXPECT_FALSE(ImageUtil_ConstructPNGBuffer(&image.info, nullptr, nullptr));
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
                isWritten ? DynBuf_Destroy(&buffer) : expectEmpty(buffer);
            },
            [&](bool failed) { EXPECT_EQ(isWritten, !failed); });
    }
}

// A depth that cannot be converted is a Panic, here an exception.  It must find
// nothing held; the leak sanitizer would tell.
TEST(PngWrite, UnknownDepthIsAPanic) {
    Random random(10);
    TestImage image(random, {16, 16}, 4, 4);
    image.info.depth = 12;
    for (const auto run : {+[](const ImageInfo &info) {
                               DynBuf buffer;
                               ImageUtil_ConstructPNGBuffer(&info, nullptr, &buffer);
                           },
                           +[](const ImageInfo &info) {
                               DynBuf buffer;
                               ImageUtil_ConstructBMPBuffer(&info, &buffer);
                           }}) {
        panicLine(expectPanic([&] { run(image.info); }), "NOT_IMPLEMENTED lib/raster/rasterConv");
        EXPECT_EQ(warnings(),
                  std::vector<std::string>{"Raster convert pixels invalid source depth 12\n"});
    }
}

// Memory operations that keep the books, and fail from one request on.
class Memory {
public:
    explicit Memory(int requests) : requestsLeft_(requests) {}

    ImageUtilMemOps ops() {
        return {this, [](void *self, size_t size) { return of(self).request(nullptr, size); },
                [](void *self, void *block) { of(self).release(block); },
                [](void *self, void *block, size_t size) { return of(self).request(block, size); }};
    }
    void release(void *block) {
        nullsFreed += block == nullptr ? 1 : 0;
        EXPECT_TRUE(block == nullptr || blocks.erase(block) == 1);
        std::free(block);
    }

    std::map<void *, size_t> blocks;
    std::vector<size_t> resizes;
    int nullsFreed = 0;

private:
    static Memory &of(void *self) { return *static_cast<Memory *>(self); }

    void *request(void *block, size_t size) {
        EXPECT_TRUE(block == nullptr || blocks.count(block) == 1);
        if (requestsLeft_-- <= 0) {
            return nullptr;
        }
        resizes.push_back(size);
        blocks.erase(block);
        void *const resized = std::realloc(block, size);
        blocks[resized] = size;
        return resized;
    }

    int requestsLeft_;
};

TEST(PngWrite, MemoryOfTheCaller) {
    Random random(11);
    const TestImage image(random, {16, 16}, 50, 40);
    bool isWritten = false;
    for (int requests = 0; !isWritten; ++requests) {
        SCOPED_TRACE(requests);
        Memory memory(requests);
        const ImageUtilMemOps ops = memory.ops();
        auto *const kNoBlock = reinterpret_cast<uint8 *>(1);
        uint8 *data = kNoBlock;
        uint32 size = 77;
        isWritten =
            ImageUtil_ConstructPNGBufferWithMemOps(&image.info, nullptr, &data, &size, &ops);
        if (!isWritten) {
            EXPECT_EQ(data, kNoBlock);
            EXPECT_EQ(size, 0u);
            EXPECT_TRUE(memory.blocks.empty());
            // The rows, the pixels at 24 bits, then the stream.
            EXPECT_EQ(memory.nullsFreed, requests <= 2 ? 1 : 0);
            continue;
        }
        EXPECT_GE(requests, 4);
        EXPECT_EQ(memory.resizes[0], 40 * sizeof(void *));
        EXPECT_EQ(memory.resizes[1], 152u * 40);
        EXPECT_EQ(memory.resizes[2], 2u * 8 + 1024); // the signature is written first
        ASSERT_EQ(memory.blocks.size(), 1u);
        EXPECT_LE(size, memory.blocks.at(data));
        expectSamePicture(decodePng(data, size), image.info);
        memory.release(data);
    }
    Memory memory(10);
    const ImageUtilMemOps ops = memory.ops();
    uint8 *data = nullptr;
    uint32 size = 77;
    EXPECT_FALSE(ImageUtil_ConstructPNGBufferWithMemOps(nullptr, nullptr, &data, &size, &ops));
    EXPECT_EQ(size, 0u);
}

// The block stays for the caller to release; what is in it is given up.
TEST(PngWrite, StreamBeyond4GiB) {
    png_structp png = png_create_write_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr);
    Memory memory(0);
    const ImageUtilMemOps ops = memory.ops();
    uint8 block[4] = {};
    for (const size_t length : {size_t{16}, ~size_t{0}}) {
        ImageUtilPngBuffer buffer = {block, 0xFFFFFFF8u, 0xFFFFFFF8u, &ops};
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

// What is written comes back through the reader, alpha included.
TEST(PngWrite, ThereAndBack) {
    Random random(12);
    const TestImage image(random, {24, 32}, 17, 9);
    Buffer buffer;
    ASSERT_TRUE(construct(image.info, &kKeepAlpha, buffer));
    ImageInfo back;
    ASSERT_TRUE(ImageUtil_ReadPNGBuffer(&back, reinterpret_cast<const uint8 *>(buffer.data),
                                        static_cast<uint32>(buffer.size),
                                        IMAGEUTIL_READ_KEEP_ALPHA));
    EXPECT_EQ(std::memcmp(back.data, image.info.data, image.pixels.size()), 0);
    ImageUtil_FreeImageData(&back);
}

} // namespace
