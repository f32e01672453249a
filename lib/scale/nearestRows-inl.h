// The horizontal pass of the scaler where it takes nearest pixels.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_SCALE_NEAREST_ROWS_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_SCALE_NEAREST_ROWS_INL_H
#undef QUILLON_SCALE_NEAREST_ROWS_INL_H
#else
#define QUILLON_SCALE_NEAREST_ROWS_INL_H
#endif

#include "hwy/highway.h"

#include "scale/channels-inl.h"
#include "scale/pixelRows-inl.h"
#include "scale/scaleAxis.h"
#include "scale/scalePlain.h"

#include <algorithm>
#include <cstring>
#include <type_traits>

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {
#if QUILLON_HAS_VECTORS

// Each pixel is the source pixel of its position, or the last one where the position
// lies behind that.  Kinds of rows differ in how positions advance; the kind is
// chosen once for all rows.
class NearestRow {
public:
    explicit NearestRow(const ScaleAxis &axis)
        : start_(axis.start), step_(axis.step), srcSize_(axis.srcSize), count_(axis.dstSize),
          inner_(std::min(stepsBefore(axis.start, axis.lastPosition(), axis.step), axis.dstSize)) {}

protected:
    // The pixels behind the inner ones.
    HWY_INLINE void fillBehindInner(uint8_t *dst, const uint8_t *src) const {
        fillPixels(dst + size_t{4} * inner_, src, srcSize_ - 1, count_ - inner_);
    }

    uint32_t start_, step_, srcSize_, count_;
    uint32_t inner_; // pixels whose positions lie in front of the last source pixel
};

// ---- Any positions --------------------------------------------------------

// Positions that wrap.
class NearestWrapping {
public:
    explicit NearestWrapping(const ScaleAxis &axis) : axis_(axis) {}

    HWY_INLINE void operator()(uint8_t *dst, const uint8_t *src) const {
        nearestRowPlain(axis_, dst, src);
    }

private:
    const ScaleAxis &axis_;
};

// Pixels far from each other, none of them behind the last one.
struct NearestGatherBody {
    static constexpr size_t kDstBytes = 4;
    uint8_t *dst;
    const uint8_t *src;
    uint32_t start, step;

    template <class C, class Access>
    HWY_INLINE void operator()(C /*chunk*/, size_t i, Access access) const {
        const uint32_t first = start + static_cast<uint32_t>(i) * step;
        if constexpr (kHasFastGather && C::kUnits >= 4) {
            const PixelTag<C> d;
            const auto index = hn::ShiftRight<16>(positionsFrom(d, first, step));
            const auto *table = reinterpret_cast<const uint32_t *>(src);
            const auto pixels =
                gather(d, table, hn::BitCast(hn::RebindToSigned<PixelTag<C>>(), index));
            access.store(d, pixels, dst + 4 * i);
        } else {
            // All are read before any is written, as the compiler cannot know that the
            // rows do not overlap.  The index stands in the upper half of 64 bits: one
            // instruction less for each.
            uint32_t pixels[C::kUnits];
            uint64_t position = uint64_t{first} << 16;
            for (uint32_t &pixel : pixels) {
                pixel = pixelAt(src, position >> 32);
                position += uint64_t{step} << 16;
            }
            for (size_t k = 0; k < C::kUnits; ++k)
                putPixel(dst, i + k, pixels[k]);
        }
    }
};

// Gathers of 16 pixels take 1.1 times as long as two of 8.  Pixels one by one: as many as
// there are registers for.
inline constexpr size_t kGatheredAtOnce = kHasFastGather ? 8 : kGeneralRegisters / 2;

template <class Access>
struct NearestGathered : NearestRow {
    using NearestRow::NearestRow;

    HWY_INLINE void operator()(uint8_t *dst, const uint8_t *src) const {
        const NearestGatherBody body = {dst, src, start_, step_};
        if constexpr (kHasFastGather)
            walkPixelsBy<Access, kGatheredAtOnce>(inner_, body);
        else
            walkPixels<kGatheredAtOnce>(inner_, body);
        fillBehindInner(dst, src);
    }
};

// ---- Steps of one pixel, and of a half ------------------------------------

struct NearestCopied : NearestRow {
    using NearestRow::NearestRow;

    HWY_INLINE void operator()(uint8_t *dst, const uint8_t *src) const {
        std::memcpy(dst, src + size_t{4} * (start_ >> 16), size_t{4} * inner_);
        fillBehindInner(dst, src);
    }
};

// Each pixel twice.  The units are source pixels.
struct DoubleBody {
    static constexpr size_t kDstBytes = 8;
    static constexpr bool kTestsEnd = true;
    uint8_t *dst;
    const uint8_t *src;

    template <class C, class Access>
    HWY_INLINE void operator()(C /*chunk*/, size_t i, Access access) const {
        HWY_ALIGN static constexpr uint32_t kTwice[16] = {0, 0, 1, 1, 2, 2, 3, 3,
                                                          4, 4, 5, 5, 6, 6, 7, 7};
        const hn::CappedTag<uint32_t, 2 * C::kUnits> d;
        if constexpr (C::kUnits == 1) {
            access.store(d, hn::Set(d, pixelAt(src, i)), dst + 8 * i);
        } else {
            const auto pixels = access.load(PixelTag<C>(), src + 4 * i);
            access.store(d,
                         hn::TableLookupLanes(hn::ZeroExtendVector(d, pixels),
                                              hn::SetTableIndices(d, kTwice)),
                         dst + 8 * i);
        }
    }
};

// Steps of half a pixel, from a whole one on.
template <class Access>
class NearestDoubled {
public:
    explicit NearestDoubled(const ScaleAxis &axis)
        : first_(std::min(axis.start >> 16, axis.srcSize - 1)), last_(axis.srcSize - 1),
          count_(axis.dstSize), pairs_(std::min(axis.srcSize - first_, axis.dstSize / 2)) {}

    HWY_INLINE void operator()(uint8_t *dst, const uint8_t *src) const {
        const DoubleBody body = {dst, src + size_t{4} * first_};
        walkPixelsBy<Access, kVectorPixels / 2>(pairs_, body);
        // The first pixel of an incomplete pair, or copies of the last one.
        fillPixels(dst + size_t{8} * pairs_, src, std::min(first_ + pairs_, last_),
                   count_ - 2 * pairs_);
    }

private:
    uint32_t first_, last_, count_;
    uint32_t pairs_; // of destination pixels whose source pixel is in the row
};

// ---- Steps of a few pixels ------------------------------------------------

// Steps of up to kWindows pixels.  srcSize is kWindows chunks or more.
template <uint32_t kWindows>
struct NearestBody {
    static constexpr bool kTestsEnd = kWindows > 1;
    uint8_t *dst;
    const uint8_t *src;
    uint32_t start, step;

    template <class C, class Access>
    HWY_INLINE void operator()(C /*chunk*/, size_t i, Access access) const {
        const PixelTag<C> d;
        const uint32_t first = start + static_cast<uint32_t>(i) * step;
        const auto index = hn::ShiftRight<16>(positionsFrom(d, first & 0xFFFF, step));
        const uint8_t *window = src + size_t{4} * (first >> 16);
        access.store(d, pickFromWindows<kWindows>(d, window, index), dst + 4 * i);
    }
};

// The same where windows or positions may reach past the end of the row.
template <uint32_t kWindows>
struct NearestToEndBody {
    static constexpr size_t kDstBytes = 4;
    uint8_t *dst;
    const uint8_t *src;
    uint32_t start, step, srcSize;

    template <class C, class Access>
    HWY_INLINE void operator()(C /*chunk*/, size_t i, Access access) const {
        const PixelTag<C> d;
        const uint32_t first = start + static_cast<uint32_t>(i) * step;
        const uint32_t base = std::min(first >> 16, srcSize - kWindows * uint32_t{C::kUnits});
        const auto index = hn::Min(hn::ShiftRight<16>(positionsFrom(d, first - (base << 16), step)),
                                   hn::Set(d, srcSize - 1 - base));
        access.store(d, pickFromWindows<kWindows>(d, src + size_t{4} * base, index), dst + 4 * i);
    }
};

template <class Access, uint32_t kWindows>
class NearestPicked {
public:
    explicit NearestPicked(const ScaleAxis &axis)
        : start_(axis.start), step_(axis.step), srcSize_(axis.srcSize), count_(axis.dstSize),
          inner_(innerOf(axis)) {}

    HWY_INLINE void operator()(uint8_t *dst, const uint8_t *src) const {
        constexpr RowPolicy kInner = {.tail = Tail::kNone};
        constexpr RowPolicy kShort = {.tail = Tail::kOverlapInLoop};
        constexpr Chunk<kVectorPixels> kChunk;
        const NearestToEndBody<kWindows> toEnd = {dst, src, start_, step_, srcSize_};
        if (srcSize_ < kWindowPixels || count_ < kVectorPixels)
            return walkPixels(count_, toEnd, srcSize_ / kWindows);
        if constexpr (std::is_same_v<Access, NonTemporal>)
            return walkAlignedRow<NonTemporal>(kChunk, count_, toEnd);
        // What pixels inside the row save is less than a second loop takes here.
        if (kVectorBytes >= 64 && count_ <= 2 * kVectorPixels)
            return walkRow<kShort>(kChunk, count_, toEnd);
        walkFrom<kInner, Unaligned>(kChunk, 0, inner_,
                                    NearestBody<kWindows>{dst, src, start_, step_});
        walkFrom<RowPolicy{}, Unaligned>(kChunk, inner_, count_, toEnd);
    }

private:
    static constexpr uint32_t kWindowPixels = kWindows * uint32_t{kVectorPixels};

    // The pixels of those whole chunks whose windows lie in the source row.
    static uint32_t innerOf(const ScaleAxis &axis) {
        if (axis.srcSize < kWindowPixels)
            return 0;
        const uint32_t end = (axis.srcSize - kWindowPixels + 1) << 16;
        constexpr uint32_t kPixels{kVectorPixels};
        const uint32_t chunks = (stepsBefore(axis.start, end, axis.step) + kPixels - 1) / kPixels;
        return std::min(chunks, axis.dstSize / kPixels) * kPixels;
    }

    uint32_t start_, step_, srcSize_, count_;
    uint32_t inner_;
};

#endif
} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
