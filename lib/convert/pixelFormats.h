// The pixel layouts: the one place where their masks stand.
#pragma once

#include <cstdint>

#include <bit>

namespace quillon {

// A source or destination of a conversion, by what a pixel of it looks like.
// The values of the direct layouts are their depths.
enum class Layout : int32_t {
    Index = 0, // one byte into a palette; sources only
    Small3 = 3,
    Small6 = 6,
    Small8 = 8,
    Rgb15 = 15,
    Rgb16 = 16,
    Rgb24 = 24,
    Rgb32 = 32,
};

// Masks of the one-byte layouts, by depth: red, green, blue.  Depths 3, 6 and 8
// exist; the other rows are only there to make the depth an index.
inline constexpr uint8_t RasterSmallMasks[9][3] = {
    {}, {}, {}, {0x04, 0x20, 0x80}, {}, {}, {0x30, 0x0C, 0x03}, {}, {0x07, 0x38, 0xC0},
};

// The bit just above each channel of a source, from which a channel is moved so
// that its top bit lands on the top bit of a one-byte layout's mask.
struct ChannelEnds {
    int red, green, blue;
};
inline constexpr ChannelEnds kEnds15 = {15, 10, 5};
inline constexpr ChannelEnds kEnds16 = {16, 11, 5};
inline constexpr ChannelEnds kEnds32 = {24, 16, 8};

// A shift to the right, or to the left where the distance is negative.
constexpr uint32_t shiftedRight(uint32_t value, int distance) {
    return distance >= 0 ? value >> distance : value << -distance;
}

// The distance to the right from a channel that ends at a bit to a mask.
constexpr int shiftToMask(int end, uint8_t mask) {
    return end - std::bit_width(mask);
}

// A pixel moved into a one-byte layout: the top bits of each channel survive.
constexpr uint32_t toSmall(uint32_t pixel, ChannelEnds ends, int32_t depth) {
    const auto &mask = RasterSmallMasks[depth];
    return (shiftedRight(pixel, shiftToMask(ends.red, mask[0])) & mask[0]) |
           (shiftedRight(pixel, shiftToMask(ends.green, mask[1])) & mask[1]) |
           (shiftedRight(pixel, shiftToMask(ends.blue, mask[2])) & mask[2]);
}

// Narrowing drops the low bits of a channel; widening repeats its top bits in
// the new low ones, so that zero stays zero and the largest value the largest.
constexpr uint32_t widen15To24(uint32_t p) {
    const uint32_t top = ((p & 0x7C00) << 9) | ((p & 0x03E0) << 6) | ((p & 0x001F) << 3);
    return top | ((top >> 5) & 0x070707);
}
constexpr uint32_t widen16To24(uint32_t p) {
    const uint32_t top = ((p & 0xF800) << 8) | ((p & 0x07E0) << 5) | ((p & 0x001F) << 3);
    return top | ((top >> 5) & 0x070007) | ((top >> 6) & 0x000300);
}
constexpr uint32_t narrow24To15(uint32_t p) {
    return ((p >> 9) & 0x7C00) | ((p >> 6) & 0x03E0) | ((p >> 3) & 0x001F);
}
constexpr uint32_t narrow24To16(uint32_t p) {
    return ((p >> 8) & 0xF800) | ((p >> 5) & 0x07E0) | ((p >> 3) & 0x001F);
}

constexpr bool isSmallDepth(int32_t depth) {
    return depth == 3 || depth == 6 || depth == 8;
}

// The bytes of a pixel at a depth.  Depths that name no format have an answer, too,
// by which pixels of equal depths are copied.
constexpr int32_t bytesPerPixelAt(int32_t depth) {
    if (depth == 3 || depth == 6)
        return 1;
    return depth == 15 ? 2 : depth / 8;
}

constexpr int32_t bytesPerPixelOf(Layout layout) {
    return layout == Layout::Index ? 1 : bytesPerPixelAt(static_cast<int32_t>(layout));
}

} // namespace quillon
