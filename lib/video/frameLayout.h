// How a video frame lies in memory.
#pragma once

#include <cstddef>
#include <cstdint>

namespace quillon {

// The bytes of a frame; for the planar format also the pitch of each of its
// three planes (bytes from row to row) and its offset from the frame's first
// byte.  All at pointer width: the last planes of a large frame lie beyond 4 GiB.
//
// pitches and offsets have three entries and may be null.  An interleaved format
// sets offsets[0] alone, to 0, and no pitch.
//
// For an unknown format the result is false and the size 0; the first one is
// logged.
bool layOutFrame(uint32_t format, uint32_t width, uint32_t height, size_t *size, size_t *pitches,
                 size_t *offsets);

} // namespace quillon
