#include "reference/video.h"
#include "operations.h"
#include "support/fence.h"
#include "support/judge.h"
#include "support/messages.h"
#include "video/frameLayout.h"
#include <quillon/raster.h>

namespace quillon::test {
namespace {

constexpr uint32_t kFormats[] = {RASTER_VIDEO_YUY2, RASTER_VIDEO_UYVY, RASTER_VIDEO_YV12};
constexpr int32_t kDepths[] = {15, 16, 24, 32};

TEST(YuvToRgb, matchesReference) {
    forEachCase(10000, tryVideo);
    Random random(baseSeed());
    for (const uint32_t width : {1088u, 1030u})
        tryLargeVideo(random, width);
}

// Every luma with every pair of chroma, as runs of one chromaLow.
TEST(YuvToRgb, everyTriple) {
    constexpr uint32_t kSide = 256; // luma, chromaHigh
    std::vector<uint8_t> src(2 * kSide * kSide);
    for (uint32_t chromaLow = 0; chromaLow < 256; ++chromaLow) {
        for (size_t i = 0; i < src.size(); i += 2) {
            src[i] = static_cast<uint8_t>(i / 2 % kSide);
            src[i + 1] = static_cast<uint8_t>(i % 4 == 0 ? chromaLow : i / 2 / kSide);
        }
        const auto converted = [&](auto function) {
            std::vector<uint8_t> dst(4 * kSide * kSide);
            function(src.data(), dst.data(), kSide, kSide, RASTER_VIDEO_YUY2, 32);
            return dst;
        };
        const std::vector<uint8_t> expected = converted(reference::yuvToRgb);
        forEachTarget([&] { ASSERT_TRUE(converted(Raster_YUVtoRGB) == expected) << chromaLow; });
    }
}

TEST(YuvToRgb, touchesNothingWhereThereIsNothingToDo) {
    const FencedBuffer fence(1);
    const std::pair<uint32_t, uint32_t> sizes[] = {{0, UINT32_MAX}, {UINT32_MAX, 0}, {1, 1}};
    for (const auto &[width, height] : sizes)
        for (const int32_t depth : kDepths)
            for (const uint32_t format : kFormats)
                Raster_YUVtoRGB(fence.end(), fence.end(), width, height, format, depth);
    Raster_YUVtoRGB(fence.end(), fence.end(), UINT32_MAX, 1, RASTER_VIDEO_YV12, 32);
    Raster_YUVtoRGB(fence.end(), fence.end(), 1, UINT32_MAX, RASTER_VIDEO_YV12, 32);
}

TEST(YuvToBgrx, matchesReference) {
    forEachCase(300000, tryYuvToBgrx);
}

// --- Geometry, and what is logged once in the life of a process

TEST(VideoAttributes, geometry) {
    using Numbers = std::vector<size_t>;
    size_t size = 1, pitches[] = {2, 3, 4}, offsets[] = {5, 6, 7};
    const auto geometry = [&](uint32_t format, uint32_t width, uint32_t height) {
        EXPECT_TRUE(layOutFrame(format, width, height, &size, pitches, offsets));
        return Numbers{size,       pitches[0], pitches[1], pitches[2],
                       offsets[0], offsets[1], offsets[2]};
    };
    // Only the width is rounded up, and only the first offset set.
    EXPECT_EQ(geometry(RASTER_VIDEO_YUY2, 5, 3), (Numbers{36, 2, 3, 4, 0, 6, 7}));
    constexpr size_t kRow = size_t{1} << 32;
    EXPECT_EQ(geometry(RASTER_VIDEO_YV12, UINT32_MAX, 3),
              (Numbers{6 * kRow, kRow, kRow / 2, kRow / 2, 0, 4 * kRow, 5 * kRow}));
    EXPECT_TRUE(layOutFrame(RASTER_VIDEO_UYVY, 2, 2, &size, nullptr, nullptr));
}

// Each message has a latch of its own; the depth is looked at first.
TEST(VideoMessages, comeOnce) {
    const FencedBuffer fence(1);
    size_t size = 1;
    for (const uint32_t format : {0xFFFFFFFEu, 0u}) {
        EXPECT_FALSE(layOutFrame(format, 5, 3, &size, nullptr, nullptr));
        EXPECT_EQ(size, 0u);
    }
    for (const auto &[format, depth] : std::vector<std::pair<uint32_t, int32_t>>{
             {UINT32_MAX, -8}, {RASTER_VIDEO_YUY2, 8}, {UINT32_MAX, 32}, {0, 16}, {0, 0}})
        Raster_YUVtoRGB(fence.end(), fence.end(), 8, 8, format, depth);
    EXPECT_EQ(logs, (Messages{"RasterComputeVideoAttributes: format :4294967294 not supported.\n",
                              "Raster_YUVtoRGB: bppdepth:-8 not supported.\n",
                              "Raster_YUVtoRGB: format:4294967295 not supported.\n"}));
    EXPECT_TRUE(warnings.empty());
}

} // namespace
} // namespace quillon::test
