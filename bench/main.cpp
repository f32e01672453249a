#include "comparison.h"
#include "operations/operations.h"
#include "peers/peers.h"
#include "report.h"
#include "shapes.h"

#include <hwy/targets.h>
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

// Whether there is an instruction set of that name; if so, no other one is used.
bool useTarget(const std::string &name) {
    for (const int64_t target : hwy::SupportedAndGeneratedTargets()) {
        if (name == hwy::TargetName(target)) {
            hwy::SetSupportedTargetsForTest(target);
            return true;
        }
    }
    return false;
}

struct Arguments {
    std::string reportFolder;
    bool sweep = false, growth = false;
};

// What Google Benchmark leaves over; false where there is something unknown.
bool parse(int count, char **arguments, Arguments &parsed) {
    for (int i = 1; i < count; ++i) {
        const std::string argument = arguments[i];
        const auto valueOf = [&](const std::string &name) {
            return argument.rfind(name, 0) == 0 ? argument.substr(name.size()) : "";
        };
        if (argument == "--sweep")
            parsed.sweep = true;
        else if (argument == "--growth")
            parsed.growth = true;
        else if (!valueOf("--report=").empty())
            parsed.reportFolder = valueOf("--report=");
        else if (valueOf("--target=").empty() || !useTarget(valueOf("--target=")))
            return false;
    }
    return true;
}

} // namespace

int main(int argc, char **argv) {
    pinToOneCore();
    benchmark::Initialize(&argc, argv);
    Arguments arguments;
    if (!parse(argc, argv, arguments))
        return benchmark::ReportUnrecognizedArguments(argc, argv), 1;
    if (arguments.sweep)
        return sweep();
    if (arguments.growth)
        return growth(arguments.reportFolder);

    const Plan plan = makePlan();
    std::vector<Result> results;
    registerComparisons(plan, results);
    Reporter reporter(results);
    benchmark::RunSpecifiedBenchmarks(&reporter);
    printSummary(results);
    if (!arguments.reportFolder.empty())
        writeReport(results, arguments.reportFolder);
    benchmark::Shutdown();
    return 0;
}
