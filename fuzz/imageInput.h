// What the image targets draw from their input, and what they have in the place of
// libhearth's functions.
#pragma once

#include <quillon/imageUtil.h>

#include <cstddef>
#include <cstdint>
#include <stdexcept>
#include <vector>

namespace quillon::fuzz {

// What Panic throws.
struct Panicked : std::runtime_error {
    using std::runtime_error::runtime_error;
};

// No block for pixels is larger, in the library and in an input.
inline constexpr uint64_t kMostInputBytes = uint64_t{1} << 16;
inline constexpr uint64_t kMostBytes = uint64_t{1} << 22;

// Fields, taken from the front of an input; 0 behind its end.
class Input {
public:
    Input(const uint8_t *data, size_t size) : next(data), end(data + size) {}

    uint32_t byte() { return next == end ? 0 : *next++; }
    uint32_t word() { return byte() | byte() << 8 | byte() << 16 | byte() << 24; }

    // Mostly small, now and then any number.
    uint32_t size() {
        const uint32_t kind = byte();
        return kind < 0xE0 ? kind : kind < 0xF8 ? byte() << 8 | byte() : word();
    }

    size_t left() const { return static_cast<size_t>(end - next); }
    const uint8_t *rest() const { return next; }

private:
    const uint8_t *next;
    const uint8_t *end;
};

// An image record with any fields, and a block of exactly the size that they tell.
class InputImage {
public:
    explicit InputImage(Input &input);

    ImageInfo info;

private:
    std::vector<uint8_t> pixels;
};

// Has the library use one of the processor's instruction sets.
void chooseTarget(uint32_t number);

// Ends the program with a finding unless isTrue.
void require(bool isTrue);

// Reads a PNG and releases what comes of it; false where nothing can be read.
bool readPng(const std::vector<uint8_t> &file, uint32_t flags, ImageInfo *image);

} // namespace quillon::fuzz
