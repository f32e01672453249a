// Draws lake.png: a lake among mountains, made to judge scaling by.  It has what
// photographs have and what shows a scaler's faults: even gradients (banding),
// fine texture (aliasing), thin lines and sharp edges against light (ringing).
//
//     lake lake.png        (some minutes)
//
// Rays go from the eye through the picture, against a landscape of noise, and are
// thrown back once by the water.  Lengths are metres: x to the right, y up, z away.
#include <quillon/imageUtil.h>
#include <quillon/version.h>

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <string_view>
#include <vector>

namespace {

constexpr char kHelp[] =
    "usage: lake FILE.png\n"
    "\n"
    "Draws lake.png, a landscape to judge scaling by.  It takes some minutes.\n"
    "\n"
    "  --help, --version   show this text; show the version\n";

constexpr int kWidth = 1280;
constexpr int kHeight = 853;
constexpr int kSamples = 2; // per pixel, across and down
constexpr float kFar = 3000;

struct Vec {
    float x, y, z;
};
Vec operator+(Vec a, Vec b) {
    return {a.x + b.x, a.y + b.y, a.z + b.z};
}
Vec operator*(Vec a, Vec b) {
    return {a.x * b.x, a.y * b.y, a.z * b.z};
}
Vec operator*(Vec a, float s) {
    return {a.x * s, a.y * s, a.z * s};
}
float dot(Vec a, Vec b) {
    return a.x * b.x + a.y * b.y + a.z * b.z;
}
Vec normalized(Vec a) {
    return a * (1 / std::sqrt(dot(a, a)));
}
Vec mix(Vec a, Vec b, float s) {
    return a * (1 - s) + b * s;
}

const Vec kEye = {0, 2.6F, 0};
const Vec kSun = normalized({-0.70F, 0.40F, -0.28F});
const Vec kSunColour = {1.35F, 1.08F, 0.78F};

// ---- Noise ----

float smoothstep(float low, float high, float value) {
    const float s = std::clamp((value - low) / (high - low), 0.0F, 1.0F);
    return s * s * (3 - 2 * s);
}

float hash(int x, int y) {
    uint32_t h = static_cast<uint32_t>(x) * 0x9E3779B1U ^ static_cast<uint32_t>(y) * 0x85EBCA77U;
    h = (h ^ (h >> 15)) * 0x2C1B3C6DU;
    h = (h ^ (h >> 12)) * 0x297A2D39U;
    return static_cast<float>((h ^ (h >> 15)) >> 8) / 16777216.0F;
}

// From 0 to 1, smooth between the points of a grid of 1.
float noise(float x, float y) {
    const float left = std::floor(x), top = std::floor(y);
    const int i = static_cast<int>(left), j = static_cast<int>(top);
    const auto fade = [](float s) { return s * s * s * (s * (s * 6 - 15) + 10); };
    const float u = fade(x - left), v = fade(y - top);
    return std::lerp(std::lerp(hash(i, j), hash(i + 1, j), u),
                     std::lerp(hash(i, j + 1), hash(i + 1, j + 1), u), v);
}

// Noise of falling size, turned at each step so that no grid shows; about 0 to 1.
float fractal(float x, float y, int octaves) {
    float sum = 0, size = 0.5F;
    for (; octaves > 0; --octaves, size /= 2) {
        sum += size * noise(x, y);
        const float turned = 1.6F * x + 1.2F * y;
        y = 1.6F * y - 1.2F * x + 7.3F;
        x = turned + 3.1F;
    }
    return sum;
}

// The same with its slopes folded into ridges.
float ridges(float x, float y, int octaves) {
    float sum = 0, size = 0.5F, weight = 1;
    for (; octaves > 0; --octaves, size *= 0.47F) {
        float ridge = 1 - std::abs(2 * noise(x, y) - 1);
        ridge *= ridge * weight;
        weight = std::clamp(ridge * 1.6F, 0.0F, 1.0F);
        sum += size * ridge;
        const float turned = 1.6F * x + 1.2F * y;
        y = 1.6F * y - 1.2F * x + 5.7F;
        x = turned + 1.9F;
    }
    return sum;
}

// ---- Land ----

constexpr float kTop = 400; // no land is higher

float landHeight(float x, float z, int octaves) {
    const float shore = 240 + 60 * noise(x / 70, 3) - 0.25F * std::abs(x);
    const float inland = z - shore;
    if (inland < -40)
        return -5;
    const float valley = smoothstep(20, 420, std::abs(x - 60) + 0.12F * inland);
    const float rise = smoothstep(0, 900, inland);
    const float hills = 26 * smoothstep(-30, 160, inland) * fractal(x / 60, z / 60, octaves);
    return -5 + 0.02F * inland + hills +
           rise * (0.28F + 0.72F * valley) * 400 * ridges(x / 420 + 4.2F, z / 420 + 0.4F, octaves);
}

// How far along the ray the land is met, or kFar.
float meetLand(Vec from, Vec direction, float limit, int octaves) {
    float t = 60, step = 0;
    while (t < limit) {
        const Vec p = from + direction * t;
        if (p.y > kTop && direction.y > 0)
            return kFar;
        const float above = p.y - landHeight(p.x, p.z, octaves);
        if (above < 0.0003F * t) {
            return above < 0 ? t - 0.5F * step : t;
        }
        step = 0.22F * above + 0.0004F * t;
        t += step;
    }
    return kFar;
}

// ---- Sky ----

Vec sky(Vec direction) {
    const float up = std::max(direction.y, 0.0F);
    const float toSun = std::max(dot(direction, kSun), 0.0F);
    Vec colour = mix({0.70F, 0.76F, 0.82F}, {0.07F, 0.22F, 0.55F}, std::pow(up, 0.6F) * 1.1F);
    colour = colour + Vec{0.55F, 0.36F, 0.16F} * std::pow(toSun, 6.0F);
    if (up > 0.02F) {
        // A layer of clouds at a fixed height, thinning towards the horizon.
        const float x = direction.x / up, z = direction.z / up;
        const float thick = fractal(x * 0.55F + 2.6F, z * 0.55F + 9.1F, 8);
        const float lit = fractal(x * 0.55F + 2.45F, z * 0.55F + 9.2F, 5);
        const float cover = smoothstep(0.40F, 0.62F, thick) * smoothstep(0.02F, 0.16F, up);
        const float shade = std::clamp(0.5F + 3.2F * (thick - lit), 0.0F, 1.0F);
        const Vec cloud = mix({0.66F, 0.68F, 0.74F}, {1.05F, 1.0F, 0.94F}, shade);
        colour = mix(colour, cloud + kSunColour * (0.3F * std::pow(toSun, 8.0F)), cover * 0.9F);
    }
    return colour;
}

Vec throughAir(Vec colour, Vec direction, float distance) {
    const float toSun = std::max(dot(direction, kSun), 0.0F);
    const Vec air = mix({0.44F, 0.57F, 0.76F}, {0.86F, 0.80F, 0.70F}, toSun * toSun * toSun);
    return mix(colour, air, 1 - std::exp(-distance / 3600));
}

Vec lightOnLand(Vec p, float distance) {
    const float e = 0.002F * distance;
    const float h = landHeight(p.x, p.z, 10);
    const Vec normal =
        normalized({h - landHeight(p.x + e, p.z, 10), e, h - landHeight(p.x, p.z + e, 10)});

    const float grain = fractal(p.x / 3, p.z / 3 + p.y / 2, 5);
    const float wide = fractal(p.x / 40, p.z / 40, 4);
    Vec ground = mix({0.22F, 0.20F, 0.18F}, {0.40F, 0.36F, 0.32F}, grain);
    const float meadow = smoothstep(0.62F, 0.80F, normal.y + 0.15F * (wide - 0.5F));
    ground = mix(ground, mix({0.16F, 0.24F, 0.06F}, {0.36F, 0.38F, 0.12F}, grain),
                 meadow * smoothstep(230, 110, p.y + 80 * wide));
    // Woods: dark crowns, in patches, up to the tree line.
    const float crowns = noise(p.x / 2.2F, p.z / 2.2F + p.y);
    const float woods = smoothstep(0.40F, 0.52F, fractal(p.x / 70 + 8, p.z / 70, 5)) *
                        smoothstep(130, 80, p.y + 50 * grain) * smoothstep(2, 5, p.y);
    ground = mix(ground, mix({0.03F, 0.06F, 0.03F}, {0.13F, 0.20F, 0.07F}, crowns), woods);
    const float snow = smoothstep(0.50F, 0.72F, normal.y) *
                       smoothstep(120, 200, p.y + 90 * (wide - 0.5F) + 40 * (grain - 0.5F));
    ground = mix(ground, {0.90F, 0.93F, 0.98F}, snow);
    ground = mix(ground, {0.46F, 0.42F, 0.34F}, smoothstep(1.6F, 0.4F, p.y)); // the beach

    const bool shaded = meetLand(p + Vec{0, 0.01F * distance, 0}, kSun, 900, 5) < kFar;
    const float sun = shaded ? 0 : std::max(dot(normal, kSun), 0.0F);
    const Vec fromSky = Vec{0.24F, 0.32F, 0.47F} * (0.5F + 0.5F * normal.y);
    return ground * (kSunColour * (1.7F * sun) + fromSky);
}

// ---- Things that stand upright, as flat figures at one distance ----

struct Figure {
    bool hit;
    Vec colour;
};

// A row of firs: the highest of the crowns that reach over x.
Figure firs(float x, float y, int row, float ground, float tallest) {
    const float apart = 2.1F;
    const int nearest = static_cast<int>(std::floor(x / apart));
    for (int i = nearest - 3; i <= nearest + 3; ++i) {
        const float random = hash(i, row);
        const float height = tallest * (0.45F + 0.55F * random);
        const float fromTop = ground + height - y;
        if (random < 0.12F || fromTop < 0)
            continue;
        const float fromStem = std::abs(x - (static_cast<float>(i) + hash(i, row + 50)) * apart);
        // Branches hang in tiers, each wider than the one above.
        const float tier = fromTop * 1.5F - std::floor(fromTop * 1.5F);
        const float ragged = noise(x * 14, y * 14 + random * 90);
        const float reach = 0.05F + 0.17F * fromTop * (0.55F + 0.45F * tier) * (0.5F + ragged);
        if (fromStem > std::min(reach, 0.26F * tallest))
            continue;
        const float lit = (0.35F + 0.65F * ragged) * (0.6F + 0.6F * random) *
                          (x < (static_cast<float>(i) + 0.5F) * apart ? 1.15F : 0.75F);
        return {true, mix({0.018F, 0.035F, 0.022F}, {0.15F, 0.19F, 0.08F}, 0.7F * lit)};
    }
    return {false, {}};
}

// A sailing boat whose mast stands at x = 0.
Figure boat(float x, float y) {
    if (y > -0.2F && y < 0.75F) {
        const float stern = -1.9F - 0.15F * y, bow = 1.9F + 0.75F * y;
        if (x > stern && x < bow) {
            return {true, y > 0.58F   ? Vec{0.80F, 0.78F, 0.72F}
                          : y > 0.50F ? Vec{0.10F, 0.10F, 0.12F}
                                      : Vec{0.55F, 0.07F, 0.05F} * (0.75F + 0.25F * x / 2)};
        }
    }
    if (std::abs(x) < 0.05F && y > 0 && y < 7.4F)
        return {true, {0.30F, 0.22F, 0.14F}};
    const float up = (y - 1.1F) / 6.1F; // along the mainsail
    if (up > 0 && up < 1 && x < -0.08F && x > -2.3F * (1 - up) * (1 + 0.25F * up)) {
        const bool seam = std::fmod(y, 1.0F) < 0.035F;
        return {true, Vec{1.0F, 0.97F, 0.90F} * (seam ? 0.78F : 0.96F + 0.03F * x)};
    }
    const float jib = (y - 0.9F) / 5.3F;
    if (jib > 0 && jib < 1 && x > 0.10F && x < 2.2F * (1 - jib))
        return {true, Vec{0.96F, 0.93F, 0.86F} * (0.80F + 0.08F * x)};
    const float stay = std::abs(x - 2.45F * (1 - (y - 0.7F) / 6.6F)); // the thin rope ahead
    if (y > 0.7F && y < 7.3F && stay < 0.02F)
        return {true, {0.2F, 0.2F, 0.2F}};
    return {false, {}};
}

// The first figure that a ray meets ahead of the given distance.
Figure meetFigure(Vec from, Vec direction, float limit) {
    const auto at = [&](float z) {
        const float t = (z - from.z) / direction.z;
        return t > 0 && t < limit ? from + direction * t : Vec{0, -1e9F, 0};
    };
    if (const Vec p = at(58); p.y > -1) {
        if (const Figure figure = boat((p.x - 7.5F) * 0.9F, p.y * 0.9F); figure.hit)
            return figure;
    }
    // Two tongues of land with firs on them, nearer on the right.
    for (int row = 0; row < 7; ++row) {
        const float back = static_cast<float>(row) * 5;
        const auto tongue = [&](float z, float edge, float side, float tallest) -> Figure {
            const Vec p = at(z + back);
            const float inside = side * (p.x - edge) - 0.9F * back + 6 * noise(p.x / 9, 40);
            const float ground = 1.5F * smoothstep(0, 16, inside) + 0.05F * inside +
                                 0.5F * noise(p.x / 2, z) - 0.45F;
            if (inside < 0 || p.y < -1)
                return {false, {}};
            if (p.y < ground) {
                const float grain = fractal(p.x * 2, p.y * 6, 4);
                return {true, p.y < 0.45F ? Vec{0.30F, 0.27F, 0.23F} * (0.3F + grain)
                                          : Vec{0.16F, 0.19F, 0.06F} * (0.4F + 1.1F * grain)};
            }
            return inside < 4 ? Figure{false, {}}
                              : firs(p.x, p.y, row + static_cast<int>(z), ground - 0.3F,
                                     tallest * smoothstep(0, 30, inside + 9));
        };
        Figure figure = tongue(96, 33, 1, 15);
        if (!figure.hit)
            figure = tongue(140, -42, -1, 16);
        if (figure.hit)
            return {true, throughAir(figure.colour, direction, 100 + back)};
    }
    return {false, {}};
}

// ---- The picture ----

Vec lookAt(Vec from, Vec direction, float limit, int octaves) {
    if (const Figure figure = meetFigure(from, direction, limit); figure.hit)
        return figure.colour;
    const float t = meetLand(from, direction, std::min(limit, kFar), octaves);
    if (t < kFar)
        return throughAir(lightOnLand(from + direction * t, t), direction, t);
    return limit < kFar ? Vec{-1, 0, 0} : sky(direction);
}

Vec look(Vec direction) {
    const float toWater = direction.y < 0 ? -kEye.y / direction.y : kFar;
    const Vec seen = lookAt(kEye, direction, toWater, 10);
    if (seen.x >= 0)
        return seen;

    // Waves tilt the water; far away they average out.
    const Vec p = kEye + direction * toWater;
    const float calm = 1 / (1 + toWater / 55);
    const float gust = 0.4F + 1.2F * smoothstep(0.35F, 0.65F, fractal(p.x / 50, p.z / 22, 3));
    const auto wave = [&](float x, float z) {
        return fractal(x * 1.1F, z * 2.1F, 5) + 0.35F * fractal(x * 0.22F + 5, z * 0.4F, 2);
    };
    const float e = 0.03F, h = wave(p.x, p.z);
    const float strength = 0.022F * calm * gust / e;
    const Vec normal = normalized(
        {strength * 0.6F * (h - wave(p.x + e, p.z)), 1, strength * (h - wave(p.x, p.z + e))});
    Vec mirrored = direction + normal * (-2 * dot(direction, normal));
    mirrored.y = std::max(mirrored.y, 0.002F);
    mirrored = normalized(mirrored);

    const float shallow = 1 - std::clamp(-dot(direction, normal), 0.0F, 1.0F);
    const float mirror = 0.05F + 0.95F * std::pow(shallow, 4.0F);
    const Vec deep = Vec{0.02F, 0.075F, 0.085F} + Vec{0.03F, 0.04F, 0.03F} * gust;
    const Vec reflection = lookAt(p, mirrored, 1e9F, 7);
    const float glitter = std::pow(std::max(dot(mirrored, kSun), 0.0F), 220.0F);
    return mix(deep, reflection, mirror * 0.94F) + kSunColour * (1.5F * glitter);
}

// Where a sample lies in an array of all of them.
size_t sampleIndex(int i, int j) {
    return static_cast<size_t>(j) * kWidth * kSamples + static_cast<size_t>(i);
}

// Reeds in front, each a bent, tapering blade: where they cover the picture.
std::vector<float> drawReeds() {
    const int width = kWidth * kSamples, height = kHeight * kSamples;
    std::vector<float> shade(sampleIndex(0, height), -1.0F);
    for (int blade = 0; blade < 130; ++blade) {
        const auto random = [&](int n) { return hash(blade, 900 + n); };
        const bool right = random(0) > 0.55F;
        const float spread = random(1) * random(1);
        const float root = right ? 1285 - 330 * spread : 230 * spread - 12;
        const float length = (90 + 260 * random(2)) * (1.1F - 0.7F * spread);
        const float bend = (random(3) - 0.45F) * 0.5F * length;
        for (int j = 0; j < height; ++j) {
            // s goes from the root, 0, to the tip.
            const float y = (static_cast<float>(j) + 0.5F) / kSamples;
            const float s = (kHeight + 6 - y) / length;
            if (s > 1)
                continue;
            const float x = (root + bend * s * s) * kSamples;
            const bool head = blade % 3 == 0 && s > 0.86F && s < 0.97F; // a bulrush
            const float half = kSamples * (head ? 3.2F : 0.35F + 1.9F * (1 - s));
            const int first = std::max(static_cast<int>(x - half), 0);
            const int last = std::min(static_cast<int>(x + half), width - 1);
            for (int i = first; i <= last; ++i) {
                const float across = (x - static_cast<float>(i)) / half;
                shade[sampleIndex(i, j)] =
                    (head ? 1.0F : 0.0F) + 0.45F + 0.45F * std::clamp(across, -1.0F, 1.0F);
            }
        }
    }
    return shade;
}

uint8_t toByte(float light) {
    // A soft shoulder, the display's curve, and some contrast.
    const float toned = std::clamp(1.2F * light / (1 + 0.3F * light), 0.0F, 1.0F);
    const float shown = std::pow(toned, 1 / 2.2F);
    return static_cast<uint8_t>(std::lround(255 * std::lerp(shown, smoothstep(0, 1, shown), 0.5F)));
}

} // namespace

