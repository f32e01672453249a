// How the loose arguments of a surface become pointers, and the shape in which
// the entries hand a rectangle to a kernel.
#pragma once

#include <cstddef>
#include <cstdint>

namespace quillon {

constexpr bool isPixelSize(int32_t bytesPerPixel) {
    return bytesPerPixel >= 1 && bytesPerPixel <= 4;
}

// The size of a rectangle in pixels.
struct Extent {
    size_t width, height;

    bool empty() const { return width == 0 || height == 0; }
};

// The size of a rectangle whose rows are rows of bytes.
struct ByteExtent {
    size_t rowBytes, height;
};

constexpr ByteExtent inBytes(Extent extent, int32_t bytesPerPixel) {
    return {extent.width * static_cast<size_t>(bytesPerPixel), extent.height};
}

// A pointer moved by a distance in bytes, computed on integers: the corner of an
// empty rectangle may lie anywhere, and pointer arithmetic that leaves its object
// is undefined even where the pointer is never followed.
template <class Byte>
Byte *advance(Byte *pointer, uint64_t bytes) {
    return reinterpret_cast<Byte *>(reinterpret_cast<uintptr_t>(pointer) + bytes);
}

// The address of pixel (x, y).  At 64 bits: y * stride alone can pass 32.
// Unsigned, so that a negative stride wraps to the right address.
template <class Byte>
Byte *pixelAddress(Byte *buffer, int64_t stride, int64_t bytesPerPixel, uint64_t x, uint64_t y) {
    return advance(buffer,
                   y * static_cast<uint64_t>(stride) + x * static_cast<uint64_t>(bytesPerPixel));
}

// The rows of a rectangle: its first pixel, and the bytes from row to row.
template <class Byte>
struct Rows {
    Byte *first;
    ptrdiff_t stride;

    Byte *row(size_t index) const { return advance(first, index * static_cast<size_t>(stride)); }
};
using DstRows = Rows<uint8_t>;
using SrcRows = Rows<const uint8_t>;

// Whether each row begins where the one before ends.  Rows that overlap do not
// count: they must be walked in their order.
template <class Byte>
bool areContiguous(const Rows<Byte> &rows, size_t rowBytes) {
    return static_cast<ptrdiff_t>(rowBytes) == rows.stride;
}

// The extent of contiguous rows taken as one long row.
constexpr Extent asOneRow(Extent extent) {
    return {extent.width * extent.height, 1};
}
constexpr ByteExtent asOneRow(ByteExtent extent) {
    return {extent.rowBytes * extent.height, 1};
}

// The addresses from the lowest byte of a rectangle up to behind its highest one.
struct AddressRange {
    uintptr_t begin, end;

    bool overlaps(const AddressRange &other) const {
        return begin < other.end && other.begin < end;
    }
};

template <class Byte>
AddressRange addressesOf(const Rows<Byte> &rows, ByteExtent extent) {
    const auto top = reinterpret_cast<uintptr_t>(rows.first);
    const uintptr_t bottom = top + (extent.height - 1) * static_cast<uintptr_t>(rows.stride);
    return rows.stride < 0 ? AddressRange{bottom, top + extent.rowBytes}
                           : AddressRange{top, bottom + extent.rowBytes};
}

// Whether two rectangles have bytes in common, or lie between each other's rows.
inline bool rowsOverlap(DstRows dst, SrcRows src, ByteExtent extent) {
    return addressesOf(dst, extent).overlaps(addressesOf(src, extent));
}

// A stride rounded down (towards minus infinity) to whole pixels of 2 or 4 bytes.
// Pixels of 1 and 3 bytes step exactly.
constexpr int64_t strideInWholePixels(int64_t stride, int32_t bytesPerPixel) {
    const bool isWord = bytesPerPixel == 2 || bytesPerPixel == 4;
    return isWord ? stride & -int64_t{bytesPerPixel} : stride;
}

// Overlap hazard: whether a vector of the given size reads a byte that a walk
// pixel by pixel would have written before.  That is so where the destination
// lies ahead of the source by less than the vector.
inline bool hasOverlapHazard(const uint8_t *dst, const uint8_t *src, size_t vectorBytes) {
    const uintptr_t ahead = reinterpret_cast<uintptr_t>(dst) - reinterpret_cast<uintptr_t>(src);
    return ahead != 0 && ahead < vectorBytes;
}

} // namespace quillon
