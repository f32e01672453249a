// The geometry of video frames, and what is logged of unknown ones.  A message
// comes once in the life of a process, so this program has no other tests.

#include "raster.h"
#include "raster/videoAttributes.h"
#include "support/fence.h"
#include "support/messages.h"

#include <array>

namespace quillon::test {
namespace {

using Strings = std::vector<std::string>;

struct Attributes {
    size_t size = 1;
    std::array<size_t, 3> pitches = {2, 3, 4};
    std::array<size_t, 3> offsets = {5, 6, 7};
    bool isKnown;

    Attributes(uint32 format, uint32 width, uint32 height)
        : isKnown(RasterComputeVideoAttributes(format, width, height, &size, pitches.data(),
                                               offsets.data())) {}
};

TEST(VideoAttributes, geometry) {
    for (const uint32 format : {RASTER_VIDEO_YUY2, RASTER_VIDEO_UYVY}) {
        const Attributes packed(format, 5, 3);
        EXPECT_TRUE(packed.isKnown);
        EXPECT_EQ(packed.size, 36u); // only the width is rounded up
        EXPECT_EQ(packed.pitches, (std::array<size_t, 3>{2, 3, 4}));
        EXPECT_EQ(packed.offsets, (std::array<size_t, 3>{0, 6, 7}));
    }
    const Attributes planar(RASTER_VIDEO_YV12, 5, 3);
    EXPECT_TRUE(planar.isKnown);
    EXPECT_EQ(planar.size, 36u);
    EXPECT_EQ(planar.pitches, (std::array<size_t, 3>{6, 3, 3}));
    EXPECT_EQ(planar.offsets, (std::array<size_t, 3>{0, 24, 30}));

    const Attributes large(RASTER_VIDEO_YV12, UINT32_MAX, 3);
    EXPECT_EQ(large.pitches[0], size_t{1} << 32);
    EXPECT_EQ(large.offsets[2], size_t{5} << 32);

    size_t size = 0;
    EXPECT_TRUE(RasterComputeVideoAttributes(RASTER_VIDEO_YV12, 2, 2, &size, nullptr, nullptr));
    EXPECT_EQ(size, 6u);
}

TEST(VideoAttributes, unknownFormatIsLoggedOnce) {
    clearMessages();
    for (const uint32 format : {0xFFFFFFFEu, 0u}) {
        const Attributes unknown(format, 5, 3);
        EXPECT_FALSE(unknown.isKnown);
        EXPECT_EQ(unknown.size, 0u);
        EXPECT_EQ(unknown.offsets[0], 0u);
        EXPECT_EQ(logs(),
                  Strings{"RasterComputeVideoAttributes: format :4294967294 not supported.\n"});
    }
}

// The depth is looked at first; each message has a latch of its own.
TEST(YuvToRgb, unknownDepthAndFormatAreLoggedOnceEach) {
    clearMessages();
    const FencedBuffer fence(1);
    const auto convert = [&](uint32 format, int32 bppdepth) {
        Raster_YUVtoRGB(fence.end(), fence.end(), 8, 8, format, bppdepth);
    };
    convert(0xFFFFFFFF, -8);
    Strings expected = {"Raster_YUVtoRGB: bppdepth:-8 not supported.\n"};
    EXPECT_EQ(logs(), expected);
    convert(RASTER_VIDEO_YUY2, 8);
    EXPECT_EQ(logs(), expected);
    convert(0xFFFFFFFF, 32);
    expected.emplace_back("Raster_YUVtoRGB: format:4294967295 not supported.\n");
    EXPECT_EQ(logs(), expected);
    convert(0, 16);
    convert(0, 0);
    EXPECT_EQ(logs(), expected);
    EXPECT_EQ(warnings(), Strings{});
}

} // namespace
} // namespace quillon::test
