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

void *aligned_alloc(size_t alignment, size_t size) {
    ++allocations;
    return __libc_memalign(alignment, size);
}

} // extern "C"

namespace quillon::test {
namespace {

TEST(Allocation, rasterRoutinesDoNone) {
    constexpr uint32 kWidth = 300, kHeight = 20, kLine = kWidth * 4;
    std::vector<uint8> dst(size_t{kHeight} * kLine), src(dst.size());
    EXPECT_GT(allocations, 1) << "they are not counted";
    const std::vector<uint32> palette(256);
    forEachTarget([&] {
        const int before = allocations;
        for (int32 bytes = 1; bytes <= 4; ++bytes) {
            Raster_RectFill(dst.data(), kLine, bytes, 1, 0, 0, kWidth, kHeight);
            for (const uint32 rop : {RASTER_ROP_COPY, RASTER_ROP_XOR})
                for (const uint8 *from : {src.data(), dst.data()})
                    Raster_RectROPcopy(dst.data(), kLine, from, kLine, bytes, 0, 0, rop, 1, 1,
                                       kWidth - 1, kHeight - 1);
            Raster_BitsToPixels(src.data(), kLine, dst.data(), kLine, bytes, kWidth, kHeight, 1, 2);
        }
        Raster_RectFillAlpha(dst.data(), kLine, 1, 0, 0, kWidth, kHeight);
        for (const uint8 *from : {src.data(), dst.data()})
            Raster_AlphaBlendOver(dst.data(), 1, 0, kLine, from, 0, 0, kLine, kWidth - 1, kHeight);
        for (const int32 to : {3, 6, 8, 15, 16, 24, 32})
            for (const int32 from : {8, 15, 16, 24, 32})
                Raster_ConvertPixels(dst.data(), kLine, to, src.data(), kLine, from, from == 8,
                                     palette.data(), 0, 0, 0, 0, kWidth, kHeight);
        EXPECT_EQ(allocations, before);
    });
}

} // namespace
} // namespace quillon::test

#endif
