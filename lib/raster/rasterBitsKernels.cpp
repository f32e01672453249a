#include "raster/rasterBitsKernels.h"

#include <array>
#include <bit>

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "raster/rasterBitsKernels.cpp"
#include "hwy/foreach_target.h"
#include "hwy/highway.h"

#include "raster/bytePattern-inl.h"
#include "raster/kernels-inl.h"
#include "raster/packed24-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {

// ---- Opaque -------------------------------------------------------------

// Per lane, one bit of a number: the leftmost pixel is the highest of count bits.
template <class T, size_t kCount>
constexpr std::array<T, kCount> laneBits(size_t bitsPerNumber) {
    std::array<T, kCount> bits = {};
    for (size_t lane = 0; lane < kCount; ++lane)
        bits[lane] = static_cast<T>(uint64_t{1} << (bitsPerNumber - 1 - lane % bitsPerNumber));
    return bits;
}

// Per byte of a vector, which byte of eight holds its lane's bit; in the upper
// bytes of a lane none does.
template <class T, size_t kCount>
constexpr std::array<uint8_t, kCount * sizeof(T)> laneSources() {
    std::array<uint8_t, kCount * sizeof(T)> sources = {};
    for (size_t i = 0; i < sources.size(); ++i)
        sources[i] = i % sizeof(T) == 0 ? static_cast<uint8_t>(i / sizeof(T) / 8) : 0x80;
    return sources;
}

// The lanes whose bit is set, for the pixels from i on.  i is a multiple of the
// number of lanes, so that no byte is read for less than a whole share of it.
template <class D>
HWY_INLINE hn::Mask<D> setBits(D d, const uint8_t *bits, size_t i) {
    using T = hn::TFromD<D>;
    constexpr size_t n = kLanes<D>;
    if constexpr (n < 8) {
        const uint32_t shifted = uint32_t{bits[i / 8]} << (i % 8) & 0xFF;
        HWY_ALIGN static constexpr auto kBit = laneBits<T, n>(8);
        return hn::TestBit(hn::Set(d, static_cast<T>(shifted)), hn::Load(d, kBit.data()));
    } else if constexpr (n <= 8 * sizeof(T)) {
        uint64_t number = 0;
        for (size_t byte = 0; byte < n / 8; ++byte)
            number = number << 8 | bits[i / 8 + byte];
        HWY_ALIGN static constexpr auto kBit = laneBits<T, n>(n);
        return hn::TestBit(hn::Set(d, static_cast<T>(number)), hn::Load(d, kBit.data()));
    } else {
        const hn::Repartition<uint64_t, D> d64;
        const hn::Repartition<uint8_t, D> d8;
        uint64_t eight = 0;
        hwy::CopyBytes<n / 8>(bits + i / 8, &eight);
        HWY_ALIGN static constexpr auto kSource = laneSources<T, n>();
        HWY_ALIGN static constexpr auto kBit = laneBits<T, n>(8);
        const auto spread = hn::TableLookupBytesOr0(hn::BitCast(d8, hn::Set(d64, eight)),
                                                    hn::Load(d8, kSource.data()));
        return hn::TestBit(hn::BitCast(d, spread), hn::Load(d, kBit.data()));
    }
}

template <class T>
struct OpaqueBody {
    static constexpr size_t kBytes = sizeof(T);
    using Lane = T;

    uint8_t *dst;
    const uint8_t *bits;
    uint32_t foreground;
    uint32_t background;

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        const auto v = hn::IfThenElse(setBits(d, bits, i), hn::Set(d, static_cast<T>(foreground)),
                                      hn::Set(d, static_cast<T>(background)));
        hn::StoreU(v, d, reinterpret_cast<T *>(dst) + i);
    }
};

struct OpaqueBody24 {
    static constexpr size_t kBytes = 3;
    using Lane = uint32_t;

    uint8_t *dst;
    const uint8_t *bits;
    uint32_t foreground;
    uint32_t background;

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        const auto v =
            hn::IfThenElse(setBits(d, bits, i), hn::Set(d, foreground), hn::Set(d, background));
        store24(d, v, dst + 3 * i);
    }
};

// Rows of whole bytes that lie end to end are one long row.
Size joinedBitRows(Size size, size_t bytesPerPixel, ptrdiff_t dstStep, ptrdiff_t bitsStep) {
    if (size.width % 8 != 0)
        return size;
    return joinedRows(size, size.width * bytesPerPixel, dstStep, size.width / 8, bitsStep);
}

template <class Body>
void opaqueRows(DstRows dst, SrcRows bits, Size size, uint32 foreground, uint32 background) {
    size = joinedBitRows(size, Body::kBytes, dst.step, bits.step);
    for (size_t y = 0; y < size.height; ++y)
        walkOnce<typename Body::Lane>(size.width,
                                      Body{dst.row(y), bits.row(y), foreground, background});
}

