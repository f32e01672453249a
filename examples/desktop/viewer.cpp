#include "viewer.h"

#include <cmath>

namespace desktop {

Viewer::Viewer(std::string title, const Rect &frame, std::shared_ptr<const Image> picture)
    : Window(std::move(title), frame), picture_(std::move(picture)) {
    place(frame);
}

void Viewer::layOut() {
    zoom_ = fittingZoom();
    target_ = {};
    zoomTo(zoom_, {0, 0});
}

// As large as leaves no margin.
double Viewer::fittingZoom() const {
    const Rect content = contentBounds();
    return std::max(double{1} * content.width() / picture_->width(),
                    double{1} * content.height() / picture_->height());
}

void Viewer::zoomTo(double zoom, Point fixed) {
    constexpr double kMaxSide = 16000;
    const double limit = kMaxSide / std::max(picture_->width(), picture_->height());
    zoom_ = std::clamp(zoom, std::min(fittingZoom() / 4, limit), std::min(24.0, limit));
    const Size size = {std::max(1, static_cast<int32_t>(std::lround(picture_->width() * zoom_))),
                       std::max(1, static_cast<int32_t>(std::lround(picture_->height() * zoom_)))};
    const Rect scaled({0, 0}, size);
    const Point there = target_.isEmpty() ? Point() : target_.mapTo(scaled, fixed);
    target_ = kept(scaled.translated(fixed - there));
}

// A picture that is larger than the window fills it, a smaller one is in its middle.
Rect Viewer::kept(const Rect &target) const {
    const Rect content = contentBounds();
    const auto first = [](int32_t at, int32_t extent, int32_t room) {
        return extent < room ? (room - extent) / 2 : std::clamp(at, room - extent, 0);
    };
    return {{first(target.left, target.width(), content.width()),
             first(target.top, target.height(), content.height())},
            target.size()};
}

void Viewer::drawAll(Layers &layers) const {
    drawPart(layers.content, contentBounds());
}

void Viewer::drawPart(Surface &content, const Rect &part) const {
    constexpr double kSquares = 6; // from this zoom on single pixels are shown
    Surface to = content.part(part);
    to.fill(kBackground);
    const quillon::Filter filter =
        zoom_ < kSquares ? quillon::Filter::kSmooth : quillon::Filter::kNearest;
    if (!to.copyScaled(target_.translated(-part.corner()), *picture_, filter))
        to.text({0, 0}, kFont, "no memory", kRed);
    to.fillAlpha(to.bounds(), 255); // which scaling leaves a little lower
}

// What stays visible is moved, what appears is scaled.
void Viewer::dragged(Point by) {
    const Rect moved = kept(target_.translated(by));
    const Point offset = moved.corner() - target_.corner();
    if (offset == Point())
        return;
    target_ = moved;
    Surface content = layers_.content;
    content.copy(offset, content);
    Region exposed(contentBounds());
    if (!exposed.subtract(contentBounds().translated(offset)))
        exposed.add(contentBounds());
    for (const Rect part : exposed)
        drawPart(content, part);
    damage(contentBounds());
}

void Viewer::wheel(Point at, int32_t steps) {
    zoomTo(zoom_ * std::pow(1.25, steps), at);
    redraw();
}

// Zooms to what has been selected.
void Viewer::selected(const Rect &area) {
    const Rect content = contentBounds();
    const double factor = std::min(double{1} * content.width() / area.width(),
                                   double{1} * content.height() / area.height());
    const Point middle((area.left + area.right) / 2, (area.top + area.bottom) / 2);
    zoomTo(zoom_ * factor, middle);
    target_ =
        kept(target_.translated({content.width() / 2 - middle.x, content.height() / 2 - middle.y}));
    redraw();
}

} // namespace desktop
