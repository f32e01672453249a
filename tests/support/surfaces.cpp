#include "support/surfaces.h"

#include <algorithm>
#include <cstring>

namespace quillon::test {
namespace {

constexpr uint32_t kFencedRows = 3;
constexpr uint32_t kMost = UINT32_MAX;
constexpr size_t kLargePages = 450; // more than is kept in the caches of a core

// The largest step there is downwards, and a step that only unsigned line
// increments can have upwards.
constexpr size_t kFar = size_t{1} << 31;

std::array<TwinMemory, 4> four(size_t pages, size_t runs, size_t spacing) {
    const auto one = [&] { return TwinMemory(pages * pageSize(), runs, spacing); };
    return {one(), one(), one(), one()};
}

int64_t rowStep(int64_t line, const Part &part) {
    const bool isUnit = part.bytes == 2 || part.bytes == 4;
    return part.rule != RowRule::kExact && isUnit ? line & -int64_t{part.bytes} : line;
}

// Small, or up to the largest.
uint32_t randomCoordinate(Random &random) {
    const uint32_t small = random.below(100);
    return random.oneOf({0u, small, small, random.word(), kMost - small});
}

uint32_t randomWidth(Random &random) {
    const uint32_t width =
        random.oneIn(16) ? 200 + random.below(600) : random.below(random.oneIn(4) ? 20 : 141);
    return random.oneIn(4) ? width & ~7u : width; // bitmap rows of whole bytes
}

// Fitting the row, padded, shorter than the row, next to none.
int64_t randomLine(Random &random, size_t rowBytes) {
    const auto row = static_cast<uint32_t>(rowBytes);
    return random.oneOf({row, row, row + random.below(10), row + random.below(10),
                         row + random.below(300), random.below(row + 1), random.below(5)});
}

// The bytes from a rectangle's first pixel down to its lowest, and up to behind
// its highest.
struct Extent {
    int64_t below, above;
};

// One call.
struct Case {
    const Operation &operation;
    bool isInRows, isNear;
    Size size;
    std::array<TwinMemory, 4> &home; // for each surface
    Surfaces at{operation.parts.size()};
    std::vector<TwinMemory *> memories{operation.parts.size()};
    bool isUpwards = false;

    size_t rowBytes(size_t i) const { return operation.parts[i].rowBytes(size.width); }

    // From each row to the next one that is walked.
    int64_t step(size_t i) const {
        return rowStep(isUpwards ? -at[i].line : at[i].line, operation.parts[i]);
    }

    Extent extent(size_t i) const {
        const int64_t toLast = step(i) * (int64_t{size.height} - 1);
        return {std::max<int64_t>(0, -toLast),
                std::max<int64_t>(0, toLast) + static_cast<int64_t>(rowBytes(i))};
    }

