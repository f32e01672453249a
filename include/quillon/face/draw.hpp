/** @file face/draw.hpp
 *
 * What the drawing functions of surface.hpp do.  Part of quillon.hpp, which states the
 * conventions.
 */
#ifndef QUILLON_FACE_DRAW_HPP
#define QUILLON_FACE_DRAW_HPP

#include <quillon/face/surface.hpp>

#include <cstring>

namespace quillon {

namespace detail {

/** The pixels of rows that pass through 32 bits in one piece. */
constexpr int32_t kPiecePixels = 256;

/** A piece of a row, in 32 bits.  Not initialised: what is read of it has been written. */
struct Piece {
    alignas(64) uint8_t bytes[4 * kPiecePixels];

    Surface surface(int32_t width) {
        return {bytes, static_cast<int32_t>(sizeof bytes), {width, 1}, Format::kBgra32};
    }
};

/** Calls draw(part) for pieces of the rows of what has been clipped. */
template <class Draw>
void forEachPiece(const Placed &all, const Draw &draw) {
    for (int32_t y = 0; y < all.height; ++y)
        for (int32_t x = 0; x < all.width; x += kPiecePixels)
            draw(Placed{all.srcX + x, all.srcY + y, all.dstX + x, all.dstY + y,
                        std::min(kPiecePixels, all.width - x), 1});
}

/** v / 255, rounded; v is at most 255 * 255. */
constexpr uint32_t divideBy255(uint32_t v) {
    return (v + 128 + ((v + 128) >> 8)) >> 8;
}

/** The colours of a pixel, each changed by change(colour, alpha). */
template <class Change>
constexpr uint32_t changedColors(uint32_t pixel, const Change &change) {
    const uint32_t alpha = pixel >> 24;
    return alpha << 24 | change(pixel >> 16 & 0xFF, alpha) << 16 |
           change(pixel >> 8 & 0xFF, alpha) << 8 | change(pixel & 0xFF, alpha);
}

constexpr uint32_t premultiplied(uint32_t pixel) {
    return changedColors(pixel,
                         [](uint32_t color, uint32_t alpha) { return divideBy255(color * alpha); });
}

constexpr uint32_t unpremultiplied(uint32_t pixel) {
    if (pixel >= 0xFF000000u)
        return pixel;
    return changedColors(pixel, [](uint32_t color, uint32_t alpha) {
        return alpha == 0 ? 0 : std::min((color * 255 + alpha / 2) / alpha, 255u);
    });
}

} // namespace detail

QUILLON_INLINE Rect Surface::fill(const Rect &rect, Color color) {
    const Rect part = clipped(rect);
    Raster_RectFill(root(), stride_, bytesPerPixel(format_), color.pixel(format_),
                    column(part.left), line(part.top), detail::u32(part.width()),
                    detail::u32(part.height()));
    return part;
}

QUILLON_INLINE Rect Surface::fillAlpha(const Rect &rect, uint8_t alpha) {
    assert(format_ == Format::kBgra32);
    if (format_ != Format::kBgra32)
        return {};
    const Rect part = clipped(rect);
    Raster_RectFillAlpha(root(), stride_, alpha, column(part.left), line(part.top),
                         detail::u32(part.width()), detail::u32(part.height()));
    return part;
}

QUILLON_INLINE Rect Surface::combine(const Rect &rect, uint32_t pixel, Rop rop) {
    const Rect part = clipped(rect);
    Raster_RectROPfill(root(), stride_, bytesPerPixel(format_), pixel, static_cast<uint32_t>(rop),
                       column(part.left), line(part.top), detail::u32(part.width()),
                       detail::u32(part.height()));
    return part;
}

QUILLON_INLINE Rect Surface::combine(Point to, const ConstSurface &source, const Rect &from,
                                     Rop rop) {
    const detail::Placed part = placed(to, source.size_, from);
    assert(part.isEmpty() || source.format_ == format_);
    if (source.format_ != format_)
        return {};
    Raster_RectROPcopy(root(), stride_, source.root_, source.stride_, bytesPerPixel(format_),
                       source.column(part.srcX), source.line(part.srcY), static_cast<uint32_t>(rop),
                       column(part.dstX), line(part.dstY), detail::u32(part.width),
                       detail::u32(part.height));
    return part.drawn();
}

// ---- Copy and blend -------------------------------------------------------

QUILLON_INLINE Rect Surface::copy(Point to, const ConstSurface &source, const Rect &from) {
    const detail::Placed part = placed(to, source.size_, from);
    if (source.format_ == format_) {
        Raster_RectCopy(root(), stride_, source.root_, source.stride_, bytesPerPixel(format_),
                        source.column(part.srcX), source.line(part.srcY), column(part.dstX),
                        line(part.dstY), detail::u32(part.width), detail::u32(part.height));
        return part.drawn();
    }
    if (part.isEmpty() || !canConvert(source))
        return {};
    convert(part, source);
    return part.drawn();
}

inline bool Surface::canConvert(const ConstSurface &source) const {
    const bool can = format_ != Format::kIndex8 &&
                     (source.format_ != Format::kIndex8 || source.palette_ != nullptr);
    assert(can && "nothing converts to palette indices, nor from them without a palette");
    return can;
}

inline void Surface::convert(const detail::Placed &part, const ConstSurface &source) {
    const Palette *const colors =
        source.format_ == Format::kIndex8 ? source.palette_ : detail::colorsOf(source.format_);
    if (stride_ > 0 && source.stride_ > 0) {
        Raster_ConvertPixels(root(), detail::u32(stride_), depthOf(format_), source.root_,
                             detail::u32(source.stride_), depthOf(source.format_),
                             colors != nullptr, colors != nullptr ? colors->data() : nullptr,
                             source.column(part.srcX), source.line(part.srcY), column(part.dstX),
                             line(part.dstY), detail::u32(part.width), detail::u32(part.height));
        return;
    }
    // The strides of conversions have no sign.
    for (int32_t y = 0; y < part.height; ++y)
        Raster_ConvertPixels(at({part.dstX, part.dstY + y}), 0, depthOf(format_),
                             source.at({part.srcX, part.srcY + y}), 0, depthOf(source.format_),
                             colors != nullptr, colors != nullptr ? colors->data() : nullptr, 0, 0,
                             0, 0, detail::u32(part.width), 1);
}

QUILLON_INLINE Rect Surface::blend(Point to, const ConstSurface &source, const Rect &from) {
    const detail::Placed part = placed(to, source.size_, from);
    if (part.isEmpty())
        return {};
    if (format_ == Format::kBgra32 && source.format_ == Format::kBgra32) {
        Raster_AlphaBlendOver(root(), column(part.dstX), line(part.dstY), stride_, source.root_,
                              source.column(part.srcX), source.line(part.srcY), source.stride_,
                              detail::u32(part.width), detail::u32(part.height));
        return part.drawn();
    }
    if (!canConvert(source))
        return {};
    detail::forEachPiece(part, [&](const detail::Placed &piece) { blendPiece(piece, source); });
    return part.drawn();
}

inline void Surface::blendPiece(const detail::Placed &piece, const ConstSurface &source) {
    const Rect from(piece.srcX, piece.srcY, piece.width, 1), under = piece.drawn();
    detail::Piece result, colors;
    Surface over = colors.surface(piece.width);
    if (source.format_ != Format::kBgra32)
        over.copy({0, 0}, source, from);
    if (format_ == Format::kBgra32) {
        blend(under.corner(), over);
        return;
    }
    Surface row = result.surface(piece.width);
    row.copy({0, 0}, *this, under);
    if (source.format_ == Format::kBgra32)
        row.blend({0, 0}, source, from);
    else
        row.blend({0, 0}, over);
    copy(under.corner(), row);
}

// ---- Bits and text --------------------------------------------------------

// draw(destination, bits, stride, width, height), where the bits begin on a byte.
template <class Draw>
QUILLON_INLINE Rect Surface::drawBits(Point to, const Bitmap &bits, const Rect &from,
                                      const Draw &draw) {
    const detail::Placed part = placed(to, bits.size(), from);
    if (part.isEmpty())
        return {};
    const int32_t head = part.srcX % 8 == 0 ? 0 : drawShiftedBits(part, bits, draw);
    if (head < part.width)
        draw(at({part.dstX + head, part.dstY}), bits.at({part.srcX + head, part.srcY}),
             bits.stride(), part.width - head, detail::u32(part.height));
    return part.drawn();
}

// The pixels ahead of the first whole byte, whose bits are shifted to begin on one;
// returns their number.
template <class Draw>
int32_t Surface::drawShiftedBits(const detail::Placed &part, const Bitmap &bits, const Draw &draw) {
    const int32_t shift = part.srcX % 8, width = std::min(8 - shift, part.width);
    uint8_t shifted[64];
    constexpr int32_t kRows = sizeof shifted;
    for (int32_t y = 0; y < part.height; y += kRows) {
        const int32_t count = std::min(kRows, part.height - y);
        for (int32_t i = 0; i < count; ++i)
            shifted[i] = static_cast<uint8_t>(*bits.at({part.srcX, part.srcY + y + i}) << shift);
        draw(at({part.dstX, part.dstY + y}), shifted, 1, width, detail::u32(count));
    }
    return width;
}

QUILLON_INLINE Rect Surface::copyBits(Point to, const Bitmap &bits, const Rect &from,
                                      Color foreground, Color background) {
    return drawBits(
        to, bits, from,
        [&, set = foreground.pixel(format_), clear = background.pixel(format_)](
            uint8_t *dst, const uint8_t *src, int32_t srcStride, int32_t width, uint32_t height) {
            Raster_BitsToPixels(src, srcStride, dst, stride_, bytesPerPixel(format_), width, height,
                                set, clear);
        });
}

QUILLON_INLINE Rect Surface::stencil(Point to, const Bitmap &bits, const Rect &from, Color color) {
    return drawBits(to, bits, from,
                    [&, pixel = color.pixel(format_)](uint8_t *dst, const uint8_t *src,
                                                      int32_t srcStride, int32_t width,
                                                      uint32_t height) {
                        Raster_BitsToPixelsStencil(src, srcStride, dst, stride_,
                                                   bytesPerPixel(format_), width, height, pixel);
                    });
}

template <class DrawGlyph>
Rect Surface::drawText(Point to, const Font &font, std::string_view characters,
                       const DrawGlyph &drawGlyph) {
    Rect drawn;
    for (const char character : characters) {
        drawn = drawn.united(drawGlyph(to, font.glyph(character)));
        to = to + Point(font.size.width, 0);
    }
    return drawn;
}

inline Rect Surface::text(Point to, const Font &font, std::string_view characters, Color color) {
    return drawText(to, font, characters, [&](Point corner, const Bitmap &glyph) {
        return stencil(corner, glyph, color);
    });
}

inline Rect Surface::text(Point to, const Font &font, std::string_view characters, Color foreground,
                          Color background) {
    return drawText(to, font, characters, [&](Point corner, const Bitmap &glyph) {
        return copyBits(corner, glyph, foreground, background);
    });
}

// ---- Alpha and the order of colours ---------------------------------------

// change(pixel), of 32 bits.
template <class Change>
Rect Surface::changePixels(const Rect &rect, const Change &change) {
    assert(format_ == Format::kBgra32);
    if (format_ != Format::kBgra32)
        return {};
    const Rect part = clipped(rect);
    for (int32_t y = part.top; y < part.bottom; ++y) {
        uint8_t *const first = at({part.left, y});
        for (std::ptrdiff_t i = 0; i < std::ptrdiff_t{4} * part.width(); i += 4) {
            uint32_t pixel;
            std::memcpy(&pixel, first + i, sizeof pixel);
            pixel = change(pixel);
            std::memcpy(first + i, &pixel, sizeof pixel);
        }
    }
    return part;
}

inline Rect Surface::premultiply(const Rect &rect) {
    return changePixels(rect, detail::premultiplied);
}

inline Rect Surface::unpremultiply(const Rect &rect) {
    return changePixels(rect, detail::unpremultiplied);
}

inline Rect Surface::exchangeRedBlue(const Rect &rect) {
    if (format_ != Format::kBgr24)
        return changePixels(rect, [](uint32_t pixel) {
            return (pixel & 0xFF00FF00u) | (pixel & 0xFF) << 16 | (pixel >> 16 & 0xFF);
        });
    const Rect part = clipped(rect);
    for (int32_t y = part.top; y < part.bottom; ++y) {
        uint8_t *const first = at({part.left, y});
        for (std::ptrdiff_t i = 0; i < std::ptrdiff_t{3} * part.width(); i += 3)
            std::swap(first[i], first[i + 2]);
    }
    return part;
}

// ---- Colour key -----------------------------------------------------------

inline Rect Surface::copyKeyed(Point to, const ConstSurface &overlay,
                               const ConstSurface &keySurface, Color key,
                               const ConstSurface &background) {
    const bool isPossible = format_ == Format::kBgra32 && overlay.format_ == Format::kBgra32 &&
                            background.format_ == Format::kBgra32 &&
                            keySurface.format_ != Format::kBgr24;
    assert(isPossible);
    // On all surfaces at once: the smallest of them clips.
    const Rect common = bounds().intersected(keySurface.bounds()).intersected(background.bounds());
    const detail::Placed part = detail::place(common.size(), to, overlay.size_, overlay.bounds());
    if (!isPossible || part.isEmpty())
        return {};
    const int32_t keyBytes = bytesPerPixel(keySurface.format_);
    // The first pixels of each, as all must have the same coordinates.
    const Point corner(part.dstX, part.dstY);
    Raster_ApplyColorKey(background.at(corner), at(corner), overlay.at({part.srcX, part.srcY}),
                         keySurface.at(corner), background.stride_, stride_, overlay.stride_,
                         keySurface.stride_, keyOn(keySurface, key), 0, 0, detail::u32(part.width),
                         detail::u32(part.height), detail::u32(8 * keyBytes));
    return part.drawn();
}

// The key as it is compared: 24 bits of 32, otherwise the bytes of a pixel.
inline uint32_t Surface::keyOn(const ConstSurface &keySurface, Color key) {
    const uint32_t pixel = key.pixel(keySurface.format_);
    return keySurface.format_ == Format::kIndex8 ? pixel & 0xFF : pixel;
}

} // namespace quillon

#endif /* QUILLON_FACE_DRAW_HPP */
