// The bits of up to 64 pixels, read from any pixel of a bitmap row on.
//
// Bits are held as they stand in memory: the lowest byte has the leftmost pixels,
// and in each byte the highest bit is the leftmost pixel.
#pragma once

#include "hwy/base.h"

#include <algorithm>
#include <bit>
#include <cstddef>
#include <cstdint>

namespace quillon {

// As one number from left to right, the leftmost pixel in the highest bit, and back.
HWY_INLINE uint64_t reverseByteOrder(uint64_t bits) {
    return __builtin_bswap64(bits);
}

// The bits of the leftmost pixels, 1 to 64 of them.
HWY_INLINE uint64_t leftmostPixels(size_t count) {
    return reverseByteOrder(~uint64_t{0} << (64 - count));
}

// The place of the leftmost pixel whose bit is set; bits is not 0.
HWY_INLINE size_t firstSetPixel(uint64_t bits) {
    return static_cast<size_t>(std::countr_zero(bits) ^ 7);
}

// The readers give the bits of the pixels i to i + kPixels - 1, a multiple of 8.
// No byte is read but those that hold a bit that is asked for.

// Where i is a multiple of 8.
struct WholeByteReader {
    const uint8_t *row;

    template <size_t kPixels>
    HWY_INLINE uint64_t read(size_t i) const {
        uint64_t bits = 0;
        hwy::CopyBytes<kPixels / 8>(row + i / 8, &bits);
        return bits;
    }
};

// Where i % 8 is shift, 1 to 7.
struct ShiftedReader {
    const uint8_t *row;
    size_t shift;

    template <size_t kPixels>
    HWY_INLINE uint64_t read(size_t i) const {
        const uint64_t bits = WholeByteReader{row}.read<kPixels>(i);
        const uint64_t next = uint64_t{row[i / 8 + kPixels / 8]} >> (8 - shift);
        return reverseByteOrder(reverseByteOrder(bits) << shift | next << (64 - kPixels));
    }
};

// Anywhere.
struct BitReader {
    const uint8_t *row;
    size_t width; // of the row, in pixels

    template <size_t kPixels>
    HWY_INLINE uint64_t read(size_t i) const {
        return i % 8 == 0 ? WholeByteReader{row}.read<kPixels>(i)
                          : ShiftedReader{row, i % 8}.read<kPixels>(i);
    }

    // The bits of count pixels, 1 to 64, in a row of at least 64; the bits behind
    // them are 0.
    HWY_INLINE uint64_t readFirst(size_t i, size_t count) const {
        const size_t begin = std::min(i, width - 64);
        const uint64_t bits = reverseByteOrder(read<64>(begin));
        return reverseByteOrder(bits << (i - begin)) & leftmostPixels(count);
    }

    // Calls use with the reader for chunks of pixels that begin a multiple of 8 from
    // begin on.
    template <class Use>
    HWY_INLINE void withReaderFrom(size_t begin, const Use &use) const {
        if (begin % 8 == 0)
            use(WholeByteReader{row});
        else
            use(ShiftedReader{row, begin % 8});
    }
};

// The bits of rows of 1 to 64 pixels, by loads that may overlap; the bits behind them are 0.
// kHasWords tells that a row has four bytes or more.
template <bool kHasWords>
class ShortRowReader {
public:
    explicit ShortRowReader(size_t width)
        : bytes_((width + 7) / 8), pixels_(leftmostPixels(width)) {}

    HWY_INLINE uint64_t read(const uint8_t *row) const {
        if constexpr (kHasWords) {
            uint32_t first4 = 0, last4 = 0;
            hwy::CopyBytes<4>(row, &first4);
            hwy::CopyBytes<4>(row + bytes_ - 4, &last4);
            return (first4 | uint64_t{last4} << 8 * (bytes_ - 4)) & pixels_;
        } else {
            const size_t middle = bytes_ / 2, last = bytes_ - 1;
            return (row[0] | uint64_t{row[middle]} << 8 * middle |
                    uint64_t{row[last]} << 8 * last) &
                   pixels_;
        }
    }

private:
    size_t bytes_;
    uint64_t pixels_;
};

} // namespace quillon
