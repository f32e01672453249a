#include "comparison.h"
#include "instructions.h"
#include "operations/operations.h"
#include "peers/peers.h"
#include "report.h"
#include "shapes.h"

#include <hwy/targets.h>
#include <quillon/version.h>
#include <sched.h>

#include <algorithm>
#include <cstdio>
#include <fstream>
#include <span>
#include <string_view>

namespace {

using namespace quillon::bench;

constexpr char kHelp[] =
    "usage: quillonBench [OPTION...]\n"
    "\n"
    "Measures every operation beside other libraries and beside what memory allows.\n"
    "\n"
    "  --target=NAME       with the kernels of one instruction set, such as AVX2\n"
    "  --report=FOLDER     write the page there instead of showing it\n"
    "  --sweep             look for slow shapes of rectangles\n"
    "  --growth            time a pixel, from small to large\n"
    "  --instructions      mark each operation for an emulator that counts\n"
    "  --benchmark_...     options of Google Benchmark, as --benchmark_filter=REGEX\n"
    "  --help, --version   show this text; show the version\n";

void pinToThisCore() {
    cpu_set_t one;
    CPU_ZERO(&one);
    CPU_SET(sched_getcpu(), &one);
    sched_setaffinity(0, sizeof(one), &one);
}

// The instruction sets of this processor that have the name; all of them for "".
std::vector<int64_t> targetsNamed(const std::string &name) {
    std::vector<int64_t> targets = hwy::SupportedAndGeneratedTargets();
    std::erase_if(targets,
                  [&](int64_t target) { return !name.empty() && name != hwy::TargetName(target); });
    return targets;
}

// The best one, and AVX2, which most desktops have for their best.
std::vector<int64_t> targetsByDefault() {
    std::vector<int64_t> targets = {targetsNamed("")[0]};
    for (const int64_t avx2 : targetsNamed("AVX2"))
        if (avx2 != targets[0])
            targets.push_back(avx2);
    return targets;
}

// Writes to the folder, or to the console where there is none; false if it cannot.
bool publish(const std::string &page, const std::string &folder, const char *name) {
    if (folder.empty())
        return std::puts(page.c_str()) >= 0;
    return !(std::ofstream(folder + name) << page).flush().fail();
}

} // namespace

int main(int argc, char **argv) {
    const std::string_view option = argc == 2 ? argv[1] : "";
    if (option == "--help")
        return std::fputs(kHelp, stdout) < 0;
    if (option == "--version")
        return std::puts("quillonBench " QUILLON_VERSION_STRING) < 0;
    pinToThisCore();
    benchmark::Initialize(&argc, argv);
    std::string folder;
    std::vector<int64_t> targets = targetsByDefault();
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
        else if (argument.starts_with("--target="))
            targets = targetsNamed(argument.substr(9));
        else
            return benchmark::ReportUnrecognizedArguments(argc, argv), 1;
    }
    if (targets.empty())
        return std::fputs("This processor has no such instruction set\n", stderr), 1;
    hwy::SetSupportedTargetsForTest(targets[0]);
    if (isSweep)
        return sweep() == 0 ? 0 : 1;
    if (isGrowth)
        return publish(growthPage(), folder, "/growth.md") ? 0 : 1;

    std::vector<Operation> operations = allOperations();
    const std::string peers = addPeers(operations);
    if (isMarked)
        return markInstructions(operations), 0;
    std::vector<Result> results;
    for (const int64_t target : targets)
        registerComparisons(operations, target, results);
    benchmark::AddCustomContext("peers", peers);
    benchmark::RunSpecifiedBenchmarks();
    benchmark::Shutdown();
    bool isGood = std::ranges::none_of(results, &Result::bytesDiffer);
    std::printf("\n%s", summaryText(results).c_str());
    if (!folder.empty())
        isGood &= publish(performancePage(results, peers), folder, "/performance.md");
    return isGood ? 0 : 1;
}
