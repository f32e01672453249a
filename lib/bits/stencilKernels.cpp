// Bits to pixels of one colour, with gaps.
#include "bits/bitReader.h"
#include "bits/bitsKernels.h"
#include "bits/bitsPlain.h"
#include "simd/thresholds.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "bits/stencilKernels.cpp"
#include "hwy/foreach_target.h"
#include "hwy/highway.h"

#include "bits/bitMasks-inl.h"
#include "simd/rowLoop-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {

#if QUILLON_HAS_VECTORS

// Stores the pixels of a chunk whose bit is set by vectors, where there are stores
// that leave out lanes.
template <size_t kBytes>
class MaskedStencil {
public:
    HWY_INLINE explicit MaskedStencil(uint32_t pixel) : vectors_(D(), pixel) {}

    HWY_INLINE void store(uint64_t bits, uint8_t *dst) const {
        // One store takes no longer than it does to find that it is not needed.
        if (kBytes > 1 && bits == 0)
            return;
        for (size_t k = 0; k < kVectors; ++k)
            storeVector(bits, dst, k);
    }

    // The same where the chunk ends with the first count pixels.
    HWY_INLINE void storeFirst(uint64_t bits, uint8_t *dst, size_t count) const {
        if (kBytes > 1 && bits == 0)
            return;
#pragma GCC unroll 8 // k is a constant then, which the masks are made of
        for (size_t k = 0; k < kVectors && k * kBytesOf<D> < count * kBytes; ++k)
            storeVector(bits, dst, k);
    }

private:
    using D = ChunkTag<kBytes, 64>;
    static constexpr size_t kVectors = 64 * kBytes / kBytesOf<D>;

    HWY_INLINE void storeVector(uint64_t bits, uint8_t *dst, size_t k) const {
        const D d;
        storeSelected(d, setLanes<kBytes>(d, bits, k), vectors_[k], dst + k * kBytesOf<D>);
    }

    PixelVectors<kBytes, D> vectors_;
};

// The same pixel by pixel.
template <size_t kBytes>
class PixelwiseStencil {
public:
    explicit PixelwiseStencil(uint32_t pixel) : pixel_(pixel) {}

    HWY_INLINE void store(uint64_t bits, uint8_t *dst) const {
        // Two to a turn of the loop, which are 0.7 of the time where many bits are set:
        // jumps backward come one a cycle at most, and at some addresses less.
#pragma GCC unroll 2
        for (; bits != 0; bits &= bits - 1)
            storePixel<kBytes>(dst + firstSetPixel(bits) * kBytes, pixel_);
    }

    HWY_INLINE void storeFirst(uint64_t bits, uint8_t *dst, size_t /*count*/) const {
        store(bits, dst);
    }

private:
    uint32_t pixel_;
};

template <size_t kBytes>
inline constexpr bool kIsMasked = kHasMaskedStores<kBytes == 4 ? 4 : 1>;

template <size_t kBytes>
using Stencil =
    std::conditional_t<kIsMasked<kBytes>, MaskedStencil<kBytes>, PixelwiseStencil<kBytes>>;

template <size_t kBytes, class Reader = BitReader>
struct StencilBody {
    static constexpr size_t kDstBytes = kBytes;
    // Uncached, 0.83 of the time with AVX-512, but 1.3 times as much with AVX2 and 4 bytes.
    static constexpr bool kTestsEnd = kVectorBytes >= 64;
    uint8_t *dst;
    Reader bits;
    const Stencil<kBytes> &stencil;
    size_t prefetchEnd; // chunks from here on would prefetch beyond the row

    template <class C, class Access>
    HWY_INLINE void operator()(C /*chunk*/, size_t i, Access access) const {
        uint8_t *pixels = dst + i * kBytes;
        if constexpr (std::is_same_v<Access, FirstUnits>)
            stencil.storeFirst(bits.readFirst(i, access.count), pixels, access.count);
        else
            stencil.store(bits.template read<C::kUnits>(i), pixels);
    }

