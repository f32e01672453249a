#include "snippet.h"
#include "picture.h"

#include <algorithm>
#include <sstream>
#include <vector>

namespace gallery {

namespace {

bool isBlank(const std::string &line) {
    return line.find_first_not_of(' ') == std::string::npos;
}

std::string unindented(const std::vector<std::string> &lines) {
    size_t indent = std::string::npos;
    for (const std::string &line : lines)
        indent = std::min(indent, line.find_first_not_of(' ')); // npos for a blank one
    std::string text;
    for (const std::string &line : lines)
        text += (isBlank(line) ? "" : line.substr(indent)) + "\n";
    return text;
}

} // namespace

std::string snippet(std::string_view name) {
    const std::string mark = "//! [" + std::string(name) + "]";
    for (const char *const *listing = kListings; *listing; ++listing) {
        std::istringstream source(*listing);
        std::vector<std::string> lines;
        bool isInside = false;
        for (std::string line; std::getline(source, line);) {
            const bool isMark = line.ends_with(mark);
            if (isMark && isInside)
                return unindented(lines);
            isInside |= isMark;
            if (isInside && !isMark)
                lines.push_back(line);
        }
    }
    fail("no lines are marked " + mark);
}

} // namespace gallery
