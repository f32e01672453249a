// Images combined, cut and scaled; and the files of the visitor's own picture.
#include "rooms.h"
#include "sheet.h"

#include <algorithm>
#include <cstdlib>
#include <vector>

namespace gallery {

namespace {

// An image of 24 bits a pixel: no alpha.
Picture withoutAlpha(const Picture &picture) {
    ImageInfo info = picture.info();
    info.bpp = 24;
    info.bytesPerLine = info.width * 3;
    info.data = static_cast<uint8_t *>(std::malloc(size_t{info.bytesPerLine} * info.height));
    if (!info.data)
        fail("no memory");
    Raster_ConvertPixelsFrom32(info.data, info.bytesPerLine, 24, picture.data(),
                               picture.info().bytesPerLine, 0, 0, 0, 0, info.width, info.height);
    return Picture(info);
}

// What is clear in a picture shows a chequered ground.
Picture overCheques(const Picture &picture) {
    constexpr int32_t kSquare = 8;
    Picture ground = blank(picture.width(), picture.height(), kWhite);
    for (int32_t y = 0; y < ground.height(); y += kSquare)
        for (int32_t x = y % (2 * kSquare); x < ground.width(); x += 2 * kSquare)
            fill(ground,
                 area(x, y, std::min(kSquare, ground.width() - x),
                      std::min(kSquare, ground.height() - y)),
                 0xFFD5DBE1);
    blend(ground, premultiplied(picture), 0, 0);
    return ground;
}

// Four quarters of a picture put together again, gap pixels apart.
void addCombined(Sheet &sheet, const Picture &photo, int32_t gap, const std::string &label) {
    const int32_t width = photo.width() / 2, height = photo.height() / 2;
    std::vector<Picture> quarters;
    std::vector<ImageInfo> images;
    std::vector<RectPoint> corners;
    for (int32_t i = 0; i < 4; ++i) {
        const int32_t column = i % 2, row = i / 2;
        quarters.push_back(
            withoutAlpha(partOf(photo, area(column * width, row * height, width, height))));
        images.push_back(quarters.back().info());
        corners.push_back({column * (width + gap), row * (height + gap)});
    }
    //! [combine]
    ImageInfo combined = {};
    if (!ImageUtil_Combine(images.data(), corners.data(), 4, &combined))
        fail("images cannot be combined");
    //! [combine]
    const Picture result(combined);
    const std::string bits = std::to_string(combined.bpp) + " bits a pixel";
    if (combined.bpp == 32) {
        sheet.add(overCheques(result), label + ": " + bits);
        return;
    }
    Picture shown = blank(result.width(), result.height(), 0);
    Raster_ConvertPixelsTo32(shown.data(), shown.info().bytesPerLine, result.data(),
                             combined.bytesPerLine, 24, false, nullptr, 0, 0, 0, 0, combined.width,
                             combined.height);
    sheet.add(std::move(shown), label + ": " + bits);
}

Picture cutAndScaled(const Picture &photo, const Rect &part, int32_t width, int32_t height) {
    //! [cropAndScale]
    ImageInfo result = {};
    if (!ImageUtil_CropAndScaleImage(&photo.info(), part.left, part.top, part.right, part.bottom, 0,
                                     0, width, height, &result))
        fail("a part cannot be scaled");
    return Picture(result);
    //! [cropAndScale]
}

// Scaled to a longest side.
Picture thumbnail(const Picture &photo, int32_t side) {
    const int32_t longest = std::max(photo.width(), photo.height());
    const auto scaled = [side, longest](int32_t extent) {
        return std::max(1, extent * side / longest);
    };
    return resized(photo, scaled(photo.width()), scaled(photo.height()));
}

// Rows of pictures on one sheet, with gaps between them.
class ContactSheet {
public:
    void add(const Picture &picture) {
        images.push_back(picture.info());
        corners.push_back({x, y});
        x += picture.width() + kGap;
        rowHeight = std::max(rowHeight, picture.height());
    }
    void newRow() {
        x = 0;
        y += rowHeight + kGap;
        rowHeight = 0;
    }
    // All of it on dark grey, with a margin.
    Picture drawn() const {
        ImageInfo info = {};
        if (!ImageUtil_Combine(images.data(), corners.data(), static_cast<uint32_t>(images.size()),
                               &info))
            fail("the sheet cannot be made");
        const Picture pasted(info);
        Picture ground = blank(pasted.width() + 2 * kGap, pasted.height() + 2 * kGap, 0xFF303438);
        // A canvas of 32 bits is 0 in the gaps.
        blend(ground, pasted, kGap, kGap);
        return ground;
    }

private:
    static constexpr int32_t kGap = 16;
    std::vector<ImageInfo> images; // borrowed
    std::vector<RectPoint> corners;
    int32_t x = 0, y = 0, rowHeight = 0;
};

} // namespace

void showImages(Page &page, const Material &material) {
    page.room("Images", "Images put together on one canvas, and cut out of one.");
    const Picture photo = covering(material.photo, 328, 216);
    Sheet combined(2);
    addCombined(combined, photo, 0, "no gap");
    addCombined(combined, photo, 16, "a gap");
    page.show(combined,
              {"combine",
               "A landscape put together of four quarters: whole, and with gaps that show cheques.",
               "`ImageUtil_Combine`: four quarters of 24 bits a pixel. Side by side they are "
               "whole again, without a seam. Where a gap is left the result gains alpha, and is "
               "clear there (shown over cheques).",
               {"combine"}});

    const Rect part = subject(photo, 132, 108);
    Picture marked = copyOf(photo);
    outline(marked, part, kOrange, 2);
    Sheet cuts(2);
    cuts.add(std::move(marked), "the part");
    cuts.add(cutAndScaled(photo, part, -1, 216), "216 high, its width by proportion");
    cuts.add(cutAndScaled(photo, part, 328, 80), "328 by 80");
    cuts.add(cutAndScaled(photo, part, -1, -1), "its own size");
    page.show(cuts,
              {"crop-and-scale",
               "A landscape with a part framed, and that part enlarged, stretched, and in its own "
               "size.",
               "`ImageUtil_CropAndScaleImage`: one part of the picture in several sizes.",
               {"cropAndScale"}});
}

void showFiles(Page &page, const Material &material) {
    page.room("Files", "The picture as plain files: thumbnails, a crop, a part enlarged, and a "
                       "sheet of them, from `ImageUtil_WriteImage`.");
    const Picture &photo = material.photo;
    std::vector<Picture> thumbnails;
    for (const int32_t side : {480, 240, 120, 60}) {
        thumbnails.push_back(thumbnail(photo, side));
        const std::string name = "thumbnail-" + std::to_string(side);
        page.link(thumbnails.back(), name + ".png");
        page.link(thumbnails.back(), name + ".bmp");
    }
    const Picture crop = partOf(photo, subject(photo, 480, 320));
    page.link(crop, "crop.png");

    const Picture detail = partOf(photo, subject(photo, 120, 80));
    const Picture nearest = zoomed(detail, 4);
    const Picture filtered = resized(detail, nearest.width(), nearest.height());
    page.link(nearest, "enlarged-nearest.png");
    page.link(filtered, "enlarged-filtered.png");

    ContactSheet sheet;
    sheet.add(thumbnails[0]);
    sheet.add(crop);
    sheet.newRow();
    for (size_t i = 1; i < thumbnails.size(); ++i)
        sheet.add(thumbnails[i]);
    sheet.newRow();
    sheet.add(nearest);
    sheet.add(filtered);
    page.show(sheet.drawn(),
              {"sheet",
               "Thumbnails of four sizes, a crop, and a detail enlarged as squares and smooth, on "
               "dark grey.",
               "The sheet, from `ImageUtil_Combine`; and what wrote the files.",
               {"write"}});
}

} // namespace gallery
