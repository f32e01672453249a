// A row of a raster operation between two surfaces.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_ROP_ROP_COPY_ROW_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_ROP_ROP_COPY_ROW_INL_H
#undef QUILLON_ROP_ROP_COPY_ROW_INL_H
#else
#define QUILLON_ROP_ROP_COPY_ROW_INL_H
#endif

#include "hwy/highway.h"

#include "simd/rowLoop-inl.h"
#include "simd/thresholds.h"

#include <quillon/raster.h>

#include <algorithm>

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {
#if QUILLON_HAS_VECTORS

template <uint32_t kRop, class V>
HWY_INLINE V combine(V s, V d) {
    switch (kRop) {
    case RASTER_ROP_AND:
        return hn::And(s, d);
    case RASTER_ROP_AND_REVERSE:
        return hn::AndNot(d, s);
    case RASTER_ROP_AND_INVERTED:
        return hn::AndNot(s, d);
    case RASTER_ROP_XOR:
        return hn::Xor(s, d);
    case RASTER_ROP_OR:
        return hn::Or(s, d);
    case RASTER_ROP_NOR:
        return hn::Not(hn::Or(s, d));
    case RASTER_ROP_EQUIV:
        return hn::Not(hn::Xor(s, d));
    case RASTER_ROP_OR_REVERSE:
        return hn::Or(s, hn::Not(d));
    case RASTER_ROP_COPY_INVERTED:
        return hn::Not(s);
    case RASTER_ROP_OR_INVERTED:
        return hn::Or(hn::Not(s), d);
    default:
        return hn::Not(hn::And(s, d));
    }
}

template <uint32_t kRop>
struct RopCopyBody {
    static constexpr size_t kDstBytes = 1;
    uint8_t *dst;
    const uint8_t *src;

    template <class C, class Access>
    HWY_INLINE void operator()(C /*chunk*/, size_t i, Access access) const {
        const hn::CappedTag<uint8_t, C::kUnits> d;
        constexpr size_t n = kLanes<decltype(d)>;
        hn::Vec<decltype(d)> results[C::kUnits / n];
        for (size_t v = 0; v < C::kUnits / n; ++v)
            results[v] =
                combine<kRop>(access.load(d, src + i + v * n), access.load(d, dst + i + v * n));
        for (size_t v = 0; v < C::kUnits / n; ++v)
            access.store(d, results[v], dst + i + v * n);
    }
};

// The same with a pointer of its own for each surface, which is quicker where memory is
// what limits: 0.97 of the time.
template <uint32_t kRop>
struct RopCopyMovingBody : RopCopyBody<kRop> {
    static constexpr size_t kMovingUnits = kVectorBytes;

    HWY_INLINE RopCopyMovingBody movedTo(size_t i) const { return {this->dst + i, this->src + i}; }
    template <class C>
    HWY_INLINE void takeNext(C chunk) {
        (*this)(chunk, 0, Unaligned());
        this->dst = advancedInRegister(this->dst, C::kUnits);
        this->src = advancedInRegister(this->src, C::kUnits);
    }
};

// A row of surfaces that no cache of the core holds.
template <uint32_t kRop>
HWY_INLINE void ropCopyRowUncached(uint8_t *dst, const uint8_t *src, size_t rowBytes) {
    if constexpr (kVectorBytes >= 64) {
        walkRowOnce<1>(rowBytes, RopCopyMovingBody<kRop>{dst, src});
    } else {
        // By blocks, the next but one of which is prefetched, from each surface at once.
        constexpr size_t kBlock = kRopPrefetchBlock;
        for (size_t i = 0; i < rowBytes; i += kBlock) {
            if (rowBytes - i >= 3 * kBlock) {
                prefetchLines(src + i, kBlock, 2 * kBlock);
                prefetchLines(dst + i, kBlock, 2 * kBlock);
            }
            walkRowOnce<1, kVectorsAtOnce>(std::min(kBlock, rowBytes - i),
                                           RopCopyBody<kRop>{dst + i, src + i});
        }
    }
}

#endif
} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
