// A Panic that becomes an exception, in the place of libhearth's.  panic.cpp does
// nothing else; the tests have one of their own (messages.h).
#pragma once

#include <cstdarg>
#include <cstdio>
#include <stdexcept>
#include <string>

namespace quillon::test {

// what() is the formatted message.
class PanicError : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

inline std::string formatted(const char *format, va_list arguments) {
    char text[1024];
    vsnprintf(text, sizeof(text), format, arguments);
    return text;
}

} // namespace quillon::test
