#include "reference/scale.h"

#include "core/extended.h"

#include <array>
#include <cmath>
#include <map>
#include <vector>

namespace quillon::reference {
namespace {

using Pixel = std::array<uint32, 4>; // the channels
using Row = std::vector<Pixel>;

struct Columns {
    uint32 start, step, scale, count;
};

Pixel blended(const Pixel &first, const Pixel &second, uint32 f) {
    Pixel pixel;
    for (size_t c = 0; c < 4; ++c)
        pixel[c] = (first[c] * ((0xFFFF - f) >> 8) + second[c] * (f >> 8)) >> 8;
    return pixel;
}

void add(Pixel &sum, const Pixel &pixel, uint32 weight) {
    for (size_t c = 0; c < 4; ++c)
        sum[c] += (pixel[c] * weight) >> 8;
}

void normalise(Pixel &sum, uint32 scale) {
    for (uint32 &channel : sum)
        channel = ((channel * scale) >> 16) & 0xFF;
}

// --- The horizontal pass: what is left of a row is its last pixel

Row nearestRow(const Row &src, const Columns &columns) {
    const auto last = static_cast<uint32>(src.size() - 1);
    Row result;
    for (uint32 i = 0; i < columns.count; ++i) {
        const uint32 x = columns.start + i * columns.step;
        result.push_back(x < last << 16 ? src[x >> 16] : src[last]);
    }
    return result;
}

Row linearRow(const Row &src, const Columns &columns) {
    const auto last = static_cast<uint32>(src.size() - 1);
    Row result;
    uint32 x = columns.start - 0x8000;
    for (; result.size() < columns.count && x >= 0x80000000; x += columns.step)
        result.push_back(src[0]);
    for (; result.size() < columns.count && x < last << 16; x += columns.step)
        result.push_back(blended(src[x >> 16], src[(x >> 16) + 1], x & 0xFFFF));
    result.resize(columns.count, src[last]);
    return result;
}

Row boxRow(const Row &src, const Columns &columns) {
    const uint32 lastPos = static_cast<uint32>(src.size() - 1) << 16;
    Row result;
    uint32 x = columns.start;
    while (result.size() < columns.count && x < lastPos) {
        Pixel sum{};
        for (uint32 remaining = columns.step; remaining != 0 && x < lastPos;) {
            const uint32 covered = std::min(0x10000 - (x & 0xFFFF), remaining);
            add(sum, src[x >> 16], covered >> 8);
            x += covered;
            remaining -= covered;
        }
        normalise(sum, columns.scale);
        result.push_back(sum);
    }
    result.resize(columns.count, src.back());
    return result;
}

Row scaledRow(const uint8 *first, uint32 width, const Columns &columns, bool isFiltered) {
    Row src(width);
    for (Pixel &pixel : src)
        for (uint32 &channel : pixel)
            channel = *first++;
    if (!isFiltered || columns.step == 0x10000)
        return nearestRow(src, columns);
    return columns.step < 0x10000 ? linearRow(src, columns) : boxRow(src, columns);
}

// --- The vertical pass

Row blended(const Row &upper, const Row &lower, uint32 f) {
    Row result;
    for (size_t x = 0; x < upper.size(); ++x)
        result.push_back(blended(upper[x], lower[x], f));
    return result;
}

// Of 32 rows at most, each with a weight of 255 at most.
template <class RowAt>
Row averaged(const RowAt &rowAt, uint32 y, uint32 yStep, uint32 yScale, uint32 width) {
    Row sum(width, Pixel{});
    uint32 remaining = yStep;
    for (int taps = 0; taps < 32 && remaining != 0; ++taps) {
        const uint32 covered = std::min(0x10000 - (y & 0xFFFF), remaining);
        const Row &row = rowAt(y);
        for (size_t x = 0; x < width; ++x)
            add(sum[x], row[x], std::min(covered >> 8, 255u));
        y += covered;
        remaining -= covered;
    }
    for (Pixel &pixel : sum)
        normalise(pixel, yScale);
    return sum;
}

} // namespace

uint32 scale(uint8 *dstBuffer, int32 dstLineIncrement, uint32 /*dstWidth*/, uint32 /*dstHeight*/,
             int32 left, int32 top, int32 right, int32 bottom, const uint8 *srcBuffer,
             int32 srcLineIncrement, uint32 srcWidth, uint32 srcHeight, double scaleX,
             double scaleY, uint32 filter) {
    const Extended one(65536.0);
    const uint32 xStep = (one / Extended(scaleX)).truncated();
    const uint32 yStep = (one / Extended(scaleY)).truncated();
    const Columns columns{xStep * static_cast<uint32>(left), xStep,
                          (Extended(scaleX) * one).truncated(), static_cast<uint32>(right - left)};
    const bool isFiltered = filter != 0;

    std::map<uint32, Row> rows;
    const auto rowAt = [&](uint32 position) -> const Row & {
        const uint32 index = position >= 0x80000000 ? 0 : std::min(position >> 16, srcHeight - 1);
        Row &row = rows[index];
        if (row.empty())
            row = scaledRow(srcBuffer + int64_t{srcLineIncrement} * index, srcWidth, columns,
                            isFiltered);
        return row;
    };
    uint32 y = yStep * static_cast<uint32>(top);
    if (isFiltered && yStep < 0x10000)
        y -= 0x8000;
    for (int32 dstY = top; dstY < bottom; ++dstY, y += yStep) {
        const Row row =
            !isFiltered || yStep == 0x10000 ? rowAt(y)
            : yStep < 0x10000
                ? blended(rowAt(y), rowAt(y + 0x10000), y & 0xFFFF)
                : averaged(rowAt, y, yStep, (Extended(scaleY) * one).truncated(), columns.count);
        uint8 *dst = dstBuffer + int64_t{dstLineIncrement} * dstY + int64_t{4} * left;
        for (const Pixel &pixel : row)
            for (const uint32 channel : pixel)
                *dst++ = static_cast<uint8>(channel);
    }
    return 1;
}

void scaleSrcCoordinates(Rect *rect, uint32 srcWidth, uint32 srcHeight, double scaleX,
                         double scaleY) {
    const auto low = [](int32 old, double factor) {
        const Extended margin(std::fmax(factor, 1.0));
        const Extended value = Extended(old) * Extended(factor) - margin;
        return value.isNegative() ? 0 : static_cast<int32>(value.truncated());
    };
    const auto high = [](int32 old, uint32 size, double factor) {
        const Extended margin(std::fmax(factor, 1.0));
        const uint32 most = (Extended(size) * Extended(factor)).truncated();
        const double value = std::ceil((Extended(old) * Extended(factor) + margin).toDouble());
        return static_cast<int32>(value > most ? most : Extended(value).truncated());
    };
    *rect = {low(rect->left, scaleX), low(rect->top, scaleY), high(rect->right, srcWidth, scaleX),
             high(rect->bottom, srcHeight, scaleY)};
}

} // namespace quillon::reference
