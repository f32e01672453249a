// Writing BMP: 8-bit images with their palette, everything else at 24 bits.
#include <hearth/hearth.h>
#include <quillon/imageUtil.h>
#include <quillon/raster.h>

#include "image/imageConversion.h"

#include <algorithm>
#include <array>
#include <cstdlib>
#include <cstring>

namespace quillon {
namespace {

constexpr uint32_t kFileHeaderBytes = 14;
constexpr uint32_t kInfoHeaderBytes = 40;
constexpr uint32_t kHeaderBytes = kFileHeaderBytes + kInfoHeaderBytes;

// The sizes of a file.  They fit 64 bits while width and height are below 2^31.
struct BmpLayout {
    bool hasPalette;
    uint32_t numColors;
    uint64_t rowBytes;
    uint64_t paletteBytes;
    uint64_t imageBytes;

    uint64_t pixelOffset() const { return kHeaderBytes + paletteBytes; }
    uint64_t fileBytes() const { return pixelOffset() + imageBytes; }
};

BmpLayout layoutOf(const ImageInfo &image) {
    BmpLayout layout = {};
    layout.hasPalette = image.bpp <= 8;
    layout.numColors = layout.hasPalette ? std::min(image.numColors, kMaxColors) : 0;
    layout.paletteBytes = layout.numColors * sizeof(ImageUtilColor);
    layout.rowBytes = roundUpTo4(uint64_t{image.width} * (layout.hasPalette ? 1 : 3));
    layout.imageBytes = layout.rowBytes * image.height;
    return layout;
}

// Whether the image can be a BMP file: its sizes fit the header's fields, of which
// width and height are signed, and it has pixels.
bool hasBmpForm(const ImageInfo &image, const BmpLayout &layout) {
    return image.bpp >= 8 && image.width <= INT32_MAX && image.height <= INT32_MAX &&
           layout.fileBytes() <= UINT32_MAX && (layout.imageBytes == 0 || image.data != nullptr);
}

bool isCopied(const ImageInfo &image) {
    return image.bpp == 24 || image.bpp == 8;
}

// Stores little-endian fields one after another.
class FieldWriter {
public:
    explicit FieldWriter(uint8_t *out) : next_(out) {}
    void put16(uint32_t value) { put(value, 2); }
    void put32(uint64_t value) { put(value, 4); }

private:
    void put(uint64_t value, uint32_t bytes) {
        for (uint32_t i = 0; i < bytes; ++i)
            *next_++ = static_cast<uint8_t>(value >> (8 * i));
    }
    uint8_t *next_;
};

using BmpHeaders = std::array<uint8_t, kHeaderBytes>;

BmpHeaders makeHeaders(const ImageInfo &image, const BmpLayout &layout) {
    BmpHeaders headers;
    FieldWriter fields(headers.data());
    fields.put16('B' | 'M' << 8);
    fields.put32(layout.fileBytes());
    fields.put16(0); // reserved
    fields.put16(0);
    fields.put32(layout.pixelOffset());

    fields.put32(kInfoHeaderBytes);
    fields.put32(image.width);
    fields.put32(image.height); // positive: the bottom row comes first
    fields.put16(1);            // planes
    fields.put16(layout.hasPalette ? 8 : 24);
    fields.put32(0); // not compressed
    fields.put32(layout.imageBytes);
    fields.put32(0); // pixels per metre, across and down: unknown
    fields.put32(0);
    fields.put32(layout.numColors);
    fields.put32(0); // all colours are important
    return headers;
}

// Writes the pixels of one row of the file and returns the number of bytes written.
// Nothing behind the end of the source row is read.
uint64_t fillRow(uint8_t *fileRow, const BmpLayout &layout, const ImageInfo &image, uint32_t row) {
    const uint8_t *const source = rowAt(image, row);
    if (isCopied(image)) {
        // The source's padding goes into that of the file's row.
        const uint64_t bytes = std::min<uint64_t>(layout.rowBytes, image.bytesPerLine);
        std::memcpy(fileRow, source, bytes);
        return bytes;
    }
    const int32_t depth = conversionDepth(image);
    const uint32_t width = std::min(image.width, image.bytesPerLine / sourcePixelBytes(depth));
    Raster_ConvertPixels(fileRow, static_cast<uint32_t>(layout.rowBytes), 24, source,
                         image.bytesPerLine, depth, false, nullptr, 0, 0, 0, 0, width, 1);
    return uint64_t{width} * 3;
}

void fillRows(uint8_t *block, const BmpLayout &layout, const ImageInfo &image) {
    if (layout.imageBytes == 0)
        return; // and there may be no block, nor data
    for (uint32_t i = 0; i < image.height; ++i) {
        const uint32_t row = isBottomUp(image) ? i : image.height - 1 - i;
        uint8_t *const fileRow = block + i * layout.rowBytes;
        const uint64_t bytes = fillRow(fileRow, layout, image, row);
        std::memset(fileRow + bytes, 0, layout.rowBytes - bytes);
    }
}

} // namespace
} // namespace quillon

using namespace quillon;

bool ImageUtil_ConstructBMPBuffer(const ImageInfo *image, DynBuf *buffer) {
    if (buffer == nullptr || image == nullptr)
        return false;
    const BmpLayout layout = layoutOf(*image);
    if (!hasBmpForm(*image, layout) ||
        (!isCopied(*image) && !checkSourceDepth(conversionDepth(*image)))) {
        return false;
    }
    const BmpHeaders headers = makeHeaders(*image, layout);
    auto *const block = static_cast<uint8_t *>(std::malloc(layout.imageBytes));
    if (block == nullptr)
        return false;
    fillRows(block, layout, *image);

    DynBuf_Init(buffer);
    const bool isComplete =
        DynBuf_Append(buffer, headers.data(), kFileHeaderBytes) &&
        DynBuf_Append(buffer, headers.data() + kFileHeaderBytes, kInfoHeaderBytes) &&
        (layout.paletteBytes == 0 || DynBuf_Append(buffer, image->palette, layout.paletteBytes)) &&
        DynBuf_Append(buffer, block, layout.imageBytes);
    std::free(block);
    if (!isComplete)
        DynBuf_Destroy(buffer);
    return isComplete;
}
