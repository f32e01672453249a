// Bits to pixels of two colours.
#include "bits/bitsKernels.h"

#include "bits/bitReader.h"
#include "bits/bitsPlain.h"
#include "simd/thresholds.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "bits/bitsKernels.cpp"
#include "hwy/foreach_target.h"
#include "hwy/highway.h"

#include "bits/bitMasks-inl.h"
#include "simd/rowLoop-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {

#if QUILLON_HAS_VECTORS

template <size_t kBytes, class D>
struct TwoColours {
    PixelVectors<kBytes, D> background, change; // what a set bit changes of it

    template <class C, class Access>
    HWY_INLINE void store(C /*chunk*/, uint64_t bits, uint8_t *pixels, Access access) const {
        constexpr size_t n = kBytesOf<D>;
        const D d;
        for (size_t k = 0; k < C::kUnits * kBytes / n; ++k) {
            const auto set = setLanes<kBytes>(d, bits, k);
            const auto changed = hn::IfThenElseZero(set, change[k]);
            access.store(d, hn::Xor(background[k], changed), pixels + k * n);
        }
    }
};

template <size_t kBytes, class D, class Reader = BitReader>
struct ExpandBody {
    static constexpr size_t kDstBytes = kBytes;
    uint8_t *dst;
    Reader bits;
    const TwoColours<kBytes, D> &colours;

    template <class C, class Access>
    HWY_INLINE void operator()(C chunk, size_t i, Access access) const {
        colours.store(chunk, bits.template read<C::kUnits>(i), dst + i * kBytes, access);
    }

    template <class Use>
    HWY_INLINE void forChunksFrom(size_t begin, const Use &use) const {
        bits.withReaderFrom(begin, [&](auto reader) HWY_ATTR {
            use(ExpandBody<kBytes, D, decltype(reader)>{dst, reader, colours});
        });
    }
};

template <size_t kBytes, class Access, size_t kUnits>
void expandRowsBy(Chunk<kUnits> chunk, DstRows dst, SrcRows bits, Extent extent,
                  uint32_t foreground, uint32_t background) {
    using D = ChunkTag<kBytes, kUnits>;
    constexpr RowPolicy kPolicy = {.hasForChunksFrom = true};
    const TwoColours<kBytes, D> colours = {{D(), background}, {D(), foreground ^ background}};
    for (size_t y = 0; y < extent.height; ++y) {
        const ExpandBody<kBytes, D> body = {dst.row(y), {bits.row(y), extent.width}, colours};
        if constexpr (std::is_same_v<Access, Unaligned>)
            walkRow<kPolicy>(chunk, extent.width, body);
        else
            walkAlignedRow<Access, kPolicy>(chunk, extent.width, body);
    }
}

template <size_t kBytes>
void expandRows(DstRows dst, SrcRows bits, Extent extent, uint32_t foreground,
                uint32_t background) {
    const ByteExtent bytes = inBytes(extent, kBytes);
    if (bytes.rowBytes > kExpandUnalignedVectors * kVectorBytes) {
        const Chunk<64> chunk;
        if (!isNonTemporal(bytes))
            return expandRowsBy<kBytes, Aligned>(chunk, dst, bits, extent, foreground, background);
        expandRowsBy<kBytes, NonTemporal>(chunk, dst, bits, extent, foreground, background);
        hwy::FlushStream();
    } else if (extent.width < 8) {
        for (size_t y = 0; y < extent.height; ++y)
            expandRowPlain<kBytes>(dst.row(y), bits.row(y), extent.width, foreground, background);
    } else {
        withWidestChunk<64, 64, 32, 16, 8>(extent.width, [&](auto chunk) HWY_ATTR {
            expandRowsBy<kBytes, Unaligned>(chunk, dst, bits, extent, foreground, background);
        });
    }
}

#else

template <size_t kBytes>
void expandRows(DstRows dst, SrcRows bits, Extent extent, uint32_t foreground,
                uint32_t background) {
    for (size_t y = 0; y < extent.height; ++y)
        expandRowPlain<kBytes>(dst.row(y), bits.row(y), extent.width, foreground, background);
}

#endif

void expandKernel(DstRows dst, SrcRows bits, Extent extent, int32_t bytesPerPixel,
                  uint32_t foreground, uint32_t background) {
    switch (bytesPerPixel) {
    case 1:
        return expandRows<1>(dst, bits, extent, foreground, background);
    case 2:
        return expandRows<2>(dst, bits, extent, foreground, background);
    case 3:
        return expandRows<3>(dst, bits, extent, foreground, background);
    default:
        return expandRows<4>(dst, bits, extent, foreground, background);
    }
}

} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace quillon {

HWY_EXPORT(expandKernel);

void expandBitRows(DstRows dst, SrcRows bits, Extent extent, int32_t bytesPerPixel,
                   uint32_t foreground, uint32_t background) {
    HWY_DYNAMIC_DISPATCH(expandKernel)(dst, bits, extent, bytesPerPixel, foreground, background);
}

} // namespace quillon
#endif