    bool overlaps() const {
        const Extent dst = extent(0), src = extent(1);
        return memories[0] == memories[1] && at[0].first - dst.below < at[1].first + src.above &&
               at[1].first - src.below < at[0].first + dst.above;
    }
};

void drawCoordinates(Random &random, Case &c) {
    const bool isOneCorner = c.operation.isOneCorner;
    const bool isOneColumn = isOneCorner || random.oneIn(4);
    const bool isOneRow = isOneCorner || random.oneIn(2);
    const uint32_t x = randomCoordinate(random), y = randomCoordinate(random);
    for (Surface &surface : c.at) {
        surface.x = isOneColumn ? x : randomCoordinate(random);
        surface.y = isOneRow ? y : randomCoordinate(random);
    }
    // Rounded steps are taken from the first row that is walked.
    c.isUpwards = c.operation.walk == Walk::kAwayFromSource && c.at[1].y < c.at[0].y;
}

void drawLine(Random &random, Case &c, size_t i) {
    int64_t &line = c.at[i].line;
    if (c.isInRows) {
        const int64_t spacing = c.home[i].spacing();
        const bool isDownwards = spacing > INT32_MAX || random.oneIn(2);
        line = c.operation.isSigned && isDownwards ? -spacing : spacing;
        return;
    }
    line = randomLine(random, c.rowBytes(i));
    if (random.oneIn(4))
        line = -line;
    if (i > 0 && random.oneIn(2)) // as on surfaces of one size, or nearly
        line = c.at[0].line + (c.isNear && random.oneIn(2) ? random.between(-20, 20) : 0);
    if (!c.operation.isSigned)
        line = std::abs(line);
    for (; c.size.height > 1; --c.size.height) {
        const Extent extent = c.extent(i);
        if (extent.below + extent.above <= static_cast<int64_t>(c.home[i].runBytes()))
            break;
    }
}

// Where the first row that is walked begins.
uint8_t *drawFirst(Random &random, Case &c, size_t i, bool isFlushBehind, bool isNear) {
    TwinMemory &memory = *c.memories[i];
    if (c.isInRows)
        return memory.run(c.step(i) < 0 ? kFencedRows - 1 : 0) +
               (isFlushBehind ? memory.runBytes() - c.rowBytes(i) : 0);
    const Extent extent = c.extent(i);
    uint8_t *const lowest = memory.run(0) + extent.below;
    const int64_t room = static_cast<int64_t>(memory.runBytes()) - extent.below - extent.above;
    if (isNear && i > 0)
        return std::clamp(c.at[0].first + random.between(-128, 128), lowest, lowest + room);
    const int64_t anywhere = random.below(static_cast<uint32_t>(room) + 1);
    return lowest + (isNear ? room / 2 : random.oneOf({int64_t{0}, room, room, anywhere}));
}

void drawPlaces(Random &random, Case &c) {
    const bool isFlushBehind = random.oneIn(2);
    const uint32_t nearest = c.at.size() < 3 ? 1 : 1 + random.below(3);
    for (size_t i = 0; i < c.at.size(); ++i) {
        const Part &part = c.operation.parts[i];
        const bool isNear = c.isNear && (i == 0 || i == nearest || random.oneIn(2));
        const bool isShared = isNear || (!c.isInRows && c.operation.mayOverlap && random.oneIn(3));
        c.memories[i] = &c.home[isShared ? 0 : i];
        Surface &surface = c.at[i];
        surface.first = part.isTouched ? drawFirst(random, c, i, isFlushBehind, isNear)
                                       : c.memories[i]->nowhere();
        const uint64_t row = uint64_t{surface.y} + (c.isUpwards ? c.size.height - 1 : 0);
        const int64_t line =
            part.rule == RowRule::kRounded ? rowStep(surface.line, part) : surface.line;
        surface.buffer = reinterpret_cast<uint8_t *>(reinterpret_cast<uintptr_t>(surface.first) -
                                                   row * static_cast<uint64_t>(line) -
                                                   uint64_t{surface.x} * part.bytes);
    }
}

// Carries out the operation in the model.
void walk(const Case &c) {
    const std::vector<Part> &parts = c.operation.parts;
    const bool isRowByRow = c.operation.walk == Walk::kRowByRow;
    const bool isAway = c.operation.walk == Walk::kAwayFromSource;
    const bool isSplit = parts[0].bytes > sizeof(uint32_t) || (isAway && parts[0].bytes == 3);
    const uint32_t split = isSplit ? parts[0].bytes : 1;
    const int64_t width = int64_t{c.size.width} * split, height = c.size.height;
    const bool isFromLast = isRowByRow && c.at[1].y < c.at[0].y && c.overlaps();
    for (int64_t i = 0; i < height; ++i) {
        std::array<uint8_t *, 4> rows = {};
        for (size_t k = 0; k < parts.size(); ++k)
            rows[k] = c.memories[k]->inModel(c.at[k].first +
                                             (isFromLast ? height - 1 - i : i) * c.step(k));
        const bool isLeftwards = (isRowByRow && rows[1] < rows[0]) ||
                                 (isAway && c.at[1].y == c.at[0].y && c.at[1].x < c.at[0].x);
        for (int64_t j = 0; j < width; ++j) {
            const int64_t column = isLeftwards ? width - 1 - j : j;
            Pixels pixels = {};
            for (size_t k = 0; k < parts.size(); ++k) {
                const uint32_t bytes = parts[k].bytes / split;
                if (bytes == 0)
                    pixels[k] = rows[k][column / 8] >> (7 - column % 8) & 1;
                else if (parts[k].isTouched)
                    std::memcpy(&pixels[k], rows[k] + column * bytes, bytes);
            }
            const uint32_t result = c.operation.reference(pixels), bytes = parts[0].bytes / split;
            std::memcpy(rows[0] + column * bytes, &result, bytes);
        }
    }
}

void compare(Random &random, const Case &c) {
    for (size_t i = 0; i < c.at.size(); ++i)
        c.memories[i]->refill(random, c.operation.parts[i].low, c.operation.parts[i].count);
    c.operation.library(c.at, c.size);
    walk(c);
    for (const TwinMemory *memory : c.memories)
        EXPECT_TRUE(memory->agree());
    if (testing::Test::HasFailure())
        for (const Surface &surface : c.at)
            ADD_FAILURE() << c.operation.name << ", " << c.size.width << " x " << c.size.height
                          << " at " << surface.x << ", " << surface.y << ", line " << surface.line;
}

// Nothing is looked at when there is nothing to do, however large the rest.
void callForNothing(Random &random, const Operation &operation, uint8_t *nowhere) {
    Surfaces at(operation.parts.size());
    for (Surface &surface : at)
        surface = {nowhere, nowhere, 64, random.below(9), random.below(9)};
    const uint32_t any = random.oneOf({0u, 1u, kMost});
    const uint32_t none = operation.parts[0].isTouched ? 0 : random.oneOf({0u, 1u, 999u, kMost});
    operation.library(at, random.oneIn(2) ? Size{any, none} : Size{none, any});
}

} // namespace

TwinMemory::TwinMemory(size_t runBytes, size_t runs, size_t spacing)
    : runBytes_(runBytes), runs_(runs), spacing_(spacing),
      pages_((runs - 1) * spacing + runBytes + 2 * pageSize()), model_(pages_.size()) {
    for (size_t i = 0; i < runs; ++i)
        for (Mapping *mapping : {&pages_, &model_})
            mapping->open(pageSize() + i * spacing, runBytes);
}

void TwinMemory::refill(Random &random, uint32_t low, uint32_t count) {
    for (size_t i = 0; i < runs_; ++i) {
        uint8_t *bytes = run(i);
        random.fill(bytes, runBytes_);
        if (count < 256)
            std::transform(bytes, bytes + runBytes_, bytes, [=](uint8_t byte) {
                return static_cast<uint8_t>(low + (byte * count >> 8));
            });
        std::copy_n(bytes, runBytes_, inModel(bytes));
    }
}

testing::AssertionResult TwinMemory::agree() const {
    for (size_t i = 0; i < runs_; ++i) {
        const uint8_t *bytes = run(i), *model = inModel(run(i));
        if (std::memcmp(bytes, model, runBytes_) == 0)
            continue;
        const auto at = std::mismatch(bytes, bytes + runBytes_, model).first - bytes;
        return testing::AssertionFailure() << "byte " << at << " of run " << i << " is "
                                           << int{bytes[at]} << ", should be " << int{model[at]};
    }
    return testing::AssertionSuccess();
}

Arena::Arena()
    : blocks_(four(6, 1, 0)), largeBlocks_(four(kLargePages, 1, 0)),
      rows_(four(1, kFencedRows, 2 * pageSize())), farRows_(four(1, kFencedRows, kFar)) {}

void Arena::check(Random &random, const Operation &operation) {
    if (!operation.parts[0].isTouched || random.oneIn(32))
        return callForNothing(random, operation, random.oneIn(4) ? nullptr : blocks_[0].nowhere());

    const bool isLarge = random.oneIn(1000), isFar = !isLarge && random.oneIn(16);
    const bool isInRows = isFar || (!isLarge && random.oneIn(3));
    const bool isNear = !isInRows && operation.mayOverlap && random.oneIn(2);
    Size size = {randomWidth(random), random.below(random.oneIn(16) ? 40 : 6)};
    if (isInRows) {
        size = {random.below(141), kFencedRows};
    } else if (isLarge) {
        size.width = 256 + random.below(2000);
        const size_t rowBytes = operation.parts[0].rowBytes(size.width);
        size.height = static_cast<uint32_t>(largeBlocks_[0].runBytes() / rowBytes);
    } else if (isNear) {
        size = {random.below(100), 1 + random.below(4)};
    }

    Case c = {operation, isInRows, isNear, size,
              isLarge    ? largeBlocks_
              : isFar    ? farRows_
              : isInRows ? rows_
                         : blocks_};
    drawCoordinates(random, c);
    for (size_t i = 0; i < c.at.size(); ++i)
        drawLine(random, c, i);
    drawPlaces(random, c);
    compare(random, c);
}

} // namespace quillon::test
