/** @file face/image.hpp
 *
 * Images that own their pixels, and their files.  Part of quillon.hpp, which states the
 * conventions.
 */
#ifndef QUILLON_FACE_IMAGE_HPP
#define QUILLON_FACE_IMAGE_HPP

#include <hearth/hearth.h>
#include <quillon/face/surface.hpp>
#include <quillon/imageUtil.h>

#include <cstdlib>
#include <cstring>
#include <memory>
#include <utility>

namespace quillon {

namespace detail {

/** Releases what came from malloc. */
struct Free {
    void operator()(void *block) const { std::free(block); }
};
using Block = std::unique_ptr<uint8_t, Free>;

} // namespace detail

/** Bytes in memory of their own: the contents of a file. */
class Bytes {
public:
    Bytes() : buffer_{} {}
    ~Bytes() { DynBuf_Destroy(&buffer_); }
    Bytes(Bytes &&other) noexcept : buffer_(std::exchange(other.buffer_, DynBuf{})) {}
    Bytes &operator=(Bytes &&other) noexcept {
        std::swap(buffer_, other.buffer_);
        return *this;
    }

    const uint8_t *data() const { return reinterpret_cast<const uint8_t *>(buffer_.data); }
    size_t size() const { return buffer_.size; }
    const uint8_t *begin() const { return data(); }
    const uint8_t *end() const { return data() + size(); }

private:
    friend class ConstSurface;

    DynBuf buffer_;
};

/** A surface that owns its pixels.
 *
 * Rows begin at multiples of 64 bytes.  An image moves; to copy it, use copyOf().  Views of
 * an image, and its parts, are valid as long as its pixels: until it is destroyed or
 * assigned to.
 */
class Image : public Surface {
public:
    /** An image without pixels. */
    Image() = default;
    Image(Image &&other) noexcept
        : Surface(static_cast<Surface &>(other)), block_(std::move(other.block_)) {
        static_cast<Surface &>(other) = {};
    }
    Image &operator=(Image &&other) noexcept {
        static_cast<Surface &>(*this) = std::exchange(static_cast<Surface &>(other), Surface());
        block_ = std::move(other.block_);
        return *this;
    }

    /** Makes an image, all bytes 0.
     *
     * @param size     in pixels
     * @param format   of the pixels
     * @param palette  for Format::kIndex8: the caller's, which must outlive the image
     * @return nothing when there is no memory, or a row has more than 2147483647 bytes
     */
    static std::optional<Image> create(Size size, Format format = Format::kBgra32,
                                       const Palette *palette = nullptr) {
        return allocate(size, format, palette, true);
    }

    /** Makes an image of another surface's pixels, converted to a format; see
     * Surface::copy. */
    static std::optional<Image> copyOf(const ConstSurface &source, Format format) {
        const Palette *const palette = format == Format::kIndex8 ? source.palette() : nullptr;
        std::optional<Image> image = allocate(source.size(), format, palette, false);
        if (image && image->copy({0, 0}, source) != source.bounds())
            return std::nullopt;
        return image;
    }
    static std::optional<Image> copyOf(const ConstSurface &source) {
        return copyOf(source, source.format());
    }

    /** Reads a PNG file, as 32-bit pixels: with the alpha of the file, otherwise 255.
     *
     * The colours are not premultiplied: call premultiply() before a blend.  See
     * ImageUtil_ReadPNG for the files that are read.
     */
    static std::optional<Image> readPng(const char *fileName) {
        return taken([&](ImageInfo &info) {
            return ImageUtil_ReadPNG(&info, fileName, IMAGEUTIL_READ_KEEP_ALPHA);
        });
    }
    /** The same from a PNG in memory. */
    static std::optional<Image> decodePng(const void *bytes, size_t size) {
        if (size > std::numeric_limits<uint32_t>::max())
            return std::nullopt;
        return taken([&](ImageInfo &info) {
            return ImageUtil_ReadPNGBuffer(&info, static_cast<const uint8_t *>(bytes),
                                           static_cast<uint32_t>(size), IMAGEUTIL_READ_KEEP_ALPHA);
        });
    }

private:
    friend class Surface;

    static constexpr int64_t kAlignment = 64;

