#include "imageInput.h"

#include <hearth/hearth.h>

#include <algorithm>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <hwy/targets.h>

namespace quillon::fuzz {

namespace {

struct Format {
    uint32_t depth, bpp;
};

constexpr Format kFormats[] = {{8, 8}, {15, 16}, {16, 16}, {24, 24}, {24, 32}, {32, 32}};

} // namespace

InputImage::InputImage(Input &input) {
    std::memset(&info, 0, sizeof info);
    const uint32_t kind = input.byte();
    const Format format = kFormats[kind % std::size(kFormats)];
    const bool isOdd = kind >= 0xF0;
    info.depth = isOdd ? input.byte() : format.depth;
    info.bpp = isOdd ? input.byte() : format.bpp;
    info.width = input.size();
    info.height = input.size();
    const uint32_t padding = input.byte();
    info.bytesPerLine =
        padding >= 0xF0 ? input.size() : info.width * ((info.bpp + 7) / 8) + padding % 16;
    info.flags = input.byte();
    info.numColors = info.bpp <= 8 ? input.size() + 1 : 0;
    for (ImageUtilColor &color : info.palette)
        color = {static_cast<uint8_t>(input.left()), static_cast<uint8_t>(kind), 1, 0};
    const uint64_t bytes = uint64_t{info.height} * info.bytesPerLine;
    if (bytes == 0 || bytes > kMostInputBytes)
        return; // without pixels
    pixels.resize(bytes);
    for (size_t i = 0; i < bytes && input.left() != 0; ++i)
        pixels[i] = input.rest()[i % input.left()];
    info.data = pixels.data();
}

void chooseTarget(uint32_t number) {
    static const std::vector<int64_t> kTargets = hwy::SupportedAndGeneratedTargets();
    hwy::SetSupportedTargetsForTest(kTargets[number % kTargets.size()]);
}

void require(bool isTrue) {
    if (!isTrue)
        std::abort();
}

bool readPng(const std::vector<uint8_t> &file, uint32_t flags, ImageInfo *image) {
    std::memset(image, 0, sizeof *image);
    if (!ImageUtil_ReadPNGBuffer(image, file.data(), static_cast<uint32_t>(file.size()), flags)) {
        ImageUtil_FreeImageData(image);
        return false;
    }
    const uint64_t rowBytes = uint64_t{image->width} * image->bpp / 8;
    require(image->data != nullptr && image->bytesPerLine >= rowBytes && image->numColors <= 256);
    return true;
}

} // namespace quillon::fuzz

// A header of a few bytes can ask for 4 GiB: in the place of libhearth's function, one
// that gives less.
void *UtilSafeMalloc0(size_t size) {
    return size == 0 || size > quillon::fuzz::kMostBytes ? nullptr : std::malloc(size);
}

void Panic(const char *format, ...) {
    char text[256];
    va_list arguments;
    va_start(arguments, format);
    vsnprintf(text, sizeof text, format, arguments);
    va_end(arguments);
    throw quillon::fuzz::Panicked(text);
}

void Warning(const char * /*format*/, ...) {}

// A few bytes can ask for gigabytes of a canvas or a file.
extern "C" const char *__asan_default_options() {
    return "allocator_may_return_null=1:max_allocation_size_mb=64";
}

extern "C" int LLVMFuzzerInitialize(int * /*argc*/, char *** /*argv*/) {
    stderr = std::fopen("/dev/null", "w"); // what libpng has to say; libFuzzer keeps its own
    return 0;
}
