#include "legacy/copyKernels.h"

#include <cstring>

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "legacy/copyKernels.cpp"
#include "hwy/foreach_target.h"
#include "hwy/highway.h"

#include "legacy/kernels-inl.h"
#include "legacy/streaming-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {

// ---- Short rows -----------------------------------------------------------

template <class D>
HWY_INLINE hn::Vec<D> loadBytes(D d, const uint8_t *from) {
    return hn::LoadU(d, reinterpret_cast<const hn::TFromD<D> *>(from));
}

// Rows of one vector, of one to two, or of two to four: the last ones overlap the
// first.
template <size_t kVectors, class D>
void copyVectors(D d, DstRows dst, SrcRows src, Size bytes) {
    constexpr size_t n = kLanes<D> * sizeof(hn::TFromD<D>);
    const size_t end = bytes.width - n;
    for (size_t y = 0; y < bytes.height; ++y) {
        uint8_t *to = dst.row(y);
        const uint8_t *from = src.row(y);
        const auto first = loadBytes(d, from);
        if constexpr (kVectors == 1) {
            ThroughCaches::store(d, first, to);
            continue;
        }
        const auto last = loadBytes(d, from + end);
        if constexpr (kVectors > 2) {
            const auto second = loadBytes(d, from + n);
            const auto third = loadBytes(d, from + end - n);
            ThroughCaches::store(d, second, to + n);
            ThroughCaches::store(d, third, to + end - n);
        }
        ThroughCaches::store(d, first, to);
        ThroughCaches::store(d, last, to + end);
    }
}

void copyFewBytes(DstRows dst, SrcRows src, Size bytes) {
    for (size_t y = 0; y < bytes.height; ++y) {
        uint8_t *to = dst.row(y);
        const uint8_t *from = src.row(y);
        const uint8_t first = from[0], middle = from[bytes.width / 2], last = from[bytes.width - 1];
        to[0] = first;
        to[bytes.width / 2] = middle;
        to[bytes.width - 1] = last;
    }
}

// The widest vectors that fit a row, in words: the fallback has no others of 4 bytes.
template <size_t kBytes>
HWY_INLINE void copyCapped(DstRows dst, SrcRows src, Size bytes) {
    const hn::CappedTag<uint32_t, kBytes / 4> d;
    constexpr size_t n = kLanes<decltype(d)> * 4;
    if (bytes.width > 2 * n)
        copyVectors<4>(d, dst, src, bytes);
    else if (bytes.width == n)
        copyVectors<1>(d, dst, src, bytes);
    else if (bytes.width > n)
        copyVectors<2>(d, dst, src, bytes);
    else if constexpr (n > 4)
        copyCapped<n / 2>(dst, src, bytes);
    else
        copyFewBytes(dst, src, bytes);
}

void CopyShort(DstRows dst, SrcRows src, Size bytes) {
    constexpr size_t kMost = size_t{16} * kLanes<hn::CappedTag<uint32_t, 16>>;
    if (bytes.width <= kMost)
        return copyCapped<64>(dst, src, bytes);
    for (size_t y = 0; y < bytes.height; ++y)
        std::memmove(dst.row(y), src.row(y), bytes.width);
}

// ---- Large surfaces -------------------------------------------------------

template <class Stores>
struct CopyWords {
    uint8_t *dst;
    const uint8_t *src;

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        Stores::store(d, loadBytes(d, src + i), dst + i);
    }
};

// Aligned stores but for the first and the last vector.
void CopyMiddling(DstRows dst, SrcRows src, Size bytes) {
    const Widest<uint8_t> d;
    constexpr size_t n = kLanes<decltype(d)>;
    for (size_t y = 0; y < bytes.height; ++y) {
        const CopyWords<ThroughCaches> body = {dst.row(y), src.row(y)};
        body(d, 0);
        size_t i = n - reinterpret_cast<uintptr_t>(body.dst) % n;
        for (; bytes.width - i >= 4 * n; i += 4 * n) {
            body(d, i);
            body(d, i + n);
            body(d, i + 2 * n);
            body(d, i + 3 * n);
        }
        for (; bytes.width - i >= n; i += n)
            body(d, i);
        body(d, bytes.width - n);
    }
}

void CopyStreamed(DstRows dst, SrcRows src, Size bytes) {
    for (size_t y = 0; y < bytes.height; ++y) {
        uint8_t *to = dst.row(y);
        const uint8_t *from = src.row(y);
        walkStreaming<uint8_t, 1>(to, bytes.width, CopyWords<ThroughCaches>{to, from},
                                  CopyWords<AroundCaches>{to, from});
    }
    hwy::FlushStream();
}

} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace quillon {

HWY_EXPORT(CopyShort);
HWY_EXPORT(CopyMiddling);
HWY_EXPORT(CopyStreamed);

void copyShortRows(DstRows dst, SrcRows src, Size bytes) {
    HWY_DYNAMIC_DISPATCH(CopyShort)(dst, src, bytes);
}

void copyMiddlingRows(DstRows dst, SrcRows src, Size bytes) {
    HWY_DYNAMIC_DISPATCH(CopyMiddling)(dst, src, bytes);
}

void copyStreamedRows(DstRows dst, SrcRows src, Size bytes) {
    HWY_DYNAMIC_DISPATCH(CopyStreamed)(dst, src, bytes);
}

} // namespace quillon
#endif
