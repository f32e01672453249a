// The desktop's windows and keys.
#include "desktop.h"

#include "terminal.h"
#include "videoWindow.h"
#include "viewer.h"

namespace desktop {

namespace {

constexpr size_t kMaxWindows = 10;
constexpr Size kSmallestWindow = {140, 90};

} // namespace

Desktop::Desktop(Settings settings) : settings_(std::move(settings)) {
    int32_t next = 170;
    const auto launcher = [&](std::string_view label, Launch launch) {
        launchers_.push_back({label, launch, {next, 3, textWidth(label) + 20, kBarHeight - 6}});
        next = launchers_.back().rect.right + 6;
    };
    launcher("Terminal", &Desktop::openTerminal);
    launcher("Picture", &Desktop::openViewer);
    launcher("Video", &Desktop::openVideo);
    resize(settings_.size);
    pointer_ = {screen_.width() / 2, screen_.height() / 2};
    openViewer();
    openVideo();
    openTerminal();
    // Side by side, as far as there is room.
    const Rect room = Rect::fromEdges(0, kBarHeight, screen_.width(), screen_.height());
    const auto place = [&](int32_t x, int32_t y, int32_t width, int32_t height) {
        return Rect(room.width() * x / 100, room.top + room.height() * y / 100,
                    room.width() * width / 100, room.height() * height / 100);
    };
    Rect film = place(57, 51, 0, 43);
    film.right = film.left + (film.height() - kTitleHeight) * 16 / 9; // its proportions
    const std::array<Rect, 3> places = {place(53, 6, 41, 50), film, place(3, 10, 47, 64)};
    for (size_t i = 0; i < places.size(); ++i)
        placeWindow(*windows_[i], places[i]);
    updateShape();
}

// ---- Windows --------------------------------------------------------------

void Desktop::openTerminal() {
    auto terminal = std::make_unique<Terminal>(freshFrame({520, 340}));
    terminal->type("about\ncolors\n");
    open(std::move(terminal));
}

void Desktop::openViewer() {
    open(std::make_unique<Viewer>("Picture", freshFrame({460, 330}), settings_.picture));
}

void Desktop::openVideo() {
    open(std::make_unique<VideoWindow>(freshFrame({400, 256}), settings_.video));
}

void Desktop::open(std::unique_ptr<Window> window) {
    if (windows_.size() >= kMaxWindows)
        close(0);
    ++opened_;
    windows_.push_back(std::move(window));
    raise(windows_.size() - 1);
}

// Each a little further down to the right.
Rect Desktop::freshFrame(Size size) const {
    const auto step = static_cast<int32_t>(opened_ % 8) * 28;
    return {{60 + step, kBarHeight + 30 + step}, size};
}

void Desktop::raise(size_t index) {
    // The one that was on top looks different from now on.
    damage(active().frame());
    std::rotate(windows_.begin() + static_cast<std::ptrdiff_t>(index),
                windows_.begin() + static_cast<std::ptrdiff_t>(index) + 1, windows_.end());
    damage(active().extent());
    if (windows_.size() > 1)
        damage(windows_[windows_.size() - 2]->frame());
}

void Desktop::close(size_t index) {
    damage(windows_[index]->extent());
    windows_.erase(windows_.begin() + static_cast<std::ptrdiff_t>(index));
    if (!windows_.empty())
        damage(active().frame());
}

void Desktop::placeWindow(Window &window, const Rect &frame) {
    damage(window.extent());
    // Some of the title stays on the screen, where it can be grasped.
    constexpr int32_t kKept = 60;
    const Size size = {std::max(frame.width(), kSmallestWindow.width),
                       std::max(frame.height(), kSmallestWindow.height)};
    const int32_t left =
        std::max(std::min(frame.left, screen_.width() - kKept), kKept - size.width);
    const int32_t top = std::max(std::min(frame.top, screen_.height() - kTitleHeight), kBarHeight);
    window.place({{left, top}, size});
    damage(window.extent());
}

void Desktop::toggleMaximized(Window &window) {
    const Rect all = Rect::fromEdges(0, kBarHeight, screen_.width(), screen_.height());
    if (window.restored) {
        placeWindow(window, *std::exchange(window.restored, std::nullopt));
    } else {
        window.restored = window.frame();
        placeWindow(window, all);
    }
}

// ---- Input ----------------------------------------------------------------

void Desktop::typed(char character) {
    if (!windows_.empty())
        active().typed(character);
}

void Desktop::functionKey(int32_t number) {
    if (drag_ != Drag::kNone)
        return;
    switch (number) {
    case 1:
        showsHelp_ = !showsHelp_;
        damage(helpRect());
        break;
    case 2:
        showsDamage_ = !showsDamage_;
        break;
    case 3:
        showsTimes_ = !showsTimes_;
        damage(timesRect());
        break;
    case 4:
        movesOutlines_ = !movesOutlines_;
        break;
    case 5:
        isPaused_ = !isPaused_;
        break;
    case 6:
        damage(cursorRect());
        cursors_.nextSize();
        damage(cursorRect());
        break;
    case 7:
        if (windows_.size() > 1)
            raise(0);
        break;
    default:
        return;
    }
    updateShape();
}

void Desktop::resize(Size size) {
    finishDrag();
    screen_ = created({std::max(size.width, 64), std::max(size.height, 64)});
    screen_.fill(0xFF000000);
    marked_.clear();
    drawWallpaper();
    for (const auto &window : windows_)
        placeWindow(*window, window->frame());
    pointer_ = {std::min(pointer_.x, screen_.width() - 1),
                std::min(pointer_.y, screen_.height() - 1)};
    damage_ = Region(screen_.bounds());
    updateShape();
}

void Desktop::advance(double seconds) {
    if (isPaused_ || !settings_.video->advance(seconds))
        return;
    for (const auto &window : windows_)
        window->videoChanged();
}

void Desktop::setTimes(std::vector<std::string> lines) {
    if (showsTimes_)
        damage(timesRect());
    times_ = std::move(lines);
    if (showsTimes_)
        damage(timesRect());
}

} // namespace desktop
