// PNG files made to cost much, or broken in every way: what reading them costs, and
// that its outcome is that of libpng left to itself.

#include "support/faults.h"
#include "support/pngFile.h"
#include "support/testImage.h"
#include <quillon/imageUtil.h>

#include <algorithm>
#include <csetjmp>
#include <cstdio>
#include <cstring>
#include <ctime>
#include <dlfcn.h>
#include <fcntl.h>
#include <png.h>
#include <unistd.h>

using namespace quillon::test;

namespace {

uint64_t inflatedBytes = 0;

} // namespace

// In the place of zlib's: counts what libpng has it inflate.
int inflate(z_streamp stream, int flush) {
    static const auto next = reinterpret_cast<decltype(&inflate)>(dlsym(RTLD_NEXT, "inflate"));
    const uLong before = stream->total_out;
    const int status = next(stream, flush);
    inflatedBytes += stream->total_out - before;
    return status;
}

namespace {

// While one lives, standard error goes nowhere: libpng says a lot of these files.
struct Silence {
    Silence() : saved(dup(STDERR_FILENO)) {
        const int nowhere = open("/dev/null", O_WRONLY);
        dup2(nowhere, STDERR_FILENO);
        close(nowhere);
    }
    ~Silence() {
        dup2(saved, STDERR_FILENO);
        close(saved);
    }
    Silence(const Silence &) = delete;
    Silence &operator=(const Silence &) = delete;
    const int saved;
};

// --- What files cost

constexpr size_t kMega = size_t{1} << 20;

// A whole stream of zeros, made of a piece of it.
Bytes zippedZeros(size_t megabytes) {
    z_stream stream = {};
    deflateInit(&stream, Z_BEST_COMPRESSION);
    const Bytes zeros(kMega, 0);
    Bytes piece(kMega, 0);
    const auto compressPiece = [&] {
        stream.next_in = const_cast<Bytef *>(bytesOf(zeros));
        stream.avail_in = kMega;
        stream.next_out = reinterpret_cast<Bytef *>(piece.data());
        stream.avail_out = kMega;
        deflate(&stream, Z_FULL_FLUSH);
        return piece.substr(0, kMega - stream.avail_out);
    };
    Bytes whole = compressPiece(); // with the header
    const Bytes next = compressPiece();
    for (size_t i = 1; i < megabytes; ++i)
        whole += next;
    deflateEnd(&stream);
    return whole + "\x03\0"s +
           bigEndian(static_cast<uint32_t>(megabytes * kMega % 65521) << 16 | 1);
}

Bytes repeated(int count, const Bytes &part) {
    Bytes all;
    for (int i = 0; i < count; ++i)
        all += part;
    return all;
}

// A colour profile that libpng takes for good but for its end.
Bytes profile(uint32_t size) {
    Bytes bytes = bigEndian(size) + Bytes(size - 4, 0);
    const auto put = [&](size_t at, const Bytes &value) { bytes.replace(at, value.size(), value); };
    put(12, "mntrRGB XYZ ");
    put(36, "acsp");
    put(68, bigEndian(0xF6D6) + bigEndian(0x10000) + bigEndian(0xD32D));
    return bytes;
}

struct Costs {
    bool isRead;
    int64_t heldBytes; // at most, without the pixels
    uint64_t inflatedBytes;
    double seconds;
};

Costs costsOf(const Bytes &file) {
    const Silence silence;
    const MemoryFault none(UINT64_MAX);
    const auto processorTime = [] { return static_cast<double>(std::clock()) / CLOCKS_PER_SEC; };
    const double start = processorTime();
    inflatedBytes = 0;
    ImageInfo image;
    const bool isRead =
        ImageUtil_ReadPNGBuffer(&image, bytesOf(file), static_cast<uint32_t>(file.size()), 0);
    const int64_t pixelBytes = int64_t{image.height} * image.bytesPerLine;
    ImageUtil_FreeImageData(&image);
    EXPECT_EQ(none.blocksHeld, 0);
    return {isRead, none.mostBytes - pixelBytes, inflatedBytes, processorTime() - start};
}

TEST(ImageHostile, CostsAreThoseOfPixelsAndBytes) {
    const Bytes head = kPngSignature + pngHeader(1, 1, 8, PNG_COLOR_TYPE_RGB, 0);
    const Bytes pixels = pngChunk("IDAT", zipped(Bytes(4, 0))), end = pngChunk("IEND");
    const Bytes long8 = zippedZeros(7), filler(20 * kMega, 'a'), broken = profile(7 * kMega - 100);
    const std::pair<const char *, Bytes> kChunks[] = {
        {"zTXt", repeated(900, pngChunk("zTXt", "k\0\0"s + long8))},
        {"iTXt", repeated(900, pngChunk("iTXt", "k\0\1\0\0\0"s + long8))},
        {"small zTXt", repeated(80000, pngChunk("zTXt", "k\0\0"s + zipped(Bytes(60000, 0))))},
        {"tEXt", pngChunk("tEXt", "k\0"s + filler)},
        {"small tEXt", repeated(300000, pngChunk("tEXt", "k\0t"s))},
        {"iCCP", repeated(500, pngChunk("iCCP", "k\0\0"s + zipped(broken)))},
        {"sPLT", repeated(1000, pngChunk("sPLT", "k\0\x08"s + Bytes(30000, 'a')))},
        {"eXIf", pngChunk("eXIf", "MM" + filler)},
        {"pCAL", pngChunk("pCAL", "k\0"s + filler)},
        {"sCAL", pngChunk("sCAL", "\1" + filler)},
        {"unknown", repeated(4, pngChunk("abCd", filler))},
        {"hIST, tRNS", repeated(100000, pngChunk("hIST", Bytes(512, 1)) + pngChunk("tRNS"))}};
    std::vector<std::pair<std::string, Bytes>> files;
    for (const auto &[name, chunks] : kChunks) {
        files.emplace_back(name + " ahead of the pixels"s, head + chunks + pixels + end);
        files.emplace_back(name + " behind them"s, head + pixels + chunks + end);
    }
    files.emplace_back("empty IDAT", head + repeated(600000, pngChunk("IDAT")) + pixels + end);
    files.emplace_back("IDAT of 7 GB", head + pngChunk("IDAT", zippedZeros(7000)) + end);
    files.emplace_back("IDAT in pieces", head + pngChunk("IDAT", zippedZeros(60)) +
                                             repeated(500000, pngChunk("IDAT", "abc")) + end);
    const Bytes wide = kPngSignature + pngHeader(30000, 30000, 1, PNG_COLOR_TYPE_PALETTE, 0) +
                       pngChunk("PLTE", "abc");
    files.emplace_back("palette of 30000 x 30000", wide + pngChunk("IDAT", zippedZeros(108)) + end);

    constexpr int64_t kOwnState = 2 * kMega;          // of libpng
    constexpr uint64_t kSurplus = (72u << 10) * 1032; // behind the pixels, and not worth a look
    constexpr uint64_t kPixels = uint64_t{30000} * 3751 + kMega;
    std::printf("%-28s %10s %10s %13s %8s\n", "", "file", "held", "inflated", "CPU s");
    for (const auto &[name, file] : files) {
        const Costs costs = costsOf(file);
        std::printf("%-28s %10zu %10ld %13lu %8.3f\n", name.c_str(), file.size(), costs.heldBytes,
                    costs.inflatedBytes, costs.seconds);
        EXPECT_TRUE(costs.isRead) << name;
        EXPECT_LE(costs.heldBytes, kOwnState) << name;
        const bool isWide = file.compare(0, wide.size(), wide) == 0;
        EXPECT_LE(costs.inflatedBytes, isWide ? kPixels : kSurplus) << name;
        EXPECT_LE(costs.seconds, isWide ? 30 : 3) << name; // a guard against squares
    }
    // A length that the file does not have.
    EXPECT_LE(costsOf(head + bigEndian(0x7FFFFFFF) + "eXIfMM" + filler).heldBytes, kOwnState);
    // Too much behind the pixels to be inflated, and a fault in it or behind it.
    for (const Bytes &rest : {Bytes(), pngChunk("IHDR") + end, pngChunk("a1cd") + end,
                              pngChunk("IDAT").replace(8, 1, "x") + end, bigEndian(~0u) + end})
        EXPECT_FALSE(costsOf(head + pngChunk("IDAT", zippedZeros(90)) + rest).isRead);
}

// --- What libpng makes of a file

constexpr size_t kMostBytes = kMega; // of a block

// Chunks may claim to be of 2 GB, all of which libpng would clear.
void *takeBlock(png_structp, size_t size) {
    return size > kMostBytes ? nullptr : std::malloc(size);
}

void giveBack(png_structp, void *block) {
    std::free(block);
}

struct Reading {
    ~Reading() { png_destroy_read_struct(&png, &info, nullptr); }
    ImageInfo image = {};
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

