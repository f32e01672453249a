/** @file face/region.hpp
 *
 * Regions of pixels.  Part of quillon.hpp, which states the conventions.
 */
#ifndef QUILLON_FACE_REGION_HPP
#define QUILLON_FACE_REGION_HPP

#include <quillon/face/rect.hpp>
#include <quillon/rasterRectList.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <iterator>

namespace quillon {

/** A set of pixels as at most 15 rectangles that do not overlap, ordered by rows.
 *
 * For damage: add what was drawn, then walk the rectangles and clear.
 *
 *     for (quillon::Rect rect : region)
 *         show(rect);
 *
 * Columns and rows lie from -1073741823 to 1073741822; what is outside of that is cut off.
 * Needs no memory but its own, and can be copied.
 */
class Region {
public:
    /** What is within the limits. */
    static constexpr Rect limits() {
        constexpr int32_t kLimit = (1 << 30) - 1;
        return Rect::fromEdges(-kLimit, -kLimit, kLimit, kLimit);
    }

    Region() : list_{} {}
    explicit Region(const Rect &rect) : Region() { add(rect); }

    /** Adds a rectangle.  A region that needs more than 15 of them becomes its bounding
     * box, which also covers pixels that were never added.
     */
    void add(const Rect &rect) {
        const Rect part = rect.intersected(limits());
        Raster_AddRect(&list_, part.left, part.top, part.width(), part.height());
    }
    void add(const Region &other) {
        for (const Rect rect : Region(other))
            add(rect);
    }

    /** Removes a rectangle.
     *
     * @return false, with the region unchanged, where the rest needs more than 15
     *         rectangles: the region still covers the rectangle, or some of it
     */
    [[nodiscard]] bool subtract(const Rect &rect) {
        const Rect part = rect.intersected(limits());
        if (!intersects(part))
            return true;
        Raster_SubRect(&list_, part.left, part.top, part.width(), part.height());
        return !intersects(part);
    }

    void clear() { list_ = {}; }

    bool isEmpty() const { return size() == 0; }
    /** The number of rectangles. */
    size_t size() const {
        size_t count = 0;
        while (count < kEntries && list_.entries[count].width > 0)
            ++count;
        return count;
    }
    /** The number of pixels. */
    uint64_t area() const {
        uint64_t pixels = 0;
        for (const Rect rect : *this)
            pixels += uint64_t{detail::u32(rect.width())} * detail::u32(rect.height());
        return pixels;
    }
    /** The bounding box; all zero when the region is empty. */
    Rect bounds() const {
        Rect box;
        for (const Rect rect : *this)
            box = box.united(rect);
        return box;
    }
    bool contains(Point point) const { return intersects({point, {1, 1}}); }
    bool intersects(const Rect &rect) const {
        return std::any_of(begin(), end(), [&](const Rect &part) { return part.intersects(rect); });
    }

    /** Walks the rectangles. */
    class Iterator {
    public:
        using iterator_category = std::input_iterator_tag;
        using value_type = Rect;
        using difference_type = std::ptrdiff_t;
        using pointer = const Rect *;
        using reference = Rect;

        explicit Iterator(const RasterRectListEntry *entry) : entry_(entry) {}
        Rect operator*() const { return {entry_->x, entry_->y, entry_->width, entry_->height}; }
        Iterator &operator++() {
            ++entry_;
            return *this;
        }
        Iterator operator++(int) { return Iterator(entry_++); }
        friend bool operator==(Iterator a, Iterator b) { return a.entry_ == b.entry_; }
        friend bool operator!=(Iterator a, Iterator b) { return !(a == b); }

    private:
        const RasterRectListEntry *entry_;
    };
    Iterator begin() const { return Iterator(list_.entries); }
    Iterator end() const { return Iterator(list_.entries + size()); }

    /** The list, for the C interface. */
    const RasterRectList &list() const { return list_; }

    /** Tests whether both cover the same pixels. */
    friend bool operator==(const Region &a, const Region &b) {
        Iterator other = b.begin();
        if (a.size() != b.size())
            return false;
        for (const Rect rect : a)
            if (rect != *other++)
                return false;
        return true;
    }
    friend bool operator!=(const Region &a, const Region &b) { return !(a == b); }

private:
    static constexpr size_t kEntries = sizeof(RasterRectList) / sizeof(RasterRectListEntry);

    RasterRectList list_;
};

} // namespace quillon

#endif /* QUILLON_FACE_REGION_HPP */
