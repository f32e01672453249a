// Cursors: random calls, refusals, and what there is no memory for.

#include "operations.h"
#include "support/faults.h"
#include "support/messages.h"
#include "testCursor.h"
#include <quillon/raster.h>

#include <cfloat>
#include <cmath>

namespace quillon::test {
namespace {

constexpr uint32_t kNoSize = 0xFFFFFFFF;
constexpr uint32_t kTypes[] = {RASTER_CURSOR_ALPHA, RASTER_CURSOR_ANDXOR};

using Bytes = std::vector<uint8_t>;

TEST(CursorPlanes, areExpandedOrCopied) {
    forEachCase(20000, tryCursorPlanes);
}

TEST(CursorPlanes, panics) {
    const Bytes bits(8, 0xFF);
    Bytes dst(64, 0xAB);
    const auto expand = [&](const char *start, uint32_t andDepth, uint32_t size) {
        expectPanic(start, [&] {
            Raster_ExpandPlanarCursorData(4, 2, andDepth, bits.data(), 8, bits.data(), 32,
                                          dst.data(), size);
        });
        return std::count(dst.begin(), dst.end(), 0xFF);
    };
    EXPECT_EQ(expand("VERIFY lib/raster/rasterCursor", 8, 63), 0); // the size comes first
    EXPECT_EQ(expand("NOT_IMPLEMENTED lib/raster/rasterCursor", 8, 64), 0);
    EXPECT_EQ(expand("NOT_IMPLEMENTED lib/raster/rasterCursor", 1, 64), 32);
    expectPanic("VERIFY lib/raster/rasterCursor",
                [&] { Raster_ExpandCursorBitPlane(4, 2, 32, bits.data(), dst.data(), 31); });
}

// Such planes would reach beyond any dstSize, one of them or only both together.
// Null pointers, as nothing may be read either.
TEST(CursorPlanes, whatNoSizeTellsIsNotWritten) {
    const uint32_t planes[][3] = {
        {32, 0x10000000, 32}, {kNoSize, 1, 32}, {0x20000000, 1, 8}, {kNoSize, 1, 1}};
    for (const auto &[width, height, depth] : planes)
        for (const uint32_t data : {uint32_t{1}, depth}) {
            Raster_ExpandCursorBitPlane(width, height, depth, nullptr, nullptr, kNoSize);
            Raster_ExpandPlanarCursorData(width, height, data, nullptr, data, nullptr, depth,
                                          nullptr, kNoSize);
        }
    Raster_ExpandPlanarCursorData(32, 0x1000000, 1, nullptr, 32, nullptr, 32, nullptr, kNoSize);
}

TEST(CursorDrawing, boxesEqualTheirModel) {
    forEachCase(300000, tryCursorBox);
}

TEST(CursorDrawing, equalsItsModelAtEveryEdge) {
    forEachCase(10000, tryDrawCursor);
}

// Row 1 of such an image is further than a line increment reaches.
TEST(CursorDrawing, imagesTooWideAreNotDrawn) {
    const RasterCursorBox box = {0, 0, 1, 2, 0, 0};
    for (const uint32_t type : kTypes)
        for (const uint32_t width : {0x20000000u, 0x40000001u, 0xFFFFFFFFu}) {
            RasterCursor cursor{};
            cursor.type = type;
            cursor.width = width;
            Raster_DrawCursor(nullptr, 4, nullptr, 0, &cursor, &box);
        }
}

TEST(CursorScaling, isAPaddedImageScaled) {
    forEachCase(3000, tryScaleCursor);
    // Around the scaler's largest size and factors.
    Random random(1);
    for (const uint32_t type : kTypes) {
        for (const uint32_t size : {32763u, 32764u}) {
            tryScaledCursor(random, {type, size, 1, 1, 1});
            tryScaledCursor(random, {type, 1, size, 1, 1});
        }
        tryScaledCursor(random, {type, 8, 8, 0x1p-14, 1});
        tryScaledCursor(random, {type, 8, 8, 200, 1});
    }
}

ScaledCursor scaled(const TestCursor &source, double scaleX, double scaleY) {
    return ScaledCursor(Raster_ScaleCursor(&source.record, scaleX, scaleY));
}

// Where there is no size, no memory is asked for.
TEST(CursorScaling, withoutASizeOrMemoryThereIsNoCursor) {
    const std::pair<uint32_t, double> cases[] = {
        {8, 0},     {8, -1},      {8, HUGE_VAL}, {8, DBL_MAX},   {8, std::nan("")},
        {8, 1e10},  {8, 1e-10},   {8, DBL_MIN},  {8, 65536},     {8, 2e9},
        {8, -1e-9}, {kNoSize, 1}, {kNoSize, .5}, {0x20000000, 1}};
    Random random(1);
    for (const uint32_t type : kTypes) {
        const TestCursor source(random, type, 8, 8);
        for (const auto &[size, scale] : cases)
            for (const bool isWide : {true, false}) {
                source.record.width = isWide ? size : 8;
                source.record.height = isWide ? 8 : size;
                const MemoryFault fault(0);
                EXPECT_EQ(scaled(source, isWide ? scale : 1, isWide ? 1 : scale), nullptr);
                EXPECT_FALSE(fault.happened);
            }
    }
}

} // namespace
} // namespace quillon::test
