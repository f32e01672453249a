#include "support/surfaces.h"

#include "support/judge.h"

#include <algorithm>
#include <cstring>
#include <sstream>

namespace quillon::test {
namespace {

constexpr uint32_t kFencedRows = 3;
constexpr uint32_t kMost = UINT32_MAX;

// The largest stride there is downwards, and one that only unsigned line
// increments can have upwards.
constexpr size_t kFar = size_t{1} << 31;

// Memory of each surface; made when a case first has use for it.
using Home = std::array<TwinMemory, 4>;

// The same sizes whatever the pages of the system: cases are drawn from them.
constexpr size_t kPage = 4096;

Home makeHome(size_t runPages, size_t srcPages, size_t runs = 1, size_t spacing = 0) {
    const auto one = [&](size_t pages) { return TwinMemory(pages * kPage, runs, spacing); };
    return {one(runPages), one(srcPages), one(runPages), one(runPages)};
}

Home &homeOf(Shape shape) {
    switch (shape) {
    case Shape::kLarge: { // sources may have four times the bytes per pixel
        static thread_local Home home = makeHome(450, 1800);
        return home;
    }
    case Shape::kLongRows: {
        static thread_local Home home = makeHome(6, 6);
        return home;
    }
    case Shape::kFenced: {
        static thread_local Home home = makeHome(1, 1, kFencedRows, 2 * pageSize());
        return home;
    }
    case Shape::kFarApart: {
        static thread_local Home home = makeHome(1, 1, kFencedRows, kFar);
        return home;
    }
    default: {
        static thread_local Home home = makeHome(2, 2);
        return home;
    }
    }
}

int64_t wholePixels(int64_t stride, const Part &part) {
    const bool isWord = part.bytes == 2 || part.bytes == 4;
    return part.rule != RowRule::kExact && isWord ? stride & -int64_t{part.bytes} : stride;
}

// The bytes from a rectangle's first pixel down to its lowest, and up to behind
// its highest.
struct Reach {
    int64_t below, above;
};

// One call.
struct Case {
    const Operation &operation;
    Shape shape;
    Home &home;
    Size size;
    bool isNear; // surfaces begin within 128 bytes of each other
    Surfaces at{operation.parts.size()};
    std::vector<TwinMemory *> memories{operation.parts.size()};
    bool isUpward = false; // the first row that is walked is the last one

    bool isFenced() const { return shape == Shape::kFenced || shape == Shape::kFarApart; }
    size_t rowBytes(size_t i) const { return operation.parts[i].rowBytes(size.width); }

    // From each row that is walked to the next.
    int64_t walkedStride(size_t i) const {
        return wholePixels(isUpward ? -at[i].stride : at[i].stride, operation.parts[i]);
    }

    Reach reach(size_t i) const {
        const int64_t toLast = walkedStride(i) * (int64_t{size.height} - 1);
        return {std::max<int64_t>(0, -toLast),
                std::max<int64_t>(0, toLast) + static_cast<int64_t>(rowBytes(i))};
    }

