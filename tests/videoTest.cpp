// YUV frames against their reference.

#include "reference/video.h"
#include "raster.h"
#include "support/fence.h"
#include "support/messages.h"
#include "support/random.h"
#include "support/targets.h"

#include <algorithm>
#include <array>
#include <vector>

namespace quillon::test {
namespace {

constexpr uint32 kFormats[] = {RASTER_VIDEO_YUY2, RASTER_VIDEO_UYVY, RASTER_VIDEO_YV12};
constexpr int32 kDepths[] = {15, 16, 24, 32};

size_t bytesAt(int32 bppdepth) {
    return bppdepth == 15 ? 2 : static_cast<size_t>(bppdepth) / 8;
}

// The bytes that a conversion may read.
size_t bytesOfFrame(uint32 width, uint32 height, uint32 format) {
    if (format != RASTER_VIDEO_YV12)
        return size_t{width} * height / 2 * 4;
    return size_t{(width + 1) / 2} * ((height + 1) / 2) * 6;
}

// Converts a frame of random samples between fences that the frame and the
// output each touch with a random end.
void expectConverted(Random &random, uint32 width, uint32 height, uint32 format, int32 bppdepth) {
    const auto flush = [&] {
        return random.oneIn(2) ? FencedBuffer::Flush::kBefore : FencedBuffer::Flush::kBehind;
    };
    const FencedBuffer src(bytesOfFrame(width, height, format), flush());
    const FencedBuffer dst(size_t{width} * height * bytesAt(bppdepth), flush());
    random.fill(src.data(), src.size());
    random.fill(dst.data(), dst.size());
    std::vector<uint8> expected(dst.data(), dst.end());

    Raster_YUVtoRGB(src.data(), dst.data(), width, height, format, bppdepth);
    reference::yuvToRgb(src.data(), expected.data(), width, height, format, bppdepth);
    EXPECT_TRUE(dst.canariesIntact());
    EXPECT_TRUE(std::equal(dst.data(), dst.end(), expected.begin()))
        << std::hex << format << std::dec << " to " << bppdepth << ", " << width << " x " << height;
}

// Every luma with every pair of chroma, as runs of one chromaLow.
TEST(YuvToRgb, everyTriple) {
    constexpr uint32 kWidth = 256, kHeight = 256; // luma, chromaHigh
    std::vector<uint8> src(size_t{2} * kWidth * kHeight), dst(size_t{4} * kWidth * kHeight);
    std::vector<uint8> expected(dst.size());
    for (uint32 chromaLow = 0; chromaLow < 256; ++chromaLow) {
        for (size_t i = 0; i < src.size(); i += 2) {
            src[i] = static_cast<uint8>(i / 2 % kWidth);
            src[i + 1] = static_cast<uint8>(i % 4 == 0 ? chromaLow : i / 2 / kWidth);
        }
        reference::yuvToRgb(src.data(), expected.data(), kWidth, kHeight, RASTER_VIDEO_YUY2, 32);
        forEachTarget([&] {
            Raster_YUVtoRGB(src.data(), dst.data(), kWidth, kHeight, RASTER_VIDEO_YUY2, 32);
            ASSERT_TRUE(dst == expected) << "chromaLow " << chromaLow;
        });
    }
}

// Every width up to several vectors: the widths of a planar row, and with a
// height of 1 the lengths of a packed run.
TEST(YuvToRgb, everyWidth) {
    forEachTarget([&] {
        forEachCase(80, [&](Random &random) {
            const auto width = static_cast<uint32>(random.between(0, 70));
            for (uint32 height = 0; height < 5; ++height)
                for (const uint32 format : kFormats)
                    for (const int32 depth : kDepths)
                        expectConverted(random, width, height, format, depth);
        });
    });
}

TEST(YuvToRgb, largerFrames) {
    forEachTarget([&] {
        forEachCase(100, [&](Random &random) {
            expectConverted(random, 1 + random.below(400), 1 + random.below(40),
                            kFormats[random.below(3)], kDepths[random.below(4)]);
        });
    });
}

// The pixels of a packed frame follow each other across its rows, whose padding
// has no part in that.
TEST(YuvToRgb, packedFramesAreOneRun) {
    const std::array<uint8, 12> src = {16, 128, 235, 128, 235, 128, 16, 128, 99, 99, 99, 99};
    std::array<uint8, 20> dst = {};
    dst[16] = 7;
    Raster_YUVtoRGB(src.data(), dst.data(), 1, 5, RASTER_VIDEO_YUY2, 32);
    EXPECT_EQ(dst, (std::array<uint8, 20>{0, 0, 0, 0, 255, 255, 255, 0, 255, 255, 255, 0, 0, 0, 0,
                                          0, 7}));
}

TEST(YuvToRgb, knownValues) {
    // luma 100, U 90, V 200: 298 * 84 = 25032, U - 128 = -38, V - 128 = 72.
    // low  (25032 - 15542 + 128) >> 8 = 37
    // mid  (25032 + 7904 - 7200 + 128) >> 8 = 101
    // high (25032 + 37152 + 128) >> 8 = 243
    const std::array<uint8, 4> yuy2 = {100, 90, 100, 200}, uyvy = {90, 100, 200, 100};
    const std::array<uint8, 6> yv12 = {100, 100, 100, 100, 200, 90};
    const auto pixelOf = [](const uint8 *src, uint32 height, uint32 format, int32 depth) {
        std::array<uint8, 16> dst = {};
        Raster_YUVtoRGB(src, dst.data(), 2, height, format, depth);
        uint32 pixel = 0;
        for (size_t i = bytesAt(depth); i-- > 0;)
            pixel = pixel << 8 | dst[i];
        return pixel;
    };
    const std::pair<int32, uint32> pixels[] = {{15, 30 << 11 | 12 << 6 | 4 << 1},
                                               {16, 30 << 11 | 25 << 5 | 4},
                                               {24, 0xF36525},
                                               {32, 0xF36525}};
    for (const auto &[depth, pixel] : pixels) {
        EXPECT_EQ(pixelOf(yuy2.data(), 1, RASTER_VIDEO_YUY2, depth), pixel) << depth;
        EXPECT_EQ(pixelOf(uyvy.data(), 1, RASTER_VIDEO_UYVY, depth), pixel) << depth;
        EXPECT_EQ(pixelOf(yv12.data(), 2, RASTER_VIDEO_YV12, depth), pixel) << depth;
    }
    const std::array<uint8, 4> white = {235, 128, 235, 128};
    EXPECT_EQ(pixelOf(white.data(), 1, RASTER_VIDEO_YUY2, 15), 0xFFFEu);
    EXPECT_EQ(pixelOf(white.data(), 1, RASTER_VIDEO_YUY2, 16), 0xFFFFu);
}

// Nothing is touched where there is nothing to convert, or nothing known.
TEST(YuvToRgb, touchesNothing) {
    const FencedBuffer fence(1);
    for (const int32 depth : kDepths) {
        for (const uint32 format : kFormats)
            for (const uint32 large : {1u, UINT32_MAX}) {
                Raster_YUVtoRGB(fence.end(), fence.end(), 0, large, format, depth);
                Raster_YUVtoRGB(fence.end(), fence.end(), large, 0, format, depth);
            }
        Raster_YUVtoRGB(fence.end(), fence.end(), UINT32_MAX, 1, RASTER_VIDEO_YV12, depth);
        Raster_YUVtoRGB(fence.end(), fence.end(), 1, UINT32_MAX, RASTER_VIDEO_YV12, depth);
        Raster_YUVtoRGB(fence.end(), fence.end(), 8, 8, 0, depth);
    }
    for (const int32 depth : {0, 8, 14, 17, -32, INT32_MIN})
        Raster_YUVtoRGB(fence.end(), fence.end(), 8, 8, RASTER_VIDEO_YUY2, depth);
}

TEST(YuvToBgrx, matchesReference) {
    EXPECT_EQ(RasterRGB_YUVtoBGRX(235, 128, 128), 0x00FEFEFEu);
    EXPECT_EQ(RasterRGB_YUVtoBGRX(16, 128, 128), 0u);
    EXPECT_EQ(RasterRGB_YUVtoBGRX(100, 90, 200), 0x00D4'3615u);
    forEachCase(1000000, [](Random &random) {
        // Samples, samples out of range, and any int32 at all.
        const int32 low = random.oneOf({0, -300, INT32_MIN});
        const int32 high = low == 0 ? 255 : low == -300 ? 600 : INT32_MAX;
        const auto sample = [&] { return random.between(low, high); };
        const int32 y = sample(), u = sample(), v = sample();
        EXPECT_EQ(RasterRGB_YUVtoBGRX(y, u, v), reference::yuvToBgrx(y, u, v))
            << y << ", " << u << ", " << v;
    });
}

} // namespace
} // namespace quillon::test
