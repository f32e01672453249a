// Cutting a rectangle out of an image, and scaling it.
#include <hearth/hearth.h>
#include <quillon/imageUtil.h>
#include <quillon/raster.h>

#include "core/extended.h"
#include "image/imageRecord.h"

#include <cstdlib>
#include <cstring>

namespace quillon {
namespace {

constexpr int32_t kNotGiven = -1;
constexpr uint32_t kPixelBytes = 4; // whatever bpp says
constexpr uint32_t kFiltered = 2;

// The rectangle cut out of the source.
struct Crop {
    uint32_t left, top;
    uint32_t width, height;
};

struct OutputSize {
    uint32_t width, height;
};

// One axis of the crop: false unless low < high <= limit.
bool resolveEdges(int32_t low, int32_t high, uint32_t limit, uint32_t *start, uint32_t *length) {
    if (low < 0 || (high != kNotGiven && high <= low))
        return false;
    const uint32_t end = high == kNotGiven ? limit : static_cast<uint32_t>(high);
    *start = static_cast<uint32_t>(low);
    *length = end - *start;
    return *start < end && end <= limit;
}

// The size asked for.  A side not given follows the other one by proportion, with
// the product wrapping at 32 bits.
OutputSize outputSize(const Crop &crop, int32_t dstRight, int32_t dstBottom) {
    OutputSize size = {crop.width, crop.height};
    if (dstRight != kNotGiven)
        size.width = static_cast<uint32_t>(dstRight);
    else if (dstBottom != kNotGiven)
        size.width = static_cast<uint32_t>(dstBottom) * crop.width / crop.height;
    if (dstBottom != kNotGiven)
        size.height = static_cast<uint32_t>(dstBottom);
    else if (dstRight != kNotGiven)
        size.height = crop.height * static_cast<uint32_t>(dstRight) / crop.width;
    return size;
}

void copyCrop(uint8_t *block, size_t stride, const uint8_t *first, const ImageInfo &src,
              const Crop &crop) {
    if (crop.width == src.width) {
        std::memcpy(block, first, crop.height * stride); // the rows are contiguous
        return;
    }
    for (uint32_t row = 0; row < crop.height; ++row)
        std::memcpy(block + row * stride, first + size_t{row} * src.bytesPerLine, stride);
}

bool scaleCrop(uint8_t *block, size_t stride, const uint8_t *first, const ImageInfo &src,
               const Crop &crop, OutputSize size) {
    if (src.bytesPerLine > INT32_MAX)
        return false; // the scaler takes its strides as int32_t
    return Raster_Scale(block, static_cast<int32_t>(stride), size.width, size.height, 0, 0,
                        static_cast<int32_t>(size.width), static_cast<int32_t>(size.height), first,
                        static_cast<int32_t>(src.bytesPerLine), crop.width, crop.height,
                        extendedQuotient(size.width, crop.width),
                        extendedQuotient(size.height, crop.height), kFiltered) != 0;
}

} // namespace
} // namespace quillon

using namespace quillon;

bool ImageUtil_CropAndScaleImage(const ImageInfo *src, int32_t srcLeft, int32_t srcTop,
                                 int32_t srcRight, int32_t srcBottom, int32_t dstLeft,
                                 int32_t dstTop, int32_t dstRight, int32_t dstBottom,
                                 ImageInfo *result) {
    Crop crop = {};
    if (!resolveEdges(srcLeft, srcRight, src->width, &crop.left, &crop.width) ||
        !resolveEdges(srcTop, srcBottom, src->height, &crop.top, &crop.height) || dstLeft != 0 ||
        dstTop != 0)
        return false;
    const OutputSize size = outputSize(crop, dstRight, dstBottom);
    const uint64_t stride = uint64_t{size.width} * kPixelBytes;
    const uint64_t cropEnd = (uint64_t{crop.left} + crop.width) * kPixelBytes;
    if (size.width == 0 || size.height == 0 || stride > INT32_MAX || size.height > INT32_MAX ||
        src->data == nullptr || cropEnd > src->bytesPerLine)
        return false;

    auto *const block = static_cast<uint8_t *>(UtilSafeMalloc0(size.height * stride));
    if (block == nullptr)
        return false;
    const uint8_t *const first = rowAt(*src, crop.top) + size_t{crop.left} * kPixelBytes;
    if (crop.width == size.width && crop.height == size.height) {
        copyCrop(block, stride, first, *src, crop);
    } else if (!scaleCrop(block, stride, first, *src, crop, size)) {
        std::free(block);
        return false;
    }

    ImageInfo made;
    std::memset(&made, 0, sizeof made);
    made.width = size.width;
    made.height = size.height;
    made.depth = src->depth;
    made.bpp = src->bpp;
    made.bytesPerLine = static_cast<uint32_t>(stride);
    made.data = block;
    *result = made;
    return true;
}
