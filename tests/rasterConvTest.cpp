// Conversions between pixel layouts against their reference.

#include "raster.h"
#include "reference/raster.h"
#include "support/messages.h"
#include "support/surfaces.h"
#include "support/targets.h"

#include <algorithm>
#include <cstring>
#include <numeric>

namespace quillon::test {
namespace {

// From a layout, or a palette, to a layout.
struct Pair {
    int32 srcDepth, dstDepth;
    bool pseudoColor;

    bool isCopy() const { return !pseudoColor && srcDepth == dstDepth; }
    bool isExact() const { return isCopy() || (pseudoColor && dstDepth == 32); }
};

std::ostream &operator<<(std::ostream &out, const Pair &pair) {
    return out << (pair.pseudoColor ? "palette " : "") << pair.srcDepth << " to " << pair.dstDepth;
}

constexpr int32 kLayouts[] = {3, 6, 8, 15, 16, 24, 32};

std::vector<Pair> everyPair() {
    std::vector<Pair> pairs;
    for (const int32 dst : kLayouts) {
        for (const int32 src : {15, 16, 24, 32})
            pairs.push_back({src, dst, false});
        if (dst <= 8)
            pairs.push_back({dst, dst, false});
        // Any of these means one byte an index.
        for (const int32 src : {8, 4, 0, -15, INT32_MIN})
            pairs.push_back({src, dst, true});
    }
    return pairs;
}

int32 bytesOf(int32 depth) {
    return depth <= 8 ? 1 : (depth + 1) / 8;
}

int32 srcBytesOf(const Pair &pair) {
    return pair.pseudoColor ? 1 : bytesOf(pair.srcDepth);
}

// One of the functions that do the pair, chosen by way.
void convert(const Pair &pair, uint32 way, const Surface &dst, const Surface &src,
             const uint32 *palette, Size size) {
    const uint32 dstLine = dst.unsignedLine(), srcLine = src.unsignedLine();
    if (way == 1 && pair.dstDepth == 32)
        return Raster_ConvertPixelsTo32(dst.buffer, dstLine, src.buffer, srcLine, pair.srcDepth,
                                        pair.pseudoColor, palette, src.x, src.y, dst.x, dst.y,
                                        size.width, size.height);
    if (way == 2 && pair.dstDepth == 32 && pair.pseudoColor)
        return Raster_ConvertIndexTo32(dst.buffer, dstLine, src.buffer, srcLine, palette, src.x,
                                       src.y, dst.x, dst.y, size.width, size.height);
    if (way == 1 && pair.srcDepth == 32)
        return Raster_ConvertPixelsFrom32(dst.buffer, dstLine, pair.dstDepth, src.buffer, srcLine,
                                          src.x, src.y, dst.x, dst.y, size.width, size.height);
    if (way == 1 && pair.isCopy())
        return RasterCopyPixels(dst.buffer, dstLine, src.buffer, srcLine, pair.srcDepth, src.x,
                                src.y, dst.x, dst.y, size.width, size.height);
    Raster_ConvertPixels(dst.buffer, dstLine, pair.dstDepth, src.buffer, srcLine, pair.srcDepth,
                         pair.pseudoColor, palette, src.x, src.y, dst.x, dst.y, size.width,
                         size.height);
}

void convertByReference(const Pair &pair, const Surface &dst, const Surface &src,
                        const uint32 *palette, Size size) {
    reference::convertPixels(dst.buffer, dst.unsignedLine(), pair.dstDepth, src.buffer,
                             src.unsignedLine(), pair.srcDepth, pair.pseudoColor, palette, src.x,
                             src.y, dst.x, dst.y, size.width, size.height);
}

// A palette of count entries with an inaccessible page right behind the last of
// them.
class FencedPalette {
public:
    FencedPalette() : block_(kMost * sizeof(uint32)) {}