    void check(const Bytes &file) {
        const uint32_t flags = files++ % 8;
        Reading expected;
        const bool isExpected = readByLibpng(expected, file, flags);
        static const FencedBuffer memory(1 << 16);
        uint8_t *const fenced = memory.end() - file.size();
        std::copy(file.begin(), file.end(), fenced);
        ImageInfo image;
        const bool isRead =
            ImageUtil_ReadPNGBuffer(&image, fenced, static_cast<uint32_t>(file.size()), flags);
        read += isRead;
        refusedWithPixels += !isRead && image.data != nullptr;
        ASSERT_EQ(isRead, isExpected) << print(file);
        ASSERT_EQ(image.data == nullptr, expected.image.bytesPerLine == 0) << print(file);
        if (image.data != nullptr) {
            EXPECT_EQ(std::memcmp(image.data, expected.pixels.data(), expected.pixels.size()), 0)
                << print(file);
        }
        ImageUtil_FreeImageData(&image);
        // Of a file that fails ahead of its pixels the record may have a part.
        if (image.bytesPerLine != 0) {
            ASSERT_EQ(std::memcmp(&image, &expected.image, sizeof image), 0) << print(file);
        }
    }
    static std::string print(const Bytes &file) { return testing::PrintToString(file); }
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
                             pngChunk("iCCP", "k\0\0"s + zipped(profile(140))),
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

TEST(ImageHostile, BrokenFilesAreReadAsByLibpngAlone) {
    const Silence silence;
    mostBytesPerBlock = kMostBytes;
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
                    for (const size_t field : {16, 20})
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
    mostBytesPerBlock = SIZE_MAX;
    for (const auto &[name, tally] :
         {std::pair("cut off at every byte", cut), std::pair("with a chunk changed", broken),
          std::pair("of other sizes", sizes), std::pair("of other palettes", palettes)})
        std::printf("%-22s %6u files: %6u read, %6u refused, %5u of these in their pixels\n", name,
                    tally.files, tally.read, tally.files - tally.read, tally.refusedWithPixels);
}

} // namespace
