// Text: a bitmap of one bit a pixel, expanded.
#include "font.h"
#include "rooms.h"
#include "sheet.h"

namespace gallery {

namespace {

Picture allGlyphs() {
    constexpr int32_t kColumns = 32, kRows = 3, kPitch = kGlyphHeight + 3;
    Picture table = blank(kColumns * kGlyphWidth + 8, kRows * kPitch + 5, kPale);
    for (int32_t row = 0; row < kRows; ++row) {
        std::string line;
        for (int32_t c = kFirstGlyph + row * kColumns; c <= kLastGlyph; ++c)
            if (line.size() < kColumns)
                line += static_cast<char>(c);
        write(table, 4, 4 + row * kPitch, line, kInk, kPale);
    }
    return table;
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
    page.show(zoomed(allGlyphs(), 2), "text-font",
              "`Raster_BitsToPixels`: the font, each line of it one call, at twice its size.");

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
    page.show(ways.drawn(), "text-ways",
              "`Raster_BitsToPixels` writes ink and paper; `Raster_BitsToPixelsStencil` writes the "
              "ink alone, and the picture stays between the letters.");
}

} // namespace gallery
