// Cursors: the size and expansion of their planes, the part of one that lies on
// the screen, and drawing.
#include <quillon/raster.h>

#include "core/failure.h"
#include "core/surface.h"
#include "cursor/cursorImage.h"

#include <algorithm>
#include <cstddef>
#include <cstring>
#include <limits>
#include <optional>

namespace quillon {
namespace {

// The layout of the records is part of the interface.
static_assert(offsetof(RasterCursor, height) == 16);
static_assert(offsetof(RasterCursor, planeInfo0) == offsetof(RasterCursor, alphaImage));
static_assert(sizeof(void *) != 8 || offsetof(RasterCursor, alphaImage) == 24);
static_assert(sizeof(void *) != 8 || offsetof(RasterCursor, planeInfo1) == 28);
static_assert(sizeof(void *) != 8 || offsetof(RasterCursor, andImage) == 32);
static_assert(sizeof(void *) != 8 || offsetof(RasterCursor, xorImage) == 40);
static_assert(sizeof(void *) != 8 || sizeof(RasterCursor) == 48);
static_assert(offsetof(RasterCursorBox, srcY) == 20 && sizeof(RasterCursorBox) == 24);
static_assert(offsetof(RasterCursorScreen, height) == 4 && sizeof(RasterCursorScreen) == 8);

// What Raster_CalculateCursorSize gives where a size exceeds 32 bits.  No plane
// has this size: all are multiples of 4.
constexpr uint32_t kNoSize = 0xFFFFFFFF;

struct Plane {
    uint32_t width;
    uint32_t height;
    uint32_t depth;
    uint32_t size; // in bytes; not kNoSize

    int32_t stride() const {
        return static_cast<int32_t>(Raster_CalculateCursorSize(width, 1, depth));
    }
};

void expandBits(const Plane &plane, const uint8_t *bits, uint8_t *dst) {
    const Plane source = {plane.width, plane.height, 1, 0};
    Raster_BitsToPixels(bits, source.stride(), dst, plane.stride(),
                        static_cast<int32_t>(plane.depth / 8), static_cast<int32_t>(plane.width),
                        plane.height, 0xFFFFFFFF, 0);
}

// Writes a plane from data of some depth; false where that depth cannot be
// converted.
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

// The visible part of one axis.
struct VisibleRange {
    uint32_t dst; // first pixel on the screen
    uint32_t size;
    uint32_t src; // first pixel of the image
};

// Clips size pixels from position start to the screen.  The position is signed; it
// is passed as uint32_t so that its arithmetic wraps.
std::optional<VisibleRange> findVisible(uint32_t start, uint32_t size, uint32_t screenSize) {
    VisibleRange range = {start, size, 0};
    if (static_cast<int32_t>(start) < 0)
        range = {0, size + start, 0 - start};
    if (static_cast<int32_t>(range.size) <= 0 || range.dst >= screenSize)
        return std::nullopt;
    range.size = std::min(range.size, screenSize - range.dst);
    return range;
}

} // namespace
} // namespace quillon

using namespace quillon;

uint32_t Raster_CalculateCursorSize(uint32_t width, uint32_t height, uint32_t depth) {
    // No step overflows 64 bits.
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
        panicVerify(kUnitRasterCursor);
        return;
    }
    // kNoSize passes the check against a dstSize of 0xFFFFFFFF, which cannot hold
    // such a plane.
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
        panicVerify(kUnitRasterCursor);
        return;
    }
    // A dstSize of 0xFFFFFFFF passes the check and cannot hold such planes.  With no
    // rows nothing is written, and the depths are still checked.
    if (!hasTotal)
        plane.height = plane.size = 0;

    if (!writePlane(plane, dstBuffer, andDepth, andData)) {
        panicNotImplemented(kUnitRasterCursor);
        return;
    }
    if (!writePlane(plane, advance(dstBuffer, plane.size), xorDepth, xorData)) {
        panicNotImplemented(kUnitRasterCursor);
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
    if (cursor->width > kMaxCursorWidth)
        return;
    const int32_t imageStride = cursorImageStride(cursor->width);

    uint8_t *target = frameBuffer;
    int32_t targetStride = lineIncrement;
    uint32_t x = box->dstX, y = box->dstY;
    if (composeBuffer != nullptr) {
        Raster_RectCopy(composeBuffer, composeLineIncrement, frameBuffer, lineIncrement,
                        kCursorPixelBytes, x, y, 0, 0, box->width, box->height);
        target = composeBuffer;
        targetStride = composeLineIncrement;
        x = y = 0;
    }

    if (cursor->type != RASTER_CURSOR_ANDXOR) {
        Raster_AlphaBlendOver(target, x, y, targetStride, cursor->alphaImage, box->srcX, box->srcY,
                              imageStride, box->width, box->height);
        return;
    }
    Raster_RectROPcopy(target, targetStride, cursor->andImage, imageStride, kCursorPixelBytes,
                       box->srcX, box->srcY, RASTER_ROP_AND, x, y, box->width, box->height);
    Raster_RectROPcopy(target, targetStride, cursor->xorImage, imageStride, kCursorPixelBytes,
                       box->srcX, box->srcY, RASTER_ROP_XOR, x, y, box->width, box->height);
}
