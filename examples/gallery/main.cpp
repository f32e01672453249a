// Makes a gallery of what the library does: a page, and the pictures it shows.
//
//     gallery PICTURE.png SPRITE.png FOLDER
#include "rooms.h"

#include <quillon/version.h>

#include <cstdio>
#include <exception>
#include <string>
#include <string_view>

namespace gallery {

namespace {

constexpr char kHelp[] =
    "usage: gallery PICTURE.png SPRITE.png FOLDER\n"
    "\n"
    "Makes a gallery of what libquillon does in FOLDER, which must exist: index.html, and the\n"
    "pictures that it shows, of PICTURE.png, and of SPRITE.png, which has alpha.\n"
    "\n"
    "  --help, --version   show this text; show the version\n";

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
    const std::string_view option = argc == 2 ? argv[1] : "";
    if (option == "--help")
        return std::fputs(gallery::kHelp, stdout) < 0;
    if (option == "--version")
        return std::puts("gallery " QUILLON_VERSION_STRING) < 0;
    if (argc != 4)
        return std::fputs(gallery::kHelp, stderr), 2;
    try {
        gallery::makeGallery(gallery::materialFrom(argv[1], argv[2]), std::string(argv[3]) + "/");
        return 0;
    } catch (const std::exception &error) {
        std::fprintf(stderr, "gallery: %s\n", error.what());
        return 1;
    }
}
