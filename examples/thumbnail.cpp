// quillon-thumbnail: cuts and scales a PNG picture, and writes it as PNG or BMP.
//
//     quillon-thumbnail IN.png OUT.{png,bmp} [--width W] [--height H] [--crop X,Y,WxH]
//
// Build it by itself with
//
//     c++ -std=c++20 thumbnail.cpp $(pkg-config --cflags --libs quillon)

#include <quillon/quillon.hpp>
#include <quillon/version.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <charconv>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <getopt.h>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <strings.h>
#include <system_error>
#include <unistd.h>
#include <utility>

namespace {

constexpr char kUsage[] =
    "usage: quillon-thumbnail IN.png OUT.{png,bmp} [--width W] [--height H] [--crop X,Y,WxH]\n"
    "\n"
    "Cuts and scales a PNG picture.  The name of the output tells its format.\n"
    "\n"
    "  --width W      pixels per row of the output, 1 to 32766\n"
    "  --height H     rows of the output, 1 to 32766\n"
    "                 With only one of them given the other follows by proportion;\n"
    "                 with none the picture keeps its size.\n"
    "  --crop X,Y,WxH take W by H pixels from column X, row Y on; the whole picture\n"
    "                 otherwise\n"
    "  --help         show this text\n"
    "  --version      show the version\n"
    "\n"
    "A PNG output has alpha when any pixel of the input is not opaque.\n"
    "Colour and palette files are read, grey ones are not.\n";

constexpr int32_t kMaxSide = 32766; // what the scaler takes
constexpr int32_t kNotGiven = -1;

struct Request {
    std::string input;
    std::string output;
    bool isBmp = false;
    int32_t width = kNotGiven;
    int32_t height = kNotGiven;
    std::optional<quillon::Rect> crop;
};

// Takes a decimal number off the front of text.
bool takeNumber(std::string_view &text, int32_t low, int32_t &value) {
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), value);
    text.remove_prefix(static_cast<size_t>(end - text.data()));
    return error == std::errc{} && value >= low && value <= kMaxSide;
}

bool takeMark(std::string_view &text, char mark) {
    const bool isThere = !text.empty() && text.front() == mark;
    text.remove_prefix(isThere ? 1 : 0);
    return isThere;
}

int32_t parseSide(const char *option, std::string_view text) {
    int32_t side = 0;
    if (!takeNumber(text, 1, side) || !text.empty()) {
        throw std::runtime_error(std::string(option) + " takes a whole number from 1 to " +
                                 std::to_string(kMaxSide));
    }
    return side;
}

quillon::Rect parseCrop(std::string_view text) {
    int32_t x = 0, y = 0, width = 0, height = 0;
    if (!takeNumber(text, 0, x) || !takeMark(text, ',') || !takeNumber(text, 0, y) ||
        !takeMark(text, ',') || !takeNumber(text, 1, width) || !takeMark(text, 'x') ||
        !takeNumber(text, 1, height) || !text.empty()) {
        throw std::runtime_error("--crop takes X,Y,WxH in whole pixels, for example 10,20,300x200");
    }
    return {x, y, width, height};
}

bool endsWith(const std::string &text, const char *ending) {
    const size_t length = std::strlen(ending);
    return text.size() > length && strcasecmp(text.c_str() + text.size() - length, ending) == 0;
}

// Nothing when all that was asked for is a text, which is out already.
std::optional<Request> parseArguments(int argc, char **argv) {
    static const std::array<option, 6> kOptions = {{{"width", required_argument, nullptr, 'w'},
                                                    {"height", required_argument, nullptr, 'h'},
                                                    {"crop", required_argument, nullptr, 'c'},
                                                    {"help", no_argument, nullptr, 'u'},
                                                    {"version", no_argument, nullptr, 'v'},
                                                    {nullptr, 0, nullptr, 0}}};
    Request request;
    int found = 0;
    // The leading colon keeps getopt from printing messages of its own.
    // NOLINTNEXTLINE(concurrency-mt-unsafe): there is one thread
    while ((found = getopt_long(argc, argv, ":", kOptions.data(), nullptr)) != -1) {
        switch (found) {
        case 'w':
            request.width = parseSide("--width", optarg);
            break;
        case 'h':
            request.height = parseSide("--height", optarg);
            break;
        case 'c':
            request.crop = parseCrop(optarg);
            break;
        case 'u':
            std::fputs(kUsage, stdout);
            return std::nullopt;
        case 'v':
            std::puts("quillon-thumbnail " QUILLON_VERSION_STRING);
            return std::nullopt;
        default:
            throw std::runtime_error(std::string(argv[optind - 1]) +
                                     ": unknown option, or without its value; see --help");
        }
    }
    if (argc - optind != 2) {
        throw std::runtime_error("one input and one output are needed; see --help");
    }
    request.input = argv[optind];
    request.output = argv[optind + 1];
    request.isBmp = endsWith(request.output, ".bmp");
    if (!request.isBmp && !endsWith(request.output, ".png")) {
        throw std::runtime_error(request.output + ": the name must end in .png or .bmp");
    }
    return request;
}