int main(int argc, char **argv) {
    const std::string_view option = argc == 2 ? argv[1] : "";
    if (option == "--help")
        return std::fputs(kHelp, stdout) < 0;
    if (option == "--version")
        return std::puts("lake " QUILLON_VERSION_STRING) < 0;
    if (argc != 2)
        return std::fputs(kHelp, stderr), 2;
    std::vector<uint8_t> pixels;
    pixels.reserve(size_t{kWidth} * kHeight * 3);
    const std::vector<float> reeds = drawReeds();

    for (int y = 0; y < kHeight; ++y) {
        if (y % 50 == 0)
            std::fprintf(stderr, "row %d of %d\n", y, kHeight);
        for (int x = 0; x < kWidth; ++x) {
            Vec sum = {0, 0, 0};
            for (int sample = 0; sample < kSamples * kSamples; ++sample) {
                const int i = x * kSamples + sample % kSamples;
                const int j = y * kSamples + sample / kSamples;
                const float shade = reeds[sampleIndex(i, j)];
                if (shade >= 1) {
                    sum = sum + Vec{0.16F, 0.09F, 0.04F} * shade;
                } else if (shade >= 0) {
                    sum = sum + Vec{0.16F, 0.20F, 0.05F} * shade;
                } else {
                    const float right = (static_cast<float>(i) + 0.5F) / kSamples - kWidth / 2.0F;
                    const float up = 0.53F * kHeight - (static_cast<float>(j) + 0.5F) / kSamples;
                    const Vec light = look(normalized({right / kWidth, up / kWidth, 0.95F}));
                    // One glaring sample must not make a white pixel.
                    sum = sum + Vec{std::min(light.x, 3.0F), std::min(light.y, 3.0F),
                                    std::min(light.z, 3.0F)};
                }
            }
            const Vec colour = sum * (1.0F / (kSamples * kSamples));
            for (const float channel : {colour.z, colour.y, colour.x})
                pixels.push_back(toByte(channel));
        }
    }

    ImageInfo image = {};
    image.width = kWidth;
    image.height = kHeight;
    image.depth = image.bpp = 24;
    image.bytesPerLine = kWidth * 3;
    image.data = pixels.data();
    const ImageUtilPngOptions smallest = {9, true};
    return ImageUtil_WritePNG(&image, argv[1], &smallest) ? 0 : 1;
}
