// The random driver.  It holds every operation on rectangles to a reference that
// handles one pixel, on every instruction set.
//
// A case is one call.  From its number are drawn
//
//     the operation  by operations/: a call with all its arguments but the surfaces
//                    and the size, and the reference for its pixels;
//     a Shape        the size, and how the surfaces lie in memory;
//     contents       random bytes, with runs of the pixels that an operation may
//                    handle in a way of its own (Part::runs).
//
// The memory is fenced and has a model, through which the reference walks pixel by
// pixel.  The call is made on each instruction set, and every time all of the
// memory has to equal the model: bytes beside the rectangle count as well.  No
// call may allocate.  (So it is in the tests; what the fuzzers and the fingerprint
// do with a case is in judge.h.)
//
// A failure names the operation, the shape, the surfaces and the instruction set,
// and ends with the variables that run this case alone, as does a crash (a fence
// that was touched):
//
//     QUILLON_TEST_SEED=20240229 QUILLON_TEST_CASE=4711 blendTest
#pragma once

#include "support/fence.h"
#include "support/random.h"

#include <array>
#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <vector>

namespace quillon::test {

// What a case stresses.
enum class Shape {
    // A width or height of 0: no pointer may be followed.
    kEmpty,
    // A few rows anywhere in a block, often up to a fence, with a stride that fits
    // the row, is longer or shorter, negative or 0: heads and tails at every
    // alignment, rows that overlap each other.
    kScattered,
    // The same with surfaces within 128 bytes of each other: overlap hazards.
    kOverlapping,
    // Rows that each begin behind a fence or end ahead of one: nothing beside them
    // is read either.
    kFenced,
    // The same with rows 2 GB apart: addresses beyond 32 bits.
    kFarApart,
    // Rows of 400 to 2500 pixels: loops that shorter ones do not enter.
    kLongRows,
    // Surfaces of about 1.6 MB: stores around the caches.  Takes long, and is only
    // drawn where a test asks for it.
    kLarge,
};

// Runs of bytes, each up to an inaccessible page, and behind one where it is of whole
// pages; and their model.
class TwinMemory {
public:
    TwinMemory(size_t runBytes, size_t runs, size_t spacing); // whole pages from run to run

    uint8_t *run(size_t index) const { return pages_.data() + first_ + index * spacing_; }
    uint8_t *nowhere() const { return pages_.data(); }
    size_t runBytes() const { return runBytes_; }
    int64_t spacing() const { return static_cast<int64_t>(spacing_); }

    // New bytes, from low to low + count - 1 each.
    void refill(Random &random, uint32_t low = 0, uint32_t count = 256);
    // Makes the present bytes those of the model, and the ones to go back to.
    void keep();
    void restore();

    uint8_t *inModel(uint8_t *address) const { return model_.data() + (address - pages_.data()); }
    void compare(const std::function<std::string()> &description) const; // with the model

private:
    size_t runBytes_, runs_, spacing_, first_;
    Mapping pages_, model_;
    std::vector<uint8_t> kept_;
};

// How the rows of a surface follow each other, see raster.h: by the stride, by the
// stride rounded down to whole pixels, or rounded ahead of the first row, too.
enum class RowRule { kExact, kRoundedSteps, kRounded };

// A surface, and a rectangle on it: its corner, and the address of its first pixel.
struct Surface {
    uint8_t *buffer; // of pixel (0, 0), which may lie outside of memory
    uint8_t *first;
    int64_t stride;
    uint32_t x, y;

    int32_t signedStride() const { return static_cast<int32_t>(stride); }
    uint32_t unsignedStride() const { return static_cast<uint32_t>(stride); }
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
    std::vector<uint32_t> runs = {}; // values of pixels, or of 8 bits

    size_t rowBytes(uint32_t width) const {
        return bytes == 0 ? (size_t{width} + 7) / 8 : size_t{width} * bytes;
    }
};

// The order in which an operation goes through its pixels, each of which it
// reads on all surfaces before it stores one.
enum class Walk {
    kForward,
    // From the last row where the source begins higher up, from the right where
    // it begins further left in the same row.  Three bytes count one by one.
    kAwayFromSource,
    // Each row as if it were read whole; from the last one where the source
    // begins higher up and is overlapped.
    kRowByRow,
};

using Pixels = std::array<uint32_t, 4>; // of each surface

// The first surface is the destination.
struct Operation {
    std::string name;
    std::vector<Part> parts;
    std::function<void(const Surfaces &, Size)> library;
    std::function<uint32_t(const Pixels &)> reference; // the pixel that is stored
    Walk walk = Walk::kForward;
    bool mayOverlap = true;
    bool isSigned = true;     // the strides
    bool isOneCorner = false; // the coordinates are the same on all surfaces
};

// Tries one case, of a random shape other than kLarge unless one is given.
void tryOperation(Random &random, const Operation &operation, std::optional<Shape> shape = {});

// Overwrites pixels by runs of one of the values each, with some left between: of
// one or two pixels, so that vectors are mixed, or of many.
void plantRuns(Random &random, uint8_t *pixels, size_t count, uint32_t bytes,
               const std::vector<uint32_t> &values);

} // namespace quillon::test
