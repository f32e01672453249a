// libpng, which ours stands on, by its simplified interface.
#include "../operations/operations.h"
#include "peers.h"

#include <png.h>

#include <memory>

namespace quillon::bench {

std::string offerLibpng(const Peer &peer) {
    peer.offer("PNG read", [file = pngFile()] {
        png_image image = {};
        image.version = PNG_IMAGE_VERSION;
        png_image_begin_read_from_memory(&image, file.data(), file.size());
        image.format = PNG_FORMAT_BGRA;
        const std::unique_ptr<uint8_t[]> pixels(new uint8_t[PNG_IMAGE_SIZE(image)]); // not cleared
        png_image_finish_read(&image, nullptr, pixels.get(), 0, nullptr);
        benchmark::DoNotOptimize(pixels.get());
    });
    peer.offer("PNG write", [&from = picture()] {
        png_image image = {};
        image.version = PNG_IMAGE_VERSION;
        image.width = from.width;
        image.height = from.height;
        image.format = PNG_FORMAT_BGRA;
        png_alloc_size_t size = PNG_IMAGE_PNG_SIZE_MAX(image);
        const std::unique_ptr<uint8_t[]> file(new uint8_t[size]); // not cleared
        png_image_write_to_memory(&image, file.get(), &size, 0, from.data,
                                  static_cast<png_int_32>(from.bytesPerLine), nullptr);
        benchmark::DoNotOptimize(file.get());
    });
    return png_get_libpng_ver(nullptr);
}

} // namespace quillon::bench
