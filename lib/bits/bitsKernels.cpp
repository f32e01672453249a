#include "bits/bitsKernels.h"

#include <array>
#include <bit>
#include <type_traits>

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "bits/bitsKernels.cpp"
#include "hwy/foreach_target.h"
#include "hwy/highway.h"

#include "legacy/kernels-inl.h"
#include "legacy/pixelPattern-inl.h"
#include "legacy/streaming-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {

// ---- Bits ---------------------------------------------------------------

// The bits of a block of up to 64 pixels are a number as it stands in memory: its
// lowest byte has the leftmost pixels, in each byte the highest bit is leftmost.
constexpr size_t kBlock = 64;

// The other way round: the highest bit of all is the leftmost pixel.
HWY_INLINE uint64_t leftmostHighest(uint64_t number) {
    return __builtin_bswap64(number);
}

// A row of 1 to 8 bytes, some of them read twice.
HWY_INLINE uint64_t fewBytes(const uint8_t *bits, size_t bytes) {
    const size_t middle = bytes / 2, last = bytes - 1;
    if (bytes < 4)
        return bits[0] | uint64_t{bits[middle]} << 8 * middle | uint64_t{bits[last]} << 8 * last;
    uint32_t first4 = 0, last4 = 0;
    hwy::CopyBytes<4>(bits, &first4);
    hwy::CopyBytes<4>(bits + bytes - 4, &last4);
    return first4 | uint64_t{last4} << 8 * (bytes - 4);
}

// The bits of a row, from a byte on.
struct WholeBytes {
    const uint8_t *first;

    // Of the pixels from i on, a multiple of 8.
    template <size_t kPixels>
    HWY_INLINE uint64_t block(size_t i) const {
        uint64_t number = 0;
        hwy::CopyBytes<kPixels / 8>(first + i / 8, &number);
        return number;
    }
};

// The bits of a row from within a byte on.
struct ShiftedBytes {
    WholeBytes bytes;
    size_t shift; // 1 to 7

    template <size_t kPixels>
    HWY_INLINE uint64_t block(size_t i) const {
        const uint64_t next = bytes.first[(i + kPixels) / 8];
        const uint64_t number = leftmostHighest(bytes.block<kPixels>(i)) << shift |
                                next >> (8 - shift) << (kBlock - kPixels);
        return leftmostHighest(number);
    }
};

// What reads the bits from pixel i on.
template <class Use>
HWY_INLINE void withBits(const uint8_t *bits, size_t i, const Use &use) {
    const WholeBytes bytes = {bits + i / 8};
    if (i % 8 == 0)
        use(bytes);
    else
        use(ShiftedBytes{bytes, i % 8});
}

template <size_t kBytes>
HWY_INLINE void storePixel(uint8_t *dst, uint32_t pixel) {
    if constexpr (kBytes == 3) {
        hwy::CopyBytes<2>(&pixel, dst);
        dst[2] = static_cast<uint8_t>(pixel >> 16);
    } else {
        hwy::CopyBytes<kBytes>(&pixel, dst);
    }
}

// Rows of whole bytes that lie end to end are one long row.
Size joinedBitRows(Size size, size_t bytesPerPixel, ptrdiff_t dstStep, ptrdiff_t bitsStep) {
    if (size.width % 8 != 0)
        return size;
    return joinedRows(size, size.width * bytesPerPixel, dstStep, size.width / 8, bitsStep);
}

#if HWY_TARGET != HWY_SCALAR

// ---- Blocks -------------------------------------------------------------

// The pixels of a block are vectors of bytes, whatever their size.  For each byte
// of them: which byte of the number has its bit, and which bit that is.
template <size_t kBytes>
HWY_ALIGN constexpr auto kSource = [] {
    std::array<uint8_t, kBlock *kBytes> sources = {};
    for (size_t i = 0; i < sources.size(); ++i)
        sources[i] = static_cast<uint8_t>(i / kBytes / 8);
    return sources;
}();
template <size_t kBytes>
HWY_ALIGN constexpr auto kBit = [] {
    std::array<uint8_t, kBlock *kBytes> bits = {};
    for (size_t i = 0; i < bits.size(); ++i)
        bits[i] = static_cast<uint8_t>(0x80 >> i / kBytes % 8);
    return bits;
}();

// The widest vectors of which there is a whole number in so many pixels.
template <size_t kBytes, size_t kPixels>
using BlockTag = std::conditional_t<kBytes == 4, hn::CappedTag<uint32_t, kPixels>,
                                    hn::CappedTag<uint8_t, kPixels *(kBytes == 3 ? 1 : kBytes)>>;

