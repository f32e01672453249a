/** @file face/scale.hpp
 *
 * How Surface::copyScaled scales.  Part of quillon.hpp, which states the conventions.
 */
#ifndef QUILLON_FACE_SCALE_HPP
#define QUILLON_FACE_SCALE_HPP

#include <quillon/face/image.hpp>

namespace quillon {

namespace detail {

/** The largest side of images that are scaled: one less than Raster_Scale takes, for the
 * spare column. */
constexpr int32_t kMaxScaledSide = 32766;
/** The largest vertical reduction whose averages hold all rows: 31 rows are parts of at most
 * 32. */
constexpr int32_t kMaxReduction = 31;

} // namespace detail

inline std::optional<Rect> Surface::copyScaled(const Rect &to, const ConstSurface &source,
                                               Filter filter) {
    constexpr int32_t kMax = detail::kMaxScaledSide;
    if (to.width() > kMax || to.height() > kMax || source.width() > kMax || source.height() > kMax)
        return std::nullopt;
    const Rect visible = clipped(to);
    if (visible.isEmpty() || source.isEmpty())
        return Rect();
    if (source.format_ != Format::kBgra32) {
        const std::optional<Image> copied = Image::copyOf(source, Format::kBgra32);
        return copied ? copyScaled(to, *copied, filter) : std::nullopt;
    }
    if (format_ != Format::kBgra32) {
        const Point corner = visible.corner();
        std::optional<Image> scaled =
            Image::allocate(visible.size(), Format::kBgra32, nullptr, false);
        if (!scaled || !scaled->copyScaled(to.translated(-corner), source, filter))
            return std::nullopt;
        return copy(corner, *scaled);
    }
    const bool isSmooth = filter == Filter::kSmooth;
    if (isSmooth && source.height() > detail::kMaxReduction * to.height()) {
        const int32_t rows = (source.height() + detail::kMaxReduction - 1) / detail::kMaxReduction;
        std::optional<Image> reduced =
            Image::allocate({to.width(), rows}, Format::kBgra32, nullptr, false);
        if (!reduced || !reduced->copyScaled(reduced->bounds(), source, filter))
            return std::nullopt;
        return copyScaled(to, *reduced, filter);
    }
    if (isSmooth && source.width() > to.width() && !source.hasSpareColumn_) {
        const std::optional<Image> copied = Image::copyOf(source);
        return copied ? copyScaled(to, *copied, filter) : std::nullopt;
    }
    return scaleVisible(to, visible, source, filter) != 0 ? std::optional(visible) : std::nullopt;
}

// One call of Raster_Scale.  A reduction leaves the last column of the source out of its
// averages; told of one column more, it takes all that there are.
inline uint32_t Surface::scaleVisible(const Rect &to, const Rect &visible,
                                      const ConstSurface &source, Filter filter) {
    const bool isSmooth = filter == Filter::kSmooth;
    const int32_t spare = isSmooth && source.width() > to.width() ? 1 : 0;
    // Where pixel (0, 0) of the scaled image would be, which need not be on the surface.
    const std::ptrdiff_t offset = std::ptrdiff_t{stride_} * (to.top - visible.top) +
                                  std::ptrdiff_t{4} * (to.left - visible.left);
    const auto first = reinterpret_cast<uintptr_t>(at(visible.corner()));
    auto *const corner = reinterpret_cast<uint8_t *>(first + static_cast<uintptr_t>(offset));
    return Raster_Scale(corner, stride_, detail::u32(to.width()), detail::u32(to.height()),
                        visible.left - to.left, visible.top - to.top, visible.right - to.left,
                        visible.bottom - to.top, source.pixels(), source.stride_,
                        detail::u32(source.width() + spare), detail::u32(source.height()),
                        double{1} * to.width() / source.width(),
                        double{1} * to.height() / source.height(), isSmooth ? 1 : 0);
}

} // namespace quillon

#endif /* QUILLON_FACE_SCALE_HPP */
