// PNG files of every kind, whole and broken, into image records.

#include "support/faults.h"
#include "support/pngFile.h"
#include "support/testImage.h"
#include <hearth/hearth.h>
#include <quillon/imageUtil.h>

#include <algorithm>
#include <cstring>
#include <fstream>
#include <png.h>
#include <unistd.h>

using namespace quillon::test;

namespace {

constexpr uint8_t kUntouched = 0x5A; // of a record as a test begins with it

bool isFilledWith(const ImageInfo &image, uint8_t byte) {
    const auto *bytes = reinterpret_cast<const uint8_t *>(&image);
    return std::all_of(bytes, bytes + sizeof image, [=](uint8_t found) { return found == byte; });
}

// --- Files made by libpng alone

struct PngPicture {
    int colorType, bitDepth;
    uint32_t width, height;
    std::vector<png_color> palette = {};
    std::vector<uint8_t> samples = {}; // as stored, but for a byte each at least

    bool isIndexed() const { return colorType == PNG_COLOR_TYPE_PALETTE; }
    bool hasAlpha() const { return (colorType & PNG_COLOR_MASK_ALPHA) != 0; }
    bool isGrey() const { return (colorType & PNG_COLOR_MASK_COLOR) == 0; }
    size_t pixelBytes() const {
        const size_t channels = isIndexed() ? 1 : (isGrey() ? 1 : 3) + (hasAlpha() ? 1 : 0);
        return channels * (bitDepth == 16 ? 2 : 1);
    }
};

PngPicture drawPicture(Random &random, int colorType, int bitDepth, uint32_t width,
                       uint32_t height) {
    PngPicture picture = {colorType, bitDepth, width, height};
    if (picture.isIndexed())
        picture.palette.resize(2 + random.below((1u << picture.bitDepth) - 1));
    else if (!picture.isGrey() && random.oneIn(2))
        picture.palette.resize(3); // a suggested one
    random.fill(picture.palette.data(), sizeof(png_color) * picture.palette.size());
    picture.samples.resize(width * height * picture.pixelBytes());
    random.fill(picture.samples.data(), picture.samples.size());
    for (uint8_t &sample : picture.samples)
        sample =
            picture.isIndexed() ? static_cast<uint8_t>(sample % picture.palette.size()) : sample;
    return picture;
}

Bytes encode(Random &random, const PngPicture &picture) {
    Bytes file;
    png_structp png = png_create_write_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr);
    png_infop info = png_create_info_struct(png);
    const auto append = [](png_structp writer, png_bytep bytes, size_t length) {
        static_cast<Bytes *>(png_get_io_ptr(writer))->append(bytes, bytes + length);
    };
    png_set_write_fn(png, &file, append, nullptr);
    png_set_IHDR(png, info, picture.width, picture.height, picture.bitDepth, picture.colorType,
                 random.oneOf({PNG_INTERLACE_ADAM7, PNG_INTERLACE_NONE}),
                 PNG_COMPRESSION_TYPE_DEFAULT, PNG_FILTER_TYPE_DEFAULT);
    if (!picture.palette.empty())
        png_set_PLTE(png, info, picture.palette.data(), static_cast<int>(picture.palette.size()));
    const png_byte alphas[] = {0, 64};
    const png_color_16 key = {0, 1, 1, 1, 1};
    if (!picture.hasAlpha() && random.oneIn(2))
        png_set_tRNS(png, info, alphas, 2, &key);
    std::vector<const png_byte *> rows;
    for (size_t i = 0; i < picture.samples.size(); i += picture.width * picture.pixelBytes())
        rows.push_back(&picture.samples[i]);
    png_set_rows(png, info, const_cast<png_bytepp>(rows.data()));
    png_write_png(png, info, PNG_TRANSFORM_PACKING, nullptr);
    png_destroy_write_struct(&png, &info);
    return file;
}

bool readBuffer(ImageInfo *image, const Bytes &file, uint32_t flags) {
    std::memset(image, kUntouched, sizeof *image);
    const FencedBuffer fenced(file.size());
    std::copy(file.begin(), file.end(), fenced.data());
    return ImageUtil_ReadPNGBuffer(image, fenced.data(), static_cast<uint32_t>(file.size()), flags);
}

