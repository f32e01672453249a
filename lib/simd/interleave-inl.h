// Vectors of bytes, one field of the pixels each, interleaved into pixels of three
// or four bytes in memory.
//
// The stores move bytes within blocks only.  For the pixels to end up in their
// order, the quads of the fields have to be put in another one before: a quad is
// the bytes of four successive pixels, a 32-bit lane.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_SIMD_INTERLEAVE_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_SIMD_INTERLEAVE_INL_H
#undef QUILLON_SIMD_INTERLEAVE_INL_H
#else
#define QUILLON_SIMD_INTERLEAVE_INL_H
#endif

#include "hwy/highway.h"

#include "simd/access-inl.h"
#include "simd/narrow-inl.h"
#include "simd/target-inl.h"

#include <array>

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
#if QUILLON_HAS_VECTORS

// ---- The order of quads ---------------------------------------------------

enum class QuadOrder {
    kRising,   // as the pixels are in memory
    kNarrowed, // as narrowSaturated leaves pixels whose 16-bit lanes rise
    kForStore, // as the stores of pixels want them
};

namespace detail {

// The quad that stands i-th in a block of a vector that is stored as pixels of:
// - 2 bytes, by interleaving blocks with others: each half of the vector has the
//   lower or the upper halves of the blocks;
// - 3 bytes: the block is 16 successive pixels, see storeThreeParts;
// - 4 bytes: it has one quad of each of the four vectors that are stored.
constexpr size_t quadForStore(size_t pixelBytes, size_t blocks, size_t block, size_t i) {
    return pixelBytes == 2   ? i / 2 * 2 * blocks + 2 * block + i % 2
           : pixelBytes == 3 ? 4 * (3 * block % blocks) + i
                             : blocks * i + block;
}

// Where a quad stands in QuadOrder::kNarrowed.
constexpr size_t placeInNarrowed(size_t quad, size_t blocks) {
    const size_t inVector = quad % (2 * blocks);
    return inVector / 2 * 4 + quad / (2 * blocks) * 2 + inVector % 2;
}

template <size_t kPixelBytes, QuadOrder kOrder, size_t kBlocks>
struct QuadsForStore {
    alignas(64) uint32_t quads[4 * kBlocks] = {};
    constexpr QuadsForStore() {
        for (size_t at = 0; at < 4 * kBlocks; ++at) {
            const size_t quad = quadForStore(kPixelBytes, kBlocks, at / 4, at % 4);
            quads[at] = static_cast<uint32_t>(
                kOrder == QuadOrder::kNarrowed ? placeInNarrowed(quad, kBlocks) : quad);
        }
    }
    constexpr bool isUnchanged() const {
        for (size_t at = 0; at < 4 * kBlocks; ++at)
            if (quads[at] != at)
                return false;
        return true;
    }
};
template <size_t kPixelBytes, QuadOrder kOrder, size_t kBlocks>
inline constexpr QuadsForStore<kPixelBytes, kOrder, kBlocks> kQuadsForStore;

} // namespace detail

// The quads of v, which come in kOrder, in QuadOrder::kForStore.
template <size_t kPixelBytes, QuadOrder kOrder, class D>
HWY_INLINE hn::Vec<D> orderForStore(D d, hn::Vec<D> v) {
    constexpr size_t kBlocks = kBytesOf<D> / 16;
    constexpr auto &kOrdered = detail::kQuadsForStore<kPixelBytes, kOrder, kBlocks>;
    if constexpr (kOrder == QuadOrder::kForStore || kOrdered.isUnchanged()) {
        return v;
    } else {
        const hn::Repartition<uint32_t, D> d32;
        return hn::BitCast(
            d, hn::TableLookupLanes(hn::BitCast(d32, v), hn::SetTableIndices(d32, kOrdered.quads)));
    }
}

// ---- Four bytes -----------------------------------------------------------

// As many pixels as there are lanes.
template <class Access, class D>
HWY_INLINE void storeInterleaved(D d, hn::Vec<D> byte0, hn::Vec<D> byte1, hn::Vec<D> byte2,
                                 hn::Vec<D> byte3, uint8_t *dst, Access access) {
    constexpr size_t n = kLanes<D>;
    const hn::Repartition<uint16_t, D> d16;
    const auto lowHalves = hn::BitCast(d16, hn::InterleaveLower(d, byte0, byte1));
    const auto highHalves = hn::BitCast(d16, hn::InterleaveLower(d, byte2, byte3));
    access.store(d16, hn::InterleaveLower(d16, lowHalves, highHalves), dst);
    access.store(d16, hn::InterleaveUpper(d16, lowHalves, highHalves), dst + n);
    const auto lowHalves2 = hn::BitCast(d16, hn::InterleaveUpper(d, byte0, byte1));
    const auto highHalves2 = hn::BitCast(d16, hn::InterleaveUpper(d, byte2, byte3));
    access.store(d16, hn::InterleaveLower(d16, lowHalves2, highHalves2), dst + 2 * n);
    access.store(d16, hn::InterleaveUpper(d16, lowHalves2, highHalves2), dst + 3 * n);
}

