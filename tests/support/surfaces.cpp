#include "support/surfaces.h"

#include <algorithm>
#include <cstring>

namespace quillon::test {
namespace {

constexpr size_t kTwinSize = 24576;

// The bytes from a rectangle's first pixel down to its lowest, and up to behind
// its highest.
struct Extent {
    int64_t below, above;

    Extent(Size size, size_t rowBytes, int64_t step) {
        const int64_t last = (int64_t{size.height} - 1) * step;
        below = std::max<int64_t>(0, -last);
        above = std::max<int64_t>(0, last) + static_cast<int64_t>(rowBytes);
    }
};

testing::AssertionResult same(const uint8 *block, const uint8 *model, size_t size) {
    if (std::memcmp(block, model, size) == 0)
        return testing::AssertionSuccess();
    const auto at = std::mismatch(block, block + size, model);
    return testing::AssertionFailure() << "byte " << at.first - block << " of " << size << " is "
                                       << int{*at.first} << ", should be " << int{*at.second};
}

size_t wholePages(size_t size) {
    return (size + pageSize() - 1) / pageSize() * pageSize();
}

} // namespace

TwinMemory::TwinMemory() : block_(wholePages(kTwinSize)), model_(block_.size()) {}

void TwinMemory::refill(Random &random, uint32 limit) {
    random.fill(data(), size());
    if (limit < 256)
        std::transform(data(), data() + size(), data(),
                       [=](uint8 byte) { return static_cast<uint8>(byte * limit >> 8); });
    std::copy(data(), data() + size(), model_.begin());
}

Surface TwinMemory::inModel(const Surface &surface) const {
    Surface model = surface;
    model.buffer = reinterpret_cast<uint8 *>(reinterpret_cast<uintptr_t>(surface.buffer) -
                                             reinterpret_cast<uintptr_t>(data()) +
                                             reinterpret_cast<uintptr_t>(model_.data()));
    return model;
}

testing::AssertionResult TwinMemory::agree() const {
    return same(data(), model_.data(), size());
}

int64_t rowStep(int64_t line, int32 bytesPerPixel, RowRule rule) {
    const bool isUnit = bytesPerPixel == 2 || bytesPerPixel == 4;
    return rule != RowRule::kExact && isUnit ? line & ~int64_t{bytesPerPixel - 1} : line;
}

uint32 randomWidth(Random &random) {
    switch (random.below(8)) {
    case 0:
        return 600 + random.below(700);
    case 1:
    case 2:
        return random.below(20);
    default:
        return random.below(141);
    }
}

int64_t randomLine(Random &random, size_t rowBytes, bool isSigned) {
    const auto row = static_cast<uint32>(rowBytes);
    int64_t line = row;
    switch (random.below(8)) {
    case 0:
    case 1:
        break; // rows end to end
    case 2:
        line = random.below(row + 1);
        break;
    case 3:
        line = random.oneOf({0, 0, 1, 2, 3, 4});
        break;
    case 4:
        line = row + random.below(300);
        break;
    default:
        line = row + random.below(10);
    }
    return isSigned && random.oneIn(4) ? -line : line;
}

Size fitted(Size size, const TwinMemory &memory, size_t rowBytes, int64_t step) {
    for (; size.height > 1; --size.height) {
        const Extent extent(size, rowBytes, step);
        if (extent.below + extent.above <= static_cast<int64_t>(memory.size()))
            break;
    }
    return size;
}

uint8 *randomPlace(Random &random, const TwinMemory &memory, Size size, size_t rowBytes,
                   int64_t step) {
    const Extent extent(size, rowBytes, step);
    const int64_t room = static_cast<int64_t>(memory.size()) - extent.below - extent.above;
    int64_t ahead = room; // flush behind
    if (random.oneIn(2))
        ahead = random.oneIn(2) ? 0 : random.below(static_cast<uint32>(room) + 1);
    return memory.data() + ahead + extent.below;
}

Surface surfaceAt(Random &random, uint8 *first, int64_t line, int32 bytesPerPixel, RowRule rule) {
    const auto coordinate = [&] {
        const uint32 small = random.below(100);
        return random.oneOf({0u, small, small, random.word(), UINT32_MAX - small});
    };
    Surface surface = {nullptr, line, coordinate(), coordinate()};
    const int64_t lineToFirst =
        rule == RowRule::kRounded ? rowStep(line, bytesPerPixel, rule) : line;
    const uint64_t offset = surface.y * static_cast<uint64_t>(lineToFirst) +
                            surface.x * static_cast<uint64_t>(bytesPerPixel);
    surface.buffer = reinterpret_cast<uint8 *>(reinterpret_cast<uintptr_t>(first) - offset);
    return surface;
}

TwinRows::TwinRows() : rows_(kHeight), model_(kHeight * pageSize()) {}

void TwinRows::refill(Random &random) {
    random.fill(model_.data(), model_.size());
    for (size_t row = 0; row < kHeight; ++row)
        std::copy_n(model_.data() + row * pageSize(), pageSize(), rows_.page(row));
}

Surface TwinRows::fenced(FencedBuffer::Flush flush, size_t rowBytes) const {
    uint8 *first =
        flush == FencedBuffer::Flush::kBefore ? rows_.flushBefore() : rows_.flushBehind(rowBytes);
    return {first, FencedRows::step(), 0, 0};
}

Surface TwinRows::inModel(FencedBuffer::Flush flush, size_t rowBytes) {
    const size_t ahead = flush == FencedBuffer::Flush::kBefore ? 0 : pageSize() - rowBytes;
    return {model_.data() + ahead, static_cast<int64_t>(pageSize()), 0, 0};
}

testing::AssertionResult TwinRows::agree() const {
    for (size_t row = 0; row < kHeight; ++row) {
        auto result = same(rows_.page(row), model_.data() + row * pageSize(), pageSize());
        if (!result)
            return result << " (row " << row << ")";
    }
    return testing::AssertionSuccess();
}

} // namespace quillon::test
