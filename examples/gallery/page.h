// The page that shows the pictures: one HTML file, with the pictures beside it.
#ifndef GALLERY_PAGE_H
#define GALLERY_PAGE_H

#include "picture.h"
#include "sheet.h"

#include <string>
#include <vector>

namespace gallery {

// What the page says of a picture.  Texts are plain, apart from `names` of functions.
struct Exhibit {
    std::string name;        // of its file, without the suffix
    std::string alternative; // what there is to see, for those who do not see it
    std::string caption;
    std::vector<std::string> snippets; // marked in the source: what made it
};

class Page {
public:
    explicit Page(std::string folderName) : folder(std::move(folderName)) {}

    void room(const std::string &title, const std::string &text);
    // Writes a picture to a file and shows it.
    void show(const Picture &picture, const Exhibit &exhibit);
    // With another one in its place where the window is narrow.
    void show(const Picture &wide, const Picture &narrow, const Exhibit &exhibit);
    void show(const Sheet &sheet, const Exhibit &exhibit);
    // Writes a picture to a file, in the format its name ends in, and links it.
    void link(const Picture &picture, const std::string &fileName);
    void finish() const;

private:
    void save(const Picture &picture, const std::string &fileName) const;
    // A figure around the HTML of a picture.
    void frame(const std::string &picture, const Exhibit &exhibit);

    std::string folder;
    std::string contents, body;
    int rooms = 0;
};

} // namespace gallery

#endif // GALLERY_PAGE_H
