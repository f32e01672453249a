// The rooms of the gallery.  Each puts its exhibits on the page.
#ifndef GALLERY_ROOMS_H
#define GALLERY_ROOMS_H

#include "page.h"
#include "picture.h"

namespace gallery {

// What there is to work on.
struct Material {
    Picture photo;  // opaque, of any size
    Picture sprite; // premultiplied
};

void showFills(Page &page, const Material &material);
void showRasterOperations(Page &page);
void showText(Page &page, const Material &material);
void showLayouts(Page &page, const Material &material);
void showScaling(Page &page, const Material &material);
void showBlending(Page &page, const Material &material);
void showCursors(Page &page, const Material &material);
void showVideo(Page &page, const Material &material);
void showColorKey(Page &page, const Material &material);
void showRects(Page &page);
void showRegions(Page &page);
void showImages(Page &page, const Material &material);
void showEncoders(Page &page, const Material &material);
// Plain files, as a program that handles pictures would make them.
void showFiles(Page &page, const Material &material);

} // namespace gallery

#endif // GALLERY_ROOMS_H
