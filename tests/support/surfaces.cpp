#include "support/surfaces.h"

#include <algorithm>
#include <cstring>

namespace quillon::test {
namespace {

constexpr uint32 kFencedRows = 3;
constexpr uint32 kMost = UINT32_MAX;

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
uint32 randomCoordinate(Random &random) {
    const uint32 small = random.below(100);
    return random.oneOf({0u, small, small, random.word(), kMost - small});
}

uint32 randomWidth(Random &random) {
    const uint32 width =
        random.oneIn(16) ? 200 + random.below(600) : random.below(random.oneIn(4) ? 20 : 141);
    return random.oneIn(4) ? width & ~7u : width; // bitmap rows of whole bytes
}

// Fitting the row, padded, shorter than the row, next to none; or the negative
// of these.
int64_t randomLine(Random &random, size_t rowBytes, bool isSigned) {
    const auto row = static_cast<uint32>(rowBytes);
    const int64_t line =
        random.oneOf({row, row, row + random.below(10), row + random.below(10),
                      row + random.below(300), random.below(row + 1), random.below(5)});
    return isSigned && random.oneIn(4) ? -line : line;
}

// The bytes from a rectangle's first pixel down to its lowest, and up to behind
// its highest.
struct Extent {
    int64_t below, above;

    Extent(uint32 height, size_t rowBytes, int64_t step)
        : below(std::max<int64_t>(0, -step * (int64_t{height} - 1))),
          above(std::max<int64_t>(0, step * (int64_t{height} - 1)) +
                static_cast<int64_t>(rowBytes)) {}
};

} // namespace

TwinMemory::TwinMemory(size_t runBytes, size_t runs, size_t spacing)
    : runBytes_(runBytes), runs_(runs), spacing_(spacing),
      pages_((runs - 1) * spacing + runBytes + 2 * pageSize()), model_(pages_.size()) {
    for (size_t i = 0; i < runs; ++i)
        for (Mapping *mapping : {&pages_, &model_})
            mapping->open(pageSize() + i * spacing, runBytes);
}

void TwinMemory::refill(Random &random, uint32 low, uint32 count) {
    for (size_t i = 0; i < runs_; ++i) {
        uint8 *bytes = run(i);
        random.fill(bytes, runBytes_);
        if (count < 256)
            std::transform(bytes, bytes + runBytes_, bytes, [=](uint8 byte) {
                return static_cast<uint8>(low + (byte * count >> 8));
            });
        std::copy_n(bytes, runBytes_, inModel(bytes));
    }
}

testing::AssertionResult TwinMemory::agree() const {
    for (size_t i = 0; i < runs_; ++i) {
        const uint8 *bytes = run(i), *model = inModel(run(i));
        if (std::memcmp(bytes, model, runBytes_) == 0)
            continue;
        const auto at = std::mismatch(bytes, bytes + runBytes_, model).first - bytes;
        return testing::AssertionFailure() << "byte " << at << " of run " << i << " is "
                                           << int{bytes[at]} << ", should be " << int{model[at]};
    }
    return testing::AssertionSuccess();
}

Arena::Arena()
    : blocks_(four(6, 1, 0)), rows_(four(1, kFencedRows, 2 * pageSize())),
      farRows_(four(1, kFencedRows, kFar)) {}

void Arena::check(Random &random, const Operation &operation) {
    const bool isFar = random.oneIn(16), isInRows = isFar || random.oneIn(3);
    const bool isNear = !isInRows && operation.mayOverlap && random.oneIn(2);
    Size size = {randomWidth(random), random.below(random.oneIn(16) ? 40 : 6)};
    if (isInRows)
        size = {random.below(141), kFencedRows};
    else if (isNear)
        size = {random.below(100), 1 + random.below(4)};
    const bool isTouched = std::any_of(operation.parts.begin(), operation.parts.end(),
                                       [](const Part &part) { return part.isTouched; });
    if (!isTouched || random.oneIn(32))
        return checkNothing(random, operation);

    const size_t count = operation.parts.size();
    Surfaces at(count);
    std::vector<TwinMemory *> memories(count);
    const bool isOneRow = random.oneIn(2), isOneColumn = random.oneIn(4);
    for (size_t i = 0; i < count; ++i) {
        const bool isSame = i > 0 && operation.isOneCorner;
        at[i].x = isSame || (i > 0 && isOneColumn) ? at[0].x : randomCoordinate(random);
        at[i].y = isSame || (i > 0 && isOneRow) ? at[0].y : randomCoordinate(random);
    }
    // Rounded steps are taken from the first row that is walked.
    const bool isUpwards =
        count == 2 && operation.parts[1].rule == RowRule::kRoundedSteps && at[1].y < at[0].y;
    const auto stepOf = [&](size_t i) {
        return rowStep(isUpwards ? -at[i].line : at[i].line, operation.parts[i]);
    };

    for (size_t i = 0; i < count; ++i) {
        const size_t rowBytes = operation.parts[i].rowBytes(size.width);
        memories[i] = &(isFar ? farRows_ : isInRows ? rows_ : blocks_)[i];
        at[i].line = randomLine(random, rowBytes, operation.isSigned);
        if (isInRows)
            at[i].line = operation.isSigned && (isFar || random.oneIn(2)) ? -memories[i]->spacing()
                                                                          : memories[i]->spacing();
        else if (i > 0 && random.oneIn(2)) // as on surfaces of one size, or nearly
            at[i].line = at[0].line + (isNear && random.oneIn(2) ? random.between(-20, 20) : 0);
        if (!operation.isSigned)
            at[i].line = std::abs(at[i].line);
        while (!isInRows && size.height > 1) {
            const Extent extent(size.height, rowBytes, stepOf(i));
            if (extent.below + extent.above <= static_cast<int64_t>(memories[i]->runBytes()))
                break;
            --size.height;
        }
    }

    const auto nearest = 1 + random.below(static_cast<uint32>(std::max<size_t>(count, 2)) - 1);
    const bool isFlushBehind = random.oneIn(2);
    for (size_t i = 0; i < count; ++i) {
        const Part &part = operation.parts[i];
        const size_t rowBytes = part.rowBytes(size.width);
        const Extent extent(size.height, rowBytes, stepOf(i));
        if (isInRows) {
            at[i].first = memories[i]->run(stepOf(i) < 0 ? kFencedRows - 1 : 0) +
                          (isFlushBehind ? memories[i]->runBytes() - rowBytes : 0);
        } else if (isNear && (i == 0 || i == nearest || random.oneIn(2))) {
            memories[i] = memories[0];
            at[i].first = memories[i]->run(0) + memories[i]->runBytes() / 2 +
                          (i == 0 ? 0 : random.between(-128, 128));
        } else {
            if (operation.mayOverlap && random.oneIn(3))
                memories[i] = memories[0];
            const int64_t room =
                static_cast<int64_t>(memories[i]->runBytes()) - extent.below - extent.above;
            at[i].first = memories[i]->run(0) + extent.below +
                          random.oneOf<int64_t>({0, room, room, random.below(uint32(room) + 1)});
        }
        const uint64_t row = uint64_t{at[i].y} + (isUpwards ? size.height - 1 : 0);
        const int64_t line =
            part.rule == RowRule::kRounded ? rowStep(at[i].line, part) : at[i].line;
        at[i].buffer = reinterpret_cast<uint8 *>(reinterpret_cast<uintptr_t>(at[i].first) -
                                                 row * static_cast<uint64_t>(line) -
                                                 uint64_t{at[i].x} * part.bytes);
    }
    compare(random, operation, size, at, memories);
}

// Nothing is looked at when there is nothing to do, however large the rest.
void Arena::checkNothing(Random &random, const Operation &operation) const {
    const bool isTouched = operation.parts[0].isTouched;
    uint8 *nowhere = random.oneIn(4) ? nullptr : blocks_[0].nowhere();
    Surfaces at(operation.parts.size());
    for (Surface &surface : at)
        surface = {nowhere, nowhere, 64, random.below(9), random.below(9)};
    const uint32 any = random.oneOf({0u, 1u, kMost});
    const uint32 none = isTouched ? 0 : random.oneOf({0u, 1u, 999u, kMost});
    operation.library(at, random.oneIn(2) ? Size{any, none} : Size{none, any});
}

void Arena::compare(Random &random, const Operation &operation, Size size, const Surfaces &at,
                    const std::vector<TwinMemory *> &memories) {
    Surfaces inModel = at, called = at;
    for (size_t i = 0; i < at.size(); ++i) {
        const Part &part = operation.parts[i];
        memories[i]->refill(random, part.low, part.count);
        const auto shift = [](Surface &surface, uint8 *first) {
            surface.buffer = reinterpret_cast<uint8 *>(
                reinterpret_cast<uintptr_t>(surface.buffer) +
                (reinterpret_cast<uintptr_t>(first) - reinterpret_cast<uintptr_t>(surface.first)));
            surface.first = first;
        };
        shift(inModel[i], memories[i]->inModel(at[i].first));
        if (!part.isTouched)
            shift(called[i], memories[i]->nowhere());
    }
    operation.library(called, size);
    operation.reference(inModel, size);
    for (const TwinMemory *memory : memories)
        EXPECT_TRUE(memory->agree());
    if (testing::Test::HasFailure())
        for (const Surface &surface : at)
            ADD_FAILURE() << operation.name << ", " << size.width << " x " << size.height << " at "
                          << surface.x << ", " << surface.y << ", line " << surface.line;
}

} // namespace quillon::test
