// Fill, copy, alpha fill and blend against their reference.

#include "raster.h"
#include "reference/raster.h"
#include "support/messages.h"
#include "support/surfaces.h"
#include "support/targets.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <numeric>

namespace quillon::test {
namespace {

// The functions in one shape, so that the library's and the reference's are
// called alike.
const auto fill = [](auto function, const Surface &dst, int32 bytes, uint32 pixel, Size size) {
    function(dst.buffer, dst.signedLine(), bytes, pixel, dst.x, dst.y, size.width, size.height);
};
const auto fillAlpha = [](auto function, const Surface &dst, uint8 alpha, Size size) {
    function(dst.buffer, dst.signedLine(), alpha, dst.x, dst.y, size.width, size.height);
};
const auto copy = [](auto function, const Surface &dst, const Surface &src, int32 bytes,
                     Size size) {
    function(dst.buffer, dst.signedLine(), src.buffer, src.signedLine(), bytes, src.x, src.y, dst.x,
             dst.y, size.width, size.height);
};
const auto blend = [](auto function, const Surface &dst, const Surface &src, Size size) {
    function(dst.buffer, dst.x, dst.y, dst.signedLine(), src.buffer, src.x, src.y, src.signedLine(),
             size.width, size.height);
};

Size randomSize(Random &random) {
    return {randomWidth(random), random.oneIn(8) ? random.below(40) : random.below(6)};
}

// A rectangle on one random surface.
struct OnOne {
    Size size;
    Surface dst;

    OnOne(Random &random, const TwinMemory &memory, int32 bytes, RowRule rule)
        : size(randomSize(random)) {
        const size_t rowBytes = size.width * static_cast<size_t>(bytes);
        const int64_t line = randomLine(random, rowBytes, true);
        const int64_t step = rowStep(line, bytes, rule);
        size = fitted(size, memory, rowBytes, step);
        dst =
            surfaceAt(random, randomPlace(random, memory, size, rowBytes, step), line, bytes, rule);
    }
};

// A rectangle on each of two random surfaces, in two memories or in one.
struct OnTwo {
    Size size;
    Surface dst, src;

