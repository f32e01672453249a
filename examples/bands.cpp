// bands: fills the cores of a processor with one operation, by splitting a picture in
// bands of rows, one for each thread.
//
//     c++ -std=c++17 -pthread bands.cpp $(pkg-config --cflags --libs quillon)
#include <quillon/raster.h>
#include <quillon/version.h>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <string_view>
#include <thread>
#include <vector>

namespace {

constexpr char kHelp[] =
    "usage: bands [THREADS]\n"
    "\n"
    "Converts a frame of 3840 by 2160 pixels by 1, 2, ... THREADS threads, as many as there are\n"
    "cores unless told, and prints what each number is worth.\n"
    "\n"
    "  --help, --version   show this text; show the version\n";

constexpr uint32_t kWidth = 3840, kHeight = 2160;
constexpr int32_t kFrameStride = kWidth * 2, kScreenStride = kWidth * 4;

//! [bands]
// Calls work(first row, rows) for bands of equal height, each in a thread of its own.
template <class Work>
void inBands(uint32_t height, uint32_t threads, Work work) {
    const uint32_t rows = (height + threads - 1) / threads;
    std::vector<std::thread> running;
    for (uint32_t y = rows; y < height; y += rows)
        running.emplace_back(work, y, std::min(rows, height - y));
    work(0u, std::min(rows, height)); // this thread takes a band as well
    for (std::thread &thread : running)
        thread.join();
}

// Bands share no row, so that no call waits for another.
void show(std::vector<uint8_t> &screen, const std::vector<uint8_t> &frame, uint32_t threads) {
    inBands(kHeight, threads, [&](uint32_t y, uint32_t rows) {
        Raster_ConvertPixels(screen.data(), kScreenStride, 32, frame.data(), kFrameStride, 16,
                             false, nullptr, 0, y, 0, y, kWidth, rows);
    });
}
//! [bands]

// The shortest of some runs, in microseconds.
template <class Work>
double shortest(Work work) {
    using Clock = std::chrono::steady_clock;
    double best = 1e9;
    for (int run = 0; run < 20; ++run) {
        const Clock::time_point start = Clock::now();
        work();
        best =
            std::min(best, std::chrono::duration<double, std::micro>(Clock::now() - start).count());
    }
    return best;
}

} // namespace

int main(int argc, char **argv) {
    const std::string_view option = argc == 2 ? argv[1] : "";
    if (option == "--help")
        return std::fputs(kHelp, stdout) < 0;
    if (option == "--version")
        return std::puts("bands " QUILLON_VERSION_STRING) < 0;
    const int given = argc == 2 ? std::atoi(argv[1]) : 0;
    if (argc > 2 || (argc == 2 && given < 1))
        return std::fputs(kHelp, stderr), 2;
    const uint32_t most = given > 0 ? static_cast<uint32_t>(given)
                                    : std::max(1u, std::thread::hardware_concurrency());
    std::vector<uint8_t> frame(size_t{kFrameStride} * kHeight);
    for (size_t i = 0; i < frame.size(); ++i)
        frame[i] = static_cast<uint8_t>(i * 7 + i / 255);
    std::vector<uint8_t> whole(size_t{kScreenStride} * kHeight), screen(whole.size());

    const double alone = shortest([&] { show(whole, frame, 1); });
    for (uint32_t threads = 1; threads <= most; ++threads) {
        const double together = shortest([&] { show(screen, frame, threads); });
        std::printf("%u thread%s: %.0f us, %.2f times as fast as one\n", threads,
                    threads == 1 ? "" : "s", together, alone / together);
        if (screen != whole)
            return 1;
    }
    return 0;
}
