// Panic, Warning and Log of the test programs.  They take the place of
// libhearth's: a panic becomes an exception, or what panicWay says; the other
// messages are kept.
#pragma once

#include "support/panic.h"

#include <gtest/gtest.h>

#include <csetjmp>
#include <regex>
#include <string>
#include <vector>

namespace quillon::test {

enum class PanicWay { kThrow, kJump, kAbort, kReturn };
inline PanicWay panicWay = PanicWay::kThrow;
inline jmp_buf panicJump; // where to, with kJump

// Since the last expectPanic() or clear(), oldest first.
using Messages = std::vector<std::string>;
inline Messages warnings, logs;

// Runs a call that has to end in a Panic of the message "<start>:<line><end>\n",
// such as "NOT_IMPLEMENTED lib/raster/rasterops:95\n".
template <class Call>
void expectPanic(const std::string &start, const Call &call, const std::string &end = {}) {
    warnings.clear();
    try {
        call();
        ADD_FAILURE() << "the call returned without a Panic";
    } catch (const PanicError &panic) {
        EXPECT_TRUE(std::regex_match(panic.what(), std::regex(start + ":[1-9][0-9]*" + end + '\n')))
            << panic.what();
    }
}

} // namespace quillon::test