    bool overlaps() const {
        const Reach dst = reach(0), src = reach(1);
        return memories[0] == memories[1] && at[0].first - dst.below < at[1].first + src.above &&
               at[1].first - src.below < at[0].first + dst.above;
    }
};

Shape drawShape(Random &random, const Operation &operation) {
    const uint32_t n = random.below(64);
    return n < 2                            ? Shape::kEmpty
           : n < 5                          ? Shape::kLongRows
           : n < 9                          ? Shape::kFarApart
           : n < 28                         ? Shape::kFenced
           : n < 46 && operation.mayOverlap ? Shape::kOverlapping
                                            : Shape::kScattered;
}

Size drawSize(Random &random, Shape shape, const TwinMemory &memory, const Part &dst) {
    const uint32_t rows = random.below(random.oneIn(16) ? 40 : 6);
    uint32_t width = random.below(141);
    switch (shape) {
    case Shape::kOverlapping:
        return {random.below(100), 1 + random.below(4)};
    case Shape::kLongRows:
        return {400 + random.below(2100), 1 + rows};
    case Shape::kLarge:
        width = 256 + random.below(2000);
        return {width, static_cast<uint32_t>(memory.runBytes() / dst.rowBytes(width))};
    default:
        width = random.oneIn(16) ? 200 + random.below(600) : random.oneOf({width, width % 20});
        width &= random.oneIn(4) ? ~7u : ~0u; // bitmap rows of whole bytes
        return shape == Shape::kScattered ? Size{width, rows} : Size{width % 141, kFencedRows};
    }
}

// Small, or up to the largest.
uint32_t drawCoordinate(Random &random) {
    const uint32_t small = random.below(100);
    return random.oneOf({0u, small, small, random.word(), kMost - small});
}

void drawCoordinates(Random &random, Case &c) {
    const bool isOneCorner = c.operation.isOneCorner;
    const bool isOneColumn = isOneCorner || random.oneIn(4);
    const bool isOneRow = isOneCorner || random.oneIn(2);
    const uint32_t x = drawCoordinate(random), y = drawCoordinate(random);
    for (Surface &surface : c.at) {
        surface.x = isOneColumn ? x : drawCoordinate(random);
        surface.y = isOneRow ? y : drawCoordinate(random);
    }
    c.isUpward = c.operation.walk == Walk::kAwayFromSource && c.at[1].y < c.at[0].y;
}

void drawStride(Random &random, Case &c, size_t i) {
    int64_t &stride = c.at[i].stride;
    if (c.isFenced()) {
        stride = c.home[i].spacing();
        if (c.operation.isSigned && (stride > INT32_MAX || random.oneIn(2)))
            stride = -stride;
        return;
    }
    const auto row = static_cast<uint32_t>(c.rowBytes(i));
    stride = random.oneOf({row, row, row + random.below(10), row + random.below(10),
                           row + random.below(300), random.below(row + 1), random.below(5)});
    if (random.oneIn(4))
        stride = -stride;
    if (i > 0 && random.oneIn(2)) // as on surfaces of one size, or nearly
        stride = c.at[0].stride + (c.isNear && random.oneIn(2) ? random.between(-20, 20) : 0);
    if (!c.operation.isSigned)
        stride = std::abs(stride);
    const TwinMemory &memory = c.home[c.operation.mayOverlap ? 0 : i];
    for (; c.size.height > 1; --c.size.height) {
        const Reach reach = c.reach(i);
        if (reach.below + reach.above <= static_cast<int64_t>(memory.runBytes()))
            break;
    }
}

// Where the first row that is walked begins.
uint8_t *drawFirst(Random &random, const Case &c, size_t i, bool isBehindFence, bool isNear) {
    const TwinMemory &memory = *c.memories[i];
    if (c.isFenced())
        return memory.run(c.walkedStride(i) < 0 ? kFencedRows - 1 : 0) +
               (isBehindFence ? 0 : memory.runBytes() - c.rowBytes(i));
    const Reach reach = c.reach(i);
    uint8_t *const lowest = memory.run(0) + reach.below;
    const int64_t room = static_cast<int64_t>(memory.runBytes()) - reach.below - reach.above;
    if (isNear && i > 0)
        return std::clamp(c.at[0].first + random.between(-128, 128), lowest, lowest + room);
    const int64_t anywhere = random.below(static_cast<uint32_t>(room) + 1);
    return lowest + (isNear ? room / 2 : random.oneOf({int64_t{0}, room, room, anywhere}));
}

void drawPlaces(Random &random, Case &c) {
    const bool isBehindFence = random.oneIn(2);
    const uint32_t nearest = c.at.size() < 3 ? 1 : 1 + random.below(3);
    for (size_t i = 0; i < c.at.size(); ++i) {
        const Part &part = c.operation.parts[i];
        const bool isNear = c.isNear && (i == 0 || i == nearest || random.oneIn(2));
        const bool isShared =
            isNear || (!c.isFenced() && c.operation.mayOverlap && random.oneIn(3));
        c.memories[i] = &c.home[isShared ? 0 : i];
        Surface &surface = c.at[i];
        surface.first = part.isTouched ? drawFirst(random, c, i, isBehindFence, isNear)
                                       : c.memories[i]->nowhere();
        const uint64_t row = uint64_t{surface.y} + (c.isUpward ? c.size.height - 1 : 0);
        const int64_t stride =
            part.rule == RowRule::kRounded ? wholePixels(surface.stride, part) : surface.stride;
        surface.buffer = reinterpret_cast<uint8_t *>(reinterpret_cast<uintptr_t>(surface.first) -
                                                     row * static_cast<uint64_t>(stride) -
                                                     uint64_t{surface.x} * part.bytes);
    }
}

void drawContents(Random &random, const Case &c) {
    for (size_t i = 0; i < c.at.size(); ++i)
        c.memories[i]->refill(random, c.operation.parts[i].low, c.operation.parts[i].count);
    for (size_t i = 0; i < c.at.size(); ++i) {
        const Part &part = c.operation.parts[i];
        const uint32_t bytes = std::max(part.bytes, 1u);
        for (uint32_t y = 0; y < c.size.height && !part.runs.empty(); ++y)
            if (!random.oneIn(3))
                plantRuns(random, c.at[i].first + y * c.walkedStride(i), c.rowBytes(i) / bytes,
                          bytes, part.runs);
    }
    for (TwinMemory *memory : c.memories)
        memory->keep();
}

// A call of memcpy for so few bytes would take most of the time.
uint32_t loadPixel(const uint8_t *from, uint32_t bytes) {
    uint32_t pixel = 0;
    if (bytes == sizeof pixel)
        std::memcpy(&pixel, from, sizeof pixel);
    else
        for (uint32_t i = 0; i < bytes; ++i)
            pixel |= uint32_t{from[i]} << (8 * i);
    return pixel;
}

void storePixel(uint8_t *to, uint32_t bytes, uint32_t pixel) {
    if (bytes == sizeof pixel)
        std::memcpy(to, &pixel, sizeof pixel);
    else
        for (uint32_t i = 0; i < bytes; ++i)
            to[i] = static_cast<uint8_t>(pixel >> (8 * i));
}

// Carries out the operation in the model.
void walkModel(const Case &c) {
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
                                             (isFromLast ? height - 1 - i : i) * c.walkedStride(k));
        const bool isLeftward = (isRowByRow && rows[1] < rows[0]) ||
                                (isAway && c.at[1].y == c.at[0].y && c.at[1].x < c.at[0].x);
        for (int64_t j = 0; j < width; ++j) {
            const int64_t column = isLeftward ? width - 1 - j : j;
            Pixels pixels = {};
            for (size_t k = 0; k < parts.size(); ++k) {
                const uint32_t bytes = parts[k].bytes / split;
                if (bytes == 0)
                    pixels[k] = rows[k][column / 8] >> (7 - column % 8) & 1;
                else if (parts[k].isTouched)
                    pixels[k] = loadPixel(rows[k] + column * bytes, bytes);
            }
            const uint32_t bytes = parts[0].bytes / split;
            storePixel(rows[0] + column * bytes, bytes, c.operation.reference(pixels));
        }
    }
}

