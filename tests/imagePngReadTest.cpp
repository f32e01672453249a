// PNG files of every kind, whole and broken, into image records.

#include "imageUtil.h"
#include "support/faults.h"
#include "support/pngFile.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <cstring>
#include <fstream>
#include <memory>
#include <string>

using namespace quillon::test;

namespace {

constexpr uint8 kUntouched = 0x5A;

bool isFilledWith(const ImageInfo &image, uint8 byte) {
    const std::vector<uint8> expected(sizeof image, byte);
    return std::memcmp(&image, expected.data(), sizeof image) == 0;
}

ImageInfo untouchedRecord() {
    ImageInfo image;
    std::memset(&image, kUntouched, sizeof image);
    return image;
}

// Reads from a block of exactly the file's size, so that a sanitizer sees any
// byte read behind it.
bool readBuffer(ImageInfo *image, const std::vector<uint8> &file, uint32 flags) {
    const std::unique_ptr<uint8[]> exact(new uint8[file.size()]);
    std::memcpy(exact.get(), file.data(), file.size());
    return ImageUtil_ReadPNGBuffer(image, exact.get(), static_cast<uint32>(file.size()), flags);
}

// A sample at 8 bits: to the nearest, as v / 65535 = r / 255 has it.
uint8 at8Bits(const PngPicture &picture, uint16 sample) {
    return static_cast<uint8>(picture.bitDepth == 16 ? (sample + 128) / 257 : sample);
}

// The bytes of a pixel as the record has to hold them.
std::vector<uint8> expectedPixel(const PngPicture &picture, const uint16 *samples, uint32 flags) {
    if (picture.colorType == PNG_COLOR_TYPE_PALETTE) {
        return {static_cast<uint8>(samples[0])};
    }
    std::vector<uint8> bytes = {at8Bits(picture, samples[2]), at8Bits(picture, samples[1]),
                                at8Bits(picture, samples[0])};
    if (picture.colorType == PNG_COLOR_TYPE_RGB && (flags & IMAGEUTIL_READ_ADD_ALPHA) != 0) {
        bytes.push_back(255);
    }
    if (picture.colorType == PNG_COLOR_TYPE_RGB_ALPHA && (flags & IMAGEUTIL_READ_KEEP_ALPHA) != 0) {
        bytes.push_back(at8Bits(picture, samples[3]));
    }
    return bytes;
}

void expectPixels(const ImageInfo &image, const PngPicture &picture, uint32 flags) {
    for (uint32 y = 0; y < picture.height; ++y) {
        const bool isReversed = (flags & IMAGEUTIL_READ_BOTTOM_UP) != 0;
        const uint32 row = isReversed ? picture.height - 1 - y : y;
        std::vector<uint8> expected;
        for (uint32 x = 0; x < picture.width; ++x) {
            const auto pixel = expectedPixel(picture, picture.pixel(x, y), flags);
            expected.insert(expected.end(), pixel.begin(), pixel.end());
        }
        expected.resize(image.bytesPerLine, kStale); // padding is left alone
        const uint8 *const actual = image.data + size_t{row} * image.bytesPerLine;
        ASSERT_EQ(std::vector<uint8>(actual, actual + image.bytesPerLine), expected) << "row " << y;
    }
}

void expectRecord(const ImageInfo &image, const PngPicture &picture, uint32 flags) {
    const uint32 bytesPerPixel =
        static_cast<uint32>(expectedPixel(picture, picture.pixel(0, 0), flags).size());
    EXPECT_EQ(image.width, picture.width);
    EXPECT_EQ(image.height, picture.height);
    EXPECT_EQ(image.depth, bytesPerPixel == 1 ? 8u : 24u);
    EXPECT_EQ(image.bpp, bytesPerPixel * 8);
    EXPECT_EQ(image.bytesPerLine, (picture.width * bytesPerPixel + 3) / 4 * 4);
    EXPECT_EQ(image.flags, 0u);

    const bool isIndexed = picture.colorType == PNG_COLOR_TYPE_PALETTE;
    ASSERT_EQ(image.numColors, isIndexed ? picture.palette.size() : 0);
    for (uint32 i = 0; i < image.numColors; ++i) {
        const png_color &color = picture.palette[i];
        const uint8 expected[4] = {color.blue, color.green, color.red, 0};
        EXPECT_EQ(std::memcmp(&image.palette[i], expected, 4), 0) << "colour " << i;
    }
    expectPixels(image, picture, flags);
}

struct Format {
    int colorType;
    int bitDepth;
};

constexpr Format kReadable[] = {{PNG_COLOR_TYPE_RGB, 8},       {PNG_COLOR_TYPE_RGB, 16},
                                {PNG_COLOR_TYPE_RGB_ALPHA, 8}, {PNG_COLOR_TYPE_RGB_ALPHA, 16},
                                {PNG_COLOR_TYPE_PALETTE, 1},   {PNG_COLOR_TYPE_PALETTE, 2},
                                {PNG_COLOR_TYPE_PALETTE, 4},   {PNG_COLOR_TYPE_PALETTE, 8}};
constexpr Format kGrey[] = {{PNG_COLOR_TYPE_GRAY, 1},       {PNG_COLOR_TYPE_GRAY, 2},
                            {PNG_COLOR_TYPE_GRAY, 4},       {PNG_COLOR_TYPE_GRAY, 8},
                            {PNG_COLOR_TYPE_GRAY, 16},      {PNG_COLOR_TYPE_GRAY_ALPHA, 8},
                            {PNG_COLOR_TYPE_GRAY_ALPHA, 16}};

PngPicture smallPicture(Format format) {
    Random random(11);
    return randomPicture(random, 5, 7, format.colorType, format.bitDepth, false);
}

// A scratch file that is gone at the end of the test.
class ScratchFile {
public:
    explicit ScratchFile(const std::vector<uint8> &content)
        : path_(testing::TempDir() + "quillonRead" + std::to_string(getpid())) {
        std::ofstream(path_, std::ios::binary)
            .write(reinterpret_cast<const char *>(content.data()),
                   static_cast<std::streamsize>(content.size()));
    }
    ~ScratchFile() { std::remove(path_.c_str()); }
    ScratchFile(const ScratchFile &) = delete;
    ScratchFile &operator=(const ScratchFile &) = delete;
    const char *path() const { return path_.c_str(); }

private:
    std::string path_;
};

TEST(PngRead, EveryFormatAndFlag) {
    Random random(baseSeed());
    testing::internal::CaptureStderr();
    for (const Format format : kReadable) {
        for (uint32 round = 0; round < 64; ++round) {
            // Chunks that suggest colours or make some of them transparent change
            // nothing; bits of the flags that mean nothing do not either.
            PngPicture picture = randomPicture(random, 1 + random.below(20), 1 + random.below(20),
                                               format.colorType, format.bitDepth, random.oneIn(2));
            picture.hasTransparency =
                format.colorType != PNG_COLOR_TYPE_RGB_ALPHA && random.oneIn(2);
            if (picture.palette.empty() && random.oneIn(2)) {
                picture.palette.resize(3);
            }
            const uint32 flags = round % 8 + (random.oneIn(2) ? 0xFFFFFFF8u : 0);
            SCOPED_TRACE(testing::Message() << "type " << format.colorType << ", " << picture.width
                                            << " by " << picture.height << ", flags " << flags);
            ImageInfo image = untouchedRecord();
            ASSERT_TRUE(readBuffer(&image, encodePng(picture), flags));
            expectRecord(image, picture, flags);
            ImageUtil_FreeImageData(&image);
            ASSERT_FALSE(HasFailure());
        }
    }
    EXPECT_EQ(testing::internal::GetCapturedStderr(), "") << "libpng has nothing to complain of";
}

TEST(PngRead, GreyIsRefused) {
    for (const Format format : kGrey) {
        ImageInfo image = untouchedRecord();
        EXPECT_FALSE(readBuffer(&image, encodePng(smallPicture(format)), 0));
        EXPECT_TRUE(isFilledWith(image, 0));
    }
}

TEST(PngRead, NoInput) {
    const std::vector<uint8> file = encodePng(smallPicture({PNG_COLOR_TYPE_RGB, 8}));
    ImageInfo image = untouchedRecord();
    EXPECT_FALSE(ImageUtil_ReadPNGBuffer(&image, nullptr, 100, 0));
    EXPECT_FALSE(ImageUtil_ReadPNGBuffer(&image, file.data(), 0, 0));
    EXPECT_FALSE(ImageUtil_ReadPNGBuffer(nullptr, file.data(), 100, 0));
    EXPECT_TRUE(isFilledWith(image, kUntouched));
}

TEST(PngRead, WrongSignature) {
    for (size_t byte = 0; byte < 8; ++byte) {
        std::vector<uint8> file = encodePng(smallPicture({PNG_COLOR_TYPE_RGB, 8}));
        file[byte] ^= 1;
        ImageInfo image = untouchedRecord();
        EXPECT_FALSE(readBuffer(&image, file, 0));
        EXPECT_TRUE(isFilledWith(image, 0));
    }
}

TEST(PngRead, EndsEarlyAtEveryLength) {
    for (const Format format : kReadable) {
        std::vector<uint8> file = encodePng(smallPicture(format));
        while (file.size() > 1) {
            file.pop_back();
            ImageInfo image = untouchedRecord();
            EXPECT_FALSE(readBuffer(&image, file, IMAGEUTIL_READ_KEEP_ALPHA)) << file.size();
            EXPECT_TRUE(file.size() >= 8 || isFilledWith(image, 0));
            EXPECT_TRUE(image.data == nullptr || (image.width == 5 && image.height == 7));
            ImageUtil_FreeImageData(&image);
        }
    }
}

// Any one byte wrong is an error, thanks to the check sums, and what was decoded
// ahead of it stays with the caller.
TEST(PngRead, DamagedPixelsLeaveTheBlock) {
    std::vector<uint8> file = encodePng(smallPicture({PNG_COLOR_TYPE_RGB, 8}));
    file[file.size() - 20] ^= 0xFF; // the end of the pixels
    ImageInfo image = untouchedRecord();
    EXPECT_FALSE(readBuffer(&image, file, 0));
    EXPECT_EQ(image.width, 5u);
    EXPECT_EQ(image.bytesPerLine, 16u);
    ASSERT_NE(image.data, nullptr);
    ImageUtil_FreeImageData(&image);
}

TEST(PngRead, BlockBeyond32Bits) {
    // 65536 rows of 65536 bytes are one byte too many, counted in 32 bits.
    for (const uint32 height : {65536u, 999999u}) {
        ImageInfo image = untouchedRecord();
        EXPECT_FALSE(readBuffer(&image,
                                encodePngHeader(65536 / 4, height, PNG_COLOR_TYPE_RGB_ALPHA),
                                IMAGEUTIL_READ_KEEP_ALPHA));
        EXPECT_EQ(image.data, nullptr);
        EXPECT_EQ(image.height, height);
    }
}

TEST(PngRead, MemoryFaults) {
    const std::vector<uint8> file = encodePng(smallPicture({PNG_COLOR_TYPE_RGB_ALPHA, 16}));
    ImageInfo image;
    bool isRead = false;
    forEachMemoryFault(
        [&] {
            isRead = ImageUtil_ReadPNGBuffer(&image, file.data(), static_cast<uint32>(file.size()),
                                             IMAGEUTIL_READ_KEEP_ALPHA);
            ImageUtil_FreeImageData(&image);
        },
        [&](bool failed) { EXPECT_EQ(isRead, !failed); });
}

TEST(PngRead, RecordWhenMemoryCannotBeHad) {
    const std::vector<uint8> file = encodePng(smallPicture({PNG_COLOR_TYPE_RGB, 8}));
    // The state, the pixels, the rows.
    for (const uint64_t request : {0u, 1u, 2u}) {
        ImageInfo image = untouchedRecord();
        const MemoryFault fault(request, Requests::kHearth);
        EXPECT_FALSE(
            ImageUtil_ReadPNGBuffer(&image, file.data(), static_cast<uint32>(file.size()), 0));
        EXPECT_TRUE(fault.happened());
        EXPECT_EQ(image.data, nullptr);
        EXPECT_EQ(image.height, request == 0 ? 0u : 7u);
    }
}

TEST(PngRead, Files) {
    const PngPicture picture = smallPicture({PNG_COLOR_TYPE_RGB, 8});
    const std::vector<uint8> content = encodePng(picture);
    const ScratchFile file(content);
    ImageInfo image = untouchedRecord();
    ASSERT_TRUE(ImageUtil_ReadPNG(&image, file.path(), IMAGEUTIL_READ_ADD_ALPHA));
    expectRecord(image, picture, IMAGEUTIL_READ_ADD_ALPHA);
    ImageUtil_FreeImageData(&image);

    image = untouchedRecord();
    for (const FileFault fault : {FileFault::kSizeFails, FileFault::kReadFails}) {
        setFileFault(fault);
        EXPECT_FALSE(ImageUtil_ReadPNG(&image, file.path(), 0));
    }
    setFileFault(FileFault::kNone);
    EXPECT_FALSE(ImageUtil_ReadPNG(&image, "/nowhere/at.all", 0));
    EXPECT_FALSE(ImageUtil_ReadPNG(&image, testing::TempDir().c_str(), 0));
    EXPECT_FALSE(ImageUtil_ReadPNG(&image, ScratchFile({}).path(), 0));
    EXPECT_TRUE(isFilledWith(image, kUntouched));
    EXPECT_EQ(filesOpen(), 0);
}

TEST(PngRead, FileShorterThanItsSize) {
    const ScratchFile file(encodePng(smallPicture({PNG_COLOR_TYPE_RGB, 8})));
    setFileFault(FileFault::kReadShort);
    ImageInfo image = untouchedRecord();
    EXPECT_FALSE(ImageUtil_ReadPNG(&image, file.path(), 0));
    setFileFault(FileFault::kNone);
    EXPECT_NE(image.data, nullptr); // only the last check sum is short of a byte
    ImageUtil_FreeImageData(&image);
    EXPECT_EQ(filesOpen(), 0);
}

TEST(PngRead, FileMemoryFaults) {
    const ScratchFile file(encodePng(smallPicture({PNG_COLOR_TYPE_PALETTE, 4})));
    ImageInfo image = {};
    bool isRead = false;
    forEachMemoryFault(
        [&] {
            isRead = ImageUtil_ReadPNG(&image, file.path(), 0);
            ImageUtil_FreeImageData(&image);
        },
        [&](bool failed) {
            EXPECT_EQ(isRead, !failed);
            EXPECT_EQ(filesOpen(), 0);
        });
}

TEST(PngRead, FreeTwice) {
    ImageInfo image = untouchedRecord();
    image.data = static_cast<uint8 *>(std::malloc(10));
    ImageUtil_FreeImageData(&image);
    EXPECT_EQ(image.data, nullptr);
    EXPECT_EQ(image.numColors, 0x5A5A5A5Au);
    ImageUtil_FreeImageData(&image);
}

} // namespace
