#include "comparison.h"
#include "operations/operations.h"
#include "peers/peers.h"
#include "report.h"
#include "shapes.h"

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
    for (const Area &area : kAreas)
        addPixelOperations(plan, area);
    addRectLists(plan);
    addImages(plan);
    addPeers(plan);
    return plan;
}

} // namespace

int main(int argc, char **argv) {
    pinToOneCore();
    benchmark::Initialize(&argc, argv);
    // What Google Benchmark leaves over is ours.
    std::string reportFolder;
    for (int i = 1; i < argc; ++i) {
        const std::string argument = argv[i];
        if (argument == "--sweep")
            return sweep();
        if (argument == "--growth")
            return growth();
        if (argument.rfind("--report=", 0) != 0)
            return benchmark::ReportUnrecognizedArguments(argc, argv), 1;
        reportFolder = argument.substr(9);
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
