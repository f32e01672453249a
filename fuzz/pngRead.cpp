// Arbitrary bytes as a PNG, read with arbitrary flags.  What could be read is
// written again in both formats.
//
// The first byte holds the flags; the rest is the file.  With bit 7 clear its
// check sums are put right first, so that mutations get past them.

#include <hearth/hearth.h>
#include <quillon/imageUtil.h>

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <initializer_list>
#include <vector>
#include <zlib.h>

namespace {

constexpr size_t kSignatureBytes = 8;
constexpr size_t kChunkFrameBytes = 12; // length, type and check sum
constexpr size_t kMaxBlock = size_t{1} << 26;

uint32_t bigEndian(const uint8_t *bytes) {
    return uint32_t{bytes[0]} << 24 | uint32_t{bytes[1]} << 16 | uint32_t{bytes[2]} << 8 | bytes[3];
}

void correctCheckSums(std::vector<uint8_t> &file) {
    for (size_t chunk = kSignatureBytes; chunk + kChunkFrameBytes <= file.size();) {
        const size_t length = bigEndian(&file[chunk]);
        if (length > file.size() - chunk - kChunkFrameBytes) {
            return;
        }
        const uLong sum = crc32(0, &file[chunk + 4], static_cast<uInt>(length + 4));
        for (size_t i = 0; i < 4; ++i) {
            file[chunk + 8 + length + i] = static_cast<uint8_t>(sum >> (24 - 8 * i));
        }
        chunk += length + kChunkFrameBytes;
    }
}

void require(bool isTrue) {
    if (!isTrue) {
        std::abort();
    }
}

void writeAgain(const ImageInfo &image) {
    for (const bool stripAlpha : {false, true}) {
        const ImageUtilPngOptions options = {.compressionLevel = 1, .stripAlpha = stripAlpha};
        DynBuf png = {};
        const bool isWritten = ImageUtil_ConstructPNGBuffer(&image, &options, &png);
        // A palette may lack a colour that a pixel names; libpng reads that, and
        // refuses to write it.
        require(isWritten || image.bpp == 8);
        DynBuf_Destroy(&png);
    }
    DynBuf bmp = {};
    require(ImageUtil_ConstructBMPBuffer(&image, &bmp));
    DynBuf_Destroy(&bmp);
}

} // namespace

// A header of a few bytes can ask for 4 GiB: in the place of libhearth's
// function, one that gives less.
void *UtilSafeMalloc0(size_t size) {
    return size == 0 || size > kMaxBlock ? nullptr : std::malloc(size);
}

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size) {
    if (size == 0) {
        return 0;
    }
    const uint32_t flags = data[0];
    std::vector<uint8_t> file(data + 1, data + size);
    if ((flags & 0x80) == 0) {
        correctCheckSums(file);
    }
    ImageInfo image;
    std::memset(&image, 0, sizeof image);
    if (ImageUtil_ReadPNGBuffer(&image, file.data(), static_cast<uint32_t>(file.size()), flags)) {
        const uint64_t rowBytes = uint64_t{image.width} * image.bpp / 8;
        require(image.data != nullptr && image.bytesPerLine >= rowBytes);
        writeAgain(image);
    }
    ImageUtil_FreeImageData(&image);
    return 0;
}
