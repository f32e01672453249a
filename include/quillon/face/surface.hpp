/** @file face/surface.hpp
 *
 * Surfaces: pixels in the caller's memory, and what is drawn on them.  Part of
 * quillon.hpp, which states the conventions.
 */
#ifndef QUILLON_FACE_SURFACE_HPP
#define QUILLON_FACE_SURFACE_HPP

#include <quillon/face/bits.hpp>
#include <quillon/face/format.hpp>
#include <quillon/face/rect.hpp>
#include <quillon/imageUtil.h>
#include <quillon/raster.h>

#include <cassert>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <string_view>

namespace quillon {

class Bytes;
class Cursor;
class Image;
class VideoFrame;

/** Whether a file gets the alpha of a 32-bit surface. */
enum class Alpha : uint8_t { kKeep, kDrop };

/** Pixels that are only read: where they are, their stride, size and format.
 *
 * A view: it is copied, and owns nothing.  The memory must outlive it.
 */
class ConstSurface {
public:
    /** An empty surface. */
    ConstSurface() = default;

    /** Pixels in memory.
     *
     * A null pointer, rows that overlap, or a stride of 2-byte or 4-byte pixels that is not a
     * multiple of their size is an assertion; without assertions the surface is empty.
     *
     * @param pixels   pixel (0, 0)
     * @param stride   bytes from a row to the next; may be negative
     * @param size     in pixels
     * @param format   of the pixels
     * @param palette  the colours of Format::kIndex8, where they are needed
     */
    ConstSurface(const void *pixels, int32_t stride, Size size, Format format,
                 const Palette *palette = nullptr) {
        const bool isValid = size.isEmpty() || isLayout(pixels, stride, size, format);
        assert(isValid && "a null pointer, overlapping rows or a stride of parts of pixels");
        if (!isValid || size.isEmpty())
            return;
        root_ = static_cast<const uint8_t *>(pixels);
        stride_ = stride;
        size_ = size;
        format_ = format;
        palette_ = palette;
    }

    Size size() const { return size_; }
    int32_t width() const { return size_.width; }
    int32_t height() const { return size_.height; }
    int32_t stride() const { return stride_; }
    Format format() const { return format_; }
    /** The colours of Format::kIndex8; null where none were given. */
    const Palette *palette() const { return palette_; }
    bool isEmpty() const { return size_.isEmpty(); }
    /** All of it: (0, 0) and its size. */
    Rect bounds() const { return {{0, 0}, size_}; }

    /** Pixel (0, 0), for the C interface. */
    const uint8_t *pixels() const { return isEmpty() ? nullptr : at({0, 0}); }
    /** The first pixel of a row, which must exist. */
    const uint8_t *row(int32_t y) const { return at({0, y}); }

    /** The part under a rectangle, cut to the surface.  Its (0, 0) is the corner of what
     * is left. */
    ConstSurface part(const Rect &rect) const { return cut(*this, rect); }

    /** Writes a PNG file: with a palette, RGB, or, from Format::kBgra32 with Alpha::kKeep,
     * RGBA.  Files have colours that are not premultiplied.
     */
    [[nodiscard]] bool writePng(const char *fileName, Alpha alpha = Alpha::kKeep) const;
    /** Writes a BMP file, without alpha. */
    [[nodiscard]] bool writeBmp(const char *fileName) const;
    /** The contents of such a PNG file. */
    std::optional<Bytes> encodePng(Alpha alpha = Alpha::kKeep) const;
    /** The contents of such a BMP file. */
    std::optional<Bytes> encodeBmp() const;

protected:
    // Of a pixel of the surface.
    const uint8_t *at(Point point) const {
        assert(bounds().contains(point));
        return root_ + std::ptrdiff_t{stride_} * (origin_.y + point.y) +
               std::ptrdiff_t{bytesPerPixel(format_)} * (origin_.x + point.x);
    }
    // Coordinates of the surface for the C interface, with root_.
    uint32_t column(int32_t x) const { return detail::u32(origin_.x + x); }
    uint32_t line(int32_t y) const { return detail::u32(origin_.y + y); }

    // A surface or what is derived from it, cut to a rectangle.
    template <class Any>
    static Any cut(Any surface, const Rect &rect) {
        const Rect inside = rect.intersected(surface.bounds());
        if (inside.isEmpty())
            return {};
        surface.hasSpareColumn_ = surface.hasSpareColumn_ && inside.right == surface.width();
        surface.origin_ = surface.origin_ + inside.corner();
        surface.size_ = inside.size();
        return surface;
    }

