/** @file face/format.hpp
 *
 * Pixel formats, colours and raster operations.  Part of quillon.hpp, which states the
 * conventions.
 */
#ifndef QUILLON_FACE_FORMAT_HPP
#define QUILLON_FACE_FORMAT_HPP

#include <quillon/raster.h>

#include <array>
#include <cstddef>
#include <cstdint>

namespace quillon {

/** The formats of a pixel; rasterConvert.h has their bits. */
enum class Format : uint8_t {
    kBgra32, /**< bytes B G R A: 0xAARRGGBB as a word; the alpha may be unused */
    kBgr24,  /**< bytes B G R */
    kRgb16,  /**< 5 bits of red on top, 6 of green, 5 of blue */
    kRgb15,  /**< 5 bits each, the top bit unused */
    kSmall8, /**< one byte: 2 bits of blue on top, 3 of green, 3 of red */
    kSmall6, /**< one byte: 2 bits each of red, green, blue */
    kSmall3, /**< one byte: a bit each of blue 0x80, green 0x20, red 0x04 */
    kIndex8  /**< one byte: an index into a Palette.  Nothing converts to it. */
};

/** The bytes of a pixel. */
constexpr int32_t bytesPerPixel(Format format) {
    return format == Format::kBgra32                              ? 4
           : format == Format::kBgr24                             ? 3
           : format == Format::kRgb16 || format == Format::kRgb15 ? 2
                                                                  : 1;
}

/** The name that the C interface has for a format, see rasterConvert.h. */
constexpr int32_t depthOf(Format format) {
    constexpr int32_t kDepths[] = {32, 24, 16, 15, 8, 6, 3, 8};
    return kDepths[static_cast<size_t>(format)];
}

/** The colours of Format::kIndex8: 0xAARRGGBB each. */
using Palette = std::array<uint32_t, 256>;

/** A colour, whatever the format that it is drawn in. */
class Color {
public:
    constexpr Color(uint8_t red, uint8_t green, uint8_t blue, uint8_t alpha = 255)
        : argb_(uint32_t{alpha} << 24 | uint32_t{red} << 16 | uint32_t{green} << 8 | blue) {}
    /** As 0xAARRGGBB, which is the pixel of Format::kBgra32. */
    constexpr Color(uint32_t argb) : argb_(argb) {}

    constexpr uint32_t argb() const { return argb_; }

    /** The pixel of a format: the low bits of the channels are dropped.  For kIndex8 the
     * colour itself is taken for the index.
     */
    uint32_t pixel(Format format) const {
        if (format == Format::kBgra32 || format == Format::kBgr24 || format == Format::kIndex8)
            return argb_;
        return Raster_ConvertOnePixel(argb_, 32, depthOf(format), false, nullptr);
    }

    friend constexpr bool operator==(Color a, Color b) { return a.argb_ == b.argb_; }
    friend constexpr bool operator!=(Color a, Color b) { return !(a == b); }

private:
    uint32_t argb_;
};

/** The sixteen raster operations, of a source S and a destination D. */
enum class Rop : uint8_t {
    kClear = RASTER_ROP_CLEAR,                /**< 0 */
    kAnd = RASTER_ROP_AND,                    /**< S & D */
    kAndReverse = RASTER_ROP_AND_REVERSE,     /**< S & ~D */
    kCopy = RASTER_ROP_COPY,                  /**< S */
    kAndInverted = RASTER_ROP_AND_INVERTED,   /**< ~S & D */
    kNoop = RASTER_ROP_NOOP,                  /**< D */
    kXor = RASTER_ROP_XOR,                    /**< S ^ D */
    kOr = RASTER_ROP_OR,                      /**< S | D */
    kNor = RASTER_ROP_NOR,                    /**< ~(S | D) */
    kEquiv = RASTER_ROP_EQUIV,                /**< ~(S ^ D) */
    kInvert = RASTER_ROP_INVERT,              /**< ~D */
    kOrReverse = RASTER_ROP_OR_REVERSE,       /**< S | ~D */
    kCopyInverted = RASTER_ROP_COPY_INVERTED, /**< ~S */
    kOrInverted = RASTER_ROP_OR_INVERTED,     /**< ~S | D */
    kNand = RASTER_ROP_NAND,                  /**< ~(S & D) */
    kSet = RASTER_ROP_SET                     /**< all bits 1 */
};

/** How pixels are scaled. */
enum class Filter : uint8_t {
    kNearest, /**< the nearest sample */
    kSmooth   /**< interpolated where the picture grows, averaged where it shrinks */
};

namespace detail {

/** The bits of a byte under a mask, widened to 8 by repeating them. */
constexpr uint32_t widened(uint32_t byte, uint32_t mask) {
    uint32_t count = 0, value = 0, result = 0;
    for (uint32_t bit = 0x80; bit != 0; bit >>= 1)
        if ((mask & bit) != 0) {
            value = value << 1 | ((byte & bit) != 0 ? 1u : 0u);
            ++count;
        }
    for (uint32_t have = 0; have < 8; have += count)
        result = result << count | value;
    return result >> ((8 + count - 1) / count * count - 8);
}

constexpr Palette smallPalette(uint32_t red, uint32_t green, uint32_t blue) {
    Palette palette = {};
    for (uint32_t byte = 0; byte < 256; ++byte)
        palette[byte] = 0xFF000000u | widened(byte, red) << 16 | widened(byte, green) << 8 |
                        widened(byte, blue);
    return palette;
}

/** The small formats are read through their colours. */
inline constexpr Palette kSmall8Colors = smallPalette(0x07, 0x38, 0xC0);
inline constexpr Palette kSmall6Colors = smallPalette(0x30, 0x0C, 0x03);
inline constexpr Palette kSmall3Colors = smallPalette(0x04, 0x20, 0x80);

/** Null where a format of one byte per pixel has no colours of its own. */
constexpr const Palette *colorsOf(Format format) {
    return format == Format::kSmall8   ? &kSmall8Colors
           : format == Format::kSmall6 ? &kSmall6Colors
           : format == Format::kSmall3 ? &kSmall3Colors
                                       : nullptr;
}

} // namespace detail
} // namespace quillon

#endif /* QUILLON_FACE_FORMAT_HPP */
