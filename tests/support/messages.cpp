#include "support/messages.h"

#include "hearth.h"

#include <cstdarg>
#include <cstdio>
#include <mutex>
#include <regex>

namespace quillon::test {
namespace {

std::mutex mutex;
std::vector<std::string> keptWarnings;
std::vector<std::string> keptLogs;

std::string formatted(const char *format, va_list arguments) {
    char text[1024];
    vsnprintf(text, sizeof(text), format, arguments);
    return text;
}

void keep(std::vector<std::string> &messages, const char *format, va_list arguments) {
    const std::lock_guard lock(mutex);
    messages.push_back(formatted(format, arguments));
}

std::vector<std::string> copyOf(const std::vector<std::string> &messages) {
    const std::lock_guard lock(mutex);
    return messages;
}

} // namespace

std::vector<std::string> warnings() {
    return copyOf(keptWarnings);
}

std::vector<std::string> logs() {
    return copyOf(keptLogs);
}

void clearMessages() {
    const std::lock_guard lock(mutex);
    keptWarnings.clear();
    keptLogs.clear();
}

int panicLine(const std::string &message, const std::string &start) {
    std::smatch match;
    if (std::regex_match(message, match, std::regex(start + ":([1-9][0-9]{0,5})\n")))
        return std::stoi(match[1]);
    ADD_FAILURE() << "not \"" << start << ":<line>\\n\": " << message;
    return 0;
}

} // namespace quillon::test

using namespace quillon::test;

void Panic(const char *format, ...) {
    va_list arguments;
    va_start(arguments, format);
    const std::string text = formatted(format, arguments);
    va_end(arguments);
    throw PanicError(text);
}

void Warning(const char *format, ...) {
    va_list arguments;
    va_start(arguments, format);
    keep(keptWarnings, format, arguments);
    va_end(arguments);
}

void Log(const char *format, ...) {
    va_list arguments;
    va_start(arguments, format);
    keep(keptLogs, format, arguments);
    va_end(arguments);
}
