// One number for each family of functions, which changes when any of its results does:
// the CRC-32 of what comes of a fixed sequence of random calls.
//
//     fingerprint [--long] [--target=NAME]
//
// prints a line for each family: its name, how many calls, the CRC of what came of
// them; with --long also after twenty times as many.  NAME is an instruction set, such
// as AVX2; without it the library chooses.  --targets lists those that there are.
//
// What comes of a call of operations/ is also held to its plain statement; a difference
// is reported, and the program fails.

#include "images.h"
#include "operations.h"
#include "sum.h"
#include "support/judge.h"
#include "support/targets.h"

#include <quillon/version.h>

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <optional>
#include <string_view>
#include <zlib.h>

namespace quillon::fingerprint {
namespace {

constexpr char kHelp[] =
    "usage: fingerprint [--long] [--target=NAME] [--targets]\n"
    "\n"
    "Prints a line for each family of functions: its name, how many calls, the CRC of what came\n"
    "of them.\n"
    "\n"
    "  --long              twenty times as many calls\n"
    "  --target=NAME       on one instruction set, such as AVX2\n"
    "  --targets           list those that there are\n"
    "  --help, --version   show this text; show the version\n";

struct Family {
    const char *name;
    void (*call)(test::Random &);
    uint32_t calls; // of the short form: a million together
};
constexpr Family kFamilies[] = {
    {"fill", test::family::fill, 90000},
    {"copy", test::family::copy, 90000},
    {"blend", test::family::blend, 90000},
    {"rop", test::family::rop, 120000},
    {"bits", test::family::bits, 90000},
    {"convert", test::family::convert, 120000},
    {"scale", test::family::scale, 20000},
    {"video", test::family::video, 60000},
    {"colorKey", test::family::colorKey, 60000},
    {"cursor", test::family::cursor, 36000},
    {"region", test::family::region, 60000},
    {"rect", test::family::rect, 150000},
    {"pngRead", decode, 2000},
    {"pngWrite", encode, 2000},
    {"bmp", encodeBmp, 4000},
    {"combine", combine, 3000},
    {"cropAndScale", cropAndScale, 3000},
};
constexpr uint32_t kLongForm = 20;

uLong sum;
uint64_t differences;

void run(const Family &family, bool isLong) {
    sum = crc32(0, nullptr, 0);
    const uint64_t seed = crc32(0, reinterpret_cast<const Bytef *>(family.name),
                                static_cast<uInt>(std::strlen(family.name)));
    printf("%-12s", family.name);
    const uint64_t calls = uint64_t{family.calls} * (isLong ? kLongForm : 1);
    for (uint64_t i = 1; i <= calls; ++i) {
        test::running.number = i;
        test::Random random(test::Random(seed << 32 | i).bits());
        family.call(random);
        if (i == family.calls || i == calls)
            printf(" %9ju %08lx", uintmax_t{i}, sum);
    }
    printf("\n");
    fflush(stdout);
}

} // namespace

void add(const void *bytes, size_t size) {
    sum = size == 0 ? sum : crc32_z(sum, static_cast<const Bytef *>(bytes), size);
}

} // namespace quillon::fingerprint

using namespace quillon;

void test::forEachTarget(const std::function<void()> &run) {
    run();
}

void test::withoutMemory(const std::function<void()> &call) {
    call();
}

void test::compare(const void *actual, const void *expected, size_t size,
                   const std::function<std::string()> &description) {
    fingerprint::add(actual, size);
    if (size == 0 || std::memcmp(actual, expected, size) == 0)
        return;
    ++fingerprint::differences;
    fprintf(stderr, "call %ju, on %s: %s; %s\n", uintmax_t{running.number}, running.target,
            firstDifference(actual, expected, size).c_str(), description().c_str());
}

int main(int argumentCount, char **arguments) {
    bool isLong = false;
    std::optional<test::OnTarget> on;
    for (int i = 1; i < argumentCount; ++i) {
        const std::string_view argument = arguments[i];
        bool isKnown = argument == "--long";
        isLong = isLong || isKnown;
        for (const int64_t target : test::kTargets) {
            if (argument == "--targets")
                printf("%s\n", hwy::TargetName(target));
            else if (argument == std::string("--target=") + hwy::TargetName(target))
                isKnown = true, on.emplace(target);
        }
        if (argument == "--targets")
            return EXIT_SUCCESS;
        if (argument == "--help")
            return fputs(fingerprint::kHelp, stdout) < 0;
        if (argument == "--version")
            return puts("fingerprint " QUILLON_VERSION_STRING) < 0;
        if (!isKnown)
            return fputs(fingerprint::kHelp, stderr), 2;
    }
    for (const fingerprint::Family &family : fingerprint::kFamilies)
        fingerprint::run(family, isLong);
    return fingerprint::differences == 0 ? EXIT_SUCCESS : EXIT_FAILURE;
}
