#include "support/panic.h"

#include <hearth/hearth.h>

void Panic(const char *format, ...) {
    va_list arguments;
    va_start(arguments, format);
    const std::string text = quillon::test::formatted(format, arguments);
    va_end(arguments);
    throw quillon::test::PanicError(text);
}