template <class D>
constexpr size_t kVectorBytes = kLanes<D> * sizeof(hn::TFromD<D>);

// Vector k of a colour: there are three that differ where pixels have 3 bytes.
template <size_t kBytes, class D>
struct Colour {
    static constexpr size_t kVectors = kBytes == 3 ? 3 : 1;
    hn::Vec<D> vectors[kVectors];

    HWY_INLINE Colour(D d, uint32_t pixel) {
        const hn::Repartition<uint32_t, D> d32;
        const PixelPattern pattern(pixel, kBytes);
        for (size_t k = 0; k < kVectors; ++k)
            vectors[k] = hn::BitCast(d, pattern.from(d32, k * kVectorBytes<D>));
    }
    HWY_INLINE hn::Vec<D> operator[](size_t k) const { return vectors[k % kVectors]; }
};

// Vector k's bytes whose bit is set.
template <size_t kBytes, class D>
HWY_INLINE hn::Mask<D> setBytes(D d, uint64_t number, size_t k) {
    const hn::Repartition<uint64_t, D> d64;
    const size_t at = k * kLanes<D>;
    const auto spread = hn::TableLookupBytes(hn::BitCast(d, hn::Set(d64, number)),
                                             hn::Load(d, kSource<kBytes>.data() + at));
    return hn::TestBit(spread, hn::Load(d, kBit<kBytes>.data() + at));
}

// Where words are pixels, half a number has the bits of 32 in each.
HWY_ALIGN constexpr auto kWordBit = [] {
    std::array<uint32_t, 32> bits = {};
    for (size_t i = 0; i < bits.size(); ++i)
        bits[i] = uint32_t{1} << (i ^ 7);
    return bits;
}();

// Vector k's lanes whose bit is set.
template <size_t kBytes, class D>
HWY_INLINE hn::Mask<D> setLanes(D d, uint64_t number, size_t k) {
    if constexpr (kBytes == 4) {
        const size_t pixel = k * kLanes<D>;
        const auto half = static_cast<uint32_t>(number >> pixel / 32 * 32);
        return hn::TestBit(hn::Set(d, half), hn::Load(d, kWordBit.data() + pixel % 32));
    } else {
        return setBytes<kBytes>(d, number, k);
    }
}

// ---- Opaque -------------------------------------------------------------

template <size_t kBytes, size_t kPixels>
struct Expansion {
    using D = BlockTag<kBytes, kPixels>;
    static constexpr size_t kVector = kVectorBytes<D>;

    Colour<kBytes, D> background, change;

    template <class Store>
    HWY_INLINE void block(uint64_t number, uint8_t *dst) const {
        const D d;
        for (size_t k = 0; k < kPixels * kBytes / kVector; ++k) {
            const auto changed = hn::IfThenElseZero(setLanes<kBytes>(d, number, k), change[k]);
            Store::store(d, hn::Xor(background[k], changed), dst + k * kVector);
        }
    }

    // At least kPixels of them.  The first block and the last one may overlap
    // those between, which begin at head.
    template <class Store>
    HWY_INLINE void row(uint8_t *dst, const uint8_t *bits, size_t count, size_t head) const {
        block<ThroughCaches>(WholeBytes{bits}.block<kPixels>(0), dst);
        const size_t last = count - kPixels;
        withBits(bits, head, [&](const auto &from) HWY_ATTR {
            for (size_t i = head; i <= last; i += kPixels)
                block<Store>(from.template block<kPixels>(i - head), dst + i * kBytes);
        });
        if ((count - head) % kPixels != 0)
            withBits(bits, last, [&](const auto &from) HWY_ATTR {
                block<ThroughCaches>(from.template block<kPixels>(0), dst + last * kBytes);
            });
    }
};

template <size_t kBytes, size_t kPixels>
void opaqueRows(DstRows dst, SrcRows bits, Size size, uint32_t foreground, uint32_t background) {
    using E = Expansion<kBytes, kPixels>;
    const typename E::D d;
    const E expansion = {{d, background}, {d, foreground ^ background}};
    const bool streams = isStreamed(size.width * kBytes, size.height);
    for (size_t y = 0; y < size.height; ++y) {
        uint8_t *row = dst.row(y);
        size_t head = kPixels;
        // On short rows what the first and the last block write twice costs more
        // than lines that are crossed.
        if (kPixels == kBlock && size.width * kBytes > 16 * E::kVector)
            head = pixelsToLine<kBytes>(row);
        if (streams && head != kBlock)
            expansion.template row<AroundCaches>(row, bits.row(y), size.width, head);
        else
            expansion.template row<ThroughCaches>(row, bits.row(y), size.width, head);
    }
    if (streams)
        hwy::FlushStream();
}

