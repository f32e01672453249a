#include "support/messages.h"

#include <hearth/hearth.h>

#include <dlfcn.h>

using namespace quillon::test;

void Panic(const char *format, ...) {
    va_list arguments;
    va_start(arguments, format);
    char text[1024]; // held by nobody when a jump leaves
    vsnprintf(text, sizeof text, format, arguments);
    va_end(arguments);
    if (panicWay == PanicWay::kJump)
        longjmp(panicJump, 1);
    if (panicWay == PanicWay::kReturn)
        return;
    if (panicWay == PanicWay::kAbort)
        reinterpret_cast<decltype(&Panic)>(dlsym(RTLD_NEXT, "Panic"))("%s", text);
    throw PanicError(text);
}

void Warning(const char *format, ...) {
    va_list arguments;
    va_start(arguments, format);
    warnings.push_back(formatted(format, arguments));
    va_end(arguments);
}

void Log(const char *format, ...) {
    va_list arguments;
    va_start(arguments, format);
    logs.push_back(formatted(format, arguments));
    va_end(arguments);
}
