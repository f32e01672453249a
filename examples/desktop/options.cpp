#include "options.h"

#include <charconv>
#include <stdexcept>
#include <string_view>

namespace desktop {

const char kHelp[] =
    "usage: desktop [OPTION...]\n"
    "\n"
    "A small software desktop, drawn by libquillon alone.  It opens a window; F1 there lists\n"
    "the keys.\n"
    "\n"
    "  --vnc PORT          no window, but a screen for remote viewers, on 127.0.0.1\n"
    "  --address ADDRESS   listen there instead; whoever reaches it has the desktop\n"
    "  --size WxH          of the screen (1120x700)\n"
    "  --wallpaper FILE    a PNG behind the windows\n"
    "  --picture FILE      a PNG in the picture windows\n"
    "  --video FILE        raw frames, yuv420p, in the video windows; - is standard input\n"
    "  --video-size WxH    of its frames (640x360)\n"
    "  --video-fps N       frames per second (25)\n"
    "  --screenshot FILE   write a picture of the desktop, and nothing else\n"
    "  --selftest [N]      do N random actions (1000); the screen must always be what a full\n"
    "                      redraw gives\n"
    "  --seed S            of the random actions (1)\n"
    "  --help, --version\n"
    "\n"
    "A film comes by\n"
    "    ffmpeg -i FILM -f rawvideo -pix_fmt yuv420p -s 640x360 - | desktop --video -\n";

namespace {

int32_t parseNumber(std::string_view option, std::string_view text, int32_t first, int32_t last) {
    int32_t number = 0;
    const char *const endOfText = text.data() + text.size();
    const auto [end, error] = std::from_chars(text.data(), endOfText, number);
    if (error != std::errc{} || end != endOfText || number < first || number > last)
        throw std::runtime_error(std::string(option) + " takes a whole number from " +
                                 std::to_string(first) + " to " + std::to_string(last) + ", not '" +
                                 std::string(text) + "'");
    return number;
}

Size parseSize(std::string_view option, std::string_view text) {
    constexpr int32_t kSmallest = 64, kLargest = 8192;
    const size_t cross = text.find('x');
    if (cross == std::string_view::npos)
        throw std::runtime_error(std::string(option) + " takes a size such as 640x480, not '" +
                                 std::string(text) + "'");
    return {parseNumber(option, text.substr(0, cross), kSmallest, kLargest),
            parseNumber(option, text.substr(cross + 1), kSmallest, kLargest)};
}

} // namespace

Options parseOptions(int argc, char **argv) {
    Options options;
    int next = 1;
    const auto hasNumber = [&] {
        return next < argc && argv[next][0] >= '0' && argv[next][0] <= '9';
    };
    while (next < argc) {
        const std::string_view option = argv[next++];
        const auto value = [&] {
            if (next == argc)
                throw std::runtime_error(std::string(option) + " takes a value");
            return argv[next++];
        };
        const auto number = [&](int32_t first, int32_t last) {
            return parseNumber(option, value(), first, last);
        };
        constexpr int32_t kMany = 1'000'000'000;
        if (option == "--help") {
            options.mode = Mode::kHelp;
        } else if (option == "--version") {
            options.mode = Mode::kVersion;
        } else if (option == "--vnc") {
            options.mode = Mode::kRemote;
            options.port = number(1, 65535);
        } else if (option == "--address") {
            options.address = value();
        } else if (option == "--size") {
            options.size = parseSize(option, value());
        } else if (option == "--wallpaper") {
            options.wallpaper = value();
        } else if (option == "--picture") {
            options.picture = value();
        } else if (option == "--video") {
            options.video = value();
        } else if (option == "--video-size") {
            options.videoSize = parseSize(option, value());
        } else if (option == "--video-fps") {
            options.framesPerSecond = number(1, 240);
        } else if (option == "--screenshot") {
            options.mode = Mode::kScreenshot;
            options.screenshot = value();
        } else if (option == "--selftest") {
            options.mode = Mode::kSelftest;
            if (hasNumber())
                options.actions = number(1, kMany);
        } else if (option == "--seed") {
            options.seed = static_cast<uint32_t>(number(0, kMany));
        } else {
            throw std::runtime_error("unknown option " + std::string(option) + "; see --help");
        }
    }
    return options;
}

} // namespace desktop
