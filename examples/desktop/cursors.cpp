#include "cursors.h"

#include <array>
#include <cmath>
#include <new>

namespace desktop {

namespace {

using quillon::Cursor;

Cursor taken(std::optional<Cursor> cursor) {
    if (!cursor)
        throw std::bad_alloc();
    return std::move(*cursor);
}

// With alpha.
Cursor shaped(const Polygon &polygon, Size size, Point hotSpot) {
    const Image image = outlinedShape(size, polygon, 0xFF16181D, 0xFFFFFFFF);
    return taken(Cursor::withAlpha(image, hotSpot));
}

Polygon turned(const Polygon &polygon, double degrees) {
    const double sine = std::sin(degrees * 3.14159265358979 / 180);
    const double cosine = std::cos(degrees * 3.14159265358979 / 180);
    Polygon result;
    for (const Corner &corner : polygon)
        result.push_back({12 + (corner.x - 12) * cosine - (corner.y - 12) * sine,
                          12 + (corner.x - 12) * sine + (corner.y - 12) * cosine});
    return result;
}

// Masks that keep the screen, but for strokes where they turn bits of its colours over.
Cursor inverting(const std::vector<Rect> &strokes, uint32_t bits, Size size, Point hotSpot) {
    Image keep = created(size), invert = created(size);
    keep.fill(0xFFFFFFFF);
    for (const Rect &stroke : strokes)
        invert.fill(stroke, bits);
    return taken(Cursor::withMasks(keep, invert, hotSpot));
}

const Polygon kArrow = {{2, 2},     {2, 18.5},   {6.2, 14.6}, {9, 21},
                        {12, 19.7}, {9.2, 13.5}, {14.8, 13.2}};
const Polygon kDouble = {{2, 12},  {7.5, 6.5},   {7.5, 10.6},  {16.5, 10.6}, {16.5, 6.5},
                         {22, 12}, {16.5, 17.5}, {16.5, 13.4}, {7.5, 13.4},  {7.5, 17.5}};
const Polygon kFourfold = {{12, 1.5},    {16, 5.5},    {13.3, 5.5}, {13.3, 10.7}, {18.5, 10.7},
                           {18.5, 8},    {22.5, 12},   {18.5, 16},  {18.5, 13.3}, {13.3, 13.3},
                           {13.3, 18.5}, {16, 18.5},   {12, 22.5},  {8, 18.5},    {10.7, 18.5},
                           {10.7, 13.3}, {5.5, 13.3},  {5.5, 16},   {1.5, 12},    {5.5, 8},
                           {5.5, 10.7},  {10.7, 10.7}, {10.7, 5.5}, {8, 5.5}};

} // namespace

// In the order of CursorShape.
Cursors::Cursors() {
    constexpr Size kSize = {26, 26};
    constexpr Point kMiddle = {12, 12};
    shapes_.push_back(shaped(kArrow, kSize, {2, 2}));
    shapes_.push_back(shaped(kFourfold, kSize, kMiddle));
    for (const double degrees : {0, 90, 45, -45})
        shapes_.push_back(shaped(turned(kDouble, degrees), kSize, kMiddle));
    shapes_.push_back(
        inverting({{1, 0, 3, 2}, {6, 0, 3, 2}, {4, 1, 2, 16}, {1, 16, 3, 2}, {6, 16, 3, 2}},
                  0x00FFFFFF, {10, 18}, {5, 9}));
    shapes_.push_back(inverting({{11, 0, 2, 9}, {11, 15, 2, 9}, {0, 11, 9, 2}, {15, 11, 9, 2}},
                                kInversion, {24, 24}, kMiddle));
}

void Cursors::nextSize() {
    constexpr std::array<double, 4> kSizes = {1, 1.5, 2, 3};
    size_ = (size_ + 1) % kSizes.size();
    scaled_.clear();
    for (const Cursor &shape : shapes_)
        if (size_ > 0)
            scaled_.push_back(taken(shape.scaled(kSizes[size_], kSizes[size_])));
}

} // namespace desktop
