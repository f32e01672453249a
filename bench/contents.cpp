#include "contents.h"

#include <cstring>

namespace quillon::bench {
namespace {

// Marsaglia's xorshift: filling hundreds of megabytes must not take long.
class Random {
public:
    explicit Random(uint64_t seed) : state(seed * 0x9E3779B97F4A7C15 + 1) {}
    uint64_t next() {
        state ^= state << 13;
        state ^= state >> 7;
        state ^= state << 17;
        return state;
    }
    uint32_t below(uint32_t bound) { return static_cast<uint32_t>((next() >> 32) % bound); }

private:
    uint64_t state;
};

} // namespace

void noise(uint8_t *bytes, size_t count) {
    Random random(1);
    for (size_t i = 0; i < count; i += 8) {
        const uint64_t eight = random.next();
        std::memcpy(bytes + i, &eight, std::min<size_t>(8, count - i));
    }
}

void interfacePixels(uint8_t *bytes, size_t count) {
    Random random(2);
    const size_t pixels = count / 4;
    for (size_t i = 0; i < pixels;) {
        const uint32_t kind = random.below(8);
        const size_t run = kind == 0 ? 1 + random.below(4) : 20 + random.below(200);
        const uint32_t alpha = kind == 0 ? 1 + random.below(254) : kind < 5 ? 0 : 255;
        for (size_t end = std::min(pixels, i + run); i < end; ++i) {
            uint8_t *pixel = bytes + 4 * i;
            for (size_t channel = 0; channel < 3; ++channel)
                pixel[channel] = static_cast<uint8_t>(random.below(256) * alpha / 255);
            pixel[3] = static_cast<uint8_t>(alpha);
        }
    }
}

void textBits(uint8_t *bytes, size_t count) {
    // Strokes of one pixel in letters of eight, every fourth byte a space.
    constexpr uint8_t kStrokes[] = {0x00, 0x3C, 0x42, 0x40, 0x7E, 0x42, 0x08, 0x18};
    Random random(3);
    for (size_t i = 0; i < count; ++i)
        bytes[i] = i % 4 == 3 ? 0 : kStrokes[random.below(8)];
}

void sparseBits(uint8_t *bytes, size_t count) {
    Random random(4);
    for (size_t i = 0; i < count; ++i)
        bytes[i] = static_cast<uint8_t>(random.below(8) == 0 ? 1U << random.below(8) : 0);
}

const std::vector<uint32_t> &palette() {
    static const std::vector<uint32_t> colours = [] {
        Random random(5);
        std::vector<uint32_t> made(256);
        for (uint32_t &colour : made)
            colour = random.below(0x1000000);
        return made;
    }();
    return colours;
}

} // namespace quillon::bench
