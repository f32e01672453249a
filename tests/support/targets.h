// Running a test on every instruction set that the library was compiled for and
// this processor has.  Compile with the library's own dispatch settings: which
// targets there are depends on them.
#pragma once

#include "support/random.h"

#include <gtest/gtest.h>
#include <hwy/targets.h>

#include <cstdint>
#include <vector>

namespace quillon::test {

template <class Run>
void forEachTarget(const Run &run) {
    struct Restore {
        ~Restore() {
            hwy::SetSupportedTargetsForTest(0);
            running.target = "any";
        }
    } const restore;
    const std::vector<int64_t> targets = hwy::SupportedAndGeneratedTargets();
    ASSERT_FALSE(targets.empty());
    for (const int64_t target : targets) {
        SCOPED_TRACE(hwy::TargetName(target));
        running.target = hwy::TargetName(target);
        hwy::SetSupportedTargetsForTest(target);
        run();
        if (testing::Test::HasFailure())
            return;
    }
}

} // namespace quillon::test
