// PNG files broken in every way: the outcome is that of libpng left to itself.

#include "support/faults.h"
#include "support/pngFile.h"
#include "support/testImage.h"
#include <quillon/imageUtil.h>

#include <algorithm>
#include <csetjmp>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <png.h>

using namespace quillon::test;

namespace {

constexpr size_t kMega = size_t{1} << 20;
constexpr size_t kMostBytes = kMega; // in a block

// Chunks may claim to be of 2 GB, all of which libpng would clear.
void *takeBlock(png_structp, size_t size) {
    return size > kMostBytes ? nullptr : std::malloc(size);
}

void giveBack(png_structp, void *block) {
    std::free(block);
}

struct Reading {
    Reading() { std::memset(&image, 0, sizeof image); } // its padding, too
    ~Reading() { png_destroy_read_struct(&png, &info, nullptr); }
    ImageInfo image;
    ImageUtilPngReadState state = {};
    png_structp png = png_create_read_struct_2(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr,
                                               nullptr, takeBlock, giveBack);
    png_infop info = png_create_info_struct(png);
    Bytes pixels;
    std::vector<png_bytep> rows;
};

bool readHeader(Reading &reading, uint32_t flags) {
    png_structp png = reading.png;
    png_infop info = reading.info;
    ImageInfo &image = reading.image;
    png_set_read_fn(png, &reading.state, ImageUtilReadPngCallback);
    png_read_info(png, info);
    const int type = png_get_color_type(png, info);
    if ((type & PNG_COLOR_MASK_COLOR) == 0)
        return false;
    png_set_scale_16(png);
    png_set_packing(png);
    png_set_bgr(png);
    if (type == PNG_COLOR_TYPE_RGB_ALPHA && (flags & IMAGEUTIL_READ_KEEP_ALPHA) == 0)
        png_set_strip_alpha(png);
    if (type == PNG_COLOR_TYPE_RGB && (flags & IMAGEUTIL_READ_ADD_ALPHA) != 0)
        png_set_add_alpha(png, 255, PNG_FILLER_AFTER);
    png_set_interlace_handling(png);
    png_read_update_info(png, info);
    image.width = png_get_image_width(png, info);
    image.height = png_get_image_height(png, info);
    image.depth = type == PNG_COLOR_TYPE_PALETTE ? 8 : 24;
    image.bpp = png_get_channels(png, info) * 8u;
    png_colorp colors = nullptr;
    int count = 0;
    if (type == PNG_COLOR_TYPE_PALETTE)
        png_get_PLTE(png, info, &colors, &count);
    image.numColors = static_cast<uint32_t>(count);
    for (int i = 0; i < count; ++i)
        image.palette[i] = {colors[i].blue, colors[i].green, colors[i].red, 0};
    return true;
}

bool readByLibpng(Reading &reading, const Bytes &file, uint32_t flags) {
    if (setjmp(png_jmpbuf(reading.png)) != 0)
        return false;
    reading.state = {bytesOf(file), 0, static_cast<uint32_t>(file.size())};
    if (!readHeader(reading, flags))
        return false;
    ImageInfo &image = reading.image;
    const uint32_t stride = (image.width * (image.bpp / 8) + 3) & ~3u;
    if (uint64_t{stride} * image.height > kMostBytes)
        return false;
    image.bytesPerLine = stride;
    reading.pixels.assign(size_t{stride} * image.height, static_cast<char>(kStale));
    const bool isBottomUp = (flags & IMAGEUTIL_READ_BOTTOM_UP) != 0;
    for (uint32_t i = 0; i < image.height; ++i)
        reading.rows.push_back(reinterpret_cast<png_bytep>(reading.pixels.data()) +
                               size_t{isBottomUp ? image.height - 1 - i : i} * image.bytesPerLine);
    png_read_image(reading.png, reading.rows.data());
    png_read_end(reading.png, nullptr);
    return true;
}

// How many files there were, and what became of them.
struct Tally {
    uint32_t files = 0, read = 0, refusedWithPixels = 0;
    const FencedBuffer memory{kMega}; // the files' own

