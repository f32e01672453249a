/** @file face/video.hpp
 *
 * Video frames.  Part of quillon.hpp, which states the conventions.
 */
#ifndef QUILLON_FACE_VIDEO_HPP
#define QUILLON_FACE_VIDEO_HPP

#include <quillon/face/draw.hpp>
#include <quillon/rasterVideo.h>

namespace quillon {

/** The formats of video frames, under the names by which other programs know them.
 *
 * Raster_YUVtoRGB takes U for V and stores red first; the face undoes both.
 */
enum class VideoFormat : uint8_t {
    kI420, /**< planar: Y, then U, then V, of one sample for 2 by 2 pixels; yuv420p */
    kYv12, /**< the same with V ahead of U */
    kNv12, /**< planar: Y, then U and V interleaved */
    kYuy2, /**< Y0 U Y1 V for two pixels of a row; also YUYV, yuyv422 */
    kUyvy, /**< U Y0 V Y1 */
    kYvyu, /**< Y0 V Y1 U */
    kVyuy  /**< V Y0 U Y1 */
};

/** A plane of a video frame: its first byte and its stride. */
struct VideoPlane {
    const uint8_t *data = nullptr;
    int32_t stride = 0;
};

/** A video frame in the caller's memory; only read.
 *
 * Levels are those of television: Y from 16 to 235, U and V from 16 to 240, by the matrix of
 * BT.601.  Where a side is odd, the last samples of U and V belong to one column or row.
 */
class VideoFrame {
public:
    /** A frame in one block without padding, as ffmpeg writes it: rows of width bytes of Y and of
     * (width + 1) / 2 of U and V, or of (width + 1) / 2 * 4 bytes.
     *
     * @param data    the frame, byteCount(format, size) bytes
     * @param format  of the frame
     * @param size    in pixels
     */
    VideoFrame(const void *data, VideoFormat format, Size size) : format_(format) {
        assert((data != nullptr || size.isEmpty()) && "a null pointer");
        if (data == nullptr || size.isEmpty() || size.width > kMaxWidth)
            return;
        const int32_t half = (size.width + 1) / 2;
        size_ = size;
        if (!isPlanar()) {
            y_ = {static_cast<const uint8_t *>(data), 4 * half};
            return;
        }
        y_ = {static_cast<const uint8_t *>(data), size.width};
        const uint8_t *const chroma = y_.data + std::ptrdiff_t{size.width} * size.height;
        const std::ptrdiff_t planeBytes =
            std::ptrdiff_t{half} * ((std::ptrdiff_t{size.height} + 1) / 2);
        u_ = v_ = {chroma, format == VideoFormat::kNv12 ? 2 * half : half};
        if (format == VideoFormat::kNv12)
            v_.data += 1;
        else
            (format == VideoFormat::kI420 ? v_ : u_).data += planeBytes;
    }

    /** An interleaved frame with a stride of its own. */
    static VideoFrame interleaved(VideoFormat format, Size size, VideoPlane plane) {
        return {format, size, plane, plane, plane};
    }
    /** A planar frame of three planes: VideoFormat::kI420, whatever their order. */
    static VideoFrame planar(Size size, VideoPlane y, VideoPlane u, VideoPlane v) {
        return {VideoFormat::kI420, size, y, u, v};
    }
    /** A planar frame of two planes: VideoFormat::kNv12. */
    static VideoFrame planar(Size size, VideoPlane y, VideoPlane uv) {
        const VideoPlane v = {uv.data == nullptr ? nullptr : uv.data + 1, uv.stride};
        return {VideoFormat::kNv12, size, y, uv, v};
    }

    /** The bytes of a frame without padding. */
    static uint64_t byteCount(VideoFormat format, Size size) {
        if (size.isEmpty())
            return 0;
        const uint64_t width = detail::u32(size.width), height = detail::u32(size.height);
        const uint64_t half = (width + 1) / 2;
        return isPlanar(format) ? width * height + 2 * half * ((height + 1) / 2)
                                : 4 * half * height;
    }

    VideoFormat format() const { return format_; }
    Size size() const { return size_; }
    Rect bounds() const { return {{0, 0}, size_}; }

private:
    friend class Surface;

    static constexpr int32_t kMaxWidth = std::numeric_limits<int32_t>::max() / 2 - 1;
    // Pixels of a row that are converted at once, even.
    static constexpr int32_t kPixels = detail::kPiecePixels;
    // Of a small frame: two rows of them as YV12, or one of them interleaved.
    using Samples = uint8_t[3 * kPixels];

