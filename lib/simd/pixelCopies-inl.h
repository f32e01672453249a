// Copies of pixels from memory to memory that leave a part out or put one in, for
// instruction sets with kHasInterleavedAccess.  Each handles kTurns chunks and moves
// the pointers behind them.
//
// Between a load that splits pixels and a store that puts them together, GCC copies
// vectors to get them side by side, and computes every address anew.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_SIMD_PIXEL_COPIES_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_SIMD_PIXEL_COPIES_INL_H
#undef QUILLON_SIMD_PIXEL_COPIES_INL_H
#else
#define QUILLON_SIMD_PIXEL_COPIES_INL_H
#endif

#include "hwy/highway.h"

#include "simd/access-inl.h"
#include "simd/target-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
#if QUILLON_HAS_VECTORS

namespace detail {
template <size_t kCount>
using Bytes = uint8_t[kCount];
} // namespace detail

// Chunks of a vector of bytes: pixels of four bytes without the fourth.
template <size_t kTurns>
HWY_INLINE void copyWithoutFourth(const uint8_t *&src, uint8_t *&dst) {
#if QUILLON_NEON
    const auto &from = *reinterpret_cast<const detail::Bytes<64 * kTurns> *>(src);
    auto &to = *reinterpret_cast<detail::Bytes<48 * kTurns> *>(dst);
    asm(".rept %c[turns]\n\t"
        "ld4 {v0.16b-v3.16b}, [%[src]], #64\n\t"
        "st3 {v0.16b-v2.16b}, [%[dst]], #48\n\t"
        ".endr"
        : [src] "+r"(src), [dst] "+r"(dst), "=m"(to)
        : [turns] "n"(kTurns), "m"(from)
        : "v0", "v1", "v2", "v3");
#else
    const Widest<uint8_t> d;
    hn::Vec<decltype(d)> blue, green, red, fourth;
    for (size_t turn = 0; turn < kTurns; ++turn) {
        hn::LoadInterleaved4(d, src, blue, green, red, fourth);
        hn::StoreInterleaved3(blue, green, red, d, dst);
        src += 4 * kVectorBytes;
        dst += 3 * kVectorBytes;
    }
#endif
}

// The same chunks: pixels of three bytes with a fourth, 255.
template <size_t kTurns>
HWY_INLINE void copyWithFourth(const uint8_t *&src, uint8_t *&dst) {
#if QUILLON_NEON
    const auto &from = *reinterpret_cast<const detail::Bytes<48 * kTurns> *>(src);
    auto &to = *reinterpret_cast<detail::Bytes<64 * kTurns> *>(dst);
    asm("movi v3.16b, #255\n\t"
        ".rept %c[turns]\n\t"
        "ld3 {v0.16b-v2.16b}, [%[src]], #48\n\t"
        "st4 {v0.16b-v3.16b}, [%[dst]], #64\n\t"
        ".endr"
        : [src] "+r"(src), [dst] "+r"(dst), "=m"(to)
        : [turns] "n"(kTurns), "m"(from)
        : "v0", "v1", "v2", "v3");
#else
    const Widest<uint8_t> d;
    hn::Vec<decltype(d)> blue, green, red;
    for (size_t turn = 0; turn < kTurns; ++turn) {
        hn::LoadInterleaved3(d, src, blue, green, red);
        hn::StoreInterleaved4(blue, green, red, hn::Set(d, 0xFF), d, dst);
        src += 3 * kVectorBytes;
        dst += 4 * kVectorBytes;
    }
#endif
}

// Chunks of two vectors of pixels of four bytes: every second one.
template <size_t kTurns>
HWY_INLINE void copyEvenPixels(const uint8_t *&src, uint8_t *&dst) {
#if QUILLON_NEON
    const auto &from = *reinterpret_cast<const detail::Bytes<64 * kTurns> *>(src);
    auto &to = *reinterpret_cast<detail::Bytes<32 * kTurns> *>(dst);
    asm(".rept %c[turns]\n\t"
        "ld2 {v0.4s-v1.4s}, [%[src]], #32\n\t"
        "ld2 {v1.4s-v2.4s}, [%[src]], #32\n\t"
        "stp q0, q1, [%[dst]], #32\n\t"
        ".endr"
        : [src] "+r"(src), [dst] "+r"(dst), "=m"(to)
        : [turns] "n"(kTurns), "m"(from)
        : "v0", "v1", "v2");
#else
    const Widest<uint32_t> d;
    hn::Vec<decltype(d)> even, odd;
    for (size_t vector = 0; vector < 2 * kTurns; ++vector) {
        hn::LoadInterleaved2(d, reinterpret_cast<const uint32_t *>(src), even, odd);
        storeBytes(d, even, dst);
        src += 2 * kVectorBytes;
        dst += kVectorBytes;
    }
#endif
}

#endif
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
