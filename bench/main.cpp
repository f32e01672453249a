#include "comparison.h"
#include "operations/operations.h"
#include "peers/peers.h"
#include "report.h"

#include <sched.h>
#include <unistd.h>

namespace {

using namespace quillon::bench;

// On the last of the processors that we may use, where least else happens.
void pinToOneCore() {
    cpu_set_t allowed, one;
    if (sched_getaffinity(0, sizeof(allowed), &allowed) != 0)
        return;
    int last = CPU_SETSIZE - 1;
    while (last > 0 && !CPU_ISSET(last, &allowed))
        --last;
    CPU_ZERO(&one);
    CPU_SET(last, &one);
    sched_setaffinity(0, sizeof(one), &one);
}

Plan makePlan() {
    Plan plan;
    for (const auto add : {addFills, addCopies, addBlends, addBits, addConversions, addScaling,
                           addVideo, addRectLists, addImages})
        add(plan);
    addPeers(plan);
    return plan;
}

} // namespace

int main(int argc, char **argv) {
    pinToOneCore();
    benchmark::Initialize(&argc, argv);
    // What is left over is ours: --report=FOLDER.
    std::string reportFolder;
    for (int i = 1; i < argc; ++i) {
        const std::string argument = argv[i];
        if (argument.rfind("--report=", 0) == 0)
            reportFolder = argument.substr(9);
        else
            return benchmark::ReportUnrecognizedArguments(argc, argv), 1;
    }

    const Plan plan = makePlan();
    std::vector<Result> results;
    registerComparisons(plan, results);
    Reporter reporter(results);
    benchmark::RunSpecifiedBenchmarks(&reporter);
    printSummary(results);
    if (!reportFolder.empty())
        writeReport(results, reportFolder);
    benchmark::Shutdown();
    return 0;
}
