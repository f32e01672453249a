// PNG files made to cost much: what reading them costs.

#include "support/faults.h"
#include "support/pngFile.h"
#include <quillon/imageUtil.h>

#include <cstdio>
#include <ctime>
#include <dlfcn.h>
#include <png.h>

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

TEST(ImageCost, CostsAreThoseOfPixelsAndBytes) {
    const Bytes head = kPngSignature + pngHeader(1, 1, 8, PNG_COLOR_TYPE_RGB, 0);
    const Bytes pixels = pngChunk("IDAT", zipped(Bytes(4, 0))), end = pngChunk("IEND");
    const Bytes long8 = zippedZeros(7), filler(20 * kMega, 'a'),
                broken = colorProfile(7 * kMega - 100);
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
        EXPECT_LE(costs.seconds, isWide ? 30 : 10) << name; // a guard against squares
    }
    // A length that the file does not have.
    EXPECT_LE(costsOf(head + bigEndian(0x7FFFFFFF) + "eXIfMM" + filler).heldBytes, kOwnState);
    // Too much behind the pixels to be inflated, and a fault in it or behind it.
    for (const Bytes &rest : {Bytes(), pngChunk("IHDR") + end, pngChunk("a1cd") + end,
                              pngChunk("IDAT").replace(8, 1, "x") + end, bigEndian(~0u) + end})
        EXPECT_FALSE(costsOf(head + pngChunk("IDAT", zippedZeros(90)) + rest).isRead);
}

} // namespace
