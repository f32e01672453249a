// Bit and stencil expansion against their reference.

#include "raster.h"
#include "reference/bits.h"
#include "support/messages.h"
#include "support/surfaces.h"
#include "support/targets.h"

#include <algorithm>
#include <array>
#include <atomic>
#include <thread>

namespace quillon::test {
namespace {

enum class Kind { kOpaque, kStencil };

// The arguments of any of the functions.
struct Expansion {
    Kind kind;
    int32 bytes;
    int32 width;
    uint32 height;
    uint32 foreground, background;

    size_t dstRow() const { return static_cast<size_t>(width) * static_cast<size_t>(bytes); }
    size_t bitsRow() const { return (static_cast<size_t>(width) + 7) / 8; }
    Size size() const { return {static_cast<uint32>(width), height}; }
};

std::ostream &operator<<(std::ostream &out, const Expansion &call) {
    return out << (call.kind == Kind::kOpaque ? "opaque, " : "stencil, ") << call.bytes
               << " bytes per pixel, " << call.width << " x " << call.height;
}

struct Rows {
    uint8 *first;
    int64_t line;

    int32 signedLine() const { return static_cast<int32>(line); }
};

void expand(const Expansion &call, const Rows &dst, const Rows &bits) {
    if (call.kind == Kind::kOpaque)
        Raster_BitsToPixels(bits.first, bits.signedLine(), dst.first, dst.signedLine(), call.bytes,
                            call.width, call.height, call.foreground, call.background);
    else
        Raster_BitsToPixelsStencil(bits.first, bits.signedLine(), dst.first, dst.signedLine(),
                                   call.bytes, call.width, call.height, call.foreground);
}

// The same by the function that has the pixel size in its name.
void expandDirectly(const Expansion &call, const Rows &dst, const Rows &bits) {
    constexpr std::array opaque = {RasterBitsToPixels8, RasterBitsToPixels16, RasterBitsToPixels24,
                                   RasterBitsToPixels32};
    constexpr std::array stencil = {RasterBitsToPixelsStencil8, RasterBitsToPixelsStencil16,
                                    RasterBitsToPixelsStencil24, RasterBitsToPixelsStencil32};
    const auto member = static_cast<size_t>(call.bytes - 1);
    if (call.kind == Kind::kOpaque)
        opaque[member](bits.first, bits.signedLine(), dst.first, dst.signedLine(), call.width,
                       call.height, call.foreground, call.background);
    else
        stencil[member](bits.first, bits.signedLine(), dst.first, dst.signedLine(), call.width,
                        call.height, call.foreground);
}

void expandByReference(const Expansion &call, const Rows &dst, const Rows &bits) {
    if (call.kind == Kind::kOpaque)
        reference::bitsToPixels(bits.first, bits.signedLine(), dst.first, dst.signedLine(),
                                call.bytes, call.width, call.height, call.foreground,
                                call.background);
    else
        reference::bitsToPixelsStencil(bits.first, bits.signedLine(), dst.first, dst.signedLine(),
                                       call.bytes, call.width, call.height, call.foreground);
}

Expansion randomExpansion(Random &random, uint32 width, uint32 height) {
    return {random.oneIn(2) ? Kind::kOpaque : Kind::kStencil,
            random.between(1, 4),
            static_cast<int32>(width),
            height,
            random.word(),
            random.word()};
}

// Dense or sparse bits, or all of them alike.
void fillBits(Random &random, uint8 *bits, size_t size) {
    std::vector<uint8> mask(size);
    random.fill(bits, size);
    for (uint32 times = random.below(4); times > 0; --times) {
        random.fill(mask.data(), size);
        std::transform(bits, bits + size, mask.begin(), bits,
                       [](uint8 a, uint8 b) { return static_cast<uint8>(a & b); });
    }
    if (random.oneIn(8))
        std::fill_n(bits, size, random.oneOf<uint8>({0, 0xFF}));
    else if (random.oneIn(2)) // rather few clear ones
        std::transform(bits, bits + size, bits,
                       [](uint8 byte) { return static_cast<uint8>(~byte); });
}

TEST(BitsToPixels, matchesReference) {
    TwinMemory memory, bitmap;
    forEachTarget([&] {
        forEachCase(6000, [&](Random &random) {
            Expansion call = randomExpansion(random, randomWidth(random), random.below(6));
            if (random.oneIn(3)) // a bitmap whose rows are whole bytes, end to end
                call.width &= ~7;
            const int64_t dstLine = randomLine(random, call.dstRow(), true);
            const int64_t bitsLine = randomLine(random, call.bitsRow(), true);
            call.height = fitted(call.size(), memory, call.dstRow(), dstLine).height;
            call.height = fitted(call.size(), bitmap, call.bitsRow(), bitsLine).height;
            const Rows dst = {randomPlace(random, memory, call.size(), call.dstRow(), dstLine),
                              dstLine};
            const Rows bits = {randomPlace(random, bitmap, call.size(), call.bitsRow(), bitsLine),
                               bitsLine};
            memory.refill(random);
            fillBits(random, bitmap.data(), bitmap.size());
            (random.oneIn(2) ? expand : expandDirectly)(call, dst, bits);
            expandByReference(call, {memory.inModel({dst.first, 0, 0, 0}).buffer, dstLine}, bits);
            EXPECT_TRUE(memory.agree()) << call << ", lines " << dstLine << ", " << bitsLine;
        });
    });
}

// Rows alone between inaccessible pages, of the bitmap too: no byte is read
// behind the last that has a pixel, and none written beyond a row.
TEST(BitsToPixels, staysInsideEveryRow) {
    TwinRows dst, bits;
    Random random(baseSeed());
    const auto check = [&](const Expansion &call, FencedBuffer::Flush flush) {
        const auto [dstFirst, dstLine, x, y] = dst.fenced(flush, call.dstRow());
        const auto [bitsFirst, bitsLine, bitsX, bitsY] = bits.fenced(flush, call.bitsRow());
        const Surface inModel = dst.inModel(flush, call.dstRow());
        expand(call, {dstFirst, dstLine}, {bitsFirst, bitsLine});
        expandByReference(call, {inModel.buffer, inModel.line}, {bitsFirst, bitsLine});
        ASSERT_TRUE(dst.agree()) << call;
    };
    forEachTarget([&] {
        for (int32 width = 0; width <= 270; ++width) {
            noteStep("width", static_cast<uint64_t>(width));
            dst.refill(random);
            bits.refill(random);
            for (const auto flush : {FencedBuffer::Flush::kBefore, FencedBuffer::Flush::kBehind})
                for (const Kind kind : {Kind::kOpaque, Kind::kStencil})
                    for (const int32 bytes : {1, 2, 3, 4})
                        check({kind, bytes, width, TwinRows::kHeight, random.word(), random.word()},
                              flush);
            ASSERT_TRUE(bits.agree());
        }
    });
}

// A page of which pixels under set bits are part, amid inaccessible ones where
// all bits are clear.
TEST(BitsToPixelsStencil, touchesNoPageWhereAllBitsAreClear) {
    const FencedBuffer page(pageSize());
    std::vector<uint8> model(page.size()), bitmap(64);
    forEachTarget([&] {
        forEachCase(6000, [&](Random &random) {
            Expansion call = randomExpansion(random, 1 + random.below(300), 1);
            call.kind = Kind::kStencil;
            const auto rowBytes = static_cast<int32>(call.dstRow());
            // The first byte's place in the page, across one of its ends.
            const auto end = static_cast<int32>(random.oneIn(2) ? 0 : page.size());
            const int32 start = end - random.between(0, rowBytes);
            fillBits(random, bitmap.data(), bitmap.size());
            for (int32 x = 0; x < call.width; ++x) {
                const int32 at = start + x * call.bytes;
                if (at < 0 || at + call.bytes > static_cast<int32>(page.size()))
                    bitmap[static_cast<size_t>(x / 8)] &= static_cast<uint8>(~(0x80 >> x % 8));
            }
            random.fill(model.data(), model.size());
            std::copy(model.begin(), model.end(), page.data());
            expand(call, {page.data() + start, rowBytes}, {bitmap.data(), 0});
            expandByReference(call, {model.data() + start, rowBytes}, {bitmap.data(), 0});
            EXPECT_TRUE(std::equal(model.begin(), model.end(), page.data()))
                << call << ", from byte " << start << " of the page";
        });
    });
}

// Pixels under clear bits belong to others: what another thread writes there is
// never lost to a pixel that is read and written back.
TEST(BitsToPixelsStencil, leavesClearPixelsToAnotherThread) {
    constexpr int32 kWidth = 64;
    constexpr int kRounds = 1000; // of the other thread
    const auto check = [&](int32 bytes, uint8 pattern) {
        const Expansion call = {Kind::kStencil, bytes, kWidth, 1, 0x12345678, 0};
        std::vector<uint8> bitmap(kWidth / 8, pattern), surface(call.dstRow());
        std::vector<uint8 *> others;
        for (size_t i = 0; i < surface.size(); ++i)
            if ((pattern << (i / static_cast<size_t>(bytes) % 8) & 0x80) == 0)
                others.push_back(&surface[i]);
        std::atomic<bool> started = false;
        std::atomic<int> rounds = 0, lost = 0;
        std::thread other([&] {
            started = true;
            while (rounds < kRounds) {
                const auto value = static_cast<uint8>(rounds);
                for (uint8 *byte : others)
                    std::atomic_ref(*byte).store(value, std::memory_order_relaxed);
                for (uint8 *byte : others)
                    lost += std::atomic_ref(*byte).load(std::memory_order_relaxed) != value;
                ++rounds;
            }
        });
        while (!started)
            std::this_thread::yield();
        while (rounds < kRounds)
            expand(call, {surface.data(), 0}, {bitmap.data(), 0});
        other.join();
        EXPECT_EQ(lost, 0) << call;
    };
    forEachTarget([&] {
        for (const int32 bytes : {1, 2, 3, 4})
            for (const int pattern : {0x00, 0x55, 0x7E})
                check(bytes, static_cast<uint8>(pattern));
    });
}

// Nothing is looked at when there is nothing to do, and nothing is said.
TEST(BitsToPixels, touchesNothingWhereThereIsNothingToDo) {
    const FencedBuffer fence(1);
    clearMessages();
    const auto call = [](uint8 *nowhere, int32 bytes, int32 width, uint32 height) {
        for (const Kind kind : {Kind::kOpaque, Kind::kStencil}) {
            const Expansion expansion = {kind, bytes, width, height, 1, 2};
            expand(expansion, {nowhere, 64}, {nowhere, 8});
            if (bytes >= 1 && bytes <= 4)
                expandDirectly(expansion, {nowhere, 64}, {nowhere, 8});
        }
    };
    for (uint8 *nowhere : {fence.end(), static_cast<uint8 *>(nullptr)}) {
        for (const int32 bytes : {1, 2, 3, 4}) {
            for (const int32 width : {0, -1, -8, INT32_MIN})
                for (const uint32 height : {0u, 1u, 1000u, UINT32_MAX})
                    call(nowhere, bytes, width, height);
            call(nowhere, bytes, 9, 0);
        }
        for (const int32 bytes : {0, 5, -1, 8, 32, 0x101, INT32_MIN, INT32_MAX})
            call(nowhere, bytes, 9, 2);
    }
    EXPECT_TRUE(warnings().empty());
}

TEST(BitsToPixels, knownValues) {
    constexpr uint32 kFore = 0xA1B2C3D4, kBack = 0x01020304;
    const std::array<uint8, 2> bitmap = {0xA5, 0x9F};
    const std::array<uint8, 12> leftmostIsTheHighBit = {1, 0, 1, 0, 0, 1, 0, 1, 1, 0, 0, 1};
    std::array<uint8, 13> bytes = {};
    Raster_BitsToPixels(bitmap.data(), 2, bytes.data(), 12, 1, 12, 1, 1, 0x100);
    EXPECT_TRUE(std::equal(leftmostIsTheHighBit.begin(), leftmostIsTheHighBit.end(), bytes.data()));

    std::array<uint8, 10> packed = {};
    Raster_BitsToPixels(bitmap.data(), 2, packed.data(), 9, 3, 3, 1, kFore, kBack);
    EXPECT_EQ(packed, (std::array<uint8, 10>{0xD4, 0xC3, 0xB2, 4, 3, 2, 0xD4, 0xC3, 0xB2, 0}));

    // The second row begins at byte 7 exactly, on top of the first one's end.
    std::array<uint8, 16> words = {};
    Raster_BitsToPixels(bitmap.data(), 1, words.data(), 7, 4, 2, 2, kFore, kBack);
    EXPECT_EQ(words, (std::array<uint8, 16>{0xD4, 0xC3, 0xB2, 0xA1, 4, 3, 2, //
                                            0xD4, 0xC3, 0xB2, 0xA1, 4, 3, 2, 1, 0}));

    std::array<uint8, 20> stencilled = {};
    const uint8 ends = 0x81;
    Raster_BitsToPixelsStencil(&ends, 1, stencilled.data(), 16, 2, 8, 1, kFore);
    EXPECT_EQ(stencilled, (std::array<uint8, 20>{0xD4, 0xC3, 0, 0, 0, 0, 0, 0, 0, 0, //
                                                 0, 0, 0, 0, 0xD4, 0xC3}));
}

// The largest steps there are: rows 2 GB apart, in either direction.
TEST(BitsToPixels, largestLineIncrements) {
    constexpr int64_t kLargest = INT64_C(0x80000000);
    const auto page = static_cast<int64_t>(pageSize());
    Mapping mapping(static_cast<size_t>(2 * kLargest + 4 * page));
    uint8 *middle = mapping.data() + kLargest + page;
    for (const int64_t line : {-kLargest, kLargest - 1}) {
        mapping.open(static_cast<size_t>(kLargest + page), pageSize());
        mapping.open(static_cast<size_t>((kLargest + page + line) / page * page), 2 * pageSize());
        for (const Kind kind : {Kind::kOpaque, Kind::kStencil})
            for (const int32 bytes : {1, 2, 3, 4}) {
                const Expansion call = {kind, bytes, 9, 2, 0x9A9A9A9A, 0};
                for (uint8 *row : {middle, middle + line}) {
                    std::fill_n(row, 100, uint8{0});
                    std::fill_n(row + 100, 2, uint8{0xFF});
                }
                expand(call, {middle, line}, {middle + 100, line});
                for (const uint8 *row : {middle, middle + line})
                    EXPECT_EQ(std::count(row, row + 100, 0x9A), 9 * bytes) << call << line;
            }
    }
}

} // namespace
} // namespace quillon::test
