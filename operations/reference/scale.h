// The scaler stated as plainly as it can be: one pixel at a time, nothing kept
// from one row to the next but whole scaled rows.
#pragma once

#include <quillon/raster.h>

namespace quillon::reference {

// For arguments that Raster_Scale accepts.
decltype(Raster_Scale) scale;

} // namespace quillon::reference
