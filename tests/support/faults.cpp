#include "support/faults.h"

#include <hearth/hearth.h>

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <dlfcn.h>
#include <malloc.h>
#if __has_include(<valgrind/memcheck.h>)
#include <valgrind/memcheck.h>
#else
#define VALGRIND_MAKE_MEM_UNDEFINED(address, size) ((void)0)
#define VALGRIND_MAKE_MEM_DEFINED(address, size) ((void)(address), (void)(size))
#endif

namespace quillon::test {
namespace {

MemoryFault *current = nullptr;

bool requestFails(bool ofHearth = true) {
    if (current == nullptr || current->happened || (current->isOfHearth && !ofHearth))
        return false;
    current->happened = current->requestsLeft-- == 0;
    return current->happened;
}

// The function that this program's own one hides.
template <class Function>
Function *hidden(Function * /*own*/, const char *name) {
    return reinterpret_cast<Function *>(dlsym(RTLD_NEXT, name));
}

} // namespace

MemoryFault::MemoryFault(uint64_t n, bool ofHearth) : requestsLeft(n), isOfHearth(ofHearth) {
    current = this;
}

MemoryFault::~MemoryFault() {
    current = nullptr;
}

void acceptStale(const void *bytes, size_t size) {
    VALGRIND_MAKE_MEM_DEFINED(bytes, size);
}

} // namespace quillon::test

using namespace quillon::test;

extern "C" {

// Under a sanitizer: null for what cannot be had, as everywhere else.
const char *__asan_default_options() {
    return "allocator_may_return_null=1";
}

#if defined(__GLIBC__) && !defined(QUILLON_SANITIZED)

void *__libc_malloc(size_t size);
void *__libc_calloc(size_t count, size_t size);
void *__libc_realloc(void *block, size_t size);
void *__libc_memalign(size_t alignment, size_t size);
void __libc_free(void *block);

static void *noted(void *block, int64_t count = 1) {
    if (current == nullptr || block == nullptr)
        return block;
    current->blocksHeld += count;
    current->bytesHeld += count * static_cast<int64_t>(malloc_usable_size(block));
    current->mostBytes = std::max(current->mostBytes, current->bytesHeld);
    return block;
}

void *malloc(size_t size) noexcept {
    return requestFails(false) ? nullptr : noted(__libc_malloc(size));
}

void *calloc(size_t count, size_t size) noexcept {
    return requestFails(false) ? nullptr : noted(__libc_calloc(count, size));
}

void *realloc(void *block, size_t size) noexcept {
    if (block == nullptr)
        return malloc(size);
    if (requestFails(false))
        return nullptr;
    noted(block, -1);
    void *const resized = __libc_realloc(block, size);
    noted(resized == nullptr ? block : resized);
    return resized;
}

void *aligned_alloc(size_t alignment, size_t size) noexcept {
    return requestFails(false) ? nullptr : noted(__libc_memalign(alignment, size));
}

void free(void *block) noexcept {
    __libc_free(noted(block, -1));
}

#endif
} // extern "C"

void *UtilSafeMalloc0(size_t size) {
    static auto *const next = hidden(UtilSafeMalloc0, "UtilSafeMalloc0");
    void *const block = requestFails() || size > mostBytesPerBlock ? nullptr : next(size);
    if (block != nullptr) {
        // Not all of a block that no page is behind yet.
        std::memset(block, kStale, size < 1u << 24 ? size : 0);
        VALGRIND_MAKE_MEM_UNDEFINED(block, size);
    }
    return block;
}

void *UtilSafeCalloc0(size_t count, size_t size) {
    static auto *const next = hidden(UtilSafeCalloc0, "UtilSafeCalloc0");
    return requestFails() ? nullptr : next(count, size);
}

bool DynBuf_Append(DynBuf *buffer, const void *source, size_t length) {
    static auto *const next = hidden(DynBuf_Append, "DynBuf_Append");
    return !requestFails() && next(buffer, source, length);
}
