// Panic, Warning and Log of the test programs.  They take the place of
// libhearth's: a panic becomes an exception, the other messages are kept.
#pragma once

#include <gtest/gtest.h>

#include <stdexcept>
#include <string>
#include <vector>

namespace quillon::test {

// What Panic throws; what() is the formatted message.
class PanicError : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

// The messages since the last clearMessages(), oldest first.
std::vector<std::string> warnings();
std::vector<std::string> logs();
void clearMessages();

// Runs a call that has to end in a Panic, and gives its message; warnings()
// then holds those of this call alone.
template <class Call>
std::string expectPanic(const Call &call) {
    clearMessages();
    try {
        call();
    } catch (const PanicError &panic) {
        return panic.what();
    }
    ADD_FAILURE() << "the call returned without a Panic";
    return {};
}

// Takes the line out of a message "<start>:<line>\n", such as
// "NOT_IMPLEMENTED lib/raster/rasterops:95\n".  Any other message is a failure,
// and gives 0.
int panicLine(const std::string &message, const std::string &start);

} // namespace quillon::test
