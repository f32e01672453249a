// Raster_ConvertPixels between the layouts that screens and files have.
#include "measure.h"
#include "raster.h"

namespace quillon::bench {
namespace {

constexpr int32 kIndex = 0; // a palette in the place of a source depth

uint32 bytesPerPixel(int32 depth) {
    return depth <= 8 ? 1 : (static_cast<uint32>(depth) + 7) / 8;
}

void registerPair(const Area &area, int32 srcDepth, int32 dstDepth) {
    const std::string from = srcDepth == kIndex ? "Index" : std::to_string(srcDepth);
    const uint32 dstBytes = bytesPerPixel(dstDepth), srcBytes = bytesPerPixel(srcDepth);
    measure("convert" + from + "to" + std::to_string(dstDepth), area, "quillon",
            dstBytes + srcBytes, [=] {
                std::vector<uint32> palette(256);
                std::generate(palette.begin(), palette.end(), std::mt19937(3));
                return [=, dst = Surface(area, dstBytes), src = Surface(area, srcBytes)]() mutable {
                    const bool indexed = srcDepth == kIndex;
                    Raster_ConvertPixels(dst.data(), dst.lineIncrement(), dstDepth, src.data(),
                                         src.lineIncrement(), indexed ? 8 : srcDepth, indexed,
                                         palette.data(), area.left, 0, area.left, 0, area.width,
                                         area.height);
                };
            });
}

} // namespace

void registerConvert() {
    constexpr struct {
        int32 src, dst;
    } kPairs[] = {{15, 32}, {16, 32}, {24, 32}, {kIndex, 32}, {32, 15},     {32, 16},    {32, 24},
                  {32, 8},  {32, 6},  {32, 3},  {15, 16},     {16, 15},     {15, 24},    {16, 24},
                  {24, 15}, {24, 16}, {16, 8},  {24, 8},      {kIndex, 16}, {kIndex, 24}};
    for (const Area &area : kAreas) {
        for (const auto &pair : kPairs)
            registerPair(area, pair.src, pair.dst);
    }
}

} // namespace quillon::bench
