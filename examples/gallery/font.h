// A font of one bit a pixel, for lettering made with the library itself.
#ifndef GALLERY_FONT_H
#define GALLERY_FONT_H

#include <cstdint>

namespace gallery {

// A glyph is 8 pixels wide, the last of them or more being the space to the
// next.  Of its 13 rows capitals stand on row 9, and letters hang down to 12.
inline constexpr int32_t kGlyphWidth = 8, kGlyphHeight = 13;

// The printable characters of ASCII, from the space to the tilde.
inline constexpr char kFirstGlyph = ' ', kLastGlyph = '~';
extern const uint8_t kFont[kLastGlyph - kFirstGlyph + 1][kGlyphHeight];

} // namespace gallery

#endif // GALLERY_FONT_H
