#include "arena.h"

#include <sys/mman.h>
#include <unistd.h>

#include <algorithm>
#include <cstring>
#include <stdexcept>

namespace quillon::bench {
namespace {

constexpr size_t kPage = 4096;
constexpr size_t kSlack = 1024; // for the offset of a buffer from its page
constexpr size_t kLeft = 100;   // the first pixel in a surface: no multiple of a vector

uint8_t *arena() {
    static void *const memory =
        mmap(nullptr, arenaBytes(), PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
    static const bool isMapped =
        memory != MAP_FAILED && madvise(memory, arenaBytes(), MADV_HUGEPAGE) <= 0;
    if (!isMapped)
        throw std::runtime_error("no memory to rotate through");
    return static_cast<uint8_t *>(memory);
}

size_t pageBytes(const Plane &plane) {
    return (plane.at(nullptr).bytes() + kSlack + kPage - 1) / kPage * kPage;
}

} // namespace

size_t arenaBytes() {
    const auto lastCache = static_cast<size_t>(std::max(sysconf(_SC_LEVEL3_CACHE_SIZE), 0L));
    return std::clamp(2 * lastCache, size_t{128} << 20, size_t{640} << 20);
}

size_t placeBytes(const Operation &operation) {
    size_t bytes = 0;
    for (const Plane &plane : operation.planes)
        bytes += pageBytes(plane);
    return bytes;
}

std::vector<Job> makeJobs(const Operation &operation) {
    const size_t fitting = arenaBytes() / placeBytes(operation);
    if (fitting == 0)
        throw std::runtime_error(operation.name + " does not fit in the arena");
    std::vector<Job> jobs(operation.area.isUncached ? fitting : 1);
    uint8_t *next = arena();
    for (Job &job : jobs) {
        for (const Plane &plane : operation.planes) {
            const size_t left = plane.area.surfaceWidth == 0 ? 0 : kLeft * plane.bitsPerPixel / 8;
            // Planes start at different cache lines of a page.
            const Buffer buffer = plane.at(next + (job.count + 1) * 64 + left + plane.area.offset);
            if (&job == &jobs[0])
                plane.content(buffer.data, buffer.bytes());
            else
                std::memcpy(buffer.data, jobs[0].planes[job.count].data, buffer.bytes());
            job.planes[job.count++] = buffer;
            next += pageBytes(plane);
        }
    }
    return jobs;
}

} // namespace quillon::bench
