// Rectangles: what they share, where they go, and how one follows another.
#include "rooms.h"

namespace gallery {

namespace {

constexpr int32_t kWidth = 168, kHeight = 128;
constexpr uint32_t kSky = 0xFF9CC5DC;

Picture tile() {
    return blank(kWidth, kHeight, kPale);
}

// A result, filled, and what it came of, in outlines.
Picture drawn(const Rect &result, const Rect &a, const Rect &b) {
    Picture picture = tile();
    fill(picture, result, kSky);
    outline(picture, a, kBlue);
    outline(picture, b, kOrange, 2);
    return picture;
}

void dot(Picture &picture, const RectPoint &point) {
    fill(picture, area(point.x - 2, point.y - 2, 5, 5), kInk);
}

// Every pixel by its distance from a rectangle, in bands of 8.
Picture distances(const Rect &rect) {
    Picture picture = tile();
    for (int32_t y = 0; y < kHeight; ++y)
        for (int32_t x = 0; x < kWidth; ++x) {
            //! [rectPoint]
            const RectPoint point = {x, y};
            const int32_t distance = Rect_PointDistance(&rect, &point);
            const bool isInside = Rect_ContainsPoint(&rect, &point); // distance <= 0
            //! [rectPoint]
            const auto shade = static_cast<uint32_t>(distance < 0 ? -distance : distance) / 8;
            const uint32_t step = isInside ? 0x00040A14 : 0x00181006; // to be taken off
            fill(picture, area(x, y, 1, 1), (isInside ? 0xFFFFD8A8U : 0xFFE4E9EEU) - shade * step);
        }
    return picture;
}

void showSets(Page &page) {
    const Rect a = area(16, 16, 92, 64), b = area(60, 44, 92, 68);
    //! [rectSets]
    Rect shared, around = a, moved;
    Rect_Intersect(&shared, &a, &b); // true, as there is something
    Rect_Union(&around, &b);
    const RectPoint delta = {44, 32};
    Rect_Translate(&moved, &a, &delta); // true, as no coordinate had to be clamped
    //! [rectSets]
    Sheet sheet(4);
    sheet.add(drawn(shared, a, b), "Rect_Intersect");
    sheet.add(drawn(around, a, b), "Rect_Union");
    sheet.add(drawn(moved, a, moved), "Rect_Translate");
    sheet.add(distances(area(44, 34, 80, 60)), "Rect_PointDistance");
    page.show(sheet,
              {"rectangles-two",
               "Two overlapping rectangles, with what they share filled, then the box around them; "
               "a rectangle and where it has moved; bands of distance inside and around one.",
               "Two rectangles: what they share, and the box around both. One that moves. And "
               "every pixel by its distance from a rectangle, orange where "
               "`Rect_ContainsPoint` says that it is inside.",
               {"rectSets", "rectPoint"}});
}

// Which part of a source is seen in a clip, and where that goes in a target.
void showMapping(Page &page) {
    //! [rect]
    const Rect source = area(20, 20, 96, 72), clip = area(72, 48, 80, 64);
    const Rect target = area(24, 12, 120, 104);
    Rect seen, goes;
    Rect_IntersectPair(&seen, &source, &clip, &goes, &target);
    // A point of it, the pointer of a mouse, say.
    const RectPoint point = {100, 60};
    RectPoint there;
    Rect_ScalePoint(&source, &target, &point, &there);
    //! [rect]
    Picture left = drawn(seen, source, clip), right = tile();
    dot(left, point);
    fill(right, goes, kSky);
    outline(right, target, kBlue);
    dot(right, there);
    Sheet sheet(2);
    sheet.add(std::move(left), "source, cut by a clip");
    sheet.add(std::move(right), "the same in target");
    page.show(sheet,
              {"rectangles",
               "A source partly covered by a clip, with their common part filled and a point in "
               "it; and a larger target with the same part and point.",
               "`Rect_IntersectPair`: as much of the source (blue) as the clip (orange) leaves, "
               "and where it lies in the target. `Rect_ScalePoint`: where a point of it goes.",
               {"rect"}});
}

// What has changed on a desktop, as each of two screens side by side has to be told.
void showScreens(Page &page) {
    const Rect screens[] = {area(4, 4, 80, 120), area(84, 4, 80, 120)};
    const Rect damage = area(52, 44, 72, 48);
    Picture whole = tile();
    fill(whole, damage, kSky);
    outline(whole, screens[0], kBlue);
    outline(whole, screens[1], kBlue);
    outline(whole, damage, kOrange, 2);
    Sheet sheet(3);
    sheet.add(std::move(whole), "two screens, damage");
    for (const Rect &screen : screens) {
        //! [rectMap]
        Rect local, onDesktop;
        if (!Rect_MapRect(&screen, &damage, &local, &onDesktop))
            continue; // nothing of it on this screen
        //! [rectMap]
        Picture picture = blank(80, 120, kPale);
        fill(picture, local, kSky);
        outline(picture, picture.bounds(), kBlue);
        sheet.add(std::move(picture),
                  "x " + std::to_string(local.left) + " to " + std::to_string(local.right) +
                      "\ny " + std::to_string(local.top) + " to " + std::to_string(local.bottom));
    }
    page.show(sheet,
              {"rectangles-screens",
               "A rectangle over the border of two screens, and the part of it on each.",
               "`Rect_MapRect`: what has changed on a desktop, in the coordinates of each of its "
               "screens.",
               {"rectMap"}});
}

Picture window(const Rect &frame, const Rect &content, const Rect &bar) {
    Picture picture = tile();
    fill(picture, frame, kWhite);
    fill(picture, content, kSky);
    fill(picture, bar, kOrange);
    outline(picture, frame, kInk);
    return picture;
}

void showResizing(Page &page) {
    const Rect before = area(12, 12, 80, 64), after = area(12, 12, 144, 104);
    const Rect content = area(18, 36, 68, 34), bar = area(12, 12, 40, 10);
    //! [rectDiff]
    Rect contentAfter, barAfter;
    Rect_ApplyDiff(&contentAfter, &after, &before, &content); // keeps its margins
    Rect_ApplyDiffEx(&barAfter, &bar, &before, &after);       // stays half as wide as the window
    //! [rectDiff]
    Sheet sheet(2);
    sheet.add(window(before, content, bar), "a window");
    sheet.add(window(after, contentAfter, barAfter), "a larger one");
    page.show(sheet,
              {"rectangles-resizing",
               "A window with a blue field and an orange bar, small and large: the margins of the "
               "field are the same, the bar has half the width of either.",
               "A window has been resized. Its content follows by `Rect_ApplyDiff`, which adds "
               "the change of each edge, and its bar by `Rect_ApplyDiffEx`, in proportion to its "
               "size.",
               {"rectDiff"}});
}

} // namespace

void showRects(Page &page) {
    page.room("Rectangles", "Intersected, united, moved and mapped, with coordinates that saturate "
                            "instead of wrapping.");
    showSets(page);
    showMapping(page);
    showScreens(page);
    showResizing(page);
}

} // namespace gallery
