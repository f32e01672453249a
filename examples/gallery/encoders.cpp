// PNG and BMP, to memory and back.
#include "rooms.h"

#include <hearth/hearth.h>

#include <algorithm>
#include <array>
#include <cstdlib>

namespace gallery {

namespace {

constexpr int32_t kSide = 160;

// An image of 8 bits a pixel, whose colours are in a palette.
Picture ofPalette() {
    constexpr std::array<ImageUtilColor, 4> kColours = {{{0x65, 0x49, 0x1B, 0},
                                                         {0xD3, 0xA8, 0x5F, 0},
                                                         {0xB0, 0xF3, 0xFF, 0},
                                                         {0x0C, 0x59, 0xE8, 0}}};
    ImageInfo info = {};
    info.width = info.height = info.bytesPerLine = kSide;
    info.depth = info.bpp = 8;
    info.numColors = kColours.size();
    std::copy(kColours.begin(), kColours.end(), info.palette);
    info.data = static_cast<uint8_t *>(std::calloc(kSide, kSide));
    if (!info.data)
        fail("no memory");
    Picture picture(info);
    for (uint32_t ring = 1; ring < kColours.size(); ++ring)
        Raster_RectFill(picture.data(), picture.step(), 1, ring, ring * 20, ring * 20,
                        kSide - ring * 40, kSide - ring * 40);
    return picture;
}

void check(bool isGood, const char *what) {
    if (!isGood)
        fail(std::string("an image cannot be ") + what);
}

// A file in memory, which is given back in the end.
class Bytes {
public:
    ~Bytes() { DynBuf_Destroy(&buffer); }
    DynBuf *get() { return &buffer; }
    std::string size() const { return std::to_string(buffer.size) + " bytes"; }

private:
    DynBuf buffer = {};
};

// Adds what is decoded of an encoded image.
void addPng(Sheet &sheet, const Picture &picture, bool stripAlpha, const std::string &label) {
    Bytes file;
    //! [encodePng]
    const ImageUtilPngOptions options = {9, stripAlpha}; // as small as can be
    check(ImageUtil_ConstructPNGBuffer(&picture.info(), &options, file.get()), "encoded");
    //! [encodePng]
    //! [decodePng]
    ImageInfo decoded = {};
    check(ImageUtil_ReadPNGBuffer(&decoded, reinterpret_cast<const uint8_t *>(file.get()->data),
                                  static_cast<uint32_t>(file.get()->size),
                                  IMAGEUTIL_READ_KEEP_ALPHA | IMAGEUTIL_READ_ADD_ALPHA),
          "decoded");
    //! [decodePng]
    Picture ground = blank(kSide, kSide, kPale);
    blend(ground, premultiplied(in32Bits(Picture(decoded))), 0, 0);
    sheet.add(std::move(ground), label + "\n" + file.size());
}

void addBmp(Sheet &sheet, const Picture &picture, const std::string &label) {
    Bytes file;
    //! [encodeBmp]
    check(ImageUtil_ConstructBMPBuffer(&picture.info(), file.get()), "encoded");
    //! [encodeBmp]
    sheet.add(copyOf(picture), label + "\n" + file.size());
}

} // namespace

void showEncoders(Page &page, const Material &material) {
    page.room("Encoders", "Images as PNG and BMP in memory, ready to be sent or stored.");
    const Picture photo = covering(material.photo, kSide, kSide);
    Sheet sheet(4);
    addPng(sheet, resized(material.sprite, kSide, kSide), false, "PNG with alpha");
    addPng(sheet, photo, true, "PNG without");
    addPng(sheet, ofPalette(), true, "PNG with a palette");
    addBmp(sheet, photo, "BMP, 24 bits a pixel");
    page.show(sheet,
              {"encoders",
               "A marble with soft edges, a landscape, squares of four colours, and the landscape "
               "again, each with the size of its file.",
               "`ImageUtil_ConstructPNGBuffer` and `ImageUtil_ConstructBMPBuffer`. What the PNG "
               "show has been encoded, and decoded from memory by `ImageUtil_ReadPNGBuffer`; BMP "
               "is written only.",
               {"encodePng", "decodePng", "encodeBmp"}});
}

} // namespace gallery
