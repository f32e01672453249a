// A small desktop on a surface in memory: it takes input, and paints what has changed.
// Whatever shows the surface stands outside.
#ifndef DESKTOP_DESKTOP_H
#define DESKTOP_DESKTOP_H

#include "cursors.h"
#include "frames.h"

#include <memory>
#include <string>
#include <vector>

namespace desktop {

enum class Button : uint8_t { kLeft, kRight };

struct Settings {
    Size size = {1120, 700};
    std::shared_ptr<const Image> wallpaper; // opaque; drawn by the desktop itself if null
    std::shared_ptr<const Image> picture;   // opaque; the wallpaper if null
    std::shared_ptr<FrameSource> video;
};

class Desktop {
public:
    explicit Desktop(Settings settings);

    // Input.
    void movePointer(Point to);
    void press(Button button);
    void release(Button button);
    void wheel(int32_t steps);
    void typed(char character);
    // F1 to F7, as kKeys has them.
    void functionKey(int32_t number);
    void resize(Size size);
    // Lets time pass.
    void advance(double seconds);
    // What is told in a corner, a line each.
    void setTimes(std::vector<std::string> lines);

    // Brings the screen up to date; returns what has been painted.
    Region paint();
    const Image &screen() const { return screen_; }
    // The screen as it should look, with everything drawn anew.
    Image redrawn() const;

    static constexpr std::array<std::string_view, 7> kKeys = {
        "this list", "show damage",    "show times",     "move windows as outlines",
        "pause",     "size of cursor", "the next window"};

private:
    enum class Drag : uint8_t { kNone, kMove, kResize, kContent, kSelectScreen, kSelectContent };
    enum class Part : uint8_t { kScreen, kBar, kEdge, kTitle, kClose, kMaximize, kContent };
    // What is at a point.
    struct Hit {
        Part part = Part::kScreen;
        size_t window = 0;                                             // its index
        bool left = false, top = false, right = false, bottom = false; // of the edges
    };
    using Launch = void (Desktop::*)();
    struct Launcher {
        std::string_view label;
        Launch open;
        Rect rect;
    };

    void damage(const Rect &rect) { damage_.add(rect.intersected(screen_.bounds())); }
    void damageAll() { damage(screen_.bounds()); }

    // Windows.
    void openTerminal();
    void openViewer();
    void openVideo();
    void open(std::unique_ptr<Window> window);
    Rect freshFrame(Size size) const;
    void raise(size_t index);
    void close(size_t index);
    void placeWindow(Window &window, const Rect &frame);
    void toggleMaximized(Window &window);
    Window &active() { return *windows_.back(); }

    // The pointer.
    Hit hitAt(Point point) const;
    CursorShape shapeAt(const Hit &hit) const;
    Rect cursorRect() const { return cursors_[shape_].bounds(pointer_); }
    void updateShape();
    void startDrag(Button button, const Hit &hit);
    void continueDrag(Point from);
    void finishDrag();
    Rect draggedFrame() const;
    void setBand(const Rect &band);
    void openSelection(const Rect &area);

    // Layers, from the lowest on.
    void drawWallpaper();
    void damageContent(size_t index);
    void paintAll(Canvas canvas, bool isAnew) const;
    size_t lowestVisible(const Rect &rect) const;
    void paintBar(Canvas &canvas) const;
    void paintHelp(Canvas &canvas) const;
    void paintTimes(Canvas &canvas) const;
    void paintMarks(Canvas &canvas) const;
    Rect helpRect() const;
    Rect timesRect() const;

    Settings settings_;
    Image screen_, wallpaper_;
    std::vector<std::unique_ptr<Window>> windows_; // the lowest first
    std::vector<Launcher> launchers_;
    Region damage_; // to be painted
    Region marked_; // what was painted last, if it is shown
    bool showsHelp_ = false, showsDamage_ = false, showsTimes_ = true, movesOutlines_ = false;
    bool isPaused_ = false;
    std::vector<std::string> times_;
    size_t opened_ = 0; // windows so far

    Cursors cursors_;
    CursorShape shape_ = CursorShape::kArrow;
    Point pointer_;
    Drag drag_ = Drag::kNone;
    Hit dragged_;
    Point dragStart_;
    Rect dragFrame_; // of the window when the drag began
    Rect band_;      // the rubber band, if not empty

    Decoration decoration_;
    Sliced panel_ = roundedBox(translucent(0xFF181C25, 0xD8), kRadius);
    Sliced mark_ = roundedBox(translucent(kRed, 0x48), 2);
};

} // namespace desktop

#endif // DESKTOP_DESKTOP_H
