#include "window.h"

namespace desktop {

void Window::place(const Rect &frame) {
    const bool isResized = frame.size() != frame_.size() || layers_.content.isEmpty();
    frame_ = frame;
    if (!isResized)
        return;
    layOut();
    redraw();
}

void Window::redraw() {
    layers_ = redrawn();
    damage(contentBounds());
}

Layers Window::redrawn() const {
    Layers layers;
    layers.content = created(contentRect().size());
    drawAll(layers);
    return layers;
}

Rect Window::button(int32_t fromRight) const {
    constexpr int32_t kSide = 14, kPitch = 22;
    return {frame_.right - kPitch * (fromRight + 1) - 2, frame_.top + (kTitleHeight - kSide) / 2,
            kSide, kSide};
}

void Decoration::paint(Canvas &canvas, const Window &window, const Layers &layers,
                       bool isActive) const {
    const Rect frame = window.frame(), content = window.contentRect();
    canvas.blend(window.extent(), shadow_, window.opaqueRect());

    // Its round corners at the bottom are hidden by the content.
    canvas.blend({frame.left, frame.top, frame.width(), kTitleHeight + kRadius},
                 isActive ? title_ : fadedTitle_);
    canvas.fill(Rect::fromEdges(frame.left, content.top - kBorder, frame.right, frame.bottom),
                kEdgeColor);
    canvas.blend(window.closeButton().corner(), isActive ? close_ : faded_);
    canvas.blend(window.maximizeButton().corner(), isActive ? maximize_ : faded_);
    const int32_t room = (window.maximizeButton().left - frame.left) / kGlyphWidth - 2;
    canvas.text({frame.left + 12, frame.top + (kTitleHeight - kGlyphHeight) / 2 + 1},
                std::string_view(window.title()).substr(0, static_cast<size_t>(std::max(room, 0))),
                isActive ? kInk : kFadedInk);

    canvas.copy(content.corner(), layers.content);
    if (!layers.overlay.isEmpty())
        canvas.copyKeyed(content.corner() + layers.overlayCorner, layers.overlay, kKey);
}

} // namespace desktop
