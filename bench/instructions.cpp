#include "instructions.h"

#include "arena.h"
#include "emulator/mark.h"

#include <unistd.h>

#include <cstdio>

namespace quillon::bench {

void markInstructions(const std::vector<Operation> &operations) {
    for (const Operation &operation : operations) {
        if (operation.area.isUncached)
            continue;
        const std::vector<Job> jobs = makeJobs(operation);
        for (const Contender &contender : operation.contenders) {
            const Work work = contender.prepare(jobs[0]);
            work(); // the first call looks the functions up
            std::printf("%s\t%s\t%s\t%u\t", operation.area.name.c_str(), operation.name.c_str(),
                        contender.name.c_str(), operation.area.width * operation.area.height);
            std::fflush(stdout);
            syscall(kMarkCall, kMarkBegin);
            work();
            syscall(kMarkCall, kMarkEnd);
        }
    }
}

} // namespace quillon::bench