    void check(const Bytes &file) {
        const uint32_t flags = files++ % 8;
        Reading expected;
        const bool isExpected = readByLibpng(expected, file, flags);
        uint8_t *const fenced = memory.end() - file.size();
        std::copy(file.begin(), file.end(), fenced);
        ImageInfo image;
        mostBytesPerBlock = kMostBytes;
        const bool isRead =
            ImageUtil_ReadPNGBuffer(&image, fenced, static_cast<uint32_t>(file.size()), flags);
        mostBytesPerBlock = SIZE_MAX;
        read += isRead;
        refusedWithPixels += !isRead && image.data != nullptr;
        ASSERT_EQ(isRead, isExpected) << shown(file);
        ASSERT_EQ(image.data == nullptr, expected.image.bytesPerLine == 0) << shown(file);
        if (image.data != nullptr) {
            acceptStale(image.data, expected.pixels.size()); // rows that were not reached
            EXPECT_EQ(std::memcmp(image.data, expected.pixels.data(), expected.pixels.size()), 0)
                << shown(file);
        }
        ImageUtil_FreeImageData(&image);
        // Of a file that fails ahead of its pixels the record may have a part.
        if (image.bytesPerLine != 0) {
            ASSERT_EQ(std::memcmp(&image, &expected.image, sizeof image), 0) << shown(file);
        }
    }
    void print(const char *name) const {
        std::printf("%-22s %6u files: %6u read, %6u refused, %5u of these in their pixels\n", name,
                    files, read, files - read, refusedWithPixels);
    }
    static std::string shown(const Bytes &file) { return testing::PrintToString(file); }
};

// The scan lines of a picture, with random filters.
Bytes scanLines(Random &random, const Bytes &ihdr, uint32_t width, uint32_t height) {
    const uint32_t bits = bytesOf(ihdr)[16], type = bytesOf(ihdr)[17];
    const uint32_t channels = type == 2 ? 3 : type == 4 ? 2 : type == 6 ? 4 : 1;
    struct Pass {
        uint32_t x, y, dx, dy;
    };
    constexpr Pass kAdam7[] = {{0, 0, 8, 8}, {4, 0, 8, 8}, {0, 4, 4, 8}, {2, 0, 4, 4},
                               {0, 2, 2, 4}, {1, 0, 2, 2}, {0, 1, 1, 2}};
    constexpr Pass kWhole[] = {{0, 0, 1, 1}};
    Bytes lines;
    const auto add = [&](const Pass &pass) {
        const uint32_t columns = (width + pass.dx - 1 - pass.x) / pass.dx;
        for (uint32_t y = pass.y; y < height && columns != 0; y += pass.dy) {
            Bytes line((columns * bits * channels + 7) / 8, 0);
            random.fill(line.data(), line.size());
            lines += static_cast<char>(random.below(5)) + line;
        }
    };
    if (bytesOf(ihdr)[20] != 0)
        std::for_each(std::begin(kAdam7), std::end(kAdam7), add);
    else
        add(kWhole[0]);
    return lines;
}

// A small picture, with some chunks that say more of it.
std::vector<Bytes> smallPicture(Random &random, int bits, int type, int interlace) {
    const uint32_t width = 1 + random.below(9), height = 1 + random.below(9);
    std::vector<Bytes> chunks = {pngHeader(width, height, bits, type, interlace)};
    Bytes colors(3u << std::min(bits, 8), 0);
    random.fill(colors.data(), colors.size());
    const bool isIndexed = type == PNG_COLOR_TYPE_PALETTE;
    if (isIndexed)
        chunks.push_back(pngChunk("PLTE", colors));
    const Bytes kExtras[] = {pngChunk("tRNS", Bytes(isIndexed ? 2 : 6, 1)),
                             pngChunk("gAMA", bigEndian(45455)),
                             pngChunk("zTXt", "k\0\0"s + zipped("text")),
                             pngChunk("iTXt", "k\0\0\0\0\0t"s),
                             pngChunk("iCCP", "k\0\0"s + zipped(colorProfile(140))),
                             pngChunk("sPLT", "k\0\x08"
                                              "colour"s),
                             pngChunk("eXIf", "MM picture"),
                             pngChunk("abCd", "?")};
    for (int i = 0; i < 2; ++i)
        chunks.push_back(random.oneOf(kExtras));
    const Bytes stream = zipped(scanLines(random, chunks[0], width, height));
    chunks.push_back(pngChunk("IDAT", stream.substr(0, 20)));
    chunks.push_back(pngChunk("IDAT", stream.substr(std::min<size_t>(20, stream.size()))));
    chunks.push_back(pngChunk("tEXt", "k\0t"s));
    chunks.push_back(pngChunk("IEND"));
    return chunks;
}

Bytes withRightSum(const Bytes &chunk) {
    return chunk.substr(0, 4) +
           pngChunk(chunk.substr(4, 4), chunk.substr(8, chunk.size() - 12)).substr(4);
}

// Every chunk on its own: dropped, doubled, moved, and with each byte changed, the
// check sum right and wrong.
void breakChunks(Tally &tally, Random &random, const std::vector<Bytes> &whole) {
    for (size_t i = 0; i < whole.size(); ++i) {
        const auto at = static_cast<ptrdiff_t>(i);
        std::vector<Bytes> chunks = whole;
        chunks.erase(chunks.begin() + at);
        tally.check(joined(chunks));
        for (size_t j = 0; j <= chunks.size(); ++j) {
            std::vector<Bytes> moved = chunks;
            moved.insert(moved.begin() + static_cast<ptrdiff_t>(j), whole[i]);
            tally.check(joined(moved));
            moved.insert(moved.begin(), whole[i]);
            tally.check(joined(moved));
        }
        for (size_t byte = 0; byte < whole[i].size(); ++byte) {
            chunks = whole;
            chunks[i][byte] ^= static_cast<char>(random.oneIn(2) ? 0x20 : 1 + random.below(255));
            tally.check(joined(chunks));
            chunks[i] = withRightSum(chunks[i]);
            tally.check(joined(chunks));
        }
    }
}

TEST(ImageBroken, BrokenFilesAreReadAsByLibpngAlone) {
    const Silence silence;
    Random random(baseSeed());
    Tally cut, broken, sizes, palettes;
    for (const int type : {0, 2, 3, 4, 6})
        for (const int bits : {1, 2, 4, 8, 16})
            for (const int interlace : {0, 1}) {
                const std::vector<Bytes> chunks = smallPicture(random, bits, type, interlace);
                const Bytes whole = joined(chunks);
                for (size_t size = 1; size <= whole.size(); ++size)
                    cut.check(whole.substr(0, size));
                breakChunks(broken, random, chunks);
                for (const uint32_t size :
                     {0u, 1u, 7u, 65536u, 400000u, 1000001u, 0x7FFFFFFFu, 0x80000000u, 0xFFFFFFFFu})
                    for (const uint32_t field : {16u, 20u})
                        sizes.check(
                            kPngSignature +
                            withRightSum(
                                Bytes(whole).replace(field, 4, bigEndian(size)).substr(8, 25)) +
                            whole.substr(33));
                if (type == PNG_COLOR_TYPE_PALETTE)
                    for (size_t bytes = 0; bytes <= 3 * 257; bytes += bytes < 21 ? 1 : 3) {
                        std::vector<Bytes> others = chunks;
                        others[1] = pngChunk("PLTE", Bytes(bytes, static_cast<char>(bytes)));
                        palettes.check(joined(others));
                    }
                ASSERT_FALSE(HasFailure());
            }
    cut.print("cut off at every byte");
    broken.print("with a chunk changed");
    sizes.print("of other sizes");
    palettes.print("of other palettes");
}

// The files of a folder: any collection of PNGs at hand, none of which comes with this.
TEST(ImageBroken, FilesAtHandAreReadAsByLibpngAlone) {
    const char *const folder = std::getenv("QUILLON_PNG_FOLDER");
    if (folder == nullptr)
        GTEST_SKIP() << "QUILLON_PNG_FOLDER is not set";
    const Silence silence;
    Tally tally;
    for (const auto &entry : std::filesystem::recursive_directory_iterator(folder)) {
        if (!entry.is_regular_file() || entry.file_size() > kMega)
            continue;
        std::ifstream file(entry.path(), std::ios::binary);
        const Bytes content(std::istreambuf_iterator<char>(file), {});
        for (int flags = 0; flags < 8; ++flags)
            tally.check(content);
    }
    tally.print(folder);
}

} // namespace
