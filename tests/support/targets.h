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

inline const std::vector<int64_t> kTargets = hwy::SupportedAndGeneratedTargets();

// While one lives, the library runs on this target.
struct OnTarget {
    explicit OnTarget(int64_t target) {
        running.target = hwy::TargetName(target);
        hwy::SetSupportedTargetsForTest(target);
    }
    ~OnTarget() {
        running.target = "any";
        hwy::SetSupportedTargetsForTest(0);
    }
    OnTarget(const OnTarget &) = delete;
    OnTarget &operator=(const OnTarget &) = delete;
};

template <class Run>
void forEachTarget(const Run &run) {
    ASSERT_FALSE(kTargets.empty());
    for (const int64_t target : kTargets) {
        const OnTarget on(target);
        SCOPED_TRACE(hwy::TargetName(target));
        run();
        if (testing::Test::HasFailure())
            return;
    }
}

} // namespace quillon::test
