// A window with a picture, to be moved about and zoomed.
#ifndef DESKTOP_VIEWER_H
#define DESKTOP_VIEWER_H

#include "window.h"

#include <memory>

namespace desktop {

class Viewer : public Window {
public:
    // The picture is opaque.
    Viewer(std::string title, const Rect &frame, std::shared_ptr<const Image> picture);

    void dragged(Point by) override;
    void wheel(Point at, int32_t steps) override;
    void selected(const Rect &area) override;
    bool hasSelection() const override { return true; }
    CursorShape cursorShape() const override { return CursorShape::kMove; }

protected:
    void layOut() override;
    void drawAll(Layers &layers) const override;

private:
    double fittingZoom() const;
    // Pixels of the content for one of the picture; the given point stays where it is.
    void zoomTo(double zoom, Point fixed);
    Rect kept(const Rect &target) const;
    void drawPart(Surface &content, const Rect &part) const;

    std::shared_ptr<const Image> picture_;
    double zoom_ = 1;
    Rect target_; // of the whole picture, in the content
};

} // namespace desktop

#endif // DESKTOP_VIEWER_H
