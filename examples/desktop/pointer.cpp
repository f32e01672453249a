// What the pointer does on the desktop.
#include "desktop.h"
#include "viewer.h"

namespace desktop {

namespace {

constexpr int32_t kBandWidth = 2;

// The rectangle between two points.
Rect spanned(Point a, Point b) {
    return Rect::fromEdges(std::min(a.x, b.x), std::min(a.y, b.y), std::max(a.x, b.x) + 1,
                           std::max(a.y, b.y) + 1);
}

} // namespace

Desktop::Hit Desktop::hitAt(Point point) const {
    constexpr int32_t kOutside = 6, kCorner = 16;
    Hit hit;
    if (point.y < kBarHeight) {
        hit.part = Part::kBar;
        return hit;
    }
    for (hit.window = windows_.size(); hit.window-- > 0;) {
        const Window &window = *windows_[hit.window];
        const Rect &frame = window.frame();
        if (!frame.grown(kOutside).contains(point))
            continue;
        if (!frame.grown(-1).contains(point)) {
            hit.part = Part::kEdge;
            const bool isAtSide = point.x <= frame.left || point.x >= frame.right - 1;
            const int32_t nearX = isAtSide ? 1 : kCorner, nearY = isAtSide ? kCorner : 1;
            hit.left = point.x < frame.left + nearX;
            hit.right = point.x >= frame.right - nearX;
            hit.top = point.y < frame.top + nearY;
            hit.bottom = point.y >= frame.bottom - nearY;
        } else if (window.closeButton().contains(point)) {
            hit.part = Part::kClose;
        } else if (window.maximizeButton().contains(point)) {
            hit.part = Part::kMaximize;
        } else {
            hit.part = window.contentRect().contains(point) ? Part::kContent : Part::kTitle;
        }
        return hit;
    }
    return {};
}

CursorShape Desktop::shapeAt(const Hit &hit) const {
    if (drag_ == Drag::kSelectScreen || drag_ == Drag::kSelectContent)
        return CursorShape::kCross;
    if (drag_ == Drag::kMove)
        return CursorShape::kMove;
    if (hit.part == Part::kContent)
        return windows_[hit.window]->cursorShape();
    if (hit.part != Part::kEdge)
        return CursorShape::kArrow;
    if (hit.left || hit.right) {
        if (!hit.top && !hit.bottom)
            return CursorShape::kResizeColumns;
        return hit.left == hit.top ? CursorShape::kResizeFalling : CursorShape::kResizeRising;
    }
    return CursorShape::kResizeRows;
}

void Desktop::updateShape() {
    const CursorShape shape = shapeAt(drag_ == Drag::kNone ? hitAt(pointer_) : dragged_);
    if (shape == shape_)
        return;
    damage(cursorRect());
    shape_ = shape;
    damage(cursorRect());
}

void Desktop::movePointer(Point to) {
    to = {std::clamp(to.x, 0, screen_.width() - 1), std::clamp(to.y, 0, screen_.height() - 1)};
    if (to == pointer_)
        return;
    damage(cursorRect());
    const Point from = std::exchange(pointer_, to);
    damage(cursorRect());
    if (drag_ != Drag::kNone)
        continueDrag(from);
    updateShape();
}

void Desktop::press(Button button) {
    if (drag_ != Drag::kNone)
        return;
    Hit hit = hitAt(pointer_);
    if (hit.part == Part::kBar) {
        for (const Launcher &launcher : launchers_)
            if (launcher.rect.contains(pointer_)) {
                (this->*launcher.open)();
                break;
            }
    } else if (hit.part == Part::kClose) {
        close(hit.window);
    } else {
        if (hit.part != Part::kScreen) {
            raise(hit.window);
            hit.window = windows_.size() - 1;
        }
        if (hit.part == Part::kMaximize)
            toggleMaximized(active());
        else
            startDrag(button, hit);
    }
    updateShape();
}

void Desktop::startDrag(Button button, const Hit &hit) {
    dragged_ = hit;
    dragStart_ = pointer_;
    if (hit.part == Part::kScreen) {
        drag_ = Drag::kSelectScreen;
        return;
    }
    dragFrame_ = active().frame();
    if (hit.part == Part::kContent)
        drag_ = button == Button::kRight && active().hasSelection() ? Drag::kSelectContent
                                                                    : Drag::kContent;
    else
        drag_ = hit.part == Part::kTitle ? Drag::kMove : Drag::kResize;
}

Rect Desktop::draggedFrame() const {
    const Point by = pointer_ - dragStart_;
    if (drag_ == Drag::kMove)
        return dragFrame_.translated(by);
    Rect frame = dragFrame_;
    if (dragged_.left)
        frame.left = std::min(frame.left + by.x, frame.right - 1);
    if (dragged_.top)
        frame.top = std::min(frame.top + by.y, frame.bottom - 1);
    if (dragged_.right)
        frame.right = std::max(frame.right + by.x, frame.left + 1);
    if (dragged_.bottom)
        frame.bottom = std::max(frame.bottom + by.y, frame.top + 1);
    return frame;
}

void Desktop::continueDrag(Point from) {
    switch (drag_) {
    case Drag::kMove:
        if (movesOutlines_)
            setBand(draggedFrame());
        else
            placeWindow(active(), draggedFrame());
        break;
    case Drag::kResize:
        setBand(draggedFrame());
        break;
    case Drag::kContent:
        active().dragged(pointer_ - from);
        break;
    case Drag::kSelectScreen:
        setBand(spanned(dragStart_, pointer_));
        break;
    case Drag::kSelectContent:
        setBand(spanned(dragStart_, pointer_).intersected(active().contentRect()));
        break;
    case Drag::kNone:
        break;
    }
}

void Desktop::release(Button /*button*/) {
    finishDrag();
    updateShape();
}

void Desktop::finishDrag() {
    const Drag drag = std::exchange(drag_, Drag::kNone);
    const Rect band = band_;
    setBand({});
    constexpr int32_t kSmallest = 8;
    const bool isArea = band.width() >= kSmallest && band.height() >= kSmallest;
    if ((drag == Drag::kMove || drag == Drag::kResize) && !band.isEmpty())
        placeWindow(active(), band);
    else if (drag == Drag::kSelectScreen && isArea)
        openSelection(band);
    else if (drag == Drag::kSelectContent && isArea)
        active().selected(band.translated(-active().contentRect().corner()));
}

// Inverts the screen along the edges; what is inside stays as it is.
void Desktop::setBand(const Rect &band) {
    for (const Rect &old : {std::exchange(band_, band), band_})
        for (const Rect &edge : Canvas::edges(old, kBandWidth))
            damage(edge);
}

// Shows a part of the screen as a picture.
void Desktop::openSelection(const Rect &area) {
    std::optional<Image> part = Image::copyOf(redrawn().part(area));
    if (!part || part->isEmpty())
        return;
    const Rect frame =
        freshFrame({std::max(2 * area.width(), 260), std::max(2 * area.height(), 180)});
    open(std::make_unique<Viewer>("A part of the screen", frame,
                                  std::make_shared<const Image>(std::move(*part))));
}

void Desktop::wheel(int32_t steps) {
    const Hit hit = hitAt(pointer_);
    if (hit.part == Part::kContent && drag_ == Drag::kNone)
        windows_[hit.window]->wheel(pointer_ - windows_[hit.window]->contentRect().corner(), steps);
}

} // namespace desktop
