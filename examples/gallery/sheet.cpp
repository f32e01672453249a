#include "sheet.h"
#include "font.h"

#include <algorithm>
#include <numeric>
#include <sstream>

namespace gallery {

namespace {
constexpr int32_t kColumnGap = 16, kRowGap = 18, kLabelGap = 5, kLinePitch = kGlyphHeight + 2;
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

Picture Sheet::drawn() const {
    std::vector<int32_t> widths(std::min(columnCount, tiles.size()));
    std::vector<int32_t> heights((tiles.size() + columnCount - 1) / columnCount);
    for (size_t i = 0; i < tiles.size(); ++i) {
        int32_t &width = widths[i % columnCount], &height = heights[i / columnCount];
        width = std::max(width, tiles[i].width());
        height = std::max(height, tiles[i].height());
    }
    // The gaps between columns and rows, one less than there are of these.
    const auto total = [](const std::vector<int32_t> &sizes, int32_t gap) {
        return std::accumulate(sizes.begin(), sizes.end(), -gap,
                               [gap](int32_t sum, int32_t size) { return sum + size + gap; });
    };
    Picture sheet = blank(total(widths, kColumnGap), total(heights, kRowGap), kWhite);

    int32_t x = 0, y = 0;
    for (size_t i = 0; i < tiles.size(); ++i) {
        paste(sheet, tiles[i].picture, x, y);
        int32_t line = y + tiles[i].picture.height() + kLabelGap;
        for (const std::string &text : tiles[i].label) {
            write(sheet, x, line, text, kInk, kWhite);
            line += kLinePitch;
        }
        const bool last = i % columnCount == columnCount - 1;
        x = last ? 0 : x + widths[i % columnCount] + kColumnGap;
        y += last ? heights[i / columnCount] + kRowGap : 0;
    }
    return sheet;
}

} // namespace gallery
