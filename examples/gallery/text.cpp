// Text: a bitmap of one bit a pixel, expanded.
#include "font.h"
#include "rooms.h"
#include "sheet.h"

#include <algorithm>

namespace gallery {

namespace {

Picture allGlyphs(int32_t columns) {
    constexpr int32_t kPitch = kGlyphHeight + 3, kCount = kLastGlyph - kFirstGlyph + 1;
    const int32_t rows = (kCount + columns - 1) / columns;
    Picture table = blank(columns * kGlyphWidth + 8, rows * kPitch + 5, kPale);
    for (int32_t first = 0; first < kCount; first += columns) {
        std::string line;
        for (int32_t i = first; i < std::min(first + columns, kCount); ++i)
            line += static_cast<char>(kFirstGlyph + i);
        write(table, 4, 4 + first / columns * kPitch, line, kInk, kPale);
    }
    return zoomed(table, 2);
}

using Lettering = void (*)(Picture &, int32_t x, int32_t y);

Picture lettered(const Picture &photo, Lettering lettering) {
    Picture picture = covering(photo, 172, 116);
    for (int32_t line = 0; line < 3; ++line)
        lettering(picture, 10, 18 + line * 32);
    return zoomed(picture, 2);
}

} // namespace

void showText(Page &page, const Material &material) {
    page.room("Text", "A bitmap with one bit a pixel becomes pixels. Every label on this page was "
                      "drawn that way, in a font of the gallery's own.");
    page.show(allGlyphs(32), allGlyphs(16),
              {"text-font",
               "All printable characters of ASCII, in a font of pixels.",
               "`Raster_BitsToPixels`: the font, each line of it one call, at twice its size.",
               {"text"}});

    Sheet ways(2);
    ways.add(lettered(material.photo,
                      [](Picture &picture, int32_t x, int32_t y) {
                          write(picture, x, y, " Sphinx of quartz ", kInk, 0xFFFFF3B0);
                      }),
             "opaque");
    ways.add(lettered(material.photo,
                      [](Picture &picture, int32_t x, int32_t y) {
                          stencil(picture, x + 1, y + 1, " Sphinx of quartz ", kInk);
                          stencil(picture, x, y, " Sphinx of quartz ", kWhite);
                      }),
             "a stencil, over its own shadow");
    page.show(ways,
              {"text-ways",
               "The words Sphinx of quartz over a landscape: on yellow paper, and as white letters "
               "with a shadow.",
               "`Raster_BitsToPixels` writes ink and paper; `Raster_BitsToPixelsStencil` writes "
               "the ink alone, and the picture stays between the letters.",
               {"stencil"}});
}

} // namespace gallery
