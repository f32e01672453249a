// PNG beside libpng called directly; BMP, combining and cropping beside one pass
// over their memory.
#include <hearth/hearth.h>
#include "operations.h"

#include <quillon/imageUtil.h>
#include "picture.h"

#include <algorithm>
#include <cstring>
#include <memory>
#include <png.h>

namespace quillon::bench {
namespace {

// The memory that a function reads and writes, moved once.
Contender memoryPass(size_t read, size_t written) {
    return {"one pass", Agreement::Approximate, [=](const Job & /*job*/) -> Work {
                return [=, from = std::vector<uint8_t>(read, 1)] {
                    const std::unique_ptr<uint8_t[]> to(new uint8_t[written]); // not cleared
                    for (size_t done = 0; done < written; done += read)
                        std::memcpy(to.get() + done, from.data(), std::min(read, written - done));
                    benchmark::DoNotOptimize(to.get());
                    benchmark::ClobberMemory();
                };
            }};
}

void add(Plan &plan, const std::string &name, const std::string &family, const Work &work,
         const std::vector<Contender> &others) {
    static const std::string size =
        std::to_string(picture().width) + "x" + std::to_string(picture().height);
    const Area area = {size.c_str(), 64, 1, 0, false};
    Operation operation = {name, family, area, {plane(area, 8, noise)}, Traffic::None, {}};
    operation.contenders.push_back(
        {"quillon", Agreement::Exact, [=](const Job & /*job*/) { return work; }});
    operation.contenders.insert(operation.contenders.end(), others.begin(), others.end());
    plan.push_back(operation);
}

// libpng called as directly as can be; what fails ends the program.
struct Reading {
    const uint8_t *next;
};

Work readDirectly() {
    return [] {
        Reading reading = {pngFile().data()};
        png_structp png = png_create_read_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr);
        png_infop info = png_create_info_struct(png);
        png_set_read_fn(png, &reading, [](png_structp reader, png_bytep to, size_t length) {
            auto &from = *static_cast<Reading *>(png_get_io_ptr(reader));
            std::memcpy(to, from.next, length);
            from.next += length;
        });
        png_read_info(png, info);
        png_set_bgr(png);
        const size_t rowBytes = png_get_rowbytes(png, info);
        const uint32_t height = png_get_image_height(png, info);
        const std::unique_ptr<uint8_t[]> pixels(new uint8_t[rowBytes * height]); // not cleared
        std::vector<png_bytep> rows;
        for (uint32_t y = 0; y < height; ++y)
            rows.push_back(pixels.get() + y * rowBytes);
        png_read_image(png, rows.data());
        png_read_end(png, nullptr);
        png_destroy_read_struct(&png, &info, nullptr);
        benchmark::DoNotOptimize(pixels.get());
    };
}

Work writeDirectly() {
    return [] {
        const ImageInfo &image = picture();
        std::vector<uint8_t> file;
        png_structp png = png_create_write_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr);
        png_infop info = png_create_info_struct(png);
        png_set_write_fn(
            png, &file,
            [](png_structp writer, png_bytep from, size_t length) {
                auto &to = *static_cast<std::vector<uint8_t> *>(png_get_io_ptr(writer));
                to.insert(to.end(), from, from + length);
            },
            nullptr);
        png_set_IHDR(png, info, image.width, image.height, 8, PNG_COLOR_TYPE_RGB_ALPHA,
                     PNG_INTERLACE_NONE, PNG_COMPRESSION_TYPE_DEFAULT, PNG_FILTER_TYPE_DEFAULT);
        png_set_compression_level(png, kPngLevel);
        png_set_bgr(png);
        png_write_info(png, info);
        std::vector<png_bytep> rows;
        for (uint32_t y = 0; y < image.height; ++y)
            rows.push_back(image.data + size_t{y} * image.bytesPerLine);
        png_write_image(png, rows.data());
        png_write_end(png, nullptr);
        png_destroy_write_struct(&png, &info);
        benchmark::DoNotOptimize(file.data());
    };
}

Contender libpng(const Work &work) {
    return {"libpng", Agreement::Approximate, [=](const Job & /*job*/) { return work; }};
}

void addBmp(Plan &plan) {
    const ImageInfo &image = picture();
    const size_t bytes = size_t{image.bytesPerLine} * image.height;
    add(plan, "BMP write", "image",
        [&image] {
            DynBuf buffer;
            ImageUtil_ConstructBMPBuffer(&image, &buffer);
            DynBuf_Destroy(&buffer);
        },
        {memoryPass(bytes, bytes)});
}

void addCombine(Plan &plan) {
    const ImageInfo &image = picture();
    const size_t bytes = size_t{image.bytesPerLine} * image.height;
    add(plan, "combine two", "image",
        [&image] {
            const ImageInfo images[] = {image, image};
            const RectPoint positions[] = {{0, 0}, {static_cast<int32_t>(image.width), 0}};
            ImageInfo combined = {};
            ImageUtil_Combine(images, positions, 2, &combined);
            ImageUtil_FreeImageData(&combined);
        },
        {memoryPass(bytes, 2 * bytes)});
}

void addCrop(Plan &plan) {
    const ImageInfo &image = picture();
    const size_t bytes = size_t{4} * (image.width - 100) * (image.height - 100);
    add(plan, "crop", "image",
        [&image] {
            ImageInfo cropped = {};
            ImageUtil_CropAndScaleImage(&image, 100, 100, -1, -1, 0, 0, -1, -1, &cropped);
            ImageUtil_FreeImageData(&cropped);
        },
        {memoryPass(bytes, bytes)});
}

void addPng(Plan &plan) {
    const auto &file = pngFile();
    add(plan, "PNG read", "PNG",
        [&file] {
            ImageInfo read = {};
            ImageUtil_ReadPNGBuffer(&read, file.data(), static_cast<uint32_t>(file.size()),
                                    IMAGEUTIL_READ_KEEP_ALPHA);
            ImageUtil_FreeImageData(&read);
        },
        {libpng(readDirectly())});
    add(plan, "PNG write", "PNG",
        [] {
            const ImageUtilPngOptions options = {kPngLevel, false};
            DynBuf buffer;
            ImageUtil_ConstructPNGBuffer(&picture(), &options, &buffer);
            DynBuf_Destroy(&buffer);
        },
        {libpng(writeDirectly())});
}

} // namespace

void addImages(Plan &plan) {
    addPng(plan);
    addBmp(plan);
    addCombine(plan);
    addCrop(plan);
}

} // namespace quillon::bench
