// yuvToPng: turns one raw video frame into a PNG picture.
//
//     yuvToPng IN.yuv WIDTH HEIGHT {YUY2|UYVY|YV12} OUT.png
//
//     c++ -std=c++17 yuvToPng.cpp $(pkg-config --cflags --libs quillon)
#include <quillon/imageUtil.h>
#include <quillon/raster.h>

#include <algorithm>
#include <charconv>
#include <cstdio>
#include <exception>
#include <filesystem>
#include <fstream>
#include <stdexcept>
#include <string>
#include <string_view>
#include <system_error>
#include <utility>
#include <vector>

namespace {

uint32_t parseSide(const char *what, std::string_view text) {
    constexpr uint32_t kMaxSide = 16384; // so that no count of bytes passes 32 bits
    uint32_t side = 0;
    const char *const last = text.data() + text.size();
    const auto [end, error] = std::from_chars(text.data(), last, side);
    if (error != std::errc{} || end != last || side < 1 || side > kMaxSide)
        throw std::runtime_error(std::string(what) + " must be a whole number from 1 to " +
                                 std::to_string(kMaxSide) + ", not '" + std::string(text) + "'");
    return side;
}

uint32_t parseFormat(std::string_view text) {
    if (text == "YUY2")
        return RASTER_VIDEO_YUY2;
    if (text == "UYVY")
        return RASTER_VIDEO_UYVY;
    if (text == "YV12")
        return RASTER_VIDEO_YV12;
    throw std::runtime_error("the format must be YUY2, UYVY or YV12, not '" + std::string(text) +
                             "'");
}

// Reads a file that must have just the given size: a raw frame does not tell its
// own, so this is the only sign of a wrong width, height or format.
std::vector<uint8_t> readFrame(const std::string &fileName, size_t size) {
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

// The conversion takes U for V and V for U.  So it is given them exchanged, and
// then has the right colours, with red in the place of blue.
void exchangeChroma(std::vector<uint8_t> &frame, uint32_t format, size_t pixels) {
    if (format == RASTER_VIDEO_YV12) {
        const auto v = frame.begin() + static_cast<std::ptrdiff_t>(pixels);
        const auto u = v + static_cast<std::ptrdiff_t>(pixels / 4);
        std::swap_ranges(v, u, u);
        return;
    }
    const size_t first = format == RASTER_VIDEO_YUY2 ? 1 : 0; // Y U Y V, or U Y V Y
    for (size_t i = first; i < frame.size(); i += 4)
        std::swap(frame[i], frame[i + 2]);
}

void run(char **arguments) {
    const uint32_t width = parseSide("the width", arguments[1]);
    const uint32_t height = parseSide("the height", arguments[2]);
    const uint32_t format = parseFormat(arguments[3]);

    // Frames are stored with even sides, but for the height of the packed formats.
    // All of what is stored is converted, and the picture cut from it: told an odd
    // width, the conversion would leave out the last column of YV12, and take the
    // padding of a packed row for the first pixel of the next one.
    const uint32_t storedWidth = width + width % 2;
    const uint32_t storedHeight = format == RASTER_VIDEO_YV12 ? height + height % 2 : height;
    const size_t pixels = size_t{storedWidth} * storedHeight;
    std::vector<uint8_t> frame =
        readFrame(arguments[0], format == RASTER_VIDEO_YV12 ? pixels / 2 * 3 : pixels * 2);

    exchangeChroma(frame, format, pixels);
    std::vector<uint8_t> colors(pixels * 3);
    Raster_YUVtoRGB(frame.data(), colors.data(), storedWidth, storedHeight, format, 24);
    for (size_t i = 0; i < colors.size(); i += 3)
        std::swap(colors[i], colors[i + 2]);

    ImageInfo image = {}; // the pixels stay the vector's, so there is nothing to free
    image.width = width;
    image.height = height;
    image.depth = 24;
    image.bpp = 24;
    image.bytesPerLine = storedWidth * 3; // skips what is only stored
    image.data = colors.data();
    if (!ImageUtil_WriteImage(&image, arguments[4], IMAGEUTIL_FORMAT_PNG))
        throw std::runtime_error(std::string(arguments[4]) + ": cannot be written");
}

} // namespace

int main(int argc, char **argv) {
    try {
        if (argc != 6)
            throw std::runtime_error("usage: IN.yuv WIDTH HEIGHT {YUY2|UYVY|YV12} OUT.png");
        run(argv + 1);
        return 0;
    } catch (const std::exception &problem) {
        std::fprintf(stderr, "yuvToPng: %s\n", problem.what());
        return 1;
    }
}
