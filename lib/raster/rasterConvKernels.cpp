#include "raster/rasterConvKernels.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "raster/rasterConvKernels.cpp"
#include "hwy/foreach_target.h"
#include "hwy/highway.h"

#include "raster/kernels-inl.h"
#include "raster/packed24-inl.h"

// A conversion is a source, which loads a vector of pixels as words of the
// 32-bit layout, and a destination, which stores such words.  Narrowing what has
// been widened gives back every bit, so the detour through words, which never
// leaves the registers, costs nothing in exactness.  Pairs whose pixels stay
// within 16 bits skip it.

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {

template <class D>
HWY_INLINE hn::Vec<D> masked(D d, hn::Vec<D> v, uint32_t mask) {
    return hn::And(v, hn::Set(d, static_cast<hn::TFromD<D>>(mask)));
}

// A shift to the right, or to the left where the distance is negative.
template <int kDistance, class V>
HWY_INLINE V shiftedRight(V v) {
    if constexpr (kDistance >= 0)
        return hn::ShiftRight<kDistance>(v);
    else
        return hn::ShiftLeft<-kDistance>(v);
}

// Pixels moved into a one-byte layout, in lanes of any width.
template <ChannelEnds kEnds, int kDepth, class D>
HWY_INLINE hn::Vec<D> toSmall(D d, hn::Vec<D> v) {
    constexpr const auto &mask = RasterSmallMasks[kDepth];
    const auto red = shiftedRight<shiftToMask(kEnds.red, mask[0])>(v);
    const auto green = shiftedRight<shiftToMask(kEnds.green, mask[1])>(v);
    const auto blue = shiftedRight<shiftToMask(kEnds.blue, mask[2])>(v);
    return hn::Or(masked(d, red, mask[0]),
                  hn::Or(masked(d, green, mask[1]), masked(d, blue, mask[2])));
}

// ---- Sources ------------------------------------------------------------

// 16-bit pixels, one to a lane of 32 bits.
template <class D>
HWY_INLINE hn::Vec<D> load16(D d, const uint8_t *src) {
    const hn::Rebind<uint16_t, D> d16;
    return hn::PromoteTo(d, hn::LoadU(d16, reinterpret_cast<const uint16_t *>(src)));
}

struct From15 {
    static constexpr size_t kBytes = 2;
    static constexpr bool kHasAlpha = false;

    template <class D>
    HWY_INLINE static hn::Vec<D> load(D d, const uint8_t *src, const uint32_t * /*palette*/) {
        const auto p = load16(d, src);
        const auto top = hn::Or(
            hn::ShiftLeft<9>(masked(d, p, 0x7C00)),
            hn::Or(hn::ShiftLeft<6>(masked(d, p, 0x03E0)), hn::ShiftLeft<3>(masked(d, p, 0x001F))));
        return hn::Or(top, masked(d, hn::ShiftRight<5>(top), 0x070707));
    }
};

struct From16 {
    static constexpr size_t kBytes = 2;
    static constexpr bool kHasAlpha = false;

    template <class D>
    HWY_INLINE static hn::Vec<D> load(D d, const uint8_t *src, const uint32_t * /*palette*/) {
        const auto p = load16(d, src);
        const auto top = hn::Or(
            hn::ShiftLeft<8>(masked(d, p, 0xF800)),
            hn::Or(hn::ShiftLeft<5>(masked(d, p, 0x07E0)), hn::ShiftLeft<3>(masked(d, p, 0x001F))));
        return hn::Or(top, hn::Or(masked(d, hn::ShiftRight<5>(top), 0x070007),
                                  masked(d, hn::ShiftRight<6>(top), 0x000300)));
    }
};

struct From24 {
    static constexpr size_t kBytes = 3;
    static constexpr bool kHasAlpha = false;

    template <class D>
    HWY_INLINE static hn::Vec<D> load(D d, const uint8_t *src, const uint32_t * /*palette*/) {
        return load24(d, src);
    }
};

struct From32 {
    static constexpr size_t kBytes = 4;
    static constexpr bool kHasAlpha = true;

    template <class D>
    HWY_INLINE static hn::Vec<D> load(D d, const uint8_t *src, const uint32_t * /*palette*/) {
        return hn::LoadU(d, reinterpret_cast<const uint32_t *>(src));
    }
};

struct FromIndex {
    static constexpr size_t kBytes = 1;
    static constexpr bool kHasAlpha = true;

    template <class D>
    HWY_INLINE static hn::Vec<D> load(D d, const uint8_t *src, const uint32_t *palette) {
        // A gather of less than four lanes would look up the lanes that are not
        // there, too.
        constexpr size_t n = kLanes<D>;
        if constexpr (n == 1) {
            return hn::Set(d, palette[src[0]]);
        } else if constexpr (n == 2) {
            const hn::Repartition<uint64_t, D> d64;
            return hn::BitCast(d, hn::Set(d64, palette[src[0]] | uint64_t{palette[src[1]]} << 32));
        } else {
            const hn::Rebind<int32_t, D> index;
            const hn::Rebind<uint8_t, D> d8;
            return hn::GatherIndex(d, palette, hn::PromoteTo(index, hn::LoadU(d8, src)));
        }
    }
};

// ---- Destinations -------------------------------------------------------

template <class D>
HWY_INLINE void store16(D /*d*/, hn::Vec<D> v, uint8_t *dst) {
    const hn::Rebind<uint16_t, D> d16;
    hn::StoreU(hn::TruncateTo(d16, v), d16, reinterpret_cast<uint16_t *>(dst));
}

template <int kDepth>
struct ToSmall {
    static constexpr size_t kBytes = 1;
    static constexpr bool kHasAlpha = false;

    template <class D>
    HWY_INLINE static void store(D d, hn::Vec<D> v, uint8_t *dst) {
        const hn::Rebind<uint8_t, D> d8;
        hn::StoreU(hn::TruncateTo(d8, toSmall<kEnds32, kDepth>(d, v)), d8, dst);
    }
};

template <int kRedShift, uint32_t kRed, int kGreenShift, uint32_t kGreen>
struct To16Bits {
    static constexpr size_t kBytes = 2;
    static constexpr bool kHasAlpha = false;

    template <class D>
    HWY_INLINE static void store(D d, hn::Vec<D> v, uint8_t *dst) {
        store16(d,
                hn::Or(masked(d, hn::ShiftRight<kRedShift>(v), kRed),
                       hn::Or(masked(d, hn::ShiftRight<kGreenShift>(v), kGreen),
                              masked(d, hn::ShiftRight<3>(v), 0x001F))),
                dst);
    }
};
using To15 = To16Bits<9, 0x7C00, 6, 0x03E0>;
using To16 = To16Bits<8, 0xF800, 5, 0x07E0>;

struct To24 {
    static constexpr size_t kBytes = 3;
    static constexpr bool kHasAlpha = false;

    template <class D>
    HWY_INLINE static void store(D d, hn::Vec<D> v, uint8_t *dst) {
        store24(d, v, dst);
    }
};

struct To32 {
    static constexpr size_t kBytes = 4;
    static constexpr bool kHasAlpha = true;

    template <class D>
    HWY_INLINE static void store(D d, hn::Vec<D> v, uint8_t *dst) {
        hn::StoreU(v, d, reinterpret_cast<uint32_t *>(dst));
    }
};

// ---- Bodies -------------------------------------------------------------

template <class Source, class Destination>
struct ThroughWords {
    using Lane = uint32_t;
    static constexpr size_t kSrcBytes = Source::kBytes;
    static constexpr size_t kDstBytes = Destination::kBytes;

    uint8_t *dst;
    const uint8_t *src;
    const uint32_t *palette;

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        auto words = Source::load(d, src + i * kSrcBytes, palette);
        if constexpr (Destination::kHasAlpha && !Source::kHasAlpha)
            words = hn::Or(words, hn::Set(d, 0xFF000000));
        Destination::store(d, words, dst + i * kDstBytes);
    }
};

