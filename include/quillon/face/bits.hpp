/** @file face/bits.hpp
 *
 * Bitmaps of one bit per pixel, and fonts made of them.  Part of quillon.hpp, which states
 * the conventions.
 */
#ifndef QUILLON_FACE_BITS_HPP
#define QUILLON_FACE_BITS_HPP

#include <quillon/face/rect.hpp>

#include <cassert>
#include <cstddef>
#include <cstdint>

namespace quillon {

/** One bit per pixel, in the caller's memory; only read.
 *
 * Each row begins on a byte, its leftmost pixel in bit 7.
 */
class Bitmap {
public:
    Bitmap() = default;
    /** Rows of (width + 7) / 8 bytes or more.
     *
     * @param bits    the first byte of row 0
     * @param stride  bytes from a row to the next; may be negative
     * @param size    in pixels
     */
    Bitmap(const void *bits, int32_t stride, Size size) {
        const int64_t rowBytes = (int64_t{size.width} + 7) / 8;
        const bool isValid =
            size.isEmpty() || (bits != nullptr && (size.height == 1 || stride >= rowBytes ||
                                                   -int64_t{stride} >= rowBytes));
        assert(isValid && "a null pointer, or a stride below the bytes of a row");
        if (isValid && !size.isEmpty()) {
            bits_ = static_cast<const uint8_t *>(bits);
            stride_ = stride;
            size_ = size;
        }
    }
    /** Rows of (width + 7) / 8 bytes, without padding. */
    Bitmap(const void *bits, Size size)
        : Bitmap(bits, static_cast<int32_t>((int64_t{size.width} + 7) / 8), size) {}

    Size size() const { return size_; }
    Rect bounds() const { return {{0, 0}, size_}; }
    int32_t stride() const { return stride_; }
    /** The byte of a pixel. */
    const uint8_t *at(Point point) const {
        assert(bounds().contains(point));
        return bits_ + std::ptrdiff_t{stride_} * point.y + point.x / 8;
    }

private:
    const uint8_t *bits_ = nullptr;
    int32_t stride_ = 0;
    Size size_;
};

/** Glyphs of one size, one behind the other: rows of (width + 7) / 8 bytes each. */
struct Font {
    const void *glyphs = nullptr; /**< in the caller's memory; only read */
    Size size;                    /**< of a glyph, in pixels */
    uint8_t first = 0;            /**< the character of the first glyph */
    int32_t count = 0;            /**< of glyphs */

    /** The glyph of a character; an empty bitmap where there is none. */
    Bitmap glyph(char character) const {
        const int32_t index = static_cast<uint8_t>(character) - first;
        if (index < 0 || index >= count || size.isEmpty())
            return {};
        const std::ptrdiff_t bytes = (std::ptrdiff_t{size.width} + 7) / 8 * size.height;
        return {static_cast<const uint8_t *>(glyphs) + bytes * index, size};
    }
};

} // namespace quillon

#endif /* QUILLON_FACE_BITS_HPP */
