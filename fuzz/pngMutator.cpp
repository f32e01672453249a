// Mutations of PNG files that keep them files: chunks with right lengths and check sums,
// of which one is changed, dropped, doubled or moved, or the compressed contents of one.
// The input begins with kControlBytes bytes that are no part of the file.

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <iterator>
#include <random>
#include <string>
#include <vector>
#include <zlib.h>

extern "C" size_t LLVMFuzzerMutate(uint8_t *data, size_t size, size_t maxSize);

namespace {

constexpr size_t kControlBytes = 2, kSignatureBytes = 8;
constexpr size_t kMostGrowth = 64, kMostInflated = 1 << 16;
constexpr const char *kNames[] = {"IHDR", "PLTE", "IDAT", "IEND", "tRNS", "gAMA", "cHRM", "sRGB",
                                  "iCCP", "tEXt", "zTXt", "iTXt", "bKGD", "pHYs", "sBIT", "sPLT",
                                  "hIST", "tIME", "oFFs", "pCAL", "sCAL", "eXIf", "abCd"};

using Random = std::minstd_rand;

struct Chunk {
    std::string name, content;
};

uint32_t bigEndian(const uint8_t *bytes) {
    return uint32_t{bytes[0]} << 24 | uint32_t{bytes[1]} << 16 | uint32_t{bytes[2]} << 8 | bytes[3];
}

std::string bytesOf(uint32_t value) {
    const char bytes[] = {static_cast<char>(value >> 24), static_cast<char>(value >> 16),
                          static_cast<char>(value >> 8), static_cast<char>(value)};
    return {bytes, sizeof bytes};
}

// As far as they are whole.
std::vector<Chunk> split(const uint8_t *data, size_t size) {
    std::vector<Chunk> chunks;
    for (size_t at = kControlBytes + kSignatureBytes; at + 12 <= size;) {
        const size_t length = std::min<size_t>(bigEndian(data + at), size - at - 12);
        const auto *const text = reinterpret_cast<const char *>(data + at);
        chunks.push_back({{text + 4, 4}, {text + 8, length}});
        at += length + 12;
    }
    return chunks;
}

std::string join(const std::vector<Chunk> &chunks) {
    std::string file = "\x89PNG\r\n\x1A\n";
    for (const Chunk &chunk : chunks) {
        const std::string summed = chunk.name + chunk.content;
        const uLong sum = crc32(0, reinterpret_cast<const Bytef *>(summed.data()),
                                static_cast<uInt>(summed.size()));
        file += bytesOf(static_cast<uint32_t>(chunk.content.size())) + summed +
                bytesOf(static_cast<uint32_t>(sum));
    }
    return file;
}

void mutate(std::string &bytes) {
    const size_t size = bytes.size();
    bytes.resize(size + kMostGrowth);
    bytes.resize(LLVMFuzzerMutate(reinterpret_cast<uint8_t *>(bytes.data()), size, bytes.size()));
}

// Changes what the chunk's contents from start on inflate to.
void mutateInflated(std::string &content, size_t start) {
    std::string inflated(kMostInflated, 0);
    uLongf size = inflated.size();
    if (start > content.size() ||
        uncompress(reinterpret_cast<Bytef *>(inflated.data()), &size,
                   reinterpret_cast<const Bytef *>(content.data()) + start,
                   content.size() - start) != Z_OK)
        return mutate(content);
    inflated.resize(size);
    mutate(inflated);
    std::string stream(compressBound(inflated.size()), 0);
    size = stream.size();
    compress2(reinterpret_cast<Bytef *>(stream.data()), &size,
              reinterpret_cast<const Bytef *>(inflated.data()), inflated.size(), 1);
    content.replace(start, std::string::npos, stream, 0, size);
}

void change(std::vector<Chunk> &chunks, Random &random) {
    const auto below = [&](size_t count) { return random() % count; };
    const size_t at = below(chunks.size());
    Chunk &chunk = chunks[at];
    switch (below(8)) {
    case 0:
        chunks.erase(chunks.begin() + static_cast<ptrdiff_t>(at));
        return;
    case 1:
        chunks.insert(chunks.begin() + static_cast<ptrdiff_t>(below(chunks.size() + 1)),
                      Chunk(chunk));
        return;
    case 2:
        std::swap(chunk, chunks[below(chunks.size())]);
        return;
    case 3:
        chunk.name = kNames[below(std::size(kNames))];
        return;
    case 4: { // cut in two
        const size_t part = below(chunk.content.size() + 1);
        const Chunk second = {chunk.name, chunk.content.substr(part)};
        chunk.content.resize(part);
        chunks.insert(chunks.begin() + static_cast<ptrdiff_t>(at) + 1, second);
        return;
    }
    case 5:
    case 6: {
        const size_t end = chunk.content.find('\0'); // of a keyword
        return mutateInflated(chunk.content, chunk.name == "IDAT" ? 0 : end + 2);
    }
    default:
        return mutate(chunk.content);
    }
}

} // namespace

extern "C" size_t LLVMFuzzerCustomMutator(uint8_t *data, size_t size, size_t maxSize,
                                          unsigned int seed) {
    Random random(seed + 1);
    std::vector<Chunk> chunks = split(data, size);
    if (chunks.empty() || random() % 8 == 0)
        return LLVMFuzzerMutate(data, size, maxSize);
    if (random() % 8 == 0)
        LLVMFuzzerMutate(data, kControlBytes, kControlBytes);
    else
        change(chunks, random);
    const std::string file = join(chunks);
    const size_t fileSize = std::min(file.size(), maxSize - kControlBytes);
    std::memcpy(data + kControlBytes, file.data(), fileSize);
    return kControlBytes + fileSize;
}
