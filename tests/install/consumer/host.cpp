// A host that puts its own functions in the place of libhearth's: failures come
// as exceptions, and warnings are kept.
#include <hearth/hearth.h>
#include <quillon/raster.h>

#include <cstdarg>
#include <cstdio>
#include <stdexcept>
#include <string>

static std::string warning;

static std::string formatted(const char *format, va_list arguments) {
    char text[256];
    std::vsnprintf(text, sizeof text, format, arguments);
    return text;
}

void Panic(const char *format, ...) {
    va_list arguments;
    va_start(arguments, format);
    const std::string text = formatted(format, arguments);
    va_end(arguments);
    throw std::runtime_error(text);
}

void Warning(const char *format, ...) {
    va_list arguments;
    va_start(arguments, format);
    warning = formatted(format, arguments);
    va_end(arguments);
}

int main() {
    uint8_t surface[64] = {};
    try {
        Raster_RectFill(surface, 16, 5, 0, 0, 0, 2, 2);
    } catch (const std::runtime_error &error) {
        const std::string text = error.what();
        const bool good =
            text.find("NOT_IMPLEMENTED lib/raster/rasterops:") == 0 && !warning.empty();
        std::printf("host: %s%s", warning.c_str(), text.c_str());
        return good ? 0 : 1;
    }
    std::puts("host: its own Panic was not called");
    return 1;
}
