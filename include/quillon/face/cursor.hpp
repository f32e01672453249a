/** @file face/cursor.hpp
 *
 * Mouse cursors.  Part of quillon.hpp, which states the conventions.
 */
#ifndef QUILLON_FACE_CURSOR_HPP
#define QUILLON_FACE_CURSOR_HPP

#include <quillon/face/image.hpp>
#include <quillon/rasterCursor.h>

namespace quillon {

/** A cursor: an image with alpha, or two masks.  It owns its images, and moves. */
class Cursor {
public:
    Cursor(Cursor &&other) noexcept
        : record_(std::exchange(other.record_, RasterCursor{})), first_(std::move(other.first_)),
          second_(std::move(other.second_)) {}
    Cursor &operator=(Cursor &&other) noexcept {
        record_ = std::exchange(other.record_, RasterCursor{});
        first_ = std::move(other.first_);
        second_ = std::move(other.second_);
        return *this;
    }

    /** Makes a cursor with alpha.
     *
     * @param image    of any format; colours premultiplied
     * @param hotSpot  the pixel of the image that is at the position of the pointer
     * @return nothing when there is no memory
     */
    static std::optional<Cursor> withAlpha(const ConstSurface &image, Point hotSpot) {
        return made(RASTER_CURSOR_ALPHA, image.size(), hotSpot,
                    [&](Surface first, Surface /*second*/) {
                        first.copy({0, 0}, image);
                    });
    }

    /** Makes a cursor of masks: a pixel of the screen becomes (pixel & andMask) ^ xorMask, in
     * all 32 bits.
     *
     * @param andMask  of any format; the colours are the bits
     * @param xorMask  likewise; it should have the size of andMask
     * @param hotSpot  the pixel of the masks that is at the position of the pointer
     * @return nothing when there is no memory
     */
    static std::optional<Cursor> withMasks(const ConstSurface &andMask, const ConstSurface &xorMask,
                                           Point hotSpot) {
        return made(RASTER_CURSOR_ANDXOR, andMask.size(), hotSpot,
                    [&](Surface first, Surface second) {
                        first.copy({0, 0}, andMask);
                        second.copy({0, 0}, xorMask);
                    });
    }
    /** The same from bitmaps: a set bit stands for a pixel with all bits 1. */
    static std::optional<Cursor> withMasks(const Bitmap &andMask, const Bitmap &xorMask,
                                           Point hotSpot) {
        return made(RASTER_CURSOR_ANDXOR, andMask.size(), hotSpot,
                    [&](Surface first, Surface second) {
                        first.copyBits({0, 0}, andMask, 0xFFFFFFFF, 0);
                        second.copyBits({0, 0}, xorMask, 0xFFFFFFFF, 0);
                    });
    }

    /** Makes a cursor of another size, see Raster_ScaleCursor.
     *
     * @param scaleX, scaleY  new pixels per old pixel
     * @return nothing when a factor is no number above 0 or too large, or there is no memory
     */
    std::optional<Cursor> scaled(double scaleX, double scaleY) const {
        const std::unique_ptr<RasterCursor, detail::Free> record(
            Raster_ScaleCursor(&record_, scaleX, scaleY));
        if (!record)
            return std::nullopt;
        Cursor cursor;
        cursor.record_.type = record->type;
        cursor.record_.hotspotX = record->hotspotX;
        cursor.record_.hotspotY = record->hotspotY;
        cursor.record_.width = record->width;
        cursor.record_.height = record->height;
        if (record->type == RASTER_CURSOR_ALPHA)
            cursor.own(record->alphaImage, nullptr);
        else
            cursor.own(record->andImage, record->xorImage);
        return cursor;
    }

    Size size() const {
        return {static_cast<int32_t>(record_.width), static_cast<int32_t>(record_.height)};
    }
    Point hotSpot() const {
        return {static_cast<int32_t>(record_.hotspotX), static_cast<int32_t>(record_.hotspotY)};
    }
    /** What the cursor covers when the pointer is at a point. */
    Rect bounds(Point at) const { return {at - hotSpot(), size()}; }
    bool hasAlpha() const { return record_.type == RASTER_CURSOR_ALPHA; }

    /** The record, for the C interface. */
    const RasterCursor &record() const { return record_; }

private:
    friend class Surface;

    Cursor() : record_{} {}

    // draw(first, second) writes the images, which begin as all zero.
    template <class Draw>
    static std::optional<Cursor> made(uint32_t type, Size size, Point hotSpot, const Draw &draw) {
        const bool hasMasks = type == RASTER_CURSOR_ANDXOR;
        Cursor cursor;
        if (size.isEmpty())
            size = {};
        else if (size.width > std::numeric_limits<int32_t>::max() / 4)
            return std::nullopt;
        const auto width = static_cast<size_t>(size.width);
        const auto height = static_cast<size_t>(size.height);
        // A byte at least: for an empty cursor calloc may give null, too.
        const auto block = [&] {
            return detail::Block(static_cast<uint8_t *>(std::calloc(width * height * 4 + 1, 1)));
        };
        detail::Block first = block(), second = hasMasks ? block() : nullptr;
        if (!first || (hasMasks && !second))
            return std::nullopt;
        const auto view = [&](uint8_t *pixels) {
            return Surface(pixels, 4 * size.width, pixels != nullptr ? size : Size(),
                           Format::kBgra32);
        };
        draw(view(first.get()), view(second.get()));
        cursor.record_.type = type;
        cursor.record_.hotspotX = detail::u32(hotSpot.x);
        cursor.record_.hotspotY = detail::u32(hotSpot.y);
        cursor.record_.width = detail::u32(size.width);
        cursor.record_.height = detail::u32(size.height);
        cursor.own(first.release(), second.release());
        return cursor;
    }

    // Takes the images over; the record keeps their addresses.
    void own(uint8_t *first, uint8_t *second) {
        first_.reset(first);
        second_.reset(second);
        if (hasAlpha()) {
            record_.alphaImage = first;
        } else {
            record_.andImage = first;
            record_.xorImage = second;
        }
    }
    // The image with alpha.
    ConstSurface image() const { return {first_.get(), 4 * size().width, size(), Format::kBgra32}; }

    RasterCursor record_;
    detail::Block first_, second_;
};

inline Rect Surface::draw(Point at, const Cursor &cursor) {
    if (format_ != Format::kBgra32 && cursor.hasAlpha())
        return blend(cursor.bounds(at).corner(), cursor.image());
    assert(format_ == Format::kBgra32);
    const RasterCursorScreen screen = {detail::u32(width()), detail::u32(height())};
    RasterCursorBox box;
    if (format_ != Format::kBgra32 ||
        Raster_ComputeCursorBox(&screen, &cursor.record_, at.x, at.y, &box) == 0)
        return {};
    Raster_DrawCursor(pixels(), stride_, nullptr, 0, &cursor.record_, &box);
    return {static_cast<int32_t>(box.dstX), static_cast<int32_t>(box.dstY),
            static_cast<int32_t>(box.width), static_cast<int32_t>(box.height)};
}

} // namespace quillon

#endif /* QUILLON_FACE_CURSOR_HPP */
