// How the desktop is painted.
#include "desktop.h"

namespace desktop {

namespace {

// A few colours, doubled until they are as large as the screen: smoother than one
// enlargement.
Image gradient(Size size) {
    constexpr int32_t kColumns = 5, kRows = 4;
    constexpr Color kColors[kRows][kColumns] = {
        {0xFF1B2A4F, 0xFF2C3568, 0xFF4A3B78, 0xFF6B4480, 0xFF8A4F80},
        {0xFF1F4568, 0xFF3A4A80, 0xFF6E5090, 0xFFB0618C, 0xFFDE8180},
        {0xFF1E6E7E, 0xFF3F6A92, 0xFF7C689E, 0xFFD07C8C, 0xFFF2A97C},
        {0xFF2C8C86, 0xFF3C7F98, 0xFF6674A2, 0xFFB07F98, 0xFFEDB48A}};
    Image colors = created({kColumns, kRows});
    for (int32_t row = 0; row < kRows; ++row)
        for (int32_t column = 0; column < kColumns; ++column)
            colors.fill({column, row, 1, 1}, kColors[row][column]);
    while (2 * colors.width() < size.width && 2 * colors.height() < size.height)
        colors = resized(colors, {2 * colors.width(), 2 * colors.height()});
    return resized(colors, size);
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
    for (const auto &window : windows_) {
        const Rect content = window->contentRect();
        for (const Rect part : window->takeDamage())
            damage(part.translated(content.corner()));
    }
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
