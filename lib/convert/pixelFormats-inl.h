// Sources and destinations of conversions: a source loads a chunk of pixels as vectors
// of 32-bit pixels, a destination stores such vectors.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_CONVERT_PIXEL_FORMATS_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_CONVERT_PIXEL_FORMATS_INL_H
#undef QUILLON_CONVERT_PIXEL_FORMATS_INL_H
#else
#define QUILLON_CONVERT_PIXEL_FORMATS_INL_H
#endif

#include "hwy/highway.h"

#include "convert/channels.h"
#include "convert/pixelFormats.h"
#include "simd/access-inl.h"
#include "simd/narrow-inl.h"
#include "simd/products-inl.h"
#include "simd/rgb24-inl.h"
#include "simd/shuffle-inl.h"
#include "simd/target-inl.h"

#include <tuple>
#include <type_traits>

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
#if QUILLON_HAS_VECTORS

template <class D>
HWY_INLINE hn::Vec<D> masked(D d, hn::Vec<D> v, uint32_t mask) {
    return hn::And(v, hn::Set(d, static_cast<hn::TFromD<D>>(mask)));
}

template <int kDistance, class V>
HWY_INLINE V shiftLanesRight(V v) {
    if constexpr (kDistance >= 0)
        return hn::ShiftRight<kDistance>(v);
    else
        return hn::ShiftLeft<-kDistance>(v);
}

// The bytes of a pixel, and whether there is alpha among them.
template <size_t kBytesIn, bool kHasAlphaIn>
struct Storage {
    static constexpr size_t kBytes = kBytesIn;
    static constexpr bool kHasAlpha = kHasAlphaIn;
};

// ---- Sources, which fill one, two or four vectors -------------------------
//
// kOpaque sets the alpha, which sources without one leave 0 otherwise.

struct FromIndex : Storage<1, true> {
    template <bool kOpaque, class D, size_t kVectors>
    HWY_INLINE static void load(D d, const uint8_t *src, const uint32_t *palette,
                                hn::Vec<D> (&pixels)[kVectors]) {
        for (size_t v = 0; v < kVectors; ++v)
            pixels[v] = lookup(d, src + v * kLanes<D>, palette);
    }

private:
    template <class D>
    HWY_INLINE static hn::Vec<D> lookup(D d, const uint8_t *src, const uint32_t *palette) {
        if constexpr (kLanes<D> == 1) {
            return hn::Set(d, palette[src[0]]);
        } else {
            const hn::Rebind<int32_t, D> index;
            const hn::Rebind<uint8_t, D> d8;
            return gather(d, palette, hn::PromoteTo(index, loadBytes(d8, src)));
        }
    }
};

// Two bytes of a pixel in each lane of 16 bits: blue and green, and red and alpha.
// There are half as many vectors of these as of 32-bit lanes.
template <PixelFormat kFormat>
struct From16Bits : Storage<2, false> {
    template <bool kOpaque, class D, size_t kVectors>
    HWY_INLINE static void load(D d, const uint8_t *src, const uint32_t * /*palette*/,
                                hn::Vec<D> (&pixels)[kVectors]) {
        if constexpr (kVectors == 1) {
            const hn::Rebind<uint16_t, D> d16;
            const auto p = loadBytes(d16, src);
            const auto high = hn::PromoteTo(d, redAndAlpha<kOpaque>(d16, p));
            pixels[0] = hn::Or(hn::PromoteTo(d, blueAndGreen(d16, p)), hn::ShiftLeft<16>(high));
        } else {
            const hn::Repartition<uint16_t, D> d16;
            for (size_t v = 0; v < kVectors; v += 2) {
                const auto p = loadForInterleave(d16, src + v * kLanes<D> * kBytes);
                interleaveHalves(d, blueAndGreen(d16, p), redAndAlpha<kOpaque>(d16, p), pixels[v],
                                 pixels[v + 1]);
            }
        }
    }

private:
    static constexpr WideningFactors kFactors = wideningFactors(traitsOf(kFormat).masks);

    template <class D16>
    HWY_INLINE static hn::Vec<D16> blueAndGreen(D16 d, hn::Vec<D16> p) {
        const auto blue =
            hn::MulHigh(hn::ShiftLeft<kFactors.blueShift>(p), hn::Set(d, kFactors.blue));
        const auto lowGreen = masked(d, hn::ShiftRight<kFactors.greenShift>(p), kFactors.greenMask);
        const auto green = hn::Mul(lowGreen, hn::Set(d, kFactors.green));
        return hn::Or(masked(d, green, 0xFF00), blue);
    }

    template <bool kOpaque, class D16>
    HWY_INLINE static hn::Vec<D16> redAndAlpha(D16 d, hn::Vec<D16> p) {
        const auto red = hn::MulHigh(masked(d, p, kFactors.redMask), hn::Set(d, kFactors.red));
        return kOpaque ? hn::Or(red, hn::Set(d, 0xFF00)) : red;
    }
};

