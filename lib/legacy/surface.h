// How the loose arguments of a surface become pointers, and the shape in which
// the entries hand a rectangle to a kernel.
#pragma once

#include <cstdint>

#include <cstddef>
#include <cstdint>

namespace quillon {

struct Size {
    size_t width; // in whatever unit the kernel counts: pixels, or bytes
    size_t height;

    bool empty() const { return width == 0 || height == 0; }
};

// A pointer moved by a distance in bytes.  In whole addresses, because an
// argument that is never followed (the corner of an empty rectangle) may lead
// anywhere, and pointer arithmetic that leaves its object is undefined.
template <class Byte>
Byte *advance(Byte *pointer, uint64_t bytes) {
    return reinterpret_cast<Byte *>(reinterpret_cast<uintptr_t>(pointer) + bytes);
}

// The address of pixel (x, y).  At 64 bits: y * lineIncrement alone can pass 32.
// Unsigned, so that a negative increment wraps to the right address.
template <class Byte>
Byte *pixelAddress(Byte *buffer, int64_t lineIncrement, int64_t bytesPerPixel, uint64_t x,
                   uint64_t y) {
    return advance(buffer, y * static_cast<uint64_t>(lineIncrement) +
                               x * static_cast<uint64_t>(bytesPerPixel));
}

// The rows of a rectangle: its first pixel, and the bytes from row to row.
template <class Byte>
struct Rows {
    Byte *first;
    ptrdiff_t step;

    Byte *row(size_t index) const { return advance(first, index * static_cast<size_t>(step)); }
};
using DstRows = Rows<uint8_t>;
using SrcRows = Rows<const uint8_t>;

// The addresses of a rectangle, from its lowest byte up to behind its highest one.
struct AddressRange {
    uintptr_t begin, end;

    bool overlaps(const AddressRange &other) const {
        return begin < other.end && other.begin < end;
    }
};

template <class Byte>
AddressRange addressesOf(const Rows<Byte> &rows, size_t rowBytes, size_t height) {
    const auto top = reinterpret_cast<uintptr_t>(rows.first);
    const uintptr_t bottom = top + (height - 1) * static_cast<uintptr_t>(rows.step);
    return rows.step < 0 ? AddressRange{bottom, top + rowBytes}
                         : AddressRange{top, bottom + rowBytes};
}

// A line increment rounded down (towards minus infinity) to whole pixels of 2
// or 4 bytes.  Pixels of 1 and 3 bytes step exactly.
inline int64_t wholePixels(int64_t lineIncrement, int32_t bytesPerPixel) {
    const bool isUnit = bytesPerPixel == 2 || bytesPerPixel == 4;
    return isUnit ? lineIncrement & -int64_t{bytesPerPixel} : lineIncrement;
}

// Rows that lie end to end are one long row.  Only an exact fit counts: rows
// that overlap must be walked in their order.
inline Size joinedRows(Size size, size_t rowBytes, ptrdiff_t step) {
    return static_cast<ptrdiff_t>(rowBytes) == step ? Size{size.width * size.height, 1} : size;
}

inline Size joinedRows(Size size, size_t dstRowBytes, ptrdiff_t dstStep, size_t srcRowBytes,
                       ptrdiff_t srcStep) {
    return static_cast<ptrdiff_t>(srcRowBytes) == srcStep ? joinedRows(size, dstRowBytes, dstStep)
                                                          : size;
}

} // namespace quillon
