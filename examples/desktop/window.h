// A window: a frame, and what it shows.
#ifndef DESKTOP_WINDOW_H
#define DESKTOP_WINDOW_H

#include "canvas.h"

#include <string>
#include <utility>

namespace desktop {

enum class CursorShape : uint8_t {
    kArrow,
    kMove,
    kResizeColumns,
    kResizeRows,
    kResizeFalling, // from the top left to the bottom right
    kResizeRising,
    kText,
    kCross
};

// The pixels of a window's content.
struct Layers {
    Image content;
    Image overlay;       // shown where the content has the key colour, if not empty
    Point overlayCorner; // in the content
};

inline constexpr Color kKey = 0xFF0A0B0D; // a black that nobody misses

class Window {
public:
    Window(std::string title, const Rect &frame) : title_(std::move(title)), frame_(frame) {}
    virtual ~Window() = default;
    Window(const Window &) = delete;
    Window &operator=(const Window &) = delete;

    const std::string &title() const { return title_; }
    const Rect &frame() const { return frame_; }
    Rect contentRect() const {
        return Rect::fromEdges(frame_.left + kBorder, frame_.top + kTitleHeight,
                               frame_.right - kBorder, frame_.bottom - kBorder);
    }
    // All that is painted for it, with its shadow.
    Rect extent() const { return frame_.grown(kShadow).translated({0, kShadow / 4}); }
    // Where nothing shines through.
    Rect opaqueRect() const {
        return Rect::fromEdges(frame_.left, frame_.top + kRadius, frame_.right, frame_.bottom);
    }
    Rect closeButton() const { return button(0); }
    Rect maximizeButton() const { return button(1); }

    // Lays the content out anew where the size has changed.
    void place(const Rect &frame);
    // The frame before it was maximised, if it is.
    std::optional<Rect> restored;

    // Input, in coordinates of the content.
    virtual void dragged(Point /*by*/) {}
    virtual void wheel(Point /*at*/, int32_t /*steps*/) {}
    virtual void typed(char /*character*/) {}
    virtual void selected(const Rect & /*area*/) {}
    virtual void videoChanged() {}
    // Whether selected() is of use.
    virtual bool hasSelection() const { return false; }
    virtual CursorShape cursorShape() const { return CursorShape::kArrow; }

    // All of the content, drawn anew.
    Layers redrawn() const;
    const Layers &layers() const { return layers_; }
    // What has changed of the content since the last call, in its coordinates.
    Region takeDamage() { return std::exchange(damage_, Region()); }

protected:
    virtual void layOut() {}
    virtual void drawAll(Layers &layers) const = 0;

    Rect contentBounds() const { return {{0, 0}, contentRect().size()}; }
    void redraw();
    void damage(const Rect &rect) { damage_.add(rect.intersected(contentBounds())); }

    Layers layers_; // brought up to date by each change

private:
    Rect button(int32_t fromRight) const;

    std::string title_;
    Rect frame_;
    Region damage_;
};

// The pictures that frames are made of.
class Decoration {
public:
    void paint(Canvas &canvas, const Window &window, const Layers &layers, bool isActive) const;

private:
    Sliced shadow_ = softShadow();
    Sliced title_ = roundedBox(kFrame, kRadius), fadedTitle_ = roundedBox(kFadedFrame, kRadius);
    Image close_ = disc(kRed, 14), maximize_ = disc(kGreen, 14), faded_ = disc(0xFF4A5263, 14);
};

} // namespace desktop

#endif // DESKTOP_WINDOW_H
