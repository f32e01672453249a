// How a kernel reaches memory.  The row loop hands every call of a body one of
// these, by which the body loads and stores: one signature, whatever the policy.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_SIMD_ACCESS_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_SIMD_ACCESS_INL_H
#undef QUILLON_SIMD_ACCESS_INL_H
#else
#define QUILLON_SIMD_ACCESS_INL_H
#endif

#include "hwy/cache_control.h"
#include "hwy/highway.h"

#include "core/surface.h"
#include "simd/target-inl.h"
#include "simd/thresholds.h"

#include <type_traits>

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
#if QUILLON_HAS_VECTORS

template <class D>
HWY_INLINE hn::Vec<D> loadBytes(D d, const uint8_t *from) {
    return hn::LoadU(d, reinterpret_cast<const hn::TFromD<D> *>(from));
}
template <class D>
HWY_INLINE void storeBytes(D d, hn::Vec<D> v, uint8_t *to) {
    hn::StoreU(v, d, reinterpret_cast<hn::TFromD<D> *>(to));
}

// The vector itself.  Where every use of a loaded vector can have an operand in
// memory, GCC loads it again for each of them: this makes it one load.
template <class V>
HWY_INLINE V inRegister(V v) {
#if QUILLON_X86_AVX512
    asm("" : "+v"(v.raw));
#endif
    return v;
}

// The pointer moved on, in a register of its own, which an instruction that loads or
// stores through it may move by itself.  The compiler would compute every address from
// that of the first one.
template <class Byte>
HWY_INLINE Byte *advancedInRegister(Byte *pointer, size_t bytes) {
    pointer += bytes;
    asm("" : "+r"(pointer));
    return pointer;
}

// Keeps the stores before it ahead of those after it in the code.  Processors write
// two vectors to one cache line at once where their stores come one after the other,
// and GCC takes any order.  Elsewhere two stores may become one instruction.
HWY_INLINE void keepStoreOrder() {
    if constexpr (HWY_ARCH_X86)
        asm volatile("" ::: "memory");
}

// Whole vectors at any address, through the caches.
struct Unaligned {
    template <class D>
    HWY_INLINE static hn::Vec<D> load(D d, const uint8_t *from) {
        return loadBytes(d, from);
    }
    template <class D>
    HWY_INLINE static void store(D d, hn::Vec<D> v, uint8_t *to) {
        storeBytes(d, v, to);
    }
};

// The same where the destination of every chunk begins a cache line: a body can
// rely on it that no whole vector lies across two lines.
struct Aligned : Unaligned {};

// As Unaligned, for the ends of rows whose other chunks begin a cache line.
struct RowEnd : Unaligned {};

// Stores around the caches; the destination of every chunk begins a cache line.
// Call hwy::FlushStream() once, after the last row.
struct NonTemporal : Unaligned {
    template <class D>
    HWY_INLINE static void store(D d, hn::Vec<D> v, uint8_t *to) {
        // Vectors of less than a block have no such stores.
        if constexpr (kBytesOf<D> >= 16)
            hn::Stream(v, d, reinterpret_cast<hn::TFromD<D> *>(to));
        else
            storeBytes(d, v, to);
    }
};