struct From24Bits : Storage<3, false> {
    template <bool kOpaque, class D, size_t kVectors>
    HWY_INLINE static void load(D d, const uint8_t *src, const uint32_t * /*palette*/,
                                hn::Vec<D> (&pixels)[kVectors]) {
        for (size_t v = 0; v < kVectors; ++v) {
            const auto loaded = loadRgb24(d, src + v * kLanes<D> * kBytes);
            pixels[v] = kOpaque ? hn::Or(loaded, hn::Set(d, 0xFF000000)) : loaded;
        }
    }
};

struct From32Bits : Storage<4, true> {
    template <bool kOpaque, class D, size_t kVectors>
    HWY_INLINE static void load(D d, const uint8_t *src, const uint32_t * /*palette*/,
                                hn::Vec<D> (&pixels)[kVectors]) {
        for (size_t v = 0; v < kVectors; ++v)
            pixels[v] = loadBytes(d, src + v * kLanes<D> * kBytes);
    }
};

// By the bytes of a pixel, from 1 on.
template <PixelFormat kFormat>
using SourceOf =
    std::tuple_element_t<traitsOf(kFormat).bytesPerPixel - 1,
                         std::tuple<FromIndex, From16Bits<kFormat>, From24Bits, From32Bits>>;

// ---- Destinations ---------------------------------------------------------

// One or two bytes.  Formats of the same size share their code, and differ by their
// weights.
template <size_t kBytesIn>
struct ToFewBits : Storage<kBytesIn, false> {
    template <class D, size_t kVectors, class Access>
    HWY_INLINE static void store(D d, const hn::Vec<D> (&pixels)[kVectors], uint8_t *dst,
                                 const NarrowingWeights &weights, Access access) {
        using Lane = hwy::UnsignedFromSize<kBytesIn>;
        hn::Vec<D> v[kVectors];
        for (size_t i = 0; i < kVectors; ++i)
            v[i] = narrowed(d, pixels[i], weights);
        if constexpr (kVectors == 1) {
            const hn::Rebind<Lane, D> few;
            access.store(few, narrowOne(few, d, v[0]), dst);
        } else {
            storeWhole(hn::Repartition<Lane, D>(), v, dst, access);
        }
    }

private:
    template <class DNarrow, class V, size_t kVectors, class Access>
    HWY_INLINE static void storeWhole(DNarrow d, const V (&v)[kVectors], uint8_t *dst,
                                      Access access) {
        if constexpr (kBytesIn == 2) {
            for (size_t i = 0; i < kVectors; i += 2)
                access.store(d, narrowTo16(d, v[i], v[i + 1]), dst + i / 2 * kBytesOf<DNarrow>);
        } else if constexpr (kVectors == 4) {
            access.store(d, narrowTo8(d, v), dst);
        } else {
            const hn::Half<DNarrow> half;
            const V twice[4] = {v[0], v[1], v[0], v[1]};
            access.store(half, hn::LowerHalf(half, narrowTo8(d, twice)), dst);
        }
    }

    template <class D>
    HWY_INLINE static hn::Vec<D> narrowed(D d, hn::Vec<D> pixels, const NarrowingWeights &weights) {
        const auto bits = masked(d, pixels, weights.mask);
        const auto sum = weightedByteSum(d, bits, weights.bytes, weights.pairs);
        return hn::ShiftRight<narrowingDistance(kBytesIn)>(sum);
    }
};

struct To24Bits : Storage<3, false> {
    template <class D, size_t kVectors, class Access>
    HWY_INLINE static void store(D d, const hn::Vec<D> (&pixels)[kVectors], uint8_t *dst,
                                 const NarrowingWeights & /*weights*/, Access access) {
        // Beside aligned chunks, whole vectors across two cache lines would cost more than
        // these pieces.
        if constexpr (kVectors == 4 && !std::is_same_v<Access, RowEnd>)
            storeRgb24(d, pixels, dst, access);
        else
            for (size_t v = 0; v < kVectors; ++v)
                storeRgb24(d, pixels[v], dst + v * kLanes<D> * kBytes);
    }
};

struct To32Bits : Storage<4, true> {
    template <class D, size_t kVectors, class Access>
    HWY_INLINE static void store(D d, const hn::Vec<D> (&pixels)[kVectors], uint8_t *dst,
                                 const NarrowingWeights & /*weights*/, Access access) {
        for (size_t v = 0; v < kVectors; ++v)
            access.store(d, pixels[v], dst + v * kLanes<D> * kBytes);
    }
};

// By the bytes of a pixel, from 1 on.
template <PixelFormat kFormat>
using DestinationOf =
    std::tuple_element_t<traitsOf(kFormat).bytesPerPixel - 1,
                         std::tuple<ToFewBits<1>, ToFewBits<2>, To24Bits, To32Bits>>;

#endif
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
