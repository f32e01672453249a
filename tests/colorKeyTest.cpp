// The colour key against its reference.

#include "raster.h"
#include "reference/video.h"
#include "support/messages.h"
#include "support/surfaces.h"
#include "support/targets.h"

#include <array>

namespace quillon::test {
namespace {

struct Key {
    uint32 depth;
    uint32 bytes;
    uint32 value;
};

// The four surfaces of a call.  The overlay's coordinates are those of its own
// origin.
struct Surfaces {
    Surface background, dst, overlay, key;
};

// The library's function and the reference in one shape.
template <class Function>
void apply(Function function, const Surfaces &at, const Key &key, Size size) {
    function(at.background.buffer, at.dst.buffer, at.overlay.buffer, at.key.buffer,
             at.background.signedLine(), at.dst.signedLine(), at.overlay.signedLine(),
             at.key.signedLine(), key.value, at.dst.x, at.dst.y, size.width, size.height,
             key.depth);
}

// A key for surfaces whose bytes are below limit: the lower that is, the more
// pixels match.  Now and then one with more bits than a pixel has.
Key randomKey(Random &random, uint32 limit) {
    const uint32 depth = random.oneOf({32u, 16u, 8u, 24u, 15u, 0u, UINT32_MAX});
    const uint32 bytes = depth == 32 ? 4 : depth == 16 ? 2 : 1;
    uint32 value = 0;
    for (uint32 i = 0; i < std::min(bytes, 3u); ++i)
        value |= random.below(limit) << (8 * i);
    if (bytes == 4 || random.oneIn(8))
        value |= random.word() << (8 * std::min(bytes, 3u));
    return {depth, bytes, value};
}

// The surface on which pixel (x, y) has the given address.
Surface surfaceAt(uint8 *first, int64_t line, uint32 bytes, uint32 x, uint32 y) {
    const uint64_t offset = y * static_cast<uint64_t>(line) + uint64_t{x} * bytes;
    return {reinterpret_cast<uint8 *>(reinterpret_cast<uintptr_t>(first) - offset), line, x, y};
}

struct Coordinates {
    uint32 x, y;

