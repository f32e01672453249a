// Pictures side by side, with a label under each.
#ifndef GALLERY_SHEET_H
#define GALLERY_SHEET_H

#include "picture.h"

#include <string>
#include <vector>

namespace gallery {

class Sheet {
public:
    explicit Sheet(size_t columns) : columnCount(columns) {}
    // A label may have several lines.
    void add(Picture picture, const std::string &label);
    Picture drawn() const { return drawnIn(columnCount); }
    // In fewer columns, as many as have room in a width, but one at least.
    Picture drawnWithin(int32_t width) const;

private:
    struct Tile {
        Picture picture;
        std::vector<std::string> label;

        int32_t width() const;
        int32_t height() const;
    };
    // Where tiles stand, in so many columns.
    struct Grid {
        std::vector<int32_t> widths, heights; // of columns and rows
        int32_t width() const;
        int32_t height() const;
    };
    Grid gridOf(size_t columns) const;
    Picture drawnIn(size_t columns) const;

    size_t columnCount;
    std::vector<Tile> tiles;
};

} // namespace gallery

#endif // GALLERY_SHEET_H
