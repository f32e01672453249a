// libyuv: its ARGB is our 32 bits; its luma and chroma are of the same
// coefficients, rounded.
#include "../operations/operations.h"
#include "peers.h"

#include <libyuv.h>

namespace quillon::bench {
namespace {

using Convert = int (*)(const uint8_t *, int, uint8_t *, int, int, int);
auto from1(Convert convert) {
    return [=](const Buffer &dst, const Buffer &src) {
        convert(src.data, src.stride, dst.data, dst.stride, dst.w(), dst.h());
    };
}

using ConvertPlanes = int (*)(const uint8_t *, int, const uint8_t *, int, const uint8_t *, int,
                              uint8_t *, int, int, int);
auto from3(ConvertPlanes convert) {
    return [=](const Buffer &dst, const Buffer &src) {
        const uint8_t *v = src.data + size_t{dst.width} * dst.height, *u = v + (v - src.data) / 4;
        const int stride = dst.w() / 2;
        convert(src.data, dst.w(), u, stride, v, stride, dst.data, dst.stride, dst.w(), dst.h());
    };
}

auto scale(libyuv::FilterMode filter) {
    return [=](const Buffer &dst, const Buffer &src) {
        libyuv::ARGBScale(src.data, src.stride, src.w(), src.h(), dst.data, dst.stride, dst.w(),
                          dst.h(), filter);
    };
}

} // namespace

std::string offerLibyuv(const Peer &peer) {
    const auto setPlane = [](const Buffer &dst) {
        libyuv::SetPlane(dst.data, dst.stride, dst.w(), dst.h(), kPixel & 0xFF);
    };
    const auto fill = [](const Buffer &dst) {
        libyuv::ARGBRect(dst.data, dst.stride, 0, 0, dst.w(), dst.h(), kPixel);
    };
    const auto blend = [](const Buffer &dst, const Buffer &src) {
        libyuv::ARGBBlend(src.data, src.stride, dst.data, dst.stride, dst.data, dst.stride, dst.w(),
                          dst.h());
    };
    peer.offer("fill 8", setPlane, Kind::Exact);
    peer.offer("fill 32", fill, Kind::Exact);
    peer.offer("copy 32", from1(libyuv::ARGBCopy), Kind::Exact);
    peer.offer("blend *", blend);
    peer.offer("convert 15 to 32", from1(libyuv::ARGB1555ToARGB));
    peer.offer("convert 16 to 32", from1(libyuv::RGB565ToARGB), Kind::Exact);
    peer.offer("convert 24 to 32", from1(libyuv::RGB24ToARGB), Kind::Exact);
    peer.offer("convert 32 to 15", from1(libyuv::ARGBToARGB1555));
    peer.offer("convert 32 to 16", from1(libyuv::ARGBToRGB565), Kind::Exact);
    peer.offer("convert 32 to 24", from1(libyuv::ARGBToRGB24), Kind::Exact);
    peer.offer("YUY2 to 32", from1(libyuv::YUY2ToARGB));
    peer.offer("UYVY to 32", from1(libyuv::UYVYToARGB));
    peer.offer("YV12 to 32", from3(libyuv::I420ToARGB));
    peer.offer("YV12 to 24", from3(libyuv::I420ToRGB24));
    peer.offer("YV12 to 16", from3(libyuv::I420ToRGB565));
    peer.offer("YV12 to 15", from3(libyuv::I420ToARGB1555));
    peer.offer("nearest *", scale(libyuv::kFilterNone));
    peer.offer("linear *", scale(libyuv::kFilterBilinear));
    // By other factors its box filter interpolates.
    peer.offer("box by 0.5", scale(libyuv::kFilterBox));
    return std::to_string(LIBYUV_VERSION);
}

} // namespace quillon::bench
