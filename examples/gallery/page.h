// The page that shows the pictures: one HTML file, with the pictures beside it.
#ifndef GALLERY_PAGE_H
#define GALLERY_PAGE_H

#include "picture.h"

#include <string>

namespace gallery {

class Page {
public:
    explicit Page(std::string folderName) : folder(std::move(folderName)) {}

    // Texts are plain, apart from `names` of functions.
    void room(const std::string &title, const std::string &text);
    // Writes a picture to NAME.png and shows it.
    void show(const Picture &picture, const std::string &name, const std::string &caption);
    // Writes a picture to a file, in the format its name ends in, and links it.
    void link(const Picture &picture, const std::string &fileName);
    void finish() const;

private:
    void save(const Picture &picture, const std::string &fileName) const;

    std::string folder;
    std::string contents, body;
    int rooms = 0;
};

} // namespace gallery

#endif // GALLERY_PAGE_H
