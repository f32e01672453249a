#include "operations.h"

#include <quillon/quillon.hpp>

namespace quillon::bench {
namespace {

Surface surfaceOf(const Buffer &buffer, Format format) {
    return {buffer.data, buffer.stride, {buffer.w(), buffer.h()}, format};
}

// A rectangle beyond all edges, so that there is something to clip.
Rect around(const Buffer &buffer) {
    return {-1, -1, buffer.w() + 2, buffer.h() + 2};
}

// What a call of the face takes beside the call of the C interface that it makes, which
// stands in the column of limits.
template <class Face, class Bare>
void add(Plan &plan, const char *name, std::vector<Plane> planes, const Face &face,
         const Bare &bare) {
    plan.add(name, "C++ face", Traffic::None, std::move(planes), face)
        .contenders.push_back({"the call", prepare(bare), Kind::Limit});
}

} // namespace

void addFace(Plan &plan) {
    add(
        plan, "face: fill 32", {{32, noise}},
        [](const Buffer &dst) -> Work {
            return [surface = surfaceOf(dst, Format::kBgra32), rect = around(dst)]() mutable {
                benchmark::DoNotOptimize(surface.fill(rect, kPixel));
            };
        },
        [](const Buffer &dst) {
            Raster_RectFill(dst.data, dst.stride, 4, kPixel, 0, 0, dst.width, dst.height);
        });
    add(
        plan, "face: copy 32", {{32, noise}, {32, noise}},
        [](const Buffer &dst, const Buffer &src) -> Work {
            return [to = surfaceOf(dst, Format::kBgra32), from = surfaceOf(src, Format::kBgra32),
                    rect = around(src)]() mutable {
                benchmark::DoNotOptimize(to.copy({-1, -1}, from, rect));
            };
        },
        [](const Buffer &dst, const Buffer &src) {
            Raster_RectCopy(dst.data, dst.stride, src.data, src.stride, 4, 0, 0, 0, 0, dst.width,
                            dst.height);
        });
    add(
        plan, "face: convert 16 to 32", {{32, noise}, {16, noise}},
        [](const Buffer &dst, const Buffer &src) -> Work {
            return [to = surfaceOf(dst, Format::kBgra32), from = surfaceOf(src, Format::kRgb16),
                    rect = around(src)]() mutable {
                benchmark::DoNotOptimize(to.copy({-1, -1}, from, rect));
            };
        },
        [](const Buffer &dst, const Buffer &src) {
            Raster_ConvertPixels(dst.data, static_cast<uint32_t>(dst.stride), 32, src.data,
                                 static_cast<uint32_t>(src.stride), 16, false, nullptr, 0, 0, 0, 0,
                                 dst.width, dst.height);
        });
    add(
        plan, "face: blend", {{32, noise}, {32, noise}},
        [](const Buffer &dst, const Buffer &src) -> Work {
            return [to = surfaceOf(dst, Format::kBgra32), from = surfaceOf(src, Format::kBgra32),
                    rect = around(src)]() mutable {
                benchmark::DoNotOptimize(to.blend({-1, -1}, from, rect));
            };
        },
        [](const Buffer &dst, const Buffer &src) {
            Raster_AlphaBlendOver(dst.data, 0, 0, dst.stride, src.data, 0, 0, src.stride, dst.width,
                                  dst.height);
        });
    add(
        plan, "face: stencil 32", {{32, noise}, {1, noise}},
        [](const Buffer &dst, const Buffer &src) -> Work {
            return [to = surfaceOf(dst, Format::kBgra32),
                    bits = Bitmap(src.data, src.stride, {src.w(), src.h()})]() mutable {
                benchmark::DoNotOptimize(to.stencil({0, 0}, bits, kForeground));
            };
        },
        [](const Buffer &dst, const Buffer &src) {
            Raster_BitsToPixelsStencil(src.data, src.stride, dst.data, dst.stride, 4, dst.w(),
                                       dst.height, kForeground);
        });
}

} // namespace quillon::bench
