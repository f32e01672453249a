// The walk along a row, written once for all kernels.
//
// A row is counted in units: pixels or bytes.  A kernel is a body: a struct that holds
// what is constant along the row, and whose
//
//     template <class C, class Access>
//     void operator()(C chunk, size_t i, Access access) const
//
// handles the units i to i + C::kUnits - 1, loading and storing through access
// (see access-inl.h).  A body whose rows are aligned also has
//
//     uint8_t *dst;                          // the row's first unit
//     static constexpr size_t kDstBytes;     // of a unit
//
// one whose units go in groups, of which rows and chunks have a whole number, has
//
//     static constexpr size_t kUnitsPerGroup;
//
// and one that prefetches has
//
//     template <class C> void prefetch(C chunk, size_t i, PrefetchDistance) const
//
// A body that is faster where it knows the unit at which whole chunks begin has
//
//     template <class Use> void forChunksFrom(size_t begin, const Use &use) const
//
// which calls use with the body for these chunks, once a row.  A body whose pointers
// can move along the row, which is for instruction sets whose loads and stores move
// them without a further instruction, has
//
//     static constexpr size_t kMovingUnits;  // of chunks, and those of multiples
//     Body movedTo(size_t i) const
//     template <class C> void takeNext(C chunk)      // not const
//
// the last of which handles the units at the pointers and moves these behind them; the
// turns of an unrolled loop are one larger chunk.  A body whose loop is faster where it
// tests for its end, not for what is left, has
//
//     static constexpr bool kTestsEnd
//
// A row is a head up to the first cache line, whole chunks, and a tail.  All three run the
// same body: there is no second algorithm for the ends, and no byte outside is touched.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_SIMD_ROW_LOOP_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_SIMD_ROW_LOOP_INL_H
#undef QUILLON_SIMD_ROW_LOOP_INL_H
#else
#define QUILLON_SIMD_ROW_LOOP_INL_H
#endif

#include "hwy/highway.h"

#include "simd/access-inl.h"
#include "simd/chunks-inl.h"
#include "simd/target-inl.h"

#include <algorithm>
#include <type_traits>
#include <utility>

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
#if QUILLON_HAS_VECTORS

// What becomes of the units behind the last whole chunk.
enum class Tail {
    // One more chunk that ends with the row, over units that are done already: for
    // bodies that store the same bytes when run again.
    kOverlap,
    // The same in the one loop there is, which is half the code, prefetches too, and has
    // less to set up: for large bodies and short rows.
    kOverlapInLoop,
    // Each unit once: a chunk of which only the first lanes are touched, where
    // kHasMaskedTails, else chunks of half the size, a quarter and so on.
    kExact,
    // Each unit once: a chunk with the access FirstUnits, for bodies that leave out
    // the other units themselves.
    kPartial,
    // Left to the caller.
    kNone,
};

struct RowPolicy {
    Tail tail = Tail::kOverlap;
    size_t unroll = 1;
    bool prefetches = false;
    bool hasForChunksFrom = false;
};

// The rest of a row of which less than 2 * kUnits units are left, each smaller
// chunk at most once.
template <size_t kUnits, class Body>
HWY_INLINE void walkHalves(size_t i, size_t end, const Body &body) {
    if ((end - i) & kUnits) {
        body(Chunk<kUnits>(), i, Unaligned());
        i += kUnits;
    }
    if constexpr (kUnits > 1)
        walkHalves<kUnits / 2>(i, end, body);
}

template <class Access, size_t kUnits, class Body, size_t... kTurns>
HWY_INLINE void walkTurns(size_t i, const Body &body, std::index_sequence<kTurns...> /*turns*/) {
    (body(Chunk<kUnits, kTurns>(), i + kTurns * kUnits, Access()), ...);
}

// Whole chunks, fewer than kUnroll.
template <class Access, size_t kUnits, size_t kUnroll, size_t kTurn, class Body>
HWY_INLINE void walkRestOfTurns(size_t i, size_t end, const Body &body) {
    if constexpr (kTurn + 1 < kUnroll) {
        if (i != end) {
            body(Chunk<kUnits, kTurn>(), i, Access());
            walkRestOfTurns<Access, kUnits, kUnroll, kTurn + 1>(i + kUnits, end, body);
        }
    }
}

