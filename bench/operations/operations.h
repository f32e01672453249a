// The operations measured, by the rooms of the library, and what names them.
#pragma once

#include "../contents.h"
#include "../operation.h"

#include <quillon/imageUtil.h>
#include <quillon/raster.h>

#include <span>

namespace quillon::bench {

// ---- What ours and peers are given -----------------------------------------

inline constexpr uint32_t kPixel = 0xFF345678;
inline constexpr uint32_t kForeground = 0xFF102030;
inline constexpr uint32_t kBackground = 0xFFE0D0C0;

inline constexpr int32_t kIndex = 0; // a depth: palette indices
inline std::string conversionName(int32_t srcDepth, int32_t dstDepth) {
    return text(srcDepth == kIndex ? "index" : text("convert ", srcDepth), " to ", dstDepth);
}

// The picture of the image operations, 32 bits a pixel, and its PNG file at zlib's
// default level, 6.
const ImageInfo &picture();
std::span<const uint8_t> pngFile();

// ---- Operations -----------------------------------------------------------

void addFills(Plan &plan);
void addRops(Plan &plan);
void addCopies(Plan &plan);
void addBlends(Plan &plan);
void addBits(Plan &plan);
void addConversions(Plan &plan);
void addScaling(Plan &plan);
void addVideo(Plan &plan);
void addColorKeys(Plan &plan);
void addRegions(Plan &plan); // these have no area
void addImages(Plan &plan);
void addFace(Plan &plan); // in small rectangles

// Those that have an area.
std::vector<Operation> pixelOperations(const Area &area);

// All, without their peers.
std::vector<Operation> allOperations();

} // namespace quillon::bench
