// The pixel formats.  kPixelFormats is the one list of them: sizes, shifts, weights
// and the kernels that there are follow from it.  A new format is an enumerator, a
// row, and a source and destination in pixelFormats-inl.h if no other format has
// pixels of its size.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <utility>

namespace quillon {

// The channels of a pixel, which is little-endian in memory.
struct ChannelMasks {
    uint32_t red, green, blue;

    // Not defaulted: GCC 14 does not take that for constexpr.
    constexpr bool operator==(const ChannelMasks &other) const {
        return red == other.red && green == other.green && blue == other.blue;
    }
};

inline constexpr ChannelMasks kMasksOfBytes = {0xFF0000, 0x00FF00, 0x0000FF};

enum class PixelFormat : uint8_t {
    kNone,   // of depths that name no format
    kIndex,  // into a palette of 32-bit pixels
    kSmall3, // the others by their depths
    kSmall6,
    kSmall8,
    kRgb15,
    kRgb16,
    kRgb24,
    kRgb32,
};

struct FormatTraits {
    PixelFormat format;
    int32_t depth; // the name that callers know it by, or kNoDepth
    int32_t bytesPerPixel;
    ChannelMasks masks; // of a palette's entries for kIndex
    bool isSource, isDestination, hasAlpha;
};

inline constexpr int32_t kNoDepth = -1;

// clang-format off
inline constexpr FormatTraits kPixelFormats[] = {
    //                     depth     bytes  red, green, blue          source dest.  alpha
    {PixelFormat::kNone,   kNoDepth, 0,     {},                       false, false, false},
    {PixelFormat::kIndex,  kNoDepth, 1,     kMasksOfBytes,            true,  false, true},
    {PixelFormat::kSmall3, 3,        1,     {0x04, 0x20, 0x80},       false, true,  false},
    {PixelFormat::kSmall6, 6,        1,     {0x30, 0x0C, 0x03},       false, true,  false},
    {PixelFormat::kSmall8, 8,        1,     {0x07, 0x38, 0xC0},       false, true,  false},
    {PixelFormat::kRgb15,  15,       2,     {0x7C00, 0x03E0, 0x001F}, true,  true,  false},
    {PixelFormat::kRgb16,  16,       2,     {0xF800, 0x07E0, 0x001F}, true,  true,  false},
    {PixelFormat::kRgb24,  24,       3,     kMasksOfBytes,            true,  true,  false},
    {PixelFormat::kRgb32,  32,       4,     kMasksOfBytes,            true,  true,  true},
};
// clang-format on
inline constexpr size_t kFormatCount = std::size(kPixelFormats);

constexpr const FormatTraits &traitsOf(PixelFormat format) {
    return kPixelFormats[static_cast<size_t>(format)];
}

// ---- By depth -------------------------------------------------------------

inline constexpr int32_t kMaxDepth = 32;

inline constexpr auto kFormatAtDepth = [] {
    std::array<PixelFormat, kMaxDepth + 1> formats = {};
    for (const FormatTraits &row : kPixelFormats)
        if (row.depth != kNoDepth)
            formats[static_cast<size_t>(row.depth)] = row.format;
    return formats;
}();

constexpr PixelFormat formatAt(int32_t depth) {
    return depth >= 0 && depth <= kMaxDepth ? kFormatAtDepth[static_cast<size_t>(depth)]
                                            : PixelFormat::kNone;
}

// The bytes of a pixel at a depth.  Depths that name no format have an answer, too,
// by which pixels of equal depths are copied.
constexpr int32_t bytesPerPixelAt(int32_t depth) {
    const PixelFormat format = formatAt(depth);
    return format == PixelFormat::kNone ? depth / 8 : traitsOf(format).bytesPerPixel;
}

// ---- Pairs of formats -----------------------------------------------------

// One function for each pair of a source and a destination, for which
// make.operator()<kFrom, kTo>() stands; null for the pairs that do not exist.
template <class Function>
class PairTable {
public:
    template <class Make>
    constexpr explicit PairTable(Make make) {
        addPairs(make, std::make_index_sequence<kFormatCount * kFormatCount>());
    }

    constexpr Function at(PixelFormat from, PixelFormat to) const {
        return functions_[static_cast<size_t>(from)][static_cast<size_t>(to)];
    }

private:
    template <class Make, size_t... kPairs>
    constexpr void addPairs(Make make, std::index_sequence<kPairs...> /*pairs*/) {
        (addPair<PixelFormat{kPairs / kFormatCount}, PixelFormat{kPairs % kFormatCount}>(make),
         ...);
    }
    template <PixelFormat kFrom, PixelFormat kTo, class Make>
    constexpr void addPair(Make make) {
        if constexpr (traitsOf(kFrom).isSource && traitsOf(kTo).isDestination)
            functions_[static_cast<size_t>(kFrom)][static_cast<size_t>(kTo)] =
                make.template operator()<kFrom, kTo>();
    }

    Function functions_[kFormatCount][kFormatCount] = {};
};

} // namespace quillon
