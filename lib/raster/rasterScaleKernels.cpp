// Resampling: the row kernels, and the walks over the destination rows that
// blend what they make.
//
// All arithmetic is on the four 8-bit channels of a pixel alike.  Weights have
// 8 bits, so that a product, and the sum of two, fits 16; every product is
// truncated by itself, and the results depend on it.

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "raster/rasterScaleKernels.cpp"
#include "raster/rasterScaleKernels.h"

#include <cstring>

#include "hwy/foreach_target.h" // IWYU pragma: keep

#include "hwy/highway.h"
#include "raster/kernels-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {

constexpr size_t kPixelBytes = 4;

// Pixels at any address.  With lanes of its own size Highway would read through
// a pointer to an aligned one.
template <class D>
HWY_INLINE hn::Vec<D> loadPixels(D d, const uint8 *from) {
#if HWY_TARGET == HWY_SCALAR
    hn::TFromD<D> lane;
    std::memcpy(&lane, from, sizeof(lane));
    return hn::Set(d, lane);
#else
    return hn::LoadU(d, reinterpret_cast<const hn::TFromD<D> *>(from));
#endif
}

template <class D>
HWY_INLINE void storePixels(hn::Vec<D> pixels, [[maybe_unused]] D d, uint8 *to) {
#if HWY_TARGET == HWY_SCALAR
    const hn::TFromD<D> lane = hn::GetLane(pixels);
    std::memcpy(to, &lane, sizeof(lane));
#else
    hn::StoreU(pixels, d, reinterpret_cast<hn::TFromD<D> *>(to));
#endif
}

// Walks a row by vectors that a window of the source suffices for: none wider
// than limit.
template <size_t kCap, class Body>
HWY_INLINE void walkWindows(size_t count, size_t limit, const Body &body) {
    if constexpr (kCap > 1) {
        if (limit < kCap || count < kCap)
            return walkWindows<kCap / 2>(count, limit, body);
    }
    walkCapped<uint32, kCap>(count, body);
}

template <class Body>
HWY_INLINE void walkWindows(size_t count, size_t limit, const Body &body) {
    walkWindows<kLanes<Widest<uint32>>>(count, limit, body);
}

// The positions of one vector's pixels.
template <class D>
HWY_INLINE hn::Vec<D> positionsFrom(D d, uint32 first, uint32 step) {
    return hn::Add(hn::Set(d, first), hn::Mul(hn::Iota(d, 0), hn::Set(d, step)));
}

// count copies of a pixel.
struct FillBody {
    uint8 *dst;
    uint32 pixel;

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        storePixels(hn::Set(d, pixel), d, dst + i * kPixelBytes);
    }
};

HWY_INLINE void fillPixels(uint8 *dst, const uint8 *pixel, size_t count) {
    FillBody body{dst, 0};
    std::memcpy(&body.pixel, pixel, kPixelBytes);
    walkAgain<uint32>(count, body);
}

// Nearest pixels whose positions advance by at most kWindows pixels: what a
// vector needs lies in as many vectors of the source, from where it is picked.
// The windows keep away from the end of the source row.
template <uint32 kWindows>
struct NearestBody {
    uint8 *dst;
    const uint8 *src;
    const ScaleAxis &axis;

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        constexpr auto n = static_cast<uint32>(kLanes<D>);
        const uint32 first = axis.start + static_cast<uint32>(i) * axis.step;
        const uint32 base = std::min(first >> 16, axis.srcSize - kWindows * n);
        const auto pixel = hn::ShiftRight<16>(positionsFrom(d, first, axis.step));
        const auto index = hn::Sub(hn::Min(pixel, hn::Set(d, axis.srcSize - 1)), hn::Set(d, base));
        const uint8 *window = src + base * kPixelBytes;
        if constexpr (kWindows == 1) {
            storePixels(hn::TableLookupLanes(loadPixels(d, window), hn::IndicesFromVec(d, index)),
                        d, dst + i * kPixelBytes);
        } else {
            const auto inWindow = hn::IndicesFromVec(d, hn::And(index, hn::Set(d, n - 1)));
            const auto low = hn::TableLookupLanes(loadPixels(d, window), inWindow);
            const auto high =
                hn::TableLookupLanes(loadPixels(d, window + n * kPixelBytes), inWindow);
            storePixels(hn::IfThenElse(hn::Lt(index, hn::Set(d, n)), low, high), d,
                        dst + i * kPixelBytes);
        }
    }
};

