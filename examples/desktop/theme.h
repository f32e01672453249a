// Names, colours, sizes and the font that all of the desktop shares.
#ifndef DESKTOP_THEME_H
#define DESKTOP_THEME_H

#include "../gallery/font.h"

#include <quillon/quillon.hpp>

#include <string>

namespace desktop {

using quillon::Color;
using quillon::ConstSurface;
using quillon::Image;
using quillon::Point;
using quillon::Rect;
using quillon::Region;
using quillon::Size;
using quillon::Surface;

inline constexpr int32_t kGlyphWidth = gallery::kGlyphWidth, kGlyphHeight = gallery::kGlyphHeight;
inline constexpr int32_t kLineHeight = 16;
inline constexpr int32_t kBarHeight = 28;   // of the bar at the top of the screen
inline constexpr int32_t kTitleHeight = 30; // of a window's title
inline constexpr int32_t kBorder = 1;       // around a window's content
inline constexpr int32_t kRadius = 9;       // of round corners
inline constexpr int32_t kShadow = 32;      // how far a shadow reaches

inline constexpr Color kInk = 0xFFE9ECF3, kFadedInk = 0xFF8D96A8, kAccent = 0xFF6CB6FF;
inline constexpr Color kFrame = 0xFF303644, kFadedFrame = 0xFF262B36, kEdgeColor = 0xFF171A21;
inline constexpr Color kBackground = 0xFF14171E; // of what windows show
inline constexpr Color kRed = 0xFFFF6B68, kGreen = 0xFF7FD88F, kYellow = 0xFFF5CF72;
inline constexpr Color kViolet = 0xFFC79BFF;

// What XOR takes to change a colour: half the range, as the opposite of grey is grey.
inline constexpr uint32_t kInversion = 0x00808080;

inline const quillon::Font kFont = {gallery::kFont,
                                    {kGlyphWidth, kGlyphHeight},
                                    gallery::kFirstGlyph,
                                    gallery::kLastGlyph - gallery::kFirstGlyph + 1};

// Columns of pixels that a line of text takes.
inline int32_t textWidth(std::string_view text) {
    return kGlyphWidth * static_cast<int32_t>(text.size());
}

// A colour as blends take it.
constexpr Color translucent(Color color, uint8_t alpha) {
    return uint32_t{alpha} << 24 | (color.argb() >> 16 & 0xFF) * alpha / 255 << 16 |
           (color.argb() >> 8 & 0xFF) * alpha / 255 << 8 | (color.argb() & 0xFF) * alpha / 255;
}

// A picture of a size, all transparent; throws std::bad_alloc.
Image created(Size size);
// A picture of another size; throws std::bad_alloc.
Image resized(const ConstSurface &source, Size size);

} // namespace desktop

#endif // DESKTOP_THEME_H
