// Rectangle lists: a region grows and shrinks.
#include "rooms.h"
#include "sheet.h"

namespace gallery {

namespace {

constexpr int32_t kWidth = 168, kHeight = 128;

// The entries of a list, and the rectangle that was last added or cut.
Picture drawn(const RasterRectList &list, const Rect &last, uint32_t colour) {
    Picture picture = blank(kWidth, kHeight, kPale);
    //! [regionWalk]
    for (const RasterRectListEntry &entry : list.entries) {
        if (entry.width < 1)
            break;
        const Rect part = area(entry.x, entry.y, entry.width, entry.height);
        fill(picture, part, 0xFF9CC5DC);
        outline(picture, part, kBlue);
    }
    //! [regionWalk]
    outline(picture, last, colour, 2);
    return picture;
}

std::string countOf(const RasterRectList &list) {
    int count = 0;
    for (const RasterRectListEntry &entry : list.entries)
        count += entry.width > 0;
    return std::to_string(count) + (count == 1 ? " entry, " : " entries, ");
}

// One region, and a tile for each of its steps.
class Story {
public:
    explicit Story(Sheet &sheetToFill) : sheet(sheetToFill) {}
    void add(int32_t x, int32_t y, int32_t width, int32_t height) {
        //! [regionAdd]
        const uint32_t pixels = Raster_AddRect(&list, x, y, width, height);
        //! [regionAdd]
        tell("added: ", pixels, area(x, y, width, height), kOrange);
    }
    void cut(int32_t x, int32_t y, int32_t width, int32_t height) {
        const uint32_t pixels = Raster_SubRect(&list, x, y, width, height);
        tell("cut: ", pixels, area(x, y, width, height), kInk);
    }
    // Squares without a tile of their own.
    void scatter(int32_t count) {
        Raster_ClearRectList(&list);
        for (int32_t i = 0; i < count; ++i)
            Raster_AddRect(&list, 8 + i % 5 * 32, 8 + i / 5 * 32 + i % 2 * 6, 20, 20);
    }

private:
    void tell(const char *what, uint32_t pixels, const Rect &last, uint32_t colour) {
        sheet.add(drawn(list, last, colour),
                  what + countOf(list) + "\n" + std::to_string(pixels) + " pixels");
    }

    Sheet &sheet;
    RasterRectList list = {};
};

} // namespace

void showRegions(Page &page) {
    page.room("Regions", "A list of at most 15 rectangles stands for a set of pixels.");
    Sheet sheet(4);
    Story story(sheet);
    story.add(16, 16, 80, 56);
    story.add(64, 44, 88, 64);
    story.add(96, 16, 40, 28);
    story.cut(36, 34, 80, 44);
    story.cut(0, 92, 168, 8);
    story.add(36, 34, 80, 44);
    story.scatter(14);
    story.add(136, 72, 20, 20);
    story.add(8, 104, 20, 20);
    page.show(sheet,
              {"regions",
               "Eight steps of a region: rectangles are added, a hole and a gap are cut, the hole "
               "is filled, squares are scattered, and the region becomes one box.",
               "`Raster_AddRect` and `Raster_SubRect`. Each entry is outlined in blue, the "
               "rectangle just added in orange, the one just cut in black. Entries never overlap, "
               "and those that could be one are one. The last step would take a sixteenth entry, "
               "so the region becomes the box around it.",
               {"regionAdd", "regionWalk"}});
}

} // namespace gallery
