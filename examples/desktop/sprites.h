// Shapes with smooth edges: drawn large by fills of rows, then reduced.
#ifndef DESKTOP_SPRITES_H
#define DESKTOP_SPRITES_H

#include "theme.h"

#include <vector>

namespace desktop {

// A picture that is stretched over a rectangle: its corners stay as they are, what is
// between them is repeated.  Colours are premultiplied.
struct Sliced {
    Image image;
    int32_t corner = 0; // the size of a corner
};

// In units of a pixel of the finished picture.
struct Corner {
    double x, y;
};
using Polygon = std::vector<Corner>;

Sliced roundedBox(Color color, int32_t radius);
// The shadow of a box, kShadow wide on each side.
Sliced softShadow();
Image disc(Color color, int32_t diameter);

// A polygon in ink, in an outline of a pixel, with a shadow.
Image outlinedShape(Size size, const Polygon &polygon, Color ink, Color outline);

} // namespace desktop

#endif // DESKTOP_SPRITES_H