// Rows shorter than the smallest block.
template <size_t kBytes>
void fewPixels(DstRows dst, SrcRows bits, Size size, uint32_t foreground, uint32_t background) {
    for (size_t y = 0; y < size.height; ++y)
        for (size_t i = 0; i < size.width; ++i)
            storePixel<kBytes>(dst.row(y) + i * kBytes,
                               bits.row(y)[0] << i & 0x80 ? foreground : background);
}

template <size_t kBytes>
void opaque(DstRows dst, SrcRows bits, Size size, uint32_t foreground, uint32_t background) {
    size = joinedBitRows(size, kBytes, dst.step, bits.step);
    if (size.width >= 64)
        opaqueRows<kBytes, 64>(dst, bits, size, foreground, background);
    else if (size.width >= 32)
        opaqueRows<kBytes, 32>(dst, bits, size, foreground, background);
    else if (size.width >= 16)
        opaqueRows<kBytes, 16>(dst, bits, size, foreground, background);
    else if (size.width >= 8)
        opaqueRows<kBytes, 8>(dst, bits, size, foreground, background);
    else
        fewPixels<kBytes>(dst, bits, size, foreground, background);
}

#else

template <size_t kBytes>
void opaque(DstRows dst, SrcRows bits, Size size, uint32_t foreground, uint32_t background) {
    for (size_t y = 0; y < size.height; ++y)
        for (size_t i = 0; i < size.width; ++i)
            storePixel<kBytes>(dst.row(y) + i * kBytes,
                               bits.row(y)[i / 8] << i % 8 & 0x80 ? foreground : background);
}

#endif

void BitsToPixels(DstRows dst, SrcRows bits, Size size, int32_t bytesPerPixel, uint32_t foreground,
                  uint32_t background) {
    switch (bytesPerPixel) {
    case 1:
        return opaque<1>(dst, bits, size, foreground, background);
    case 2:
        return opaque<2>(dst, bits, size, foreground, background);
    case 3:
        return opaque<3>(dst, bits, size, foreground, background);
    default:
        return opaque<4>(dst, bits, size, foreground, background);
    }
}

// ---- Stencil ------------------------------------------------------------

// Stores that leave bytes alone: AVX-512 has them for any, AVX2 for words.
template <size_t kBytes>
constexpr bool kMasked = HWY_TARGET == HWY_AVX3 || (HWY_TARGET == HWY_AVX2 && kBytes == 4);

template <size_t kBytes>
class Stencil {
public:
    explicit Stencil(uint32_t pixel) : pixel_(pixel) {}

    // Of a row that ends no sooner than after so many pixels.
    HWY_INLINE void block(uint64_t number, uint8_t *dst, size_t /*pixels*/ = kBlock) const {
        for (; number != 0; number &= number - 1)
            storePixel<kBytes>(dst + static_cast<size_t>(std::countr_zero(number) ^ 7) * kBytes,
                               pixel_);
    }

private:
    uint32_t pixel_;
};

#if HWY_TARGET == HWY_AVX3 || HWY_TARGET == HWY_AVX2

template <size_t kBytes>
requires kMasked<kBytes>
class Stencil<kBytes> {
public:
    explicit Stencil(uint32_t pixel) : colour_(D(), pixel) {}

    HWY_INLINE void block(uint64_t number, uint8_t *dst, size_t pixels = kBlock) const {
        // One store takes no longer than it does to find that it is not needed.
        if (kBytes > 1 && number == 0)
            return;
        const D d;
        for (size_t k = 0; k * kVectorBytes<D> < pixels * kBytes; ++k) {
            const auto set = setLanes<kBytes>(d, number, k);
            uint8_t *to = dst + k * kVectorBytes<D>;
#if HWY_TARGET == HWY_AVX3
            if constexpr (kBytes == 4)
                _mm512_mask_storeu_epi32(to, set.raw, colour_[k].raw);
            else
                _mm512_mask_storeu_epi8(to, set.raw, colour_[k].raw);
#else
            _mm256_maskstore_epi32(reinterpret_cast<int *>(to), set.raw, colour_[k].raw);
#endif
        }
    }

private:
    using D = BlockTag<kBytes, kBlock>;
    Colour<kBytes, D> colour_;
};

