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

// Calls body for the vectors that rows have bytes in: one at the start of a row that
// it holds, otherwise aligned ones.  The arena has room for those at the ends, which
// add no cache line.
template <bool kIsAligned, class D, class Body>
HWY_INLINE void forVectors(D d, Buffer buffer, size_t firstRow, size_t endRow, const Body &body) {
    const size_t n = hn::Lanes(d), stride = static_cast<size_t>(buffer.stride);
    uint8_t *row = buffer.row(firstRow);
    uint8_t *const endOfRows = buffer.row(endRow);
    if (buffer.rowBytes == stride) // contiguous rows
        buffer.rowBytes = static_cast<size_t>(endOfRows - row);
    if (!kIsAligned && buffer.rowBytes <= n) {
        for (; row < endOfRows; row += stride)
            body(row);
        return;
    }
    for (; row < endOfRows; row += std::max(stride, buffer.rowBytes)) {
        const uint8_t *end = row + buffer.rowBytes;
        uint8_t *at = row - reinterpret_cast<uintptr_t>(row) % n;
        for (; at + 3 * n < end; at += 4 * n) {
            body(at);
            body(at + n);
            body(at + 2 * n);
            body(at + 3 * n);
        }
        for (; at < end; at += n)
            body(at);
    }
}

// Fastest of 512, 1024, 2048 and 4096 uncached, on Sapphire Rapids.
constexpr size_t kPrefetchDistance = 1024;

// By bands of some rows: those of each source, then those of the destination.  The ways
// are those of limitsOf.
template <size_t kWay, bool kReadsDst>
void moveBands(const Job &job) {
    constexpr bool kNonTemporal = kWay == 2, kPrefetches = kWay >= 2;
    const hn::CappedTag<uint8_t, kWay == 1 ? 32 : 64> d;
    auto v = hn::Set(d, 1);
    const auto read = [&](const uint8_t *at) HWY_ATTR {
        if (kPrefetches)
            hwy::Prefetch(at + kPrefetchDistance);
        v = hn::Xor(v, hn::LoadU(d, at));
    };
    const size_t rows = job.dst().height, band = std::max<size_t>(1024 / job.dst().rowBytes, 1);
    for (size_t y = 0; y < rows; y += band) {
        const size_t end = std::min(y + band, rows);
        for (size_t s = 1; s < job.count; ++s) {
            const Buffer &src = job.planes[s];
            const bool isEven = src.height == rows;
            forVectors<false>(d, src, isEven ? y : y * src.height / rows,
                              isEven ? end : end * src.height / rows, read);
        }
        forVectors<kNonTemporal>(d, job.dst(), y, end, [&](uint8_t *at) HWY_ATTR {
            if (kReadsDst)
                read(at);
            kNonTemporal ? hn::Stream(v, d, at) : hn::StoreU(v, d, at);
        });
    }
    if (kNonTemporal)
        hwy::FlushStream();
}

void moveKernel(const Job &job, size_t way, bool readsDst) {
    constexpr void (*kMoves[][2])(const Job &) = {{moveBands<0, false>, moveBands<0, true>},
                                                  {moveBands<1, false>, moveBands<1, true>},
                                                  {moveBands<2, false>, moveBands<2, true>},
                                                  {moveBands<3, false>, moveBands<3, true>}};
    kMoves[way][readsDst](job);
}

} // namespace
} // namespace quillon::bench::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace quillon::bench {

HWY_EXPORT(moveKernel);

namespace {

// Calls body(row, bytes), once where the rows of both are contiguous.
template <class Body>
void forRows(const Buffer &dst, const Buffer &src, const Body &body) {
    const size_t bytes = dst.rowBytes * dst.height;
    if (bytes == dst.bytes() && bytes == src.bytes())
        return body(0, bytes);
    for (size_t y = 0; y < dst.height; ++y)
        body(y, dst.rowBytes);
}

} // namespace

std::vector<Contender> limitsOf(const Operation &operation) {
    std::vector<Contender> limits;
    const auto add = [&](const char *name, const auto &call) {
        limits.push_back({name, prepare(call), Kind::Limit});
    };
    if (operation.traffic == Traffic::None)
        return {};
    const bool readsDst = operation.traffic == Traffic::Change;
    constexpr const char *kWays[] = {"64-byte stores", "32-byte stores", "non-temporal stores",
                                     "64-byte stores, prefetched"};
    for (size_t way = 0; way < std::size(kWays); ++way)
        add(kWays[way], [=](const Job &job) {
            HWY_DYNAMIC_DISPATCH(moveKernel)(job, way, readsDst);
        });
    const std::vector<Plane> &planes = operation.planes;
    if (!readsDst && planes.size() == 1)
        add("memset", [](const Buffer &dst) {
            forRows(dst, dst, [&](size_t y, size_t bytes) { std::memset(dst.row(y), 1, bytes); });
        });
    if (!readsDst && planes.size() == 2 && planes[0].bitsPerPixel == planes[1].bitsPerPixel)
        add("memcpy", [](const Buffer &dst, const Buffer &src) {
            forRows(dst, src,
                    [&](size_t y, size_t bytes) { std::memcpy(dst.row(y), src.row(y), bytes); });
        });
    return limits;
}

} // namespace quillon::bench
#endif
