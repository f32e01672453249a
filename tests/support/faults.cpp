#include "support/faults.h"

#include "hearth.h"

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <dlfcn.h>

#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
#define HAS_OWN_MALLOC 0
#elif defined(__has_feature)
#if __has_feature(address_sanitizer) || __has_feature(thread_sanitizer)
#define HAS_OWN_MALLOC 0
#endif
#endif
#ifndef HAS_OWN_MALLOC
#define HAS_OWN_MALLOC 1
#endif

namespace quillon::test {
namespace {

MemoryFault *current = nullptr;

bool requestFails(bool ofHearth = true) {
    if (current == nullptr || current->happened || (current->isOfHearth && !ofHearth)) {
        return false;
    }
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

} // namespace quillon::test

using namespace quillon::test;

// Under a sanitizer: null for what cannot be had, as everywhere else.
extern "C" const char *__asan_default_options() {
    return "allocator_may_return_null=1";
}

#if HAS_OWN_MALLOC
extern "C" {

void *__libc_malloc(size_t size);
void *__libc_calloc(size_t count, size_t size);
void *__libc_realloc(void *block, size_t size);
void __libc_free(void *block);

static void *noted(void *block, int64_t count = 1) {
    if (current != nullptr && block != nullptr) {
        current->blocksHeld += count;
    }
    return block;
}

void *malloc(size_t size) noexcept {
    return requestFails(false) ? nullptr : noted(__libc_malloc(size));
}

void *calloc(size_t count, size_t size) noexcept {
    return requestFails(false) ? nullptr : noted(__libc_calloc(count, size));
}

void *realloc(void *block, size_t size) noexcept {
    if (block == nullptr) {
        return malloc(size);
    }
    return requestFails(false) ? nullptr : __libc_realloc(block, size);
}

void free(void *block) noexcept {
    __libc_free(noted(block, -1));
}

} // extern "C"
#endif

void *UtilSafeMalloc0(size_t size) {
    static auto *const next = hidden(UtilSafeMalloc0, "UtilSafeMalloc0");
    void *const block = requestFails() ? nullptr : next(size);
    // Not all of a block that no page is behind yet.
    return block == nullptr ? nullptr : std::memset(block, kStale, size < 1u << 24 ? size : 0);
}

void *UtilSafeCalloc0(size_t count, size_t size) {
    static auto *const next = hidden(UtilSafeCalloc0, "UtilSafeCalloc0");
    return requestFails() ? nullptr : next(count, size);
}

bool DynBuf_Append(DynBuf *buffer, const void *source, size_t length) {
    static auto *const next = hidden(DynBuf_Append, "DynBuf_Append");
    return !requestFails() && next(buffer, source, length);
}

int FileIO_Open(FileIODescriptor *file, const char *name, int access, int action) {
    static auto *const next = hidden(FileIO_Open, "FileIO_Open");
    const int status = next(file, name, access, action);
    filesOpen += status == 0 ? 1 : 0;
    return status;
}

int FileIO_Close(FileIODescriptor *file) {
    static auto *const next = hidden(FileIO_Close, "FileIO_Close");
    filesOpen -= file->fd >= 0 ? 1 : 0;
    return next(file);
}

int64_t FileIO_GetSize(const FileIODescriptor *file) {
    static auto *const next = hidden(FileIO_GetSize, "FileIO_GetSize");
    return fileFault == FileFault::kSizeFails ? -1 : next(file);
}

int FileIO_Read(FileIODescriptor *file, void *buffer, size_t count, size_t *actual) {
    static auto *const next = hidden(FileIO_Read, "FileIO_Read");
    if (fileFault == FileFault::kReadFails) {
        return EIO;
    }
    return next(file, buffer, count - (fileFault == FileFault::kReadShort ? 1 : 0), actual);
}

int FileIO_Write(FileIODescriptor *file, const void *source, size_t count, size_t *actual) {
    static auto *const next = hidden(FileIO_Write, "FileIO_Write");
    if (fileFault == FileFault::kWriteFails) {
        return ENOSPC;
    }
    return next(file, source, count - (fileFault == FileFault::kWriteShort ? 1 : 0), actual);
}
