// swscale: conversion and scaling through one kind of context.
#include "../operations/names.h"
#include "../operations/operations.h"
#include "peers.h"

#include <map>
#include <memory>

extern "C" {
#include <libavutil/log.h>
#include <libswscale/swscale.h>
}

namespace quillon::bench {
namespace {

using Context = std::shared_ptr<SwsContext>;

struct Ends {
    AVPixelFormat src, dst;
    int flags;
    auto operator<=>(const Ends &) const = default;
};

// One context serves all jobs of the same sizes.
Context contextOf(const Ends &ends, int srcWidth, int srcHeight, const Buffer &dst) {
    static std::map<std::tuple<Ends, int, int, uint32_t, uint32_t>, Context> made;
    Context &context = made[{ends, srcWidth, srcHeight, dst.width, dst.height}];
    if (!context)
        context = Context(sws_getContext(srcWidth, srcHeight, ends.src, static_cast<int>(dst.width),
                                         static_cast<int>(dst.height), ends.dst, ends.flags,
                                         nullptr, nullptr, nullptr),
                          sws_freeContext);
    return context;
}

Work convert(const Job &job, const Ends &ends) {
    const Buffer dst = job.dst, src = job.src();
    const bool planar = ends.src == AV_PIX_FMT_YUV420P;
    const int srcHeight = static_cast<int>(planar ? dst.height : src.height);
    const Context context = contextOf(ends, static_cast<int>(src.width), srcHeight, dst);
    if (!context)
        return [] {};
    const uint8_t *planes[4] = {src.data};
    int steps[4] = {src.line()};
    if (planar) {
        const size_t pixels = size_t{dst.width} * dst.height;
        planes[1] = src.data + pixels * 5 / 4;
        planes[2] = src.data + pixels;
        steps[1] = steps[2] = src.line() / 2;
    } else if (ends.src == AV_PIX_FMT_PAL8) {
        planes[1] = reinterpret_cast<const uint8_t *>(palette().data());
    }
    return [=] {
        uint8_t *out[4] = {dst.data};
        const int outSteps[4] = {dst.line()};
        sws_scale(context.get(), planes, steps, 0, srcHeight, out, outSteps);
    };
}

void offer(Offers &offers, const std::string &operation, const Ends &ends) {
    offers[operation].push_back(
        {"swscale", Agreement::Approximate, [=](const Job &job) { return convert(job, ends); }});
}

} // namespace

void offerSwscale(Offers &offers) {
    av_log_set_level(AV_LOG_ERROR);
    constexpr struct {
        int32_t depth;
        AVPixelFormat format;
    } kFormats[] = {{kIndex, AV_PIX_FMT_PAL8}, {8, AV_PIX_FMT_RGB8},   {15, AV_PIX_FMT_RGB555LE},
                    {16, AV_PIX_FMT_RGB565LE}, {24, AV_PIX_FMT_BGR24}, {32, AV_PIX_FMT_BGRA}};
    for (const auto &from : kFormats) {
        for (const auto &to : kFormats)
            offer(offers, conversionName(from.depth, to.depth),
                  {from.format, to.format, SWS_POINT});
    }
    for (const auto &to : kFormats) {
        const std::string depth = std::to_string(to.depth);
        offer(offers, "YUY2 to " + depth, {AV_PIX_FMT_YUYV422, to.format, SWS_POINT});
        offer(offers, "UYVY to " + depth, {AV_PIX_FMT_UYVY422, to.format, SWS_POINT});
        offer(offers, "YV12 to " + depth, {AV_PIX_FMT_YUV420P, to.format, SWS_POINT});
        offer(offers, "bits noise to " + depth, {AV_PIX_FMT_MONOBLACK, to.format, SWS_POINT});
    }
    const auto offerScaling = [&](const char *name, const auto &factors, int flags) {
        for (const double factor : factors)
            offer(offers, scaleName(name, factor), {AV_PIX_FMT_BGRA, AV_PIX_FMT_BGRA, flags});
    };
    offerScaling("nearest", kNearestFactors, SWS_POINT);
    offerScaling("linear", kLinearFactors, SWS_BILINEAR);
    offerScaling("box", kBoxFactors, SWS_AREA);
}

} // namespace quillon::bench
