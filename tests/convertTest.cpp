#include "operations.h"
#include "reference/pixels.h"
#include "support/judge.h"
#include "support/messages.h"
#include <quillon/raster.h>

#include <cstring>
#include <numeric>

namespace quillon::test {
namespace {

TEST(Convert, matchesReference) {
    forEachCase(20000, [](Random &random) { tryConvert(random); });
}

TEST(Convert, matchesReferenceOnLargeSurfaces) {
    forEachCase(5 * 7, [](Random &random) { tryConvert(random, Shape::kLarge); });
}

// All there is in 16 bits, as a rectangle and one by one.
TEST(Convert, every16BitPixel) {
    constexpr uint32_t kSide = 256;
    std::vector<uint16_t> pixels(kSide * kSide);
    std::iota(pixels.begin(), pixels.end(), uint16_t{0});
    for (const int32_t srcDepth : {15, 16})
        for (const int32_t dstDepth : reference::kDepths) {
            const uint32_t bytes = static_cast<uint32_t>(dstDepth + 7) / 8;
            std::vector<uint8_t> expected(pixels.size() * bytes), dst(expected.size());
            for (uint32_t pixel = 0; pixel <= 0xFFFF; ++pixel) {
                const uint32_t wanted =
                    srcDepth == dstDepth ? pixel : reference::converted(pixel, srcDepth, dstDepth);
                std::memcpy(&expected[size_t{pixel} * bytes], &wanted, bytes);
                ASSERT_EQ(Raster_ConvertOnePixel(pixel, srcDepth, dstDepth, false, nullptr),
                          reference::convertedAlone(pixel, srcDepth, dstDepth));
            }
            forEachTarget([&] {
                Raster_ConvertPixels(dst.data(), kSide * bytes, dstDepth,
                                     reinterpret_cast<const uint8_t *>(pixels.data()), 2 * kSide,
                                     srcDepth, false, nullptr, 0, 0, 0, 0, kSide, kSide);
                EXPECT_TRUE(dst == expected) << srcDepth << " to " << dstDepth;
            });
        }
}

// The palette is narrowed as far as its use has grown, and ends at an inaccessible page.
TEST(Convert, usesMoreOfThePaletteFromRowToRow) {
    constexpr uint32_t kWidth = 300, kHeight = 250, kStride = kWidth + 7, kFirst = 3;
    const FencedBuffer entries(kHeight * sizeof(uint32_t), FencedBuffer::Flush::kBefore);
    const FencedBuffer lastEntries(kHeight * sizeof(uint32_t));
    Random random(1);
    random.fill(entries.data(), entries.size());
    std::memcpy(lastEntries.data(), entries.data(), entries.size());
    std::vector<uint8_t> rising(size_t{kStride} * kHeight), falling(rising.size());
    for (uint32_t y = 0; y < kHeight; ++y)
        for (uint32_t x = 0; x < kWidth; ++x) {
            const uint32_t i = random.below(y + 1);
            rising[y * kStride + x] = static_cast<uint8_t>(i);
            falling[y * kStride + x] = static_cast<uint8_t>(kFirst + kHeight - 1 - i);
        }
    const auto *low = reinterpret_cast<const uint32_t *>(lastEntries.data());
    const auto *high = reinterpret_cast<const uint32_t *>(entries.data()) - kFirst;
    for (const auto &[src, palette] : {std::pair(rising, low), std::pair(falling, high)})
        for (const int32_t depth : {3, 6, 8, 15, 16, 24, 32}) {
            const uint32_t bytes = depth <= 8 ? 1 : static_cast<uint32_t>(depth + 1) / 8;
            std::vector<uint8_t> expected(src.size() * bytes), dst(expected.size());
            for (uint32_t y = 0; y < kHeight; ++y)
                for (uint32_t x = 0; x < kWidth; ++x) {
                    const size_t i = y * kStride + x;
                    const uint32_t wanted = reference::converted(palette[src[i]], 32, depth);
                    std::memcpy(&expected[i * bytes], &wanted, bytes);
                }
            forEachTarget([&, &src = src, &palette = palette] {
                dst.assign(dst.size(), 0);
                Raster_ConvertPixels(dst.data(), kStride * bytes, depth, src.data(), kStride, 8,
                                     true, palette, 0, 0, 0, 0, kWidth, kHeight);
                EXPECT_TRUE(dst == expected) << "to " << depth;
            });
        }
}

TEST(ConvertOne, matchesReference) {
    forEachCase(200000, tryConvertOne);
    // An index is unsigned.
    const uint32_t entry = 0x12345678, index = 0xC0000001;
    const auto *far = reinterpret_cast<const uint32_t *>(reinterpret_cast<uintptr_t>(&entry) -
                                                         uint64_t{index} * sizeof(uint32_t));
    EXPECT_EQ(Raster_ConvertOnePixel(index, 8, 32, true, far), entry);
}

// What a failing call says, of one pixel and of a rectangle: the source is looked
// at first, both are ahead of any store.  Equal depths of any kind are a copy.
TEST(Convert, refusesUnknownDepths) {
    const FencedBuffer fence(1);
    const uint32_t palette[] = {0};
    const auto refuses = [&](const std::string &text, const auto &call) {
        if (text.empty())
            return call();
        expectPanic("NOT_IMPLEMENTED lib/raster/rasterConv", call);
        EXPECT_EQ(warnings, Messages{"Raster convert " + text + '\n'});
    };
    const std::string one = "one pixel ", many = "pixels ", depth = "invalid depth ",
                      source = "invalid source depth ", pseudo = "invalid depth for pseudo color ";
    struct Pair {
        int32_t srcDepth, dstDepth;
        bool pseudoColor;
    };
    const std::tuple<Pair, std::string, std::string> cases[] = {
        {{15, 7, false}, one + depth + "7", many + depth + "7"},
        {{24, 33, false}, one + depth + "33", many + depth + "33"},
        {{32, -8, false}, one + depth + "-8", many + depth + "-8"},
        {{8, 7, true}, one + depth + "7", many + depth + "7"},
        {{8, 7, false}, one + source + "8", many + source + "8"},
        {{17, 32, false}, one + source + "17", many + source + "17"},
        {{9, 32, true}, many + pseudo + "9", many + pseudo + "9"},
        {{INT32_MIN, 1, true}, many + pseudo + "-2147483648", many + depth + "1"},
        {{-16, -16, false}, one + source + "-16", ""}};
    for (const auto &[pair, ofOne, ofMany] : cases) {
        const auto &[src, dst, isPseudo] = pair;
        refuses(ofOne, [&, src = src, dst = dst, isPseudo = isPseudo] {
            Raster_ConvertOnePixel(0, src, dst, isPseudo, palette);
        });
        for (const uint32_t side : {0u, 1u}) {
            refuses(ofMany, [&, src = src, dst = dst, isPseudo = isPseudo] {
                Raster_ConvertPixels(fence.end(), 4, dst, fence.end(), 4, src, isPseudo, palette, 0,
                                     0, 0, 0, side, side);
            });
            if (dst == 32)
                refuses(ofMany, [&, src = src, isPseudo = isPseudo] {
                    Raster_ConvertPixelsTo32(fence.end(), 4, fence.end(), 4, src, isPseudo, palette,
                                             0, 0, 0, 0, side, side);
                });
        }
    }
}

} // namespace
} // namespace quillon::test
