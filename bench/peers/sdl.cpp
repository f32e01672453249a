// SDL's surfaces: fills, blits with conversion, blending and a key, video.
#include "../operations/names.h"
#include "../operations/operations.h"
#include "peers.h"

#include <SDL2/SDL.h>
#include <memory>

namespace quillon::bench {
namespace {

using Surface = std::shared_ptr<SDL_Surface>;

Surface surfaceOf(const Buffer &buffer, uint32_t format) {
    const int bits = SDL_BITSPERPIXEL(format);
    return {SDL_CreateRGBSurfaceWithFormatFrom(buffer.data, static_cast<int>(buffer.width),
                                               static_cast<int>(buffer.height), bits, buffer.line(),
                                               format),
            SDL_FreeSurface};
}

Work blit(const Surface &src, const Surface &dst, SDL_BlendMode mode) {
    SDL_SetSurfaceBlendMode(src.get(), mode);
    return [=] { SDL_BlitSurface(src.get(), nullptr, dst.get(), nullptr); };
}

constexpr struct Format {
    int32_t depth;
    uint32_t format;
} kFormats[] = {{kIndex, SDL_PIXELFORMAT_INDEX8}, {8, SDL_PIXELFORMAT_RGB332},
                {15, SDL_PIXELFORMAT_RGB555},     {16, SDL_PIXELFORMAT_RGB565},
                {24, SDL_PIXELFORMAT_BGR24},      {32, SDL_PIXELFORMAT_RGB888}};

void setPalette(SDL_Surface *surface) {
    SDL_Color colours[256];
    for (size_t i = 0; i < 256; ++i) {
        const uint32_t colour = palette()[i];
        colours[i] = {static_cast<uint8_t>(colour >> 16), static_cast<uint8_t>(colour >> 8),
                      static_cast<uint8_t>(colour), 255};
    }
    SDL_SetPaletteColors(surface->format->palette, colours, 0, 256);
}

void offerConversions(Offers &offers) {
    for (const Format &from : kFormats) {
        for (const Format &to : kFormats) {
            if (to.depth == kIndex)
                continue;
            offers[conversionName(from.depth, to.depth)].push_back(
                {"SDL", Agreement::Approximate, [=](const Job &job) -> Work {
                     const Surface src = surfaceOf(job.src(), from.format);
                     if (from.depth == kIndex)
                         setPalette(src.get());
                     return blit(src, surfaceOf(job.dst, to.format), SDL_BLENDMODE_NONE);
                 }});
        }
    }
}

void offerVideo(Offers &offers) {
    const auto offer = [&](const char *name, uint32_t from, uint32_t to) {
        offers[name].push_back(
            {"SDL", Agreement::Approximate, [=](const Job &job) -> Work {
                 return [=, dst = job.dst, src = job.src()] {
                     SDL_ConvertPixels(static_cast<int>(dst.width), static_cast<int>(dst.height),
                                       from, src.data, src.line(), to, dst.data, dst.line());
                 };
             }});
    };
    offer("YUY2 to 32", SDL_PIXELFORMAT_YUY2, SDL_PIXELFORMAT_RGB888);
    offer("UYVY to 32", SDL_PIXELFORMAT_UYVY, SDL_PIXELFORMAT_RGB888);
    offer("YV12 to 32", SDL_PIXELFORMAT_YV12, SDL_PIXELFORMAT_RGB888);
    offer("YUY2 to 24", SDL_PIXELFORMAT_YUY2, SDL_PIXELFORMAT_BGR24);
    offer("UYVY to 24", SDL_PIXELFORMAT_UYVY, SDL_PIXELFORMAT_BGR24);
    offer("YV12 to 24", SDL_PIXELFORMAT_YV12, SDL_PIXELFORMAT_BGR24);
    offer("YUY2 to 16", SDL_PIXELFORMAT_YUY2, SDL_PIXELFORMAT_RGB565);
    offer("UYVY to 16", SDL_PIXELFORMAT_UYVY, SDL_PIXELFORMAT_RGB565);
    offer("YV12 to 16", SDL_PIXELFORMAT_YV12, SDL_PIXELFORMAT_RGB565);
}

} // namespace

void offerSdl(Offers &offers) {
    for (const Format &format : kFormats) {
        if (format.depth == kIndex || format.depth == 15)
            continue;
        const std::string depth = std::to_string(format.depth);
        const uint32_t mask = 0xFFFFFFFF >> (32 - 8 * SDL_BYTESPERPIXEL(format.format));
        offers["fill " + depth].push_back({"SDL", Agreement::Exact, [=](const Job &job) -> Work {
                                               // Only the bytes of a pixel may be set.
                                               const uint32_t pixel = kPixel & mask;
                                               return [=, dst = surfaceOf(job.dst, format.format)] {
                                                   SDL_FillRect(dst.get(), nullptr, pixel);
                                               };
                                           }});
        offers["copy " + depth].push_back({"SDL", Agreement::Exact, [=](const Job &job) -> Work {
                                               return blit(surfaceOf(job.src(), format.format),
                                                           surfaceOf(job.dst, format.format),
                                                           SDL_BLENDMODE_NONE);
                                           }});
    }
    for (const char *content : {"noise", "interface"}) {
        offers["blend " + std::string(content)].push_back(
            {"SDL", Agreement::Approximate, [](const Job &job) -> Work {
                 return blit(surfaceOf(job.src(), SDL_PIXELFORMAT_ARGB8888),
                             surfaceOf(job.dst, SDL_PIXELFORMAT_RGB888), SDL_BLENDMODE_BLEND);
             }});
    }
    offerConversions(offers);
    offerVideo(offers);
}

} // namespace quillon::bench
