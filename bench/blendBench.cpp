// Raster_AlphaBlendOver, on contents that differ in what could be skipped.
#include "measure.h"
#include "raster.h"

namespace quillon::bench {
namespace {

enum class Content {
    noise, // every alpha anew
    runs,  // stretches that are clear or solid, as in text and sprites
    solid  // nothing to blend
};

// Gives a surface of noise the alpha of a kind of content, premultiplied.
void premultiply(Surface &surface, Content content) {
    std::mt19937 random(2);
    uint32 left = 0, alpha = 255;
    std::vector<uint8> &bytes = surface.all();
    for (size_t i = 0; i + 3 < bytes.size(); i += 4) {
        if (content == Content::noise) {
            alpha = bytes[i + 3];
        } else if (content == Content::runs && left-- == 0) {
            left = static_cast<uint32>(random() % 24);
            alpha = random() & 1 ? 255 : 0;
        }
        for (size_t channel = 0; channel < 3; ++channel)
            bytes[i + channel] = static_cast<uint8>(bytes[i + channel] * alpha / 255);
        bytes[i + 3] = static_cast<uint8>(alpha);
    }
}

void registerContent(const Area &area, const std::string &name, Content content) {
    measure("blend" + name, area, "quillon", 12, [=] {
        Surface src(area, 4);
        premultiply(src, content);
        return [=, dst = Surface(area, 4), src = std::move(src)]() mutable {
            Raster_AlphaBlendOver(dst.data(), area.left, 0, dst.signedIncrement(), src.data(),
                                  area.left, 0, src.signedIncrement(), area.width, area.height);
        };
    });
}

} // namespace

void registerBlend() {
    for (const Area &area : kAreas) {
        registerContent(area, "Noise", Content::noise);
        registerContent(area, "Runs", Content::runs);
        registerContent(area, "Solid", Content::solid);
    }
}

} // namespace quillon::bench
