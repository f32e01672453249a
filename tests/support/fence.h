// Memory whose edges bite: a byte touched outside it ends the test at once,
// whether it was read or written.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>

namespace quillon::test {

size_t pageSize();
size_t wholePages(size_t size); // rounded up to them

// Inaccessible address space, of which parts can be opened.  Takes no memory
// until it is touched, so it may be far larger than the machine.
class Mapping {
public:
    explicit Mapping(size_t size);
    ~Mapping();
    Mapping(const Mapping &) = delete;
    Mapping &operator=(const Mapping &) = delete;

    uint8_t *data() const { return data_; }
    size_t size() const { return size_; }
    void open(size_t offset, size_t size); // in whole pages

private:
    uint8_t *data_;
    size_t size_;
};

// A block of any size with one edge flush against an inaccessible page.  The
// bytes between the other edge and its page's end are canaries; a size of whole
// pages leaves none, and both edges bite.
class FencedBuffer {
public:
    enum class Flush { kBehind, kBefore }; // where the page lies that the block touches

    explicit FencedBuffer(size_t size, Flush flush = Flush::kBehind);
    ~FencedBuffer(); // looks whether the canaries kept their value
    FencedBuffer(const FencedBuffer &) = delete;
    FencedBuffer &operator=(const FencedBuffer &) = delete;

    uint8_t *data() const { return data_; }
    uint8_t *end() const { return data_ + size_; }
    size_t size() const { return size_; }

private:
    std::unique_ptr<Mapping> mapping_; // from those that are free
    uint8_t *open_;                    // the accessible pages
    size_t openSize_;
    uint8_t *data_;
    size_t size_;
};

} // namespace quillon::test
