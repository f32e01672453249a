#include "reference/scale.h"

#include "core/extended.h"

#include <algorithm>
#include <array>
#include <vector>

namespace quillon::reference {
namespace {

using Pixel = std::array<uint32_t, 4>; // the channels
using Row = std::vector<Pixel>;

constexpr uint32_t kOne = 0x10000;

struct Axis {
    uint32_t start, step, scale, count;
};

Pixel blended(const Pixel &first, const Pixel &second, uint32_t f) {
    Pixel pixel;
    for (size_t c = 0; c < 4; ++c)
        pixel[c] = (first[c] * ((0xFFFF - f) >> 8) + second[c] * (f >> 8)) >> 8;
    return pixel;
}

// How much there can be to an average: what the positions end ahead of, the
// number of pixels, and the weight of each.
struct Limits {
    uint64_t end;
    uint32_t count, weight;
};

template <class At>
Pixel averaged(const At &at, uint32_t position, const Axis &axis, const Limits &limits) {
    Pixel sum = {};
    uint32_t remaining = axis.step;
    for (uint32_t i = 0; i < limits.count && remaining != 0 && position < limits.end; ++i) {
        const uint32_t covered = std::min(kOne - position % kOne, remaining);
        const Pixel &pixel = at(position);
        for (size_t c = 0; c < 4; ++c)
            sum[c] += (pixel[c] * std::min(covered >> 8, limits.weight)) >> 8;
        position += covered;
        remaining -= covered;
    }
    for (uint32_t &channel : sum)
        channel = ((channel * axis.scale) >> 16) & 0xFF;
    return sum;
}

// What is left of a row behind the last position is its last pixel.
Row scaledRow(const uint8_t *first, uint32_t width, const Axis &axis, bool isFiltered) {
    Row src(width), row;
    for (Pixel &pixel : src)
        for (uint32_t &channel : pixel)
            channel = *first++;
    const auto at = [&](uint32_t x) -> const Pixel & { return src[std::min(x >> 16, width - 1)]; };
    const bool isNearest = !isFiltered || axis.step == kOne, isLinear = axis.step < kOne;
    const uint32_t end = (width - 1) << 16;
    uint32_t x = axis.start - (!isNearest && isLinear ? kOne / 2 : 0);
    for (; !isNearest && isLinear && row.size() < axis.count && x >= 0x80000000; x += axis.step)
        row.push_back(src[0]);
    for (; row.size() < axis.count && (isNearest || x < end); x += axis.step)
        row.push_back(isNearest  ? at(x)
                      : isLinear ? blended(at(x), at(x + kOne), x % kOne)
                                 : averaged(at, x, axis, {end, UINT32_MAX, 256}));
    row.resize(axis.count, src.back());
    return row;
}

Axis axisOf(double scale, int32_t first, int32_t end) {
    const Extended one(kOne), factor(scale);
    const uint32_t step = (one / factor).truncated();
    return {step * static_cast<uint32_t>(first), step, (factor * one).truncated(),
            static_cast<uint32_t>(end - first)};
}

} // namespace

uint32_t scale(uint8_t *dstBuffer, int32_t dstLineIncrement, uint32_t /*dstWidth*/,
               uint32_t /*dstHeight*/, int32_t left, int32_t top, int32_t right, int32_t bottom,
               const uint8_t *srcBuffer, int32_t srcLineIncrement, uint32_t srcWidth,
               uint32_t srcHeight, double scaleX, double scaleY, uint32_t filter) {
    const Axis columns = axisOf(scaleX, left, right), lines = axisOf(scaleY, top, bottom);
    const bool isNearest = filter == 0 || lines.step == kOne, isLinear = lines.step < kOne;

    std::vector<Row> rows(srcHeight);
    const auto rowAt = [&](uint32_t position) -> const Row & {
        const uint32_t index = position >= 0x80000000 ? 0 : std::min(position >> 16, srcHeight - 1);
        if (rows[index].empty())
            rows[index] = scaledRow(srcBuffer + int64_t{srcLineIncrement} * index, srcWidth,
                                    columns, filter != 0);
        return rows[index];
    };
    uint32_t y = lines.start - (!isNearest && isLinear ? kOne / 2 : 0);
    for (int32_t dstY = top; dstY < bottom; ++dstY, y += lines.step) {
        uint8_t *dst = dstBuffer + int64_t{dstLineIncrement} * dstY + int64_t{4} * left;
        for (uint32_t x = 0; x < columns.count; ++x) {
            const auto at = [&](uint32_t position) -> const Pixel & { return rowAt(position)[x]; };
            const Pixel pixel = isNearest  ? at(y)
                                : isLinear ? blended(at(y), at(y + kOne), y % kOne)
                                           : averaged(at, y, lines, {uint64_t{1} << 32, 32, 255});
            for (const uint32_t channel : pixel)
                *dst++ = static_cast<uint8_t>(channel);
        }
    }
    return 1;
}

} // namespace quillon::reference
