// pixman: fills, compositing, conversion through its formats, scaling, regions.
#include "../operations/operations.h"
#include "peers.h"

#include <pixman.h>

#include <memory>

namespace quillon::bench {
namespace {

using Image = std::shared_ptr<pixman_image_t>;

Image imageOf(const Buffer &buffer, pixman_format_code_t format) {
    auto *bits = reinterpret_cast<uint32_t *>(buffer.data);
    const Image image = {
        pixman_image_create_bits(format, buffer.w(), buffer.h(), bits, buffer.stride),
        pixman_image_unref};
    static pixman_indexed_t table = {};
    table.color = true;
    for (size_t i = 0; i < 256; ++i)
        table.rgba[i] = palette()[i] | 0xFF000000;
    if (format == PIXMAN_c8)
        pixman_image_set_indexed(image.get(), &table);
    return image;
}

Image solid(uint32_t pixel) {
    const auto channel = [=](int shift) {
        return static_cast<uint16_t>((pixel >> shift & 0xFF) * 0x0101);
    };
    const pixman_color_t color = {channel(16), channel(8), channel(0), channel(24)};
    return {pixman_image_create_solid_fill(&color), pixman_image_unref};
}

Work composite(pixman_op_t op, const Image &src, const Image &mask, const Image &dst) {
    return [=, w = pixman_image_get_width(dst.get()), h = pixman_image_get_height(dst.get())] {
        pixman_image_composite32(op, src.get(), mask.get(), dst.get(), 0, 0, 0, 0, 0, 0, w, h);
    };
}

auto compositor(pixman_op_t op, pixman_format_code_t from, pixman_format_code_t to) {
    return [=](const Buffer &dst, const Buffer &src) {
        return composite(op, imageOf(src, from), {}, imageOf(dst, to));
    };
}

// A color through a mask of bits.
auto stencil(pixman_format_code_t format) {
    return [=](const Buffer &dst, const Buffer &src) {
        return composite(PIXMAN_OP_OVER, solid(kForeground), imageOf(src, PIXMAN_a1),
                         imageOf(dst, format));
    };
}

auto expand(pixman_format_code_t format) {
    return [=](const Buffer &dst, const Buffer &src) -> Work {
        const Work fill = composite(PIXMAN_OP_SRC, solid(kBackground), {}, imageOf(dst, format));
        return [fill, draw = stencil(format)(dst, src)] { fill(), draw(); };
    };
}

auto scale(pixman_filter_t filter) {
    return [=](const Buffer &dst, const Buffer &src) {
        const Image image = imageOf(src, PIXMAN_a8r8g8b8);
        const pixman_fixed_t step = pixman_double_to_fixed(double(src.width) / dst.width);
        pixman_transform_t transform;
        pixman_transform_init_scale(&transform, step, step);
        pixman_image_set_transform(image.get(), &transform);
        int count = 0;
        const std::unique_ptr<pixman_fixed_t, decltype(&free)> box(
            pixman_filter_create_separable_convolution(&count, step, step, PIXMAN_KERNEL_IMPULSE,
                                                       PIXMAN_KERNEL_IMPULSE, PIXMAN_KERNEL_BOX,
                                                       PIXMAN_KERNEL_BOX, 4, 4),
            free);
        const bool isBox = filter == PIXMAN_FILTER_SEPARABLE_CONVOLUTION;
        pixman_image_set_filter(image.get(), filter, isBox ? box.get() : nullptr,
                                isBox ? count : 0);
        pixman_image_set_repeat(image.get(), PIXMAN_REPEAT_PAD);
        return composite(PIXMAN_OP_SRC, image, {}, imageOf(dst, PIXMAN_a8r8g8b8));
    };
}

class PixmanRegion {
public:
    PixmanRegion() { pixman_region32_init(&region); }
    ~PixmanRegion() { pixman_region32_fini(&region); }
    PixmanRegion(const PixmanRegion &) = delete;
    PixmanRegion &operator=(const PixmanRegion &) = delete;

    void add(const RegionStep &step) {
        pixman_region32_union_rect(&region, &region, step.x, step.y, unsigned(step.width),
                                   unsigned(step.height));
    }
    void cut(const RegionStep &step) {
        pixman_region32_t hole;
        pixman_region32_init_rect(&hole, step.x, step.y, unsigned(step.width),
                                  unsigned(step.height));
        pixman_region32_subtract(&region, &region, &hole);
    }
    uint32_t area() {
        int count = 0;
        const pixman_box32_t *boxes = pixman_region32_rectangles(&region, &count);
        uint32_t sum = 0;
        for (const pixman_box32_t &box : std::span(boxes, size_t(count)))
            sum += uint32_t(box.x2 - box.x1) * uint32_t(box.y2 - box.y1);
        return sum;
    }

private:
    pixman_region32_t region;
};

} // namespace

std::string offerPixman(const Peer &peer) {
    for (const int bits : {8, 16, 32}) {
        const auto fill = [=](const Buffer &dst) {
            pixman_fill(reinterpret_cast<uint32_t *>(dst.data), dst.stride / 4, bits, 0, 0, dst.w(),
                        dst.h(), kPixel);
        };
        peer.offer(text("fill ", bits), fill, Kind::Exact);
    }
    const auto copy = compositor(PIXMAN_OP_SRC, PIXMAN_a8r8g8b8, PIXMAN_a8r8g8b8);
    peer.offer("copy 32", copy, Kind::Exact);
    peer.offer("blend *", compositor(PIXMAN_OP_OVER, PIXMAN_a8r8g8b8, PIXMAN_x8r8g8b8));
    constexpr struct {
        int32_t depth;
        pixman_format_code_t format;
    } kFormats[] = {{kIndex, PIXMAN_c8}, {3, PIXMAN_r3g3b2},    {6, PIXMAN_a2r2g2b2},
                    {8, PIXMAN_r3g3b2},  {15, PIXMAN_x1r5g5b5}, {16, PIXMAN_r5g6b5},
                    {24, PIXMAN_r8g8b8}, {32, PIXMAN_x8r8g8b8}};
    for (const auto &[depth, to] : kFormats) {
        for (const auto &[fromDepth, from] : kFormats)
            peer.offer(conversionName(fromDepth, depth), compositor(PIXMAN_OP_SRC, from, to));
        peer.offer(text("stencil * to ", depth), stencil(to));
        peer.offer(text("bits * to ", depth), expand(to));
    }
    peer.offer("nearest *", scale(PIXMAN_FILTER_NEAREST));
    peer.offer("linear *", scale(PIXMAN_FILTER_BILINEAR));
    peer.offer("box *", scale(PIXMAN_FILTER_SEPARABLE_CONVOLUTION));
    peer.offerRegions<PixmanRegion>();
    return pixman_version_string();
}

} // namespace quillon::bench
