#include "operations.h"
#include "reference/pixels.h"
#include "support/judge.h"
#include <quillon/raster.h>

#include <algorithm>

namespace quillon::test {
namespace {

using reference::kDepths, reference::kSourceDepths;

// Rounded up for formats, and down for other depths, which can only be copied.
uint32_t bytesOf(int32_t depth) {
    const bool isFormat = std::ranges::find(kDepths, depth) != std::end(kDepths);
    return static_cast<uint32_t>(isFormat ? depth + 7 : depth) / 8;
}

// From a pixel format, or a palette, to a format.
struct Pair {
    int32_t srcDepth, dstDepth;
    bool pseudoColor;
    const uint32_t *palette = nullptr;
};

Pair drawPair(Random &random) {
    Pair pair = {random.oneOf(kSourceDepths), random.oneOf(kDepths), random.oneIn(4)};
    if (pair.pseudoColor)
        pair.srcDepth = random.oneOf({8, 4, 0, -15, INT32_MIN}); // all mean one byte
    else if (random.oneIn(8))                                    // any depth can be copied
        pair.srcDepth = pair.dstDepth = random.oneOf({3, 8, 12, 15, 16, 20, 24, 32});
    return pair;
}

// All pairs in turn.
Pair pairOf(uint64_t number) {
    constexpr size_t kSources = std::size(kSourceDepths);
    const size_t src = number / std::size(kDepths) % (kSources + 1);
    const bool isPalette = src == kSources;
    return {isPalette ? 8 : kSourceDepths[src], kDepths[number % std::size(kDepths)], isPalette};
}

// By one of the functions that do the pair.
void convert(const Pair &pair, uint32_t way, const Surfaces &at, Size size) {
    const auto &[src, dst, pseudo, palette] = pair;
    const Surface &to = at[0], &from = at[1];
    const auto call = [&](auto function, auto... depths) {
        function(to.buffer, to.unsignedStride(), from.buffer, from.unsignedStride(), depths...,
                 from.x, from.y, to.x, to.y, size.width, size.height);
    };
    if (way == 1 && dst == 32)
        call(Raster_ConvertPixelsTo32, src, pseudo, palette);
    else if (way == 2 && dst == 32 && pseudo)
        call(Raster_ConvertIndexTo32, palette);
    else if (way == 2 && src == dst && !pseudo)
        call(RasterCopyPixels, src);
    else if (way != 0 && src == 32 && !pseudo)
        Raster_ConvertPixelsFrom32(to.buffer, to.unsignedStride(), dst, from.buffer,
                                   from.unsignedStride(), from.x, from.y, to.x, to.y, size.width,
                                   size.height);
    else
        Raster_ConvertPixels(to.buffer, to.unsignedStride(), dst, from.buffer,
                             from.unsignedStride(), src, pseudo, palette, from.x, from.y, to.x,
                             to.y, size.width, size.height);
}

uint32_t convertedByReference(const Pair &pair, uint32_t pixel) {
    const auto &[src, dst, pseudo, palette] = pair;
    if (pseudo)
        return reference::converted(palette[pixel], 32, dst);
    return src == dst ? pixel : reference::converted(pixel, src, dst);
}

// A palette of which there are no entries but those that pixels use, on one side; and
// the bytes that pixels may have.
const uint32_t *drawPalette(Random &random, Part &part) {
    static thread_local const FencedBuffer behindFence(256 * sizeof(uint32_t),
                                                       FencedBuffer::Flush::kBefore);
    static thread_local const FencedBuffer aheadOfFence(256 * sizeof(uint32_t));
    const bool isLow = random.oneIn(2);
    const FencedBuffer &colors = isLow ? aheadOfFence : behindFence;
    random.fill(colors.data(), colors.size());
    const uint32_t edge = random.below(256);
    part.low = isLow ? 0 : edge;
    part.count = isLow ? edge + 1 : 256 - edge;
    const uint8_t *first = isLow ? colors.end() - 4 * size_t{part.count} : colors.data();
    return reinterpret_cast<const uint32_t *>(first) - part.low;
}

Operation conversion(Random &random, Pair pair) {
    Part src = {pair.pseudoColor ? 1 : bytesOf(pair.srcDepth)};
    if (pair.pseudoColor)
        pair.palette = drawPalette(random, src);
    const bool isCopy = !pair.pseudoColor && pair.srcDepth == pair.dstDepth;
    const bool isExact = isCopy || (pair.pseudoColor && pair.dstDepth == 32);
    src.rule = isExact ? RowRule::kExact : RowRule::kRounded;
    const uint32_t way = random.below(3);
    return {std::to_string(pair.srcDepth) + " to " + std::to_string(pair.dstDepth),
            {{bytesOf(pair.dstDepth), src.rule}, src},
            [=](const Surfaces &at, Size size) { convert(pair, way, at, size); },
            [=](const Pixels &old) { return convertedByReference(pair, old[1]); },
            isCopy ? Walk::kRowByRow : Walk::kForward,
            isCopy,
            false};
}

// A channel of random place and width: its bits, from the top, are those of the
// component over and over.
void tryRGBParam(Random &random) {
    const uint32_t bits = 1 + random.below(31), width = 1 + random.below(31 / bits * bits);
    const uint32_t low = random.below(33 - width), most = (1u << bits) - 1;
    const auto run = static_cast<uint32_t>(((uint64_t{1} << width) - 1) << low);
    // Further bits, not next to the run, are no part of the channel.
    const uint32_t above = ~static_cast<uint32_t>((uint64_t{2} << (low + width)) - 1);
    const uint32_t mask = run | (random.word() & above);
    RasterRGBParam param = {};
    RasterRGB_MakeRGBParam(&param, static_cast<int32_t>(bits), mask);
    compare(param.mask, mask, "mask");
    const bool isLeast = param.shift < 32 && (param.shift == 0 || param.multiplier % 2 == 1);
    compare(isLeast, true, "shift and multiplier are not least");
    for (const uint32_t component : {1u, most, most / 2 + 1, random.word() & most}) {
        uint32_t expected = 0;
        for (uint32_t i = 0; i < width; ++i)
            expected = expected << 1 | (component >> (bits - 1 - i % bits) & 1);
        compare(((component * param.multiplier) >> param.shift) & run, expected << low,
                "component in a channel");
    }
}

} // namespace

void tryConvert(Random &random, std::optional<Shape> shape) {
    const Pair pair = shape == Shape::kLarge ? pairOf(running.number) : drawPair(random);
    tryOperation(random, conversion(random, pair), shape);
}

void tryConvertOne(Random &random) {
    static thread_local uint32_t palette[300]; // an index is not cut to a byte
    const uint32_t pixel = random.word(), index = random.below(300);
    const int32_t dst = random.oneOf(kDepths), src = random.oneOf(kSourceDepths);
    palette[index] = pixel;
    compare(Raster_ConvertOnePixel(pixel, src, dst, false, nullptr),
            reference::convertedAlone(pixel, src, dst), "one pixel");
    compare(Raster_ConvertOnePixel(index, 8, dst, true, palette),
            reference::convertedAlone(pixel, 32, dst), "one index");

    const int32_t depth = random.between(-2, 40), bits = random.between(-2, 40);
    const bool isWord = bits == 16 && (depth == 15 || depth == 16);
    const bool isWide = depth == 24 && (bits == 24 || bits == 32);
    compare(Raster_IsModeReasonable(depth, bits, false), isWord || isWide, "mode");
    compare(Raster_IsModeReasonable(depth, bits, true), bits == 8, "mode with a palette");
    tryRGBParam(random);
}

void family::convert(Random &random) {
    random.oneIn(4) ? tryConvertOne(random) : tryConvert(random);
}

} // namespace quillon::test