std::string description(const Case &c) {
    static constexpr const char *kShapes[] = {"empty",     "scattered", "overlapping", "fenced",
                                              "far apart", "long rows", "large"};
    std::ostringstream text;
    text << c.operation.name << ", " << kShapes[static_cast<size_t>(c.shape)] << ", "
         << c.size.width << " x " << c.size.height;
    for (const Surface &surface : c.at)
        text << "; at " << surface.x << ", " << surface.y << ", stride " << surface.stride
             << ", address " << uintptr_t(surface.first);
    return text.str();
}

void callLibrary(const Case &c) {
    forEachTarget([&] {
        for (TwinMemory *memory : c.memories)
            memory->restore();
        withoutMemory([&] { c.operation.library(c.at, c.size); });
        for (const TwinMemory *memory : c.memories)
            memory->compare([&] { return description(c); });
    });
}

// Nothing is looked at when there is nothing to do, however large the rest.
void drawNothing(Random &random, Case &c) {
    uint8_t *const nowhere = random.oneIn(4) ? nullptr : c.home[0].nowhere();
    std::fill(c.memories.begin(), c.memories.end(), &c.home[0]);
    for (Surface &surface : c.at)
        surface = {nowhere, nowhere, 64, random.below(9), random.below(9)};
    const uint32_t any = random.oneOf({0u, 1u, kMost});
    const bool isIdle = !c.operation.parts[0].isTouched;
    const uint32_t none = isIdle ? random.oneOf({0u, 1u, 999u, kMost}) : 0;
    c.size = random.oneIn(2) ? Size{any, none} : Size{none, any};
    c.home[0].refill(random); // no case depends on the one before it
    c.home[0].keep();
}

} // namespace

