// Raster routines take no memory.

#include <quillon/raster.h>
#include "support/faults.h"
#include "support/targets.h"

#include <vector>

namespace quillon::test {
namespace {

TEST(Allocation, rasterRoutinesDoNone) {
    constexpr uint32_t kWidth = 300, kHeight = 20, kLine = kWidth * 4;
    std::vector<uint8_t> dst(size_t{kHeight} * kLine), src(dst.size());
    const std::vector<uint32_t> palette(256);
    forEachTarget([&] {
        const MemoryFault none(UINT64_MAX);
        for (int32_t bytes = 1; bytes <= 4; ++bytes) {
            Raster_RectFill(dst.data(), kLine, bytes, 1, 0, 0, kWidth, kHeight);
            for (const uint32_t rop : {RASTER_ROP_COPY, RASTER_ROP_XOR})
                for (const uint8_t *from : {src.data(), dst.data()})
                    Raster_RectROPcopy(dst.data(), kLine, from, kLine, bytes, 0, 0, rop, 1, 1,
                                       kWidth - 1, kHeight - 1);
            Raster_BitsToPixels(src.data(), kLine, dst.data(), kLine, bytes, kWidth, kHeight, 1, 2);
        }
        Raster_RectFillAlpha(dst.data(), kLine, 1, 0, 0, kWidth, kHeight);
        for (const uint8_t *from : {src.data(), dst.data()})
            Raster_AlphaBlendOver(dst.data(), 1, 0, kLine, from, 0, 0, kLine, kWidth - 1, kHeight);
        for (const int32_t to : {3, 6, 8, 15, 16, 24, 32})
            for (const int32_t from : {8, 15, 16, 24, 32})
                Raster_ConvertPixels(dst.data(), kLine, to, src.data(), kLine, from, from == 8,
                                     palette.data(), 0, 0, 0, 0, kWidth, kHeight);
        EXPECT_EQ(none.requestsLeft, UINT64_MAX);
    });
}

} // namespace
} // namespace quillon::test