    // Behind every row there is room for one pixel more, see Surface::copyScaled.
    static std::optional<Image> allocate(Size size, Format format, const Palette *palette,
                                         bool isCleared) {
        Image image;
        if (size.isEmpty())
            return image;
        const int64_t rowBytes = (int64_t{size.width} + 1) * bytesPerPixel(format);
        const int64_t stride = (rowBytes + kAlignment - 1) / kAlignment * kAlignment;
        if (stride > std::numeric_limits<int32_t>::max())
            return std::nullopt;
        // Below 2^62: a product of two 31-bit numbers.
        const auto bytes = static_cast<size_t>(stride * size.height);
        image.block_.reset(static_cast<uint8_t *>(std::aligned_alloc(kAlignment, bytes)));
        if (!image.block_)
            return std::nullopt;
        if (isCleared)
            std::memset(image.block_.get(), 0, bytes);
        static_cast<Surface &>(image) =
            Surface(image.block_.get(), static_cast<int32_t>(stride), size, format, palette);
        image.hasSpareColumn_ = true;
        return image;
    }

    // What read(info) reads, in 32 bits.
    template <class Read>
    static std::optional<Image> taken(const Read &read) {
        ImageInfo info = {};
        const bool isRead = read(info);
        std::optional<Image> image;
        if (isRead && info.bytesPerLine <= detail::u32(std::numeric_limits<int32_t>::max())) {
            Palette palette = {};
            for (size_t i = 0; i < palette.size(); ++i) {
                const ImageUtilColor &color = info.palette[i];
                palette[i] = Color(color.red, color.green, color.blue).argb();
            }
            const Format format = info.bpp == 32   ? Format::kBgra32
                                  : info.bpp == 24 ? Format::kBgr24
                                                   : Format::kIndex8;
            const Size size = {static_cast<int32_t>(info.width), static_cast<int32_t>(info.height)};
            image = copyOf(ConstSurface(info.data, static_cast<int32_t>(info.bytesPerLine), size,
                                        format, &palette),
                           Format::kBgra32);
        }
        ImageUtil_FreeImageData(&info);
        return image;
    }

    detail::Block block_;
};

inline Surface::Surface(Image &image) : Surface(static_cast<Surface &>(image)) {}

// ---- Files ----------------------------------------------------------------

// The surface as the record that files are written from; its pixels are not changed.
inline ImageInfo ConstSurface::info() const {
    ImageInfo info = {};
    if (isEmpty())
        return info;
    const int32_t depth = depthOf(format_);
    const bool isBottomUp = stride_ < 0;
    info.width = detail::u32(size_.width);
    info.height = detail::u32(size_.height);
    info.bpp = 8 * detail::u32(bytesPerPixel(format_));
    info.depth = info.bpp == 8 ? 8 : std::min(detail::u32(depth), 24u);
    // The stride of one row does not count, but a record must have one.
    info.bytesPerLine = size_.height == 1 ? info.width * (info.bpp / 8)
                                          : static_cast<uint32_t>(std::abs(int64_t{stride_}));
    info.flags = isBottomUp ? IMAGEUTIL_FLAG_BOTTOM_UP : 0;
    info.data = const_cast<uint8_t *>(row(isBottomUp ? size_.height - 1 : 0));
    const Palette *const colors = format_ == Format::kIndex8 ? palette_ : detail::colorsOf(format_);
    for (size_t i = 0; colors != nullptr && i < colors->size(); ++i) {
        const uint32_t color = (*colors)[i];
        info.palette[i] = {static_cast<uint8_t>(color), static_cast<uint8_t>(color >> 8),
                           static_cast<uint8_t>(color >> 16), 0};
        info.numColors = 256;
    }
    return info;
}

inline bool ConstSurface::writePng(const char *fileName, Alpha alpha) const {
    const ImageInfo record = info();
    const ImageUtilPngOptions options = {-1, alpha == Alpha::kDrop};
    return ImageUtil_WritePNG(&record, fileName, &options);
}

inline bool ConstSurface::writeBmp(const char *fileName) const {
    const ImageInfo record = info();
    return ImageUtil_WriteImage(&record, fileName, IMAGEUTIL_FORMAT_BMP);
}

inline std::optional<Bytes> ConstSurface::encodePng(Alpha alpha) const {
    const ImageInfo record = info();
    const ImageUtilPngOptions options = {-1, alpha == Alpha::kDrop};
    std::optional<Bytes> bytes(std::in_place);
    if (!ImageUtil_ConstructPNGBuffer(&record, &options, &bytes->buffer_))
        return std::nullopt;
    return bytes;
}

inline std::optional<Bytes> ConstSurface::encodeBmp() const {
    const ImageInfo record = info();
    std::optional<Bytes> bytes(std::in_place);
    if (!ImageUtil_ConstructBMPBuffer(&record, &bytes->buffer_))
        return std::nullopt;
    return bytes;
}

} // namespace quillon

#endif /* QUILLON_FACE_IMAGE_HPP */
