// swscale: conversion and scaling through one kind of context.
#include "../operations/operations.h"
#include "peers.h"

extern "C" {
#include <libavutil/log.h>
#include <libswscale/swscale.h>
}

namespace quillon::bench {
namespace {

// One context serves all jobs of an operation, which differ in nothing that it
// depends on.
SwsContext *context = nullptr;

auto convert(AVPixelFormat from, AVPixelFormat to, int flags = SWS_POINT) {
    return [=](const Buffer &dst, const Buffer &src) -> Work {
        const int height = from == AV_PIX_FMT_YUV420P ? dst.h() : src.h();
        context = sws_getCachedContext(context, src.w(), height, from, dst.w(), dst.h(), to, flags,
                                       nullptr, nullptr, nullptr);
        const size_t pixels = size_t{dst.width} * dst.height;
        const uint8_t *second = from == AV_PIX_FMT_PAL8
                                    ? reinterpret_cast<const uint8_t *>(palette())
                                    : src.data + pixels * 5 / 4;
        return [=] {
            const uint8_t *const planes[4] = {src.data, second, src.data + pixels};
            const int strides[4] = {src.stride, src.stride / 2, src.stride / 2};
            uint8_t *const out[4] = {dst.data};
            const int outStrides[4] = {dst.stride};
            if (context != nullptr)
                sws_scale(context, planes, strides, 0, height, out, outStrides);
        };
    };
}

} // namespace

std::string offerSwscale(const Peer &peer) {
    av_log_set_level(AV_LOG_ERROR);
    constexpr struct {
        int32_t depth;
        AVPixelFormat format;
    } kFormats[] = {{kIndex, AV_PIX_FMT_PAL8}, {8, AV_PIX_FMT_RGB8},   {15, AV_PIX_FMT_RGB555LE},
                    {16, AV_PIX_FMT_RGB565LE}, {24, AV_PIX_FMT_BGR24}, {32, AV_PIX_FMT_BGRA}};
    for (const auto &[depth, to] : kFormats) {
        for (const auto &[fromDepth, from] : kFormats)
            peer.offer(conversionName(fromDepth, depth), convert(from, to));
        peer.offer(text("YUY2 to ", depth), convert(AV_PIX_FMT_YUYV422, to));
        peer.offer(text("UYVY to ", depth), convert(AV_PIX_FMT_UYVY422, to));
        peer.offer(text("YV12 to ", depth), convert(AV_PIX_FMT_YUV420P, to));
        peer.offer(text("bits * to ", depth), convert(AV_PIX_FMT_MONOBLACK, to));
    }
    peer.offer("nearest *", convert(AV_PIX_FMT_BGRA, AV_PIX_FMT_BGRA, SWS_POINT));
    peer.offer("linear *", convert(AV_PIX_FMT_BGRA, AV_PIX_FMT_BGRA, SWS_BILINEAR));
    peer.offer("box *", convert(AV_PIX_FMT_BGRA, AV_PIX_FMT_BGRA, SWS_AREA));
    return text(AV_VERSION_MAJOR(swscale_version()), ".", AV_VERSION_MINOR(swscale_version()));
}

} // namespace quillon::bench
