#include "copy/copyKernels.h"

#include "simd/thresholds.h"

#include <cstring>

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "copy/copyKernels.cpp"
#include "hwy/foreach_target.h"
#include "hwy/highway.h"

#include "simd/rowLoop-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {

#if QUILLON_HAS_VECTORS

// ---- Rows that registers hold ---------------------------------------------

// Rows of one vector, of one to two, or of two to four: the last vectors overlap
// the first.
template <size_t kVectors, class D>
void copyRowsInRegisters(D d, DstRows dst, SrcRows src, ByteExtent extent) {
    constexpr size_t n = kBytesOf<D>;
    const size_t end = extent.rowBytes - n;
    for (size_t y = 0; y < extent.height; ++y) {
        uint8_t *to = dst.row(y);
        const uint8_t *from = src.row(y);
        const auto first = loadBytes(d, from);
        if constexpr (kVectors == 1) {
            storeBytes(d, first, to);
            continue;
        }
        const auto last = loadBytes(d, from + end);
        if constexpr (kVectors > 2) {
            const auto second = loadBytes(d, from + n);
            const auto third = loadBytes(d, from + end - n);
            storeBytes(d, second, to + n);
            storeBytes(d, third, to + end - n);
        }
        storeBytes(d, first, to);
        storeBytes(d, last, to + end);
    }
}

// Rows of 1 to 3 bytes.
void copyFewBytes(DstRows dst, SrcRows src, ByteExtent extent) {
    const size_t middle = extent.rowBytes / 2, end = extent.rowBytes - 1;
    for (size_t y = 0; y < extent.height; ++y) {
        uint8_t *to = dst.row(y);
        const uint8_t *from = src.row(y);
        const uint8_t first = from[0], second = from[middle], last = from[end];
        to[0] = first;
        to[middle] = second;
        to[end] = last;
    }
}

void copyShortKernel(DstRows dst, SrcRows src, ByteExtent extent) {
    if (extent.rowBytes > 4 * kVectorBytes) {
        for (size_t y = 0; y < extent.height; ++y)
            std::memmove(dst.row(y), src.row(y), extent.rowBytes);
    } else if (extent.rowBytes < 4) {
        copyFewBytes(dst, src, extent);
    } else {
        withWidestChunk<kVectorBytes, 64, 32, 16, 8, 4>(extent.rowBytes, [&](auto chunk) HWY_ATTR {
            const hn::CappedTag<uint32_t, chunk.kUnits / 4> d;
            if (extent.rowBytes > 2 * chunk.kUnits)
                copyRowsInRegisters<4>(d, dst, src, extent);
            else if (extent.rowBytes > chunk.kUnits)
                copyRowsInRegisters<2>(d, dst, src, extent);
            else
                copyRowsInRegisters<1>(d, dst, src, extent);
        });
    }
}

// ---- Longer rows ----------------------------------------------------------

struct CopyBody {
    static constexpr size_t kDstBytes = 1;
    uint8_t *dst;
    const uint8_t *src;

    template <class C, class Access>
    HWY_INLINE void operator()(C /*chunk*/, size_t i, Access access) const {
        const hn::CappedTag<uint8_t, C::kUnits> d;
        access.store(d, access.load(d, src + i), dst + i);
    }
};

// Where a vector is one block, memcpy does it with fewer instructions: by pairs.
void copyMediumKernel(DstRows dst, SrcRows src, ByteExtent extent) {
    constexpr RowPolicy kPolicy = {.unroll = 4};
    for (size_t y = 0; y < extent.height; ++y) {
        const CopyBody row = {dst.row(y), src.row(y)};
        if constexpr (kVectorBytes == 16)
            std::memcpy(row.dst, row.src, extent.rowBytes);
        else
            walkAlignedRow<Aligned, kPolicy>(Chunk<kVectorBytes>(), extent.rowBytes, row);
    }
}

void copyNonTemporalKernel(DstRows dst, SrcRows src, ByteExtent extent) {
    for (size_t y = 0; y < extent.height; ++y)
        walkAlignedRow<NonTemporal>(Chunk<kVectorBytes>(), extent.rowBytes,
                                    CopyBody{dst.row(y), src.row(y)});
    hwy::FlushStream();
}

#else

void copyShortKernel(DstRows dst, SrcRows src, ByteExtent extent) {
    for (size_t y = 0; y < extent.height; ++y)
        std::memmove(dst.row(y), src.row(y), extent.rowBytes);
}

void copyMediumKernel(DstRows dst, SrcRows src, ByteExtent extent) {
    copyShortKernel(dst, src, extent);
}

void copyNonTemporalKernel(DstRows dst, SrcRows src, ByteExtent extent) {
    copyShortKernel(dst, src, extent);
}

#endif

} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace quillon {

HWY_EXPORT(copyShortKernel);
HWY_EXPORT(copyMediumKernel);
HWY_EXPORT(copyNonTemporalKernel);

void copyShortRows(DstRows dst, SrcRows src, ByteExtent extent) {
    HWY_DYNAMIC_DISPATCH(copyShortKernel)(dst, src, extent);
}

void copyMediumRows(DstRows dst, SrcRows src, ByteExtent extent) {
    HWY_DYNAMIC_DISPATCH(copyMediumKernel)(dst, src, extent);
}

void copyNonTemporalRows(DstRows dst, SrcRows src, ByteExtent extent) {
    HWY_DYNAMIC_DISPATCH(copyNonTemporalKernel)(dst, src, extent);
}

} // namespace quillon
#endif
