// Makes a gallery of what the library does: a page, and the pictures it shows.
//
//     gallery PICTURE.png SPRITE.png FOLDER
#include "rooms.h"

#include <cstdio>
#include <exception>
#include <string>

namespace gallery {

namespace {

Material materialFrom(const std::string &photoFile, const std::string &spriteFile) {
    // What is transparent in the photo shows white.
    const Picture photo = premultiplied(read(photoFile));
    Picture ground = blank(photo.width(), photo.height(), kWhite);
    blend(ground, photo, 0, 0);
    return {std::move(ground), premultiplied(read(spriteFile))};
}

void makeGallery(const Material &material, const std::string &folder) {
    Page page(folder);
    showFills(page, material);
    showRasterOperations(page);
    showText(page, material);
    showLayouts(page, material);
    showScaling(page, material);
    showBlending(page, material);
    showCursors(page, material);
    showVideo(page, material);
    showColorKey(page, material);
    showRects(page);
    showRegions(page);
    showImages(page, material);
    showEncoders(page, material);
    showFiles(page, material);
    page.finish();
}

} // namespace

} // namespace gallery

int main(int argc, char **argv) {
    if (argc != 4) {
        std::fputs("usage: gallery PICTURE.png SPRITE.png FOLDER\n", stderr);
        return 2;
    }
    try {
        gallery::makeGallery(gallery::materialFrom(argv[1], argv[2]), std::string(argv[3]) + "/");
        return 0;
    } catch (const std::exception &error) {
        std::fprintf(stderr, "gallery: %s\n", error.what());
        return 1;
    }
}
