// Operations on rectangles, held to their reference: on random surfaces, in
// fenced memory that has a model.
#pragma once

#include <cstdint>
#include "support/fence.h"
#include "support/targets.h"

#include <array>
#include <functional>
#include <string>
#include <vector>

namespace quillon::test {

// Runs of pages between inaccessible ones, and their model.  The call under
// test works on the pages, the reference on the model, and then they have to
// agree.
class TwinMemory {
public:
    TwinMemory(size_t runBytes, size_t runs, size_t spacing); // in whole pages

    uint8_t *run(size_t index) const { return pages_.data() + pageSize() + index * spacing_; }
    uint8_t *nowhere() const { return pages_.data(); }
    size_t runBytes() const { return runBytes_; }
    int64_t spacing() const { return static_cast<int64_t>(spacing_); }

    // New bytes, from low to low + count - 1 each.
    void refill(Random &random, uint32_t low = 0, uint32_t count = 256);

    uint8_t *inModel(uint8_t *address) const { return model_.data() + (address - pages_.data()); }

    testing::AssertionResult agree() const;

private:
    size_t runBytes_, runs_, spacing_;
    Mapping pages_, model_;
};

// How the rows of a surface follow each other, see raster.h.
enum class RowRule { kExact, kRoundedSteps, kRounded };

// A surface, and a rectangle on it: its corner, and the address of its first pixel.
struct Surface {
    uint8_t *buffer; // of pixel (0, 0), which may lie outside of memory
    uint8_t *first;
    int64_t line;
    uint32_t x, y;

    int32_t signedLine() const { return static_cast<int32_t>(line); }
    uint32_t unsignedLine() const { return static_cast<uint32_t>(line); }
};
using Surfaces = std::vector<Surface>;

struct Size {
    uint32_t width, height;
};

// What a surface is to an operation.
struct Part {
    uint32_t bytes; // per pixel, or 0: the pixels are bits
    RowRule rule = RowRule::kExact;
    uint32_t low = 0, count = 256; // the values that bytes may have
    bool isTouched = true;

    size_t rowBytes(uint32_t width) const {
        return bytes == 0 ? (size_t{width} + 7) / 8 : size_t{width} * bytes;
    }
};

// The order in which an operation goes through its pixels, each of which it
// reads on all surfaces before it stores one.
enum class Walk {
    kForwards,
    // From the last row where the source begins higher up, from the right where
    // it begins further left in the same row.  Three bytes count one by one.
    kAwayFromSource,
    // Each row as if it were read whole; from the last one where the source
    // begins higher up and is overlapped.
    kRowByRow,
};

using Pixels = std::array<uint32_t, 4>; // of each surface

// A call with all its arguments but the surfaces, of which the first is the
// destination, and the size.
struct Operation {
    std::string name;
    std::vector<Part> parts;
    std::function<void(const Surfaces &, Size)> library;
    std::function<uint32_t(const Pixels &)> reference; // the pixel that is stored
    Walk walk = Walk::kForwards;
    bool mayOverlap = true;
    bool isSigned = true;     // the line increments
    bool isOneCorner = false; // the coordinates are the same on all surfaces
};

class Arena {
public:
    Arena();

    // One call: anywhere in memory, often flush against a fence; or with
    // surfaces so near that a vector can run into itself; or with a fence at an
    // edge of every row, the rows up to 2 GB apart; or so large that caches are
    // passed by; or with nothing to do.
    void check(Random &random, const Operation &operation);

private:
    std::array<TwinMemory, 4> blocks_, largeBlocks_, rows_, farRows_; // for each surface
};

// Random operations, on every instruction set.
template <class Draw>
void holdToReference(uint64_t cases, const Draw &draw) {
    Arena arena;
    forEachTarget(
        [&] { forEachCase(cases, [&](Random &random) { arena.check(random, draw(random)); }); });
}

} // namespace quillon::test