// Each pixel is the source pixel of its position, or the last one.
class RasterScaleRowNearest {
public:
    explicit RasterScaleRowNearest(const ScaleAxis &axis)
        : axis_(axis), wraps_((uint64_t{axis.step} * (axis.dstSize - 1) + axis.start) >> 32 != 0) {}

    HWY_INLINE void operator()(uint8 *dst, const uint8 *src) const {
        if (axis_.srcSize == 1)
            fillPixels(dst, src, axis_.dstSize);
        else if (wraps_ || axis_.step > 2 * kScaleOne)
            pickSingly(dst, src);
        else if (axis_.step == kScaleOne)
            copy(dst, src);
        else if (axis_.step < kScaleOne)
            walkWindows(axis_.dstSize, axis_.srcSize, NearestBody<1>{dst, src, axis_});
        else
            walkWindows(axis_.dstSize, axis_.srcSize / 2, NearestBody<2>{dst, src, axis_});
    }

private:
    HWY_INLINE void copy(uint8 *dst, const uint8 *src) const {
        const uint32 first = std::min(axis_.start >> 16, axis_.srcSize - 1);
        const uint32 count = std::min(axis_.srcSize - first, axis_.dstSize);
        std::memcpy(dst, src + size_t{first} * kPixelBytes, size_t{count} * kPixelBytes);
        if (count != axis_.dstSize)
            fillPixels(dst + size_t{count} * kPixelBytes,
                       src + size_t{axis_.srcSize - 1} * kPixelBytes, axis_.dstSize - count);
    }

    HWY_INLINE void pickSingly(uint8 *dst, const uint8 *src) const {
        uint32 x = axis_.start;
        for (size_t i = 0; i < axis_.dstSize; ++i, x += axis_.step) {
            const size_t pixel = std::min(x >> 16, axis_.srcSize - 1);
            std::memcpy(dst + i * kPixelBytes, src + pixel * kPixelBytes, kPixelBytes);
        }
    }

    const ScaleAxis &axis_;
    bool wraps_;
};

// Pixels between two source pixels each, picked from two overlapping windows.
struct LinearBody {
    uint8 *dst;
    const uint8 *src;
    uint32 start, step, srcSize;

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        constexpr auto n = static_cast<uint32>(kLanes<D>);
        const uint32 first = start + static_cast<uint32>(i) * step;
        const uint32 base = std::min(first >> 16, srcSize - 1 - n);
        const auto x = positionsFrom(d, first, step);
        const auto index = hn::IndicesFromVec(d, hn::Sub(hn::ShiftRight<16>(x), hn::Set(d, base)));
        const uint8 *window = src + base * kPixelBytes;
        const auto left = hn::TableLookupLanes(loadPixels(d, window), index);
        const auto right = hn::TableLookupLanes(loadPixels(d, window + kPixelBytes), index);