struct Widen15To16 {
    template <class D>
    HWY_INLINE static hn::Vec<D> converted(D d, hn::Vec<D> p) {
        const auto wide =
            hn::Or(hn::ShiftLeft<1>(masked(d, p, 0x7FE0)), hn::ShiftRight<4>(masked(d, p, 0x0200)));
        return hn::Or(masked(d, p, 0x001F), wide);
    }
};

struct Narrow16To15 {
    template <class D>
    HWY_INLINE static hn::Vec<D> converted(D d, hn::Vec<D> p) {
        return hn::Or(masked(d, p, 0x001F), masked(d, hn::ShiftRight<1>(p), 0x7FE0));
    }
};

// From one layout of 16 bits to the other.
template <class Conversion>
struct Within16 {
    using Lane = uint16_t;
    static constexpr size_t kSrcBytes = 2;
    static constexpr size_t kDstBytes = 2;

    uint8_t *dst;
    const uint8_t *src;
    const uint32_t *palette;

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        const auto p = hn::LoadU(d, reinterpret_cast<const uint16_t *>(src + 2 * i));
        hn::StoreU(Conversion::converted(d, p), d, reinterpret_cast<uint16_t *>(dst + 2 * i));
    }
};

template <ChannelEnds kEnds, int kDepth>
struct From16ToSmall {
    using Lane = uint16_t;
    static constexpr size_t kSrcBytes = 2;
    static constexpr size_t kDstBytes = 1;

