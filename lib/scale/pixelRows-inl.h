// What the row kernels of the scaler share: how they walk a row of pixels, and how
// they pick source pixels by their position.
//
// Where positions advance slowly, what a vector needs lies close together in the
// source: it is read as whole vectors, the windows, and picked from them by index.
// A window that would reach past the end of the row is moved back to end with it.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_SCALE_PIXEL_ROWS_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_SCALE_PIXEL_ROWS_INL_H
#undef QUILLON_SCALE_PIXEL_ROWS_INL_H
#else
#define QUILLON_SCALE_PIXEL_ROWS_INL_H
#endif

#include "hwy/highway.h"

#include "scale/scalePlain.h"
#include "simd/rowLoop-inl.h"
#include "simd/shuffle-inl.h"
#include "simd/thresholds.h"

#include <algorithm>
#include <type_traits>

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {
#if QUILLON_HAS_VECTORS

inline constexpr size_t kVectorPixels = kVectorBytes / 4;

// The vector of a chunk of pixels.
template <class C>
using PixelTag = hn::CappedTag<uint32_t, C::kUnits>;

// ---- Walks ----------------------------------------------------------------

// For withWidestChunk; not a lambda, which the compiler might not inline.
template <class Body>
struct WalkWithChunk {
    size_t count;
    const Body &body;

    template <class C>
    HWY_INLINE void operator()(C chunk) const {
        if (C::kUnits > 1 && count < C::kUnits)
            __builtin_unreachable();
        walkRow(chunk, count, body);
    }
};

// A row of any length, for bodies that store the same bytes when run again.  Chunks
// are of kMost pixels or less, and of at most limit: what the windows of a chunk have
// room for in the source row.
template <size_t kMost = kVectorPixels, class Body>
HWY_INLINE void walkPixels(size_t count, const Body &body, size_t limit = kMost) {
    withWidestChunk<kMost, 16, 8, 4, 2, 1>(std::min(count, limit),
                                           WalkWithChunk<Body>{count, body});
}

// The same, whose stores are unaligned (Unaligned), or begin with a cache line and
// go through the caches (Aligned) or around them (NonTemporal).  The access is chosen
// once for all rows: a row that decides by itself costs short ones a fifth.
template <class Access, size_t kMost = kVectorPixels, class Body>
HWY_INLINE void walkPixelsBy(size_t count, const Body &body) {
    if constexpr (!std::is_same_v<Access, Unaligned>) {
        if (count >= kMost)
            return walkAlignedRow<Access>(Chunk<kMost>(), count, body);
    }
    walkPixels<kMost>(count, body);
}

// The same, by a kind of body that prefetches its source or does not, and the numbers that
// it is for, if any.  Rows that are worth it have whole vectors.
template <template <bool kPrefetches, uint32_t...> class Body, uint32_t... kNumbers,
          class... Members>
HWY_INLINE void walkPixelsOf(bool prefetches, size_t count, size_t limit, Members... members) {
    if (kPrefetchesAhead && prefetches && std::min(count, limit) >= kVectorPixels)
        walkRow(Chunk<kVectorPixels>(), count, Body<true, kNumbers...>{members...});
    else
        walkPixels(count, Body<false, kNumbers...>{members...}, limit);
}

template <bool kPrefetches>
HWY_INLINE void prefetchSource(const uint8_t *from, size_t bytes) {
    if constexpr (kPrefetches)
        prefetchLines(from, bytes, kPrefetchUncached);
}

struct FillPixelsBody {
    uint8_t *dst;
    uint32_t pixel;

    template <class C, class Access>
    HWY_INLINE void operator()(C /*chunk*/, size_t i, Access access) const {
        const PixelTag<C> d;
        access.store(d, hn::Set(d, pixel), dst + 4 * i);
    }
};

// count copies of a source pixel.
HWY_INLINE void fillPixels(uint8_t *dst, const uint8_t *src, size_t index, size_t count) {
    if (count == 0)
        return;
    const uint32_t pixel = pixelAt(src, index);
    if (count < 4) { // mostly: the ends of rows that are enlarged
        putPixel(dst, 0, pixel);
        putPixel(dst, count / 2, pixel);
        putPixel(dst, count - 1, pixel);
        return;
    }
    walkPixels(count, FillPixelsBody{dst, pixel});
}

// ---- Windows --------------------------------------------------------------

// The positions of one vector's pixels.
template <class D>
HWY_INLINE hn::Vec<D> positionsFrom(D d, uint32_t first, uint32_t step) {
    return hn::Add(hn::Set(d, first), hn::Mul(hn::Iota(d, 0), hn::Set(d, step)));
}

// Pixels by their index in kWindows vectors end to end.
template <uint32_t kWindows, class D>
HWY_INLINE hn::Vec<D> pickFromWindows(D d, const uint8_t *window, hn::Vec<D> index) {
    constexpr auto n = static_cast<uint32_t>(kLanes<D>);
    if constexpr (kWindows == 1) {
        return hn::TableLookupLanes(loadBytes(d, window), hn::IndicesFromVec(d, index));
    } else {
        const auto low =
            lookupInTwo(d, loadBytes(d, window), loadBytes(d, window + kBytesOf<D>), index);
        if constexpr (kWindows == 2) {
            return low;
        } else {
            auto rest = hn::Sub(index, hn::Set(d, 2 * n));
            if constexpr (kWindows == 3)
                rest = hn::And(rest, hn::Set(d, n - 1));
            const auto high = pickFromWindows<kWindows - 2>(d, window + 2 * kBytesOf<D>, rest);
            return hn::IfThenElse(hn::Lt(index, hn::Set(d, 2 * n)), low, high);
        }
    }
}

#endif
} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