    const uint32 *refill(Random &random, uint32 count) {
        random.fill(block_.data(), block_.size());
        return reinterpret_cast<const uint32 *>(block_.end()) - count;
    }

private:
    static constexpr size_t kMost = 256;
    FencedBuffer block_;
};

TEST(ConvertPixels, matchesReference) {
    TwinMemory dstMemory, srcMemory;
    FencedPalette fencedPalette;
    const std::vector<Pair> pairs = everyPair();
    forEachTarget([&] {
        forEachCase(12000, [&](Random &random) {
            const Pair pair = pairs[random.below(static_cast<uint32>(pairs.size()))];
            const int32 dstBytes = bytesOf(pair.dstDepth), srcBytes = srcBytesOf(pair);
            const RowRule rule = pair.isExact() ? RowRule::kExact : RowRule::kRounded;
            Size size = {randomWidth(random), random.below(6)};
            const size_t dstRow = size.width * static_cast<size_t>(dstBytes);
            const size_t srcRow = size.width * static_cast<size_t>(srcBytes);
            const int64_t dstLine = randomLine(random, dstRow, false);
            const int64_t srcLine = randomLine(random, srcRow, false);
            const int64_t dstStep = rowStep(dstLine, dstBytes, rule);
            const int64_t srcStep = rowStep(srcLine, srcBytes, rule);
            size = fitted(size, dstMemory, dstRow, dstStep);
            size = fitted(size, srcMemory, srcRow, srcStep);
            uint8 *dstFirst = randomPlace(random, dstMemory, size, dstRow, dstStep);
            uint8 *srcFirst = randomPlace(random, srcMemory, size, srcRow, srcStep);
            const Surface dst = surfaceAt(random, dstFirst, dstLine, dstBytes, rule);
            const Surface src = surfaceAt(random, srcFirst, srcLine, srcBytes, rule);

            const uint32 colors = random.oneIn(2) ? 256 : 1 + random.below(256);
            const uint32 *palette =
                pair.pseudoColor ? fencedPalette.refill(random, colors) : nullptr;
            dstMemory.refill(random);
            srcMemory.refill(random, pair.pseudoColor ? colors : 256);
            convert(pair, random.below(3), dst, src, palette, size);
            convertByReference(pair, dstMemory.inModel(dst), srcMemory.inModel(src), palette, size);
            EXPECT_TRUE(dstMemory.agree()) << pair << ", lines " << dstLine << ", " << srcLine
                                           << ", " << size.width << " x " << size.height;
            EXPECT_TRUE(srcMemory.agree()) << pair;
        });
    });
}

// Rows alone between inaccessible pages: nothing beyond any row is read, and
// nothing is written, not even with the value that it has.
TEST(ConvertPixels, staysInsideEveryRow) {
    TwinRows dst, src;
    std::vector<uint32> palette(256);
    Random random(baseSeed());
    random.fill(palette.data(), palette.size() * sizeof(uint32));
    forEachTarget([&] {
        for (uint32 width = 0; width <= 140; ++width) {
            noteStep("width", width);
            dst.refill(random);
            src.refill(random);
            for (const Pair &pair : everyPair()) {
                const size_t dstRow = width * static_cast<size_t>(bytesOf(pair.dstDepth));
                const size_t srcRow = width * static_cast<size_t>(srcBytesOf(pair));
                const Size size = {width, TwinRows::kHeight};
                for (const auto flush :
                     {FencedBuffer::Flush::kBefore, FencedBuffer::Flush::kBehind}) {
                    convert(pair, 0, dst.fenced(flush, dstRow), src.fenced(flush, srcRow),
                            palette.data(), size);
                    convertByReference(pair, dst.inModel(flush, dstRow), src.inModel(flush, srcRow),
                                       palette.data(), size);
                }
                ASSERT_TRUE(dst.agree()) << pair << ", width " << width;
                ASSERT_TRUE(src.agree()) << pair << ", width " << width;
            }
        }
    });
}

// All there is in 16 bits, as a rectangle and one by one.
TEST(ConvertPixels, every16BitPixel) {
    constexpr uint32 kSide = 256;
    std::vector<uint16> pixels(size_t{kSide} * kSide);
    std::iota(pixels.begin(), pixels.end(), uint16{0});
    Surface src = {reinterpret_cast<uint8 *>(pixels.data()), int64_t{kSide} * 2, 0, 0};
    for (const int32 srcDepth : {15, 16})
        for (const int32 dstDepth : kLayouts) {
            const Pair pair = {srcDepth, dstDepth, false};
            const auto line = kSide * static_cast<uint32>(bytesOf(dstDepth));
            std::vector<uint8> expected(size_t{kSide} * line), result(expected.size());
            convertByReference(pair, {expected.data(), line, 0, 0}, src, nullptr, {kSide, kSide});
            forEachTarget([&] {
                convert(pair, 0, {result.data(), line, 0, 0}, src, nullptr, {kSide, kSide});
                ASSERT_TRUE(result == expected) << pair;
            });
            for (uint32 pixel = 0; pixel <= 0xFFFF; ++pixel)
                ASSERT_EQ(Raster_ConvertOnePixel(pixel, srcDepth, dstDepth, false, nullptr),
                          reference::convertOnePixel(pixel, srcDepth, dstDepth, false, nullptr))
                    << pair << ", pixel " << pixel;
        }
}

// Each bit of a colour on and off, at every place of a row in turn.
TEST(ConvertPixels, everyBitOfAColor) {
    constexpr uint32 kWidth = 32 * 67;
    std::vector<uint32> colors(kWidth);
    for (uint32 i = 0; i < kWidth; ++i) {
        const uint32 bit = 1u << (i % 32);
        colors[i] = (i / 32) % 2 == 0 ? bit : ~bit;
    }
    for (const int32 dstDepth : kLayouts) {
        const Pair pair = {32, dstDepth, false};
        const size_t dstRow = kWidth * static_cast<size_t>(bytesOf(dstDepth));
        std::vector<uint8> expected(dstRow), result(dstRow);
        const Surface src = {reinterpret_cast<uint8 *>(colors.data()), int64_t{kWidth} * 4, 0, 0};
        convertByReference(pair, {expected.data(), 0, 0, 0}, src, nullptr, {kWidth, 1});
        forEachTarget([&] {
            convert(pair, 0, {result.data(), 0, 0, 0}, src, nullptr, {kWidth, 1});
            EXPECT_EQ(result, expected) << pair;
        });
    }
}

// Line increments are unsigned, the copy's too: rows up to 4 GB apart.
TEST(ConvertPixels, largestLineIncrements) {
    constexpr Size kSize = {13, 3};
    constexpr uint64_t kLargest = UINT32_MAX;
    Random random(baseSeed());
    std::vector<uint32> palette(256);
    random.fill(palette.data(), palette.size() * sizeof(uint32));
    for (const int64_t line : {INT64_C(0x80000000), INT64_C(0xC0000001), INT64_C(0xFFFFFFFF)}) {
        Mapping mapping(2 * kLargest + 2 * pageSize());
        for (uint64_t y = 0; y < kSize.height; ++y) { // whole or rounded, a row lies here
            const uint64_t row = y * static_cast<uint64_t>(line);
            const uint64_t page = (row < 8 ? 0 : row - 8) / pageSize() * pageSize();
            mapping.open(page, 2 * pageSize());
        }
        for (const Pair &pair : everyPair()) {
            const int32 dstBytes = bytesOf(pair.dstDepth), srcBytes = srcBytesOf(pair);
            const auto near = [&](uint8 *memory, int32 bytes) {
                return Surface{memory, int64_t{4} * kSize.width * bytes, 0, 0};
            };
            const auto farStep = [&](int32 bytes) {
                return rowStep(line, bytes, pair.isExact() ? RowRule::kExact : RowRule::kRounded);
            };
            std::vector<uint8> src(size_t{16} * kSize.width * kSize.height), expected(src.size());
            random.fill(src.data(), src.size());
            convertByReference(pair, near(expected.data(), dstBytes), near(src.data(), srcBytes),
                               palette.data(), kSize);
            const Surface far = {mapping.data(), line, 0, 0};

            // From rows close together to rows far apart.
            convert(pair, 0, far, near(src.data(), srcBytes), palette.data(), kSize);
            for (uint32 y = 0; y < kSize.height; ++y)
                EXPECT_EQ(
                    std::memcmp(
                        far.buffer + y * farStep(dstBytes),
                        &expected[size_t{y} * 4 * kSize.width * static_cast<size_t>(dstBytes)],
                        kSize.width * static_cast<size_t>(dstBytes)),
                    0)
                    << pair << ", line " << line << ", row " << y;

            // And from rows far apart.
            for (uint32 y = 0; y < kSize.height; ++y)
                std::copy_n(&src[size_t{y} * 4 * kSize.width * static_cast<size_t>(srcBytes)],
                            kSize.width * static_cast<size_t>(srcBytes),
                            far.buffer + y * farStep(srcBytes));
            std::vector<uint8> result(src.size());
            convert(pair, 0, near(result.data(), dstBytes), far, palette.data(), kSize);
            EXPECT_EQ(result, expected) << pair << ", line " << line;
        }
    }
}

// Entries that no pixel uses are not read: those below the first in use are not
// there, nor are those above the last.
TEST(ConvertPixels, paletteIsReadWherePixelsPoint) {
    FencedBuffer entries(pageSize());
    constexpr uint32 kWidth = 70;
    Random random(baseSeed());
    random.fill(entries.data(), entries.size());
    forEachTarget([&] {
        for (const int32 dstDepth : kLayouts) {
            const auto convertAll = [&](uint8 index, const uint32 *entry) {
                std::vector<uint8> src(kWidth, index), dst(size_t{kWidth} * 4),
                    expected(dst.size());
                const auto *palette = reinterpret_cast<const uint32 *>(
                    reinterpret_cast<uintptr_t>(entry) - index * sizeof(uint32));
                const Pair pair = {8, dstDepth, true};
                const Surface from = {src.data(), 0, 0, 0};
                convert(pair, 0, {dst.data(), 0, 0, 0}, from, palette, {kWidth, 1});
                convertByReference(pair, {expected.data(), 0, 0, 0}, from, palette, {kWidth, 1});
                EXPECT_EQ(dst, expected) << pair << ", index " << int{index};
            };
            const auto *first = reinterpret_cast<const uint32 *>(entries.data());
            const auto *last = reinterpret_cast<const uint32 *>(entries.end()) - 1;
            for (const int index : {0, 1, 127, 128, 255}) {
                convertAll(static_cast<uint8>(index), first);
                convertAll(static_cast<uint8>(index), last);
            }
        }
    });
}

TEST(ConvertPixels, knownValues) {
    // A row of one pixel, by value, from one layout to another.
    const auto one = [](int32 srcDepth, int32 dstDepth, uint32 pixel) {
        uint32 result = 0;
        Raster_ConvertPixels(reinterpret_cast<uint8 *>(&result), 4, dstDepth,
                             reinterpret_cast<const uint8 *>(&pixel), 4, srcDepth, false, nullptr,
                             0, 0, 0, 0, 1, 1);
        return result;
    };
    EXPECT_EQ(one(16, 32, 0x0821), 0xFF080408u);
    EXPECT_EQ(one(16, 32, 0xF800), 0xFFFF0000u);
    EXPECT_EQ(one(15, 32, 0x0421), 0xFF080808u);
    EXPECT_EQ(one(15, 32, 0x8000), 0xFF000000u);
    EXPECT_EQ(one(15, 24, 0x7FFF), 0x00FFFFFFu);
    EXPECT_EQ(one(15, 16, 0x0200), 0x0420u);
    EXPECT_EQ(one(16, 15, 0x0020), 0u);
    EXPECT_EQ(one(16, 3, 0x8410), 0xA4u);
    EXPECT_EQ(one(16, 6, 0x8410), 0x2Au);
    EXPECT_EQ(one(24, 32, 0x030201), 0xFF030201u);
    EXPECT_EQ(one(24, 16, 0xFF0807), 0xF840u);
    EXPECT_EQ(one(32, 15, 0x00070707), 0u);
    EXPECT_EQ(one(32, 16, 0x00F8FCF8), 0xFFFFu);
    EXPECT_EQ(one(32, 24, 0xAA123456), 0x123456u);
    EXPECT_EQ(one(32, 8, 0x00123456), 0x48u);
    EXPECT_EQ(one(32, 6, 0x00123456), 0x01u);
    EXPECT_EQ(one(12, 12, 0xABCD), 0xCDu); // a copy of one byte, whatever 12 may be
    EXPECT_EQ(one(4, 4, 0xAB), 0u);        // and of none
    EXPECT_EQ(one(-16, -16, 0xABCD), 0u);
}

TEST(ConvertPixels, emptyRectanglesTouchNothing) {
    const FencedBuffer fence(1);
    const Surface nowhere = {fence.end(), 64, 3, 5};
    for (const Pair &pair : everyPair())
        for (uint32 way = 0; way < 3; ++way)
            for (const Size size : {Size{0, 0}, Size{0, UINT32_MAX}, Size{UINT32_MAX, 0}})
                convert(pair, way, nowhere, nowhere, nullptr, size);
}

TEST(ConvertOnePixel, matchesReference) {
    constexpr uint32 kColors = 300; // an index is not cut to a byte
    std::vector<uint32> palette(kColors);
    forEachCase(20000, [&](Random &random) {
        const uint32 pixel = random.word();
        const int32 dstDepth = random.oneOf({3, 6, 8, 15, 16, 24, 32});
        const int32 srcDepth = random.oneOf({15, 16, 24, 32});
        EXPECT_EQ(Raster_ConvertOnePixel(pixel, srcDepth, dstDepth, false, nullptr),
                  reference::convertOnePixel(pixel, srcDepth, dstDepth, false, nullptr))
            << srcDepth << " to " << dstDepth << ", pixel " << pixel;

        random.fill(palette.data(), palette.size() * sizeof(uint32));
        const uint32 index = random.below(kColors);
        EXPECT_EQ(Raster_ConvertOnePixel(index, 8, dstDepth, true, palette.data()),
                  reference::convertOnePixel(palette[index], 32, dstDepth, false, nullptr))
            << "index " << index << " to " << dstDepth;
    });
}

TEST(ConvertOnePixel, knownValues) {
    const auto one = [](uint32 pixel, int32 srcDepth, int32 dstDepth) {
        return Raster_ConvertOnePixel(pixel, srcDepth, dstDepth, false, nullptr);
    };
    EXPECT_EQ(one(0xFFFF, 16, 32), 0x00FFFFFFu); // without alpha, unlike a rectangle
    EXPECT_EQ(one(0x8000, 15, 32), 0u);
    EXPECT_EQ(one(0x7FFF, 15, 16), 0xFFFFu);
    EXPECT_EQ(one(0x0200, 15, 16), 0x0420u);
    EXPECT_EQ(one(0x01E0, 15, 16), 0x03C0u);
    EXPECT_EQ(one(0xFFFF, 16, 15), 0x7FFFu);
    EXPECT_EQ(one(0xABCD0123, 15, 15), 0xABCD0123u);
    EXPECT_EQ(one(0xABCD0123, 32, 24), 0xABCD0123u);
    EXPECT_EQ(one(0xABCD0123, 24, 32), 0xABCD0123u);
    EXPECT_EQ(one(0xFFFFFF, 24, 8), 0xFFu);
    EXPECT_EQ(one(0xFFFFFF, 24, 6), 0x3Fu);
    EXPECT_EQ(one(0xFFFFFF, 24, 3), 0xA4u);

    // The index is taken whole and unsigned.
    const uint32 entry = 0x12345678, index = 0xC0000001;
    const auto *palette = reinterpret_cast<const uint32 *>(reinterpret_cast<uintptr_t>(&entry) -
                                                           uint64_t{index} * sizeof(uint32));
    for (const int32 dstDepth : {24, 32})
        EXPECT_EQ(Raster_ConvertOnePixel(index, 8, dstDepth, true, palette), entry);
}

TEST(IsModeReasonable, isTrueForNoOtherMode) {
    for (int32 depth = -2; depth <= 40; ++depth)
        for (int32 bits = -2; bits <= 40; ++bits) {
            const auto mode = std::pair(depth, bits);
            const bool direct = mode == std::pair(24, 24) || mode == std::pair(24, 32) ||
                                mode == std::pair(15, 16) || mode == std::pair(16, 16);
            EXPECT_EQ(Raster_IsModeReasonable(depth, bits, false), direct) << depth << ' ' << bits;
            EXPECT_EQ(Raster_IsModeReasonable(depth, bits, true), bits == 8)
                << depth << ' ' << bits;
        }
}

TEST(MakeRGBParam, knownValues) {
    struct Known {
        int32 componentBits;
        uint32 mask, multiplier, shift;
    };
    for (const Known &known : {
             Known{8, 0xFF0000, 0x10000, 0},
             {8, 0x0000FF, 1, 0},
             {8, 0xF800, 0x100, 0},
             {8, 0x07E0, 0x8, 0},
             {8, 0x001F, 1, 3},
             {8, 0x03E0, 0x4, 0},
             {5, 0xFF, 0x21, 2},
             {6, 0xFF, 0x41, 4},
             {4, 0xFF, 0x11, 0},
             {3, 0xFF, 0x49, 1},
             {1, 0xFF, 0xFF, 0},
             {5, 0xFF00, 0x840, 0},
             {8, 0xF0F0, 1, 0}, // the lowest run only
             {8, 0xFF000000, 0x1000000, 0},
         }) {
        RasterRGBParam param = {};
        RasterRGB_MakeRGBParam(&param, known.componentBits, known.mask);
        EXPECT_EQ(param.multiplier, known.multiplier) << known.componentBits << ' ' << known.mask;
        EXPECT_EQ(param.shift, known.shift) << known.componentBits << ' ' << known.mask;
        EXPECT_EQ(param.mask, known.mask);
    }
}

// Every channel that the limits allow: its bits, from the top, are those of the
// component over and over.
TEST(MakeRGBParam, placesEveryComponent) {
    Random random(baseSeed());
    for (uint32 bits = 1; bits <= 31; ++bits)
        for (uint32 width = 1; (width + bits - 1) / bits * bits <= 31; ++width)
            for (uint32 low = 0; low + width <= 32; ++low) {
                const auto run = static_cast<uint32>(((uint64_t{1} << width) - 1) << low);
                // Further bits, not next to the run, are no part of the channel.
                const uint32 above = ~static_cast<uint32>((uint64_t{2} << (low + width)) - 1);
                for (const uint32 mask : {run, run | (random.word() & above)}) {
                    RasterRGBParam param = {};
                    RasterRGB_MakeRGBParam(&param, static_cast<int32>(bits), mask);
                    ASSERT_EQ(param.mask, mask);
                    ASSERT_LT(param.shift, 32u);
                    const uint32 most = (1u << bits) - 1;
                    for (const uint32 component :
                         {0u, 1u, most, 1u << (bits - 1), random.word() & most}) {
                        uint32 expected = 0;
                        for (uint32 i = 0; i < width; ++i)
                            expected |= (component >> (bits - 1 - i % bits) & 1)
                                        << (low + width - 1 - i);
                        ASSERT_EQ(((component * param.multiplier) >> param.shift) & run, expected)
                            << bits << " bits, mask " << mask << ", component " << component;
                    }
                }
            }
}

// What a failing call says, and from which line.  The memory is inaccessible:
// nothing is read or written ahead of the checks.
class Failures : public testing::Test {
protected:
    enum class Call { kOnePixel, kPixels, kTo32, kFrom32 };