    uint8_t *dst;
    const uint8_t *src;
    const uint32_t *palette;

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        const hn::Rebind<uint8_t, D> d8;
        const auto p = hn::LoadU(d, reinterpret_cast<const uint16_t *>(src + 2 * i));
        hn::StoreU(hn::TruncateTo(d8, toSmall<kEnds, kDepth>(d, p)), d8, dst + i);
    }
};

// ---- Rectangles ---------------------------------------------------------

struct Job {
    DstRows dst;
    SrcRows src;
    const uint32 *palette;
    Size size;
};

template <class Body>
void walkRows(const Job &job) {
    const Size size = joinedRows(job.size, Body::kDstBytes * job.size.width, job.dst.step,
                                 Body::kSrcBytes * job.size.width, job.src.step);
    for (size_t y = 0; y < size.height; ++y)
        walkAgain<typename Body::Lane>(size.width,
                                       Body{job.dst.row(y), job.src.row(y), job.palette});
}

template <class Source>
void convertWords(Layout dstLayout, const Job &job) {
    switch (dstLayout) {
    case Layout::Small3:
        return walkRows<ThroughWords<Source, ToSmall<3>>>(job);
    case Layout::Small6:
        return walkRows<ThroughWords<Source, ToSmall<6>>>(job);
    case Layout::Small8:
        return walkRows<ThroughWords<Source, ToSmall<8>>>(job);
    case Layout::Rgb15:
        return walkRows<ThroughWords<Source, To15>>(job);
    case Layout::Rgb16:
        return walkRows<ThroughWords<Source, To16>>(job);
    case Layout::Rgb24:
        return walkRows<ThroughWords<Source, To24>>(job);
    case Layout::Rgb32:
        return walkRows<ThroughWords<Source, To32>>(job);
    case Layout::Index:
        return;
    }
}

// From 15 or 16; Conversion goes to the other of the two.
template <class Source, ChannelEnds kEnds, class Conversion>
void convert16(Layout dstLayout, const Job &job) {
    switch (dstLayout) {
    case Layout::Small3:
        return walkRows<From16ToSmall<kEnds, 3>>(job);
    case Layout::Small6:
        return walkRows<From16ToSmall<kEnds, 6>>(job);
    case Layout::Small8:
        return walkRows<From16ToSmall<kEnds, 8>>(job);
    case Layout::Rgb15:
    case Layout::Rgb16:
        return walkRows<Within16<Conversion>>(job);
    case Layout::Rgb24:
        return walkRows<ThroughWords<Source, To24>>(job);
    case Layout::Rgb32:
        return walkRows<ThroughWords<Source, To32>>(job);
    case Layout::Index:
        return;
    }
}

void Convert(Layout dstLayout, DstRows dst, Layout srcLayout, SrcRows src, const uint32 *palette,
             Size size) {
    const Job job = {dst, src, palette, size};
    switch (srcLayout) {
    case Layout::Index:
        return convertWords<FromIndex>(dstLayout, job);
    case Layout::Rgb15:
        return convert16<From15, kEnds15, Widen15To16>(dstLayout, job);
    case Layout::Rgb16:
        return convert16<From16, kEnds16, Narrow16To15>(dstLayout, job);
    case Layout::Rgb24:
        return convertWords<From24>(dstLayout, job);
    case Layout::Rgb32:
        return convertWords<From32>(dstLayout, job);
    case Layout::Small3:
    case Layout::Small6:
    case Layout::Small8:
        return; // destinations only
    }
}

} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace quillon {

HWY_EXPORT(Convert);

void convertRows(Layout dstLayout, DstRows dst, Layout srcLayout, SrcRows src,
                 const uint32 *palette, Size size) {
    HWY_DYNAMIC_DISPATCH(Convert)(dstLayout, dst, srcLayout, src, palette, size);
}

} // namespace quillon
#endif
