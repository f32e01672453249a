// libspng: reads PNG in the byte order of the file, R G B A.
#include "../operations/operations.h"
#include "peers.h"

#include <spng.h>

#include <memory>
#include <stdexcept>

namespace quillon::bench {

std::string offerSpng(const Peer &peer) {
    peer.offer("PNG read", [file = pngFile()] {
        const std::unique_ptr<spng_ctx, decltype(&spng_ctx_free)> context(spng_ctx_new(0),
                                                                          spng_ctx_free);
        size_t size = 0;
        spng_set_png_buffer(context.get(), file.data(), file.size());
        spng_decoded_image_size(context.get(), SPNG_FMT_RGBA8, &size);
        const std::unique_ptr<void, decltype(&free)> pixels(malloc(size), free);
        if (spng_decode_image(context.get(), pixels.get(), size, SPNG_FMT_RGBA8, 0) != 0)
            throw std::runtime_error("libspng cannot read the picture");
        benchmark::DoNotOptimize(pixels.get());
    });
    return spng_version_string();
}

} // namespace quillon::bench
