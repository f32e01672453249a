#include "contents.h"

#include <algorithm>
#include <cstring>
#include <random>

namespace quillon::bench {

void noise(uint8_t *bytes, size_t count) {
    std::mt19937_64 random(1);
    for (size_t i = 0; i < count; i += 8) {
        const uint64_t word = random();
        std::memcpy(bytes + i, &word, std::min<size_t>(8, count - i));
    }
}

void interfacePixels(uint8_t *bytes, size_t count) {
    std::mt19937 random(2);
    for (size_t i = 0; i + 4 <= count;) {
        const size_t kind = random() % 8; // soft, 4 times transparent, 3 times opaque
        const size_t run = kind == 0 ? 1 + random() % 4 : 20 + random() % 200;
        const size_t alpha = kind == 0 ? 1 + random() % 254 : kind < 5 ? 0 : 255;
        for (const size_t end = std::min(count - 3, i + 4 * run); i < end; i += 4) {
            for (size_t channel = 0; channel < 3; ++channel)
                bytes[i + channel] = static_cast<uint8_t>(random() % 256 * alpha / 255);
            bytes[i + 3] = static_cast<uint8_t>(alpha);
        }
    }
}

void textBits(uint8_t *bytes, size_t count) {
    // Letters eight pixels wide with strokes of one pixel; every fourth byte is a space.
    constexpr uint8_t kStrokes[] = {0x00, 0x3C, 0x42, 0x40, 0x7E, 0x42, 0x08, 0x18};
    std::mt19937 random(3);
    for (size_t i = 0; i < count; ++i)
        bytes[i] = i % 4 == 3 ? 0 : kStrokes[random() % 8];
}

void sparseBits(uint8_t *bytes, size_t count) {
    std::mt19937 random(4);
    for (size_t i = 0; i < count; ++i)
        bytes[i] = static_cast<uint8_t>(random() % 8 == 0 ? 1 << random() % 8 : 0);
}

const uint32_t *palette() {
    static const std::vector<uint32_t> colors = [] {
        std::mt19937 random(5);
        std::vector<uint32_t> made(256);
        for (uint32_t &color : made)
            color = static_cast<uint32_t>(random() & 0xFFFFFF);
        return made;
    }();
    return colors.data();
}

} // namespace quillon::bench
