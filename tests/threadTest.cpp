// Many threads at once on separate memory, from the first call of the process on:
// the choice of kernels, the latches of messages.  A race that leaves the results
// alone is for the thread sanitizer to find.

#include "operations.h"
#include "support/judge.h"
#include "support/testImage.h"

#include <gtest/gtest.h>
#include <hearth/hearth.h>
#include <quillon/raster.h>

#include <atomic>
#include <barrier>
#include <cstring>
#include <thread>
#include <vector>

namespace quillon::test {
namespace {

std::atomic<int> differences, logged;

void tryVideoMessages(Random & /*random*/) {
    Raster_YUVtoRGB(nullptr, nullptr, 8, 8, RASTER_VIDEO_YUY2, 8);
    Raster_YUVtoRGB(nullptr, nullptr, 8, 8, 0, 32);
}

// To a file and back, and through the scaler.
void tryImages(Random &random) {
    TestImage image(random, {24, 32}, 1 + random.below(30), 1 + random.below(30));
    image.info.flags = 0;
    const ImageUtilPngOptions options = {1, false};
    DynBuf file;
    DynBuf_Init(&file);
    ImageInfo read = {}, part = {};
    const bool isDone =
        ImageUtil_ConstructPNGBuffer(&image.info, &options, &file) &&
        ImageUtil_ReadPNGBuffer(&read, reinterpret_cast<uint8_t *>(file.data),
                                static_cast<uint32_t>(file.size), IMAGEUTIL_READ_KEEP_ALPHA) &&
        ImageUtil_CropAndScaleImage(&read, 0, 0, -1, -1, 0, 0, 40, 40, &part);
    compare(isDone, true, "a call that fails");
    if (isDone)
        compare(read.data, image.info.data, image.pixels.size(), [] { return "pixels"; });
    ImageUtil_FreeImageData(&part);
    ImageUtil_FreeImageData(&read);
    DynBuf_Destroy(&file);
}

template <auto function>
void onRectangles(Random &random) {
    function(random, {});
}

TEST(Threads, agreeFromTheFirstCallOn) {
    constexpr size_t kThreads = 16;
    using Try = void (*)(Random &);
    const std::vector<Try> tries = {onRectangles<tryFill>,
                                    onRectangles<tryCopy>,
                                    onRectangles<tryBlend>,
                                    tryVideoMessages,
                                    onRectangles<tryRop>,
                                    onRectangles<tryBits>,
                                    tryScale,
                                    tryImages,
                                    onRectangles<tryConvert>,
                                    onRectangles<tryColorKey>,
                                    tryVideo,
                                    tryDrawCursor,

                                    tryRectList,
                                    tryRectMaps,
                                    tryConvertOne};
    std::barrier start(kThreads);
    std::vector<std::thread> threads;
    for (size_t thread = 0; thread < kThreads; ++thread)
        threads.emplace_back([&, thread] {
            Random random(thread);
            start.arrive_and_wait();
            // Half of the threads begin with the same call, the others with each one.
            const size_t first = thread % 2 * thread;
            for (size_t i = 0; i < 100 * tries.size(); ++i)
                tries[(first + i) % tries.size()](random);
        });
    for (std::thread &thread : threads)
        thread.join();
    EXPECT_EQ(differences, 0);
    EXPECT_EQ(logged, 2); // of the many times that there was something to say
}

} // namespace

void forEachTarget(const std::function<void()> &run) {
    run();
}

void withoutMemory(const std::function<void()> &call) {
    call();
}

void compare(const void *actual, const void *expected, size_t size,
             const std::function<std::string()> & /*description*/) {
    differences += size != 0 && std::memcmp(actual, expected, size) != 0;
}

} // namespace quillon::test

void Log(const char * /*format*/, ...) {
    ++quillon::test::logged;
}