void BitsToPixels(DstRows dst, SrcRows bits, Size size, int32 bytesPerPixel, uint32 foreground,
                  uint32 background) {
    switch (bytesPerPixel) {
    case 1:
        return opaqueRows<OpaqueBody<uint8_t>>(dst, bits, size, foreground, background);
    case 2:
        return opaqueRows<OpaqueBody<uint16_t>>(dst, bits, size, foreground, background);
    case 3:
        return opaqueRows<OpaqueBody24>(dst, bits, size, foreground, background);
    default:
        return opaqueRows<OpaqueBody<uint32_t>>(dst, bits, size, foreground, background);
    }
}

// ---- Stencil ------------------------------------------------------------

// Up to 64 bits of a row from byte-aligned pixel i on, the leftmost in bit 0.
HWY_INLINE uint64_t stencilBits(const uint8_t *bits, size_t i, size_t count) {
    uint64_t eight = 0;
    const size_t rest = HWY_MIN(count - i, size_t{64});
    if (rest > 56)
        hwy::CopyBytes<8>(bits + i / 8, &eight);
    else
        for (size_t byte = 0; byte < (rest + 7) / 8; ++byte)
            eight |= uint64_t{bits[i / 8 + byte]} << (8 * byte);
    // Reverse the bits of each byte.
    eight = (eight >> 4 & 0x0F0F0F0F0F0F0F0F) | (eight & 0x0F0F0F0F0F0F0F0F) << 4;
    eight = (eight >> 2 & 0x3333333333333333) | (eight & 0x3333333333333333) << 2;
    eight = (eight >> 1 & 0x5555555555555555) | (eight & 0x5555555555555555) << 1;
    return eight & (~uint64_t{0} >> (64 - rest));
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

#if HWY_TARGET == HWY_AVX3

// Only AVX-512 has stores that leave bytes alone at every pixel size.
template <size_t kBytes>
HWY_INLINE void stencil64(uint8_t *dst, uint64_t set, const BytePattern<64> &pattern) {
    const __m512i v = _mm512_loadu_si512(pattern.bytes);
    if constexpr (kBytes == 1) {
        _mm512_mask_storeu_epi8(dst, set, v);
    } else if constexpr (kBytes == 2) {
        for (; set != 0; set >>= 32, dst += 64)
            _mm512_mask_storeu_epi16(dst, static_cast<__mmask32>(set), v);
    } else if constexpr (kBytes == 3) {
        for (; set != 0; set >>= 16, dst += 48)
            _mm512_mask_storeu_epi8(dst, 7 * _pdep_u64(set, 0x249249249249), v);
    } else {
        for (; set != 0; set >>= 16, dst += 64)
            _mm512_mask_storeu_epi32(dst, static_cast<__mmask16>(set), v);
    }
}

template <size_t kBytes>
void stencil(DstRows dst, SrcRows bits, Size size, uint32 pixel) {
    const BytePattern<64> pattern(pixel, kBytes);
    for (size_t y = 0; y < size.height; ++y) {
        for (size_t i = 0; i < size.width; i += 64)
            stencil64<kBytes>(dst.row(y) + i * kBytes, stencilBits(bits.row(y), i, size.width),
                              pattern);
    }
}

#else

template <size_t kBytes>
void stencil(DstRows dst, SrcRows bits, Size size, uint32 pixel) {
    for (size_t y = 0; y < size.height; ++y) {
        for (size_t i = 0; i < size.width; i += 64) {
            uint8_t *at = dst.row(y) + i * kBytes;
            uint64_t set = stencilBits(bits.row(y), i, size.width);
            for (; set != 0; set &= set - 1)
                storePixel<kBytes>(at + static_cast<size_t>(std::countr_zero(set)) * kBytes, pixel);
        }
    }
}

#endif

void Stencil(DstRows dst, SrcRows bits, Size size, int32 bytesPerPixel, uint32 pixel) {
    size = joinedBitRows(size, static_cast<size_t>(bytesPerPixel), dst.step, bits.step);
    switch (bytesPerPixel) {
    case 1:
        return stencil<1>(dst, bits, size, pixel);
    case 2:
        return stencil<2>(dst, bits, size, pixel);
    case 3:
        return stencil<3>(dst, bits, size, pixel);
    default:
        return stencil<4>(dst, bits, size, pixel);
    }
}

} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace quillon {

HWY_EXPORT(BitsToPixels);
HWY_EXPORT(Stencil);

void bitsToPixelRows(DstRows dst, SrcRows bits, Size size, int32 bytesPerPixel, uint32 foreground,
                     uint32 background) {
    HWY_DYNAMIC_DISPATCH(BitsToPixels)(dst, bits, size, bytesPerPixel, foreground, background);
}

void stencilRows(DstRows dst, SrcRows bits, Size size, int32 bytesPerPixel, uint32 pixel) {
    HWY_DYNAMIC_DISPATCH(Stencil)(dst, bits, size, bytesPerPixel, pixel);
}

} // namespace quillon
#endif
