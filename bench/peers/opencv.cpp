// OpenCV's core and imgproc, on one thread.
#include "../operations/names.h"
#include "../operations/operations.h"
#include "peers.h"

#include <quillon/raster.h>

#include <opencv2/core.hpp>
#include <opencv2/imgproc.hpp>

namespace quillon::bench {
namespace {

cv::Mat matOf(const Buffer &buffer, int type) {
    return {static_cast<int>(buffer.height), static_cast<int>(buffer.width), type, buffer.data,
            buffer.step};
}

int typeOf(int32_t bits) {
    return bits == 8 ? CV_8UC1 : bits == 16 ? CV_8UC2 : bits == 24 ? CV_8UC3 : CV_8UC4;
}

cv::Scalar channels(uint32_t pixel) {
    return {double(pixel & 0xFF), double(pixel >> 8 & 0xFF), double(pixel >> 16 & 0xFF),
            double(pixel >> 24)};
}

// The bitwise codes that it has; the others would take several passes.
constexpr uint32_t kRops[] = {RASTER_ROP_AND,  RASTER_ROP_OR,     RASTER_ROP_XOR,
                            RASTER_ROP_COPY, RASTER_ROP_INVERT, RASTER_ROP_COPY_INVERTED};

void combine(uint32_t rop, const cv::Mat &src, cv::Mat &dst) {
    switch (rop) {
    case RASTER_ROP_AND:
        return cv::bitwise_and(src, dst, dst);
    case RASTER_ROP_OR:
        return cv::bitwise_or(src, dst, dst);
    case RASTER_ROP_XOR:
        return cv::bitwise_xor(src, dst, dst);
    case RASTER_ROP_INVERT:
        return cv::bitwise_not(dst, dst);
    case RASTER_ROP_COPY_INVERTED:
        return cv::bitwise_not(src, dst);
    default:
        return src.copyTo(dst);
    }
}

void offerRasterCopies(Offers &offers) {
    for (const int32_t bits : {8, 16, 24, 32}) {
        for (const uint32_t rop : kRops) {
            offers["raster copy " + ropName(rop) + " " + std::to_string(bits)].push_back(
                {"OpenCV", Agreement::Exact, [=](const Job &job) -> Work {
                     const cv::Mat src =
                         job.sourceCount > 0 ? matOf(job.src(), typeOf(bits)) : cv::Mat();
                     return [=, dst = matOf(job.dst, typeOf(bits))]() mutable {
                         combine(rop, src, dst);
                     };
                 }});
        }
    }
}

// From and to so many bytes a pixel, by one of its colour codes.
Contender converter(int code, int srcType, int dstType, Agreement agreement) {
    return {"OpenCV", agreement, [=](const Job &job) -> Work {
                return [=, src = matOf(job.src(), srcType),
                        dst = matOf(job.dst, dstType)]() mutable { cv::cvtColor(src, dst, code); };
            }};
}

void offerConversions(Offers &offers) {
    constexpr struct {
        int32_t from, to;
        int code, srcType, dstType;
        Agreement agreement;
    } kCodes[] = {
        {15, 24, cv::COLOR_BGR5552BGR, CV_8UC2, CV_8UC3, Agreement::Approximate},
        {15, 32, cv::COLOR_BGR5552BGRA, CV_8UC2, CV_8UC4, Agreement::Approximate},
        {16, 24, cv::COLOR_BGR5652BGR, CV_8UC2, CV_8UC3, Agreement::Approximate},
        {16, 32, cv::COLOR_BGR5652BGRA, CV_8UC2, CV_8UC4, Agreement::Approximate},
        {24, 15, cv::COLOR_BGR2BGR555, CV_8UC3, CV_8UC2, Agreement::Exact},
        {24, 16, cv::COLOR_BGR2BGR565, CV_8UC3, CV_8UC2, Agreement::Exact},
        {24, 32, cv::COLOR_BGR2BGRA, CV_8UC3, CV_8UC4, Agreement::Exact},
        {32, 15, cv::COLOR_BGRA2BGR555, CV_8UC4, CV_8UC2, Agreement::Approximate},
        {32, 16, cv::COLOR_BGRA2BGR565, CV_8UC4, CV_8UC2, Agreement::Exact},
        {32, 24, cv::COLOR_BGRA2BGR, CV_8UC4, CV_8UC3, Agreement::Exact},
    };
    for (const auto &code : kCodes)
        offers[conversionName(code.from, code.to)].push_back(
            converter(code.code, code.srcType, code.dstType, code.agreement));
}

void offerVideo(Offers &offers) {
    constexpr struct {
        const char *operation;
        int code, srcType, dstType;
    } kCodes[] = {
        {"YUY2 to 32", cv::COLOR_YUV2BGRA_YUY2, CV_8UC2, CV_8UC4},
        {"YUY2 to 24", cv::COLOR_YUV2BGR_YUY2, CV_8UC2, CV_8UC3},
        {"UYVY to 32", cv::COLOR_YUV2BGRA_UYVY, CV_8UC2, CV_8UC4},
        {"UYVY to 24", cv::COLOR_YUV2BGR_UYVY, CV_8UC2, CV_8UC3},
        {"YV12 to 32", cv::COLOR_YUV2BGRA_YV12, CV_8UC1, CV_8UC4},
        {"YV12 to 24", cv::COLOR_YUV2BGR_YV12, CV_8UC1, CV_8UC3},
    };
    for (const auto &code : kCodes)
        offers[code.operation].push_back(
            converter(code.code, code.srcType, code.dstType, Agreement::Approximate));
    for (const int32_t depth : {8, 16, 32}) {
        offers["key " + std::to_string(depth)].push_back(
            {"OpenCV", Agreement::ColourOnly, [=](const Job &job) -> Work {
                 return [=, dst = matOf(job.dst, CV_8UC4), back = matOf(job.sources[0], CV_8UC4),
                         over = matOf(job.sources[1], CV_8UC4),
                         keys = matOf(job.sources[2], typeOf(depth)), mask = cv::Mat()]() mutable {
                     cv::Scalar low = channels(kPixel), high = low;
                     low[3] = 0; // the top byte of a 32-bit key does not count
                     high[3] = 255;
                     cv::inRange(keys, low, high, mask);
                     back.copyTo(dst);
                     over.copyTo(dst, mask);
                 };
             }});
    }
}

void offerScaling(Offers &offers) {
    const auto offer = [&](const char *name, double factor, int interpolation) {
        offers[scaleName(name, factor)].push_back(
            {"OpenCV", Agreement::Approximate, [=](const Job &job) -> Work {
                 return
                     [=, src = matOf(job.src(), CV_8UC4), dst = matOf(job.dst, CV_8UC4)]() mutable {
                         cv::resize(src, dst, dst.size(), 0, 0, interpolation);
                     };
             }});
    };
    for (const double factor : kNearestFactors)
        offer("nearest", factor, cv::INTER_NEAREST);
    for (const double factor : kLinearFactors)
        offer("linear", factor, cv::INTER_LINEAR);
    for (const double factor : kBoxFactors)
        offer("box", factor, cv::INTER_AREA);
}

} // namespace

void offerOpenCv(Offers &offers) {
    cv::setNumThreads(1);
    for (const int32_t bits : {8, 16, 24, 32}) {
        const Prepare fill = [=](const Job &job) -> Work {
            const cv::Scalar value = bits == 8 ? cv::Scalar::all(kPixel & 0xFF) : channels(kPixel);
            return [=, dst = matOf(job.dst, typeOf(bits))]() mutable { dst.setTo(value); };
        };
        offers["fill " + std::to_string(bits)].push_back({"OpenCV", Agreement::Exact, fill});
        offers["copy " + std::to_string(bits)].push_back(
            {"OpenCV", Agreement::Exact, [=](const Job &job) -> Work {
                 return [src = matOf(job.src(), typeOf(bits)),
                         dst = matOf(job.dst, typeOf(bits))]() mutable { src.copyTo(dst); };
             }});
    }
    offerRasterCopies(offers);
    offerConversions(offers);
    offerVideo(offers);
    offerScaling(offers);
}

} // namespace quillon::bench
