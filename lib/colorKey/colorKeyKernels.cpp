#include "colorKey/colorKeyKernels.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "colorKey/colorKeyKernels.cpp"
#include "hwy/foreach_target.h"
#include "hwy/highway.h"

#include "legacy/kernels-inl.h"
#include "legacy/streaming-inl.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace {

// Key pixels as words that equal the key where they match.  Of 32-bit pixels the
// top byte is shifted out.
template <class D>
HWY_INLINE hn::Vec<D> loadKeys(D d, const uint32_t *keys) {
    return hn::ShiftLeft<8>(hn::LoadU(d, keys));
}

template <class D, class Pixel>
HWY_INLINE hn::Vec<D> loadKeys(D d, const Pixel *keys) {
    const hn::Rebind<Pixel, D> narrow;
    return hn::PromoteTo(d, hn::LoadU(narrow, keys));
}

template <class Pixel, class Store>
struct ApplyKey {
    uint8_t *dst;
    const uint8_t *background, *overlay, *keys;
    uint32_t key;

    template <class D>
    HWY_INLINE void operator()(D d, size_t i) const {
        const auto words = [&](const uint8_t *row) HWY_ATTR {
            return hn::LoadU(d, reinterpret_cast<const uint32_t *>(row) + i);
        };
        const auto matches =
            hn::Eq(loadKeys(d, reinterpret_cast<const Pixel *>(keys) + i), hn::Set(d, key));
        Store::store(d, hn::IfThenElse(matches, words(overlay), words(background)), dst + 4 * i);
    }
};

template <class Pixel>
struct KeyedSurfaces {
    KeyedRows rows;
    Size size;
    uint32_t key;

    template <class Store>
    ApplyKey<Pixel, Store> body(size_t y) const {
        return {rows.dst.row(y), rows.background.row(y), rows.overlay.row(y), rows.key.row(y), key};
    }

    // Whether the pixels of a row have to be gone through one by one.  Writing
    // goes on faster than the reading of narrow key pixels and may catch up with
    // it anywhere, so there any overlap counts.
    bool runsIntoItself(size_t y) const {
        constexpr size_t kVector = 4 * kLanes<Widest<uint32_t>>;
        const uint8_t *dst = rows.dst.row(y), *keys = rows.key.row(y);
        const auto catchesUp = [&](const uint8_t *src) {
            return HWY_NAMESPACE::runsIntoItself(dst, src, kVector);
        };
        if (catchesUp(rows.background.row(y)) || catchesUp(rows.overlay.row(y)))
            return true;
        if constexpr (sizeof(Pixel) == 4)
            return catchesUp(keys);
        return addressesOf(SrcRows{dst, 0}, 4 * size.width, 1)
            .overlaps(addressesOf(SrcRows{keys, 0}, sizeof(Pixel) * size.width, 1));
    }

    // Whether nothing that is written is read.
    bool isApart() const {
        const auto all = [&](const auto &surface, size_t pixelBytes) {
            return addressesOf(surface, pixelBytes * size.width, size.height);
        };
        const AddressRange dst = all(rows.dst, 4);
        return !dst.overlaps(all(rows.background, 4)) && !dst.overlaps(all(rows.overlay, 4)) &&
               !dst.overlaps(all(rows.key, sizeof(Pixel)));
    }

    // A row pixel by pixel: where their order counts, or where there are only few.
    void applySingly(size_t y) const {
        const auto body = this->template body<ThroughCaches>(y);
        for (size_t x = 0; x < size.width; ++x) {
            Pixel pixel;
            hwy::CopyBytes<sizeof(Pixel)>(body.keys + sizeof(Pixel) * x, &pixel);
            // As the key comes: without the top byte of 32 bits.
            const uint32_t compared = sizeof(Pixel) == 4 ? uint32_t{pixel} << 8 : pixel;
            uint32_t over, under;
            hwy::CopyBytes<4>(body.overlay + 4 * x, &over);
            hwy::CopyBytes<4>(body.background + 4 * x, &under);
            const uint32_t word = compared == key ? over : under;
            hwy::CopyBytes<4>(&word, body.dst + 4 * x);
        }
    }
};

template <class Pixel>
void applyKey(const KeyedRows &rows, Size size, uint32_t key) {
    const size_t rowBytes = 4 * size.width;
    const auto fits = [](const SrcRows &src, size_t bytes) {
        return src.step == static_cast<ptrdiff_t>(bytes);
    };
    if (fits(rows.background, rowBytes) && fits(rows.overlay, rowBytes))
        size = joinedRows(size, rowBytes, rows.dst.step, sizeof(Pixel) * size.width, rows.key.step);

    const KeyedSurfaces<Pixel> surfaces = {rows, size, key};
    const bool streams = isStreamed(4 * size.width, size.height) && surfaces.isApart();
    for (size_t y = 0; y < size.height; ++y) {
        if (size.width < 4) {
            surfaces.applySingly(y);
            continue;
        }
        const auto body = surfaces.template body<ThroughCaches>(y);
        if (streams)
            walkStreaming<uint32_t, 4>(body.dst, size.width, body,
                                       surfaces.template body<AroundCaches>(y));
        else if (surfaces.runsIntoItself(y))
            surfaces.applySingly(y);
        else
            walkOnce<uint32_t>(size.width, body);
    }
    if (streams)
        hwy::FlushStream();
}

void Key(const KeyedRows &rows, Size size, KeyPixel keyPixel, uint32_t key) {
    switch (keyPixel) {
    case KeyPixel::Bytes1:
        return applyKey<uint8_t>(rows, size, key);
    case KeyPixel::Bytes2:
        return applyKey<uint16_t>(rows, size, key);
    case KeyPixel::Bytes4:
        return applyKey<uint32_t>(rows, size, key << 8);
    }
}

} // namespace
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace quillon {

HWY_EXPORT(Key);

void applyKeyRows(const KeyedRows &rows, Size size, KeyPixel keyPixel, uint32_t key) {
    HWY_DYNAMIC_DISPATCH(Key)(rows, size, keyPixel, key);
}

} // namespace quillon
#endif
