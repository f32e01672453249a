// Running the library on a chosen instruction set, of those that it was compiled for
// and this processor has.  Compile with the library's own dispatch settings: which
// targets there are depends on them.
#pragma once

#include "support/random.h"

#include <hwy/targets.h>

#include <cstdint>
#include <functional>
#include <vector>

namespace quillon::test {

inline const std::vector<int64_t> kTargets = hwy::SupportedAndGeneratedTargets();

// While one lives, the library runs on this target.
struct OnTarget {
    explicit OnTarget(int64_t target) {
        running.target = hwy::TargetName(target);
        hwy::GetChosenTarget().Update(target);
    }
    ~OnTarget() {
        running.target = "any";
        hwy::GetChosenTarget().DeInit(); // to be chosen by the next call
    }
    OnTarget(const OnTarget &) = delete;
    OnTarget &operator=(const OnTarget &) = delete;
};

} // namespace quillon::test