    OnTwo(Random &random, const TwinMemory &dstMemory, const TwinMemory &srcMemory, int32 bytes)
        : size(randomSize(random)) {
        const size_t rowBytes = size.width * static_cast<size_t>(bytes);
        const int64_t dstLine = randomLine(random, rowBytes, true);
        // Often the same one, as on surfaces of one size.
        const int64_t srcLine = random.oneIn(2) ? dstLine : randomLine(random, rowBytes, true);
        size = fitted(size, dstMemory, rowBytes, dstLine);
        size = fitted(size, srcMemory, rowBytes, srcLine);
        uint8 *dstFirst = randomPlace(random, dstMemory, size, rowBytes, dstLine);
        uint8 *srcFirst = randomPlace(random, srcMemory, size, rowBytes, srcLine);
        dst = surfaceAt(random, dstFirst, dstLine, bytes, RowRule::kExact);
        src = surfaceAt(random, srcFirst, srcLine, bytes, RowRule::kExact);
    }
};

TEST(RectFill, matchesReference) {
    TwinMemory memory;
    forEachTarget([&] {
        forEachCase(6000, [&](Random &random) {
            const int32 bytes = random.between(1, 4);
            const uint32 pixel = random.oneIn(4) ? random.below(256) * 0x01010101 : random.word();
            const OnOne at(random, memory, bytes, RowRule::kRoundedSteps);
            memory.refill(random);
            fill(Raster_RectFill, at.dst, bytes, pixel, at.size);
            fill(reference::rectFill, memory.inModel(at.dst), bytes, pixel, at.size);
            EXPECT_TRUE(memory.agree()) << bytes << " bytes per pixel, line " << at.dst.line << ", "
                                        << at.size.width << " x " << at.size.height;
        });
    });
}

TEST(RectFillAlpha, matchesReference) {
    TwinMemory memory;
    forEachTarget([&] {
        forEachCase(3000, [&](Random &random) {
            const auto alpha = static_cast<uint8>(random.below(256));
            const OnOne at(random, memory, 4, RowRule::kExact);
            memory.refill(random);
            fillAlpha(Raster_RectFillAlpha, at.dst, alpha, at.size);
            fillAlpha(reference::rectFillAlpha, memory.inModel(at.dst), alpha, at.size);
            EXPECT_TRUE(memory.agree())
                << "line " << at.dst.line << ", " << at.size.width << " x " << at.size.height;
        });
    });
}

TEST(RectCopy, matchesReference) {
    TwinMemory memory, other;
    forEachTarget([&] {
        forEachCase(6000, [&](Random &random) {
            // The count of bytes is not checked: 7 is as good as 4.
            const int32 bytes = random.oneIn(8) ? 7 : random.between(1, 4);
            TwinMemory &srcMemory = random.oneIn(2) ? other : memory;
            const OnTwo at(random, memory, srcMemory, bytes);
            memory.refill(random);
            other.refill(random);
            copy(Raster_RectCopy, at.dst, at.src, bytes, at.size);
            copy(reference::rectCopy, memory.inModel(at.dst), srcMemory.inModel(at.src), bytes,
                 at.size);
            EXPECT_TRUE(memory.agree())
                << bytes << " bytes per pixel, lines " << at.dst.line << ", " << at.src.line << ", "
                << at.size.width << " x " << at.size.height;
            EXPECT_TRUE(other.agree());
        });
    });
}

TEST(AlphaBlendOver, matchesReference) {
    TwinMemory memory, other;
    forEachTarget([&] {
        forEachCase(4000, [&](Random &random) {
            TwinMemory &srcMemory = random.oneIn(3) ? memory : other;
            const OnTwo at(random, memory, srcMemory, 4);
            memory.refill(random);
            other.refill(random);
            blend(Raster_AlphaBlendOver, at.dst, at.src, at.size);
            blend(reference::alphaBlendOver, memory.inModel(at.dst), srcMemory.inModel(at.src),
                  at.size);
            EXPECT_TRUE(memory.agree()) << "lines " << at.dst.line << ", " << at.src.line << ", "
                                        << at.size.width << " x " << at.size.height;
            EXPECT_TRUE(other.agree());
        });
    });
}

// Calls run(random, size, dst, src) with the two rectangles on equally stepped
// surfaces at every distance at which a vector can run into itself, with rows
// of several lengths that follow, or overlap, each other.
template <class Run>
void forEachDistance(int32 bytes, TwinMemory &memory, const Run &run) {
    constexpr int kMost = 128;
    forEachCase(8 * (2 * kMost + 1), [&](Random &random) {
        const int distance = random.between(-kMost, kMost);
        const Size size = {random.below(100), 1 + random.below(4)};
        const size_t rowBytes = size.width * static_cast<size_t>(bytes);
        const int64_t dstLine = randomLine(random, rowBytes, true);
        // At another step the distance changes from row to row.
        const int64_t srcLine = random.oneIn(2) ? dstLine : dstLine + random.between(-20, 20);
        uint8 *middle = memory.data() + memory.size() / 2;
        const auto on = [&](uint8 *first, int64_t line) {
            return surfaceAt(random, first, line, bytes, RowRule::kExact);
        };
        memory.refill(random);
        run(size, on(middle + distance, dstLine), on(middle, srcLine));
        EXPECT_TRUE(memory.agree()) << "distance " << distance << ", lines " << dstLine << ", "
                                    << srcLine << ", " << size.width << " x " << size.height;
    });
}

TEST(RectCopy, overlapAtEveryDistance) {
    TwinMemory memory;
    forEachTarget([&] {
        for (const int32 bytes : {1, 2, 3, 4})
            forEachDistance(bytes, memory, [&](Size size, const Surface &dst, const Surface &src) {
                copy(Raster_RectCopy, dst, src, bytes, size);
                copy(reference::rectCopy, memory.inModel(dst), memory.inModel(src), bytes, size);
            });
    });
}

TEST(AlphaBlendOver, overlapAtEveryDistance) {
    TwinMemory memory;
    forEachTarget([&] {
        forEachDistance(4, memory, [&](Size size, const Surface &dst, const Surface &src) {
            blend(Raster_AlphaBlendOver, dst, src, size);
            blend(reference::alphaBlendOver, memory.inModel(dst), memory.inModel(src), size);
        });
    });
}

// Within one surface, what comes out is what a copy through a buffer gives.
TEST(RectCopy, withinOneSurface) {
    constexpr uint32 kWidth = 40, kHeight = 30;
    forEachCase(4000, [&](Random &random) {
        const size_t bytes = 1 + random.below(4), line = kWidth * bytes + random.below(3);
        const Size size = {random.below(kWidth + 1), random.below(kHeight + 1)};
        const auto [srcX, dstX] =
            std::pair(random.below(kWidth - size.width + 1), random.below(kWidth - size.width + 1));
        const auto [srcY, dstY] = std::pair(random.below(kHeight - size.height + 1),
                                            random.below(kHeight - size.height + 1));
        std::vector<uint8> surface(kHeight * line);
        random.fill(surface.data(), surface.size());
        const std::vector<uint8> before = surface;
        std::vector<uint8> expected = surface;
        for (uint32 row = 0; row < size.height; ++row)
            std::copy_n(before.data() + (srcY + row) * line + srcX * bytes, size.width * bytes,
                        expected.data() + (dstY + row) * line + dstX * bytes);

        // Turned over, the last row comes first and the line increment is negative.
        uint8 *first = surface.data();
        auto signedLine = static_cast<int32>(line);
        const bool turned = random.oneIn(2);
        const auto y = [=](uint32 top) { return turned ? kHeight - top - size.height : top; };
        if (turned) {
            first += (kHeight - 1) * line;
            signedLine = -signedLine;
        }
        Raster_RectCopy(first, signedLine, first, signedLine, static_cast<int32>(bytes), srcX,
                        y(srcY), dstX, y(dstY), size.width, size.height);
        EXPECT_EQ(surface, expected) << bytes << " bytes per pixel";
    });
}

TEST(RectCopy, countOfBytesOfZeroOrLessCopiesNothing) {
    std::array<uint8, 4> memory = {1, 2, 3, 4};
    for (const int32 bytes : {0, -1, -4})
        Raster_RectCopy(&memory[2], 1, &memory[0], 1, bytes, 0, 0, 0, 0, 2, 1);
    EXPECT_EQ(memory, (std::array<uint8, 4>{1, 2, 3, 4}));
}

// Rows alone between inaccessible pages: nothing beyond any row is read, and
// nothing is written, not even with the value that it has.
TEST(Raster, staysInsideEveryRow) {
    TwinRows dst, src;
    Random random(baseSeed());
    uint32 width = 0;
    // Each call does its operation with the library's or the reference's function.
    const auto check = [&](int32 bytes, const auto &call, auto library, auto reference) {
        const size_t rowBytes = width * static_cast<size_t>(bytes);
        for (const auto flush : {FencedBuffer::Flush::kBefore, FencedBuffer::Flush::kBehind}) {
            call(library, dst.fenced(flush, rowBytes), src.fenced(flush, rowBytes));
            call(reference, dst.inModel(flush, rowBytes), src.inModel(flush, rowBytes));
            ASSERT_TRUE(dst.agree()) << bytes << " bytes per pixel, width " << width;
        }
    };
    forEachTarget([&] {
        for (width = 0; width <= 140; ++width) {
            noteStep("width", width);
            dst.refill(random);
            src.refill(random);
            const Size size = {width, TwinRows::kHeight};
            for (int32 bytes = 1; bytes <= 4; ++bytes) {
                const uint32 pixel = random.word();
                const auto filled = [&](auto function, const Surface &to, const Surface &) {
                    fill(function, to, bytes, pixel, size);
                };
                const auto copied = [&](auto function, const Surface &to, const Surface &from) {
                    copy(function, to, from, bytes, size);
                };
                check(bytes, filled, Raster_RectFill, reference::rectFill);
                check(bytes, copied, Raster_RectCopy, reference::rectCopy);
            }
            const auto alphaFilled = [&](auto function, const Surface &to, const Surface &) {
                fillAlpha(function, to, 77, size);
            };
            const auto blended = [&](auto function, const Surface &to, const Surface &from) {
                blend(function, to, from, size);
            };
            check(4, alphaFilled, Raster_RectFillAlpha, reference::rectFillAlpha);
            check(4, blended, Raster_AlphaBlendOver, reference::alphaBlendOver);
            ASSERT_TRUE(src.agree());
        }
    });
}

// Every alpha over every source and every destination value, in all channels.
TEST(AlphaBlendOver, everyValue) {
    constexpr uint32 kSide = 256, kLine = kSide * 4;
    std::vector<uint8> src(size_t{kSide} * kLine), dst(src.size()), expected(src.size());
    std::vector<uint8> before(src.size());
    for (uint32 alpha = 0; alpha < 256; ++alpha) {
        for (uint32 y = 0; y < kSide; ++y)
            for (uint32 x = 0; x < kSide; ++x) {
                const size_t at = y * kLine + x * 4;
                for (uint32 c = 0; c < 3; ++c) { // shifted, lest one channel stands in for another
                    src[at + c] = static_cast<uint8>(y + 85 * c);
                    before[at + c] = static_cast<uint8>(x + 43 * c);
                    const uint32 sum = src[at + c] + before[at + c] * (255 - alpha) / 255;
                    expected[at + c] = static_cast<uint8>(std::min(sum, 255u));
                }
                src[at + 3] = static_cast<uint8>(alpha);
                before[at + 3] = expected[at + 3] = static_cast<uint8>(x ^ y);
            }
        forEachTarget([&] {
            dst = before;
            Raster_AlphaBlendOver(dst.data(), 0, 0, kLine, src.data(), 0, 0, kLine, kSide, kSide);
            ASSERT_TRUE(dst == expected) << "alpha " << alpha;
        });
    }
}

TEST(RectFill, knownValues) {
    const std::array<uint8, 4> stored = {0xD4, 0xC3, 0xB2, 0xA1};
    for (int32 bytes = 1; bytes <= 4; ++bytes) {
        std::array<uint8, 4> memory = {};
        Raster_RectFill(memory.data(), 4, bytes, 0xA1B2C3D4, 0, 0, 1, 1);
        std::array<uint8, 4> expected = {};
        std::copy_n(stored.begin(), bytes, expected.begin());
        EXPECT_EQ(memory, expected);
    }

    // A line increment of 66: the first row at 66 exactly, the next 64 further;
    // the alpha fill goes on by 66.
    std::array<uint8, 140> filled = {}, alpha = {};
    Raster_RectFill(filled.data(), 66, 4, 0xFFFFFFFF, 0, 1, 1, 2);
    Raster_RectFillAlpha(alpha.data(), 66, 0xFF, 0, 1, 1, 2);
    EXPECT_EQ(std::find(filled.begin(), filled.end(), 0xFF) - filled.begin(), 66);
    EXPECT_EQ(std::find(filled.begin() + 70, filled.end(), 0xFF) - filled.begin(), 130);
    EXPECT_EQ(std::find(alpha.begin(), alpha.end(), 0xFF) - alpha.begin(), 69);
    EXPECT_EQ(std::find(alpha.begin() + 70, alpha.end(), 0xFF) - alpha.begin(), 135);
}

// The largest steps there are: rows 2 GB apart, in either direction.
TEST(RectFill, largestLineIncrements) {
    constexpr int64_t kLargest = INT64_C(0x80000000);
    constexpr uint32 kWidth = 9;
    Mapping mapping(2 * kLargest + 4 * pageSize());
    uint8 *middle = mapping.data() + kLargest + pageSize();
    for (const int64_t line : {-kLargest, kLargest - 1})
        for (int32 bytes = 1; bytes <= 4; ++bytes) {
            const int64_t step = rowStep(line, bytes, RowRule::kRoundedSteps);
            const int64_t page = static_cast<int64_t>(pageSize());
            const int64_t offset = (kLargest + page + step) / page * page;
            mapping.open(static_cast<size_t>(kLargest + page), pageSize());
            mapping.open(static_cast<size_t>(offset), 2 * pageSize());
            Raster_RectFill(middle, static_cast<int32>(line), bytes, 0x9A9A9A9A, 0, 0, kWidth, 2);
            const std::vector<uint8> expected(kWidth * static_cast<size_t>(bytes), 0x9A);
            for (const uint8 *row : {middle, middle + step})
                EXPECT_EQ(std::memcmp(row, expected.data(), expected.size()), 0)
                    << "line " << line << ", " << bytes << " bytes per pixel";
        }
}

// Nothing is looked at when there is nothing to do, however large the rest.
TEST(Raster, emptyRectanglesTouchNothing) {
    const FencedBuffer fence(1);
    uint8 *nowhere = fence.end();
    constexpr uint32 kMost = UINT32_MAX;
    for (const Size size : {Size{0, 0}, Size{0, kMost}, Size{kMost, 0}, Size{1, 0}, Size{0, 1}})
        for (uint8 *buffer : {nowhere, static_cast<uint8 *>(nullptr)}) {
            const Surface at = {buffer, 64, 3, 5};
            for (int32 bytes = 1; bytes <= 4; ++bytes) {
                fill(Raster_RectFill, at, bytes, 0, size);
                copy(Raster_RectCopy, at, at, bytes, size);
            }
            fillAlpha(Raster_RectFillAlpha, at, 1, size);
            blend(Raster_AlphaBlendOver, at, at, size);
        }
}

TEST(RectFill, unsupportedDepthIsReportedAheadOfAnyStore) {
    const FencedBuffer fence(1);
    for (const int32 bytes : {0, 5, -1, 8, 32, INT32_MIN, INT32_MAX})
        for (const uint32 side : {0u, 1u}) {
            const std::string message =
                expectPanic([&] { Raster_RectFill(fence.end(), 4, bytes, 0, 0, 0, side, side); });
            panicLine(message, "NOT_IMPLEMENTED lib/raster/rasterops");
            EXPECT_EQ(warnings(),
                      std::vector<std::string>{"Raster: Unsupported frame buffer depth\n"});
        }
}

} // namespace
} // namespace quillon::test
