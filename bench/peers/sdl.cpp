// SDL's surfaces: fills, blits with conversion and blending, video.
#include "../operations/operations.h"
#include "peers.h"

#include <SDL2/SDL.h>

#include <memory>

namespace quillon::bench {
namespace {

using Surface = std::shared_ptr<SDL_Surface>;

Surface surfaceOf(const Buffer &buffer, uint32_t format) {
    SDL_Surface *surface = SDL_CreateRGBSurfaceWithFormatFrom(
        buffer.data, buffer.w(), buffer.h(), SDL_BITSPERPIXEL(format), buffer.stride, format);
    for (int i = 0; format == SDL_PIXELFORMAT_INDEX8 && i < 256; ++i) {
        const uint32_t entry = palette()[i];
        const SDL_Color color = {static_cast<uint8_t>(entry >> 16),
                                 static_cast<uint8_t>(entry >> 8), static_cast<uint8_t>(entry),
                                 255};
        SDL_SetPaletteColors(surface->format->palette, &color, i, 1);
    }
    return {surface, SDL_FreeSurface};
}

auto fill(uint32_t format) {
    return [=](const Buffer &dst) -> Work {
        // It requires that only the bytes of a pixel are set.
        const uint32_t pixel = kPixel & 0xFFFFFFFF >> (32 - 8 * SDL_BYTESPERPIXEL(format));
        return [=, to = surfaceOf(dst, format)] { SDL_FillRect(to.get(), nullptr, pixel); };
    };
}

auto blit(uint32_t from, uint32_t to, SDL_BlendMode mode = SDL_BLENDMODE_NONE) {
    return [=](const Buffer &dst, const Buffer &src) -> Work {
        const Surface source = surfaceOf(src, from), target = surfaceOf(dst, to);
        SDL_SetSurfaceBlendMode(source.get(), mode);
        return [=] { SDL_BlitSurface(source.get(), nullptr, target.get(), nullptr); };
    };
}

auto convertFrame(uint32_t from, uint32_t to) {
    return [=](const Buffer &dst, const Buffer &src) {
        SDL_ConvertPixels(dst.w(), dst.h(), from, src.data, src.stride, to, dst.data, dst.stride);
    };
}

} // namespace

std::string offerSdl(const Peer &peer) {
    constexpr struct {
        int32_t depth;
        uint32_t format;
    } kFormats[] = {{kIndex, SDL_PIXELFORMAT_INDEX8}, {8, SDL_PIXELFORMAT_RGB332},
                    {15, SDL_PIXELFORMAT_RGB555},     {16, SDL_PIXELFORMAT_RGB565},
                    {24, SDL_PIXELFORMAT_BGR24},      {32, SDL_PIXELFORMAT_RGB888}};
    for (const auto &[depth, format] : kFormats) {
        peer.offer(text("fill ", depth), fill(format), Kind::Exact);
        peer.offer(text("copy ", depth), blit(format, format), Kind::Exact);
        for (const auto &[fromDepth, from] : kFormats)
            peer.offer(conversionName(fromDepth, depth), blit(from, format));
        if (depth == 15)
            continue;
        peer.offer(text("YUY2 to ", depth), convertFrame(SDL_PIXELFORMAT_YUY2, format));
        peer.offer(text("UYVY to ", depth), convertFrame(SDL_PIXELFORMAT_UYVY, format));
        peer.offer(text("YV12 to ", depth), convertFrame(SDL_PIXELFORMAT_YV12, format));
    }
    peer.offer("blend *",
               blit(SDL_PIXELFORMAT_ARGB8888, SDL_PIXELFORMAT_RGB888, SDL_BLENDMODE_BLEND));
    SDL_version version;
    SDL_GetVersion(&version);
    return text(int{version.major}, ".", int{version.minor}, ".", int{version.patch});
}

} // namespace quillon::bench