// The whole chunks from begin to tail.
template <RowPolicy kPolicy, class Access, size_t kUnits, class Body>
HWY_INLINE void walkWholeChunks(size_t begin, size_t tail, const Body &body,
                                [[maybe_unused]] PrefetchDistance distance) {
    constexpr size_t kStep = kPolicy.unroll * kUnits;
    if constexpr (requires { requires kUnits % Body::kMovingUnits == 0; }) {
        Body moving = body.movedTo(begin);
        for (size_t steps = (tail - begin) / kStep; steps != 0; --steps)
            moving.takeNext(Chunk<kStep>());
        for (size_t chunks = (tail - begin) % kStep / kUnits; chunks != 0; --chunks)
            moving.takeNext(Chunk<kUnits>());
        return;
    }
    constexpr bool kTestsEnd = kPolicy.unroll == 1 && requires {
        requires Body::kTestsEnd;
    };
    size_t i = begin;
    for (; kTestsEnd ? i != tail : tail - i >= kStep; i += kStep) {
        if constexpr (kPolicy.prefetches)
            body.prefetch(Chunk<kStep>(), i, distance);
        walkTurns<Access, kUnits>(i, body, std::make_index_sequence<kPolicy.unroll>());
    }
    // One test for half of the chunks that may be left, where these are many.
    constexpr bool kHasHalfStep = kPolicy.unroll >= 8;
    constexpr size_t kRest = kHasHalfStep ? kPolicy.unroll / 2 : kPolicy.unroll;
    if (kHasHalfStep && tail - i >= kRest * kUnits) {
        walkTurns<Access, kUnits>(i, body, std::make_index_sequence<kRest>());
        i += kRest * kUnits;
    }
    walkRestOfTurns<Access, kUnits, kRest, 0>(i, tail, body);
}

// Tail::kOverlapInLoop: the last chunk is moved back to end with the row.
template <RowPolicy kPolicy, size_t kUnits, class Body>
HWY_INLINE void walkOverlapInLoop(Chunk<kUnits> chunk, size_t begin, size_t end, const Body &body,
                                  [[maybe_unused]] PrefetchDistance distance) {
    static_assert(kPolicy.unroll == 1);
    const size_t last = end - kUnits;
    for (size_t i = begin;; i = std::min(i + kUnits, last)) {
        if constexpr (kPolicy.prefetches)
            body.prefetch(chunk, i, distance);
        body(chunk, i, Unaligned());
        if (i == last)
            return;
    }
}

// Whole chunks from begin on, and the tail.  The overlapping ones need end to be
// kUnits or more.
template <RowPolicy kPolicy, class Access, size_t kUnits, class Body>
HWY_INLINE void walkFrom(Chunk<kUnits> chunk, size_t begin, size_t end, const Body &body,
                         PrefetchDistance distance = {}) {
    if constexpr (kPolicy.tail == Tail::kOverlapInLoop)
        return walkOverlapInLoop<kPolicy>(chunk, begin, end, body, distance);

    // Computed ahead, so that it is hoisted out of the loop over the rows.
    const size_t tail = end - (end - begin) % kUnits;
    if constexpr (kPolicy.hasForChunksFrom) {
        body.forChunksFrom(begin, [&](const auto &chunksBody) HWY_ATTR {
            walkWholeChunks<kPolicy, Access, kUnits>(begin, tail, chunksBody, distance);
        });
    } else {
        walkWholeChunks<kPolicy, Access, kUnits>(begin, tail, body, distance);
    }

    if constexpr (kPolicy.tail == Tail::kOverlap) {
        using End = std::conditional_t<std::is_same_v<Access, Unaligned>, Unaligned, RowEnd>;
        if (tail != end)
            body(chunk, end - kUnits, End());
    } else if constexpr (kPolicy.tail == Tail::kExact) {
        if constexpr (kHasMaskedTails) {
            if (tail != end)
                body(chunk, tail, FirstLanes{end - tail});
        } else if constexpr (kUnits > 1) {
            // One test for all of them where there are none.
            if (tail != end)
                walkHalves<kUnits / 2>(tail, end, body);
        }
    } else if constexpr (kPolicy.tail == Tail::kPartial) {
        if (tail != end)
            body(chunk, tail, FirstUnits{end - tail});
    }
}

// A row at any address, of at least kUnits units where tails overlap.
template <RowPolicy kPolicy = RowPolicy{}, size_t kUnits, class Body>
HWY_INLINE void walkRow(Chunk<kUnits> chunk, size_t count, const Body &body,
                        PrefetchDistance distance = {}) {
    walkFrom<kPolicy, Unaligned>(chunk, 0, count, body, distance);
}

