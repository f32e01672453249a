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

// ---- From the right -------------------------------------------------------

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

// ---- Parts of vectors -----------------------------------------------------

// How a body that takes one reaches memory.  Where the processor has loads and
// stores that leave lanes alone, a body can take the rest of a row at once.
struct AllLanes {
    template <class D>
    HWY_INLINE static hn::Vec<D> load(D d, const hn::TFromD<D> *from) {
        return hn::LoadU(d, from);
    }
    template <class D>
    HWY_INLINE static void store(D d, hn::Vec<D> v, hn::TFromD<D> *to) {
        hn::StoreU(v, d, to);
    }
};

#if HWY_TARGET == HWY_AVX3

struct FirstLanes {
    size_t count;

    template <class D>
    HWY_INLINE hn::Vec<D> load(D d, const hn::TFromD<D> *from) const {
        const auto mask = hn::FirstN(d, count).raw;
        if constexpr (sizeof(hn::TFromD<D>) == 1)
            return hn::Vec<D>{_mm512_maskz_loadu_epi8(mask, from)};
        else
            return hn::Vec<D>{_mm512_maskz_loadu_epi32(mask, from)};
    }
    template <class D>
    HWY_INLINE void store(D d, hn::Vec<D> v, hn::TFromD<D> *to) const {
        const auto mask = hn::FirstN(d, count).raw;
        if constexpr (sizeof(hn::TFromD<D>) == 1)
            _mm512_mask_storeu_epi8(to, mask, v.raw);
        else
            _mm512_mask_storeu_epi32(to, mask, v.raw);
    }
};

// Every pixel exactly once, in rising order, and in falling order.  Rising, the
// vectors of longer rows are aligned to dst: those that lie across two cache lines
// cost double.
template <class T, class Body>
HWY_INLINE void walkParts(const uint8_t *dst, size_t count, const Body &body) {
    const Widest<T> d;
    constexpr size_t n = kLanes<decltype(d)>;
    if (count < 4) {
        const auto whole = [&](auto few, size_t i) HWY_ATTR { body(few, i, AllLanes()); };
        return walkTail<T, 2>(0, count, whole);
    }
    size_t i = 0;
    if (HWY_UNLIKELY(count >= 8 * n)) {
        const size_t ahead = reinterpret_cast<uintptr_t>(dst) % (n * sizeof(T));
        if (ahead != 0 && ahead % sizeof(T) == 0) {
            i = n - ahead / sizeof(T);
            body(d, 0, FirstLanes{i});
        }
    }
    for (; count - i >= n; i += n)
        body(d, i, AllLanes());
    if (i != count)
        body(d, i, FirstLanes{count - i});
}

template <class T, class Body>
HWY_INLINE void walkPartsBackwards(size_t count, const Body &body) {
    const Widest<T> d;
    constexpr size_t n = kLanes<decltype(d)>;
    for (; count >= n; count -= n)
        body(d, count - n, AllLanes());
    if (count != 0)
        body(d, 0, FirstLanes{count});
}

#else

template <class T, class Body>
HWY_INLINE void walkParts(const uint8_t * /*dst*/, size_t count, const Body &body) {
    const auto whole = [&](auto d, size_t i) HWY_ATTR { body(d, i, AllLanes()); };
    const Widest<T> d;
    constexpr size_t n = kLanes<decltype(d)>;
    size_t i = 0;
    for (; count - i >= 2 * n; i += 2 * n) {
        whole(d, i);
        whole(d, i + n);
    }
    if (count - i >= n) {
        whole(d, i);
        i += n;
    }
    if constexpr (n > 1)
        walkTail<T, n / 2>(i, count, whole);
}

template <class T, class Body>
HWY_INLINE void walkPartsBackwards(size_t count, const Body &body) {
    walkOnceBackwards<T>(count, [&](auto d, size_t i) HWY_ATTR { body(d, i, AllLanes()); });
}

#endif

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
