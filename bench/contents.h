// What buffers are filled with; the same in every run.
#pragma once

#include <cstddef>
#include <cstdint>

namespace quillon::bench {

void noise(uint8_t *bytes, size_t count);

// 32-bit pixels of windows: long runs that are transparent or opaque, with soft
// edges between them.
void interfacePixels(uint8_t *bytes, size_t count);

void textBits(uint8_t *bytes, size_t count);   // lines of small letters
void sparseBits(uint8_t *bytes, size_t count); // one bit of 64 is set

const uint32_t *palette(); // 256 entries

} // namespace quillon::bench
