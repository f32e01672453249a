// Allocation that answers with null instead of anything cleverer.

#include <hearth/hearth.h>

#include <cstdlib>

// malloc and calloc may give a pointer for a size of 0.  Here null is the one
// answer for "no block", so a caller has one test to make.

void *UtilSafeMalloc0(size_t size) {
    return size == 0 ? nullptr : std::malloc(size);
}

void *UtilSafeCalloc0(size_t count, size_t size) {
    return count == 0 || size == 0 ? nullptr : std::calloc(count, size);
}
