// Every Panic of the library, left by an exception, by a jump and by the end of the
// process, and one that comes back.  Nothing may be left behind.

#include "support/faults.h"
#include "support/messages.h"
#include <quillon/quillon.h>

#include <algorithm>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <cstring>

using namespace quillon::test;

namespace {

const uint32_t kPalette[256] = {};
uint8_t memory[4096];
constexpr size_t kPlanes = 1024, kPlaneBytes = 256; // of a cursor of 8 x 8

void convertDepths(int32_t dstDepth, int32_t srcDepth, bool isIndexed) {
    Raster_ConvertPixels(memory, 64, dstDepth, memory, 64, srcDepth, isIndexed, kPalette, 0, 0, 0,
                         0, 4, 4);
}

void combineRects(uint32_t dstX) {
    Raster_RectROPcopy(memory, 64, memory, 64, 5, 1, 1, RASTER_ROP_XOR, dstX, 1, 4, 4);
}

void expandPlanes(uint32_t andDepth, uint32_t xorDepth, uint32_t size) {
    Raster_ExpandPlanarCursorData(8, 8, andDepth, memory, xorDepth, memory, 32, memory + kPlanes,
                                  size);
}

void splitAmongSixteen() {
    RasterRectList list;
    for (int32_t i = 0; i < 16; ++i)
        list.entries[i] = {10 * i, 0, 5, 20};
    Raster_SubRect(&list, 1, -5, 2, 10);
}

void addNegative() {
    RasterRectList list = {};
    Raster_AddRect(&list, 0, 0, -1, 5);
}

// An image of 16 bits, in a depth that does not exist.
ImageInfo imageOfNoDepth() {
    ImageInfo image = {};
    image.width = image.height = 4;
    image.depth = 12;
    image.bpp = image.bytesPerLine = 16;
    image.data = memory;
    return image;
}

void combineImages() {
    const ImageInfo images[] = {imageOfNoDepth(), imageOfNoDepth()};
    const RectPoint positions[] = {{0, 0}, {9, 0}};
    ImageInfo canvas;
    ImageUtil_Combine(images, positions, 2, &canvas);
}

void encodeByMemOps() {
    const ImageUtilMemOps ops = {
        nullptr, [](void *, size_t size) { return std::malloc(size); },
        [](void *, void *block) { std::free(block); },
        [](void *, void *block, size_t size) { return std::realloc(block, size); }};
    const ImageInfo image = imageOfNoDepth();
    uint8_t *data = nullptr;
    uint32_t size = 0;
    ImageUtil_ConstructPNGBufferWithMemOps(&image, nullptr, &data, &size, &ops);
}

const std::pair<const char *, void (*)()> kPanics[] = {
    {"Raster_RectFill", [] { Raster_RectFill(memory, 64, 5, 0, 0, 0, 4, 4); }},
    {"Raster_RectROPfill",
     [] { Raster_RectROPfill(memory, 64, 5, 0, RASTER_ROP_XOR, 0, 0, 4, 4); }},
    {"Raster_RectROPcopy, backward", [] { combineRects(2); }},
    {"Raster_RectROPcopy, forward", [] { combineRects(0); }},
    {"Raster_ConvertPixels, palette", [] { convertDepths(32, 16, true); }},
    {"Raster_ConvertPixels, source", [] { convertDepths(32, 12, false); }},
    {"Raster_ConvertPixels, destination", [] { convertDepths(12, 32, false); }},
    {"Raster_ConvertOnePixel, palette", [] { Raster_ConvertOnePixel(0, 16, 32, true, kPalette); }},
    {"Raster_ConvertOnePixel, source", [] { Raster_ConvertOnePixel(0, 12, 32, false, nullptr); }},
    {"Raster_ConvertOnePixel, destination",
     [] { Raster_ConvertOnePixel(0, 32, 12, false, nullptr); }},
    {"Raster_ExpandCursorBitPlane",
     [] { Raster_ExpandCursorBitPlane(8, 8, 32, memory, memory, 255); }},
    {"Raster_ExpandPlanarCursorData, size", [] { expandPlanes(1, 1, 511); }},
    {"Raster_ExpandPlanarCursorData, AND", [] { expandPlanes(7, 1, 512); }},
    {"Raster_ExpandPlanarCursorData, XOR", [] { expandPlanes(1, 7, 512); }},
    {"Raster_AddRect", addNegative},
    {"Raster_SubRect", splitAmongSixteen},
    {"ImageUtil_WriteImage", [] { ImageUtil_WriteImage(nullptr, "", 2); }},
    {"ImageUtil_Combine", combineImages},
    {"ImageUtil_ConstructPNGBufferWithMemOps", encodeByMemOps},
    {"ImageUtil_ConstructPNGBuffer",
     [] {
         DynBuf buffer = {};
         const ImageInfo image = imageOfNoDepth();
         ImageUtil_ConstructPNGBuffer(&image, nullptr, &buffer);
     }},
    {"ImageUtil_ConstructBMPBuffer", [] {
         DynBuf buffer = {};
         const ImageInfo image = imageOfNoDepth();
         ImageUtil_ConstructBMPBuffer(&image, &buffer);
     }}};

// The message, where an exception was thrown.
std::string thrownBy(void (*call)()) {
    try {
        call();
    } catch (const PanicError &panic) {
        return panic.what();
    }
    return "";
}

bool jumpsOut(void (*call)()) {
    panicWay = PanicWay::kJump;
    const bool hasJumped = setjmp(panicJump) != 0;
    if (!hasJumped)
        call();
    panicWay = PanicWay::kThrow;
    return hasJumped;
}

// The call returns and leaves all memory alone, but for the first of two planes, which
// is written ahead of the check of the second.
void expectReturn(void (*call)()) {
    std::memset(memory, 0xA5, sizeof(memory));
    panicWay = PanicWay::kReturn;
    call();
    panicWay = PanicWay::kThrow;
    const auto isSame = [](uint8_t byte) { return byte == 0xA5; };
    EXPECT_TRUE(std::all_of(memory, memory + kPlanes, isSame));
    EXPECT_TRUE(std::all_of(memory + kPlanes + kPlaneBytes, std::end(memory), isSame));
}

TEST(Panics, LeaveInEveryWay) {
    for (const auto &[name, call] : kPanics) {
        SCOPED_TRACE(name);
        const std::string message = thrownBy(call);
        ASSERT_NE(message, "");
        Messages().swap(warnings);
        const MemoryFault none(UINT64_MAX);
        EXPECT_EQ(thrownBy(call), message);
        EXPECT_TRUE(jumpsOut(call));
        expectReturn(call);
        Messages().swap(warnings);
        EXPECT_EQ(none.blocksHeld, 0);
        EXPECT_EXIT((panicWay = PanicWay::kAbort, call()), testing::KilledBySignal(SIGABRT),
                    message);
        std::printf("%-40s thrown, jumped, returned, aborted: %s", name, message.c_str());
    }
}

} // namespace
