#include "reference/scale.h"

#include <array>
#include <cfloat>
#include <cmath>
#include <map>
#include <vector>

#if LDBL_MANT_DIG != 64
#include "core/extended.h"
#endif

namespace quillon::reference {
namespace {

// --- Factors: computed at 64 bits, then truncated

#if LDBL_MANT_DIG == 64
using Real = long double;

uint32 truncated(Real value) {
    return static_cast<uint32>(static_cast<int64_t>(value));
}
double toDouble(Real value) {
    return static_cast<double>(value);
}
bool isNegative(Real value) {
    return value < 0;
}
#else
using Real = Extended;

uint32 truncated(Real value) {
    return value.truncated();
}
double toDouble(Real value) {
    return value.toDouble();
}
bool isNegative(Real value) {
    return value.isNegative();
}
#endif

// --- Pixels and rows

using Pixel = std::array<uint32, 4>; // the channels
using Row = std::vector<Pixel>;

Row readRow(const uint8 *first, uint32 width) {
    Row row(width);
    for (Pixel &pixel : row)
        for (uint32 &channel : pixel)
            channel = *first++;
    return row;
}

// --- The horizontal pass

struct Columns {
    uint32 start, step, scale, count;
};

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
    for (; result.size() < columns.count && x < last << 16; x += columns.step) {
        const uint32 i = x >> 16, f = x & 0xFFFF;
        const uint32 wRight = f >> 8, wLeft = (0xFFFF - f) >> 8;
        Pixel pixel;
        for (size_t c = 0; c < 4; ++c)
            pixel[c] = (src[i][c] * wLeft + src[i + 1][c] * wRight) >> 8;
        result.push_back(pixel);
    }
    result.resize(columns.count, src[last]);
    return result;
}

Row boxRow(const Row &src, const Columns &columns) {
    const auto last = static_cast<uint32>(src.size() - 1);
    const uint32 lastPos = last << 16;
    Row result;
    uint32 x = columns.start;
    while (result.size() < columns.count && x < lastPos) {
        Pixel sum{};
        const auto add = [&](uint32 p, uint32 weight) {
            for (size_t c = 0; c < 4; ++c)
                sum[c] += (src[p][c] * weight) >> 8;
        };
        uint32 p = x >> 16, remaining = columns.step;
        if ((x & 0xFFFF) != 0) {
            const uint32 head = 0x10000 - (x & 0xFFFF);
            add(p++, head >> 8);
            x += head;
            remaining -= head;
        }
        while (x < lastPos && remaining >= 0x10000) {
            add(p++, 256);
            x += 0x10000;
            remaining -= 0x10000;
        }
        if (remaining != 0 && x < lastPos) {
            add(p, remaining >> 8);
            x += remaining;
        }
        for (uint32 &channel : sum)
            channel = ((channel * columns.scale) >> 16) & 0xFF;
        result.push_back(sum);
    }
    result.resize(columns.count, src[last]);
    return result;
}

Row scaledRow(const Row &src, const Columns &columns, bool isFiltered) {
    if (!isFiltered || columns.step == 0x10000)
        return nearestRow(src, columns);
    return columns.step < 0x10000 ? linearRow(src, columns) : boxRow(src, columns);
}

// --- The vertical pass

Row blended(const Row &upper, const Row &lower, uint32 f) {
    const uint32 wLower = f >> 8, wUpper = (0xFFFF - f) >> 8;
    Row result(upper.size());
    for (size_t x = 0; x < result.size(); ++x)
        for (size_t c = 0; c < 4; ++c)
            result[x][c] = (upper[x][c] * wUpper + lower[x][c] * wLower) >> 8;
    return result;
}

template <class RowAt>
Row averaged(const RowAt &rowAt, uint32 y, uint32 yStep, uint32 yScale, uint32 width) {
    Row sum(width, Pixel{});
    int taps = 0;
    const auto add = [&](uint32 position, uint32 weight) {
        ++taps;
        const Row &row = rowAt(position);
        for (size_t x = 0; x < width; ++x)
            for (size_t c = 0; c < 4; ++c)
                sum[x][c] += (row[x][c] * weight) >> 8;
    };
    uint32 position = y, remaining = yStep;
    if ((y & 0xFFFF) != 0) {
        const uint32 head = 0x10000 - (y & 0xFFFF);
        add(position, head >> 8);
        position += head;
        remaining -= head;
    }
    for (; remaining >= 0x10000 && taps < 32; position += 0x10000, remaining -= 0x10000)
        add(position, 255);
    if (remaining != 0 && taps < 32)
        add(position, remaining >> 8);
    for (Pixel &pixel : sum)
        for (uint32 &channel : pixel)
            channel = ((channel * yScale) >> 16) & 0xFF;
    return sum;
}

} // namespace