// The same, of two blocks each whose quads come in QuadOrder::kNarrowed: to store every
// block by itself is cheaper than to bring quads across blocks.
template <class Access, class D>
HWY_INLINE void storeInterleavedByBlocks(D d, hn::Vec<D> byte0, hn::Vec<D> byte1, hn::Vec<D> byte2,
                                         hn::Vec<D> byte3, uint8_t *dst, Access access) {
    static_assert(kBytesOf<D> == 32);
    const hn::Repartition<uint16_t, D> d16;
    const hn::Half<decltype(d16)> block;
    const auto storeBlocks = [&](hn::Vec<decltype(d16)> pixels, size_t at) HWY_ATTR {
        access.store(block, hn::LowerHalf(block, pixels), dst + at);
        access.store(block, hn::UpperHalf(block, pixels), dst + at + 32);
    };
    const auto storePairs = [&](hn::Vec<D> lows, hn::Vec<D> highs, size_t at) HWY_ATTR {
        const auto low = hn::BitCast(d16, lows), high = hn::BitCast(d16, highs);
        storeBlocks(hn::InterleaveLower(d16, low, high), at);
        storeBlocks(hn::InterleaveUpper(d16, low, high), at + 16);
    };
    storePairs(hn::InterleaveLower(d, byte0, byte1), hn::InterleaveLower(d, byte2, byte3), 0);
    storePairs(hn::InterleaveUpper(d, byte0, byte1), hn::InterleaveUpper(d, byte2, byte3), 64);
}

// ---- Three bytes ----------------------------------------------------------

