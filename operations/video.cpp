#include "reference/video.h"
#include "operations.h"
#include "support/judge.h"
#include <quillon/raster.h>

namespace quillon::test {
namespace {

constexpr uint32_t kFormats[] = {RASTER_VIDEO_YUY2, RASTER_VIDEO_UYVY, RASTER_VIDEO_YV12};
constexpr int32_t kDepths[] = {15, 16, 24, 32};

FencedBuffer::Flush drawFlush(Random &random) {
    return random.oneIn(2) ? FencedBuffer::Flush::kBefore : FencedBuffer::Flush::kBehind;
}

// A frame of random samples between fences that the frame and the output each touch
// with a random end.
void tryFrame(Random &random, Size frame, uint32_t format, int32_t bppdepth) {
    const size_t width = frame.width, height = frame.height;
    const bool isPlanar = format == RASTER_VIDEO_YV12;
    const FencedBuffer src(isPlanar ? (width + 1) / 2 * ((height + 1) / 2) * 6
                                    : width * height / 2 * 4,
                           drawFlush(random));
    const FencedBuffer dst(width * height * static_cast<size_t>(bppdepth + 1) / 8,
                           drawFlush(random));
    random.fill(src.data(), src.size());
    random.fill(dst.data(), dst.size());
    const std::vector<uint8_t> before(dst.data(), dst.end());
    std::vector<uint8_t> expected = before;
    reference::yuvToRgb(src.data(), expected.data(), frame.width, frame.height, format, bppdepth);
    forEachTarget([&] {
        std::copy(before.begin(), before.end(), dst.data());
        withoutMemory([&] {
            Raster_YUVtoRGB(src.data(), dst.data(), frame.width, frame.height, format, bppdepth);
        });
        compare(dst.data(), expected.data(), dst.size(), [&] {
            return "format " + std::to_string(format) + " to " + std::to_string(bppdepth) + ", " +
                   std::to_string(width) + " x " + std::to_string(height);
        });
    });
}

} // namespace

// The widths of a planar row, and with a height of 1 the lengths of an interleaved run.
void tryVideo(Random &random) {
    const uint32_t format = random.oneOf(kFormats);
    const int32_t depth = random.oneOf(kDepths);
    const uint32_t width = random.below(random.oneIn(8) ? 400 : 71);
    tryFrame(random, {width, random.oneIn(8) ? random.below(40) : random.below(5)}, format, depth);
}

// More than the caches nearest to a core hold, with rows that lie to cache lines alike
// and with rows that do not.
void tryLargeVideo(Random &random, uint32_t width) {
    for (const int32_t depth : kDepths)
        for (const uint32_t format : kFormats) {
            const uint32_t rowBytes = width * (static_cast<uint32_t>(depth + 1) / 8);
            tryFrame(random, {width, 1600000 / rowBytes & ~1u}, format, depth);
        }
}

// Samples, samples out of range, and any int32_t at all.
void tryYuvToBgrx(Random &random) {
    const auto [low, high] =
        random.oneOf<std::pair<int32_t, int32_t>>({{0, 255}, {-300, 600}, {INT32_MIN, INT32_MAX}});
    const int32_t y = random.between(low, high), u = random.between(low, high),
                  v = random.between(low, high);
    compare(RasterRGB_YUVtoBGRX(y, u, v), reference::yuvToBgrx(y, u, v), "triple");
}

void family::video(Random &random) {
    random.oneIn(8) ? tryYuvToBgrx(random) : tryVideo(random);
}

} // namespace quillon::test
