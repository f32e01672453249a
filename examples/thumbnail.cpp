// quillon-thumbnail: cuts and scales a PNG picture, and writes it as PNG or BMP.
//
//     quillon-thumbnail IN.png OUT.{png,bmp} [--width W] [--height H] [--crop X,Y,WxH]
//
// Build it by itself with
//
//     c++ -std=c++20 thumbnail.cpp $(pkg-config --cflags --libs quillon)

#include <quillon/imageUtil.h>
#include <quillon/raster.h>
#include <quillon/version.h>

#include <array>
#include <cerrno>
#include <charconv>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <getopt.h>
#include <new>
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
    "  --width W      pixels per row of the output, 1 to 32767\n"
    "  --height H     rows of the output, 1 to 32767\n"
    "                 With only one of them given the other follows by proportion;\n"
    "                 with none the picture keeps its size.\n"
    "  --crop X,Y,WxH take W by H pixels from column X, row Y on; the whole picture\n"
    "                 otherwise\n"
    "  --help         show this text\n"
    "  --version      show the version\n"
    "\n"
    "A PNG output has alpha when any pixel of the input is not opaque.\n"
    "Colour and palette files are read, grey ones are not.\n";

constexpr int32_t kMaxSide = 32767; // what the scaler takes
constexpr int32_t kNotGiven = -1;   // as the library has it

struct Crop {
    int32_t x, y, width, height;
};

struct Request {
    std::string input;
    std::string output;
    bool isBmp = false;
    int32_t width = kNotGiven;
    int32_t height = kNotGiven;
    std::optional<Crop> crop;
};

// An image record that gives its pixels back.
struct Image : ImageInfo {
    Image() { static_cast<ImageInfo &>(*this) = ImageInfo{}; }
    Image(const Image &) = delete;
    Image &operator=(const Image &) = delete;
    ~Image() { ImageUtil_FreeImageData(this); }
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

Crop parseCrop(std::string_view text) {
    Crop crop = {};
    if (!takeNumber(text, 0, crop.x) || !takeMark(text, ',') || !takeNumber(text, 0, crop.y) ||
        !takeMark(text, ',') || !takeNumber(text, 1, crop.width) || !takeMark(text, 'x') ||
        !takeNumber(text, 1, crop.height) || !text.empty()) {
        throw std::runtime_error("--crop takes X,Y,WxH in whole pixels, for example 10,20,300x200");
    }
    return crop;
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
            std::printf("quillon-thumbnail %d.%d.%d\n", QUILLON_VERSION_MAJOR,
                        QUILLON_VERSION_MINOR, QUILLON_VERSION_PATCH);
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

// Expands a palette image to opaque 32-bit pixels.
void expandPalette(const Image &indexed, Image &colored) {
    std::array<uint32_t, 256> palette = {};
    for (size_t i = 0; i < palette.size(); ++i) {
        const ImageUtilColor &color = indexed.palette[i];
        palette[i] =
            0xFF000000u | uint32_t{color.red} << 16 | uint32_t{color.green} << 8 | color.blue;
    }
    colored.width = indexed.width;
    colored.height = indexed.height;
    colored.depth = 24;
    colored.bpp = 32;
    colored.bytesPerLine = indexed.width * 4;
    colored.data = static_cast<uint8_t *>(std::calloc(indexed.height, colored.bytesPerLine));
    if (colored.data == nullptr) {
        throw std::bad_alloc();
    }
    Raster_ConvertIndexTo32(colored.data, colored.bytesPerLine, indexed.data, indexed.bytesPerLine,
                            palette.data(), 0, 0, 0, 0, indexed.width, indexed.height);
}

// Reads the input as 32-bit pixels, which is what the scaler takes.
void readInput(const Request &request, Image &picture) {
    if (access(request.input.c_str(), R_OK) != 0) {
        throw std::runtime_error(request.input + ": " + std::generic_category().message(errno));
    }
    Image read;
    if (!ImageUtil_ReadPNG(&read, request.input.c_str(),
                           IMAGEUTIL_READ_KEEP_ALPHA | IMAGEUTIL_READ_ADD_ALPHA)) {
        throw std::runtime_error(request.input + ": not a whole PNG picture in colour");
    }
    if (read.bpp == 8) {
        expandPalette(read, picture);
    } else {
        std::swap<ImageInfo>(read, picture);
    }
}

bool isOpaque(const Image &picture) {
    for (uint32_t y = 0; y < picture.height; ++y) {
        const uint8_t *const row = picture.data + size_t{y} * picture.bytesPerLine;
        for (uint32_t x = 0; x < picture.width; ++x) {
            if (row[size_t{x} * 4 + 3] != 255) {
                return false;
            }
        }
    }
    return true;
}

void cropAndScale(const Request &request, const Image &picture, Image &thumbnail) {
    Rect part = {0, 0, kNotGiven, kNotGiven};
    if (request.crop) {
        Rect_SetFromXYWH(&part, request.crop->x, request.crop->y, request.crop->width,
                         request.crop->height);
    }
    if (!ImageUtil_CropAndScaleImage(&picture, part.left, part.top, part.right, part.bottom, 0, 0,
                                     request.width, request.height, &thumbnail)) {
        throw std::runtime_error("a picture of " + std::to_string(picture.width) + " by " +
                                 std::to_string(picture.height) +
                                 " cannot be cut and scaled like this");
    }
}

// Writes beside the target and renames, so that the target is the whole picture
// or what it was before.
void writeOutput(const Request &request, const Image &thumbnail, bool keepAlpha) {
    const std::string part = request.output + ".part" + std::to_string(getpid());
    const ImageUtilPngOptions options = {.compressionLevel = -1, .stripAlpha = !keepAlpha};
    const bool isWritten =
        request.isBmp ? ImageUtil_WriteImage(&thumbnail, part.c_str(), IMAGEUTIL_FORMAT_BMP)
                      : ImageUtil_WritePNG(&thumbnail, part.c_str(), &options);
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
    Image picture;
    readInput(request, picture);
    Image thumbnail;
    cropAndScale(request, picture, thumbnail);
    writeOutput(request, thumbnail, !isOpaque(picture));
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
