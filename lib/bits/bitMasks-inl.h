// Chunks of pixels as vectors, and the bits of a chunk as masks of their lanes.
//
// Chunks are 64, 32, 16 or 8 pixels, whatever the size of a vector: a chunk's
// pixels are one or several vectors.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_BITS_BIT_MASKS_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_BITS_BIT_MASKS_INL_H
#undef QUILLON_BITS_BIT_MASKS_INL_H
#else
#define QUILLON_BITS_BIT_MASKS_INL_H
#endif

#include "hwy/highway.h"

#include "simd/pixelPattern-inl.h"
#include "simd/target-inl.h"

#include <array>
#include <type_traits>

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
#if QUILLON_HAS_VECTORS

// The widest vectors of which there is a whole number in a chunk.  Lanes are
// pixels of 4 bytes, and single bytes of all others.
template <size_t kBytes, size_t kPixels>
using ChunkTag = hn::CappedTag<std::conditional_t<kBytes == 4, uint32_t, uint8_t>,
                               (kBytes == 2 ? 2 : 1) * kPixels>;

// Equal pixels as the vectors of a chunk.  There are three different ones where
// pixels have 3 bytes.
template <size_t kBytes, class D>
class PixelVectors {
public:
    HWY_INLINE PixelVectors(D d, uint32_t pixel) {
        const hn::Repartition<uint32_t, D> d32;
        const PixelPattern pattern(pixel, kBytes);
        for (size_t k = 0; k < kCount; ++k)
            vectors_[k] = hn::BitCast(d, pattern.from(d32, k * kBytesOf<D>));
    }

    HWY_INLINE hn::Vec<D> operator[](size_t k) const { return vectors_[k % kCount]; }

private:
    static constexpr size_t kCount = kBytes == 3 ? 3 : 1;
    hn::Vec<D> vectors_[kCount];
};

// For each byte of a chunk's pixels: which byte of the bits has its bit, and which
// bit of that byte it is.
template <size_t kBytes>
using ByteTable = std::array<uint8_t, size_t{64} * kBytes>;
template <size_t kBytes>
HWY_ALIGN constexpr auto kByteOfBits = [] {
    ByteTable<kBytes> table = {};
    for (size_t i = 0; i < table.size(); ++i)
        table[i] = static_cast<uint8_t>(i / kBytes / 8);
    return table;
}();
template <size_t kBytes>
HWY_ALIGN constexpr auto kBitOfByte = [] {
    ByteTable<kBytes> table = {};
    for (size_t i = 0; i < table.size(); ++i)
        table[i] = static_cast<uint8_t>(0x80 >> i / kBytes % 8);
    return table;
}();

// For each of 32 pixels, their bit in a half of the bits.
HWY_ALIGN constexpr auto kBitOfHalf = [] {
    std::array<uint32_t, 32> table = {};
    for (size_t i = 0; i < table.size(); ++i)
        table[i] = uint32_t{1} << (i ^ 7);
    return table;
}();

// The lanes of a chunk's vector k whose bit is set.
template <size_t kBytes, class D>
HWY_INLINE hn::Mask<D> setLanes(D d, uint64_t bits, size_t k) {
    const size_t lane = k * kLanes<D>;
    if constexpr (kBytes == 4) {
        const auto half = static_cast<uint32_t>(bits >> lane / 32 * 32);
        return hn::TestBit(hn::Set(d, half), hn::Load(d, kBitOfHalf.data() + lane % 32));
    } else {
        const hn::Repartition<uint64_t, D> d64;
        const auto spread = hn::TableLookupBytes(hn::BitCast(d, hn::Set(d64, bits)),
                                                 hn::Load(d, kByteOfBits<kBytes>.data() + lane));
        return hn::TestBit(spread, hn::Load(d, kBitOfByte<kBytes>.data() + lane));
    }
}

#endif
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
