#include "operations.h"

#include <hearth/hearth.h>

#include <algorithm>
#include <cstring>
#include <memory>
#include <stdexcept>

namespace quillon::bench {
namespace {

// One pass over the memory that an operation reads and writes.
Contender onePass(size_t read, size_t written) {
    return {"one pass", prepare([=, from = std::vector<uint8_t>(read, 1)] {
                const std::unique_ptr<uint8_t[]> to(new uint8_t[written]); // not cleared
                for (size_t done = 0; done < written; done += read)
                    std::memcpy(to.get() + done, from.data(), std::min(read, written - done));
                benchmark::DoNotOptimize(to.get());
                benchmark::ClobberMemory();
            }),
            Kind::Limit};
}

void writePng(DynBuf &file) {
    const ImageUtilPngOptions options = {6, false};
    if (!ImageUtil_ConstructPNGBuffer(&picture(), &options, &file))
        throw std::runtime_error("cannot write the picture as a PNG");
}

} // namespace

const ImageInfo &picture() {
    static ImageInfo image;
    static const bool isRead = ImageUtil_ReadPNG(&image, QUILLON_PICTURE, IMAGEUTIL_READ_ADD_ALPHA);
    if (!isRead)
        throw std::runtime_error("cannot read " QUILLON_PICTURE);
    return image;
}

std::span<const uint8_t> pngFile() {
    static DynBuf file;
    if (file.size == 0)
        writePng(file);
    return {reinterpret_cast<const uint8_t *>(file.data), file.size};
}

void addImages(Plan &plan) {
    const ImageInfo &image = picture();
    const size_t bytes = size_t{image.bytesPerLine} * image.height;
    const size_t croppedBytes = size_t{4} * (image.width - 100) * (image.height - 100);
    plan.area.name = text(image.width, "x", image.height);
    const auto add = [&](const char *name, const char *family, const auto &call) -> auto & {
        return plan.add(name, family, Traffic::None, {{8, noise}}, call).contenders;
    };
    add("PNG read", "PNG", [file = pngFile()] {
        ImageInfo read = {};
        ImageUtil_ReadPNGBuffer(&read, file.data(), static_cast<uint32_t>(file.size()),
                                IMAGEUTIL_READ_KEEP_ALPHA);
        ImageUtil_FreeImageData(&read);
    });
    add("PNG write", "PNG", [] {
        DynBuf file;
        writePng(file);
        DynBuf_Destroy(&file);
    });
    const auto writeBmp = [&image] {
        DynBuf file;
        ImageUtil_ConstructBMPBuffer(&image, &file);
        DynBuf_Destroy(&file);
    };
    const auto combine = [&image] {
        const ImageInfo images[] = {image, image};
        const RectPoint positions[] = {{0, 0}, {static_cast<int32_t>(image.width), 0}};
        ImageInfo combined = {};
        ImageUtil_Combine(images, positions, 2, &combined);
        ImageUtil_FreeImageData(&combined);
    };
    const auto crop = [&image] {
        ImageInfo cropped = {};
        ImageUtil_CropAndScaleImage(&image, 100, 100, -1, -1, 0, 0, -1, -1, &cropped);
        ImageUtil_FreeImageData(&cropped);
    };
    add("BMP write", "image", writeBmp).push_back(onePass(bytes, bytes));
    add("combine two", "image", combine).push_back(onePass(bytes, 2 * bytes));
    add("crop", "image", crop).push_back(onePass(croppedBytes, croppedBytes));
}

} // namespace quillon::bench
