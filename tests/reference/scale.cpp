#include "reference/scale.h"

#include "core/extended.h"

#include <algorithm>
#include <array>
#include <vector>

namespace quillon::reference {
namespace {

using Pixel = std::array<uint32, 4>; // the channels
using Row = std::vector<Pixel>;

constexpr uint32 kOne = 0x10000;

struct Axis {
    uint32 start, step, scale, count;
};

Pixel blended(const Pixel &first, const Pixel &second, uint32 f) {
    Pixel pixel;
    for (size_t c = 0; c < 4; ++c)
        pixel[c] = (first[c] * ((0xFFFF - f) >> 8) + second[c] * (f >> 8)) >> 8;
    return pixel;
}

// How much there can be to an average: what the positions end ahead of, the
// number of pixels, and the weight of each.
struct Limits {
    uint64_t end;
    uint32 count, weight;
};

template <class At>
Pixel averaged(const At &at, uint32 position, const Axis &axis, const Limits &limits) {
    Pixel sum = {};
    uint32 remaining = axis.step;
    for (uint32 i = 0; i < limits.count && remaining != 0 && position < limits.end; ++i) {
        const uint32 covered = std::min(kOne - position % kOne, remaining);
        const Pixel &pixel = at(position);
        for (size_t c = 0; c < 4; ++c)
            sum[c] += (pixel[c] * std::min(covered >> 8, limits.weight)) >> 8;
        position += covered;
        remaining -= covered;
    }
    for (uint32 &channel : sum)
        channel = ((channel * axis.scale) >> 16) & 0xFF;
    return sum;
}

// What is left of a row behind the last position is its last pixel.
Row scaledRow(const uint8 *first, uint32 width, const Axis &axis, bool isFiltered) {
    Row src(width), row;
    for (Pixel &pixel : src)
        for (uint32 &channel : pixel)
            channel = *first++;
    const auto at = [&](uint32 x) -> const Pixel & { return src[std::min(x >> 16, width - 1)]; };
    const bool isNearest = !isFiltered || axis.step == kOne, isLinear = axis.step < kOne;
    const uint32 end = (width - 1) << 16;
    uint32 x = axis.start - (!isNearest && isLinear ? kOne / 2 : 0);
    for (; !isNearest && isLinear && row.size() < axis.count && x >= 0x80000000; x += axis.step)
        row.push_back(src[0]);
    for (; row.size() < axis.count && (isNearest || x < end); x += axis.step)
        row.push_back(isNearest  ? at(x)
                      : isLinear ? blended(at(x), at(x + kOne), x % kOne)
                                 : averaged(at, x, axis, {end, UINT32_MAX, 256}));
    row.resize(axis.count, src.back());
    return row;
}

Axis axisOf(double scale, int32 first, int32 end) {
    const Extended one(kOne), factor(scale);
    const uint32 step = (one / factor).truncated();
    return {step * static_cast<uint32>(first), step, (factor * one).truncated(),
            static_cast<uint32>(end - first)};
}

} // namespace

uint32 scale(uint8 *dstBuffer, int32 dstLineIncrement, uint32 /*dstWidth*/, uint32 /*dstHeight*/,
             int32 left, int32 top, int32 right, int32 bottom, const uint8 *srcBuffer,
             int32 srcLineIncrement, uint32 srcWidth, uint32 srcHeight, double scaleX,
             double scaleY, uint32 filter) {
    const Axis columns = axisOf(scaleX, left, right), lines = axisOf(scaleY, top, bottom);
    const bool isNearest = filter == 0 || lines.step == kOne, isLinear = lines.step < kOne;

    std::vector<Row> rows(srcHeight);
    const auto rowAt = [&](uint32 position) -> const Row & {
        const uint32 index = position >= 0x80000000 ? 0 : std::min(position >> 16, srcHeight - 1);
        if (rows[index].empty())
            rows[index] = scaledRow(srcBuffer + int64_t{srcLineIncrement} * index, srcWidth,
                                    columns, filter != 0);
        return rows[index];
    };
    uint32 y = lines.start - (!isNearest && isLinear ? kOne / 2 : 0);
    for (int32 dstY = top; dstY < bottom; ++dstY, y += lines.step) {
        uint8 *dst = dstBuffer + int64_t{dstLineIncrement} * dstY + int64_t{4} * left;
        for (uint32 x = 0; x < columns.count; ++x) {
            const auto at = [&](uint32 position) -> const Pixel & { return rowAt(position)[x]; };
            const Pixel pixel = isNearest  ? at(y)
                                : isLinear ? blended(at(y), at(y + kOne), y % kOne)
                                           : averaged(at, y, lines, {uint64_t{1} << 32, 32, 255});
            for (const uint32 channel : pixel)
                *dst++ = static_cast<uint8>(channel);
        }
    }
    return 1;
}

} // namespace quillon::reference