uint32 scale(uint8 *dstBuffer, int32 dstLineIncrement, uint32 dstWidth, uint32 dstHeight,
             int32 left, int32 top, int32 right, int32 bottom, const uint8 *srcBuffer,
             int32 srcLineIncrement, uint32 srcWidth, uint32 srcHeight, double scaleX,
             double scaleY, uint32 filter) {
    if (srcHeight > 32767 || srcWidth > 32767 || dstHeight > 32767 || dstWidth > 32767)
        return 0;
    for (const double factor : {scaleX, scaleY})
        if (std::isnan(factor) || factor <= 1.0 / 32767 || factor > 65536)
            return 0;
    if (left >= right || top >= bottom)
        return 1;
    if (srcHeight == 0 || srcWidth == 0 || dstHeight == 0 || dstWidth == 0)
        return 1;

    const uint32 xStep = truncated(Real(65536.0) / Real(scaleX));
    const uint32 yStep = truncated(Real(65536.0) / Real(scaleY));
    const uint32 yScale = truncated(Real(scaleY) * Real(65536.0));
    const Columns columns{xStep * static_cast<uint32>(left), xStep,
                          truncated(Real(scaleX) * Real(65536.0)),
                          static_cast<uint32>(right - left)};
    const bool isFiltered = filter != 0;

    std::map<uint32, Row> rows;
    const auto rowAt = [&](uint32 position) -> const Row & {
        uint32 index = position >= 0x80000000 ? 0 : position >> 16;
        if (index > srcHeight - 1)
            index = srcHeight - 1;
        const auto found = rows.find(index);
        if (found != rows.end())
            return found->second;
        const Row src = readRow(srcBuffer + int64_t{srcLineIncrement} * index, srcWidth);
        return rows[index] = scaledRow(src, columns, isFiltered);
    };

    uint32 y = yStep * static_cast<uint32>(top);
    if (isFiltered && yStep < 0x10000)
        y -= 0x8000;
    for (int32 dstY = top; dstY < bottom; ++dstY, y += yStep) {
        const Row row = !isFiltered || yStep == 0x10000 ? rowAt(y)
                        : yStep < 0x10000 ? blended(rowAt(y), rowAt(y + 0x10000), y & 0xFFFF)
                                          : averaged(rowAt, y, yStep, yScale, columns.count);
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
        const Real value = Real(old) * Real(factor) - Real(factor > 1 ? factor : 1.0);
        return isNegative(value) ? 0 : static_cast<int32>(truncated(value));
    };
    const auto high = [](int32 old, uint32 size, double factor) {
        const uint32 scaledSize = truncated(Real(size) * Real(factor));
        const double value =
            std::ceil(toDouble(Real(old) * Real(factor) + Real(factor > 1 ? factor : 1.0)));
        return static_cast<int32>(value > scaledSize ? scaledSize : truncated(Real(value)));
    };
    *rect = {low(rect->left, scaleX), low(rect->top, scaleY), high(rect->right, srcWidth, scaleX),
             high(rect->bottom, srcHeight, scaleY)};
}

} // namespace quillon::reference
