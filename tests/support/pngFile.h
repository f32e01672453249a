// PNG files put together, or taken apart, chunk by chunk.
#pragma once

#include <cstdint>
#include <fcntl.h>
#include <string>
#include <unistd.h>
#include <vector>
#include <zlib.h>

namespace quillon::test {

using namespace std::string_literals;

// Bytes of a file.
using Bytes = std::string;

inline const Bytes kPngSignature = "\x89PNG\r\n\x1A\n";

inline const uint8_t *bytesOf(const Bytes &bytes) {
    return reinterpret_cast<const uint8_t *>(bytes.data());
}

inline Bytes bigEndian(uint32_t value) {
    Bytes bytes;
    for (int shift = 24; shift >= 0; shift -= 8)
        bytes += static_cast<char>(value >> shift);
    return bytes;
}

// With its length and its check sum.
inline Bytes pngChunk(const Bytes &name, const Bytes &content = {}) {
    const Bytes summed = name + content;
    const uLong sum = crc32(0, bytesOf(summed), static_cast<uInt>(summed.size()));
    return bigEndian(static_cast<uint32_t>(content.size())) + summed +
           bigEndian(static_cast<uint32_t>(sum));
}

inline Bytes pngHeader(uint32_t width, uint32_t height, int bits, int colorType, int interlace) {
    const char kinds[] = {static_cast<char>(bits), static_cast<char>(colorType), 0, 0,
                          static_cast<char>(interlace)};
    return pngChunk("IHDR", bigEndian(width) + bigEndian(height) + Bytes(kinds, sizeof kinds));
}

inline Bytes zipped(const Bytes &content, int level = Z_BEST_COMPRESSION) {
    uLongf size = compressBound(content.size());
    Bytes stream(size, 0);
    compress2(reinterpret_cast<Bytef *>(stream.data()), &size, bytesOf(content), content.size(),
              level);
    stream.resize(size);
    return stream;
}

// The chunks of a file that is whole.
inline std::vector<Bytes> chunksOf(const Bytes &file) {
    std::vector<Bytes> chunks;
    for (size_t at = kPngSignature.size(), size = 0; at < file.size(); at += size) {
        size = 12;
        for (size_t i = 0; i < 4; ++i)
            size += size_t{bytesOf(file)[at + i]} << (24 - 8 * i);
        chunks.push_back(file.substr(at, size));
    }
    return chunks;
}

inline Bytes joined(const std::vector<Bytes> &chunks) {
    Bytes file = kPngSignature;
    for (const Bytes &chunk : chunks)
        file += chunk;
    return file;
}

// A colour profile that libpng takes for good but for its end.
inline Bytes colorProfile(uint32_t size) {
    Bytes bytes = bigEndian(size) + Bytes(size - 4, 0);
    const auto put = [&](size_t at, const Bytes &value) { bytes.replace(at, value.size(), value); };
    put(12, "mntrRGB XYZ ");
    put(36, "acsp");
    put(68, bigEndian(0xF6D6) + bigEndian(0x10000) + bigEndian(0xD32D));
    return bytes;
}

// While one lives, standard error goes nowhere: libpng says a lot of these files.
struct Silence {
    Silence() : saved(dup(STDERR_FILENO)) {
        const int nowhere = open("/dev/null", O_WRONLY);
        dup2(nowhere, STDERR_FILENO);
        close(nowhere);
    }
    ~Silence() {
        dup2(saved, STDERR_FILENO);
        close(saved);
    }
    Silence(const Silence &) = delete;
    Silence &operator=(const Silence &) = delete;
    const int saved;
};

} // namespace quillon::test
