// The raster operations against their reference.

#include "raster.h"
#include "reference/raster.h"
#include "reference/rop.h"
#include "support/messages.h"
#include "support/surfaces.h"
#include "support/targets.h"

#include <algorithm>
#include <array>
#include <set>

namespace quillon::test {
namespace {

// Do nothing.  A code is all of its 32 bits: 0x103 is not RASTER_ROP_COPY.
constexpr uint32 kIdleCodes[] = {5, 16, 17, 0x103, 0x106, 0x10000, 0x80000000, 0xFFFFFFFF};

// --- Calls

const auto ropFill = [](auto function, const Surface &dst, int32 bytes, uint32 pixel, uint32 rop,
                        Size size) {
    function(dst.buffer, dst.signedLine(), bytes, pixel, rop, dst.x, dst.y, size.width,
             size.height);
};
const auto ropCopy = [](auto function, const Surface &dst, const Surface &src, int32 bytes,
                        uint32 rop, Size size) {
    function(dst.buffer, dst.signedLine(), src.buffer, src.signedLine(), bytes, src.x, src.y, rop,
             dst.x, dst.y, size.width, size.height);
};

// The ways in which the coordinates make a copy go through its rectangles.
enum class Walk { kDown, kUp, kLeftwards };
constexpr Walk kWalks[] = {Walk::kDown, Walk::kUp, Walk::kLeftwards};

std::ostream &operator<<(std::ostream &out, Walk walk) {
    return out << std::array{"down", "up", "leftwards"}[static_cast<size_t>(walk)];
}

// A copy, but for its surfaces.
struct Copy {
    int32 bytes;
    uint32 rop;
    Walk walk;
    Size size;

    size_t rowBytes() const { return size.width * static_cast<size_t>(bytes); }

    // From each row to the next one that is gone through.
    int64_t step(int64_t line) const {
        const RowRule rule = rop == RASTER_ROP_COPY ? RowRule::kExact : RowRule::kRoundedSteps;
        return rowStep(walk == Walk::kUp ? -line : line, bytes, rule);
    }
};

std::ostream &operator<<(std::ostream &out, const Copy &copy) {
    return out << "code " << copy.rop << ", " << copy.bytes << " bytes per pixel, " << copy.walk
               << ", " << copy.size.width << " x " << copy.size.height;
}

// Coordinates as they come, up to the largest, the first below the second.
std::pair<uint32, uint32> ascending(Random &random) {
    const auto any = [&] {
        const uint32 small = random.below(100);
        return random.oneOf({0u, 1u, small, random.word(), UINT32_MAX - small, UINT32_MAX});
    };
    uint32 one = any(), two = any();
    while (one == two)
        two = any();
    return std::minmax({one, two});
}

// The two surfaces of a copy, whose walks begin in the rows at dstFirst and
// srcFirst.
struct Pair {
    Surface dst, src;

