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
#include "simd/shuffle-inl.h"

#include <algorithm>
#include <bit>
#include <type_traits>

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
        else if constexpr (kLog2Step == 3 && !std::is_same_v<Access, NonTemporal>)
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
        if constexpr (!kHasInterleavedAccess && kCount >= 4) {
            constexpr size_t kStepBytes = 4 << kLog2Step;
            const hn::CappedTag<uint32_t, 4> d;
            for (size_t i = 0; i < kCount; i += 4)
                storeBytes(d, loadApart<kStepBytes>(d, from + i * kStepBytes), to + 4 * i);
            return;
        }
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

// The destination pixels from which on a row is worth the setup of the following.
inline constexpr uint32_t kEighthsInLinesFrom = 4 * kVectorPixels;

// Of 8 pixels one, from vectors that begin with cache lines: loads across two lines would
// take twice the time.
struct FirstOfEightInLinesBody {
    static constexpr bool kTestsEnd = true;
    uint8_t *dst;
    const uint8_t *lines;
    uint32_t lane; // of the first pixel in the first line, below 8

    template <class C, class Access>
    HWY_INLINE void operator()(C /*chunk*/, size_t i, Access access) const {
        using D = PixelTag<C>;
        const D d;
        constexpr size_t kOfPair = kLanes<D> / 4, kPairs = 4; // of vectors
        const auto inPair = hn::And(hn::Iota(d, 0), hn::Set(d, uint32_t{kOfPair - 1}));
        const auto index = hn::Add(hn::Set(d, lane), hn::ShiftLeft<3>(inPair));
        const auto ofPair = [&](size_t pair) HWY_ATTR {
            const uint8_t *from = lines + 32 * i + pair * 2 * kBytesOf<D>;
            return lookupInTwo(d, loadBytes(d, from), loadBytes(d, from + kBytesOf<D>), index);
        };
        auto pixels = ofPair(kPairs - 1);
        for (size_t pair = kPairs - 1; pair != 0; --pair)
            pixels = hn::IfThenElse(hn::FirstN(d, pair * kOfPair), ofPair(pair - 1), pixels);
        access.store(d, pixels, dst + 4 * i);
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
        if (kHasLines && whole_ >= kEighthsInLinesFrom)
            walkLines(dst, src);
        else if (kHasInterleavedAccess && whole_ >= kUnits)
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

    // Where a vector is a cache line, most loads would lie across two.
    static constexpr bool kHasLines =
        kStep == 8 && kVectorBytes == kLineBytes && !std::is_same_v<Access, NonTemporal>;

    HWY_INLINE void walkLines(uint8_t *dst, const uint8_t *src) const {
        constexpr RowPolicy kInner = {.tail = Tail::kNone};
        constexpr Chunk<kVectorPixels> kChunk;
        constexpr uint32_t kPixels{kVectorPixels};
        const Body body = bodyOf(dst, src);
        // The head ends where a line begins in the source row and has a pixel to take in
        // its first half.
        const auto past =
            static_cast<uint32_t>(reinterpret_cast<uintptr_t>(body.src) % kLineBytes) / 4;
        const bool isInLine = past < kStep && past <= first_;
        const uint32_t head = isInLine ? 0 : (kPixels - past + kStep - 1) / kStep;
        const uint32_t lane = (past + head * kStep) % kPixels;
        for (uint32_t i = 0; i < head; ++i)
            body(Chunk<1>(), i, Unaligned());
        const uint32_t rest = (whole_ - head) % kPixels;
        const uint8_t *lines = body.src + size_t{4} * (head * kStep) - size_t{4} * lane;
        walkFrom<kInner, Unaligned>(kChunk, 0, whole_ - head - rest,
                                    FirstOfEightInLinesBody{dst + size_t{4} * head, lines, lane});
        if (rest != 0)
            body(kChunk, whole_ - kPixels, Unaligned());
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
