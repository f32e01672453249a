// The chunks of a PNG, seen ahead of libpng or in its place.
#pragma once

#include <cstdint>
#include <png.h>

namespace quillon {

inline constexpr uint32_t kPngSignatureBytes = 8;

// A PNG in memory.
struct PngFile {
    const uint8_t *bytes;
    uint32_t size;
};

// Has libpng skip the chunks whose contents it would copy or inflate and that mean
// nothing to pixels and palette: no file makes it keep or inflate any of them.
void skipCostlyChunks(png_structp png, const PngFile &file);

// Whether the chunks that end behind offset are whole, up to and with IEND, by what
// libpng asks of chunks behind the last row.
bool isWholeBehind(const PngFile &file, uint32_t offset);

} // namespace quillon
