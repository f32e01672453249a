// Scaling, up and down, by the nearest sample and filtered.
#include "rooms.h"
#include "sheet.h"

#include <cmath>

namespace gallery {

namespace {

enum Filter : uint32_t { kNearest = 0, kFiltered = 1 };

// With its last column once more.
Picture widened(const Picture &source) {
    Picture wide = blank(source.width() + 1, source.height(), 0);
    paste(wide, source, 1, 0);
    paste(wide, source, 0, 0);
    return wide;
}

Picture scaled(const Picture &picture, int32_t width, int32_t height, Filter filter) {
    Picture result = blank(width, height, 0);
    const Rect all = result.bounds();
    //! [scale]
    // A reduction leaves the last column of its source out, so it gets one more, and the
    // factors of the picture without that.
    const bool isReduced = filter == kFiltered && width < picture.width();
    const Picture source = isReduced ? widened(picture) : copyOf(picture);
    if (!Raster_Scale(result.data(), result.step(), result.info().width, result.info().height,
                      all.left, all.top, all.right, all.bottom, source.data(), source.step(),
                      source.info().width, source.info().height,
                      static_cast<double>(width) / picture.width(),
                      static_cast<double>(height) / picture.height(), filter))
        fail("a picture cannot be scaled");
    //! [scale]
    return result;
}

// Spokes that grow finer towards the middle: what cannot be shown in fewer
// pixels should turn grey.
Picture spokes(int32_t size) {
    Picture picture = blank(size, size, kWhite);
    const double middle = (size - 1) / 2.0;
    for (int32_t y = 0; y < size; ++y)
        for (int32_t x = 0; x < size; ++x) {
            const double dx = x - middle, dy = y - middle;
            if (std::hypot(dx, dy) < middle && std::sin(std::atan2(dy, dx) * 36) > 0)
                fill(picture, area(x, y, 1, 1), kInk);
        }
    return picture;
}

// A large picture as it was, then reduced to a quarter of the given size and
// enlarged again so that its pixels can be seen.
void addReductions(Sheet &sheet, const Picture &source, int32_t width, int32_t height) {
    constexpr int32_t kZoom = 4;
    sheet.add(covering(source, width, height), "for comparison");
    for (const Filter filter : {kNearest, kFiltered})
        sheet.add(zoomed(scaled(source, width / kZoom, height / kZoom, filter), kZoom),
                  std::to_string(source.width()) + " to " + std::to_string(width / kZoom) +
                      (filter == kNearest ? ", nearest" : ", filtered"));
}

// Which pixels of an enlargement change when a part of the source does.
void addDamage(Sheet &sheet, const Picture &source, int32_t factor) {
    Rect part = area(source.width() / 2 - 6, source.height() / 2 - 4, 8, 6);
    Picture small = copyOf(source);
    fill(small, part, kOrange);
    //! [scaleDamage]
    Picture large = scaled(small, source.width() * factor, source.height() * factor, kFiltered);
    Raster_ScaleSrcCoordinates(&part, source.info().width, source.info().height, factor, factor);
    outline(large, part, kWhite);
    //! [scaleDamage]
    sheet.add(zoomed(small, factor), "8 by 6 pixels have changed");
    sheet.add(std::move(large), "what to scale again, outlined");
}

} // namespace

void showScaling(Page &page, const Material &material) {
    page.room("Scaling", "`Raster_Scale` has two ways: the nearest sample, or filtered, which "
                         "interpolates where a picture grows and averages where it shrinks.");

    constexpr int32_t kFactor = 8;
    const Picture detail =
        covering(partOf(material.photo, subject(material.photo, 129, 87)), 43, 29);
    Sheet up(2);
    up.add(scaled(detail, detail.width() * kFactor, detail.height() * kFactor, kNearest),
           "8 times, nearest");
    up.add(scaled(detail, detail.width() * kFactor, detail.height() * kFactor, kFiltered),
           "8 times, filtered");
    addDamage(up, detail, kFactor);
    page.show(up,
              {"scale-up",
               "A detail of a landscape eight times enlarged, as squares and smooth; below, a part "
               "that has changed, and the larger part of the enlargement that depends on it.",
               "Enlarged: squares, or slopes between them. Below, `Raster_ScaleSrcCoordinates` "
               "tells which pixels of an enlargement depend on a part of its source.",
               {"enlarge", "scaleDamage"}});

    Sheet down(3);
    addReductions(down, spokes(672), 224, 224);
    addReductions(down, covering(material.photo, 896, 608), 224, 152);
    page.show(down,
              {"scale-down",
               "Spokes and a landscape, reduced: by nearest samples with false patterns, by "
               "averages smooth.",
               "Reduced, and shown with each pixel as a square. Nearest samples invent patterns "
               "where the spokes are finer than the pixels; averages turn them grey. Averages "
               "leave the last column of their source out, which would darken the right edge: the "
               "source has been handed over with that column twice.",
               {"scale"}});
}

} // namespace gallery
