// How the desktop is painted.
#include "desktop.h"

#include <cmath>

namespace desktop {

namespace {

// Spots of colour that run into each other, drawn small and enlarged.
Image gradient(Size size) {
    struct Spot {
        double x, y; // in a square of side 1
        double red, green, blue;
    };
    constexpr std::array<Spot, 7> kSpots = {{{0.05, 0.10, 26, 42, 88},
                                             {0.50, 0.00, 70, 58, 130},
                                             {0.95, 0.15, 150, 84, 140},
                                             {0.10, 0.95, 32, 128, 132},
                                             {0.45, 0.60, 84, 92, 160},
                                             {0.72, 0.92, 214, 128, 134},
                                             {1.00, 0.75, 246, 172, 122}}};
    constexpr int32_t kReduction = 8;
    constexpr double kSharpness = 9;
    Image small = created({size.width / kReduction + 1, size.height / kReduction + 1});
    for (int32_t y = 0; y < small.height(); ++y)
        for (int32_t x = 0; x < small.width(); ++x) {
            double weights = 0, red = 0, green = 0, blue = 0;
            for (const Spot &spot : kSpots) {
                const double dx = (x + 0.5) / small.width() - spot.x;
                const double dy = (y + 0.5) / small.height() - spot.y;
                const double weight = std::exp(-kSharpness * (dx * dx + dy * dy));
                weights += weight;
                red += weight * spot.red;
                green += weight * spot.green;
                blue += weight * spot.blue;
            }
            small.fill({x, y, 1, 1},
                       {static_cast<uint8_t>(red / weights), static_cast<uint8_t>(green / weights),
                        static_cast<uint8_t>(blue / weights)});
        }
    return resized(small, size);
}

// The smallest rectangle of the proportions of a picture that covers the screen.
Rect covering(Size screen, Size picture) {
    const double zoom = std::max(double{1} * screen.width / picture.width,
                                 double{1} * screen.height / picture.height);
    const Size size = {std::max(screen.width, static_cast<int32_t>(picture.width * zoom)),
                       std::max(screen.height, static_cast<int32_t>(picture.height * zoom))};
    return {{(screen.width - size.width) / 2, (screen.height - size.height) / 2}, size};
}

} // namespace

void Desktop::drawWallpaper() {
    const Image *const picture = settings_.wallpaper.get();
    wallpaper_ = picture != nullptr ? created(screen_.size()) : gradient(screen_.size());
    if (picture != nullptr &&
        !wallpaper_.copyScaled(covering(screen_.size(), picture->size()), *picture))
        wallpaper_.fill(kEdgeColor);
    wallpaper_.fillAlpha(wallpaper_.bounds(), 255); // which scaling leaves a little lower
}

Region Desktop::paint() {
    for (size_t i = 0; i < windows_.size(); ++i)
        damageContent(i);
    Region painted = damage_;
    // Marks are painted over what has changed, and stay until something else does.
    if (!showsDamage_ || !damage_.isEmpty()) {
        painted.add(marked_);
        marked_ = showsDamage_ ? damage_ : Region();
    }
    for (const Rect part : painted)
        paintAll(Canvas(screen_, part), false);
    damage_.clear();
    return painted;
}

// What has changed of a window's content, but for what the windows above it hide.
void Desktop::damageContent(size_t index) {
    const Point corner = windows_[index]->contentRect().corner();
    Region visible;
    for (const Rect part : windows_[index]->takeDamage())
        visible.add(part.translated(corner));
    for (size_t i = index + 1; i < windows_.size(); ++i)
        if (!visible.subtract(windows_[i]->opaqueRect()))
            break; // too many pieces: some more is painted than need be
    for (const Rect part : visible)
        damage(part);
}

Image Desktop::redrawn() const {
    Image image = created(screen_.size());
    image.fill(0xFF000000);
    paintAll(Canvas(image, image.bounds()), true);
    return image;
}

// The highest window that hides all below it, or the number of windows.
size_t Desktop::lowestVisible(const Rect &rect) const {
    for (size_t i = windows_.size(); i-- > 0;)
        if (windows_[i]->opaqueRect().contains(rect))
            return i;
    return windows_.size();
}

void Desktop::paintAll(Canvas canvas, bool isAnew) const {
    size_t first = lowestVisible(canvas.clip());
    if (first == windows_.size()) {
        canvas.copy({0, 0}, wallpaper_);
        first = 0;
    }
    for (size_t i = first; i < windows_.size(); ++i) {
        const Window &window = *windows_[i];
        if (!window.extent().intersects(canvas.clip()))
            continue;
        const bool isActive = i + 1 == windows_.size();
        if (isAnew)
            decoration_.paint(canvas, window, window.redrawn(), isActive);
        else
            decoration_.paint(canvas, window, window.layers(), isActive);
    }
    paintBar(canvas);
    if (showsTimes_)
        paintTimes(canvas);
    if (showsHelp_)
        paintHelp(canvas);
    canvas.invertFrame(band_, 2);
    paintMarks(canvas);
    canvas.draw(pointer_, cursors_[shape_]);
}

void Desktop::paintBar(Canvas &canvas) const {
    // Its round corners are beyond the edges of the screen.
    canvas.blend(Rect::fromEdges(-kRadius, -kRadius, screen_.width() + kRadius, kBarHeight),
                 panel_);
    const int32_t y = (kBarHeight - kGlyphHeight) / 2 + 1;
    canvas.text({14, y}, "libquillon", kInk);
    canvas.text({15, y}, "libquillon", kInk); // bold
    for (const Launcher &launcher : launchers_)
        canvas.text({launcher.rect.left + 10, y}, launcher.label, kInk);
    constexpr std::string_view kHint = "F1 keys";
    canvas.text({screen_.width() - textWidth(kHint) - 14, y}, kHint, kFadedInk);
}

Rect Desktop::helpRect() const {
    const Size size = {320, 2 * 14 + kLineHeight * static_cast<int32_t>(kKeys.size() + 5)};
    return {{(screen_.width() - size.width) / 2, (screen_.height() - size.height) / 2}, size};
}

void Desktop::paintHelp(Canvas &canvas) const {
    canvas.blend(helpRect(), panel_);
    Point at = helpRect().corner() + Point(18, 14);
    const auto line = [&](std::string_view key, std::string_view meaning) {
        canvas.text(at, key, kAccent);
        canvas.text(at + Point(88, 0), meaning, kInk);
        at.y += kLineHeight;
    };
    for (size_t i = 0; i < kKeys.size(); ++i)
        line(std::string("F") + std::to_string(i + 1), kKeys[i]);
    at.y += kLineHeight / 2;
    line("wheel", "zooms, scrolls");
    line("drag", "moves, resizes; on the");
    line("", "wallpaper takes a picture");
    line("right", "drag zooms to an area");
}

Rect Desktop::timesRect() const {
    size_t columns = 0;
    for (const std::string &line : times_)
        columns = std::max(columns, line.size());
    const Size size = {static_cast<int32_t>(columns) * kGlyphWidth + 24,
                       static_cast<int32_t>(times_.size()) * kLineHeight + 16};
    if (times_.empty())
        return {};
    return {{screen_.width() - size.width - 12, screen_.height() - size.height - 12}, size};
}

void Desktop::paintTimes(Canvas &canvas) const {
    const Rect rect = timesRect();
    if (rect.isEmpty())
        return;
    canvas.blend(rect, panel_);
    Point at = rect.corner() + Point(12, 10);
    for (const std::string &line : times_) {
        canvas.text(at, line, kInk);
        at.y += kLineHeight;
    }
}

void Desktop::paintMarks(Canvas &canvas) const {
    for (const Rect part : marked_) {
        canvas.blend(part, mark_);
        canvas.frame(part, 1, kRed);
    }
}

} // namespace desktop
