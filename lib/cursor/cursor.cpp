// Cursors: their planes, where they lie on the screen, drawing, scaling.

#include <quillon/raster.h>

#include "core/extended.h"
#include "core/failure.h"
#include "legacy/surface.h"
#include <hearth/hearth.h>

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

constexpr char kUnit[] = "lib/raster/rasterCursor";

// No plane has this size: all are multiples of 4.
constexpr uint32_t kNoSize = 0xFFFFFFFF;

constexpr int32_t kBytesPerPixel = 4; // of the images in a record

// Rows of more pixels are longer than a line increment can tell.
constexpr uint32_t kMaxWidth = std::numeric_limits<int32_t>::max() / kBytesPerPixel;

// A record of the alpha type ends behind its image.  So a record that is handed
// in is never read as a whole.
constexpr size_t kAlphaRecordSize = offsetof(RasterCursor, alphaImage) + sizeof(uint8_t *);

static_assert(offsetof(RasterCursor, alphaImage) == offsetof(RasterCursor, planeInfo0));
static_assert(sizeof(uint8_t *) != 8 || (kAlphaRecordSize == 32 && sizeof(RasterCursor) == 48));
static_assert(sizeof(RasterCursorBox) == 24 && sizeof(RasterCursorScreen) == 8);

// --- Planes

struct Plane {
    uint32_t width;
    uint32_t height;
    uint32_t depth;
    uint32_t size; // in bytes; not kNoSize

    int32_t lineIncrement() const {
        return static_cast<int32_t>(Raster_CalculateCursorSize(width, 1, depth));
    }
};

void expandBits(const Plane &plane, const uint8_t *bits, uint8_t *dst) {
    const Plane source = {plane.width, plane.height, 1, 0};
    Raster_BitsToPixels(bits, source.lineIncrement(), dst, plane.lineIncrement(),
                        static_cast<int32_t>(plane.depth / 8), static_cast<int32_t>(plane.width),
                        plane.height, 0xFFFFFFFF, 0);
}

// Brings data of some depth to that of the plane; false where that cannot be
// done.
bool writePlane(const Plane &plane, uint8_t *dst, uint32_t dataDepth, const uint8_t *data) {
    // Equal depths first: an expansion to depth 1 would write nothing.
    if (dataDepth == plane.depth) {
        if (plane.size != 0)
            std::memcpy(dst, data, plane.size);
        return true;
    }
    if (dataDepth == 1) {
        expandBits(plane, data, dst);
        return true;
    }
    return false;
}

// --- The part on the screen

struct VisibleRange {
    uint32_t dst;
    uint32_t size;
    uint32_t src;
};

// One axis of the box: of size pixels, the first at position start, those on the
// screen.  The position is signed; without a sign here so that it wraps.
std::optional<VisibleRange> findVisible(uint32_t start, uint32_t size, uint32_t screenSize) {
    VisibleRange range = {start, size, 0};
    if (static_cast<int32_t>(start) < 0)
        range = {0, size + start, 0 - start};
    if (static_cast<int32_t>(range.size) <= 0 || range.dst >= screenSize)
        return std::nullopt;
    range.size = std::min(range.size, screenSize - range.dst);
    return range;
}

// --- Scaling

uint32_t lineBytes(uint32_t width) {
    return width * kBytesPerPixel;
}

// One axis of a cursor and of its scaled copy.
struct ScaledAxis {
    double scale;
    uint32_t srcSize;
    uint32_t border; // pixels of the source, on either side
    uint32_t paddedSize;
    uint32_t dstSize;
    uint32_t dstHotspot;
};

struct ScaledShape {
    ScaledAxis x;
    ScaledAxis y;
};