// 16 pixels have three parts of 16 bytes each in memory.
namespace detail {

// Which of the fields the byte of a part is of.
constexpr size_t fieldAt(size_t part, size_t byte) {
    return (16 * part + byte) % 3;
}

// The lookups that bring the bytes of a field to their places in all parts at
// once: no two parts have the same field at the same place.
template <size_t kField>
struct ToAllParts {
    alignas(16) uint8_t from[16] = {};
    constexpr ToAllParts() {
        for (size_t part = 0; part < 3; ++part)
            for (size_t byte = 0; byte < 16; ++byte)
                if (fieldAt(part, byte) == kField)
                    from[byte] = static_cast<uint8_t>((16 * part + byte) / 3);
    }
};
template <size_t kField>
inline constexpr ToAllParts<kField> kToAllParts;

// The same to one part, with 0 at the other fields' places.
template <size_t kField, size_t kPart>
struct ToPart {
    alignas(16) uint8_t from[16] = {};
    constexpr ToPart() {
        for (size_t byte = 0; byte < 16; ++byte)
            from[byte] =
                fieldAt(kPart, byte) == kField ? kToAllParts<kField>.from[byte] : uint8_t{0x80};
    }
};
template <size_t kField, size_t kPart>
inline constexpr ToPart<kField, kPart> kToPart;

#if QUILLON_X86_AVX512

// The bytes of a part that are of a field.
template <size_t kField, size_t kPart, class D>
HWY_INLINE hn::Mask<D> bytesOfField(D /*d*/) {
    constexpr uint64_t kMask = [] {
        uint64_t mask = 0;
        for (size_t byte = 0; byte < 64; ++byte)
            mask |= uint64_t{fieldAt(kPart, byte % 16) == kField} << byte;
        return mask;
    }();
    return hn::Mask<D>{static_cast<decltype(hn::Mask<D>::raw)>(kMask)};
}

// The blocks of the kVector-th of three vectors in memory that are of a part, as
// 64-bit lanes.
template <size_t kPart, size_t kVector, class D>
HWY_INLINE hn::Mask<D> blocksOfPart(D /*d*/) {
    constexpr uint8_t kMask = [] {
        uint8_t mask = 0;
        for (size_t block = 0; block < 4; ++block)
            if ((4 * kVector + block) % 3 == kPart)
                mask = static_cast<uint8_t>(mask | 3 << 2 * block);
        return mask;
    }();
    return hn::Mask<D>{kMask};
}

#endif

// One part of each block's pixels.
template <size_t kPart, class D>
HWY_INLINE hn::Vec<D> partOf(D d, hn::Vec<D> byte0, hn::Vec<D> byte1, hn::Vec<D> byte2) {
#if QUILLON_X86_AVX512
    // To select bytes takes no longer than to combine them, and the compiler does
    // each of these lookups once for the three parts.
    const auto all0 = hn::TableLookupBytes(byte0, hn::LoadDup128(d, kToAllParts<0>.from));
    const auto all1 = hn::TableLookupBytes(byte1, hn::LoadDup128(d, kToAllParts<1>.from));
    const auto all2 = hn::TableLookupBytes(byte2, hn::LoadDup128(d, kToAllParts<2>.from));
    const auto rest = hn::IfThenElse(bytesOfField<1, kPart>(d), all1, all2);
    return hn::IfThenElse(bytesOfField<0, kPart>(d), all0, rest);
#else
    const auto at0 = hn::TableLookupBytesOr0(byte0, hn::LoadDup128(d, kToPart<0, kPart>.from));
    const auto at1 = hn::TableLookupBytesOr0(byte1, hn::LoadDup128(d, kToPart<1, kPart>.from));
    const auto at2 = hn::TableLookupBytesOr0(byte2, hn::LoadDup128(d, kToPart<2, kPart>.from));
    return hn::Or(hn::Or(at0, at1), at2);
#endif
}

// The parts of all blocks, which have their pixels in QuadOrder::kForStore: in
// memory come the three parts of one block, then those of the next.
template <class Access, class D>
HWY_INLINE void storeThreeParts(D d, hn::Vec<D> part0, hn::Vec<D> part1, hn::Vec<D> part2,
                                uint8_t *dst, Access access) {
    constexpr size_t n = kLanes<D>;
    if constexpr (n == 16) {
        access.store(d, part0, dst);
        access.store(d, part1, dst + n);
        access.store(d, part2, dst + 2 * n);
    } else if constexpr (n == 32) {
        access.store(d, hn::ConcatLowerLower(d, part1, part0), dst);
        access.store(d, hn::ConcatUpperLower(d, part0, part2), dst + n);
        access.store(d, hn::ConcatUpperUpper(d, part2, part1), dst + 2 * n);
    } else {
#if QUILLON_X86_AVX512
        // The 16 bytes that come c-th in memory are of part c % 3.  In the first
        // part they are block c % 4 by the order of the quads; the others are
        // rotated to that.
        static_assert(n == 64);
        const hn::Repartition<uint64_t, D> d64;
        const auto a = hn::BitCast(d64, part0);
        const hn::Vec<decltype(d64)> b{_mm512_shuffle_i64x2(part1.raw, part1.raw, 0x93)};
        const hn::Vec<decltype(d64)> c{_mm512_shuffle_i64x2(part2.raw, part2.raw, 0x4E)};
        const auto merged = [&](auto isA, auto isB) HWY_ATTR {
            return hn::IfThenElse(isA, a, hn::IfThenElse(isB, b, c));
        };
        access.store(d64, merged(blocksOfPart<0, 0>(d64), blocksOfPart<1, 0>(d64)), dst);
        access.store(d64, merged(blocksOfPart<0, 1>(d64), blocksOfPart<1, 1>(d64)), dst + n);
        access.store(d64, merged(blocksOfPart<0, 2>(d64), blocksOfPart<1, 2>(d64)), dst + 2 * n);
#else
        constexpr size_t kBlocks = n / 16;
        HWY_ALIGN uint8_t parts[3 * n];
        HWY_ALIGN uint8_t bytes[3 * n];
        hn::Store(part0, d, parts);
        hn::Store(part1, d, parts + n);
        hn::Store(part2, d, parts + 2 * n);
        for (size_t c = 0; c < 3 * kBlocks; ++c)
            hwy::CopyBytes<16>(parts + c % 3 * n + 3 * (c / 3) % kBlocks * 16, bytes + 16 * c);
        for (size_t i = 0; i < 3 * n; i += n)
            access.store(d, hn::Load(d, bytes + i), dst + i);
#endif
    }
}

} // namespace detail

// As many pixels as there are lanes.
template <class Access, class D>
HWY_INLINE void storeInterleaved(D d, hn::Vec<D> byte0, hn::Vec<D> byte1, hn::Vec<D> byte2,
                                 uint8_t *dst, Access access) {
    detail::storeThreeParts(d, detail::partOf<0>(d, byte0, byte1, byte2),
                            detail::partOf<1>(d, byte0, byte1, byte2),
                            detail::partOf<2>(d, byte0, byte1, byte2), dst, access);
}

#endif
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
