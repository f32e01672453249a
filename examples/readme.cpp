#include <quillon/quillon.hpp>

#include <cstdio>

// A PNG, 320 pixels across, as a card: on white, in a frame, with a shadow.
int main(int argc, char **argv) {
    if (argc != 3) {
        std::fprintf(stderr, "usage: %s IN.png OUT.png\n", argv[0]);
        return 2;
    }
    std::optional<quillon::Image> photo = quillon::Image::readPng(argv[1]);
    if (!photo) {
        std::fprintf(stderr, "%s cannot be read, or is not a PNG in colour\n", argv[1]);
        return 1;
    }
    const int height = std::max(1, 320 * photo->height() / photo->width());
    std::optional<quillon::Image> picture = quillon::Image::create({320, height});
    std::optional<quillon::Image> card = quillon::Image::create({352, height + 32});
    photo->premultiply(); // as scaling and blending expect it
    if (!picture || !card || !picture->copyScaled(picture->bounds(), *photo)) {
        std::fprintf(stderr, "%s is too large to be scaled\n", argv[1]);
        return 1;
    }
    const quillon::Rect frame = quillon::Rect({16, 16}, picture->size()).grown(1);
    card->fill({255, 255, 255});
    card->fill(frame.translated({4, 4}), {208, 208, 208});
    card->fill(frame, {64, 64, 64});
    card->fill(frame.grown(-1), {255, 255, 255});
    card->blend({16, 16}, *picture);
    if (!card->writePng(argv[2], quillon::Alpha::kDrop)) {
        std::fprintf(stderr, "%s cannot be written\n", argv[2]);
        return 1;
    }
}
