// Bit and stencil expansion against their reference.

#include "raster.h"
#include "reference/bits.h"
#include "support/fence.h"
#include "support/messages.h"
#include "support/surfaces.h"

#include <atomic>
#include <thread>

namespace quillon::test {
namespace {

using Opaque = decltype(&RasterBitsToPixels8);
using Stencil = decltype(&RasterBitsToPixelsStencil8);
constexpr Opaque kOpaque[] = {RasterBitsToPixels8, RasterBitsToPixels16, RasterBitsToPixels24,
                              RasterBitsToPixels32};
constexpr Stencil kStencil[] = {RasterBitsToPixelsStencil8, RasterBitsToPixelsStencil16,
                                RasterBitsToPixelsStencil24, RasterBitsToPixelsStencil32};

// By the general function, or the one that has the pixel size in its name.
Operation expansion(Random &random, bool isStencil) {
    const uint32 member = random.below(4), pixel = random.word(), background = random.word();
    const auto bytes = static_cast<int32>(member + 1);
    const bool isNamed = random.oneIn(2);
    const auto call = [=](bool isReference, const Surfaces &at, Size size) {
        const auto expand = [&](auto function, auto... rest) {
            function(at[1].first, at[1].signedLine(), at[0].first, at[0].signedLine(), rest...);
        };
        const auto width = static_cast<int32>(size.width);
        if (isNamed && !isReference)
            return isStencil ? expand(kStencil[member], width, size.height, pixel)
                             : expand(kOpaque[member], width, size.height, pixel, background);
        if (isStencil)
            expand(isReference ? reference::bitsToPixelsStencil : Raster_BitsToPixelsStencil, bytes,
                   width, size.height, pixel);
        else
            expand(isReference ? reference::bitsToPixels : Raster_BitsToPixels, bytes, width,
                   size.height, pixel, background);
    };
    Operation operation((isStencil ? "stencil " : "opaque ") + std::to_string(bytes),
                        {{.bytes = member + 1}, {.bytes = 0}}, false, true, call);
    operation.mayOverlap = false;
    if (random.oneIn(4)) { // all bits alike
        operation.parts[1].low = random.oneOf({0u, 0xFFu});
        operation.parts[1].count = 1;
    }
    return operation;
}

TEST(BitsToPixels, matchesReference) {
    clearMessages();
    holdToReference(16000, [](Random &random) { return expansion(random, random.oneIn(2)); });
    EXPECT_TRUE(warnings().empty());
}

// More than the caches nearest to a core hold, in rows of which each lies to cache
// lines in its own way.
TEST(BitsToPixels, largeSurfacesMatchReference) {
    constexpr uint32 kWidth = 1013, kHeight = 1700;
    constexpr int32 kBitsLine = (kWidth + 7) / 8;
    forEachCase(4, [&](Random &random) {
        const auto bytes = static_cast<int32>(1 + running.number);
        const int32 line = kWidth * bytes;
        const FencedBuffer bits(kBitsLine * kHeight), dst(static_cast<size_t>(line) * kHeight);
        random.fill(bits.data(), bits.size());
        const auto expand = [&](auto opaque, auto stencil, uint8 *to) {
            opaque(bits.data(), kBitsLine, to, line, bytes, kWidth, kHeight, 0x12345678, 0xABCDEF);
            stencil(bits.data() + kBitsLine, kBitsLine, to, line, bytes, kWidth, kHeight - 1, 0xA5);
        };
        std::vector<uint8> expected(dst.size());
        expand(reference::bitsToPixels, reference::bitsToPixelsStencil, expected.data());
        forEachTarget([&] {
            std::fill(dst.data(), dst.end(), uint8{0});
            expand(Raster_BitsToPixels, Raster_BitsToPixelsStencil, dst.data());
            EXPECT_TRUE(dst.canariesIntact());
            EXPECT_TRUE(std::equal(dst.data(), dst.end(), expected.begin())) << bytes;
        });
    });
}

// A page of which pixels under set bits are part, amid inaccessible ones where
// all bits are clear.
TEST(BitsToPixelsStencil, touchesNoPageWhereAllBitsAreClear) {
    TwinMemory page(pageSize(), 1, 0);
    std::vector<uint8> bitmap(64);
    forEachTarget([&] {
        forEachCase(6000, [&](Random &random) {
            const Operation call = expansion(random, true);
            const auto bytes = static_cast<int32>(call.parts[0].bytes);
            const int32 width = 1 + static_cast<int32>(random.below(300));
            const auto size = static_cast<int32>(page.runBytes());
            // The first byte's place in the page, across one of its ends.
            const int32 start = random.oneOf({0, size}) - random.between(0, width * bytes);
            random.fill(bitmap.data(), bitmap.size());
            for (int32 x = 0; x < width; ++x) {
                const int32 at = start + x * bytes;
                if (at < 0 || at + bytes > size)
                    bitmap[static_cast<size_t>(x / 8)] &= static_cast<uint8>(~(0x80 >> x % 8));
            }
            page.refill(random);
            const auto run = [&](const auto &function, uint8 *first) {
                function({{nullptr, first + start, 0, 0, 0}, {nullptr, bitmap.data(), 0, 0, 0}},
                         {static_cast<uint32>(width), 1});
            };
            run(call.library, page.run(0));
            run(call.reference, page.inModel(page.run(0)));
            EXPECT_TRUE(page.agree()) << call.name << ", from byte " << start << " of the page";
        });
    });
}

// Pixels under clear bits belong to others: what another thread writes there is
// never lost to a pixel that is read and written back.
TEST(BitsToPixelsStencil, leavesClearPixelsToAnotherThread) {
    constexpr uint32 kWidth = 64;
    constexpr int kRounds = 1000; // of the other thread
    const auto check = [&](size_t bytes, uint8 pattern) {
        std::vector<uint8> bitmap(kWidth / 8, pattern), surface(kWidth * bytes);
        std::vector<uint8 *> others;
        for (size_t i = 0; i < surface.size(); ++i)
            if ((pattern << (i / bytes % 8) & 0x80) == 0)
                others.push_back(&surface[i]);
        std::atomic<int> rounds = -1, lost = 0; // -1: not yet started
        std::thread other([&] {
            for (rounds = 0; rounds < kRounds; ++rounds) {
                const auto value = static_cast<uint8>(rounds);
                for (uint8 *byte : others)
                    std::atomic_ref(*byte).store(value, std::memory_order_relaxed);
                for (uint8 *byte : others)
                    lost += std::atomic_ref(*byte).load(std::memory_order_relaxed) != value;
            }
        });
        while (rounds < 0)
            std::this_thread::yield();
        while (rounds < kRounds)
            kStencil[bytes - 1](bitmap.data(), 0, surface.data(), 0, kWidth, 1, 0x12345678);
        other.join();
        EXPECT_EQ(lost, 0) << bytes << " bytes per pixel";
    };
    forEachTarget([&] {
        for (const size_t bytes : {1u, 2u, 3u, 4u})
            for (const uint8 pattern : {uint8{0x00}, uint8{0x55}, uint8{0x7E}})
                check(bytes, pattern);
    });
}

// Widths below 1 and unknown pixel sizes: nothing is looked at, or said.
TEST(BitsToPixels, touchesNothingWhereThereIsNothingToDo) {
    const FencedBuffer fence(1);
    uint8 *nowhere = fence.end();
    clearMessages();
    const auto call = [&](int32 bytes, int32 width, uint32 height) {
        Raster_BitsToPixels(nowhere, 8, nowhere, 64, bytes, width, height, 1, 2);
        Raster_BitsToPixelsStencil(nowhere, 8, nowhere, 64, bytes, width, height, 1);
    };
    for (const int32 bytes : {1, 2, 3, 4})
        for (const int32 width : {-1, -8, INT32_MIN})
            call(bytes, width, 1000);
    for (const int32 bytes : {0, 5, -1, 8, 32, 0x101, INT32_MIN, INT32_MAX})
        call(bytes, 9, 2);
    EXPECT_TRUE(warnings().empty());
}

TEST(BitsToPixels, knownValues) {
    // The leftmost pixel is the high bit; the second row begins at byte 7
    // exactly, on top of the first one's end.
    const uint8 bitmap[] = {0xA5, 0x5F};
    const std::vector<uint8> expected = {0xD4, 0xC3, 0xB2, 0xA1, 4,    3,    2,    4,
                                         3,    2,    1,    0xD4, 0xC3, 0xB2, 0xA1, 0};
    std::vector<uint8> words(expected.size());
    Raster_BitsToPixels(bitmap, 1, words.data(), 7, 4, 2, 2, 0xA1B2C3D4, 0x01020304);
    EXPECT_EQ(words, expected);
}

} // namespace
} // namespace quillon::test
