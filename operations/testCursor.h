// Cursors with random images.
#pragma once

#include "support/fence.h"
#include "support/random.h"
#include <quillon/rasterCursor.h>

#include <cstdlib>
#include <memory>

namespace quillon::test {

// A cursor with random images, each fenced, as are the 32 bytes of the record that
// an alpha cursor has.
struct TestCursor {
    TestCursor(Random &random, uint32_t type, uint32_t width, uint32_t height)
        : memory(type == RASTER_CURSOR_ALPHA ? 32 : sizeof(RasterCursor)),
          images{FencedBuffer(size_t{4} * width * height),
                 FencedBuffer(size_t{4} * width * height)},
          record(*reinterpret_cast<RasterCursor *>(memory.data())) {
        for (const FencedBuffer *part : {&memory, &images[0], &images[1]})
            random.fill(part->data(), part->size());
        record.type = type;
        record.hotspotX = random.below(width + 1);
        record.hotspotY = random.below(height + 1);
        record.width = width;
        record.height = height;
        (type == RASTER_CURSOR_ALPHA ? record.alphaImage : record.andImage) = images[0].data();
        if (type == RASTER_CURSOR_ANDXOR)
            record.xorImage = images[1].data();
    }

    FencedBuffer memory, images[2];
    RasterCursor &record;
};

struct Release {
    void operator()(RasterCursor *cursor) const {
        std::free(cursor->type == RASTER_CURSOR_ALPHA ? cursor->alphaImage : cursor->andImage);
        std::free(cursor->type == RASTER_CURSOR_ALPHA ? nullptr : cursor->xorImage);
        std::free(cursor);
    }
};
using ScaledCursor = std::unique_ptr<RasterCursor, Release>;

} // namespace quillon::test