    int lineOf(Call function, const char *text, int32 argument, int32 srcDepth, int32 dstDepth,
               bool pseudoColor) {
        int line = 0;
        for (const uint32 side : {0u, 1u}) {
            const std::string message =
                expectPanic([&] { call(function, srcDepth, dstDepth, pseudoColor, side); });
            line = panicLine(message, "NOT_IMPLEMENTED lib/raster/rasterConv");
            char expected[128];
            snprintf(expected, sizeof(expected), "Raster convert %s %d\n", text, argument);
            EXPECT_EQ(warnings(), std::vector<std::string>{expected})
                << srcDepth << " to " << dstDepth;
        }
        return line;
    }

private:
    void call(Call function, int32 srcDepth, int32 dstDepth, bool pseudoColor, uint32 side) {
        uint8 *nowhere = fence_.end();
        const uint32 palette[] = {0};
        switch (function) {
        case Call::kOnePixel:
            Raster_ConvertOnePixel(0, srcDepth, dstDepth, pseudoColor, palette);
            break;
        case Call::kPixels:
            Raster_ConvertPixels(nowhere, 4, dstDepth, nowhere, 4, srcDepth, pseudoColor, palette,
                                 0, 0, 0, 0, side, side);
            break;
        case Call::kTo32:
            Raster_ConvertPixelsTo32(nowhere, 4, nowhere, 4, srcDepth, pseudoColor, palette, 0, 0,
                                     0, 0, side, side);
            break;
        case Call::kFrom32:
            Raster_ConvertPixelsFrom32(nowhere, 4, dstDepth, nowhere, 4, 0, 0, 0, 0, side, side);
        }
    }

