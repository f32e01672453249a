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
template <class Face>
void add(Plan &plan, const char *name, const char *bareName, const Face &face) {
    for (const Operation &bare : pixelOperations(plan.area))
        if (bare.name == bareName)
            plan.add(name, "C++ face", Traffic::None, bare.planes, face)
                .contenders.push_back({"the call", bare.contenders[0].prepare, Kind::Limit});
}

// A call of the face from a surface of the format to one of 32 bits.
template <class Call>
auto onSurfaces(Format srcFormat, const Call &call) {
    return [=](const Buffer &dst, const Buffer &src) -> Work {
        return [=, to = surfaceOf(dst, Format::kBgra32), from = surfaceOf(src, srcFormat),
                rect = around(src)]() mutable { benchmark::DoNotOptimize(call(to, from, rect)); };
    };
}

} // namespace

void addFace(Plan &plan) {
    const auto copy = [](Surface &to, const Surface &from, Rect rect) {
        return to.copy({-1, -1}, from, rect);
    };
    const auto blend = [](Surface &to, const Surface &from, Rect rect) {
        return to.blend({-1, -1}, from, rect);
    };
    add(plan, "face: fill 32", "fill 32", [](const Buffer &dst) -> Work {
        return [surface = surfaceOf(dst, Format::kBgra32), rect = around(dst)]() mutable {
            benchmark::DoNotOptimize(surface.fill(rect, kPixel));
        };
    });
    add(plan, "face: copy 32", "copy 32", onSurfaces(Format::kBgra32, copy));
    add(plan, "face: convert 16 to 32", "convert 16 to 32", onSurfaces(Format::kRgb16, copy));
    add(plan, "face: blend", "blend noise", onSurfaces(Format::kBgra32, blend));
    add(plan, "face: stencil 32", "stencil noise to 32",
        [](const Buffer &dst, const Buffer &src) -> Work {
            return [to = surfaceOf(dst, Format::kBgra32),
                    bits = Bitmap(src.data, src.stride, {src.w(), src.h()})]() mutable {
                benchmark::DoNotOptimize(to.stencil({0, 0}, bits, kForeground));
            };
        });
}

} // namespace quillon::bench
