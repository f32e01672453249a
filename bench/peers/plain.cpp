// Plain loops over the pixels; for frames, the tests' own.
#include "../operations/names.h"
#include "../operations/operations.h"
#include "peers.h"
#include "plainLoops.h"

#include "reference/video.h"

#include <quillon/raster.h>

namespace quillon::bench {
namespace {

template <class Call>
void offer(Offers &offers, const std::string &operation, const Call &call) {
    offers[operation].push_back({"plain loop", Agreement::Exact, [=](const Job &job) -> Work {
                                     return [=] { call(job, job.dst, job.src()); };
                                 }});
}

void offerBitLoops(Offers &offers, int32_t bytes) {
    const std::string depth = std::to_string(8 * bytes);
    offer(offers, "bits noise to " + depth, [=](const Job &, const Buffer &dst, const Buffer &src) {
        plain::bitsToPixels(src.data, src.line(), dst.data, dst.line(), bytes,
                            static_cast<int32_t>(dst.width), dst.height, kForeground, kBackground);
    });
    for (const char *content : {"text", "noise", "sparse"}) {
        offer(offers, "stencil " + std::string(content) + " to " + depth,
              [=](const Job &, const Buffer &dst, const Buffer &src) {
                  plain::bitsToPixelsStencil(src.data, src.line(), dst.data, dst.line(), bytes,
                                             static_cast<int32_t>(dst.width), dst.height,
                                             kForeground);
              });
    }
}

void offerRopLoops(Offers &offers, int32_t bytes) {
    for (uint32_t rop = 0; rop < 16; ++rop) {
        const std::string name = ropName(rop) + " " + std::to_string(8 * bytes);
        offer(offers, "raster fill " + name, [=](const Job &, const Buffer &dst, const Buffer &) {
            plain::rectRopFill(dst.data, dst.line(), bytes, kPixel, rop, 0, 0, dst.width,
                               dst.height);
        });
        offer(offers, "raster copy " + name,
              [=](const Job &job, const Buffer &dst, const Buffer &src) {
                  const Buffer &from = job.sourceCount > 0 ? src : dst;
                  plain::rectRopCopy(dst.data, dst.line(), from.data, from.line(), bytes, 0, 0, rop,
                                     0, 0, dst.width, dst.height);
              });
    }
}

void offerConversionLoops(Offers &offers) {
    for (const int32_t from : {kIndex, 15, 16, 24, 32}) {
        for (const int32_t to : {3, 6, 8, 15, 16, 24, 32}) {
            offer(offers, conversionName(from, to),
                  [=](const Job &, const Buffer &dst, const Buffer &src) {
                      plain::convertPixels(dst.data, static_cast<uint32_t>(dst.step), to, src.data,
                                           static_cast<uint32_t>(src.step), from == kIndex ? 8 : from,
                                           from == kIndex, palette().data(), 0, 0, 0, 0, dst.width,
                                           dst.height);
                  });
        }
    }
}

void offerVideoLoops(Offers &offers) {
    constexpr struct {
        const char *name;
        uint32_t format;
    } kFormats[] = {
        {"YUY2", RASTER_VIDEO_YUY2}, {"UYVY", RASTER_VIDEO_UYVY}, {"YV12", RASTER_VIDEO_YV12}};
    for (const auto &from : kFormats) {
        for (const int32_t depth : {15, 16, 24, 32}) {
            offer(offers, from.name + std::string(" to ") + std::to_string(depth),
                  [=, format = from.format](const Job &, const Buffer &dst, const Buffer &src) {
                      reference::yuvToRgb(src.data, dst.data, dst.width, dst.height, format, depth);
                  });
        }
    }
    for (const uint32_t depth : {8, 16, 32}) {
        offer(offers, "key " + std::to_string(depth),
              [=](const Job &job, const Buffer &dst, const Buffer &back) {
                  const Buffer &over = job.sources[1], &keys = job.sources[2];
                  plain::applyColorKey(back.data, dst.data, over.data, keys.data, back.line(),
                                       dst.line(), over.line(), keys.line(), kPixel, 0, 0,
                                       dst.width, dst.height, depth);
              });
    }
}

} // namespace

void offerPlainLoops(Offers &offers) {
    for (const int32_t bytes : {1, 2, 3, 4}) {
        const std::string depth = std::to_string(8 * bytes);
        offer(offers, "fill " + depth, [=](const Job &, const Buffer &dst, const Buffer &) {
            plain::rectFill(dst.data, dst.line(), bytes, kPixel, 0, 0, dst.width, dst.height);
        });
        offer(offers, "copy " + depth, [=](const Job &, const Buffer &dst, const Buffer &src) {
            plain::rectCopy(dst.data, dst.line(), src.data, src.line(), bytes, 0, 0, 0, 0,
                            dst.width, dst.height);
        });
        offerBitLoops(offers, bytes);
        offerRopLoops(offers, bytes);
    }
    offer(offers, "alpha fill", [](const Job &, const Buffer &dst, const Buffer &) {
        plain::rectFillAlpha(dst.data, dst.line(), kAlpha, 0, 0, dst.width, dst.height);
    });
    for (const char *content : {"noise", "interface"}) {
        offer(offers, "blend " + std::string(content),
              [](const Job &, const Buffer &dst, const Buffer &src) {
                  plain::alphaBlendOver(dst.data, 0, 0, dst.line(), src.data, 0, 0, src.line(),
                                        dst.width, dst.height);
              });
    }
    offerConversionLoops(offers);
    offerVideoLoops(offers);
}

} // namespace quillon::bench
