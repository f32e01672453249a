// Pixels as one vector of bytes for each channel: how conversions are done where loads
// and stores split pixels into these.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_CONVERT_FORMAT_CHANNELS_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_CONVERT_FORMAT_CHANNELS_INL_H
#undef QUILLON_CONVERT_FORMAT_CHANNELS_INL_H
#else
#define QUILLON_CONVERT_FORMAT_CHANNELS_INL_H
#endif

#include "hwy/highway.h"

#include "convert/channels.h"
#include "convert/pixelFormats.h"
#include "simd/access-inl.h"
#include "simd/bitInsert-inl.h"
#include "simd/target-inl.h"

#include <algorithm>
#include <bit>

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
#if QUILLON_HAS_VECTORS

// A channel of fewer than 8 bits stands in the upper bits of its bytes.
template <class D8>
struct Channels {
    hn::Vec<D8> blue, green, red, alpha;
};

// A format of two bytes: from the top padding, red, green, of which some bits are in
// each byte, and blue.
struct TwoByteLayout {
    int padding, red, green, blue;       // bits
    int greenInHigh, greenInLow, inHigh; // the last without green's

    constexpr explicit TwoByteLayout(const ChannelMasks &masks)
        : padding(16 - channelEnd(masks.red)), red(std::popcount(masks.red)),
          green(std::popcount(masks.green)), blue(std::popcount(masks.blue)),
          greenInHigh(8 - padding - red), greenInLow(8 - blue), inHigh(padding + red) {}
};

// ---- Loads ----------------------------------------------------------------

// Below its bits a channel again, if more of them are needed.
template <int kBits, uint32_t kMaskTo, class D8>
HWY_INLINE hn::Vec<D8> widenChannel(D8 d, hn::Vec<D8> v) {
    if constexpr (std::popcount(kMaskTo) > kBits)
        return insertBelow<kBits>(d, v, v);
    else
        return v;
}

template <PixelFormat kFormat, PixelFormat kTo, class D8>
HWY_INLINE Channels<D8> loadTwoBytes(D8 d, const uint8_t *src) {
    constexpr TwoByteLayout k(traitsOf(kFormat).masks);
    constexpr ChannelMasks to = traitsOf(kTo).masks;
    hn::Vec<D8> low, high;
    hn::LoadInterleaved2(d, src, low, high);
    const auto red = hn::ShiftLeft<k.padding>(high);
    const auto green = insertBelow<k.greenInHigh>(d, hn::ShiftLeft<k.inHigh>(high), low);
    const auto blue = hn::ShiftLeft<k.greenInLow>(low);
    return {widenChannel<k.blue, to.blue>(d, blue), widenChannel<k.green, to.green>(d, green),
            widenChannel<k.red, to.red>(d, red), hn::Set(d, 0xFF)};
}

// As many pixels as there are lanes, with the bits that the other format needs; alpha is
// 255 where the format has none.
template <PixelFormat kFormat, PixelFormat kTo, class D8>
HWY_INLINE Channels<D8> loadChannels(D8 d, const uint8_t *src) {
    constexpr int32_t kBytes = traitsOf(kFormat).bytesPerPixel;
    if constexpr (kBytes == 2) {
        return loadTwoBytes<kFormat, kTo>(d, src);
    } else if constexpr (kBytes == 3) {
        hn::Vec<D8> blue, green, red;
        hn::LoadInterleaved3(d, src, blue, green, red);
        return {blue, green, red, hn::Set(d, 0xFF)};
    } else {
        static_assert(kBytes == 4);
        hn::Vec<D8> blue, green, red, alpha;
        hn::LoadInterleaved4(d, src, blue, green, red, alpha);
        return {blue, green, red, alpha};
    }
}

// ---- Stores ---------------------------------------------------------------

template <PixelFormat kFormat, class D8>
HWY_INLINE hn::Vec<D8> oneByteOf(D8 d, const Channels<D8> &c) {
    // From the top.  What a channel has too many bits is overwritten by the next one.
    constexpr ChannelMasks to = traitsOf(kFormat).masks;
    constexpr int red = channelEnd(to.red), green = channelEnd(to.green),
                  blue = channelEnd(to.blue);
    constexpr uint32_t kUsed = to.red | to.green | to.blue;
    static_assert(green < std::max(red, blue) && green > std::min(red, blue));
    constexpr int kUpper = 8 - std::max(red, blue), kLower = 8 - std::min(red, blue);
    const auto first = hn::ShiftRight<kUpper>(red > blue ? c.red : c.blue);
    const auto second = insertBelow<8 - green>(d, first, c.green);
    const auto all = insertBelow<kLower>(d, second, red > blue ? c.blue : c.red);
    constexpr bool kHasGaps = std::popcount(kUsed) != channelEnd(kUsed);
    return kHasGaps ? hn::And(all, hn::Set(d, static_cast<uint8_t>(kUsed))) : all;
}

template <PixelFormat kFormat, class D8>
HWY_INLINE void storeTwoBytes(D8 d, const Channels<D8> &c, uint8_t *dst) {
    constexpr TwoByteLayout k(traitsOf(kFormat).masks);
    const auto high = insertBelow<k.inHigh>(d, hn::ShiftRight<k.padding>(c.red), c.green);
    const auto low = insertBelow<k.greenInLow>(d, hn::ShiftLeft<k.greenInHigh>(c.green), c.blue);
    hn::StoreInterleaved2(low, high, d, dst);
}

template <PixelFormat kFormat, class D8>
HWY_INLINE void storeChannels(D8 d, const Channels<D8> &c, uint8_t *dst) {
    constexpr int32_t kBytes = traitsOf(kFormat).bytesPerPixel;
    if constexpr (kBytes == 1)
        storeBytes(d, oneByteOf<kFormat>(d, c), dst);
    else if constexpr (kBytes == 2)
        storeTwoBytes<kFormat>(d, c, dst);
    else if constexpr (kBytes == 3)
        hn::StoreInterleaved3(c.blue, c.green, c.red, d, dst);
    else
        hn::StoreInterleaved4(c.blue, c.green, c.red, c.alpha, d, dst);
}

#endif
} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
