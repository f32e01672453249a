// Lines of the gallery's own source, to be shown below the pictures that they made.
#ifndef GALLERY_SNIPPET_H
#define GALLERY_SNIPPET_H

#include <string>
#include <string_view>

namespace gallery {

// The files that have snippets, whole; the last is null.  The build makes this list.
extern const char *const kListings[];

// The lines between the two comments "//! [name]", indented no more than they have to be.
std::string snippet(std::string_view name);

} // namespace gallery

#endif // GALLERY_SNIPPET_H