        const auto channels = hn::Set(d, 0x00FF00FFu);
        const auto rightWeight = hn::And(hn::ShiftRight<8>(x), hn::Set(d, 0xFFu));
        const auto leftWeight = hn::Sub(hn::Set(d, 0xFFu), rightWeight);
        const auto even = hn::Add(mulChannels(d, hn::And(left, channels), leftWeight),
                                  mulChannels(d, hn::And(right, channels), rightWeight));
        const auto odd =
            hn::Add(mulChannels(d, hn::And(hn::ShiftRight<8>(left), channels), leftWeight),
                    mulChannels(d, hn::And(hn::ShiftRight<8>(right), channels), rightWeight));
        storePixels(hn::Or(hn::And(hn::ShiftRight<8>(even), channels), hn::AndNot(channels, odd)),
                    d, dst + i * kPixelBytes);
    }

    // Two channels of a pixel, in the halves of a lane, by the pixel's weight.
    template <class D, class V>
    static HWY_INLINE V mulChannels([[maybe_unused]] D d, V channels, V weight) {
#if HWY_TARGET == HWY_SCALAR
        return hn::Mul(channels, weight);
#else
        const hn::Repartition<uint16, D> d16;
        const auto both = hn::Or(weight, hn::ShiftLeft<16>(weight));
        return hn::BitCast(d, hn::Mul(hn::BitCast(d16, channels), hn::BitCast(d16, both)));
#endif
    }
};

// Copies of the first pixel, blends of neighbours with weights that sum to 255,
// copies of the last pixel.
class RasterScaleRowLinear {
public:
    explicit RasterScaleRowLinear(const ScaleAxis &axis) : axis_(axis) {
        const bool isAhead = axis.start >> 31 != 0;
        leading_ =
            isAhead ? std::min(stepsBefore(axis.start, uint64_t{1} << 32, axis.step), axis.dstSize)
                    : 0;
        innerStart_ = axis.start + leading_ * axis.step;
        inner_ = std::min(stepsBefore(innerStart_, axis.lastPosition(), axis.step),
                          axis.dstSize - leading_);
    }

    HWY_INLINE void operator()(uint8 *dst, const uint8 *src) const {
        if (leading_ != 0)
            fillPixels(dst, src, leading_);
        dst += size_t{leading_} * kPixelBytes;
        if (inner_ != 0)
            walkWindows(inner_, axis_.srcSize - 1,
                        LinearBody{dst, src, innerStart_, axis_.step, axis_.srcSize});
        const uint32 rest = axis_.dstSize - leading_ - inner_;
        if (rest != 0)
            fillPixels(dst + size_t{inner_} * kPixelBytes,
                       src + size_t{axis_.srcSize - 1} * kPixelBytes, rest);
    }

private:
    const ScaleAxis &axis_;
    uint32 leading_, inner_, innerStart_;
};

// Sums over spans of source pixels, one pixel's channels in a vector of lanes T
// (one channel after the other where vectors have one lane).  16 bits hold the
// sums of up to 257 pixels.
template <class T>
class BoxSums {
public:
    using D = hn::CappedTag<T, 4>;
    using V = hn::Vec<D>;

    explicit BoxSums(const uint8 *channel) : channel_(channel) {}

    HWY_INLINE V pixel(size_t index) const { return load(D(), index); }

    // Weights are 0 to 256; 256 takes the pixel whole.
    HWY_INLINE V weighted(size_t index, uint32 weight) const {
        return hn::ShiftRight<8>(hn::Mul(pixel(index), hn::Set(D(), static_cast<T>(weight))));
    }

    // Whole pixels from begin to before end.
    HWY_INLINE V run(size_t begin, size_t end) const {
        V sum = hn::Zero(D());
        if (end - begin >= kWide) {
            auto wide = load(WideD(), begin);
            for (begin += kWide; end - begin >= kWide; begin += kWide)
                wide = hn::Add(wide, load(WideD(), begin));
            sum = folded(WideD(), wide);
        }
        for (; begin < end; ++begin)
            sum = hn::Add(sum, pixel(begin));
        return sum;
    }

private:
    using WideD = Widest<T>;
    static constexpr size_t kWide = std::max<size_t>(kLanes<WideD> / 4, 1); // in pixels

    template <class DT>
    HWY_INLINE hn::Vec<DT> load(DT d, size_t index) const {
        const hn::Rebind<uint8, DT> d8;
        return hn::PromoteTo(d, hn::LoadU(d8, channel_ + index * kPixelBytes));
    }

