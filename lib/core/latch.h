// Something that happens once in the life of the process.
#pragma once

#include <atomic>
#include <cstdint>

namespace quillon {

class Latch {
public:
    // True for the first caller of all threads.
    bool firstTime() { return closed_.exchange(1, std::memory_order_relaxed) == 0; }

private:
    std::atomic<uint8_t> closed_{0};
};
static_assert(sizeof(Latch) == 1);

} // namespace quillon