    FencedBuffer fence_{1};
};

TEST_F(Failures, tellTheirChecksApart) {
    constexpr const char *kPseudo = "pixels invalid depth for pseudo color";
    constexpr const char *kSource = "pixels invalid source depth";
    constexpr const char *kDepth = "pixels invalid depth";
    constexpr const char *kOneSource = "one pixel invalid source depth";
    constexpr const char *kOneDepth = "one pixel invalid depth";
    const std::vector<int32> noLayouts = {INT32_MIN, -8, 0,  1,  2,  4,  5,  7,  9,
                                          12,        14, 17, 23, 25, 31, 33, 64, INT32_MAX};
    const std::vector<int32> noSources = {INT32_MIN, -15, 0, 3, 6, 8, 9, 12, 14, 17, 33, INT32_MAX};
    std::vector<int> lines; // of the distinct checks, a function's after another's
    const auto check = [&](auto lineOfValue, const std::vector<int32> &values) {
        const int line = lineOfValue(values.front());
        for (const int32 value : values)
            EXPECT_EQ(lineOfValue(value), line) << value;
        lines.push_back(line);
    };

    // The source is looked at first, so a wrong destination beside it is not
    // what is told.
    check([&](int32 src) { return lineOf(Call::kOnePixel, kPseudo, src, src, 7, true); },
          {7, 9, 0, -8, 15, 32});
    check([&](int32 src) { return lineOf(Call::kOnePixel, kOneSource, src, src, 7, false); },
          noSources);
    lineOf(Call::kOnePixel, kOneSource, 8, 8, 8, false);
    for (const int32 src : {15, 16, 24})
        check([&](int32 dst) { return lineOf(Call::kOnePixel, kOneDepth, dst, src, dst, false); },
              noLayouts);
    for (const int32 dst : noLayouts) { // words and palette entries are the same row
        EXPECT_EQ(lineOf(Call::kOnePixel, kOneDepth, dst, 32, dst, false), lines.back());
        EXPECT_EQ(lineOf(Call::kOnePixel, kOneDepth, dst, 8, dst, true), lines.back());
    }

    check([&](int32 src) { return lineOf(Call::kPixels, kPseudo, src, src, 7, true); },
          {9, 15, 32, INT32_MAX});
    lineOf(Call::kPixels, kPseudo, 16, 16, 16, true); // not taken for a copy
    check([&](int32 dst) { return lineOf(Call::kPixels, kDepth, dst, 8, dst, true); }, noLayouts);
    check([&](int32 src) { return lineOf(Call::kPixels, kSource, src, src, 10, false); },
          noSources);
    for (const int32 src : {15, 16, 24})
        check([&](int32 dst) { return lineOf(Call::kPixels, kDepth, dst, src, dst, false); },
              noLayouts);

    check([&](int32 src) { return lineOf(Call::kTo32, kPseudo, src, src, 32, true); },
          {9, 15, 32, INT32_MAX});
    EXPECT_EQ(lineOf(Call::kPixels, kPseudo, 9, 9, 32, true), lines.back());
    check([&](int32 src) { return lineOf(Call::kTo32, kSource, src, src, 32, false); }, noSources);
    EXPECT_EQ(lineOf(Call::kPixels, kSource, 8, 8, 32, false), lines.back());
    check([&](int32 dst) { return lineOf(Call::kFrom32, kDepth, dst, 32, dst, false); }, noLayouts);
    EXPECT_EQ(lineOf(Call::kPixels, kDepth, 7, 32, 7, false), lines.back());

    std::sort(lines.begin(), lines.end());
    EXPECT_EQ(std::adjacent_find(lines.begin(), lines.end()), lines.end());
    EXPECT_EQ(lines.size(), 14u);
}

} // namespace
} // namespace quillon::test
