// The operations that are measured, each family in a file of its own.
#pragma once

#include "../comparison.h"
#include "../contents.h"

namespace quillon::bench {

// What the operations are given; peers are given the same.
inline constexpr uint32_t kPixel = 0xFF345678;
inline constexpr uint32_t kForeground = 0xFF102030;
inline constexpr uint32_t kBackground = 0xFFE0D0C0;
inline constexpr uint8_t kAlpha = 0x80;

void addFills(Plan &plan, const Area &area);
void addCopies(Plan &plan, const Area &area);
void addBlends(Plan &plan, const Area &area);
void addBits(Plan &plan, const Area &area);
void addConversions(Plan &plan, const Area &area);
void addScaling(Plan &plan, const Area &area);
void addVideo(Plan &plan, const Area &area);
// All of these.
void addPixelOperations(Plan &plan, const Area &area);

// Those that have no area.
void addRectLists(Plan &plan);
void addImages(Plan &plan);

} // namespace quillon::bench
