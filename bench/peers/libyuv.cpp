// libyuv: its ARGB is our 32 bits; luma and chroma by the same coefficients, rounded.
#include "../operations/names.h"
#include "../operations/operations.h"
#include "peers.h"

#include <libyuv.h>

namespace quillon::bench {
namespace {

int width(const Buffer &buffer) {
    return static_cast<int>(buffer.width);
}
int height(const Buffer &buffer) {
    return static_cast<int>(buffer.height);
}

// The many functions from one buffer to another.
using Conversion = int (*)(const uint8_t *, int, uint8_t *, int, int, int);

Prepare converter(Conversion convert) {
    return [convert](const Job &job) -> Work {
        return [convert, dst = job.dst, src = job.src()] {
            convert(src.data, src.line(), dst.data, dst.line(), width(dst), height(dst));
        };
    };
}

// The same from three planes.
using PlanarConversion = int (*)(const uint8_t *, int, const uint8_t *, int, const uint8_t *, int,
                                 uint8_t *, int, int, int);

Prepare planarConverter(PlanarConversion convert) {
    return [convert](const Job &job) -> Work {
        return [convert, dst = job.dst, luma = job.src().data] {
            const size_t pixels = size_t{dst.width} * dst.height;
            const int chromaLine = width(dst) / 2;
            convert(luma, width(dst), luma + pixels * 5 / 4, chromaLine, luma + pixels, chromaLine,
                    dst.data, dst.line(), width(dst), height(dst));
        };
    };
}

void offerScaling(Offers &offers) {
    const auto offer = [&](const char *name, double factor, libyuv::FilterMode mode) {
        offers[scaleName(name, factor)].push_back(
            {"libyuv", Agreement::Approximate, [mode](const Job &job) -> Work {
                 return [mode, dst = job.dst, src = job.src()] {
                     libyuv::ARGBScale(src.data, src.line(), width(src), height(src), dst.data,
                                       dst.line(), width(dst), height(dst), mode);
                 };
             }});
    };
    for (const double factor : kNearestFactors)
        offer("nearest", factor, libyuv::kFilterNone);
    for (const double factor : kLinearFactors)
        offer("linear", factor, libyuv::kFilterBilinear);
    // By other factors it interpolates, whatever it is asked for.
    offer("box", 0.5, libyuv::kFilterBox);
}

} // namespace

void offerLibyuv(Offers &offers) {
    const auto offer = [&](const std::string &operation, Agreement agreement,
                           const Prepare &prepare) {
        offers[operation].push_back({"libyuv", agreement, prepare});
    };
    offer("fill 8", Agreement::Exact, [](const Job &job) -> Work {
        return [dst = job.dst] {
            libyuv::SetPlane(dst.data, dst.line(), width(dst), height(dst), kPixel & 0xFF);
        };
    });
    offer("fill 32", Agreement::Exact, [](const Job &job) -> Work {
        return [dst = job.dst] {
            libyuv::ARGBRect(dst.data, dst.line(), 0, 0, width(dst), height(dst), kPixel);
        };
    });
    offer("copy 32", Agreement::Exact, converter(libyuv::ARGBCopy));
    for (const char *content : {"noise", "interface"}) {
        offer("blend " + std::string(content), Agreement::Approximate, [](const Job &job) -> Work {
            return [dst = job.dst, src = job.src()] {
                libyuv::ARGBBlend(src.data, src.line(), dst.data, dst.line(), dst.data, dst.line(),
                                  width(dst), height(dst));
            };
        });
    }

    offer(conversionName(15, 32), Agreement::Approximate, converter(libyuv::ARGB1555ToARGB));
    offer(conversionName(16, 32), Agreement::Exact, converter(libyuv::RGB565ToARGB));
    offer(conversionName(24, 32), Agreement::Exact, converter(libyuv::RGB24ToARGB));
    offer(conversionName(32, 15), Agreement::Approximate, converter(libyuv::ARGBToARGB1555));
    offer(conversionName(32, 16), Agreement::Exact, converter(libyuv::ARGBToRGB565));
    offer(conversionName(32, 24), Agreement::Exact, converter(libyuv::ARGBToRGB24));

    offer("YUY2 to 32", Agreement::Approximate, converter(libyuv::YUY2ToARGB));
    offer("UYVY to 32", Agreement::Approximate, converter(libyuv::UYVYToARGB));
    offer("YV12 to 32", Agreement::Approximate, planarConverter(libyuv::I420ToARGB));
    offer("YV12 to 24", Agreement::Approximate, planarConverter(libyuv::I420ToRGB24));
    offer("YV12 to 16", Agreement::Approximate, planarConverter(libyuv::I420ToRGB565));
    offer("YV12 to 15", Agreement::Approximate, planarConverter(libyuv::I420ToARGB1555));
    offerScaling(offers);
}

} // namespace quillon::bench
