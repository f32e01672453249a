// A part of the screen that is painted anew, in the coordinates of the screen.
#ifndef DESKTOP_CANVAS_H
#define DESKTOP_CANVAS_H

#include "sprites.h"

namespace desktop {

class Canvas {
public:
    // The clip lies on the screen.
    Canvas(Surface screen, const Rect &clip) : part_(screen.part(clip)), clip_(clip) {}

    const Rect &clip() const { return clip_; }

    void fill(const Rect &rect, Color color) { part_.fill(onPart(rect), color); }
    // The edges of a rectangle, just inside of it.
    void frame(const Rect &rect, int32_t thickness, Color color) {
        for (const Rect &edge : edges(rect, thickness))
            fill(edge, color);
    }
    // The same in other colours than those there; done again, those come back.
    void invertFrame(const Rect &rect, int32_t thickness) {
        for (const Rect &edge : edges(rect, thickness))
            part_.combine(onPart(edge), kInversion, quillon::Rop::kXor);
    }
    void copy(Point to, const ConstSurface &source) { part_.copy(onPart(to), source); }
    void blend(Point to, const ConstSurface &source) { part_.blend(onPart(to), source); }
    // Stretches a picture over a rectangle; what lies all in the hole may be left out.
    void blend(const Rect &rect, const Sliced &sliced, const Rect &hole = {});
    void text(Point to, std::string_view line, Color color) {
        part_.text(onPart(to), kFont, line, color);
    }
    // Replaces the key colour on the canvas by an overlay.
    void copyKeyed(Point to, const ConstSurface &overlay, Color key) {
        part_.copyKeyed(onPart(to), overlay, part_, key, part_);
    }
    void draw(Point at, const quillon::Cursor &cursor) { part_.draw(onPart(at), cursor); }

    // The edges of a rectangle as rectangles that do not overlap.
    static std::array<Rect, 4> edges(const Rect &rect, int32_t thickness);

private:
    Point onPart(Point point) const { return point - clip_.corner(); }
    Rect onPart(const Rect &rect) const { return rect.translated(-clip_.corner()); }

    Surface part_;
    Rect clip_;
};

} // namespace desktop

#endif // DESKTOP_CANVAS_H
