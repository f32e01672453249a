// How the time of a call depends on the shape of its rectangle.
#pragma once

#include <string>

namespace quillon::bench {

// All widths up to 300, every alignment, gaps between rows and odd line increments.
// Reports what takes twice as long as what is like it, or longer than a plain loop
// over the pixels.  Returns an exit code: 1 where there was anything to report.
int sweep();

// The time for a pixel from 16 x 16 to 8192 x 8192, and of a call that has nothing
// to do; growth.md in the folder, unless that is empty.
int growth(const std::string &folder);

} // namespace quillon::bench
