// Random calls of every function of raster.h and rect.h, each held to its plain
// statement: what the tests, the fuzzers and the fingerprint try.  A file for each
// room of lib/; reference/ has the statements that are longer than a line.
//
// A function tries one case, which it draws from random.  How many instruction sets it
// is tried on, and what a difference leads to, is up to the program (support/judge.h).
#pragma once

#include "support/surfaces.h"

#include <cstdlib>

namespace quillon::test {

// Rectangles on surfaces, of any shape but kLarge unless one is given.
void tryFill(Random &random, std::optional<Shape> shape = {});
void tryCopy(Random &random, std::optional<Shape> shape = {});
void tryBlend(Random &random, std::optional<Shape> shape = {});
void tryRop(Random &random, std::optional<Shape> shape = {});
void tryBits(Random &random, std::optional<Shape> shape = {});
void tryConvert(Random &random, std::optional<Shape> shape = {});
void tryColorKey(Random &random, std::optional<Shape> shape = {});

// A stencil over a page that begins or ends within it.
void tryStencilBesidePage(Random &random);
// One pixel; the placing of a component in a channel; a mode.
void tryConvertOne(Random &random);

// An image, and rows of the image that it is scaled to, with any strides.
struct ScaleRows {
    uint32_t width, height;
    int32_t stride;

    size_t toLast() const { return static_cast<size_t>(std::abs(stride)) * (height - 1); }
    size_t bytes() const { return toLast() + size_t{4} * width; }
    // Row 0, when the rows take up all of a block of this size.
    size_t first() const { return stride < 0 ? toLast() : 0; }
};
struct Scaling {
    ScaleRows src, dst; // dst: of the rectangle alone
    int32_t left, top;
    double scaleX, scaleY;
    uint32_t filter;
};
void tryScaling(Random &random, const Scaling &scaling);
void tryScale(Random &random);
void tryScaleSrcCoordinates(Random &random);
void tryVideo(Random &random);
void tryLargeVideo(Random &random, uint32_t width); // every format and depth
void tryYuvToBgrx(Random &random);

void tryCursorPlanes(Random &random);
void tryCursorBox(Random &random);
void tryDrawCursor(Random &random);
struct CursorScaling {
    uint32_t type, width, height;
    double scaleX, scaleY;
};
void tryScaledCursor(Random &random, const CursorScaling &scaling);
void tryScaleCursor(Random &random);

void tryRectList(Random &random);
void tryAnyRectList(Random &random); // of numbers that may mean nothing

void tryRectSets(Random &random);
void tryRectPoints(Random &random);
void tryRectMoves(Random &random);
void tryRectMaps(Random &random);

// Any call of a family, in the shares that fuzzers and the fingerprint try them.
namespace family {
void bits(Random &random);
void blend(Random &random);
void colorKey(Random &random);
void convert(Random &random);
void copy(Random &random);
void cursor(Random &random);
void fill(Random &random);
void rect(Random &random);
void region(Random &random);
void rop(Random &random);
void scale(Random &random);
void video(Random &random);
} // namespace family

} // namespace quillon::test