    Pair(Random &random, const Copy &copy, uint8 *dstFirst, int64_t dstLine, uint8 *srcFirst,
         int64_t srcLine) {
        const auto [lowX, highX] = ascending(random);
        const auto [lowY, highY] = ascending(random);
        dst = {nullptr, dstLine, lowX, lowY};
        src = {nullptr, srcLine, highX, lowY};
        if (copy.walk == Walk::kLeftwards || random.oneIn(2))
            std::swap(dst.x, src.x);
        if (copy.walk == Walk::kUp)
            dst.y = highY;
        else if (copy.walk == Walk::kDown && (dst.x > src.x || random.oneIn(2)))
            src.y = highY;
        else if (copy.walk == Walk::kDown && random.oneIn(4))
            dst.x = src.x;
        place(dst, dstFirst, copy);
        place(src, srcFirst, copy);
    }

private:
    static void place(Surface &surface, uint8 *first, const Copy &copy) {
        const uint64_t lastRow = uint64_t{surface.y} + copy.size.height - 1;
        const uint64_t row = copy.walk == Walk::kUp ? lastRow : surface.y;
        surface.buffer = reinterpret_cast<uint8 *>(reinterpret_cast<uintptr_t>(first) -
                                                   row * static_cast<uint64_t>(surface.line) -
                                                   surface.x * static_cast<uint64_t>(copy.bytes));
    }
};

Size randomSize(Random &random) {
    return {randomWidth(random), random.oneIn(8) ? random.below(40) : random.below(6)};
}

// --- Every value

// The operations by their names.
uint8 named(uint32 rop, uint8 s, uint8 d) {
    const auto result = [=]() -> int {
        switch (rop) {
        case RASTER_ROP_CLEAR:
            return 0;
        case RASTER_ROP_AND:
            return s & d;
        case RASTER_ROP_AND_REVERSE:
            return s & ~d;
        case RASTER_ROP_COPY:
            return s;
        case RASTER_ROP_AND_INVERTED:
            return ~s & d;
        case RASTER_ROP_NOOP:
            return d;
        case RASTER_ROP_XOR:
            return s ^ d;
        case RASTER_ROP_OR:
            return s | d;
        case RASTER_ROP_NOR:
            return ~(s | d);
        case RASTER_ROP_EQUIV:
            return ~(s ^ d);
        case RASTER_ROP_INVERT:
            return ~d;
        case RASTER_ROP_OR_REVERSE:
            return s | ~d;
        case RASTER_ROP_COPY_INVERTED:
            return ~s;
        case RASTER_ROP_OR_INVERTED:
            return ~s | d;
        case RASTER_ROP_NAND:
            return ~(s & d);
        case RASTER_ROP_SET:
            return 0xFF;
        default:
            ADD_FAILURE() << "no operation " << rop;
            return 0;
        }
    };
    return static_cast<uint8>(result());
}

// Every pair of bytes under every code, in each byte of a pixel.
TEST(RasterOperations, everyPairOfBytes) {
    constexpr uint32 kSide = 256;
    for (uint32 bytes = 1; bytes <= 4; ++bytes) {
        const uint32 line = kSide * bytes;
        std::vector<uint8> src(size_t{kSide} * line), before(src.size()), expected(src.size());
        for (uint32 y = 0; y < kSide; ++y)
            for (uint32 x = 0; x < kSide; ++x)
                for (uint32 i = 0; i < bytes; ++i) { // shifted, lest one byte pass for another
                    src[y * line + x * bytes + i] = static_cast<uint8>(y + 85 * i);
                    before[y * line + x * bytes + i] = static_cast<uint8>(x + 43 * i);
                }
        const Size size = {kSide, kSide};
        for (uint32 rop = 0; rop <= 15; ++rop) {
            std::transform(src.begin(), src.end(), before.begin(), expected.begin(),
                           [=](uint8 s, uint8 d) { return named(rop, s, d); });
            forEachTarget([&] {
                std::vector<uint8> dst = before;
                const auto depth = static_cast<int32>(bytes);
                ropCopy(Raster_RectROPcopy, {dst.data(), line, 0, 0}, {src.data(), line, 0, 0},
                        depth, rop, size);
                ASSERT_TRUE(dst == expected) << "copy, code " << rop << ", " << bytes;
                dst = before;
                for (uint32 y = 0; y < kSide; ++y) {
                    uint32 pixel = 0xFFFFFFFF; // of which only the low bytes count
                    std::copy_n(&src[size_t{y} * line], bytes, reinterpret_cast<uint8 *>(&pixel));
                    ropFill(Raster_RectROPfill, {dst.data(), line, 0, y}, depth, pixel, rop,
                            {kSide, 1});
                }
                ASSERT_TRUE(dst == expected) << "fill, code " << rop << ", " << bytes;
            });
        }
    }
}

// --- Random rectangles

TEST(RectROPfill, matchesReference) {
    TwinMemory memory;
    forEachTarget([&] {
        forEachCase(6000, [&](Random &random) {
            const int32 bytes = random.between(1, 4);
            const uint32 rop = random.below(16);
            const uint32 pixel = random.oneIn(4) ? random.below(256) * 0x01010101 : random.word();
            Size size = randomSize(random);
            const size_t rowBytes = size.width * static_cast<size_t>(bytes);
            const int64_t line = randomLine(random, rowBytes, true);
            const int64_t step = rowStep(line, bytes, RowRule::kRoundedSteps);
            size = fitted(size, memory, rowBytes, step);
            uint8 *first = randomPlace(random, memory, size, rowBytes, step);
            const Surface dst = surfaceAt(random, first, line, bytes, RowRule::kRoundedSteps);
            memory.refill(random);
            ropFill(Raster_RectROPfill, dst, bytes, pixel, rop, size);
            ropFill(reference::rectRopFill, memory.inModel(dst), bytes, pixel, rop, size);
            EXPECT_TRUE(memory.agree())
                << "code " << rop << ", " << bytes << " bytes per pixel, line " << line << ", "
                << size.width << " x " << size.height;
        });
    });
}

TEST(RectROPcopy, matchesReference) {
    TwinMemory memory, other;
    forEachTarget([&] {
        forEachCase(8000, [&](Random &random) {
            Copy copy = {random.between(1, 4), random.below(16), kWalks[random.below(3)],
                         randomSize(random)};
            TwinMemory &srcMemory = random.oneIn(2) ? other : memory;
            const int64_t dstLine = randomLine(random, copy.rowBytes(), true);
            // Often the same one, as on surfaces of one size.
            const int64_t srcLine =
                random.oneIn(2) ? dstLine : randomLine(random, copy.rowBytes(), true);
            for (const int64_t line : {dstLine, srcLine})
                copy.size = fitted(copy.size, memory, copy.rowBytes(), copy.step(line));
            const auto anywhere = [&](const TwinMemory &in, int64_t line) {
                return randomPlace(random, in, copy.size, copy.rowBytes(), copy.step(line));
            };
            const Pair pair(random, copy, anywhere(memory, dstLine), dstLine,
                            anywhere(srcMemory, srcLine), srcLine);
            memory.refill(random);
            other.refill(random);
            ropCopy(Raster_RectROPcopy, pair.dst, pair.src, copy.bytes, copy.rop, copy.size);
            ropCopy(reference::rectRopCopy, memory.inModel(pair.dst), srcMemory.inModel(pair.src),
                    copy.bytes, copy.rop, copy.size);
            EXPECT_TRUE(memory.agree()) << copy << ", lines " << dstLine << ", " << srcLine;
            EXPECT_TRUE(other.agree());
        });
    });
}

// Rectangles at every distance at which a vector can run into itself, with rows
// of several lengths that follow, or overlap, each other.
TEST(RectROPcopy, overlapAtEveryDistance) {
    constexpr int kMost = 128;
    TwinMemory memory;
    uint8 *middle = memory.data() + memory.size() / 2;
    const auto atEveryDistance = [&](Random &random, Copy copy) {
        const int64_t dstLine = randomLine(random, copy.rowBytes(), true);
        // At another step the distance changes from row to row.
        const int64_t srcLine = random.oneIn(2) ? dstLine : dstLine + random.between(-20, 20);
        for (int distance = -kMost; distance <= kMost; ++distance) {
            copy.rop = random.below(16);
            const Pair pair(random, copy, middle + distance, dstLine, middle, srcLine);
            memory.refill(random);
            ropCopy(Raster_RectROPcopy, pair.dst, pair.src, copy.bytes, copy.rop, copy.size);
            ropCopy(reference::rectRopCopy, memory.inModel(pair.dst), memory.inModel(pair.src),
                    copy.bytes, copy.rop, copy.size);
            ASSERT_TRUE(memory.agree())
                << copy << ", lines " << dstLine << ", " << srcLine << ", distance " << distance;
        }
    };
    forEachTarget([&] {
        for (const int32 bytes : {1, 2, 3, 4})
            for (const Walk walk : kWalks)
                forEachCase(10, [&](Random &random) {
                    const Size size = {1 + random.below(100), 1 + random.below(4)};
                    atEveryDistance(random, {bytes, 0, walk, size});
                });
    });
}

// Within one surface, what comes out is a combination of the rectangles as they
// were before.
TEST(RectROPcopy, withinOneSurface) {
    constexpr uint32 kWidth = 40, kHeight = 30;
    forEachCase(4000, [&](Random &random) {
        const uint32 bytes = 1 + random.below(4), rop = random.below(16);
        const uint32 line = (kWidth + random.below(2)) * bytes;
        const Size size = {random.below(kWidth + 1), random.below(kHeight + 1)};
        const auto place = [&](uint32 room) {
            return std::pair(random.below(room + 1), random.below(room + 1));
        };
        auto [srcX, dstX] = place(kWidth - size.width);
        auto [srcY, dstY] = place(kHeight - size.height);
        if (random.oneIn(3))
            dstY = srcY;
        std::vector<uint8> surface(size_t{kHeight} * line);
        random.fill(surface.data(), surface.size());
        std::vector<uint8> expected = surface;
        const auto at = [=](uint32 x, uint32 y) { return size_t{y} * line + size_t{x} * bytes; };
        for (uint32 row = 0; row < size.height; ++row) {
            const uint8 *src = surface.data() + at(srcX, srcY + row);
            const size_t dst = at(dstX, dstY + row);
            std::transform(src, src + at(size.width, 0), surface.data() + dst,
                           expected.data() + dst,
                           [=](uint8 s, uint8 d) { return named(rop, s, d); });
        }
        Raster_RectROPcopy(surface.data(), static_cast<int32>(line), surface.data(),
                           static_cast<int32>(line), static_cast<int32>(bytes), srcX, srcY, rop,
                           dstX, dstY, size.width, size.height);
        EXPECT_EQ(surface, expected) << "code " << rop << ", " << bytes << " bytes per pixel";
    });
}

// --- What is left alone

// Rows alone between inaccessible pages: nothing beyond any row is read, and
// nothing is written, not even with the value that it has.
TEST(RasterOperations, stayInsideEveryRow) {
    TwinRows dst, src;
    Random random(baseSeed());
    // The same rows, under other coordinates.
    const auto moved = [](Surface surface, int32 bytes, uint32 x, uint32 y) {
        return Surface{surface.buffer - y * surface.line - int64_t{x} * bytes, surface.line, x, y};
    };
    const auto check = [&](const Copy &copy, FencedBuffer::Flush flush) {
        const auto [bytes, rop, walk, size] = copy;
        const uint32 dstX = walk == Walk::kLeftwards ? 1 : 0, dstY = walk == Walk::kUp ? 1 : 0;
        ropCopy(Raster_RectROPcopy, moved(dst.fenced(flush, copy.rowBytes()), bytes, dstX, dstY),
                src.fenced(flush, copy.rowBytes()), bytes, rop, size);
        ropCopy(reference::rectRopCopy,
                moved(dst.inModel(flush, copy.rowBytes()), bytes, dstX, dstY),
                src.inModel(flush, copy.rowBytes()), bytes, rop, size);
        ASSERT_TRUE(dst.agree()) << copy;
        if (walk != Walk::kDown)
            return;
        ropFill(Raster_RectROPfill, dst.fenced(flush, copy.rowBytes()), bytes, 0x5A6978, rop, size);
        ropFill(reference::rectRopFill, dst.inModel(flush, copy.rowBytes()), bytes, 0x5A6978, rop,
                size);
        ASSERT_TRUE(dst.agree()) << copy << " (fill)";
    };
    forEachTarget([&] {
        for (uint32 width = 0; width <= 140; ++width) {
            noteStep("width", width);
            dst.refill(random);
            src.refill(random);
            for (const auto flush : {FencedBuffer::Flush::kBefore, FencedBuffer::Flush::kBehind})
                for (const int32 bytes : {1, 2, 3, 4})
                    for (const Walk walk : kWalks)
                        for (const uint32 rop : {RASTER_ROP_XOR, RASTER_ROP_COPY_INVERTED,
                                                 RASTER_ROP_INVERT, RASTER_ROP_SET})
                            check({bytes, rop, walk, {width, TwinRows::kHeight}}, flush);
            ASSERT_TRUE(src.agree());
        }
    });
}

TEST(RectROPcopy, sourceIsNotTouchedWhereItDoesNotCount) {
    const FencedBuffer fence(1);
    TwinMemory memory;
    forEachTarget([&] {
        for (const uint32 rop : {RASTER_ROP_CLEAR, RASTER_ROP_INVERT, RASTER_ROP_SET})
            forEachCase(200, [&](Random &random) {
                const Copy copy = {random.between(1, 4),
                                   rop,
                                   kWalks[random.below(3)],
                                   {random.below(150), random.below(4)}};
                const auto line = static_cast<int64_t>(copy.rowBytes());
                uint8 *first = memory.data() + memory.size() / 2;
                uint8 *inModel = memory.inModel({first, 0, 0, 0}).buffer;
                uint8 *nowhere = random.oneIn(2) ? fence.end() : nullptr;
                const Pair pair(random, copy, first, line, nowhere, line);
                const Pair model(random, copy, inModel, line, inModel, line);
                memory.refill(random);
                ropCopy(Raster_RectROPcopy, pair.dst, pair.src, copy.bytes, rop, copy.size);
                ropCopy(reference::rectRopCopy, model.dst, model.src, copy.bytes, rop, copy.size);
                EXPECT_TRUE(memory.agree()) << copy;
            });
    });
}

// No operation and empty rectangles: nothing is looked at, however large the
// rest, and nothing is said.
TEST(RasterOperations, touchNothingWhereThereIsNothingToDo) {
    constexpr uint32 kMost = UINT32_MAX;
    const FencedBuffer fence(1);
    clearMessages();
    const auto call = [](uint8 *nowhere, uint32 rop, Size size) {
        for (int32 bytes = 1; bytes <= 4; ++bytes)
            for (const uint32 dstX : {2u, 4u})
                for (const uint32 dstY : {4u, 5u, 6u}) {
                    const Surface dst = {nowhere, 64, dstX, dstY};
                    ropCopy(Raster_RectROPcopy, dst, {nowhere, 64, 3, 5}, bytes, rop, size);
                    ropFill(Raster_RectROPfill, dst, bytes, 0x12345678, rop, size);
                }
    };
    for (uint8 *nowhere : {fence.end(), static_cast<uint8 *>(nullptr)}) {
        for (const uint32 rop : kIdleCodes)
            for (const Size size : {Size{1, 1}, Size{999, 999}, Size{kMost, kMost}, Size{0, 0}})
                call(nowhere, rop, size);
        for (uint32 rop = 0; rop <= 15; ++rop)
            for (const Size size :
                 {Size{0, 0}, Size{0, 1}, Size{1, 0}, Size{0, kMost}, Size{kMost, 0}})
                call(nowhere, rop, size);
    }
    EXPECT_TRUE(warnings().empty());
}

// --- Known values

TEST(RectROPfill, knownValues) {
    std::array<uint8, 5> memory = {0x01, 0x02, 0x03, 0x04, 0x05};
    Raster_RectROPfill(memory.data() + 1, 3, 3, 0xFF102030, RASTER_ROP_XOR, 0, 0, 1, 1);
    EXPECT_EQ(memory, (std::array<uint8, 5>{0x01, 0x32, 0x23, 0x14, 0x05}));
    Raster_RectROPfill(memory.data() + 1, 4, 2, 0xABCD1234, RASTER_ROP_OR, 0, 0, 1, 1);
    EXPECT_EQ(memory, (std::array<uint8, 5>{0x01, 0x36, 0x33, 0x14, 0x05}));
}

// A line increment of 66 at 4 bytes per pixel, where 64 and -68 are the nearest
// whole steps, and the mirror image of it.
TEST(RasterOperations, stepsOfWholePixels) {
    constexpr ptrdiff_t kRows = 300;
    struct Expected {
        int32 line;
        uint32 dstY;
        uint32 rop;
        std::array<ptrdiff_t, 3> rows; // walked, from the buffer
    };
    for (const auto &[line, dstY, rop, rows] : {
             Expected{66, 1, RASTER_ROP_COPY_INVERTED, {198, 130, 62}}, // up
             Expected{66, 0, RASTER_ROP_COPY_INVERTED, {0, 64, 128}},
             Expected{66, 1, RASTER_ROP_COPY, {66, 132, 198}},
             Expected{-66, 1, RASTER_ROP_COPY_INVERTED, {-198, -134, -70}},
             Expected{-66, 0, RASTER_ROP_COPY_INVERTED, {0, -68, -136}},
         }) {
        std::vector<uint8> memory(2 * kRows), expected(memory.size());
        const std::array<uint8, 12> src = rop == RASTER_ROP_COPY
                                              ? std::array<uint8, 12>{0xFF, 0xFF, 0xFF, 0xFF}
                                              : std::array<uint8, 12>{};
        for (const ptrdiff_t row : rows)
            std::fill_n(expected.data() + kRows + row, 4, 0xFF);
        // The source is one row, over and over.
        Raster_RectROPcopy(memory.data() + kRows, line, src.data(), 0, 4, 0, 0, rop, 0, dstY, 1, 3);
        EXPECT_EQ(memory, expected) << "line " << line << ", y " << dstY << ", code " << rop;
    }
    std::vector<uint8> memory(256), expected(memory.size());
    for (const size_t row : {66u, 130u})
        std::fill_n(expected.data() + row, 4, 0xFF);
    Raster_RectROPfill(memory.data(), 66, 4, 0, RASTER_ROP_SET, 0, 1, 1, 2);
    EXPECT_EQ(memory, expected);
}

// Pixels of 3 bytes that overlap go byte by byte, in the direction of the row.
TEST(RectROPcopy, orderWithinPixels) {
    const std::array<uint8, 4> before = {0x11, 0x22, 0x33, 0x44};
    std::array<uint8, 4> memory = before;
    Raster_RectROPcopy(&memory[1], 3, memory.data(), 3, 3, 0, 0, RASTER_ROP_COPY_INVERTED, 0, 0, 1,
                       1);
    EXPECT_EQ(memory, (std::array<uint8, 4>{0x11, 0xEE, 0x11, 0xEE}));
    std::array<uint8, 8> wide = {0, 0, 0, 0x11, 0x22, 0x33, 0x44};
    Raster_RectROPcopy(&wide[1], 8, &wide[3], 8, 3, 0, 0, RASTER_ROP_COPY_INVERTED, 1, 0, 1, 1);
    EXPECT_EQ(wide, (std::array<uint8, 8>{0, 0, 0, 0x11, 0xEE, 0xDD, 0xCC}));
}

// The largest steps there are: rows 2 GB apart, in either direction.
TEST(RectROPcopy, largestLineIncrements) {
    constexpr int64_t kLargest = INT64_C(0x80000000);
    const auto page = static_cast<int64_t>(pageSize());
    Mapping mapping(static_cast<size_t>(2 * kLargest + 4 * page));
    uint8 *middle = mapping.data() + kLargest + page;
    Random random(baseSeed());
    for (const int64_t line : {-kLargest, kLargest - 1})
        for (const int32 bytes : {1, 2, 3, 4})
            for (const Walk walk : kWalks) {
                const Copy copy = {bytes, RASTER_ROP_COPY_INVERTED, walk, {9, 2}};
                const int64_t step = copy.step(line);
                mapping.open(static_cast<size_t>(kLargest + page), pageSize());
                mapping.open(static_cast<size_t>((kLargest + page + step) / page * page),
                             2 * pageSize());
                std::fill_n(middle, 200, uint8{0});
                std::fill_n(middle + step, 200, uint8{0});
                const Pair pair(random, copy, middle, line, middle + 100, line);
                ropCopy(Raster_RectROPcopy, pair.dst, pair.src, bytes, copy.rop, copy.size);
                for (const uint8 *row : {middle, middle + step})
                    EXPECT_EQ(std::count(row, row + 100, 0xFF), 9 * bytes) << copy << line;
            }
}

// --- Unsupported depths

TEST(RasterOperations, unsupportedDepthIsReportedAheadOfAnyStore) {
    const FencedBuffer fence(1);
    uint8 *nowhere = fence.end();
    const auto lineOf = [](const auto &call) {
        const int line = panicLine(expectPanic(call), "NOT_IMPLEMENTED lib/raster/rasterops");
        EXPECT_EQ(warnings(), std::vector<std::string>{"Raster: Unsupported frame buffer depth\n"});
        return line;
    };
    std::set<int> plainFill, fill, copy, copyLeftwards;
    for (const int32 bytes : {0, 5, -1, 7, 8, 32, 0x101, INT32_MIN, INT32_MAX})
        for (const Size size : {Size{0, 0}, Size{1, 1}}) {
            plainFill.insert(
                lineOf([&] { Raster_RectFill(nowhere, 4, bytes, 0, 0, 0, size.width, 1); }));
            for (const uint32 rop : {0u, 1u, 3u, 5u, 10u, 15u, 16u, 0x103u, 0x80000000u}) {
                const auto filling = [&] {
                    ropFill(Raster_RectROPfill, {nowhere, 4, 0, 0}, bytes, 0, rop, size);
                };
                if (rop == RASTER_ROP_COPY) { // the fill's own check; the copy has none
                    plainFill.insert(lineOf(filling));
                    continue;
                }
                fill.insert(lineOf(filling));
                for (const uint32 dstX : {2u, 3u, 4u, UINT32_MAX})
                    for (const uint32 dstY : {4u, 5u, 6u}) {
                        const bool leftwards = dstX > 3 && dstY == 5;
                        (leftwards ? copyLeftwards : copy).insert(lineOf([&] {
                            ropCopy(Raster_RectROPcopy, {nowhere, 4, dstX, dstY},
                                    {nowhere, 4, 3, 5}, bytes, rop, size);
                        }));
                    }
            }
        }
    std::set<int> lines;
    for (const std::set<int> &each : {plainFill, fill, copy, copyLeftwards}) {
        EXPECT_EQ(each.size(), 1U); // one check each
        lines.insert(each.begin(), each.end());
    }
    EXPECT_EQ(lines.size(), 4U); // and no two the same
}

TEST(RectROPcopy, plainCopyTakesAnyCountOfBytes) {
    std::array<uint8, 14> memory = {1, 2, 3, 4, 5, 6, 7};
    clearMessages();
    for (const int32 bytes : {0, -1, 7})
        Raster_RectROPcopy(memory.data() + 7, 7, memory.data(), 7, bytes, 0, 0, RASTER_ROP_COPY, 0,
                           0, 1, 1);
    EXPECT_EQ(memory, (std::array<uint8, 14>{1, 2, 3, 4, 5, 6, 7, 1, 2, 3, 4, 5, 6, 7}));
    EXPECT_TRUE(warnings().empty());
}

} // namespace
} // namespace quillon::test
