// What is measured: an operation, the buffers it works on, and who does it.
#pragma once

#include "text.h"

#include <benchmark/benchmark.h>

#include <cstdint>
#include <functional>
#include <string>
#include <type_traits>
#include <vector>

namespace quillon::bench {

struct Area {
    std::string name;
    uint32_t width, height;
    uint32_t surfaceWidth = 0; // pixels from a row to the next; 0: contiguous rows
    bool isUncached = false;   // every call works on memory that has left the caches
    uint32_t offset = 0;       // bytes added to the start of every buffer
    uint32_t extraStride = 0;  // bytes added to every stride
};

struct Buffer {
    uint8_t *data;
    int32_t stride;
    uint32_t width, height;
    size_t rowBytes;

    int w() const { return static_cast<int>(width); }
    int h() const { return static_cast<int>(height); }
    uint8_t *row(size_t y) const { return data + y * static_cast<size_t>(stride); }
    size_t bytes() const { return (height - 1) * static_cast<size_t>(stride) + rowBytes; }
};

// The description of a buffer; the content is written over all of its bytes.
struct Plane {
    uint32_t bitsPerPixel;
    std::function<void(uint8_t *bytes, size_t count)> content;
    Area area = {"", 0, 0}; // of height 0: that of the operation

    size_t bytesOf(uint32_t pixels) const { return (size_t{pixels} * bitsPerPixel + 7) / 8; }
    Buffer at(uint8_t *data) const {
        const size_t stride = bytesOf(area.surfaceWidth == 0 ? area.width : area.surfaceWidth);
        return {data, static_cast<int32_t>(stride + area.extraStride), area.width, area.height,
                bytesOf(area.width)};
    }
};

// The buffers of one call: the destination, then up to three sources.
struct Job {
    Buffer planes[4];
    size_t count;

    const Buffer &dst() const { return planes[0]; }
    const Buffer &src() const { return planes[1]; }
};

using Work = std::function<void()>;

// Prepares, outside of the time measured, what a contender needs for a job.
using Prepare = std::function<Work(const Job &)>;

// A Prepare from a callable that takes nothing, the destination, destination and
// source, or the job, and that either does the work or returns a Work that does.
template <class Call>
Prepare prepare(const Call &call) {
    const auto run = [=](const Job &job) {
        if constexpr (std::is_invocable_v<Call>)
            return call();
        else if constexpr (std::is_invocable_v<Call, const Buffer &>)
            return call(job.dst());
        else if constexpr (std::is_invocable_v<Call, const Buffer &, const Buffer &>)
            return call(job.dst(), job.src());
        else
            return call(job);
    };
    if constexpr (std::is_void_v<std::invoke_result_t<decltype(run), const Job &>>)
        return [=](const Job &job) -> Work { return [=] { run(job); }; };
    else
        return run;
}

enum class Kind {
    Exact,       // a peer whose bytes equal ours
    Approximate, // a peer that rounds in another way, or does somewhat less
    Limit,       // moves the same memory and does nothing else
};

struct Contender {
    std::string name;
    Prepare prepare;
    Kind kind = Kind::Exact;
    // Does the same and leaves in the destination what is compared; for work that
    // leaves no bytes there.
    Prepare prepareCheck = {};
};

// The memory traffic that bounds an operation.
enum class Traffic {
    Write,  // reads the sources and writes the destination
    Change, // reads the destination, too
    None,   // unknown: the content decides, or a factor
};

struct Operation {
    std::string name; // what peers are found by
    std::string family;
    Area area;
    std::vector<Plane> planes; // the destination first
    Traffic traffic;
    std::vector<Contender> contenders; // ours first
};

struct Plan {
    Area area; // of the operations that are added
    std::vector<Operation> operations = {};

    template <class Call>
    Operation &add(const std::string &name, const std::string &family, Traffic traffic,
                   std::vector<Plane> planes, const Call &call) {
        for (Plane &plane : planes)
            if (plane.area.height == 0)
                plane.area = area;
        operations.push_back({name, family, area, planes, traffic, {{"quillon", prepare(call)}}});
        return operations.back();
    }
};

} // namespace quillon::bench
