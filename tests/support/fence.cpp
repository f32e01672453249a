#include "support/fence.h"

#include "support/judge.h"

#include <sys/mman.h>
#include <unistd.h>

#include <algorithm>
#include <map>
#include <system_error>
#include <vector>

namespace quillon::test {
namespace {

constexpr uint8_t kCanary = 0xC5;

// By their accessible bytes: to map memory takes longer than most calls do.
constexpr size_t kMostKept = 1 << 20;
thread_local std::map<size_t, std::vector<std::unique_ptr<Mapping>>> freeMappings;

std::unique_ptr<Mapping> takeMapping(size_t openSize) {
    auto &free = freeMappings[openSize];
    if (free.empty()) {
        free.push_back(std::make_unique<Mapping>(openSize + 2 * pageSize()));
        free.back()->open(pageSize(), openSize);
    }
    std::unique_ptr<Mapping> mapping = std::move(free.back());
    free.pop_back();
    return mapping;
}

void expectCanaries(const uint8_t *first, const uint8_t *end, const char *description) {
    const bool areWhole = std::all_of(first, end, [](uint8_t byte) { return byte == kCanary; });
    compare(areWhole, true, description);
}

} // namespace

size_t pageSize() {
    static const auto size = static_cast<size_t>(sysconf(_SC_PAGESIZE));
    return size;
}

size_t wholePages(size_t size) {
    return (size + pageSize() - 1) / pageSize() * pageSize();
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
    : mapping_(takeMapping(wholePages(size))), open_(mapping_->data() + pageSize()),
      openSize_(wholePages(size)),
      data_(flush == Flush::kBefore ? open_ : open_ + openSize_ - size), size_(size) {
    std::fill(open_, data_, kCanary);
    std::fill(end(), open_ + openSize_, kCanary);
}

FencedBuffer::~FencedBuffer() {
    expectCanaries(open_, data_, "written ahead of the block");
    expectCanaries(end(), open_ + openSize_, "written behind the block");
    if (openSize_ <= kMostKept)
        freeMappings[openSize_].push_back(std::move(mapping_));
}

} // namespace quillon::test
