// Conversions of a chunk of pixels.  Most pairs of formats go through 32-bit pixels, or
// a vector for each channel, which stay in registers.  As channelMoves says, this is
// exact.  Pairs whose pixels have at most 16 bits go directly.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_CONVERT_CONVERSION_BODIES_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_CONVERT_CONVERSION_BODIES_INL_H
#undef QUILLON_CONVERT_CONVERSION_BODIES_INL_H
#else
#define QUILLON_CONVERT_CONVERSION_BODIES_INL_H
#endif

#include "hwy/highway.h"

#include "convert/formatChannels-inl.h"
#include "convert/pixelFormats-inl.h"
#include "simd/pixelCopies-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
#if QUILLON_HAS_VECTORS

template <size_t kSrcBytesIn, size_t kDstBytesIn>
struct ConversionRow {
    static constexpr size_t kSrcBytes = kSrcBytesIn;
    static constexpr size_t kDstBytes = kDstBytesIn;
    uint8_t *dst;
    const uint8_t *src;

    template <class C>
    HWY_INLINE void prefetch(C /*chunk*/, size_t i, PrefetchDistance distance) const {
        prefetchLines(src + i * kSrcBytes, C::kUnits * kSrcBytes, distance.src);
        prefetchLines(dst + i * kDstBytes, C::kUnits * kDstBytes, distance.dst);
    }
};

template <class Source, class Destination>
struct ConvertThrough32Body : ConversionRow<Source::kBytes, Destination::kBytes> {
    const uint32_t *palette;
    NarrowingWeights weights;

    template <class C, class Access>
    HWY_INLINE void operator()(C /*chunk*/, size_t i, Access access) const {
        const hn::CappedTag<uint32_t, C::kUnits> d;
        constexpr bool kOpaque = Destination::kHasAlpha && !Source::kHasAlpha;
        hn::Vec<decltype(d)> pixels[C::kUnits / kLanes<decltype(d)>];
        Source::template load<kOpaque>(d, this->src + i * Source::kBytes, palette, pixels);
        Destination::store(d, pixels, this->dst + i * Destination::kBytes, weights, access);
    }
};

// Whole vectors by channels, the rest through 32-bit pixels.
template <PixelFormat kFrom, PixelFormat kTo>
struct ConvertByChannelsBody : ConvertThrough32Body<SourceOf<kFrom>, DestinationOf<kTo>> {
    template <class C, class Access>
    HWY_INLINE void operator()(C chunk, size_t i, Access access) const {
        if constexpr (C::kUnits == kVectorBytes) {
            const Widest<uint8_t> d;
            storeChannels<kTo>(d, loadChannels<kFrom, kTo>(d, this->src + i * this->kSrcBytes),
                               this->dst + i * this->kDstBytes);
        } else {
            ConvertThrough32Body<SourceOf<kFrom>, DestinationOf<kTo>>::operator()(chunk, i, access);
        }
    }
};

// The same from three or four bytes to the other of these.
template <PixelFormat kFrom, PixelFormat kTo>
struct ConvertByCopyBody : ConvertThrough32Body<SourceOf<kFrom>, DestinationOf<kTo>> {
    static constexpr size_t kMovingUnits = kVectorBytes;

    template <class C, class Access>
    HWY_INLINE void operator()(C chunk, size_t i, Access access) const {
        if constexpr (C::kUnits == kVectorBytes)
            movedTo(i).takeNext(chunk);
        else
            ConvertThrough32Body<SourceOf<kFrom>, DestinationOf<kTo>>::operator()(chunk, i, access);
    }

    HWY_INLINE ConvertByCopyBody movedTo(size_t i) const {
        ConvertByCopyBody moved = *this;
        moved.src += i * this->kSrcBytes;
        moved.dst += i * this->kDstBytes;
        return moved;
    }
    template <class C>
    HWY_INLINE void takeNext(C /*chunk*/) {
        if constexpr (kTo == PixelFormat::kRgb24)
            copyWithoutFourth<C::kUnits / kVectorBytes>(this->src, this->dst);
        else
            copyWithFourth<C::kUnits / kVectorBytes>(this->src, this->dst);
    }
};

// convertPixel in vectors of 16-bit lanes.
template <PixelFormat kFrom, PixelFormat kTo, size_t kMove = 0, class D16>
HWY_INLINE hn::Vec<D16> convertLanes(D16 d, hn::Vec<D16> p) {
    constexpr const ChannelMoves &all = kChannelMoves<kFrom, kTo>;
    constexpr ChannelMove move = all.moves[kMove];
    const auto moved = masked(d, shiftLanesRight<move.distance>(p), move.mask);
    if constexpr (kMove + 1 == all.count)
        return moved;
    else
        return hn::Or(moved, convertLanes<kFrom, kTo, kMove + 1>(d, p));
}

// From 16 bits to as many, or to a byte.
template <PixelFormat kFrom, PixelFormat kTo>
struct ConvertFrom16Body : ConversionRow<2, traitsOf(kTo).bytesPerPixel> {
    static constexpr size_t kDstBytes = traitsOf(kTo).bytesPerPixel;

    template <class C, class Access>
    HWY_INLINE void operator()(C /*chunk*/, size_t i, Access access) const {
        const hn::CappedTag<uint16_t, C::kUnits> d;
        const hn::CappedTag<uint8_t, C::kUnits> d8;
        constexpr size_t n = kLanes<decltype(d)>;
        const uint8_t *from = this->src + 2 * i;
        uint8_t *to = this->dst + kDstBytes * i;
        if constexpr (kDstBytes == 2) {
            for (size_t b = 0; b < 2 * C::kUnits; b += 2 * n)
                access.store(d, convertLanes<kFrom, kTo>(d, loadBytes(d, from + b)), to + b);
        } else if constexpr (n == C::kUnits) {
            access.store(d8, narrowOne(d8, d, convertLanes<kFrom, kTo>(d, loadBytes(d, from))), to);
        } else {
            const auto first = inRegister(loadBytes(d, from));
            const auto second = inRegister(loadBytes(d, from + 2 * n));
            access.store(d8,
                         narrowTo8(d8, convertLanes<kFrom, kTo>(d, first),
                                   convertLanes<kFrom, kTo>(d, second)),
                         to);
        }
    }
};

#endif
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
