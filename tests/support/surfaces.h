// Random rectangles on random surfaces, in fenced memory that has a model.
#pragma once

#include "quillonTypes.h"
#include "support/fence.h"
#include "support/random.h"

#include <gtest/gtest.h>

#include <vector>

namespace quillon::test {

// How the rows of a surface follow each other, see raster.h.
enum class RowRule { kExact, kRoundedSteps, kRounded };

// A surface, and where on it a rectangle begins.
struct Surface {
    uint8 *buffer; // of pixel (0, 0), which may lie outside of memory
    int64_t line;
    uint32 x, y;

    int32 signedLine() const { return static_cast<int32>(line); }
    uint32 unsignedLine() const { return static_cast<uint32>(line); }
};

struct Size {
    uint32 width, height;
};

// A fenced block and its model, alike to begin with.  The call under test works
// on the block, the reference on the model, and then they have to agree.
class TwinMemory {
public:
    TwinMemory();

    uint8 *data() const { return block_.data(); }
    size_t size() const { return block_.size(); }

    // New bytes, below limit each.
    void refill(Random &random, uint32 limit = 256);

    // The same place in the model.
    Surface inModel(const Surface &surface) const;

    testing::AssertionResult agree() const;

private:
    FencedBuffer block_;
    std::vector<uint8> model_;
};

// What a row step comes to, in bytes.
int64_t rowStep(int64_t line, int32 bytesPerPixel, RowRule rule);

// 0 to about 140 pixels, or a good many more.
uint32 randomWidth(Random &random);

// A line increment for rows of the given length: fitting, padded, odd, shorter
// than the row, 0; with isSigned also the negative of these.
int64_t randomLine(Random &random, size_t rowBytes, bool isSigned);

// The size with its height cut down until the rectangle fits the memory.
Size fitted(Size size, const TwinMemory &memory, size_t rowBytes, int64_t step);

// A rectangle somewhere in the memory, often flush against one of its fences.
uint8 *randomPlace(Random &random, const TwinMemory &memory, Size size, size_t rowBytes,
                   int64_t step);

// The surface on which the first pixel of a rectangle has the given address, at
// random coordinates that go up to the largest.
Surface surfaceAt(Random &random, uint8 *first, int64_t line, int32 bytesPerPixel, RowRule rule);

// Three rows with fences at one edge of each, and their model.
class TwinRows {
public:
    static constexpr uint32 kHeight = 3;

    TwinRows();

    void refill(Random &random);

    // The rows of a rectangle at the fences before or behind, and in the model.
    Surface fenced(FencedBuffer::Flush flush, size_t rowBytes) const;
    Surface inModel(FencedBuffer::Flush flush, size_t rowBytes);

    testing::AssertionResult agree() const;

private:
    FencedRows rows_;
    std::vector<uint8> model_;
};

} // namespace quillon::test