    template <class C>
    HWY_INLINE void prefetch(C /*chunk*/, size_t i, PrefetchDistance /*distance*/) const {
        if (i < prefetchEnd)
            prefetchLines(dst + i * kBytes, C::kUnits * kBytes, kPrefetchUncached);
    }

    template <class Use>
    HWY_INLINE void forChunksFrom(size_t begin, const Use &use) const {
        bits.withReaderFrom(begin, [&](auto reader) HWY_ATTR {
            use(StencilBody<kBytes, decltype(reader)>{dst, reader, stencil, prefetchEnd});
        });
    }
};

// Rows of at least 64 pixels.
template <size_t kBytes, bool kPrefetches>
void stencilRowsBy(DstRows dst, SrcRows bits, Extent extent, uint32_t pixel) {
    constexpr RowPolicy kPolicy = {
        .tail = Tail::kPartial, .prefetches = kPrefetches, .hasForChunksFrom = true};
    constexpr Chunk<64> chunk;
    const size_t prefetchEnd = kPrefetches ? extent.width - kPrefetchUncached / kBytes : 0;
    const Stencil<kBytes> stencil(pixel);
    for (size_t y = 0; y < extent.height; ++y) {
        const BitReader reader = {bits.row(y), extent.width};
        const StencilBody<kBytes> body = {dst.row(y), reader, stencil, prefetchEnd};
        if constexpr (kIsMasked<kBytes>)
            walkAlignedRow<Aligned, kPolicy>(chunk, extent.width, body);
        else
            walkRow<kPolicy>(chunk, extent.width, body);
    }
}

template <size_t kBytes, bool kHasWords>
HWY_NOINLINE void stencilShortRows(DstRows dst, SrcRows bits, Extent extent, uint32_t pixel) {
    const Stencil<kBytes> stencil(pixel);
    const ShortRowReader<kHasWords> reader(extent.width);
    for (size_t y = 0; y < extent.height; ++y)
        stencil.storeFirst(reader.read(bits.row(y)), dst.row(y), extent.width);
}

template <size_t kBytes>
void stencilRows(DstRows dst, SrcRows bits, Extent extent, uint32_t pixel) {
    if (extent.width < kStencilShortRow) {
        for (size_t y = 0; y < extent.height; ++y)
            stencilRowPlain<kBytes>(dst.row(y), bits.row(y), extent.width, pixel);
    } else if (extent.width <= 24) {
        stencilShortRows<kBytes, false>(dst, bits, extent, pixel);
    } else if (extent.width < 64) {
        stencilShortRows<kBytes, true>(dst, bits, extent, pixel);
    } else if (isPrefetchedStencil(inBytes(extent, kBytes))) {
        stencilRowsBy<kBytes, true>(dst, bits, extent, pixel);
    } else {
        stencilRowsBy<kBytes, false>(dst, bits, extent, pixel);
    }
}

#else

template <size_t kBytes>
void stencilRows(DstRows dst, SrcRows bits, Extent extent, uint32_t pixel) {
    for (size_t y = 0; y < extent.height; ++y)
        stencilRowPlain<kBytes>(dst.row(y), bits.row(y), extent.width, pixel);
}

#endif

void stencilKernel(DstRows dst, SrcRows bits, Extent extent, int32_t bytesPerPixel,
                   uint32_t pixel) {
    switch (bytesPerPixel) {
    case 1:
        return stencilRows<1>(dst, bits, extent, pixel);
    case 2:
        return stencilRows<2>(dst, bits, extent, pixel);
    case 3:
        return stencilRows<3>(dst, bits, extent, pixel);
    default:
        return stencilRows<4>(dst, bits, extent, pixel);
    }
}

} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace quillon {

HWY_EXPORT(stencilKernel);

void stencilBitRows(DstRows dst, SrcRows bits, Extent extent, int32_t bytesPerPixel,
                    uint32_t pixel) {
    HWY_DYNAMIC_DISPATCH(stencilKernel)(dst, bits, extent, bytesPerPixel, pixel);
}

} // namespace quillon
#endif
