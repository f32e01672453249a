#include "images.h"

#include "sum.h"
#include "support/pngFile.h"
#include "support/testImage.h"
#include <hearth/hearth.h>
#include <quillon/imageUtil.h>

#include <cstdio>
#include <cstdlib>
#include <deque>
#include <fstream>
#include <iterator>
#include <png.h>
#include <stdexcept>
#include <unistd.h>

namespace quillon::fingerprint {
namespace {

using namespace test;

// All of a record but its padding, and releases its pixels.
void addImage(ImageInfo &image) {
    for (const uint32_t field : {image.width, image.height, image.depth, image.bpp,
                                 image.bytesPerLine, image.flags, image.numColors})
        add(field);
    add(image.palette, sizeof image.palette);
    for (uint32_t y = 0; y < image.height && image.data != nullptr; ++y)
        add(image.data + size_t{y} * image.bytesPerLine, size_t{image.width} * (image.bpp / 8));
    ImageUtil_FreeImageData(&image);
}

void addDecoded(const Bytes &file, uint32_t flags) {
    ImageInfo image = {};
    const bool isRead =
        ImageUtil_ReadPNGBuffer(&image, bytesOf(file), static_cast<uint32_t>(file.size()), flags);
    add(isRead);
    addImage(image);
}

// A file in the folder for such.
struct ScratchFile {
    ScratchFile() {
        if (const int file = mkstemp(name); file < 0 || close(file) != 0)
            throw std::runtime_error("no scratch file");
    }
    ~ScratchFile() { std::remove(name); }
    ScratchFile(const ScratchFile &) = delete;
    ScratchFile &operator=(const ScratchFile &) = delete;

    Bytes content() const {
        std::ifstream stream(name, std::ios::binary);
        return {std::istreambuf_iterator<char>(stream), {}};
    }
    char name[32] = "/tmp/fingerprintXXXXXX";
};

TestImage drawImage(Random &random) {
    const Format format = random.oneOf(kFormats);
    const uint32_t width = 1 + random.below(40), height = 1 + random.below(20);
    return TestImage(random, format, width, height, 4 * random.below(3));
}

// --- Decoding

// Rows of random bytes, filtered in random ways.
void addRows(Random &random, Bytes &rows, uint32_t width, uint32_t height, uint32_t pixelBits) {
    const size_t rowBytes = 1 + (size_t{width} * pixelBits + 7) / 8;
    for (uint32_t y = 0; y < height && width != 0; ++y) {
        Bytes row(rowBytes, 0);
        random.fill(row.data(), row.size());
        row[0] = static_cast<char>(random.below(5));
        rows += row;
    }
}

struct Pass {
    uint32_t x, y, stepX, stepY;
};
constexpr Pass kPasses[] = {{0, 0, 8, 8}, {4, 0, 8, 8}, {0, 4, 4, 8}, {2, 0, 4, 4},
                            {0, 2, 2, 4}, {1, 0, 2, 2}, {0, 1, 1, 2}};

} // namespace

void decode(Random &random) {
    const bool isIndexed = random.oneIn(3), isInterlaced = random.oneIn(3);
    const int colorType = isIndexed ? PNG_COLOR_TYPE_PALETTE
                                    : random.oneOf({PNG_COLOR_TYPE_RGB, PNG_COLOR_TYPE_RGB_ALPHA});
    const uint32_t bits = isIndexed ? random.oneOf({1u, 2u, 4u, 8u}) : random.oneOf({8u, 16u});
    const uint32_t channels = isIndexed ? 1 : colorType == PNG_COLOR_TYPE_RGB ? 3 : 4;
    const uint32_t width = 1 + random.below(40), height = 1 + random.below(20);
    Bytes rows, palette(isIndexed ? 3u << bits : 0, 0);
    random.fill(palette.data(), palette.size());
    if (!isInterlaced)
        addRows(random, rows, width, height, channels * bits);
    for (const auto &[x, y, stepX, stepY] : kPasses)
        if (isInterlaced)
            addRows(random, rows, (width - x + stepX - 1) / stepX * (width > x),
                    (height - y + stepY - 1) / stepY * (height > y), channels * bits);
    Bytes file = kPngSignature +
                 pngHeader(width, height, static_cast<int>(bits), colorType, isInterlaced ? 1 : 0);
    if (isIndexed)
        file += pngChunk("PLTE", palette);
    file += pngChunk("IDAT", zipped(rows, 1));
    addDecoded(file + pngChunk("IEND"), random.below(8));
}

// --- Encoding

namespace {

void addChunks(const Bytes &file) {
    for (const Bytes &chunk : chunksOf(file))
        if (chunk.compare(4, 4, "IDAT") != 0)
            add(chunk.data(), chunk.size());
}

Bytes taken(DynBuf &buffer) {
    Bytes bytes(reinterpret_cast<const char *>(buffer.data), buffer.size);
    DynBuf_Destroy(&buffer);
    return bytes;
}

constexpr ImageUtilMemOps kMemOps = {
    .context = nullptr,
    .alloc = [](void *, size_t size) { return std::malloc(size); },
    .free = [](void *, void *block) { std::free(block); },
    .realloc = [](void *, void *block, size_t size) { return std::realloc(block, size); }};

Bytes encoded(const ImageInfo &image, const ImageUtilPngOptions *options, bool hasMemOps) {
    DynBuf buffer = {};
    if (!hasMemOps)
        return ImageUtil_ConstructPNGBuffer(&image, options, &buffer) ? taken(buffer) : Bytes();
    uint8_t *data = nullptr;
    uint32_t size = 0;
    if (!ImageUtil_ConstructPNGBufferWithMemOps(&image, options, &data, &size, &kMemOps))
        return {};
    Bytes bytes(reinterpret_cast<const char *>(data), size);
    std::free(data);
    return bytes;
}

// By way of files.
void addFileOf(const ImageInfo &image, const ImageUtilPngOptions *options) {
    const ScratchFile file;
    add(options == nullptr ? ImageUtil_WriteImage(&image, file.name, IMAGEUTIL_FORMAT_PNG)
                           : ImageUtil_WritePNG(&image, file.name, options));
    ImageInfo read = {};
    add(ImageUtil_ReadPNG(&read, file.name, IMAGEUTIL_READ_ADD_ALPHA));
    addImage(read);
}

// The functions that libpng calls.
void addCallbacks(Random &random) {
    uint8_t bytes[64];
    random.fill(bytes, sizeof bytes);
    const size_t length = 1 + random.below(sizeof bytes);
    png_structp png = png_create_write_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr);
    DynBuf buffer = {};
    png_set_write_fn(png, &buffer, ImageUtilDynBufWriteCallback, nullptr);
    ImageUtilDynBufWriteCallback(png, bytes, length);
    const Bytes written = taken(buffer);
    add(written.data(), written.size());
    ImageUtilPngBuffer block = {nullptr, 0, 0, &kMemOps};
    png_set_write_fn(png, &block, ImageUtilBufferWriteCallback, nullptr);
    ImageUtilBufferWriteCallback(png, bytes, length);
    add(block.data, block.size);
    std::free(block.data);
    png_destroy_write_struct(&png, nullptr);

