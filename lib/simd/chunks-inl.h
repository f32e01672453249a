// Chunks: what a row loop hands to a kernel at a time, and how their size is chosen.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_SIMD_CHUNKS_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_SIMD_CHUNKS_INL_H
#undef QUILLON_SIMD_CHUNKS_INL_H
#else
#define QUILLON_SIMD_CHUNKS_INL_H
#endif

#include "hwy/highway.h"

#include "simd/target-inl.h"

#include <type_traits>
#include <utility>

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
#if QUILLON_HAS_VECTORS

// The units that one call of a body handles, and which of the calls of an
// unrolled loop it is.
template <size_t kUnitsIn, size_t kTurnIn = 0>
struct Chunk {
    static constexpr size_t kUnits = kUnitsIn;
    static constexpr size_t kTurn = kTurnIn;
};

// Calls use with the first of the chunk sizes, which fall, that is not above kMost
// and fits in count units.  The last size has to fit.
template <size_t kMost, size_t kSize, size_t... kSmaller, class Use>
HWY_INLINE void withWidestChunk(size_t count, const Use &use) {
    if constexpr (sizeof...(kSmaller) != 0 && kSize > kMost) {
        withWidestChunk<kMost, kSmaller...>(count, use);
    } else {
        if constexpr (sizeof...(kSmaller) != 0) {
            if (count < kSize)
                return withWidestChunk<kMost, kSmaller...>(count, use);
        }
        use(Chunk<kSize>());
    }
}

// Rows of 4 bytes to kMostVectors of the widest vectors: calls use with the tag of
// the widest vectors that fit, and with how many of them hold the row, the last of
// which may overlap the one before.
template <size_t kMostVectors, class Use>
HWY_INLINE void withShortRow(size_t rowBytes, const Use &use) {
    withWidestChunk<kVectorBytes, 64, 32, 16, 8, 4>(rowBytes, [&](auto chunk) HWY_ATTR {
        constexpr size_t n = chunk.kUnits, kMost = n == kVectorBytes ? kMostVectors : 2;
        const hn::CappedTag<uint32_t, n / 4> d;
        const size_t vectors = (rowBytes + n - 1) / n;
        const auto useOf = [&]<size_t... kLess>(std::index_sequence<kLess...>) HWY_ATTR {
            (void)((vectors == kLess + 1 &&
                    (use(d, std::integral_constant<size_t, kLess + 1>()), true)) ||
                   ...);
        };
        useOf(std::make_index_sequence<kMost>());
    });
}

#endif
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
