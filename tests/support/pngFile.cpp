#include "support/pngFile.h"

#include <gtest/gtest.h>

#include <cstring>

namespace quillon::test {
namespace {

constexpr png_byte kTransparency[4] = {0, 64, 128, 255};

void appendBytes(png_structp png, png_bytep bytes, size_t length) {
    auto &file = *static_cast<std::vector<uint8> *>(png_get_io_ptr(png));
    file.insert(file.end(), bytes, bytes + length);
}

struct Input {
    const uint8 *next;
    size_t left;
};

void takeBytes(png_structp png, png_bytep bytes, size_t length) {
    auto &input = *static_cast<Input *>(png_get_io_ptr(png));
    if (length > input.left) {
        png_error(png, "the file ends early");
    }
    std::memcpy(bytes, input.next, length);
    input.next += length;
    input.left -= length;
}

void setChunks(png_structp png, png_infop info, const PngPicture &picture) {
    png_set_IHDR(png, info, picture.width, picture.height, picture.bitDepth, picture.colorType,
                 picture.interlaced ? PNG_INTERLACE_ADAM7 : PNG_INTERLACE_NONE,
                 PNG_COMPRESSION_TYPE_DEFAULT, PNG_FILTER_TYPE_DEFAULT);
    if (!picture.palette.empty()) {
        png_set_PLTE(png, info, picture.palette.data(), static_cast<int>(picture.palette.size()));
    }
    if (picture.hasTransparency && picture.colorType == PNG_COLOR_TYPE_PALETTE) {
        png_set_tRNS(png, info, kTransparency, 2, nullptr);
    } else if (picture.hasTransparency) {
        const uint16 *const first = picture.pixel(0, 0);
        const png_color_16 key = {0, first[0], first[1], first[2], 0};
        png_set_tRNS(png, info, nullptr, 0, &key);
    }
}

// The samples of a row as libpng takes and gives them once bits are unpacked.
std::vector<uint8> rowBytes(const PngPicture &picture, uint32 y) {
    std::vector<uint8> bytes;
    const uint16 *const first = picture.pixel(0, y);
    for (uint32 i = 0; i < picture.width * picture.channels(); ++i) {
        if (picture.bitDepth == 16) {
            bytes.push_back(static_cast<uint8>(first[i] >> 8));
        }
        bytes.push_back(static_cast<uint8>(first[i]));
    }
    return bytes;
}

} // namespace

uint32 PngPicture::channels() const {
    if (colorType == PNG_COLOR_TYPE_PALETTE) {
        return 1;
    }
    return ((colorType & PNG_COLOR_MASK_COLOR) != 0 ? 3 : 1) +
           ((colorType & PNG_COLOR_MASK_ALPHA) != 0 ? 1 : 0);
}

PngPicture randomPicture(Random &random, uint32 width, uint32 height, int colorType, int bitDepth,
                         bool interlaced) {
    PngPicture picture;
    picture.width = width;
    picture.height = height;
    picture.colorType = colorType;
    picture.bitDepth = bitDepth;
    picture.interlaced = interlaced;
    uint32 sampleRange = 1u << bitDepth;
    if (colorType == PNG_COLOR_TYPE_PALETTE) {
        sampleRange = 2 + random.below(sampleRange - 1);
        picture.palette.resize(sampleRange);
        random.fill(picture.palette.data(), sizeof(png_color) * sampleRange);
    }
    picture.samples.resize(size_t{width} * height * picture.channels());
    for (uint16 &sample : picture.samples) {
        sample = static_cast<uint16>(random.below(sampleRange));
    }
    return picture;
}

std::vector<uint8> encodePng(const PngPicture &picture) {
    std::vector<uint8> file;
    png_structp png = png_create_write_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr);
    png_infop info = png_create_info_struct(png);
    png_set_write_fn(png, &file, appendBytes, nullptr);
    setChunks(png, info, picture);
    if (picture.samples.empty()) {
        png_write_info(png, info);
        constexpr png_byte kZlibHeader[2] = {0x78, 0x9C};
        png_write_chunk(png, reinterpret_cast<png_const_bytep>("IDAT"), kZlibHeader, 2);
    } else {
        std::vector<std::vector<uint8>> rows;
        std::vector<png_bytep> pointers;
        for (uint32 y = 0; y < picture.height; ++y) {
            pointers.push_back(rows.emplace_back(rowBytes(picture, y)).data());
        }
        png_set_rows(png, info, pointers.data());
        png_write_png(png, info, PNG_TRANSFORM_PACKING, nullptr);
    }
    png_destroy_write_struct(&png, &info);
    return file;
}

PngPicture decodePng(const void *data, size_t size) {
    Input input = {static_cast<const uint8 *>(data), size};
    PngPicture picture;
    png_structp png = png_create_read_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr);
    png_infop info = png_create_info_struct(png);
    png_set_read_fn(png, &input, takeBytes);
    png_read_png(png, info, PNG_TRANSFORM_PACKING, nullptr);
    EXPECT_EQ(input.left, 0u) << "bytes behind the end of the PNG";

    picture.width = png_get_image_width(png, info);
    picture.height = png_get_image_height(png, info);
    picture.colorType = png_get_color_type(png, info);
    picture.bitDepth = png_get_bit_depth(png, info);
    picture.interlaced = png_get_interlace_type(png, info) != PNG_INTERLACE_NONE;
    png_colorp colors = nullptr;
    int count = 0;
    if (png_get_PLTE(png, info, &colors, &count) != 0) {
        picture.palette.assign(colors, colors + count);
    }
    const png_bytepp rows = png_get_rows(png, info);
    for (uint32 y = 0; y < picture.height; ++y) {
        picture.samples.insert(picture.samples.end(), rows[y],
                               rows[y] + picture.width * picture.channels());
    }
    png_destroy_read_struct(&png, &info, nullptr);
    return picture;
}

} // namespace quillon::test