    explicit Coordinates(Random &random)
        : x(random.oneOf({0u, random.below(100), random.word(), UINT32_MAX})),
          y(random.oneOf({0u, random.below(100), random.word(), UINT32_MAX})) {}
};

Size randomSize(Random &random) {
    return {randomWidth(random), random.below(6)};
}

// Sources on surfaces of their own or on the destination's, with any lines.
TEST(ApplyColorKey, matchesReference) {
    TwinMemory memory, others[3];
    forEachTarget([&] {
        forEachCase(6000, [&](Random &random) {
            const uint32 limit = random.oneOf({1u, 2u, 2u, 3u, 256u});
            const Key key = randomKey(random, limit);
            Size size = randomSize(random);
            const Coordinates corner(random);
            const int64_t dstLine = randomLine(random, size_t{4} * size.width, true);
            const auto lineFor = [&](uint32 bytes) {
                return bytes == 4 && random.oneIn(2)
                           ? dstLine
                           : randomLine(random, size_t{bytes} * size.width, true);
            };
            const std::array<int64_t, 4> lines = {dstLine, lineFor(4), lineFor(4),
                                                  lineFor(key.bytes)};
            for (const int64_t line : lines)
                size = fitted(size, memory, size_t{4} * size.width, line);
            std::array<TwinMemory *, 4> memories = {&memory};
            std::array<uint8 *, 4> firsts = {};
            for (size_t i = 0; i < 4; ++i) {
                if (i > 0)
                    memories[i] = random.oneIn(3) ? &memory : &others[i - 1];
                const size_t rowBytes = size_t{i == 3 ? key.bytes : 4} * size.width;
                firsts[i] = randomPlace(random, *memories[i], size, rowBytes, lines[i]);
            }
            memory.refill(random, memories[3] == &memory ? limit : 256);
            for (TwinMemory &other : others)
                other.refill(random, &other == &others[2] ? limit : 256);

            const Surfaces at = {surfaceAt(firsts[1], lines[1], 4, corner.x, corner.y),
                                 surfaceAt(firsts[0], lines[0], 4, corner.x, corner.y),
                                 surfaceAt(firsts[2], lines[2], 4, 0, 0),
                                 surfaceAt(firsts[3], lines[3], key.bytes, corner.x, corner.y)};
            apply(Raster_ApplyColorKey, at, key, size);
            apply(reference::applyColorKey,
                  {memories[1]->inModel(at.background), memory.inModel(at.dst),
                   memories[2]->inModel(at.overlay), memories[3]->inModel(at.key)},
                  key, size);
            EXPECT_TRUE(memory.agree())
                << "key depth " << key.depth << ", lines " << lines[0] << ", " << lines[1] << ", "
                << lines[2] << ", " << lines[3] << ", " << size.width << " x " << size.height;
            for (const TwinMemory &other : others)
                EXPECT_TRUE(other.agree());
        });
    });
}

// The destination at every distance from each source at which a vector can run
// into what has been written, the others being out of the way or near as well.
TEST(ApplyColorKey, overlapAtEveryDistance) {
    constexpr int kMost = 128;
    TwinMemory memory;
    forEachTarget([&] {
        forEachCase(40 * (2 * kMost + 1), [&](Random &random) {
            const uint32 limit = random.oneOf({2u, 2u, 3u});
            const Key key = randomKey(random, limit);
            const Size size = {random.below(100), 1 + random.below(4)};
            const auto line = [&](uint32 bytes) {
                return randomLine(random, size_t{bytes} * size.width, true);
            };
            const int64_t dstLine = line(4);
            uint8 *middle = memory.data() + memory.size() / 2;
            const uint32 nearOne = random.below(3);
            const auto source = [&](uint32 which, uint32 bytes) {
                if (which != nearOne && random.oneIn(2)) // within reach of a row, in a few cases
                    return surfaceAt(memory.data() + memory.size() / 4 * (which + 1), line(bytes),
                                     bytes, 0, 0);
                const int distance = random.between(-kMost, kMost);
                return surfaceAt(middle - distance, random.oneIn(2) ? dstLine : line(bytes), bytes,
                                 0, 0);
            };
            const Surfaces at = {source(0, 4), surfaceAt(middle, dstLine, 4, 0, 0), source(1, 4),
                                 source(2, key.bytes)};
            memory.refill(random, limit);
            apply(Raster_ApplyColorKey, at, key, size);
            apply(reference::applyColorKey,
                  {memory.inModel(at.background), memory.inModel(at.dst),
                   memory.inModel(at.overlay), memory.inModel(at.key)},
                  key, size);
            EXPECT_TRUE(memory.agree())
                << "key depth " << key.depth << ", " << size.width << " x " << size.height
                << ", from dst: background " << at.background.buffer - middle << ", overlay "
                << at.overlay.buffer - middle << ", key " << at.key.buffer - middle;
        });
    });
}

// Rows alone between inaccessible pages.
TEST(ApplyColorKey, staysInsideEveryRow) {
    TwinRows background, dst, overlay, keys;
    Random random(baseSeed());
    forEachTarget([&] {
        for (uint32 width = 0; width <= 140; ++width)
            for (const uint32 depth : {8u, 16u, 32u})
                for (const auto flush :
                     {FencedBuffer::Flush::kBefore, FencedBuffer::Flush::kBehind}) {
                    noteStep("width", width);
                    background.refill(random);
                    dst.refill(random);
                    overlay.refill(random);
                    keys.refill(random);
                    const Key key = {depth, depth / 8, random.below(256)};
                    const Size size = {width, TwinRows::kHeight};
                    const size_t rowBytes = size_t{4} * width,
                                 keyRowBytes = size_t{key.bytes} * width;
                    apply(Raster_ApplyColorKey,
                          {background.fenced(flush, rowBytes), dst.fenced(flush, rowBytes),
                           overlay.fenced(flush, rowBytes), keys.fenced(flush, keyRowBytes)},
                          key, size);
                    apply(reference::applyColorKey,
                          {background.inModel(flush, rowBytes), dst.inModel(flush, rowBytes),
                           overlay.inModel(flush, rowBytes), keys.inModel(flush, keyRowBytes)},
                          key, size);
                    ASSERT_TRUE(dst.agree()) << "key depth " << depth << ", width " << width;
                }
    });
}

TEST(ApplyColorKey, knownValues) {
    const uint32 background = 0xB0000001, overlay = 0xA0000002;
    const auto matches = [&](uint32 pixel, uint32 key, uint32 keyDepth) {
        uint32 dst = 0;
        const auto bytes = [](const uint32 &word) {
            return reinterpret_cast<const uint8 *>(&word);
        };
        Raster_ApplyColorKey(bytes(background), reinterpret_cast<uint8 *>(&dst), bytes(overlay),
                             bytes(pixel), 4, 4, 4, 4, key, 0, 0, 1, 1, keyDepth);
        EXPECT_TRUE(dst == background || dst == overlay) << std::hex << dst;
        return dst == overlay;
    };
    EXPECT_TRUE(matches(0x00123456, 0xFF123456, 32)); // the top byte does not count
    EXPECT_TRUE(matches(0xFF123456, 0x00123456, 32));
    EXPECT_FALSE(matches(0x00123457, 0x00123456, 32));
    EXPECT_TRUE(matches(0xFFFF2345, 0x00002345, 16));
    EXPECT_FALSE(matches(0xFFFF2345, 0x00012345, 16)); // all of the key does
    EXPECT_FALSE(matches(0xFFFF2345, 0xFFFF2345, 16));
    for (const uint32 depth : {8u, 0u, 15u, 24u, 33u}) {
        EXPECT_TRUE(matches(0xFFFFFF45, 0x45, depth));
        EXPECT_FALSE(matches(0xFFFFFF45, 0x145, depth));
    }
}

TEST(ApplyColorKey, emptyRectanglesTouchNothing) {
    const FencedBuffer fence(1);
    const Surface nowhere = {fence.end(), 64, 3, 5};
    for (const Size size : {Size{0, 0}, Size{0, UINT32_MAX}, Size{UINT32_MAX, 0}})
        for (const uint32 depth : {8u, 16u, 32u})
            apply(Raster_ApplyColorKey, {nowhere, nowhere, nowhere, nowhere}, {depth, 0, 0}, size);
}

} // namespace
} // namespace quillon::test