TwinMemory::TwinMemory(size_t runBytes, size_t runs, size_t spacing)
    : runBytes_(runBytes), runs_(runs), spacing_(spacing),
      first_(pageSize() + wholePages(runBytes) - runBytes),
      pages_((runs - 1) * spacing + wholePages(runBytes) + 2 * pageSize()), model_(pages_.size()),
      kept_(runs * runBytes) {
    for (size_t i = 0; i < runs; ++i)
        for (Mapping *mapping : {&pages_, &model_})
            mapping->open(pageSize() + i * spacing, wholePages(runBytes));
}

void TwinMemory::refill(Random &random, uint32_t low, uint32_t count) {
    for (size_t i = 0; i < runs_; ++i) {
        uint8_t *bytes = run(i);
        random.fill(bytes, runBytes_);
        if (count < 256)
            std::transform(bytes, bytes + runBytes_, bytes, [=](uint8_t byte) {
                return static_cast<uint8_t>(low + (byte * count >> 8));
            });
    }
}

void TwinMemory::keep() {
    for (size_t i = 0; i < runs_; ++i) {
        std::copy_n(run(i), runBytes_, &kept_[i * runBytes_]);
        std::copy_n(run(i), runBytes_, inModel(run(i)));
    }
}

void TwinMemory::restore() {
    for (size_t i = 0; i < runs_; ++i)
        std::copy_n(&kept_[i * runBytes_], runBytes_, run(i));
}

void TwinMemory::compare(const std::function<std::string()> &description) const {
    for (size_t i = 0; i < runs_; ++i)
        test::compare(run(i), inModel(run(i)), runBytes_, description);
}

void tryOperation(Random &random, const Operation &operation, std::optional<Shape> given) {
    const bool isIdle = !operation.parts[0].isTouched;
    const Shape shape = isIdle ? Shape::kEmpty : given.value_or(drawShape(random, operation));
    Home &home = homeOf(shape);
    const Size size = drawSize(random, shape, home[0], operation.parts[0]);
    const bool isNear = shape == Shape::kOverlapping || (shape == Shape::kLarge && random.oneIn(2));
    Case c = {operation, shape, home, size, isNear && operation.mayOverlap};
    if (shape == Shape::kEmpty) {
        drawNothing(random, c);
        return callLibrary(c);
    }
    drawCoordinates(random, c);
    for (size_t i = 0; i < c.at.size(); ++i)
        drawStride(random, c, i);
    drawPlaces(random, c);
    drawContents(random, c);
    walkModel(c);
    callLibrary(c);
}

void plantRuns(Random &random, uint8_t *pixels, size_t count, uint32_t bytes,
               const std::vector<uint32_t> &values) {
    const uint32_t longest = random.oneOf({2u, 9u, 90u});
    for (size_t i = 0; i < count;) {
        const size_t end = std::min<size_t>(count, i + 1 + random.below(longest));
        const uint32_t value = values[random.below(static_cast<uint32_t>(values.size()))];
        for (const bool isLeft = random.oneIn(3); i < end; ++i)
            if (!isLeft)
                storePixel(pixels + i * bytes, bytes, value);
    }
}

} // namespace quillon::test