    // A part keeps pixel (0, 0) of what it is a part of: where two parts overlap, their
    // coordinates tell the order in which to copy.
    const uint8_t *root_ = nullptr;
    Point origin_;
    const Palette *palette_ = nullptr;
    int32_t stride_ = 0;
    Size size_;
    Format format_ = Format::kBgra32;
    bool hasSpareColumn_ = false; // memory for a pixel behind every row, part of no surface

private:
    friend class Surface;

    ImageInfo info() const;
    static bool isLayout(const void *pixels, int32_t stride, Size size, Format format) {
        const int64_t pixelBytes = bytesPerPixel(format),
                      step = stride < 0 ? -int64_t{stride} : stride;
        const bool isWhole = pixelBytes == 3 || step % pixelBytes == 0;
        return pixels != nullptr && isWhole &&
               (size.height == 1 || step >= pixelBytes * size.width);
    }
};

/** Pixels that are drawn on.
 *
 * A view, as ConstSurface is.  Every drawing function clips to this surface and to the source,
 * and returns the rectangle that it has drawn to, all zero when there was none.
 *
 * Source and destination may overlap in copies between equal formats, in raster operations
 * and in blends between 32-bit surfaces, as raster.h says, where both are the same surface or
 * parts of one; elsewhere they must not.
 */
class Surface : public ConstSurface {
public:
    /** An empty surface. */
    Surface() = default;
    /** Pixels in memory, see ConstSurface. */
    Surface(void *pixels, int32_t stride, Size size, Format format,
            const Palette *palette = nullptr)
        : ConstSurface(pixels, stride, size, format, palette) {}
    /** The pixels of an image, as long as it exists. */
    Surface(Image &image);
    Surface(const Image &) = delete;

    /** Pixel (0, 0), for the C interface. */
    uint8_t *pixels() { return isEmpty() ? nullptr : at({0, 0}); }
    /** The first pixel of a row, which must exist. */
    uint8_t *row(int32_t y) { return at({0, y}); }
    using ConstSurface::pixels;
    using ConstSurface::row;

    /** The part under a rectangle, cut to the surface.  Its (0, 0) is the corner of what
     * is left. */
    Surface part(const Rect &rect) { return cut(*this, rect); }
    using ConstSurface::part;

    /** @name Fill
     * @{
     */

    /** Fills a rectangle with a colour. */
    Rect fill(const Rect &rect, Color color);
    /** Fills all of the surface. */
    Rect fill(Color color) { return fill(bounds(), color); }
    /** Sets the alpha of 32-bit pixels and leaves their colours. */
    Rect fillAlpha(const Rect &rect, uint8_t alpha);

    /** @}
     * @name Copy and blend
     * @{
     */

    /** Copies a surface; its top left corner goes to a point.
     *
     * Formats are converted.  A 32-bit destination gets alpha 255 where the source has
     * none.  Nothing but Format::kIndex8 can be copied to Format::kIndex8, and it takes a
     * palette to copy that to another format.
     */
    Rect copy(Point to, const ConstSurface &source) { return copy(to, source, source.bounds()); }
    /** Copies a rectangle of a surface; the corner of the rectangle goes to a point. */
    Rect copy(Point to, const ConstSurface &source, const Rect &from);

    /** Blends a surface over this one, by its alpha.
     *
     *     dst = min(255, src + dst * (255 - srcAlpha) / 255)
     *
     * The colours of the source must be premultiplied, see premultiply(); a source without
     * alpha is opaque.  The alpha of a 32-bit destination keeps its value.  Where a
     * surface is not of 32 bits, pixels pass through pieces of rows of 32 bits.  The destination
     * cannot be Format::kIndex8.
     */
    Rect blend(Point to, const ConstSurface &source) { return blend(to, source, source.bounds()); }
    /** Blends a rectangle of a surface. */
    Rect blend(Point to, const ConstSurface &source, const Rect &from);

    /** @}
     * @name Raster operations
     * @{
     */

    /** Combines a rectangle with one pixel value, in the format of the surface. */
    Rect combine(const Rect &rect, uint32_t pixel, Rop rop);
    /** Combines a surface of the same format with this one. */
    Rect combine(Point to, const ConstSurface &source, Rop rop) {
        return combine(to, source, source.bounds(), rop);
    }
    Rect combine(Point to, const ConstSurface &source, const Rect &from, Rop rop);

    /** @}
     * @name Bits and text
     * @{
     */

    /** Draws a bitmap in two colours: foreground where a bit is set. */
    Rect copyBits(Point to, const Bitmap &bits, Color foreground, Color background) {
        return copyBits(to, bits, bits.bounds(), foreground, background);
    }
    Rect copyBits(Point to, const Bitmap &bits, const Rect &from, Color foreground,
                  Color background);
    /** Draws the set bits of a bitmap in one colour. */
    Rect stencil(Point to, const Bitmap &bits, Color color) {
        return stencil(to, bits, bits.bounds(), color);
    }
    Rect stencil(Point to, const Bitmap &bits, const Rect &from, Color color);

