// Scaling of cursors.
//
// Each image is scaled within a border of pixels that leave the screen unchanged.
// The border keeps the cursor's own pixels away from the edges, where the scaler
// has rules of its own.
#include <hearth/hearth.h>
#include <quillon/raster.h>

#include "core/extended.h"
#include "cursor/cursorImage.h"

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <cstdlib>
#include <cstring>
#include <limits>
#include <memory>
#include <optional>

namespace quillon {
namespace {

// A record of the alpha type ends behind alphaImage, so it is never copied or
// cleared as a whole RasterCursor.
constexpr size_t kAlphaRecordSize = offsetof(RasterCursor, alphaImage) + sizeof(uint8_t *);
static_assert(sizeof(void *) != 8 || kAlphaRecordSize == 32);

// One axis of a cursor and of its scaled copy.
struct ScaledAxis {
    double scale;
    uint32_t srcSize;
    uint32_t border;     // source pixels on either side
    uint32_t paddedSize; // srcSize with both borders
    uint32_t dstSize;
    uint32_t dstHotspot;
};

struct ScaledShape {
    ScaledAxis x;
    ScaledAxis y;
};

// Nothing where the factor gives no size, or one that cannot be represented.  A hot
// spot may lie anywhere, so it wraps.
std::optional<ScaledAxis> scaleAxis(uint32_t size, uint32_t hotspot, double scale) {
    constexpr double kMaxBorder = std::numeric_limits<int32_t>::max();
    // Negated, so that a NaN fails too.
    if (!(scale > 0 && scale < kMaxBorder && 1 / scale < kMaxBorder))
        return std::nullopt;

    // The greater of how far one pixel of either image reaches in the other.
    const Extended factor(scale);
    const uint32_t border =
        std::max((Extended(1.0) / factor).truncated(), factor.truncated()) + uint32_t{1};
    const uint64_t padded = uint64_t{size} + 2 * uint64_t{border};
    if (padded > std::numeric_limits<uint32_t>::max())
        return std::nullopt;

    const auto paddedSize = static_cast<uint32_t>(padded);
    const double dstSize = std::ceil((Extended(paddedSize) * factor).toDouble());
    if (dstSize > kMaxCursorWidth)
        return std::nullopt;
    return ScaledAxis{.scale = scale,
                      .srcSize = size,
                      .border = border,
                      .paddedSize = paddedSize,
                      .dstSize = static_cast<uint32_t>(dstSize),
                      .dstHotspot = (Extended(hotspot + border) * factor).truncated()};
}

// How an image is scaled, and the byte that leaves the screen unchanged.
struct ImageKind {
    uint8_t fill;
    uint32_t filter;
};
constexpr ImageKind kAlphaImage = {0, 2};
constexpr ImageKind kAndImage = {0xFF, 0};
constexpr ImageKind kXorImage = {0, 0};

struct Free {
    void operator()(void *block) const { std::free(block); }
};
template <class T>
using Block = std::unique_ptr<T, Free>;

// Width and height are below 2^30 in every image that is allocated: the scaled one
// by scaleAxis, the padded one because the scaler takes no larger sizes.
size_t imageBytes(uint32_t width, uint32_t height) {
    return size_t{width} * height * kCursorPixelBytes;
}

Block<uint8_t> allocateImage(uint32_t width, uint32_t height) {
    return Block<uint8_t>(static_cast<uint8_t *>(UtilSafeMalloc0(imageBytes(width, height))));
}

// The image within its border, or null.
Block<uint8_t> padImage(const ScaledShape &shape, const uint8_t *image, uint8_t fill) {
    const ScaledAxis &x = shape.x, &y = shape.y;
    Block<uint8_t> padded = allocateImage(x.paddedSize, y.paddedSize);
    if (padded == nullptr)
        return nullptr;
    std::memset(padded.get(), fill, imageBytes(x.paddedSize, y.paddedSize));
    Raster_RectCopy(padded.get(), cursorImageStride(x.paddedSize), image,
                    cursorImageStride(x.srcSize), kCursorPixelBytes, 0, 0, x.border, y.border,
                    x.srcSize, y.srcSize);
    return padded;
}

// Scales the padded image src into the first width columns and height rows of dst.
bool scalePadded(const ScaledShape &shape, uint8_t *dst, uint32_t width, uint32_t height,
                 const uint8_t *src, uint32_t filter) {
    const ScaledAxis &x = shape.x, &y = shape.y;
    return Raster_Scale(dst, cursorImageStride(x.dstSize), x.dstSize, y.dstSize, 0, 0,
                        static_cast<int32_t>(width), static_cast<int32_t>(height), src,
                        cursorImageStride(x.paddedSize), x.paddedSize, y.paddedSize, x.scale,
                        y.scale, filter) != 0;
}

// A scaled image, or null.
Block<uint8_t> scaleImage(const ScaledShape &shape, const uint8_t *image, ImageKind kind) {
    const uint32_t width = shape.x.dstSize, height = shape.y.dstSize;
    Block<uint8_t> scaled = allocateImage(width, height);
    if (scaled == nullptr)
        return nullptr;

    // A call for no pixels tells whether the scaler takes these sizes and factors.
    // Where it does not, the padded image, which could be enormous, is not needed.
    if (!scalePadded(shape, nullptr, 0, 0, nullptr, kind.filter)) {
        std::memset(scaled.get(), kind.fill, imageBytes(width, height));
        return scaled;
    }
    const Block<uint8_t> padded = padImage(shape, image, kind.fill);
    if (padded == nullptr ||
        !scalePadded(shape, scaled.get(), width, height, padded.get(), kind.filter))
        return nullptr;
    return scaled;
}

// A record without images, or null.
Block<RasterCursor> allocateRecord(const ScaledShape &shape, uint32_t type, size_t size) {
    Block<RasterCursor> record(static_cast<RasterCursor *>(UtilSafeCalloc0(1, size)));
    if (record == nullptr)
        return nullptr;
    record->type = type;
    record->hotspotX = shape.x.dstHotspot;
    record->hotspotY = shape.y.dstHotspot;
    record->width = shape.x.dstSize;
    record->height = shape.y.dstSize;
    return record;
}

RasterCursor *scaleAlpha(const ScaledShape &shape, const RasterCursor *cursor) {
    Block<RasterCursor> record = allocateRecord(shape, RASTER_CURSOR_ALPHA, kAlphaRecordSize);
    if (record == nullptr)
        return nullptr;
    Block<uint8_t> image = scaleImage(shape, cursor->alphaImage, kAlphaImage);
    if (image == nullptr)
        return nullptr;
    record->alphaImage = image.release();
    return record.release();
}

RasterCursor *scaleMasks(const ScaledShape &shape, const RasterCursor *cursor) {
    Block<RasterCursor> record = allocateRecord(shape, RASTER_CURSOR_ANDXOR, sizeof(RasterCursor));
    if (record == nullptr)
        return nullptr;
    Block<uint8_t> andImage = scaleImage(shape, cursor->andImage, kAndImage);
    if (andImage == nullptr)
        return nullptr;
    Block<uint8_t> xorImage = scaleImage(shape, cursor->xorImage, kXorImage);
    if (xorImage == nullptr)
        return nullptr;
    record->planeInfo0 = cursor->planeInfo0;
    record->planeInfo1 = cursor->planeInfo1;
    record->andImage = andImage.release();
    record->xorImage = xorImage.release();
    return record.release();
}

} // namespace
} // namespace quillon

using namespace quillon;

RasterCursor *Raster_ScaleCursor(const RasterCursor *cursor, double scaleX, double scaleY) {
    const auto x = scaleAxis(cursor->width, cursor->hotspotX, scaleX);
    const auto y = scaleAxis(cursor->height, cursor->hotspotY, scaleY);
    if (!x || !y)
        return nullptr;
    const ScaledShape shape = {*x, *y};
    return cursor->type == RASTER_CURSOR_ALPHA ? scaleAlpha(shape, cursor)
                                               : scaleMasks(shape, cursor);
}
