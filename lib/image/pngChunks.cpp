#include "image/pngChunks.h"

#include <algorithm>
#include <cstddef>
#include <cstring>
#include <zlib.h>

namespace quillon {

namespace {

constexpr uint32_t kNameBytes = 4;
constexpr uint32_t kFrameBytes = 12; // length, name and check sum

// Five bytes each, as png_set_keep_unknown_chunks takes them.  All other chunks that
// libpng knows have contents of a few bytes, and what it does not know it skips.
constexpr png_byte kCostlyChunks[] = "tEXt\0zTXt\0iTXt\0iCCP\0sPLT\0eXIf\0pCAL\0sCAL";
constexpr int kCostlyCount = sizeof kCostlyChunks / 5;

uint32_t bigEndian(const uint8_t *bytes) {
    return uint32_t{bytes[0]} << 24 | uint32_t{bytes[1]} << 16 | uint32_t{bytes[2]} << 8 | bytes[3];
}

// Walks the chunks of a file, as far as they lie inside it.
class ChunkWalk {
public:
    explicit ChunkWalk(const PngFile &file) : file_(file) {}

    // Goes to the next chunk; false when there is none that is whole.
    bool next() {
        start_ = end_;
        if (file_.size < start_ || file_.size - start_ < kFrameBytes)
            return false;
        length_ = bigEndian(file_.bytes + start_);
        if (length_ > file_.size - start_ - kFrameBytes)
            return false;
        end_ = start_ + kFrameBytes + length_;
        return true;
    }

    const uint8_t *name() const { return file_.bytes + start_ + 4; }
    bool is(const void *other) const { return std::memcmp(name(), other, kNameBytes) == 0; }
    bool isCritical() const { return (name()[0] & 0x20) == 0; }
    bool endsBehind(uint32_t offset) const { return end_ > offset; }
    bool hasValidHeader() const {
        return length_ <= PNG_UINT_31_MAX &&
               std::all_of(name(), name() + kNameBytes, [](uint8_t c) {
                   return (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z');
               });
    }
    bool hasRightSum() const {
        return crc32(0, name(), kNameBytes + length_) == bigEndian(file_.bytes + end_ - 4);
    }

private:
    const PngFile &file_;
    uint32_t start_ = 0;
    uint32_t end_ = kPngSignatureBytes;
    uint32_t length_ = 0;
};

bool isCostly(const ChunkWalk &chunk) {
    for (size_t i = 0; i < sizeof kCostlyChunks; i += 5)
        if (chunk.is(kCostlyChunks + i))
            return true;
    return false;
}

} // namespace

void skipCostlyChunks(png_structp png, const PngFile &file) {
    ChunkWalk chunk(file);
    while (chunk.next() && !isCostly(chunk)) {
        if (chunk.is("IHDR")) {
            png_set_keep_unknown_chunks(png, PNG_HANDLE_CHUNK_NEVER, kCostlyChunks, kCostlyCount);
            return;
        }
    }
    // One ahead of the header: libpng refuses that file, unless told to skip the chunk.
}

bool isWholeBehind(const PngFile &file, uint32_t offset) {
    ChunkWalk chunk(file);
    while (chunk.next()) {
        if (!chunk.endsBehind(offset))
            continue;
        if (!chunk.hasValidHeader() || chunk.is("IHDR") ||
            (chunk.isCritical() && !chunk.hasRightSum()))
            return false;
        if (chunk.is("IEND"))
            return true;
    }
    return false;
}

} // namespace quillon
