// The arithmetic of rectangle lists.
//
// Entries are handled as boxes: rectangles with their right and bottom edges in
// place of sizes.  Sums wrap, so that an entry beyond int32_t has its edges in the
// wrong order and is empty.
#pragma once

#include <quillon/raster.h>

#include "core/coordinates.h"

#include <cstdint>
#include <cstring>

namespace quillon {

inline constexpr int kSlots = 16;
inline constexpr int kMaxEntries = 15;       // of a list in normal form
inline constexpr int kMaxBoxes = kSlots + 1; // of a list with all slots in use, and one more

// ---- Boxes ----------------------------------------------------------------

inline Rect boxOf(int32_t x, int32_t y, int32_t width, int32_t height) {
    return {.left = x, .top = y, .right = wrappingAdd(x, width), .bottom = wrappingAdd(y, height)};
}

inline Rect boxOf(const RasterRectListEntry &entry) {
    return boxOf(entry.x, entry.y, entry.width, entry.height);
}

inline RasterRectListEntry entryOf(const Rect &box) {
    return {.x = box.left,
            .y = box.top,
            .width = wrappingSubtract(box.right, box.left),
            .height = wrappingSubtract(box.bottom, box.top)};
}

inline int32_t bottomOf(const RasterRectListEntry &entry) {
    return wrappingAdd(entry.y, entry.height);
}

inline uint32_t areaOf(const RasterRectListEntry &entry) {
    return static_cast<uint32_t>(entry.width) * static_cast<uint32_t>(entry.height);
}

inline uint32_t areaOf(const Rect &box) {
    return areaOf(entryOf(box));
}

inline bool isEmpty(const Rect &box) {
    return box.left >= box.right || box.top >= box.bottom;
}

// Whether the sizes of the box can be represented in an entry: beyond int32_t they
// wrap to negative ones.
inline bool isStorable(const Rect &box) {
    return !isEmpty(box) && entryOf(box).width > 0 && entryOf(box).height > 0;
}

inline bool haveSameColumns(const Rect &a, const Rect &b) {
    return a.left == b.left && a.right == b.right;
}

inline bool covers(const Rect &outer, const Rect &inner) {
    return outer.left <= inner.left && outer.top <= inner.top && outer.right >= inner.right &&
           outer.bottom >= inner.bottom;
}

inline bool shareRows(const Rect &a, const Rect &b) {
    return a.top < b.bottom && b.top < a.bottom;
}

inline bool shareColumns(const Rect &a, const Rect &b) {
    return a.left < b.right && b.left < a.right;
}

inline bool overlap(const Rect &a, const Rect &b) {
    return shareColumns(a, b) && shareRows(a, b);
}

// The order of the normal form.
inline bool isBefore(const Rect &a, const Rect &b) {
    return a.top != b.top ? a.top < b.top : a.left < b.left;
}

inline bool isBefore(const RasterRectListEntry &entry, const Rect &box) {
    return entry.y != box.top ? entry.y < box.top : entry.x < box.left;
}

template <int kCapacity>
struct Boxes {
    int count = 0;
    Rect boxes[kCapacity];

    void append(const Rect &box) { boxes[count++] = box; }
    const Rect *begin() const { return boxes; }
    const Rect *end() const { return boxes + count; }
};

using ListBoxes = Boxes<kMaxBoxes>;

// ---- Lists ----------------------------------------------------------------

inline bool isEmptyList(const RasterRectList &list) {
    return list.entries[0].width < 1 || list.entries[0].height < 1;
}

// Whether the slots from the given one on are all zero.
inline bool isZeroFrom(const RasterRectList &list, int slot) {
    // One vector instruction a slot, and a branch for every four: this is a quarter of
    // the time of a short call.
    using Bits = uint64_t __attribute__((vector_size(16)));
    static_assert(sizeof(Bits) == sizeof(RasterRectListEntry));
    Bits bits = {};
    const auto combine = [&](int i) {
        Bits entry;
        std::memcpy(&entry, &list.entries[i], sizeof(entry));
        bits |= entry;
    };
    int group = kSlots - 4;
#pragma GCC unroll 4
    for (; group >= slot; group -= 4) {
        for (int i = 0; i < 4; ++i)
            combine(group + i);
    }
    for (; slot < group + 4; ++slot)
        combine(slot);
    return (bits[0] | bits[1]) == 0;
}

// Clears entry by entry: compilers clear a record of this size as a whole by a
// string instruction, which is slower.
inline void clear(RasterRectList &list) {
#pragma GCC unroll 16
    for (RasterRectListEntry &entry : list.entries)
        entry = {};
}

} // namespace quillon