// Nothing where the factor gives no size, or one that nothing can express.  A
// hot spot may lie anywhere, so it wraps.
std::optional<ScaledAxis> scaleAxis(uint32_t size, uint32_t hotspot, double scale) {
    constexpr double kMaxBorder = std::numeric_limits<int32_t>::max();
    // What is not a number fails every comparison.
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
    if (dstSize > kMaxWidth)
        return std::nullopt;
    return ScaledAxis{scale,
                      size,
                      border,
                      paddedSize,
                      static_cast<uint32_t>(dstSize),
                      (Extended(hotspot + border) * factor).truncated()};
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

// Width times height pixels, of which neither passes 30 bits.
size_t imageBytes(uint32_t width, uint32_t height) {
    return size_t{width} * height * kBytesPerPixel;
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
    Raster_RectCopy(padded.get(), static_cast<int32_t>(lineBytes(x.paddedSize)), image,
                    static_cast<int32_t>(lineBytes(x.srcSize)), kBytesPerPixel, 0, 0, x.border,
                    y.border, x.srcSize, y.srcSize);
    return padded;
}

// Scales the padded image src into the first width columns and height rows of dst.
bool scalePadded(const ScaledShape &shape, uint8_t *dst, uint32_t width, uint32_t height,
                 const uint8_t *src, uint32_t filter) {
    const ScaledAxis &x = shape.x, &y = shape.y;
    return Raster_Scale(dst, static_cast<int32_t>(lineBytes(x.dstSize)), x.dstSize, y.dstSize, 0, 0,
                        static_cast<int32_t>(width), static_cast<int32_t>(height), src,
                        static_cast<int32_t>(lineBytes(x.paddedSize)), x.paddedSize, y.paddedSize,
                        x.scale, y.scale, filter) != 0;
}

// A scaled image, or null.
//
// The border keeps the cursor's own pixels away from the edges, where the scaler
// has rules of its own.
Block<uint8_t> RasterScaleCursorImage(const ScaledShape &shape, const uint8_t *image,
                                      ImageKind kind) {
    const uint32_t width = shape.x.dstSize, height = shape.y.dstSize;
    Block<uint8_t> scaled = allocateImage(width, height);
    if (scaled == nullptr)
        return nullptr;

    // The scaler looks at sizes and factors even if there is nothing to write.
    // What it refuses is not worth a padded image, which could be enormous.
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
    Block<uint8_t> image = RasterScaleCursorImage(shape, cursor->alphaImage, kAlphaImage);
    if (image == nullptr)
        return nullptr;
    record->alphaImage = image.release();
    return record.release();
}

RasterCursor *scaleMasks(const ScaledShape &shape, const RasterCursor *cursor) {
    Block<RasterCursor> record = allocateRecord(shape, RASTER_CURSOR_ANDXOR, sizeof(RasterCursor));
    if (record == nullptr)
        return nullptr;
    Block<uint8_t> andImage = RasterScaleCursorImage(shape, cursor->andImage, kAndImage);
    if (andImage == nullptr)
        return nullptr;
    Block<uint8_t> xorImage = RasterScaleCursorImage(shape, cursor->xorImage, kXorImage);
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

uint32_t Raster_CalculateCursorSize(uint32_t width, uint32_t height, uint32_t depth) {
    // Each step at 64 bits, where none of them overflows.
    const uint64_t paddedBits = uint64_t{width} * depth + 31;
    if (paddedBits > std::numeric_limits<uint32_t>::max())
        return kNoSize;
    const uint64_t size = paddedBits / 32 * 4 * height;
    return size > std::numeric_limits<uint32_t>::max() ? kNoSize : static_cast<uint32_t>(size);
}

void Raster_ExpandCursorBitPlane(uint32_t width, uint32_t height, uint32_t depth,
                                 const uint8_t *bits, uint8_t *dstBuffer, uint32_t dstSize) {
    const Plane plane = {width, height, depth, Raster_CalculateCursorSize(width, height, depth)};
    if (plane.size > dstSize) {
        panicVerify(kUnit);
        return;
    }
    // A dstSize of kNoSize passes, too, but does not hold a plane that large.
    if (plane.size != kNoSize)
        expandBits(plane, bits, dstBuffer);
}

void Raster_ExpandPlanarCursorData(uint32_t width, uint32_t height, uint32_t andDepth,
                                   const uint8_t *andData, uint32_t xorDepth,
                                   const uint8_t *xorData, uint32_t depth, uint8_t *dstBuffer,
                                   uint32_t dstSize) {
    Plane plane = {width, height, depth, Raster_CalculateCursorSize(width, height, depth)};
    const bool hasTotal = plane.size <= kNoSize / 2;
    if (dstSize < (hasTotal ? 2 * plane.size : kNoSize)) {
        panicVerify(kUnit);
        return;
    }
    // A dstSize of kNoSize passes, too, but does not hold planes that large.
    if (!hasTotal)
        plane.height = plane.size = 0;

    if (!writePlane(plane, dstBuffer, andDepth, andData)) {
        panicNotImplemented(kUnit);
        return;
    }
    if (!writePlane(plane, advance(dstBuffer, plane.size), xorDepth, xorData)) {
        panicNotImplemented(kUnit);
        return;
    }
}

uint32_t Raster_ComputeCursorBox(const RasterCursorScreen *screen, const RasterCursor *cursor,
                                 int32_t x, int32_t y, RasterCursorBox *box) {
    const auto columns =
        findVisible(static_cast<uint32_t>(x) - cursor->hotspotX, cursor->width, screen->width);
    if (!columns)
        return 0;
    const auto rows =
        findVisible(static_cast<uint32_t>(y) - cursor->hotspotY, cursor->height, screen->height);
    if (!rows)
        return 0;
    *box = {columns->dst, rows->dst, columns->size, rows->size, columns->src, rows->src};
    return 1;
}

void Raster_DrawCursor(uint8_t *frameBuffer, int32_t lineIncrement, uint8_t *composeBuffer,
                       int32_t composeLineIncrement, const RasterCursor *cursor,
                       const RasterCursorBox *box) {
    if (cursor->width > kMaxWidth)
        return;
    const auto imageLine = static_cast<int32_t>(lineBytes(cursor->width));

    uint8_t *target = frameBuffer;
    int32_t targetLine = lineIncrement;
    uint32_t x = box->dstX, y = box->dstY;
    if (composeBuffer != nullptr) {
        Raster_RectCopy(composeBuffer, composeLineIncrement, frameBuffer, lineIncrement,
                        kBytesPerPixel, x, y, 0, 0, box->width, box->height);
        target = composeBuffer;
        targetLine = composeLineIncrement;
        x = y = 0;
    }

    if (cursor->type != RASTER_CURSOR_ANDXOR) {
        Raster_AlphaBlendOver(target, x, y, targetLine, cursor->alphaImage, box->srcX, box->srcY,
                              imageLine, box->width, box->height);
        return;
    }
    Raster_RectROPcopy(target, targetLine, cursor->andImage, imageLine, kBytesPerPixel, box->srcX,
                       box->srcY, RASTER_ROP_AND, x, y, box->width, box->height);
    Raster_RectROPcopy(target, targetLine, cursor->xorImage, imageLine, kBytesPerPixel, box->srcX,
                       box->srcY, RASTER_ROP_XOR, x, y, box->width, box->height);
}

RasterCursor *Raster_ScaleCursor(const RasterCursor *cursor, double scaleX, double scaleY) {
    const auto x = scaleAxis(cursor->width, cursor->hotspotX, scaleX);
    const auto y = scaleAxis(cursor->height, cursor->hotspotY, scaleY);
    if (!x || !y)
        return nullptr;
    const ScaledShape shape = {*x, *y};
    return cursor->type == RASTER_CURSOR_ALPHA ? scaleAlpha(shape, cursor)
                                               : scaleMasks(shape, cursor);
}