// Only the first lanes of a vector, of 8, 16 or 32 bits.  Memory of the others is not
// touched.  Lanes that become 32 bits are loaded from the vectors of 8 or 16 bits
// that have as many.
struct FirstLanes {
    size_t count;

#if QUILLON_X86_AVX512
    template <class D>
    HWY_INLINE hn::Vec<D> load(D d, const uint8_t *from) const {
        constexpr size_t kLaneBytes = sizeof(hn::TFromD<D>);
        const auto mask = hn::FirstN(d, count).raw;
        if constexpr (kBytesOf<D> == 64 && kLaneBytes == 4) {
            return hn::Vec<D>{_mm512_maskz_loadu_epi32(mask, from)};
        } else if constexpr (kBytesOf<D> == 32 && kLaneBytes == 2) {
            return hn::Vec<D>{_mm256_maskz_loadu_epi16(mask, from)};
        } else if constexpr (kBytesOf<D> == 32 && kLaneBytes == 1) {
            return hn::Vec<D>{_mm256_maskz_loadu_epi8(mask, from)};
        } else if constexpr (kBytesOf<D> == 16 && kLaneBytes == 1) {
            return hn::Vec<D>{_mm_maskz_loadu_epi8(mask, from)};
        } else {
            static_assert(kBytesOf<D> == 64 && kLaneBytes == 1);
            return hn::Vec<D>{_mm512_maskz_loadu_epi8(mask, from)};
        }
    }
    template <class D>
    HWY_INLINE void store(D d, hn::Vec<D> v, uint8_t *to) const {
        static_assert(kBytesOf<D> == 64);
        const auto mask = hn::FirstN(d, count).raw;
        if constexpr (sizeof(hn::TFromD<D>) == 1)
            _mm512_mask_storeu_epi8(to, mask, v.raw);
        else if constexpr (sizeof(hn::TFromD<D>) == 2)
            _mm512_mask_storeu_epi16(to, mask, v.raw);
        else
            _mm512_mask_storeu_epi32(to, mask, v.raw);
    }
#else
    template <class D>
    HWY_INLINE hn::Vec<D> load(D d, const uint8_t *from) const {
        HWY_ALIGN hn::TFromD<D> lanes[kLanes<D>] = {};
        __builtin_memcpy(lanes, from, count * sizeof(lanes[0]));
        return hn::Load(d, lanes);
    }
    template <class D>
    HWY_INLINE void store(D d, hn::Vec<D> v, uint8_t *to) const {
        HWY_ALIGN hn::TFromD<D> lanes[kLanes<D>];
        hn::Store(v, d, lanes);
        __builtin_memcpy(to, lanes, count * sizeof(lanes[0]));
    }
#endif
};

// Only the first units of a chunk, which is not always one vector: the body itself
// leaves out the memory of the others.
struct FirstUnits {
    size_t count;
};

// Stores the lanes, of 8 or 32 bits in a whole vector, that the mask selects.
// Memory of the others is not touched.
template <class D>
HWY_INLINE void storeSelected(D d, hn::Mask<D> mask, hn::Vec<D> v, uint8_t *to) {
    static_assert(kBytesOf<D> == kVectorBytes);
    constexpr size_t kLaneBytes = sizeof(hn::TFromD<D>);
#if QUILLON_X86_AVX512
    if constexpr (kLaneBytes == 1)
        _mm512_mask_storeu_epi8(to, mask.raw, v.raw);
    else
        _mm512_mask_storeu_epi32(to, mask.raw, v.raw);
#else
#if QUILLON_X86_AVX2
    if constexpr (kLaneBytes == 4) {
        _mm256_maskstore_epi32(reinterpret_cast<int *>(to), mask.raw, v.raw);
        return;
    }
#endif
    // One by one: other threads may write to the lanes that are left out.
    HWY_ALIGN hn::TFromD<D> lanes[kLanes<D>], selected[kLanes<D>];
    hn::Store(v, d, lanes);
    hn::Store(hn::VecFromMask(d, mask), d, selected);
    for (size_t i = 0; i < kLanes<D>; ++i)
        if (selected[i] != 0)
            hwy::CopyBytes<kLaneBytes>(&lanes[i], to + i * kLaneBytes);
#endif
}

inline constexpr size_t kLineBytes = 64; // of a cache line

// How far ahead of the current chunk to prefetch, in bytes; 0 not at all.
// The processor itself prefetches inside a page, but not beyond, and not for the
// next row.
struct PrefetchDistance {
    ptrdiff_t dst, src;
};

// Prefetches the cache lines of a range that lies so far ahead.
HWY_INLINE void prefetchLines(const uint8_t *from, size_t bytes, ptrdiff_t distance) {
    if (!kPrefetchesAhead || distance == 0)
        return;
    const uint8_t *line = advance(from, static_cast<uint64_t>(distance));
    for (size_t i = 0; i < bytes; i += kLineBytes)
        hwy::Prefetch(advance(line, i));
}

// The units from dst on to the first one that begins a cache line, kNoLine where
// none does.
inline constexpr size_t kNoLine = kLineBytes;

template <size_t kUnitBytes>
HWY_INLINE size_t unitsToLine(const uint8_t *dst) {
    const size_t bytes = (kLineBytes - reinterpret_cast<uintptr_t>(dst) % kLineBytes) % kLineBytes;
    if constexpr (kUnitBytes % 2 != 0) {
        // An odd size is invertible modulo 64: 1, 3.
        static_assert(kUnitBytes == 1 || kUnitBytes == 3);
        return bytes * (kUnitBytes == 3 ? 43 : 1) % kLineBytes;
    } else {
        return bytes % kUnitBytes == 0 ? bytes / kUnitBytes : kNoLine;
    }
}

#endif
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
