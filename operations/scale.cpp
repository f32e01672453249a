#include "reference/scale.h"
#include "operations.h"
#include "support/judge.h"
#include "support/longDouble.h"
#include <quillon/raster.h>

#include <cmath>

namespace quillon::test {
namespace {

uint32_t run(const Scaling &c, uint8_t *dst, const uint8_t *src, decltype(Raster_Scale) scale) {
    // Pixel (0, 0) may be an address outside of memory.
    const int64_t offset = int64_t{c.dst.stride} * c.top + int64_t{4} * c.left;
    auto *origin = reinterpret_cast<uint8_t *>(reinterpret_cast<uintptr_t>(dst + c.dst.first()) -
                                               static_cast<uintptr_t>(offset));
    return scale(origin, c.dst.stride, 32767, 32767, c.left, c.top,
                 c.left + static_cast<int32_t>(c.dst.width),
                 c.top + static_cast<int32_t>(c.dst.height), src + c.src.first(), c.src.stride,
                 c.src.width, c.src.height, c.scaleX, c.scaleY, c.filter);
}

std::string description(const Scaling &c) {
    const auto rows = [](const ScaleRows &r) {
        return std::to_string(r.width) + " x " + std::to_string(r.height) + " stride " +
               std::to_string(r.stride);
    };
    return "src " + rows(c.src) + ", dst " + rows(c.dst) + " at " + std::to_string(c.left) + ", " +
           std::to_string(c.top) + ", scale " + std::to_string(c.scaleX) + ' ' +
           std::to_string(c.scaleY) + ", filter " + std::to_string(c.filter);
}

// Factors where something changes, and any others.
double drawScale(Random &random) {
    static constexpr double kFactors[] = {1,           2,         0.5,       1.0 / 3,   0.1,
                                          0.2,         3,         0.999,     1.001,     1.5,
                                          0.75,        1.0 / 4,   1.0 / 5,   0.4,       1.0 / 32,
                                          1.0 / 33,    1.0 / 8,   1.0 / 64,  1.0 / 256, 1.0 / 257,
                                          1.0 / 257.5, 1.0 / 258, 1.0 / 600, 65536,     40000};
    switch (random.below(8)) {
    case 0:
        return std::nextafter(random.oneOf({1.0, 2.0, 0.5, 1.0 / 32767}), 2);
    case 1:
        return std::nextafter(random.oneOf({1.0, 2.0, 0.5, 65536.0}), 0);
    case 2:
    case 3: {
        const int exponent = random.between(-6, 5);
        return std::ldexp(random.word() | 0x80000000, exponent - 31);
    }
    default:
        return random.oneOf(kFactors);
    }
}

ScaleRows drawRows(Random &random, uint32_t width, uint32_t height) {
    const int32_t row = static_cast<int32_t>(4 * width);
    const int32_t stride =
        random.oneOf({row, row, row + 4, row + random.between(0, 99), random.between(0, row)});
    return {width, height, random.oneIn(4) ? -stride : stride};
}

// Where the rectangle starts: mostly near the source, else anywhere, so that
// positions pass every limit.
int32_t drawCorner(Random &random, double scale, uint32_t srcSize) {
    if (random.oneIn(3))
        return 0;
    if (random.oneIn(6))
        return random.between(-100, 32767);
    return random.between(0, static_cast<int32_t>(std::fmin(srcSize * scale, 32700)));
}

// One axis of Raster_ScaleSrcCoordinates.
struct Range {
    Range(int32_t first, int32_t end, uint32_t size, long double scale) {
        const long double margin = std::max(scale, 1.0L);
        const long double start = in80Bits(in80Bits(first * scale) - margin);
        const auto most = static_cast<uint32_t>(static_cast<int64_t>(in80Bits(size * scale)));
        const long double behind = in80Bits(in80Bits(end * scale) + margin);
        const double stop = std::ceil(static_cast<double>(behind));
        low = start < 0 ? 0 : static_cast<int32_t>(static_cast<int64_t>(start));
        high = static_cast<int32_t>(stop > most ? most : static_cast<int64_t>(stop));
    }
    int32_t low, high;
};

} // namespace

// In fenced memory, either end of which is at the fence.
void tryScaling(Random &random, const Scaling &c) {
    const auto flush =
        random.oneIn(2) ? FencedBuffer::Flush::kBehind : FencedBuffer::Flush::kBefore;
    const FencedBuffer src(c.src.bytes(), flush), dst(c.dst.bytes(), flush);
    random.fill(src.data(), src.size());
    random.fill(dst.data(), dst.size());
    if (random.oneIn(4)) // all the same, and as bright as can be
        std::fill(src.data(), src.end(), uint8_t{255});
    else if (random.oneIn(3))
        plantRuns(random, src.data(), src.size() / 4, 4, {0, 0xFFFFFFFF, random.word()});
    const std::vector<uint8_t> before(dst.data(), dst.end());
    std::vector<uint8_t> expected = before;
    run(c, expected.data(), src.data(), reference::scale);
    forEachTarget([&] {
        std::copy(before.begin(), before.end(), dst.data());
        compare(run(c, dst.data(), src.data(), Raster_Scale), 1u, "result of Raster_Scale");
        compare(dst.data(), expected.data(), dst.size(), [&] { return description(c); });
    });
}

void tryScale(Random &random) {
    Scaling c{};
    uint32_t width = 1 + random.below(random.oneIn(8) ? 2700 : 70);
    uint32_t height = 1 + random.below(random.oneIn(8) ? 70 : 20);
    c.src = drawRows(random, width, height);
    width = 1 + random.below(random.oneIn(8) ? 300 : 70);
    height = 1 + random.below(12);
    c.dst = drawRows(random, width, height);
    c.scaleX = drawScale(random);
    c.scaleY = random.oneIn(3) ? c.scaleX : drawScale(random);
    c.left = drawCorner(random, c.scaleX, c.src.width);
    c.top = drawCorner(random, c.scaleY, c.src.height);
    c.filter = random.oneOf({0u, 0u, 1u, 2u, 2u, 256u, 0x80000000u});
    tryScaling(random, c);
}

void tryScaleSrcCoordinates(Random &random) {
    const auto coordinate = [&] {
        if (!random.oneIn(3))
            return random.between(-20, 2000);
        const auto any = static_cast<int32_t>(random.word());
        return any >> random.below(31);
    };
    const Rect old{coordinate(), coordinate(), coordinate(), coordinate()};
    const uint32_t width = random.below(3000), height = random.below(3000);
    // Also negative; but no coordinate leaves 64 bits.
    const double sign = random.oneOf({1, 1, 1, -1});
    const double scaleX = drawScale(random) * sign, scaleY = drawScale(random);
    const Range columns(old.left, old.right, width, scaleX);
    const Range lines(old.top, old.bottom, height, scaleY);
    Rect rect = old;
    Raster_ScaleSrcCoordinates(&rect, width, height, scaleX, scaleY);
    compare(rect, Rect{columns.low, lines.low, columns.high, lines.high}, "source coordinates");
}

void family::scale(Random &random) {
    random.oneIn(8) ? tryScaleSrcCoordinates(random) : tryScale(random);
}

} // namespace quillon::test
