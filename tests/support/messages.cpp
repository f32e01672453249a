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
    va_list again;
    va_copy(again, arguments);
    const int length = vsnprintf(nullptr, 0, format, arguments);
    std::string text(static_cast<size_t>(length), '\0');
    vsnprintf(text.data(), text.size() + 1, format, again);
    va_end(again);
    return text;
}

} // namespace

std::vector<std::string> warnings() {
    const std::lock_guard lock(mutex);
    return keptWarnings;
}

std::vector<std::string> logs() {
    const std::lock_guard lock(mutex);
    return keptLogs;
}

void clearMessages() {
    const std::lock_guard lock(mutex);
    keptWarnings.clear();
    keptLogs.clear();
}

int panicLine(const std::string &message, const std::string &start) {
    std::smatch match;
    if (message.compare(0, start.size(), start) == 0) {
        const std::string rest = message.substr(start.size());
        if (std::regex_match(rest, match, std::regex(":([1-9][0-9]{0,5})\n")))
            return std::stoi(match[1]);
    }
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
    const std::string text = formatted(format, arguments);
    va_end(arguments);
    const std::lock_guard lock(mutex);
    keptWarnings.push_back(text);
}

void Log(const char *format, ...) {
    va_list arguments;
    va_start(arguments, format);
    const std::string text = formatted(format, arguments);
    va_end(arguments);
    const std::lock_guard lock(mutex);
    keptLogs.push_back(text);
}