    png = png_create_read_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr);
    ImageUtilPngReadState state = {bytes, 0, sizeof bytes};
    png_set_read_fn(png, &state, ImageUtilReadPngCallback);
    uint8_t read[sizeof bytes] = {};
    ImageUtilReadPngCallback(png, read, length);
    add(read, sizeof read);
    add(state.offset);
    png_destroy_read_struct(&png, nullptr, nullptr);
}

} // namespace

void encode(Random &random) {
    const TestImage image = drawImage(random);
    const int32_t level = random.between(-2, 12);
    const ImageUtilPngOptions given = {level, random.oneIn(2)};
    const ImageUtilPngOptions *const options = random.oneIn(3) ? nullptr : &given;
    const Bytes file = encoded(image.info, options, random.oneIn(2));
    addChunks(file);
    addDecoded(file, IMAGEUTIL_READ_KEEP_ALPHA | random.below(8));
    if (random.oneIn(16))
        addFileOf(image.info, options);
    addCallbacks(random);
}

void encodeBmp(Random &random) {
    const TestImage image = drawImage(random);
    DynBuf buffer = {};
    add(ImageUtil_ConstructBMPBuffer(&image.info, &buffer));
    const Bytes file = taken(buffer);
    add(file.data(), file.size());
    if (random.oneIn(64)) {
        const ScratchFile scratch;
        add(ImageUtil_WriteImage(&image.info, scratch.name, IMAGEUTIL_FORMAT_BMP));
        add(scratch.content() == file);
    }
}

// --- Composing

void combine(Random &random) {
    const Format format = random.oneOf(kFormats);
    const bool isTight = random.oneIn(3); // side by side, which leaves no gap
    std::deque<TestImage> blocks;
    std::vector<ImageInfo> images;
    std::vector<RectPoint> positions;
    const uint32_t count = 1 + random.below(4);
    for (int32_t nextX = -7; images.size() < count;) {
        const uint32_t width = 1 + random.below(12), height = 1 + random.below(12);
        const RectPoint at = {random.between(-15, 15), random.between(-15, 15)};
        blocks.emplace_back(random, format, width, isTight ? 6 : height, 4 * random.below(3));
        images.push_back(blocks.back().info);
        positions.push_back(isTight ? RectPoint{nextX, 3} : at);
        nextX += static_cast<int32_t>(width);
    }
    ImageInfo canvas = {};
    add(ImageUtil_Combine(images.data(), positions.data(), count, &canvas));
    addImage(canvas);
}

void cropAndScale(Random &random) {
    const uint32_t imageWidth = 2 + random.below(40), imageHeight = 2 + random.below(40);
    const TestImage image(random, {24, 32}, imageWidth, imageHeight);
    const auto edge = [&](uint32_t size) {
        return random.oneIn(4) ? -1 : random.between(-1, static_cast<int32_t>(size) + 1);
    };
    const int32_t left = random.between(0, 9), top = random.between(0, 9);
    const int32_t right = edge(imageWidth), bottom = edge(imageHeight);
    const int32_t width = edge(90), height = edge(90);
    ImageInfo made = {};
    add(ImageUtil_CropAndScaleImage(&image.info, left, top, right, bottom, 0, 0, width, height,
                                    &made));
    addImage(made);
}

} // namespace quillon::fingerprint