    // The sum of the pixels in a vector.
    template <class DT>
    static HWY_INLINE V folded([[maybe_unused]] DT d, hn::Vec<DT> sums) {
        if constexpr (kLanes<DT> <= 4) {
            return sums;
        } else {
            // UpperHalf, which not every target has, by argument alone.
            const hn::Half<DT> half;
            return folded(half, hn::Add(hn::LowerHalf(half, sums), UpperHalf(half, sums)));
        }
    }

    const uint8 *channel_;
};

HWY_INLINE auto normalised(hn::Vec<hn::CappedTag<uint16, 4>> sum, uint32 normaliser) {
    const hn::CappedTag<uint16, 4> d;
    const auto average = hn::MulHigh(sum, hn::Set(d, static_cast<uint16>(normaliser)));
    return hn::DemoteTo(hn::CappedTag<uint8, 4>(),
                        hn::BitCast(hn::RebindToSigned<decltype(d)>(), average));
}

HWY_INLINE auto normalised(hn::Vec<hn::CappedTag<uint32, 4>> sum, uint32 normaliser) {
    const hn::CappedTag<uint32, 4> d;
    return hn::U8FromU32(hn::ShiftRight<16>(hn::Mul(sum, hn::Set(d, normaliser))));
}

// Averages over the step: the pixels at both ends count by their part, those
// between whole.  The last source pixel never enters a sum; what would start
// there is a copy of it.
template <class T>
class RasterScaleRowBox {
public:
    explicit RasterScaleRowBox(const ScaleAxis &axis)
        : axis_(axis),
          inner_(std::min(stepsBefore(axis.start, axis.lastPosition(), axis.step), axis.dstSize)) {}

    HWY_INLINE void operator()(uint8 *dst, const uint8 *src) const {
        if (inner_ != 0) {
            uint32 x = axis_.start;
            for (uint32 i = 1; i < inner_; ++i, x += axis_.step, dst += kPixelBytes)
                average<false>(dst, src, x);
            average<true>(dst, src, x);
            dst += kPixelBytes;
        }
        if (inner_ != axis_.dstSize)
            fillPixels(dst, src + size_t{axis_.srcSize - 1} * kPixelBytes, axis_.dstSize - inner_);
    }

private:
    // Only the last span can reach to the last pixel; it ends there.
    template <bool kIsLast>
    HWY_INLINE void average(uint8 *dst, const uint8 *src, uint32 x) const {
        const uint32 last = axis_.lastPosition();
        const uint32 spanEnd = kIsLast ? std::min(x + axis_.step, last) : x + axis_.step;
        const size_t begin = x >> 16, end = spanEnd >> 16;
        const uint32 head = (kScaleOne - (x & 0xFFFF)) >> 8;
        const uint32 tail = (spanEnd & 0xFFFF) >> 8;
        for (size_t channel = 0; channel < 4; channel += kLanes<typename BoxSums<T>::D>) {
            const BoxSums<T> sums(src + channel);
            auto sum = sums.weighted(begin, head);
            if constexpr (kIsLast) {
                sum = hn::Add(sum, sums.run(begin + 1, end));
                sum = hn::Add(sum, sums.weighted(end, tail));
            } else {
                // The span covers as many pixels as the step is long, or one
                // more.  Weights decide, not a branch that would be missed
                // every few pixels.
                const size_t middle = begin + (axis_.step >> 16);
                const bool isLonger = middle != end;
                sum = hn::Add(sum, sums.run(begin + 1, middle));
                sum = hn::Add(sum, sums.weighted(middle, isLonger ? 256 : tail));
                sum = hn::Add(sum, sums.weighted(end, isLonger ? tail : 0));
            }
            const auto bytes = normalised(sum, axis_.normaliser);
            hn::StoreU(bytes, hn::CappedTag<uint8, 4>(), dst + channel);
        }
    }

    const ScaleAxis &axis_;
    uint32 inner_;
};

