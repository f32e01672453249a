// What the vector kernels share: the walk along a row.
//
// A kernel is a body, a struct whose operator()(d, i) handles the pixels i to
// i + Lanes(d) - 1 of one row.  The walkers call it with tags of falling size
// until the row is used up, so that no byte behind the row is ever read or
// written, and tails run through the very same arithmetic.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_KERNELS_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_KERNELS_INL_H
#undef QUILLON_KERNELS_INL_H
#else
#define QUILLON_KERNELS_INL_H
#endif

#include "hwy/highway.h"

#include <cstddef>
#include <cstdint>

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace hn = hwy::HWY_NAMESPACE;

// The widest tag of lanes T.
template <class T>
using Widest = hn::ScalableTag<T>;

template <class D>
inline constexpr size_t kLanes = hn::MaxLanes(D());

// The rest of a row, shorter than the vectors that came before: each smaller
// size at most once.
template <class T, size_t kCap, class Body>
HWY_INLINE void walkTail(size_t i, size_t count, const Body &body) {
    if (count & kCap) {
        body(hn::CappedTag<T, kCap>(), i);
        i += kCap;
    }
    if constexpr (kCap > 1)
        walkTail<T, kCap / 2>(i, count, body);
}

// Every pixel exactly once, in rising order.
template <class T, class Body>
HWY_INLINE void walkOnce(size_t count, const Body &body) {
    const Widest<T> d;
    constexpr size_t n = kLanes<decltype(d)>;
    size_t i = 0;
    for (; count - i >= n; i += n)
        body(d, i);
    if constexpr (n > 1)
        walkTail<T, n / 2>(i, count, body);
}

// Every pixel at least once: the last vector ends with the row and may overlap
// the one before.  For bodies that give the same bytes when run again on the
// same pixels.
template <class T, size_t kCap, class Body>
HWY_INLINE void walkCapped(size_t count, const Body &body) {
    const hn::CappedTag<T, kCap> d;
    constexpr size_t n = kLanes<decltype(d)>;
    if constexpr (n > 1) {
        if (count < n)
            return walkCapped<T, n / 2>(count, body);
    }
    size_t i = 0;
    for (; count - i >= n; i += n)
        body(d, i);
    if (i != count)
        body(d, count - n);
}

template <class T, class Body>
HWY_INLINE void walkAgain(size_t count, const Body &body) {
    walkCapped<T, kLanes<Widest<T>>>(count, body);
}

// One pixel after the other, where the order of reads and writes counts.
template <class T, class Body>
HWY_INLINE void walkSingly(size_t count, const Body &body) {
    for (size_t i = 0; i < count; ++i)
        body(hn::CappedTag<T, 1>(), i);
}

// The same from the right end of the row to the left.
template <class T, size_t kCap, class Body>
HWY_INLINE void walkTailBackwards(size_t count, const Body &body) {
    if (count & kCap)
        body(hn::CappedTag<T, kCap>(), count &= ~kCap);
    if constexpr (kCap > 1)
        walkTailBackwards<T, kCap / 2>(count & (kCap - 1), body);
}

template <class T, class Body>
HWY_INLINE void walkOnceBackwards(size_t count, const Body &body) {
    const Widest<T> d;
    constexpr size_t n = kLanes<decltype(d)>;
    for (; count >= n; count -= n)
        body(d, count - n);
    if constexpr (n > 1)
        walkTailBackwards<T, n / 2>(count, body);
}

template <class T, class Body>
HWY_INLINE void walkSinglyBackwards(size_t count, const Body &body) {
    while (count-- > 0)
        body(hn::CappedTag<T, 1>(), count);
}

// Whether a vector of the given size would read a byte that walking pixel by
// pixel would have written before: the destination lies ahead of the source by
// less than the vector.
HWY_INLINE bool runsIntoItself(const uint8_t *dst, const uint8_t *src, size_t vectorBytes) {
    const uintptr_t ahead = reinterpret_cast<uintptr_t>(dst) - reinterpret_cast<uintptr_t>(src);
    return ahead != 0 && ahead < vectorBytes;
}

} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
