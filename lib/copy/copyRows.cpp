#include "copy/copyRows.h"

#include "copy/copyKernels.h"
#include "simd/thresholds.h"

#include <cstring>

namespace quillon {
namespace {

// Rows of more than kCopyShortRow bytes on surfaces that do not overlap.
void copyLongRows(DstRows dst, SrcRows src, ByteExtent extent) {
    if (isNonTemporal(extent)) {
        copyNonTemporalRows(dst, src, extent);
        return;
    }
    if (extent.rowBytes <= kCopyMediumRow) {
        copyMediumRows(dst, src, extent);
        return;
    }
    for (size_t y = 0; y < extent.height; ++y)
        std::memcpy(dst.row(y), src.row(y), extent.rowBytes);
}

} // namespace

void copyRows(DstRows dst, SrcRows src, ByteExtent extent, RowOrder order) {
    const bool isOverlapping = rowsOverlap(dst, src, extent);
    if (isOverlapping && order == RowOrder::kUpward) {
        dst = {dst.row(extent.height - 1), -dst.stride};
        src = {src.row(extent.height - 1), -src.stride};
    }
    if (!isOverlapping && areContiguous(dst, extent.rowBytes) &&
        areContiguous(src, extent.rowBytes))
        extent = asOneRow(extent);
    if (extent.rowBytes <= kCopyShortRow) {
        copyShortRows(dst, src, extent);
    } else if (!isOverlapping) {
        copyLongRows(dst, src, extent);
    } else {
        for (size_t y = 0; y < extent.height; ++y)
            std::memmove(dst.row(y), src.row(y), extent.rowBytes);
    }
}

} // namespace quillon
