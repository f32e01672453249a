// OpenCV's core and imgproc, on one thread.
#include "../operations/operations.h"
#include "peers.h"

#include <opencv2/core.hpp>
#include <opencv2/imgproc.hpp>

namespace quillon::bench {
namespace {

cv::Mat matOf(const Buffer &buffer) {
    const auto bytes = static_cast<int>(buffer.rowBytes / buffer.width);
    return {buffer.h(), buffer.w(), CV_8UC(bytes), buffer.data, static_cast<size_t>(buffer.stride)};
}

// Calls call(src, dst).
template <class Call>
auto onMats(const Call &call) {
    return [=](const Job &job) -> Work {
        return [=, src = matOf(job.planes[job.count - 1]), dst = matOf(job.dst())]() mutable {
            call(src, dst);
        };
    };
}

auto convert(int code) {
    return onMats([=](const cv::Mat &src, cv::Mat &dst) { cv::cvtColor(src, dst, code); });
}

auto resize(int interpolation) {
    return onMats([=](const cv::Mat &src, cv::Mat &dst) {
        cv::resize(src, dst, dst.size(), 0, 0, interpolation);
    });
}

cv::Scalar channels(uint32_t pixel) {
    return {double(pixel & 0xFF), double(pixel >> 8 & 0xFF), double(pixel >> 16 & 0xFF),
            double(pixel >> 24)};
}

Work applyKey(const Job &job) {
    return
        [dst = matOf(job.planes[0]), background = matOf(job.planes[1]),
         overlay = matOf(job.planes[2]), keys = matOf(job.planes[3]), mask = cv::Mat()]() mutable {
            // The top byte of a 32-bit key does not count.
            cv::inRange(keys, channels(kPixel & 0xFFFFFF), channels(kPixel | 0xFF000000), mask);
            background.copyTo(dst);
            overlay.copyTo(dst, mask);
        };
}

} // namespace

std::string offerOpenCv(const Peer &peer) {
    cv::setNumThreads(1);
    using Mat = cv::Mat;
    const auto exact = [&](const char *names, const auto &call) {
        peer.offer(names, onMats(call), Kind::Exact);
    };
    exact("fill *", [](const Mat &, Mat &dst) { dst.setTo(channels(kPixel)); });
    exact("copy *", [](const Mat &src, Mat &dst) { src.copyTo(dst); });
    exact("raster copy copy 32", [](const Mat &src, Mat &dst) { src.copyTo(dst); });
    exact("raster copy and 32", [](const Mat &src, Mat &dst) { cv::bitwise_and(src, dst, dst); });
    exact("raster copy or 32", [](const Mat &src, Mat &dst) { cv::bitwise_or(src, dst, dst); });
    exact("raster copy xor *", [](const Mat &src, Mat &dst) { cv::bitwise_xor(src, dst, dst); });
    exact("raster copy invert 32", [](const Mat &, Mat &dst) { cv::bitwise_not(dst, dst); });
    exact("raster copy copy inverted 32",
          [](const Mat &src, Mat &dst) { cv::bitwise_not(src, dst); });
    peer.offer("convert 15 to 24", convert(cv::COLOR_BGR5552BGR));
    peer.offer("convert 15 to 32", convert(cv::COLOR_BGR5552BGRA));
    peer.offer("convert 16 to 24", convert(cv::COLOR_BGR5652BGR));
    peer.offer("convert 16 to 32", convert(cv::COLOR_BGR5652BGRA));
    peer.offer("convert 24 to 15", convert(cv::COLOR_BGR2BGR555), Kind::Exact);
    peer.offer("convert 24 to 16", convert(cv::COLOR_BGR2BGR565), Kind::Exact);
    peer.offer("convert 24 to 32", convert(cv::COLOR_BGR2BGRA), Kind::Exact);
    peer.offer("convert 32 to 15", convert(cv::COLOR_BGRA2BGR555));
    peer.offer("convert 32 to 16", convert(cv::COLOR_BGRA2BGR565), Kind::Exact);
    peer.offer("convert 32 to 24", convert(cv::COLOR_BGRA2BGR), Kind::Exact);
    peer.offer("YUY2 to 32", convert(cv::COLOR_YUV2BGRA_YUY2));
    peer.offer("YUY2 to 24", convert(cv::COLOR_YUV2BGR_YUY2));
    peer.offer("UYVY to 32", convert(cv::COLOR_YUV2BGRA_UYVY));
    peer.offer("UYVY to 24", convert(cv::COLOR_YUV2BGR_UYVY));
    peer.offer("YV12 to 32", convert(cv::COLOR_YUV2BGRA_YV12));
    peer.offer("YV12 to 24", convert(cv::COLOR_YUV2BGR_YV12));
    peer.offer("key *", applyKey, Kind::Exact);
    peer.offer("nearest *", resize(cv::INTER_NEAREST));
    peer.offer("linear *", resize(cv::INTER_LINEAR));
    peer.offer("box *", resize(cv::INTER_AREA));
    return CV_VERSION;
}

} // namespace quillon::bench
