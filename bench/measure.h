// What every benchmark shares: surfaces, their contents, and how a measurement is
// registered.
//
// A measurement is named operation/size/who.  "who" is quillon, or somebody who
// does the same beside it: memset and memcpy on the same bytes show what memory
// allows.
#pragma once

#include "quillonTypes.h"

#include <benchmark/benchmark.h>

#include <algorithm>
#include <random>
#include <string>
#include <vector>

namespace quillon::bench {

// A rectangle of a surface: an icon, a window, a whole screen.
struct Area {
    const char *name;
    uint32 left; // where the rectangle starts in each row
    uint32 width;
    uint32 height;
    uint32 surfaceWidth;

    double pixels() const { return double{1} * width * height; }
};

inline constexpr Area kAreas[] = {
    {"32x32", 101, 32, 32, 1920},
    {"256x128", 101, 256, 128, 1920},
    {"3840x2160", 0, 3840, 2160, 3840},
};

// The memory of a surface that an area lies in, full of noise that is the same in
// every run.
class Surface {
public:
    Surface(const Area &area, uint32 bytesPerPixel)
        : step(area.surfaceWidth * bytesPerPixel), bytes(size_t{step} * area.height) {
        std::mt19937 random(1);
        std::generate(bytes.begin(), bytes.end(),
                      [&] { return static_cast<uint8>(random() >> 24); });
    }

    uint8 *data() { return bytes.data(); }
    uint32 lineIncrement() const { return step; }
    int32 signedIncrement() const { return static_cast<int32>(step); }
    std::vector<uint8> &all() { return bytes; }

private:
    uint32 step;
    std::vector<uint8> bytes;
};

// Calls rowWork(first byte, bytes) for the rows of an area, once for them all where
// they lie end to end: what the best caller of memset or memcpy would do.
template <class RowWork>
void eachRow(const Area &area, uint32 bytesPerPixel, const RowWork &rowWork) {
    const size_t step = size_t{area.surfaceWidth} * bytesPerPixel;
    const size_t rowBytes = size_t{area.width} * bytesPerPixel;
    if (step == rowBytes) {
        rowWork(size_t{0}, rowBytes * area.height);
        return;
    }
    for (size_t y = 0; y < area.height; ++y)
        rowWork(y * step + size_t{area.left} * bytesPerPixel, rowBytes);
}

// Registers a measurement.  prepare() gives the function to be timed, with all that
// it works on inside; it runs only when the measurement does.
//
// pixels and bytes are those of one call, the bytes being the ones read plus the
// ones written.
template <class Prepare>
void measure(const std::string &name, double pixels, double bytes, Prepare prepare) {
    benchmark::RegisterBenchmark(name.c_str(), [=](benchmark::State &state) {
        auto work = prepare();
        for (auto _ : state) {
            work();
            benchmark::ClobberMemory();
        }
        using benchmark::Counter;
        state.counters["pixels"] = Counter(pixels, Counter::kIsIterationInvariantRate);
        state.counters["bytes"] = Counter(bytes, Counter::kIsIterationInvariantRate);
    });
}

template <class Prepare>
void measure(const std::string &operation, const Area &area, const std::string &who,
             double bytesPerPixel, Prepare prepare) {
    measure(operation + "/" + area.name + "/" + who, area.pixels(), area.pixels() * bytesPerPixel,
            prepare);
}

void registerFill();
void registerCopy();
void registerBlend();
void registerConvert();
void registerScale();
void registerImage();

} // namespace quillon::bench
