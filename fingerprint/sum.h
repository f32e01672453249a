// The sum that results are added to.
#pragma once

#include <cstddef>

namespace quillon::fingerprint {

void add(const void *bytes, size_t size);

template <class T>
void add(const T &record) { // without padding
    add(&record, sizeof record);
}

} // namespace quillon::fingerprint