    VideoFrame(VideoFormat format, Size size, VideoPlane y, VideoPlane u, VideoPlane v)
        : format_(format), y_(y), u_(u), v_(v) {
        const bool isValid =
            size.isEmpty() || (y.data != nullptr && u.data != nullptr && v.data != nullptr);
        assert(isValid && "a null pointer");
        if (isValid && !size.isEmpty() && size.width <= kMaxWidth)
            size_ = size;
    }

    static bool isPlanar(VideoFormat format) {
        return format == VideoFormat::kI420 || format == VideoFormat::kYv12 ||
               format == VideoFormat::kNv12;
    }
    bool isPlanar() const { return isPlanar(format_); }

    static const uint8_t *at(VideoPlane plane, int32_t x, int32_t y) {
        return plane.data + std::ptrdiff_t{plane.stride} * y + x;
    }

    // Gathers a small planar frame of width columns by two rows from an even column and row
    // on, U where V is expected.  What is beyond an odd side is repeated.
    void gatherPlanar(Samples &samples, int32_t x, int32_t y, int32_t width) const {
        const int32_t columns = std::min(width, size_.width - x), half = width / 2;
        uint8_t *to = samples;
        for (const int32_t row : {y, std::min(y + 1, size_.height - 1)}) {
            std::memcpy(to, at(y_, x, row), static_cast<size_t>(columns));
            to[width - 1] = to[columns - 1];
            to += width;
        }
        const std::ptrdiff_t step = format_ == VideoFormat::kNv12 ? 2 : 1;
        const uint8_t *u = at(u_, 0, y / 2) + step * (x / 2);
        const uint8_t *v = at(v_, 0, y / 2) + step * (x / 2);
        for (int32_t i = 0; i < half; ++i, u += step, v += step) {
            to[i] = *u;
            to[half + i] = *v;
        }
    }

    // The same of an interleaved frame and one row, as YVYU.
    void gatherInterleaved(Samples &samples, int32_t x, int32_t y, int32_t width) const {
        const bool isLumaFirst = format_ == VideoFormat::kYuy2 || format_ == VideoFormat::kYvyu;
        const bool isUFirst = format_ == VideoFormat::kYuy2 || format_ == VideoFormat::kUyvy;
        const int32_t luma = isLumaFirst ? 0 : 1, u = (isUFirst ? 0 : 2) + 1 - luma;
        const uint8_t *from = at(y_, 2 * x, y);
        for (int32_t i = 0; i < 2 * width; i += 4, from += 4) {
            samples[i] = from[luma];
            samples[i + 1] = from[u ^ 2];
            samples[i + 2] = from[luma + 2];
            samples[i + 3] = from[u];
        }
    }

    // Converts up to kPixels columns and two rows, from an even column and, of a planar
    // frame, an even row on, to 32-bit pixels; returns the rows.
    int32_t convert(uint8_t *pixels, int32_t x, int32_t y, int32_t width) const {
        Samples samples;
        const int32_t rows = isPlanar() ? 2 : 1;
        if (isPlanar())
            gatherPlanar(samples, x, y, width);
        else
            gatherInterleaved(samples, x, y, width);
        Raster_YUVtoRGB(samples, pixels, detail::u32(width), detail::u32(rows),
                        isPlanar() ? RASTER_VIDEO_YV12 : RASTER_VIDEO_YUY2, 32);
        for (int32_t i = 0; i < 4 * width * rows; i += 4) {
            std::swap(pixels[i], pixels[i + 2]);
            pixels[i + 3] = 255;
        }
        return rows;
    }

    VideoFormat format_;
    Size size_;
    VideoPlane y_, u_, v_;
};

inline Rect Surface::copyVideo(Point to, const VideoFrame &frame) {
    const detail::Placed part = placed(to, frame.size(), frame.bounds());
    if (part.isEmpty())
        return {};
    constexpr int32_t kPixels = VideoFrame::kPixels;
    alignas(64) uint8_t pixels[2 * 4 * kPixels];
    const Rect from(part.srcX, part.srcY, part.width, part.height);
    const Point offset(part.dstX - part.srcX, part.dstY - part.srcY);
    const int32_t firstX = from.left & ~1, step = frame.isPlanar() ? 2 : 1;
    for (int32_t y = from.top - from.top % step; y < from.bottom; y += step)
        for (int32_t x = firstX; x < from.right; x += kPixels) {
            const int32_t width = std::min(kPixels, (from.right - x + 1) & ~1);
            const int32_t rows = frame.convert(pixels, x, y, width);
            const ConstSurface piece(pixels, 4 * width, {width, rows}, Format::kBgra32);
            const Rect wanted = from.intersected({x, y, width, rows});
            copy(wanted.corner() + offset, piece, wanted.translated({-x, -y}));
        }
    return part.drawn();
}

} // namespace quillon

#endif /* QUILLON_FACE_VIDEO_HPP */
