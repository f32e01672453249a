#include "memoryLimits.h"

#include <algorithm>
#include <cstring>

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "memoryLimits.cpp"
#include "hwy/foreach_target.h"

#include "hwy/cache_control.h"
#include "hwy/highway.h"

HWY_BEFORE_NAMESPACE();
namespace quillon::bench::HWY_NAMESPACE {
namespace {
namespace hn = hwy::HWY_NAMESPACE;

using Words = hn::ScalableTag<uint32_t>;
using Vector = hn::Vec<Words>;

Vector load(const uint8_t *from) {
    return hn::LoadU(Words(), reinterpret_cast<const uint32_t *>(from));
}

// All bytes, in whole vectors of which the last may overlap; rows shorter than a
// vector byte by byte.
Vector readAll(const uint8_t *from, size_t bytes, Vector seen) {
    const size_t n = hn::Lanes(Words()) * 4;
    if (bytes < n) {
        for (size_t i = 0; i < bytes; ++i)
            seen = hn::Xor(seen, hn::Set(Words(), from[i]));
        return seen;
    }
    for (size_t i = 0; bytes - i > n; i += n)
        seen = hn::Xor(seen, load(from + i));
    return hn::Xor(seen, load(from + bytes - n));
}

template <bool kReads>
void writePlain(uint8_t *to, size_t bytes, Vector v) {
    const Words d;
    const size_t n = hn::Lanes(d) * 4;
    const auto write = [&](size_t i) HWY_ATTR {
        hn::StoreU(kReads ? hn::Xor(v, load(to + i)) : v, d, reinterpret_cast<uint32_t *>(to + i));
    };
    if (bytes < n) {
        std::memset(to, 1, bytes);
        return;
    }
    write(0);
    for (size_t i = n - reinterpret_cast<uintptr_t>(to) % n; i + n <= bytes; i += n)
        write(i);
    write(bytes - n);
}

template <bool kReads>
void writeStreaming(uint8_t *to, size_t bytes, Vector v) {
    const Words d;
    const size_t n = hn::Lanes(d) * 4;
    size_t i = (n - reinterpret_cast<uintptr_t>(to) % n) % n;
    if (i + n > bytes)
        return writePlain<kReads>(to, bytes, v);
    writePlain<kReads>(to, i, v);
    for (; i + n <= bytes; i += n) {
        const auto changed = kReads ? hn::Xor(v, load(to + i)) : v;
        hn::Stream(changed, d, reinterpret_cast<uint32_t *>(to + i));
    }
    writePlain<kReads>(to + i, bytes - i, v);
}

// Row by row and, where rows are long, by turns: some bytes of each source, then
// the destination's share of them.
template <bool kReads, bool kStreams>
void moveRows(const Job &job) {
    constexpr size_t kTurn = 1536;
    const size_t turns = std::max<size_t>(job.dst.rowBytes / kTurn, 1);
    Vector v = hn::Set(Words(), 0x01020304);
    for (size_t y = 0; y < job.dst.height; ++y) {
        const auto share = [turns](size_t bytes, size_t turn) { return bytes * turn / turns; };
        uint8_t *row = job.dst.data + y * job.dst.step;
        for (size_t turn = 0; turn < turns; ++turn) {
            for (size_t s = 0; s < job.sourceCount; ++s) {
                const Buffer &src = job.sources[s];
                const size_t srcRow = y * src.height / job.dst.height;
                if (y != 0 && srcRow == (y - 1) * src.height / job.dst.height)
                    continue;
                const size_t begin = share(src.rowBytes, turn);
                v = readAll(src.data + srcRow * src.step + begin,
                            share(src.rowBytes, turn + 1) - begin, v);
            }
            const size_t begin = share(job.dst.rowBytes, turn);
            const size_t bytes = share(job.dst.rowBytes, turn + 1) - begin;
            if (kStreams)
                writeStreaming<kReads>(row + begin, bytes, v);
            else
                writePlain<kReads>(row + begin, bytes, v);
        }
    }
    if (kStreams)
        hwy::FlushStream();
}

void Move(const Job &job, bool reads, bool streams) {
    if (reads)
        streams ? moveRows<true, true>(job) : moveRows<true, false>(job);
    else
        streams ? moveRows<false, true>(job) : moveRows<false, false>(job);
}

} // namespace
} // namespace quillon::bench::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace quillon::bench {

HWY_EXPORT(Move);

namespace {

// Rows that lie end to end in all buffers are one long row.
Job joined(Job job) {
    const auto packed = [&](const Buffer &buffer) {
        return buffer.step == buffer.rowBytes && buffer.height == job.dst.height;
    };
    const auto join = [](Buffer &buffer) {
        buffer.rowBytes *= buffer.height;
        buffer.height = 1;
    };
    if (packed(job.dst) &&
        std::all_of(job.sources.begin(), job.sources.begin() + job.sourceCount, packed)) {
        std::for_each(job.sources.begin(), job.sources.begin() + job.sourceCount, join);
        join(job.dst);
    }
    return job;
}

Work memsetWork(const Job &job) {
    return [job = joined(job)] {
        for (size_t y = 0; y < job.dst.height; ++y)
            std::memset(job.dst.data + y * job.dst.step, 1, job.dst.rowBytes);
    };
}

Work memcpyWork(const Job &job) {
    return [job = joined(job)] {
        for (size_t y = 0; y < job.dst.height; ++y)
            std::memcpy(job.dst.data + y * job.dst.step, job.src().data + y * job.src().step,
                        job.dst.rowBytes);
    };
}

Contender loop(const char *name, bool reads, bool streams) {
    return {name, Agreement::Approximate, [=](const Job &job) -> Work {
                return [=, job = joined(job)] { HWY_DYNAMIC_DISPATCH(Move)(job, reads, streams); };
            }};
}

} // namespace

std::vector<Contender> limitsOf(const Operation &operation) {
    if (operation.traffic == Traffic::None)
        return {};
    const bool reads = operation.traffic == Traffic::Change;
    std::vector<Contender> limits = {loop("plain loop", reads, false),
                                     loop("streaming loop", reads, true)};
    const Plane &dst = operation.planes[0];
    if (!reads && operation.planes.size() == 1)
        limits.push_back({"memset", Agreement::Approximate, memsetWork});
    if (!reads && operation.planes.size() == 2 && operation.planes[1].height == dst.height &&
        operation.planes[1].rowBytes() == dst.rowBytes())
        limits.push_back({"memcpy", Agreement::Approximate, memcpyWork});
    return limits;
}

} // namespace quillon::bench
#endif
