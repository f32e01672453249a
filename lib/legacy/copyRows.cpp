#include "legacy/copyRows.h"

#include "legacy/copyKernels.h"
#include "legacy/streaming.h"

#include <cstring>

namespace quillon {
namespace {

// Long rows, or the rows of a surface from end to end.
void copyLongRows(DstRows dst, SrcRows src, Size size) {
    if (isStreamed(size.width, size.height)) {
        copyStreamedRows(dst, src, size);
        return;
    }
    if (size.width <= kMiddlingRow) {
        copyMiddlingRows(dst, src, size);
        return;
    }
    for (size_t y = 0; y < size.height; ++y)
        std::memcpy(dst.row(y), src.row(y), size.width);
}

} // namespace

bool rowsOverlap(DstRows dst, SrcRows src, Size size) {
    const AddressRange written = addressesOf(dst, size.width, size.height);
    return written.overlaps(addressesOf(src, size.width, size.height));
}

void copyRows(DstRows dst, SrcRows src, Size size, RowOrder order) {
    const bool overlapping = rowsOverlap(dst, src, size);
    if (overlapping && order == RowOrder::Upwards) {
        dst = {dst.row(size.height - 1), -dst.step};
        src = {src.row(size.height - 1), -src.step};
    }
    if (!overlapping)
        size = joinedRows(size, size.width, dst.step, size.width, src.step);
    if (size.width <= kShortRow) {
        copyShortRows(dst, src, size);
    } else if (!overlapping) {
        copyLongRows(dst, src, size);
    } else {
        for (size_t y = 0; y < size.height; ++y)
            std::memmove(dst.row(y), src.row(y), size.width);
    }
}

} // namespace quillon
