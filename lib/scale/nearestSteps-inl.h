// The horizontal pass of the scaler where it takes the first of every 2, 4 or 8 pixels.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_SCALE_NEAREST_STEPS_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_SCALE_NEAREST_STEPS_INL_H
#undef QUILLON_SCALE_NEAREST_STEPS_INL_H
#else
#define QUILLON_SCALE_NEAREST_STEPS_INL_H
#endif

#include "hwy/highway.h"

#include "scale/channels-inl.h"
#include "scale/nearestRows-inl.h"
#include "simd/pixelCopies-inl.h"

#include <algorithm>
#include <bit>

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {
#if QUILLON_HAS_VECTORS

// Of 2^kLog2Step pixels the first.
template <uint32_t kLog2Step>
struct FirstOfEachBody {
    static constexpr size_t kDstBytes = 4;
    // More than a chunk has where pointers do not move.
    static constexpr size_t kMovingUnits = 2 * kVectorPixels;
    static constexpr bool kTestsEnd = true;
    uint8_t *dst;
    const uint8_t *src;

    template <class C, class Access>
    HWY_INLINE void operator()([[maybe_unused]] C chunk, size_t i, Access access) const {
        const uint8_t *from = src + 4 * (i << kLog2Step);
        if constexpr (C::kUnits == kMovingUnits)
            movedTo(i).takeNext(chunk);
        else if constexpr (kHasInterleavedAccess && kLog2Step == 3)
            copyFirstOfEach<C::kUnits>(from, dst + 4 * i);
        else
            access.store(PixelTag<C>(), firstOfEach<kLog2Step>(PixelTag<C>(), from), dst + 4 * i);
    }

    HWY_INLINE FirstOfEachBody movedTo(size_t i) const {
        return {dst + 4 * i, src + 4 * (i << kLog2Step)};
    }
    template <class C>
    HWY_INLINE void takeNext(C /*chunk*/) {
        copyEvenPixels<C::kUnits / (2 * kVectorPixels)>(src, dst);
    }

private:
    template <size_t kCount>
    static HWY_INLINE void copyFirstOfEach(const uint8_t *from, uint8_t *to) {
        uint32_t pixels[kCount];
        for (size_t k = 0; k < kCount; ++k)
            pixels[k] = pixelAt(from, k << kLog2Step);
        for (size_t k = 0; k < kCount; ++k)
            putPixel(to, k, pixels[k]);
    }

    template <uint32_t k, class D>
    static HWY_INLINE hn::Vec<D> firstOfEach(D d, const uint8_t *from) {
        if constexpr (k == 0) {
            return loadBytes(d, from);
        } else {
            const auto low = firstOfEach<k - 1>(d, from);
            const auto high = firstOfEach<k - 1>(d, from + (kBytesOf<D> << (k - 1)));
            return Neighbours<D>::of(d, low, high).left;
        }
    }
};

template <class Access, uint32_t kStep>
class NearestFirstOfEach : NearestRow {
    static constexpr uint32_t kLog2Step = std::countr_zero(kStep);
    static constexpr size_t kUnits = kLog2Step == 1 ? 2 * kVectorPixels : kVectorPixels;
    using Body = FirstOfEachBody<kLog2Step>;

public:
    explicit NearestFirstOfEach(const ScaleAxis &axis)
        : NearestRow(axis), first_(axis.start >> 16),
          whole_(std::min((axis.srcSize - std::min(first_, axis.srcSize)) >> kLog2Step,
                          axis.dstSize)) {}

    HWY_INLINE void operator()(uint8_t *dst, const uint8_t *src) const {
        if (kHasInterleavedAccess && whole_ >= kUnits)
            copyInside(dst, src);
        else
            walkPixelsBy<Access>(whole_, bodyOf(dst, src));
        if (whole_ != count_) {
            const size_t index = size_t{first_} + (size_t{whole_} << kLog2Step);
            writeEnd(dst + size_t{4} * whole_, src, index, inner_ - whole_, srcSize_ - 1,
                     count_ - inner_);
        }
    }

    // Whether every step of the row lies in it, and whole chunks do: copyInside is all then.
    bool isInside() const { return whole_ == count_ && whole_ >= kUnits; }

    HWY_INLINE void copyInside(uint8_t *dst, const uint8_t *src) const {
        if (whole_ < kUnits)
            __builtin_unreachable();
        walkRow<RowPolicy{.unroll = 4}>(Chunk<kUnits>(), whole_, bodyOf(dst, src));
    }

private:
    HWY_INLINE Body bodyOf(uint8_t *dst, const uint8_t *src) const {
        return {dst, src + size_t{4} * first_};
    }

    // The pixel whose step reaches behind the row, and copies of the last one.
    static HWY_NOINLINE void writeEnd(uint8_t *dst, const uint8_t *src, size_t index, size_t count,
                                      size_t last, size_t lastCount) {
        fillPixels(dst, src, index, count);
        fillPixels(dst + 4 * count, src, last, lastCount);
    }

    uint32_t first_;
    uint32_t whole_; // pixels whose steps lie in the row
};

#endif
} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