void expectRecord(const ImageInfo &image, const PngPicture &picture, uint32_t flags) {
    const bool hasAlpha =
        (flags & (picture.hasAlpha() ? IMAGEUTIL_READ_KEEP_ALPHA : IMAGEUTIL_READ_ADD_ALPHA)) != 0;
    ASSERT_TRUE(image.width == picture.width && image.height == picture.height);
    EXPECT_EQ(image.depth, picture.isIndexed() ? 8u : 24u);
    ASSERT_EQ(image.bpp, picture.isIndexed() ? 8u : hasAlpha ? 32u : 24u);
    EXPECT_EQ(image.flags, 0u);
    const uint32_t rowBytes = picture.width * image.bpp / 8;
    ASSERT_EQ(image.bytesPerLine, (rowBytes + 3) / 4 * 4);
    ASSERT_EQ(image.numColors, picture.isIndexed() ? picture.palette.size() : 0);
    for (const ImageUtilColor &color : image.palette)
        EXPECT_EQ(color.reserved, 0);
    expectColors(image, (flags & IMAGEUTIL_READ_BOTTOM_UP) != 0, [&](uint32_t x, uint32_t y) {
        const uint8_t *s = &picture.samples[(size_t{y} * picture.width + x) * picture.pixelBytes()];
        if (picture.isIndexed())
            return Color{picture.palette[s[0]].blue, picture.palette[s[0]].green,
                         picture.palette[s[0]].red, 255};
        // To the nearest, as v / 65535 = r / 255 has it.
        const auto at8Bits = [&](size_t c) {
            return static_cast<uint8_t>(
                picture.bitDepth == 16 ? (s[2 * c] * 256 + s[2 * c + 1] + 128) / 257 : s[c]);
        };
        return Color{at8Bits(2), at8Bits(1), at8Bits(0),
                     picture.hasAlpha() ? at8Bits(3) : uint8_t{255}};
    });
    acceptStale(image.data, size_t{image.height} * image.bytesPerLine);
    for (uint32_t i = 0; i < image.height * image.bytesPerLine; ++i)
        EXPECT_TRUE(i % image.bytesPerLine < rowBytes || image.data[i] == kStale) << "padding";
}

// Chunks that suggest colours or make some of them transparent change nothing;
// bits of the flags that mean nothing do not either.  Grey is refused.
TEST(PngRead, EveryFormatAndFlag) {
    testing::internal::CaptureStderr();
    forEachCase(600, [](Random &random) {
        const int type =
            random.oneOf({PNG_COLOR_TYPE_RGB, PNG_COLOR_TYPE_RGB_ALPHA, PNG_COLOR_TYPE_PALETTE,
                          PNG_COLOR_TYPE_GRAY, PNG_COLOR_TYPE_GRAY_ALPHA});
        const int bits =
            type == PNG_COLOR_TYPE_PALETTE ? random.oneOf({1, 2, 4, 8}) : random.oneOf({8, 16});
        const PngPicture picture =
            drawPicture(random, type, bits, 1 + random.below(20), 1 + random.below(20));
        const uint32_t flags = random.below(8) | (random.oneIn(2) ? 0xFFFFFFF8u : 0);
        ImageInfo image;
        ASSERT_NE(readBuffer(&image, encode(random, picture), flags), picture.isGrey());
        if (picture.isGrey()) {
            EXPECT_TRUE(isFilledWith(image, 0));
            return;
        }
        expectRecord(image, picture, flags);
        ImageUtil_FreeImageData(&image);
        EXPECT_EQ(image.data, nullptr);
        ImageUtil_FreeImageData(&image);
    });
    EXPECT_EQ(testing::internal::GetCapturedStderr(), "") << "libpng has nothing to complain of";
}

// Without pixels: what the header tells, and neither bytesPerLine nor data.
void expectHeaderOnly(const ImageInfo &image, uint32_t width, uint32_t height) {
    ImageInfo expected = {};
    expected.width = width, expected.height = height, expected.depth = 24, expected.bpp = 32;
    EXPECT_EQ(std::memcmp(&image, &expected, sizeof image), 0);
}

// 65536 rows of 65536 bytes are one byte too many, counted in 32 bits.
TEST(PngRead, PicturesTooLarge) {
    for (const auto &[width, height] :
         {std::pair(16384u, 65536u), std::pair(16384u, 999999u), std::pair(1000000u, 1074u)}) {
        ImageInfo image;
        const Bytes file = kPngSignature +
                           pngHeader(width, height, 8, PNG_COLOR_TYPE_RGB_ALPHA, 0) +
                           pngChunk("IDAT");
        EXPECT_FALSE(readBuffer(&image, file, IMAGEUTIL_READ_KEEP_ALPHA));
        expectHeaderOnly(image, width, height);
    }
}

TEST(PngRead, Files) {
    const std::string path = testing::TempDir() + "quillonRead" + std::to_string(getpid());
    Random random(12);
    const Bytes content = encode(random, drawPicture(random, PNG_COLOR_TYPE_RGB_ALPHA, 16, 5, 7));
    ImageInfo image;
    std::memset(&image, kUntouched, sizeof image);
    const auto read = [&](const std::string &name) {
        return ImageUtil_ReadPNG(&image, name.c_str(), IMAGEUTIL_READ_KEEP_ALPHA);
    };
    EXPECT_FALSE(read(path));
    EXPECT_FALSE(read("/")); // has no bytes to read
    EXPECT_FALSE(read("/dev/null"));
    EXPECT_FALSE(ImageUtil_ReadPNGBuffer(&image, bytesOf(content), 0, 0));
    EXPECT_TRUE(isFilledWith(image, kUntouched));

    (std::ofstream(path, std::ios::binary) << content).flush();
    for (const uint64_t request : {1u, 2u, 3u}) { // the state, the pixels, the rows
        const MemoryFault fault(request, true);
        EXPECT_FALSE(read(path));
        if (request == 1)
            EXPECT_TRUE(isFilledWith(image, 0));
        else
            expectHeaderOnly(image, 5, 7);
    }
    std::remove(path.c_str());
}

} // namespace
