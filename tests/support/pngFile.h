// PNG files put together, or taken apart, chunk by chunk.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
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

} // namespace quillon::test
