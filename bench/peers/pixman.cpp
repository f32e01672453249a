// pixman: fills, composition, conversion through its formats, scaling.
#include "../operations/names.h"
#include "../operations/operations.h"
#include "../operations/rectSequences.h"
#include "peers.h"

#include <memory>
#include <pixman.h>

namespace quillon::bench {
namespace {

using Image = std::shared_ptr<pixman_image_t>;

Image imageOf(const Buffer &buffer, pixman_format_code_t format) {
    return {pixman_image_create_bits(format, static_cast<int>(buffer.width),
                                     static_cast<int>(buffer.height),
                                     reinterpret_cast<uint32_t *>(buffer.data), buffer.line()),
            pixman_image_unref};
}

Image solid(uint32_t pixel) {
    const auto channel = [pixel](int shift) {
        return static_cast<uint16_t>((pixel >> shift & 0xFF) * 0x0101);
    };
    const pixman_color_t colour = {channel(16), channel(8), channel(0), channel(24)};
    return {pixman_image_create_solid_fill(&colour), pixman_image_unref};
}

Work composite(pixman_op_t op, const Image &src, const Image &mask, const Image &dst,
               const Buffer &size) {
    return [=, width = static_cast<uint16_t>(size.width),
            height = static_cast<uint16_t>(size.height)] {
        pixman_image_composite32(op, src.get(), mask.get(), dst.get(), 0, 0, 0, 0, 0, 0, width,
                                 height);
    };
}

Work fill(const Job &job, int bits) {
    return [dst = job.dst, bits] {
        pixman_fill(reinterpret_cast<uint32_t *>(dst.data), static_cast<int>(dst.step / 4), bits, 0,
                    0, static_cast<int>(dst.width), static_cast<int>(dst.height), kPixel);
    };
}

struct Format {
    int32_t depth;
    pixman_format_code_t src, dst;
};
constexpr Format kFormats[] = {
    {kIndex, PIXMAN_c8, PIXMAN_c8},         {3, PIXMAN_r3g3b2, PIXMAN_r3g3b2},
    {6, PIXMAN_a2r2g2b2, PIXMAN_a2r2g2b2},  {8, PIXMAN_r3g3b2, PIXMAN_r3g3b2},
    {15, PIXMAN_x1r5g5b5, PIXMAN_x1r5g5b5}, {16, PIXMAN_r5g6b5, PIXMAN_r5g6b5},
    {24, PIXMAN_r8g8b8, PIXMAN_r8g8b8},     {32, PIXMAN_x8r8g8b8, PIXMAN_x8r8g8b8},
};

const pixman_indexed_t *indexed() {
    static const pixman_indexed_t table = [] {
        pixman_indexed_t made = {};
        made.color = true;
        for (size_t i = 0; i < 256; ++i)
            made.rgba[i] = palette()[i] | 0xFF000000;
        return made;
    }();
    return &table;
}

void offerConversions(Offers &offers) {
    for (const Format &from : kFormats) {
        for (const Format &to : kFormats) {
            offers[conversionName(from.depth, to.depth)].push_back(
                {"pixman", Agreement::Approximate, [=](const Job &job) -> Work {
                     const Image src = imageOf(job.src(), from.src);
                     if (from.depth == kIndex)
                         pixman_image_set_indexed(src.get(), indexed());
                     return composite(PIXMAN_OP_SRC, src, {}, imageOf(job.dst, to.dst), job.dst);
                 }});
        }
    }
}

// Letters of a colour: through a mask of bits, over a ground where there is one.
void offerBits(Offers &offers) {
    constexpr struct {
        int bits;
        pixman_format_code_t format;
    } kDepths[] = {
        {8, PIXMAN_r3g3b2}, {16, PIXMAN_r5g6b5}, {24, PIXMAN_r8g8b8}, {32, PIXMAN_x8r8g8b8}};
    for (const auto &depth : kDepths) {
        const auto stencil = [format = depth.format](const Job &job) -> Work {
            return composite(PIXMAN_OP_OVER, solid(kForeground), imageOf(job.src(), PIXMAN_a1),
                             imageOf(job.dst, format), job.dst);
        };
        for (const char *content : {"text", "noise", "sparse"})
            offers["stencil " + std::string(content) + " to " + std::to_string(depth.bits)]
                .push_back({"pixman", Agreement::Approximate, stencil});
        offers["bits noise to " + std::to_string(depth.bits)].push_back(
            {"pixman", Agreement::Approximate, [=, format = depth.format](const Job &job) -> Work {
                 const Image dst = imageOf(job.dst, format);
                 const Work ground = composite(PIXMAN_OP_SRC, solid(kBackground), {}, dst, job.dst);
                 const Work letters = stencil(job);
                 return [=] {
                     ground();
                     letters();
                 };
             }});
    }
}

Work scale(const Job &job, double factor, pixman_filter_t filter) {
    const Image src = imageOf(job.src(), PIXMAN_a8r8g8b8);
    pixman_transform_t transform;
    pixman_transform_init_scale(&transform, pixman_double_to_fixed(1 / factor),
                                pixman_double_to_fixed(1 / factor));
    pixman_image_set_transform(src.get(), &transform);
    if (filter == PIXMAN_FILTER_SEPARABLE_CONVOLUTION) {
        int count = 0;
        const pixman_fixed_t step = pixman_double_to_fixed(1 / factor);
        const std::unique_ptr<pixman_fixed_t, decltype(&free)> parameters(
            pixman_filter_create_separable_convolution(&count, step, step, PIXMAN_KERNEL_IMPULSE,
                                                       PIXMAN_KERNEL_IMPULSE, PIXMAN_KERNEL_BOX,
                                                       PIXMAN_KERNEL_BOX, 4, 4),
            free);
        pixman_image_set_filter(src.get(), filter, parameters.get(), count);
    } else {
        pixman_image_set_filter(src.get(), filter, nullptr, 0);
    }
    pixman_image_set_repeat(src.get(), PIXMAN_REPEAT_PAD);
    return composite(PIXMAN_OP_SRC, src, {}, imageOf(job.dst, PIXMAN_a8r8g8b8), job.dst);
}

void offerScaling(Offers &offers) {
    const auto offer = [&](const char *name, double factor, pixman_filter_t filter) {
        offers[scaleName(name, factor)].push_back(
            {"pixman", Agreement::Approximate,
             [=](const Job &job) -> Work { return scale(job, factor, filter); }});
    };
    for (const double factor : kNearestFactors)
        offer("nearest", factor, PIXMAN_FILTER_NEAREST);
    for (const double factor : kLinearFactors)
        offer("linear", factor, PIXMAN_FILTER_BILINEAR);
    for (const double factor : kBoxFactors)
        offer("box", factor, PIXMAN_FILTER_SEPARABLE_CONVOLUTION);
}

void offerRectLists(Offers &offers) {
    for (const RectSequence &sequence : rectSequences()) {
        offers["rectangles " + sequence.name].push_back(
            {"pixman", Agreement::Approximate, [&](const Job & /*job*/) -> Work {
                 return [&steps = sequence.steps] {
                     pixman_region32_t region;
                     pixman_region32_init(&region);
                     for (const ListStep &step : steps) {
                         const auto width = static_cast<unsigned>(step.width);
                         const auto height = static_cast<unsigned>(step.height);
                         if (!step.cut) {
                             pixman_region32_union_rect(&region, &region, step.x, step.y, width,
                                                        height);
                             continue;
                         }
                         pixman_region32_t hole;
                         pixman_region32_init_rect(&hole, step.x, step.y, width, height);
                         pixman_region32_subtract(&region, &region, &hole);
                     }
                     benchmark::DoNotOptimize(region);
                     pixman_region32_fini(&region);
                 };
             }});
    }
}

} // namespace

void offerPixman(Offers &offers) {
    for (const int bits : {8, 16, 32}) {
        offers["fill " + std::to_string(bits)].push_back(
            {"pixman", Agreement::Exact, [=](const Job &job) { return fill(job, bits); }});
    }
    offers["copy 32"].push_back({"pixman", Agreement::Exact, [](const Job &job) -> Work {
                                     return composite(PIXMAN_OP_SRC,
                                                      imageOf(job.src(), PIXMAN_a8r8g8b8), {},
                                                      imageOf(job.dst, PIXMAN_a8r8g8b8), job.dst);
                                 }});
    for (const char *content : {"noise", "interface"}) {
        offers["blend " + std::string(content)].push_back(
            {"pixman", Agreement::Approximate, [](const Job &job) -> Work {
                 return composite(PIXMAN_OP_OVER, imageOf(job.src(), PIXMAN_a8r8g8b8), {},
                                  imageOf(job.dst, PIXMAN_x8r8g8b8), job.dst);
             }});
    }
    offerConversions(offers);
    offerBits(offers);
    offerScaling(offers);
    offerRectLists(offers);
}

} // namespace quillon::bench
