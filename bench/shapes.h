// How the time of a call depends on the shape of its rectangle.
#pragma once

#include <string>

namespace quillon::bench {

// Prints the rectangles that take much longer than similar ones, of all widths up to
// 300 with contiguous rows, in a surface and of an odd stride, and of all alignments.
// Returns their count.
size_t sweep();

// The page of the time a pixel of squares from 16 x 16 to 8192 x 8192, and of an
// empty call.
std::string growthPage();

} // namespace quillon::bench
