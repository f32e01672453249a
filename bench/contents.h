// What buffers are filled with; the same in every run.
#pragma once

#include "job.h"

namespace quillon::bench {

void noise(uint8_t *bytes, size_t count);

// 32-bit pixels as windows hold them: long runs that are clear or opaque, with
// soft edges between them.
void interfacePixels(uint8_t *bytes, size_t count);

// Bits as lines of small letters leave them, and with one bit in 64 set.
void textBits(uint8_t *bytes, size_t count);
void sparseBits(uint8_t *bytes, size_t count);

// 256 colours.
const std::vector<uint32_t> &palette();

} // namespace quillon::bench
