// Draws marble.png: a glass marble with a soft shadow, on nothing.  Its edge is
// smooth, its shadow fades to full transparency, its middle lets the ground shine
// through.  Colours are not premultiplied, as PNG has it.
//
//     marble marble.png
#include <quillon/imageUtil.h>
#include <quillon/version.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <string_view>
#include <vector>

namespace {

constexpr char kHelp[] = "usage: marble FILE.png\n"
                         "\n"
                         "Draws marble.png, a glass marble with a soft shadow.\n"
                         "\n"
                         "  --help, --version   show this text; show the version\n";

constexpr int kSize = 256;
constexpr float kRadius = 96;
constexpr float kCentreX = 128, kCentreY = 112;

struct Colour {
    float red, green, blue, alpha;
};

float smoothstep(float low, float high, float value) {
    const float s = std::clamp((value - low) / (high - low), 0.0F, 1.0F);
    return s * s * (3 - 2 * s);
}

// The marble at a point of its disc, x and y from -1 to 1.
Colour glass(float x, float y) {
    const float z = std::sqrt(std::max(0.0F, 1 - x * x - y * y));
    // Three ribbons twist around the middle of the glass.
    const float angle = std::atan2(y, x + 0.2F) + 1.9F * std::hypot(x, y);
    const float ribbon =
        smoothstep(0.15F, 0.55F, std::sin(3 * angle)) * smoothstep(0.95F, 0.55F, std::hypot(x, y));
    const float rim = std::pow(1 - z, 2.5F);
    // Light enters at the top left, and gathers at the bottom right.
    const float lit = std::max(0.0F, 0.62F * z - 0.5F * x - 0.6F * y);
    const float gathered = smoothstep(0.55F, 0.0F, std::hypot(x - 0.42F, y - 0.48F));
    const float glint = smoothstep(0.20F, 0.07F, std::hypot((x + 0.40F) * 0.9F, y + 0.48F));

    const float shade = 0.42F + 0.5F * lit - 0.25F * rim;
    Colour colour = {0.20F * shade + 0.25F * gathered, 0.55F * shade + 0.45F * gathered,
                     0.75F * shade + 0.40F * gathered, 0.45F + 0.5F * rim};
    colour.red += ribbon * (1.05F * shade - colour.red + 0.15F);
    colour.green += ribbon * (0.48F * shade - colour.green + 0.05F);
    colour.blue += ribbon * (0.10F * shade - colour.blue);
    colour.alpha += ribbon * (0.95F - colour.alpha);
    colour.red += glint * (1 - colour.red);
    colour.green += glint * (1 - colour.green);
    colour.blue += glint * (1 - colour.blue);
    colour.alpha += glint * (1 - colour.alpha);
    return colour;
}

// One colour over the other, both not premultiplied.
Colour over(Colour top, Colour ground) {
    const float rest = ground.alpha * (1 - top.alpha);
    const float alpha = top.alpha + rest;
    if (alpha <= 0)
        return {0, 0, 0, 0};
    return {(top.red * top.alpha + ground.red * rest) / alpha,
            (top.green * top.alpha + ground.green * rest) / alpha,
            (top.blue * top.alpha + ground.blue * rest) / alpha, alpha};
}

Colour pixelAt(float x, float y) {
    const float fromShadow = std::hypot((x - kCentreX - 10) / 1.12F, (y - 206) / 0.42F);
    const Colour shadow = {0.02F, 0.02F, 0.05F, 0.6F * smoothstep(104, 10, fromShadow)};
    const float fromCentre = std::hypot(x - kCentreX, y - kCentreY);
    Colour marble = glass((x - kCentreX) / kRadius, (y - kCentreY) / kRadius);
    marble.alpha *= std::clamp(kRadius - fromCentre + 0.5F, 0.0F, 1.0F);
    return over(marble, shadow);
}

uint8_t toByte(float channel) {
    return static_cast<uint8_t>(std::lround(255 * std::clamp(channel, 0.0F, 1.0F)));
}

} // namespace

int main(int argc, char **argv) {
    const std::string_view option = argc == 2 ? argv[1] : "";
    if (option == "--help")
        return std::fputs(kHelp, stdout) < 0;
    if (option == "--version")
        return std::puts("marble " QUILLON_VERSION_STRING) < 0;
    if (argc != 2)
        return std::fputs(kHelp, stderr), 2;
    std::vector<uint8_t> pixels;
    for (int y = 0; y < kSize; ++y) {
        for (int x = 0; x < kSize; ++x) {
            const Colour c = pixelAt(static_cast<float>(x) + 0.5F, static_cast<float>(y) + 0.5F);
            for (const float channel : {c.blue, c.green, c.red, c.alpha})
                pixels.push_back(toByte(channel));
        }
    }

    ImageInfo image = {};
    image.width = image.height = kSize;
    image.depth = 24;
    image.bpp = 32;
    image.bytesPerLine = kSize * 4;
    image.data = pixels.data();
    const ImageUtilPngOptions withAlpha = {9, false};
    return ImageUtil_WritePNG(&image, argv[1], &withAlpha) ? 0 : 1;
}
