// Stores through the caches or around them, and the walk along a row with the
// latter, which need their addresses aligned.
//
// A body that can do both is a template over one of the two structs below.  Call
// hwy::FlushStream() once, after the last row.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_STREAMING_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_STREAMING_INL_H
#undef QUILLON_STREAMING_INL_H
#else
#define QUILLON_STREAMING_INL_H
#endif

#include "hwy/cache_control.h"
#include "hwy/highway.h"

#include "legacy/kernels-inl.h"
#include "legacy/streaming.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {

struct ThroughCaches {
    template <class D>
    HWY_INLINE static void store(D d, hn::Vec<D> v, uint8_t *to) {
        hn::StoreU(v, d, reinterpret_cast<hn::TFromD<D> *>(to));
    }
};

// to is aligned to the size of the vector.  Vectors of less than 16 bytes have no
// such stores.
struct AroundCaches {
    template <class D>
    HWY_INLINE static hn::Vec<D> load(D d, const hn::TFromD<D> *from) {
        return hn::LoadU(d, from);
    }
    template <class D>
    HWY_INLINE static void store(D d, hn::Vec<D> v, uint8_t *to) {
        auto *lanes = reinterpret_cast<hn::TFromD<D> *>(to);
        if constexpr (kLanes<D> * sizeof(hn::TFromD<D>) >= 16)
            hn::Stream(v, d, lanes);
        else
            hn::StoreU(v, d, lanes);
    }
};

// Pixels from dst on to the next one that begins a cache line; 64 where none does.
template <size_t kBytesPerPixel>
HWY_INLINE size_t pixelsToLine(const uint8_t *dst) {
    const size_t bytes = (64 - reinterpret_cast<uintptr_t>(dst) % 64) % 64;
    if constexpr (kBytesPerPixel == 3)
        return bytes * 43 % 64; // 3 * 43 is 1 modulo 64
    return bytes % kBytesPerPixel == 0 ? bytes / kBytesPerPixel : 64;
}

// Every pixel at least once, as walkAgain does, but from the first pixel on that
// begins a cache line the whole vectors go to aroundCaches.
template <class T, size_t kBytesPerPixel, class Through, class Around>
HWY_INLINE void walkStreaming(const uint8_t *dst, size_t count, const Through &throughCaches,
                              const Around &aroundCaches) {
    const Widest<T> d;
    constexpr size_t n = kLanes<decltype(d)>;
    const size_t head = pixelsToLine<kBytesPerPixel>(dst);
    if (head == 64 || count < 64 + n)
        return walkAgain<T>(count, throughCaches);
    for (size_t i = 0; i < head; i += n)
        throughCaches(d, i);
    size_t i = head;
    for (; count - i >= n; i += n)
        aroundCaches(d, i);
    if (i != count)
        throughCaches(d, count - n);
}

} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