// The units of the row at dst that come before the first group which begins a
// cache line, kNoLine where none does.
template <class Body>
HWY_INLINE size_t headOf(const uint8_t *dst) {
    const size_t head = unitsToLine<Body::kDstBytes>(dst);
    if constexpr (requires { Body::kUnitsPerGroup; }) {
        if (head % Body::kUnitsPerGroup != 0)
            return kNoLine;
    }
    return head;
}

// The same, whose whole chunks begin with a cache line and have the given access.
// Rows of which no group begins a line, and short ones, are walked unaligned, and
// without prefetching.
template <class Access, RowPolicy kPolicy = RowPolicy{}, size_t kUnits, class Body>
HWY_INLINE void walkAlignedRow(Chunk<kUnits> chunk, size_t count, const Body &body,
                               PrefetchDistance distance = {}) {
    static_assert(kPolicy.tail == Tail::kOverlap || kPolicy.tail == Tail::kPartial,
                  "the head is one, too");
    const size_t head = headOf<Body>(body.dst);
    if (count < kLineBytes + kUnits || head == kNoLine)
        return walkRow<kPolicy>(chunk, count, body);
    if constexpr (kPolicy.tail == Tail::kPartial) {
        static_assert(kUnits >= kLineBytes, "the head is one chunk");
        if (head != 0)
            body(chunk, 0, FirstUnits{head});
    } else {
        for (size_t i = 0; i < head; i += kUnits)
            body(chunk, i, RowEnd());
    }
    walkFrom<kPolicy, Access>(chunk, head, count, body, distance);
}

// A row of any length, each unit of kUnitBytes bytes once, in rising order: for
// bodies that read what they write.  Without masks chunks are of kVectors vectors.
template <size_t kUnitBytes, size_t kVectors = 1, class Body>
HWY_INLINE void walkRowOnce(size_t count, const Body &body) {
    constexpr size_t kUnits = kVectorBytes / kUnitBytes;
    const Chunk<kUnits> chunk;
    if constexpr (kHasMaskedTails) {
        constexpr RowPolicy kPolicy = {.tail = Tail::kExact};
        if (count < 4)
            return walkHalves<2>(0, count, body);
        // Vectors that lie across two cache lines cost double: rows of some length
        // are aligned.
        const size_t past = reinterpret_cast<uintptr_t>(body.dst) % kVectorBytes;
        if (count < 8 * kUnits || past % kUnitBytes != 0)
            return walkRow<kPolicy>(chunk, count, body);
        const size_t head = past == 0 ? 0 : kUnits - past / kUnitBytes;
        // Not by a masked chunk: the next load would wait for all of that to be stored.
        walkHalves<kUnits / 2>(0, head, body);
        walkFrom<kPolicy, Unaligned>(chunk, head, count, body);
    } else {
        constexpr size_t kTurns = kHasPairedStores ? 8 / kVectors : 2;
        constexpr RowPolicy kPolicy = {.tail = Tail::kExact, .unroll = kTurns};
        walkFrom<kPolicy, Unaligned>(Chunk<kVectors * kUnits>(), 0, count, body);
    }
}

// The first count units of a row, fewer than 2 * kUnits, from the last one on, each smaller
// chunk at most once.
template <size_t kUnits, class Body>
HWY_INLINE void walkHalvesBackward(size_t count, const Body &body) {
    if (count & kUnits)
        body(Chunk<kUnits>(), count &= ~kUnits, Unaligned());
    if constexpr (kUnits > 1)
        walkHalvesBackward<kUnits / 2>(count & (kUnits - 1), body);
}

// The same as walkRowOnce in falling order.
template <size_t kUnitBytes, class Body>
HWY_INLINE void walkRowOnceBackward(size_t count, const Body &body) {
    constexpr size_t kUnits = kVectorBytes / kUnitBytes;
    const Chunk<kUnits> chunk;
    if (kHasMaskedTails && count < kUnits)
        return body(chunk, 0, FirstLanes{count});
    for (; count >= kUnits; count -= kUnits)
        body(chunk, count - kUnits, Unaligned());
    // Not by a masked chunk: its load would wait for the chunk that was stored before.
    if (count != 0)
        walkHalvesBackward<kUnits / 2>(count, body);
}

#endif

} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
