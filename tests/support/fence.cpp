#include "support/fence.h"

#include <gtest/gtest.h>
#include <sys/mman.h>
#include <unistd.h>

#include <algorithm>
#include <system_error>

namespace quillon::test {
namespace {

constexpr uint8_t kCanary = 0xC5;

size_t wholePages(size_t size) {
    return (size + pageSize() - 1) / pageSize() * pageSize();
}

} // namespace

size_t pageSize() {
    static const auto size = static_cast<size_t>(sysconf(_SC_PAGESIZE));
    return size;
}

Mapping::Mapping(size_t size) : data_(nullptr), size_(size) {
    void *memory =
        mmap(nullptr, size, PROT_NONE, MAP_PRIVATE | MAP_ANONYMOUS | MAP_NORESERVE, -1, 0);
    if (memory == MAP_FAILED)
        throw std::system_error(errno, std::generic_category(), "mmap");
    data_ = static_cast<uint8_t *>(memory);
}

Mapping::~Mapping() {
    munmap(data_, size_);
}

void Mapping::open(size_t offset, size_t size) {
    if (size != 0 && mprotect(data_ + offset, size, PROT_READ | PROT_WRITE) != 0)
        throw std::system_error(errno, std::generic_category(), "mprotect");
}

FencedBuffer::FencedBuffer(size_t size, Flush flush)
    : mapping_(wholePages(size) + 2 * pageSize()), open_(mapping_.data() + pageSize()),
      openSize_(wholePages(size)),
      data_(flush == Flush::kBefore ? open_ : open_ + openSize_ - size), size_(size) {
    mapping_.open(pageSize(), openSize_);
    std::fill(open_, data_, kCanary);
    std::fill(end(), open_ + openSize_, kCanary);
}

FencedBuffer::~FencedBuffer() {
    const auto isCanary = [](uint8_t byte) { return byte == kCanary; };
    EXPECT_TRUE(std::all_of(open_, data_, isCanary)) << "written ahead of the block";
    EXPECT_TRUE(std::all_of(end(), open_ + openSize_, isCanary)) << "written behind the block";
}

} // namespace quillon::test
