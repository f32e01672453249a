// What is measured: an operation, the pixels it works on, and who does it.
#pragma once

#include <cstdint>

#include <array>
#include <functional>
#include <string>
#include <vector>

namespace quillon::bench {

struct Area {
    const char *name;
    uint32_t width, height;
    uint32_t surfaceWidth;  // pixels from one row to the next; 0: the rows lie end to end
    bool uncached;        // each call works on memory that has left every cache
    uint32_t offset = 0;    // bytes by which every buffer starts later
    uint32_t extraStep = 0; // bytes that rows lie further apart
};

// The sizes that everything is measured at.
inline constexpr Area kAreas[] = {
    {"32x32", 32, 32, 1920, false},
    {"256x128", 256, 128, 0, false},
    {"256x128 in 1920", 256, 128, 1920, false},
    {"1920x1080", 1920, 1080, 0, true},
};

// Fills memory with what an operation is to find in it.
using Content = std::function<void(uint8_t *bytes, size_t count)>;

// The description of one buffer.
struct Plane {
    uint32_t width, height;
    uint32_t bitsPerPixel;
    uint32_t surfaceWidth;
    Content content;
    uint32_t offset, extraStep; // as in Area

    size_t rowBytes() const { return (size_t{width} * bitsPerPixel + 7) / 8; }
    size_t step() const {
        const size_t width8 = size_t{surfaceWidth} * bitsPerPixel + 7;
        return (surfaceWidth == 0 ? rowBytes() : width8 / 8) + extraStep;
    }
    size_t bytes() const { return step() * (height - 1) + rowBytes(); }
};

Plane plane(const Area &area, uint32_t bitsPerPixel, const Content &content);

// The buffer itself.
struct Buffer {
    uint8_t *data;
    size_t step; // bytes from one row to the next
    uint32_t width, height;
    size_t rowBytes;

    int32_t line() const { return static_cast<int32_t>(step); }
};

// One call's worth of buffers: the destination and up to three sources.
struct Job {
    Buffer dst;
    std::array<Buffer, 3> sources;
    size_t sourceCount;

    const Buffer &src() const { return sources[0]; }
};

using Work = std::function<void()>;

// Makes ready, outside of what is timed, what somebody needs for a job.
using Prepare = std::function<Work(const Job &)>;

// How a peer's bytes compare with ours.
enum class Agreement {
    Exact,       // equal, byte for byte
    ColourOnly,  // equal but for the top byte of 32-bit pixels, which means nothing to it
    Approximate, // it rounds in another way, or does somewhat less
};

struct Contender {
    std::string name;
    Agreement agreement;
    Prepare prepare;
};

// What memory has to carry, which sets the limit.
enum class Traffic {
    Write,  // the destination is written without being read
    Change, // it is read and written
    None,   // the planes say nothing of it: no limit is measured
};

// An operation at one size, with all who do it.  ours is the first contender.
struct Operation {
    std::string name;
    std::string family; // a key of the targets
    Area area;
    std::vector<Plane> planes; // the destination first
    Traffic traffic;
    std::vector<Contender> contenders;
};

} // namespace quillon::bench