    /** Draws text on one line, from left to right; characters without a glyph are left
     * blank, with nothing drawn. */
    Rect text(Point to, const Font &font, std::string_view characters, Color color);
    /** The same with a background behind the glyphs. */
    Rect text(Point to, const Font &font, std::string_view characters, Color foreground,
              Color background);

    /** @}
     * @name Alpha and the order of colours
     * Small loops, not vectors by hand.
     * @{
     */

    /** Multiplies the colours of 32-bit pixels by their alpha, rounded. */
    Rect premultiply(const Rect &rect);
    Rect premultiply() { return premultiply(bounds()); }
    /** Divides the colours of 32-bit pixels by their alpha, rounded, at most 255; 0 at
     * alpha 0. */
    Rect unpremultiply(const Rect &rect);
    Rect unpremultiply() { return unpremultiply(bounds()); }
    /** Exchanges red and blue of 24-bit or 32-bit pixels: for pixels from or for a library
     * that stores red first. */
    Rect exchangeRedBlue(const Rect &rect);
    Rect exchangeRedBlue() { return exchangeRedBlue(bounds()); }

    /** @}
     * @name Scaling
     * @{
     */

    /** Scales all of a surface to a rectangle, of which the part on this surface is drawn.
     *
     * To scale a rectangle of the source, pass source.part(rectangle).  The rectangle may be
     * far larger than the surface: what is not visible is not computed.
     *
     * The right edge is not darkened as by Raster_Scale, nor is a reduction of the height by
     * more than 32.  For that a source that shrinks is copied first, unless it is an Image,
     * or a part of one that reaches to its right edge.  Formats other than 32 bits pass
     * through images of 32 bits.  All four channels are treated alike: premultiply before
     * where transparent edges count.
     *
     * @return nothing, with nothing drawn, when a side of the rectangle or the source is
     *         above 32766 or there is no memory
     */
    [[nodiscard]] std::optional<Rect> copyScaled(const Rect &to, const ConstSurface &source,
                                                 Filter filter = Filter::kSmooth);

    /** @}
     * @name Video, colour key, cursors
     * @{
     */

    /** Draws a video frame, converted to the format of the surface, with alpha 255. */
    Rect copyVideo(Point to, const VideoFrame &frame);

    /** Composes an overlay and a background by a colour key; all but the key surface are of
     * 32 bits.
     *
     * The key surface and the background have the coordinates of this surface.  Where the
     * overlay lies, a pixel comes from it when the key surface has the key colour there,
     * otherwise from the background, which may be this surface.
     *
     * @param to          where the top left corner of the overlay goes
     * @param overlay     the overlay
     * @param keySurface  of any format but Format::kBgr24
     * @param key         the key colour; its alpha does not count
     * @param background  the background
     */
    Rect copyKeyed(Point to, const ConstSurface &overlay, const ConstSurface &keySurface, Color key,
                   const ConstSurface &background);

    /** Draws a cursor whose hot spot is at a point, on 32 bits; one with alpha on any format
     * that blend() takes. */
    Rect draw(Point at, const Cursor &cursor);

    /** @} */

private:
    using ConstSurface::at;
    uint8_t *at(Point point) { return const_cast<uint8_t *>(ConstSurface::at(point)); }
    uint8_t *root() { return const_cast<uint8_t *>(root_); }

    // The visible part of a rectangle.
    Rect clipped(const Rect &rect) const { return rect.intersected(bounds()); }
    detail::Placed placed(Point to, Size source, const Rect &from) const {
        return detail::place(size_, to, source, from);
    }
    bool canConvert(const ConstSurface &source) const;
    void convert(const detail::Placed &part, const ConstSurface &source);
    void blendPiece(const detail::Placed &piece, const ConstSurface &source);
    static uint32_t keyOn(const ConstSurface &keySurface, Color key);
    template <class Draw>
    Rect drawBits(Point to, const Bitmap &bits, const Rect &from, const Draw &draw);
    template <class Draw>
    int32_t drawShiftedBits(const detail::Placed &part, const Bitmap &bits, const Draw &draw);
    template <class DrawGlyph>
    Rect drawText(Point to, const Font &font, std::string_view characters,
                  const DrawGlyph &drawGlyph);
    template <class Change>
    Rect changePixels(const Rect &rect, const Change &change);
    uint32_t scaleVisible(const Rect &to, const Rect &visible, const ConstSurface &source,
                          Filter filter);
};

} // namespace quillon

#include <quillon/face/draw.hpp>

#endif /* QUILLON_FACE_SURFACE_HPP */