// Reads the input, with colours multiplied by their alpha: only so are the edges of
// what is transparent scaled right.
quillon::Image readInput(const Request &request) {
    if (access(request.input.c_str(), R_OK) != 0) {
        throw std::runtime_error(request.input + ": " + std::generic_category().message(errno));
    }
    std::optional<quillon::Image> picture = quillon::Image::readPng(request.input.c_str());
    if (!picture) {
        throw std::runtime_error(request.input + ": not a whole PNG picture in colour");
    }
    picture->premultiply();
    return std::move(*picture);
}

bool isOpaque(const quillon::Image &picture) {
    for (int32_t y = 0; y < picture.height(); ++y) {
        const uint8_t *const row = picture.row(y);
        for (std::ptrdiff_t x = 0; x < picture.width(); ++x) {
            if (row[4 * x + 3] != 255) {
                return false;
            }
        }
    }
    return true;
}

// The size of the output; a side that is not given follows by proportion.
quillon::Size outputSize(const Request &request, quillon::Size part) {
    const auto scaled = [](int32_t side, int32_t from, int32_t to) {
        return static_cast<int32_t>(std::clamp<int64_t>(int64_t{side} * to / from, 1, INT32_MAX));
    };
    if (request.width == kNotGiven && request.height == kNotGiven) {
        return part;
    }
    if (request.height == kNotGiven) {
        return {request.width, scaled(part.height, part.width, request.width)};
    }
    if (request.width == kNotGiven) {
        return {scaled(part.width, part.height, request.height), request.height};
    }
    return {request.width, request.height};
}

quillon::Image cropAndScale(const Request &request, quillon::Image &picture) {
    const quillon::Rect part = request.crop.value_or(picture.bounds());
    const quillon::Size size = outputSize(request, part.size());
    std::optional<quillon::Image> thumbnail;
    if (picture.bounds().contains(part)) {
        thumbnail = quillon::Image::create(size);
    }
    if (!thumbnail || !thumbnail->copyScaled(thumbnail->bounds(), picture.part(part))) {
        throw std::runtime_error("a picture of " + std::to_string(picture.width()) + " by " +
                                 std::to_string(picture.height()) +
                                 " cannot be cut and scaled like this");
    }
    thumbnail->unpremultiply();
    return std::move(*thumbnail);
}

// Writes beside the target and renames, so that the target is the whole picture
// or what it was before.
void writeOutput(const Request &request, const quillon::Image &thumbnail, quillon::Alpha alpha) {
    const std::string part = request.output + ".part" + std::to_string(getpid());
    const bool isWritten =
        request.isBmp ? thumbnail.writeBmp(part.c_str()) : thumbnail.writePng(part.c_str(), alpha);
    if (!isWritten) {
        std::remove(part.c_str());
        throw std::runtime_error(request.output + ": cannot be written");
    }
    if (std::rename(part.c_str(), request.output.c_str()) != 0) {
        const int error = errno;
        std::remove(part.c_str());
        throw std::runtime_error(request.output + ": " + std::generic_category().message(error));
    }
}

void run(const Request &request) {
    quillon::Image picture = readInput(request);
    const quillon::Alpha alpha = isOpaque(picture) ? quillon::Alpha::kDrop : quillon::Alpha::kKeep;
    writeOutput(request, cropAndScale(request, picture), alpha);
}

} // namespace

int main(int argc, char **argv) {
    try {
        const std::optional<Request> request = parseArguments(argc, argv);
        if (request) {
            run(*request);
        }
        return 0;
    } catch (const std::exception &problem) {
        std::fprintf(stderr, "quillon-thumbnail: %s\n", problem.what());
        return 1;
    }
}
