// Premultiplied pictures laid over others.
#include "rooms.h"
#include "sheet.h"

#include <algorithm>

namespace gallery {

namespace {

// The sprite in falling sizes, from left to right as far as there is room.
Picture decorated(const Material &material) {
    Picture picture = covering(material.photo, 704, 300);
    int32_t x = 0;
    for (int32_t size = 280; size >= 16; size = size * 5 / 8) {
        if (x + size > picture.width())
            break;
        blend(picture, resized(material.sprite, size, size), x, picture.height() - size);
        x += size;
    }
    return picture;
}

// One sprite over the picture, with its alpha replaced unless alpha is negative.
Picture withAlpha(const Material &material, int32_t alpha) {
    constexpr int32_t kSize = 136;
    //! [fillAlpha]
    Picture sprite = resized(material.sprite, kSize, kSize);
    if (alpha >= 0)
        Raster_RectFillAlpha(sprite.data(), sprite.step(), static_cast<uint8_t>(alpha), 0, 0, kSize,
                             kSize);
    //! [fillAlpha]
    Picture picture = covering(material.photo, 224, 152);
    blend(picture, sprite, 44, 8);
    return picture;
}

} // namespace

void showBlending(Page &page, const Material &material) {
    page.room("Blending", "A sprite whose colours are multiplied by its alpha, over a picture.");
    page.show(decorated(material),
              {"blend",
               "Glass marbles of six sizes stand on the lower edge of a landscape, which shines "
               "through them.",
               "`Raster_AlphaBlendOver`: marbles of several sizes. The glass is clear where it "
               "should be, and its shadow soft, with no rim of another colour.",
               {"blend"}});

    Sheet sheet(3);
    sheet.add(withAlpha(material, -1), "alpha as it is");
    sheet.add(withAlpha(material, 255), "alpha 255: covers");
    sheet.add(withAlpha(material, 0), "alpha 0: adds light");
    page.show(sheet,
              {"blend-alpha",
               "A marble over a landscape: clear; as an opaque square; and as light without "
               "shadow.",
               "`Raster_RectFillAlpha` replaces the alpha of the sprite before it is blended, and "
               "leaves its colours.",
               {"fillAlpha"}});
}

} // namespace gallery
