// yuvToPng: turns one raw video frame into a PNG picture.
//
//     yuvToPng IN.yuv WIDTH HEIGHT FORMAT OUT.png
//
// FORMAT is I420 (yuv420p of ffmpeg), YV12, NV12, YUY2, UYVY, YVYU or VYUY.
//
//     c++ -std=c++17 yuvToPng.cpp $(pkg-config --cflags --libs quillon)
#include <quillon/quillon.hpp>

#include <charconv>
#include <cstdio>
#include <exception>
#include <filesystem>
#include <fstream>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <system_error>
#include <utility>
#include <vector>

namespace {

constexpr char kHelp[] =
    "usage: yuvToPng IN.yuv WIDTH HEIGHT FORMAT OUT.png\n"
    "\n"
    "Turns one raw video frame into a picture.  FORMAT is I420 (yuv420p of ffmpeg), YV12, NV12,\n"
    "YUY2, UYVY, YVYU or VYUY.\n"
    "\n"
    "  --help, --version   show this text; show the version\n";
constexpr char kFormatNames[] = "I420, YV12, NV12, YUY2, UYVY, YVYU or VYUY";

int32_t parseSide(const char *what, std::string_view text) {
    constexpr int32_t kMaxSide = 16384;
    int32_t side = 0;
    const char *const last = text.data() + text.size();
    const auto [end, error] = std::from_chars(text.data(), last, side);
    if (error != std::errc{} || end != last || side < 1 || side > kMaxSide)
        throw std::runtime_error(std::string(what) + " must be a whole number from 1 to " +
                                 std::to_string(kMaxSide) + ", not '" + std::string(text) + "'");
    return side;
}

quillon::VideoFormat parseFormat(std::string_view text) {
    using quillon::VideoFormat;
    static const std::pair<std::string_view, VideoFormat> kFormats[] = {
        {"I420", VideoFormat::kI420}, {"YV12", VideoFormat::kYv12}, {"NV12", VideoFormat::kNv12},
        {"YUY2", VideoFormat::kYuy2}, {"UYVY", VideoFormat::kUyvy}, {"YVYU", VideoFormat::kYvyu},
        {"VYUY", VideoFormat::kVyuy}};
    for (const auto &[name, format] : kFormats)
        if (text == name)
            return format;
    throw std::runtime_error("the format must be " + std::string(kFormatNames) + ", not '" +
                             std::string(text) + "'");
}

// Reads a file that must have just the given size: a raw frame does not tell its
// own, so this is the only sign of a wrong width, height or format.
std::vector<uint8_t> readFrame(const std::string &fileName, uint64_t size) {
    std::error_code error;
    const auto found = std::filesystem::file_size(fileName, error);
    if (error)
        throw std::runtime_error(fileName + ": " + error.message());
    if (found != size)
        throw std::runtime_error(fileName + ": has " + std::to_string(found) +
                                 " bytes, but such a frame has " + std::to_string(size));
    std::vector<uint8_t> frame(size);
    std::ifstream file(fileName, std::ios::binary);
    if (!file.read(reinterpret_cast<char *>(frame.data()), static_cast<std::streamsize>(size)))
        throw std::runtime_error(fileName + ": cannot be read");
    return frame;
}

void run(char **arguments) {
    const quillon::Size size = {parseSide("the width", arguments[1]),
                                parseSide("the height", arguments[2])};
    const quillon::VideoFormat format = parseFormat(arguments[3]);
    const std::vector<uint8_t> frame =
        readFrame(arguments[0], quillon::VideoFrame::byteCount(format, size));

    std::optional<quillon::Image> picture = quillon::Image::create(size, quillon::Format::kBgr24);
    if (!picture)
        throw std::runtime_error("there is no memory for a picture of this size");
    picture->copyVideo({0, 0}, quillon::VideoFrame(frame.data(), format, size));
    if (!picture->writePng(arguments[4]))
        throw std::runtime_error(std::string(arguments[4]) + ": cannot be written");
}

} // namespace

int main(int argc, char **argv) {
    const std::string_view option = argc == 2 ? argv[1] : "";
    if (option == "--help")
        return std::fputs(kHelp, stdout) < 0;
    if (option == "--version")
        return std::puts("yuvToPng " QUILLON_VERSION_STRING) < 0;
    if (argc != 6)
        return std::fputs(kHelp, stderr), 2;
    try {
        run(argv + 1);
        return 0;
    } catch (const std::exception &problem) {
        std::fprintf(stderr, "yuvToPng: %s\n", problem.what());
        return 1;
    }
}
