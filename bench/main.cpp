#include "comparison.h"
#include "instructions.h"
#include "operations/operations.h"
#include "peers/peers.h"
#include "report.h"
#include "shapes.h"

#include <hwy/targets.h>
#include <sched.h>

#include <algorithm>
#include <fstream>
#include <span>

namespace {

using namespace quillon::bench;

void pinToThisCore() {
    cpu_set_t one;
    CPU_ZERO(&one);
    CPU_SET(sched_getcpu(), &one);
    sched_setaffinity(0, sizeof(one), &one);
}

// Limits all kernels to an instruction set; false where there is none of that name.
bool useTarget(const std::string &name) {
    for (const int64_t target : hwy::SupportedAndGeneratedTargets())
        if (name == hwy::TargetName(target))
            return hwy::SetSupportedTargetsForTest(target), true;
    return false;
}

// Writes to the folder, or to the console where there is none; false if it cannot.
bool publish(const std::string &page, const std::string &folder, const char *name) {
    if (folder.empty())
        return std::puts(page.c_str()) >= 0;
    return !(std::ofstream(folder + name) << page).flush().fail();
}

} // namespace

int main(int argc, char **argv) {
    pinToThisCore();
    benchmark::Initialize(&argc, argv);
    std::string folder;
    bool isSweep = false, isGrowth = false, isMarked = false;
    for (const std::string argument : std::span(argv + 1, argv + argc)) {
        if (argument == "--sweep")
            isSweep = true;
        else if (argument == "--growth")
            isGrowth = true;
        else if (argument == "--instructions")
            isMarked = true;
        else if (argument.starts_with("--report="))
            folder = argument.substr(9);
        else if (!argument.starts_with("--target=") || !useTarget(argument.substr(9)))
            return benchmark::ReportUnrecognizedArguments(argc, argv), 1;
    }
    if (isSweep)
        return sweep() == 0 ? 0 : 1;
    if (isGrowth)
        return publish(growthPage(), folder, "/growth.md") ? 0 : 1;

    const std::vector<Operation> operations = allOperations();
    if (isMarked)
        return markInstructions(operations), 0;
    std::vector<Result> results;
    registerComparisons(operations, results);
    benchmark::AddCustomContext("peers", peerText());
    benchmark::RunSpecifiedBenchmarks();
    benchmark::Shutdown();
    bool isGood = std::ranges::none_of(results, &Result::bytesDiffer);
    std::printf("\n%s", summaryText(results).c_str());
    if (!folder.empty())
        isGood &= publish(performancePage(results), folder, "/performance.md");
    return isGood ? 0 : 1;
}
