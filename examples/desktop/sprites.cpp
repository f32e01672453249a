#include "sprites.h"

#include <cmath>
#include <new>

namespace desktop {

Image created(Size size) {
    std::optional<Image> image = Image::create(size);
    if (!image)
        throw std::bad_alloc();
    return std::move(*image);
}

Image resized(const ConstSurface &source, Size size) {
    Image image = created(size);
    if (!image.copyScaled(image.bounds(), source))
        throw std::bad_alloc();
    return image;
}

namespace {

constexpr int32_t kOversampling = 8;

Image largeOf(Size size) {
    return created({size.width * kOversampling, size.height * kOversampling});
}

Image reduced(const Image &large) {
    return resized(large, {large.width() / kOversampling, large.height() / kOversampling});
}

void fillRounded(Surface &to, const Rect &box, int32_t radius, Color color) {
    const double square = double{1} * radius * radius;
    to.fill(Rect::fromEdges(box.left, box.top + radius, box.right, box.bottom - radius), color);
    for (int32_t i = 0; i < radius; ++i) {
        const double rise = radius - i - 0.5;
        const auto inset =
            static_cast<int32_t>(std::lround(radius - std::sqrt(square - rise * rise)));
        const int32_t left = box.left + inset, width = box.width() - 2 * inset;
        to.fill({left, box.top + i, width, 1}, color);
        to.fill({left, box.bottom - 1 - i, width, 1}, color);
    }
}

// Where a horizontal line crosses the edges of a polygon, from left to right.
std::vector<double> crossings(const Polygon &polygon, double y) {
    std::vector<double> columns;
    for (size_t i = 0; i < polygon.size(); ++i) {
        const Corner &a = polygon[i], &b = polygon[(i + 1) % polygon.size()];
        if ((a.y <= y) != (b.y <= y))
            columns.push_back(a.x + (y - a.y) / (b.y - a.y) * (b.x - a.x));
    }
    std::sort(columns.begin(), columns.end());
    return columns;
}

void fillPolygon(Surface &to, const Polygon &polygon, Corner offset, Color color) {
    for (int32_t y = 0; y < to.height(); ++y) {
        const std::vector<double> columns =
            crossings(polygon, (y + 0.5) / kOversampling - offset.y);
        for (size_t i = 0; i + 1 < columns.size(); i += 2) {
            const auto column = [&](double x) {
                return static_cast<int32_t>(std::lround((x + offset.x) * kOversampling));
            };
            const int32_t left = column(columns[i]);
            to.fill({left, y, column(columns[i + 1]) - left, 1}, color);
        }
    }
}

} // namespace

// A reduction truncates: 255 may become 254.  What has no smooth edge is filled again.
Sliced roundedBox(Color color, int32_t radius) {
    constexpr int32_t kMiddle = 64;
    const int32_t side = 2 * radius + kMiddle;
    Image large = largeOf({side, side});
    fillRounded(large, large.bounds(), radius * kOversampling, color);
    Image box = reduced(large);
    box.fill({radius, 0, kMiddle, side}, color);
    box.fill({0, radius, side, kMiddle}, color);
    return {std::move(box), radius};
}

// Boxes within boxes, each a little darker.
Sliced softShadow() {
    constexpr int32_t kCorner = 2 * kShadow, kSide = 2 * kCorner + 64;
    constexpr double kDarkest = 150;
    Image shadow = created({kSide, kSide});
    for (int32_t i = 0; i < kCorner; ++i) {
        const double depth = std::min(1.0, (i + 1.0) / (kShadow * 1.6));
        const auto alpha = static_cast<uint8_t>(kDarkest * depth * depth * (3 - 2 * depth));
        fillRounded(shadow, shadow.bounds().grown(-i), kCorner - i, translucent(0xFF04060B, alpha));
    }
    return {std::move(shadow), kCorner};
}

Image disc(Color color, int32_t diameter) {
    Image large = largeOf({diameter, diameter});
    fillRounded(large, large.bounds(), diameter * kOversampling / 2, color);
    return reduced(large);
}

Image outlinedShape(Size size, const Polygon &polygon, Color ink, Color outline) {
    Image large = largeOf(size);
    fillPolygon(large, polygon, {1.0, 2.0}, translucent(0xFF000000, 0x50));
    constexpr int kDirections = 16;
    for (int i = 0; i < kDirections; ++i) {
        const double angle = i * 6.283185307 / kDirections;
        fillPolygon(large, polygon, {1.1 * std::cos(angle), 1.1 * std::sin(angle)}, outline);
    }
    fillPolygon(large, polygon, {0, 0}, ink);
    return reduced(large);
}

} // namespace desktop
