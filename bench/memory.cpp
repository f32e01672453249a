#include "memory.h"

#include <algorithm>
#include <cstring>
#include <stdexcept>
#include <sys/mman.h>
#include <unistd.h>

namespace quillon::bench {
namespace {

constexpr size_t kPage = 4096;

// A rectangle inside a surface starts at this pixel: at no multiple of a vector.
constexpr size_t kLeft = 100;

// What each buffer has beyond its bytes, because the buffers of a job start at
// different distances from a page, and in the surface at kLeft.
constexpr size_t kSlack = 1024;

// The memory that all operations share, one after the other.
uint8_t *arena() {
    static uint8_t *const memory = [] {
        void *mapped =
            mmap(nullptr, arenaBytes(), PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
        if (mapped == MAP_FAILED)
            throw std::runtime_error("no memory to rotate through");
        madvise(mapped, arenaBytes(), MADV_HUGEPAGE);
        return static_cast<uint8_t *>(mapped);
    }();
    return memory;
}

} // namespace

Plane plane(const Area &area, uint32_t bitsPerPixel, const Content &content) {
    return {area.width, area.height, bitsPerPixel,  area.surfaceWidth,
            content,    area.offset, area.extraStep};
}

size_t arenaBytes() {
    constexpr size_t kLeast = size_t{128} << 20;
    constexpr size_t kMost = size_t{640} << 20;
    const long lastCache = sysconf(_SC_LEVEL3_CACHE_SIZE);
    return std::clamp(2 * static_cast<size_t>(std::max(lastCache, 0L)), kLeast, kMost);
}

size_t Places::bytesOf(const Operation &operation) {
    size_t bytes = 0;
    for (const Plane &plane : operation.planes)
        bytes += (plane.bytes() + kSlack + kPage - 1) / kPage * kPage;
    return bytes;
}

Places::Places(const Operation &operation) : dstPlane(operation.planes.front()) {
    const size_t bytes = bytesOf(operation);
    if (bytes > arenaBytes())
        throw std::runtime_error(operation.name + " is larger than the memory for it");
    const size_t places = operation.area.uncached ? arenaBytes() / bytes : 1;

    uint8_t *next = arena();
    for (size_t place = 0; place < places; ++place) {
        Job job = {};
        job.sourceCount = operation.planes.size() - 1;
        for (size_t p = 0; p < operation.planes.size(); ++p) {
            const Plane &plane = operation.planes[p];
            const size_t left = plane.surfaceWidth == 0 ? 0 : kLeft * plane.bitsPerPixel / 8;
            const size_t start = (p + 1) * 64 + left + plane.offset;
            const Buffer buffer = {next + start, plane.step(), plane.width, plane.height,
                                   plane.rowBytes()};
            (p == 0 ? job.dst : job.sources[p - 1]) = buffer;
            if (place == 0)
                plane.content(buffer.data, plane.bytes());
            else
                std::memcpy(buffer.data, (p == 0 ? jobs[0].dst : jobs[0].sources[p - 1]).data,
                            plane.bytes());
            next += (plane.bytes() + kSlack + kPage - 1) / kPage * kPage;
        }
        jobs.push_back(job);
    }
}

void Places::reset() {
    dstPlane.content(jobs[0].dst.data, dstPlane.bytes());
}

} // namespace quillon::bench