// The source row of a vertical position.
HWY_INLINE uint32 rowOf(const ScaleAxis &axis, uint32 position) {
    const bool isAbove = position >> 31 != 0;
    return isAbove ? 0 : std::min(position >> 16, axis.srcSize - 1);
}

HWY_INLINE const uint8 *srcRow(const ScaleJob &job, uint32 row) {
    return advance(job.src.first, uint64_t{row} * static_cast<uint64_t>(job.src.step));
}

// The source rows that neighbouring destination rows share, already scaled.
template <class Row>
class RowCache {
public:
    RowCache(const ScaleJob &job, const Row &row, void *block)
        : job_(job), row_(row), slots_(static_cast<RasterScaleRowSlot *>(block)) {
        const ScaleCacheShape shape(job);
        period_ = static_cast<uint32>(shape.slots - 1);
        const auto behindSlots = reinterpret_cast<uintptr_t>(slots_ + shape.slots);
        auto *pixels = reinterpret_cast<uint8 *>((behindSlots + ScaleCacheShape::kAlignment - 1) &
                                                 -ScaleCacheShape::kAlignment);
        for (size_t i = 0; i < shape.slots; ++i)
            slots_[i] = {pixels + i * shape.rowBytes, kScaleNoRow};
    }

    HWY_INLINE const uint8 *fetch(uint32 position) const {
        const uint32 index = rowOf(job_.y, position);
        RasterScaleRowSlot &slot = slots_[index == 0 ? 0 : 1 + index % period_];
        if (slot.rowIndex != index) {
            slot.rowIndex = index;
            row_(slot.pixels, srcRow(job_, index));
        }
        return slot.pixels;
    }

private:
    const ScaleJob &job_;
    const Row &row_;
    RasterScaleRowSlot *slots_;
    uint32 period_;
};

// Each destination row is one scaled source row.  No cache: a row that comes
// again is copied from the destination row before.
template <class Row>
HWY_INLINE void walkDirect(const ScaleJob &job, const Row &row) {
    uint8 *dst = job.dst.first;
    uint32 y = job.y.start;
    uint32 previous = kScaleNoRow;
    for (uint32 i = 0; i < job.y.dstSize; ++i, y += job.y.step) {
        const uint32 index = rowOf(job.y, y);
        if (index == previous)
            std::memmove(dst, dst - job.dst.step, size_t{job.x.dstSize} * kPixelBytes);
        else
            row(dst, srcRow(job, index));
        previous = index;
        dst += job.dst.step;
    }
}

// In the vertical passes a lane is two channels, the even one below the odd one.
constexpr uint16 kEvenChannel = 0x00FF;

struct BlendBody {
    uint8 *dst;
    const uint8 *upper, *lower;
    uint32 lowerWeight; // 0 to 255

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        const auto channel = hn::Set(d, kEvenChannel);
        const auto wUpper = hn::Set(d, static_cast<uint16>(255 - lowerWeight));
        const auto wLower = hn::Set(d, static_cast<uint16>(lowerWeight));
        const auto above = loadPixels(d, upper + i * sizeof(uint16));
        const auto below = loadPixels(d, lower + i * sizeof(uint16));
        const auto even = hn::Add(hn::Mul(hn::And(above, channel), wUpper),
                                  hn::Mul(hn::And(below, channel), wLower));
        const auto odd = hn::Add(hn::Mul(hn::ShiftRight<8>(above), wUpper),
                                 hn::Mul(hn::ShiftRight<8>(below), wLower));
        storePixels(hn::Or(hn::ShiftRight<8>(even), hn::AndNot(channel, odd)), d,
                    dst + i * sizeof(uint16));
    }
};