#endif

// With masked stores the blocks between the first and the last begin with a cache
// line where a pixel does.
template <size_t kBytes>
HWY_INLINE void stencilRow(const Stencil<kBytes> &stencil, uint8_t *dst, const uint8_t *bits,
                           size_t count, bool isLarge) {
    // The leftmost pixels of a block, all of them but so many.
    const auto without = [](size_t rest) { return leftmostHighest(~uint64_t{0} << rest); };
    if (count < kBlock)
        return stencil.block(fewBytes(bits, (count + 7) / 8) & without(kBlock - count), dst, count);
    const size_t head = kMasked<kBytes> ? pixelsToLine<kBytes>(dst) % kBlock : 0;
    if (head != 0)
        stencil.block(WholeBytes{bits}.block<kBlock>(0) & without(kBlock - head), dst);
    const size_t last = count - kBlock;
    // Stores that leave bytes alone wait for the lines that hold them.
    constexpr size_t kAhead = 2048 / kBytes;
    const size_t fetched = isLarge && last > kAhead ? last - kAhead : 0;
    withBits(bits, head, [&](const auto &from) HWY_ATTR {
        for (size_t i = head; i <= last; i += kBlock) {
            if (i < fetched)
                for (size_t line = 0; line < kBytes; ++line)
                    hwy::Prefetch(dst + (i + kAhead) * kBytes + 64 * line);
            stencil.block(from.template block<kBlock>(i - head), dst + i * kBytes);
        }
    });
    // Pixels of the last block that the one before had: all but the rightmost.
    const size_t had = (kBlock - (count - head) % kBlock) % kBlock;
    if (had != 0)
        withBits(bits, last, [&](const auto &from) HWY_ATTR {
            stencil.block(from.template block<kBlock>(0) & ~without(kBlock - had),
                          dst + last * kBytes);
        });
}

// Rows too short to be worth a block.
template <size_t kBytes>
void stencilFewPixels(DstRows dst, SrcRows bits, Size size, uint32_t pixel) {
    uint8_t *row = dst.first;
    const uint8_t *rowBits = bits.first;
    for (size_t y = 0; y < size.height; ++y) {
        for (size_t i = 0; i < size.width; ++i) {
            if ((rowBits[0] << i & 0x80) != 0)
                storePixel<kBytes>(row + i * kBytes, pixel);
        }
        row = advance(row, static_cast<uint64_t>(dst.step));
        rowBits = advance(rowBits, static_cast<uint64_t>(bits.step));
    }
}

template <size_t kBytes>
void stencilRows(DstRows dst, SrcRows bits, Size size, uint32_t pixel) {
    size = joinedBitRows(size, kBytes, dst.step, bits.step);
    if (size.width < 4)
        return stencilFewPixels<kBytes>(dst, bits, size, pixel);
    const Stencil<kBytes> stencil(pixel);
    const bool isLarge = size.width * kBytes * size.height >= kStreamedBytes;
    for (size_t y = 0; y < size.height; ++y)
        stencilRow(stencil, dst.row(y), bits.row(y), size.width, isLarge);
}

void StencilRows(DstRows dst, SrcRows bits, Size size, int32_t bytesPerPixel, uint32_t pixel) {
    switch (bytesPerPixel) {
    case 1:
        return stencilRows<1>(dst, bits, size, pixel);
    case 2:
        return stencilRows<2>(dst, bits, size, pixel);
    case 3:
        return stencilRows<3>(dst, bits, size, pixel);
    default:
        return stencilRows<4>(dst, bits, size, pixel);
    }
}

} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace quillon {

HWY_EXPORT(BitsToPixels);
HWY_EXPORT(StencilRows);

void bitsToPixelRows(DstRows dst, SrcRows bits, Size size, int32_t bytesPerPixel,
                     uint32_t foreground, uint32_t background) {
    HWY_DYNAMIC_DISPATCH(BitsToPixels)(dst, bits, size, bytesPerPixel, foreground, background);
}

void stencilRows(DstRows dst, SrcRows bits, Size size, int32_t bytesPerPixel, uint32_t pixel) {
    HWY_DYNAMIC_DISPATCH(StencilRows)(dst, bits, size, bytesPerPixel, pixel);
}

} // namespace quillon
#endif
