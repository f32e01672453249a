// Allocation.  A size of 0 gives null, where malloc and calloc may give a pointer.
#include <hearth/hearth.h>

#include <cstdlib>

void *UtilSafeMalloc0(size_t size) {
    return size == 0 ? nullptr : std::malloc(size);
}

void *UtilSafeCalloc0(size_t count, size_t size) {
    return count == 0 || size == 0 ? nullptr : std::calloc(count, size);
}
