#include "measure.h"

int main(int argc, char **argv) {
    using namespace quillon::bench;
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv))
        return 1;
    registerFill();
    registerCopy();
    registerBlend();
    registerConvert();
    registerScale();
    registerImage();
    benchmark::RunSpecifiedBenchmarks();
    benchmark::Shutdown();
    return 0;
}