// Each destination row is a blend of two source rows, with weights that sum to
// 255; at the edges both can be the same row.
template <class Row>
HWY_INLINE void walkLinear(const ScaleJob &job, const Row &row, void *block) {
    const RowCache<Row> cache(job, row, block);
    uint8 *dst = job.dst.first;
    uint32 y = job.y.start;
    for (uint32 i = 0; i < job.y.dstSize; ++i, y += job.y.step) {
        const uint8 *upper = cache.fetch(y);
        const uint8 *lower = cache.fetch(y + kScaleOne);
        walkAgain<uint16>(size_t{job.x.dstSize} * 2,
                          BlendBody{dst, upper, lower, (y & 0xFFFF) >> 8});
        dst += job.dst.step;
    }
}

// A source row and its weight in an average, 0 to 255.
struct Tap {
    const uint8 *row;
    uint16 weight;
};

struct AverageBody {
    uint8 *dst;
    const Tap *taps;
    size_t count;
    uint32 normaliser;

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        const auto channel = hn::Set(d, kEvenChannel);
        auto even = hn::Zero(d), odd = hn::Zero(d);
        for (const Tap *tap = taps; tap != taps + count; ++tap) {
            const auto weight = hn::Set(d, tap->weight);
            const auto pixels = loadPixels(d, tap->row + i * sizeof(uint16));
            even = hn::Add(even, hn::ShiftRight<8>(hn::Mul(hn::And(pixels, channel), weight)));
            odd = hn::Add(odd, hn::ShiftRight<8>(hn::Mul(hn::ShiftRight<8>(pixels), weight)));
        }
        // The weights do not exceed the step, so an average fits its 8 bits.
        const auto scale = hn::Set(d, static_cast<uint16>(normaliser));
        storePixels(hn::Or(hn::MulHigh(even, scale), hn::ShiftLeft<8>(hn::MulHigh(odd, scale))), d,
                    dst + i * sizeof(uint16));
    }
};

// Each destination row is the average of the source rows that the step covers,
// or of the first 32 of them.  A row covered whole has the weight 255 of 256.
template <class Row>
HWY_INLINE void walkBox(const ScaleJob &job, const Row &row, void *block) {
    const RowCache<Row> cache(job, row, block);
    uint8 *dst = job.dst.first;
    uint32 y = job.y.start;
    for (uint32 i = 0; i < job.y.dstSize; ++i, y += job.y.step) {
        Tap taps[kScaleMaxTaps];
        size_t count = 0;
        uint32 position = y;
        uint32 remaining = job.y.step;
        while (remaining != 0 && count < kScaleMaxTaps) {
            const uint32 toNext = kScaleOne - (position & 0xFFFF);
            const uint32 covered = std::min(toNext, remaining);
            const uint32 weight = std::min<uint32>(covered >> 8, 255);
            taps[count++] = {cache.fetch(position), static_cast<uint16>(weight)};
            position += covered;
            remaining -= covered;
        }
        walkAgain<uint16>(size_t{job.x.dstSize} * 2,
                          AverageBody{dst, taps, count, job.y.normaliser});
        dst += job.dst.step;
    }
}

template <class Row>
void walkRows(const ScaleJob &job, const Row &row, void *block) {
    switch (job.y.method) {
    case ScaleMethod::kNearest:
        return walkDirect(job, row);
    case ScaleMethod::kLinear:
        return walkLinear(job, row, block);
    case ScaleMethod::kBox:
        return walkBox(job, row, block);
    }
}

void scaleRect(const ScaleJob &job, void *block) {
    switch (job.x.method) {
    case ScaleMethod::kNearest:
        return walkRows(job, RasterScaleRowNearest(job.x), block);
    case ScaleMethod::kLinear:
        return walkRows(job, RasterScaleRowLinear(job.x), block);
    case ScaleMethod::kBox:
        return job.x.step <= 257 * kScaleOne
                   ? walkRows(job, RasterScaleRowBox<uint16>(job.x), block)
                   : walkRows(job, RasterScaleRowBox<uint32>(job.x), block);
    }
}

} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace quillon {

HWY_EXPORT(scaleRect);

void RasterScaleRect(const ScaleJob &job, void *cache) {
    HWY_DYNAMIC_DISPATCH(scaleRect)(job, cache);
}

} // namespace quillon
#endif
