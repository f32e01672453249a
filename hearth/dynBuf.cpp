// The growable byte buffer.
#include <hearth/hearth.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <cstring>

// The layout of the record is part of the interface.
static_assert(sizeof(void *) != 8 || offsetof(DynBuf, allocated) == 16);
static_assert(sizeof(void *) != 8 || sizeof(DynBuf) == 24);

namespace {

constexpr size_t kFirstAllocation = 256;

// Makes room for needed bytes.  Doubling the size, at least, keeps the total cost of
// many small appends linear.
bool reserve(DynBuf *buffer, size_t needed) {
    if (needed <= buffer->allocated)
        return true;
    const size_t twice = buffer->allocated > SIZE_MAX / 2 ? needed : buffer->allocated * 2;
    const size_t allocated = std::max({needed, twice, kFirstAllocation});
    char *const data = static_cast<char *>(std::realloc(buffer->data, allocated));
    if (data == nullptr)
        return false;
    buffer->data = data;
    buffer->allocated = allocated;
    return true;
}

} // namespace

void DynBuf_Init(DynBuf *buffer) {
    *buffer = DynBuf{};
}

bool DynBuf_Append(DynBuf *buffer, const void *source, size_t length) {
    if (length == 0)
        return true; // source may be null here, which memcpy does not allow
    if (length > SIZE_MAX - buffer->size || !reserve(buffer, buffer->size + length))
        return false;
    std::memcpy(buffer->data + buffer->size, source, length);
    buffer->size += length;
    return true;
}

void DynBuf_Destroy(DynBuf *buffer) {
    std::free(buffer->data);
    *buffer = DynBuf{};
}
