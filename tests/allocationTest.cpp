// Raster routines take no memory.  This program's own malloc counts.

#include "raster.h"
#include "support/targets.h"

#include <atomic>
#include <cstdlib>
#include <vector>

#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
#define QUILLON_SANITIZED
#elif defined(__has_feature)
#if __has_feature(address_sanitizer) || __has_feature(thread_sanitizer)
#define QUILLON_SANITIZED
#endif
#endif

// The sanitizers have an allocator of their own, and so has a C library that is
// not glibc.
#if defined(__GLIBC__) && !defined(QUILLON_SANITIZED)

namespace {
std::atomic<int> allocations;
}

extern "C" {

// NOLINTBEGIN(bugprone-reserved-identifier): the names that glibc gives them
void *__libc_malloc(size_t size);
void *__libc_calloc(size_t count, size_t size);
void *__libc_realloc(void *block, size_t size);
void *__libc_memalign(size_t alignment, size_t size);
// NOLINTEND(bugprone-reserved-identifier)

void *malloc(size_t size) {
    ++allocations;
    return __libc_malloc(size);
}

void *calloc(size_t count, size_t size) {
    ++allocations;
    return __libc_calloc(count, size);
}

void *realloc(void *block, size_t size) {
    ++allocations;
    return __libc_realloc(block, size);
}

void *aligned_alloc(size_t alignment, size_t size) {
    ++allocations;
    return __libc_memalign(alignment, size);
}

} // extern "C"

namespace quillon::test {
namespace {

template <class Run>
int allocationsOf(const Run &run) {
    const int before = allocations;
    run();
    return allocations - before;
}

TEST(Allocation, isCounted) {
    const int count = allocationsOf([] {
        void *volatile block = std::malloc(100); // volatile, lest the pair be left out
        std::free(block);
    });
    EXPECT_EQ(count, 1);
}

TEST(Allocation, rasterRoutinesDoNone) {
    constexpr uint32 kWidth = 300, kHeight = 20, kLine = kWidth * 4;
    std::vector<uint8> dst(size_t{kHeight} * kLine), src(dst.size());
    const std::vector<uint32> palette(256);
    forEachTarget([&] {
        const int count = allocationsOf([&] {
            for (int32 bytes = 1; bytes <= 4; ++bytes) {
                Raster_RectFill(dst.data(), kLine, bytes, 1, 0, 0, kWidth, kHeight);
                Raster_RectCopy(dst.data(), kLine, src.data(), kLine, bytes, 0, 0, 0, 0, kWidth,
                                kHeight);
                Raster_RectCopy(dst.data(), kLine, dst.data(), kLine, bytes, 0, 0, 1, 1, kWidth - 1,
                                kHeight - 1);
            }
            Raster_RectFillAlpha(dst.data(), kLine, 1, 0, 0, kWidth, kHeight);
            Raster_AlphaBlendOver(dst.data(), 0, 0, kLine, src.data(), 0, 0, kLine, kWidth,
                                  kHeight);
            Raster_AlphaBlendOver(dst.data(), 1, 0, kLine, dst.data(), 0, 0, kLine, kWidth - 1,
                                  kHeight);
            for (const int32 to : {3, 6, 8, 15, 16, 24, 32}) {
                for (const int32 from : {15, 16, 24, 32})
                    Raster_ConvertPixels(dst.data(), kLine, to, src.data(), kLine, from, false,
                                         nullptr, 0, 0, 0, 0, kWidth, kHeight);
                Raster_ConvertPixels(dst.data(), kLine, to, src.data(), kLine, 8, true,
                                     palette.data(), 0, 0, 0, 0, kWidth, kHeight);
            }
        });
        EXPECT_EQ(count, 0);
    });
}

} // namespace
} // namespace quillon::test

#endif
