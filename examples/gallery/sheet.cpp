#include "sheet.h"
#include "font.h"

#include <algorithm>
#include <numeric>
#include <sstream>

namespace gallery {

namespace {
constexpr int32_t kColumnGap = 16, kRowGap = 18, kLabelGap = 5, kLinePitch = kGlyphHeight + 2;

// The gaps between sizes are one less than there are of these.
int32_t total(const std::vector<int32_t> &sizes, int32_t gap) {
    return std::accumulate(sizes.begin(), sizes.end(), -gap,
                           [gap](int32_t sum, int32_t size) { return sum + size + gap; });
}

} // namespace

int32_t Sheet::Tile::width() const {
    int32_t widest = picture.width();
    for (const std::string &line : label)
        widest = std::max(widest, textWidth(line));
    return widest;
}

int32_t Sheet::Tile::height() const {
    return picture.height() + kLabelGap + static_cast<int32_t>(label.size()) * kLinePitch;
}

void Sheet::add(Picture picture, const std::string &label) {
    std::vector<std::string> lines;
    std::istringstream text(label);
    for (std::string line; std::getline(text, line);)
        lines.push_back(line);
    tiles.push_back({std::move(picture), std::move(lines)});
}

int32_t Sheet::Grid::width() const {
    return total(widths, kColumnGap);
}

int32_t Sheet::Grid::height() const {
    return total(heights, kRowGap);
}

Sheet::Grid Sheet::gridOf(size_t columns) const {
    Grid grid;
    grid.widths.resize(std::min(columns, tiles.size()));
    grid.heights.resize((tiles.size() + columns - 1) / columns);
    for (size_t i = 0; i < tiles.size(); ++i) {
        int32_t &width = grid.widths[i % columns], &height = grid.heights[i / columns];
        width = std::max(width, tiles[i].width());
        height = std::max(height, tiles[i].height());
    }
    return grid;
}

Picture Sheet::drawnWithin(int32_t width) const {
    size_t columns = columnCount;
    while (columns > 1 && gridOf(columns).width() > width)
        --columns;
    return drawnIn(columns);
}

Picture Sheet::drawnIn(size_t columns) const {
    const Grid grid = gridOf(columns);
    Picture sheet = blank(grid.width(), grid.height(), kWhite);
    int32_t x = 0, y = 0;
    for (size_t i = 0; i < tiles.size(); ++i) {
        paste(sheet, tiles[i].picture, x, y);
        int32_t line = y + tiles[i].picture.height() + kLabelGap;
        for (const std::string &text : tiles[i].label) {
            write(sheet, x, line, text, kInk, kWhite);
            line += kLinePitch;
        }
        const bool last = i % columns == columns - 1;
        x = last ? 0 : x + grid.widths[i % columns] + kColumnGap;
        y += last ? grid.heights[i / columns] + kRowGap : 0;
    }
    return sheet;
}

} // namespace gallery
