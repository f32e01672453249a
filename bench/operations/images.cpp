// PNG beside libpng called directly; BMP, combining and cropping beside one pass
// over their memory.
#include "operations.h"

#include "imageUtil.h"
#include "picture.h"

#include <algorithm>
#include <cstring>

namespace quillon::bench {
namespace {

// The memory that a function reads and writes, moved once.
Contender memoryPass(size_t read, size_t written) {
    return {"one pass", Agreement::Approximate, [=](const Job & /*job*/) -> Work {
                return [=, from = std::vector<uint8>(read, 1)] {
                    auto *to = static_cast<uint8 *>(std::malloc(written));
                    for (size_t done = 0; done < written; done += read)
                        std::memcpy(to + done, from.data(), std::min(read, written - done));
                    benchmark::DoNotOptimize(to);
                    benchmark::ClobberMemory();
                    std::free(to);
                };
            }};
}

void add(Plan &plan, const std::string &name, const std::string &family, const Work &work,
         const std::vector<Contender> &others) {
    const Area area = {"480x320", 64, 1, 0, false};
    Operation operation = {name, family, area, {plane(area, 8, noise)}, Traffic::None, {}};
    operation.contenders.push_back(
        {"quillon", Agreement::Exact, [=](const Job & /*job*/) { return work; }});
    operation.contenders.insert(operation.contenders.end(), others.begin(), others.end());
    plan.push_back(operation);
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
            const RectPoint positions[] = {{0, 0}, {static_cast<int32>(image.width), 0}};
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
            ImageUtil_ReadPNGBuffer(&read, file.data(), static_cast<uint32>(file.size()),
                                    IMAGEUTIL_READ_KEEP_ALPHA);
            ImageUtil_FreeImageData(&read);
        },
        {});
    add(plan, "PNG write", "PNG",
        [] {
            const ImageUtilPngOptions options = {kPngLevel, false};
            DynBuf buffer;
            ImageUtil_ConstructPNGBuffer(&picture(), &options, &buffer);
            DynBuf_Destroy(&buffer);
        },
        {});
}

} // namespace

void addImages(Plan &plan) {
    addPng(plan);
    addBmp(plan);
    addCombine(plan);
    addCrop(plan);
}

} // namespace quillon::bench
