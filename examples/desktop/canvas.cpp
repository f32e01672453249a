#include "canvas.h"

#include <vector>

namespace desktop {

std::array<Rect, 4> Canvas::edges(const Rect &rect, int32_t thickness) {
    const int32_t across = std::min(thickness, (rect.width() + 1) / 2);
    const int32_t down = std::min(thickness, (rect.height() + 1) / 2);
    const Rect top(rect.left, rect.top, rect.width(), down);
    const Rect bottom = Rect::fromEdges(rect.left, std::max(top.bottom, rect.bottom - down),
                                        rect.right, rect.bottom);
    const Rect left(rect.left, top.bottom, across, bottom.top - top.bottom);
    const Rect right = Rect::fromEdges(std::max(left.right, rect.right - across), left.top,
                                       rect.right, left.bottom);
    return {top, bottom, left, right};
}

namespace {

// Pixels of one axis: where they go, where they come from, how many.
struct Run {
    int32_t to, from, count;
};

// A corner, as many pieces of the middle as it takes, a corner.
std::vector<Run> runs(int32_t first, int32_t extent, int32_t size, int32_t corner) {
    const int32_t head = std::min(corner, extent / 2), tail = std::min(corner, extent - head);
    const int32_t middle = size - 2 * corner, end = first + extent - tail;
    std::vector<Run> all = {{first, 0, head}};
    for (int32_t to = first + head; to < end; to += middle)
        all.push_back({to, corner, std::min(middle, end - to)});
    all.push_back({end, size - tail, tail});
    return all;
}

} // namespace

void Canvas::blend(const Rect &rect, const Sliced &sliced, const Rect &hole) {
    if (!rect.intersects(clip_))
        return;
    const Image &image = sliced.image;
    for (const Run &row : runs(rect.top, rect.height(), image.height(), sliced.corner))
        for (const Run &column : runs(rect.left, rect.width(), image.width(), sliced.corner)) {
            const Rect piece(column.to, row.to, column.count, row.count);
            if (!hole.contains(piece))
                part_.blend(onPart(piece.corner()), image, {{column.from, row.from}, piece.size()});
        }
}

} // namespace desktop
