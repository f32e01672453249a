#include "page.h"
#include "snippet.h"

#include <fstream>

namespace gallery {

namespace {

constexpr const char *kHead = R"(<!DOCTYPE html>
<html lang="en">
<meta charset="utf-8">
<meta name="viewport" content="width=device-width, initial-scale=1">
<title>libquillon: a gallery</title>
<style>
:root { color-scheme: light; --ink: #1f2a36; --soft: #5b6875; --line: #dde3e9; --blue: #2f6690 }
* { box-sizing: border-box }
body { margin: 0; background: #f3f5f7; color: var(--ink);
       font: 16px/1.55 system-ui, -apple-system, "Segoe UI", sans-serif }
main { max-width: 52rem; margin: 0 auto; padding: 2.5rem 1.25rem 4rem }
h1 { margin: 0; font-size: 2rem; line-height: 1.2 }
h2 { margin: 3.5rem 0 .25rem; font-size: 1.4rem; scroll-margin-top: 1rem }
p { margin: .25rem 0 1rem; max-width: 46rem }
nav { display: flex; flex-wrap: wrap; gap: .5rem; margin-top: 1.25rem }
a { color: var(--blue) }
nav a { padding: .15rem .75rem; border: 1px solid var(--line); border-radius: 1rem;
        background: #fff; text-decoration: none }
nav a:hover { border-color: var(--blue) }
figure { margin: 1rem 0; padding: 1.25rem; border: 1px solid var(--line); border-radius: .5rem;
         background: #fff }
figure a { display: block }
img { display: block; max-width: 100%; height: auto }
figcaption { max-width: 46rem; margin-top: .9rem; color: var(--soft); font-size: .925rem }
code { font: .9em ui-monospace, Consolas, "DejaVu Sans Mono", monospace; color: var(--ink) }
/* Code that goes on beyond an edge has a shadow there, which scrolls away. */
pre { margin: .9rem 0 0; padding: .75rem 1rem; overflow-x: auto; font-size: .875rem;
      line-height: 1.45; border-radius: .25rem;
      background: linear-gradient(90deg, #f3f5f7 50%, #f3f5f700) 0 0 / 3rem 100% no-repeat local,
                  linear-gradient(270deg, #f3f5f7 50%, #f3f5f700) 100% 0 / 3rem 100% no-repeat local,
                  linear-gradient(90deg, #1f2a3640, #1f2a3600) 0 0 / .75rem 100% no-repeat scroll,
                  linear-gradient(270deg, #1f2a3640, #1f2a3600) 100% 0 / .75rem 100% no-repeat scroll
                  #f3f5f7 }
@media (max-width: 30rem) { main { padding: 1.5rem .5rem 3rem } figure { padding: .5rem } }
.file { display: inline-block; margin: 0 1rem .25rem 0 }
</style>
<main>
<h1>libquillon: a gallery</h1>
<p>Every picture here was drawn by the library, the lettering in it too, by the lines
of <code>examples/gallery</code> that stand below it. A picture opens in its true size at a click.</p>
)";

// Text as HTML, with what stands between backticks as code.
std::string markup(const std::string &text) {
    std::string html;
    bool code = false;
    for (const char c : text) {
        if (c == '`') {
            html += code ? "</code>" : "<code>";
            code = !code;
        } else if (c == '<') {
            html += "&lt;";
        } else if (c == '&') {
            html += "&amp;";
        } else if (c == '"') {
            html += "&quot;";
        } else {
            html += c;
        }
    }
    return html;
}

// Up to how wide a window is narrow, and what fits one.
constexpr const char *kNarrowWindow = "(max-width: 48rem)";
constexpr int32_t kNarrow = 360;

std::string sizeOf(const Picture &picture) {
    return " width=\"" + std::to_string(picture.width()) + "\" height=\"" +
           std::to_string(picture.height()) + "\"";
}

std::string imageOf(const Picture &picture, const Exhibit &exhibit) {
    return "<img src=\"" + exhibit.name + ".png\" alt=\"" + markup(exhibit.alternative) + "\"" +
           sizeOf(picture) + ">";
}

} // namespace

void Page::room(const std::string &title, const std::string &text) {
    const std::string id = "room" + std::to_string(++rooms);
    contents += "<a href=\"#" + id + "\">" + markup(title) + "</a>\n";
    body += "<h2 id=\"" + id + "\">" + markup(title) + "</h2>\n<p>" + markup(text) + "</p>\n";
}

void Page::show(const Picture &picture, const Exhibit &exhibit) {
    save(picture, exhibit.name + ".png");
    frame(imageOf(picture, exhibit), exhibit);
}

void Page::show(const Picture &wide, const Picture &narrow, const Exhibit &exhibit) {
    save(wide, exhibit.name + ".png");
    const std::string narrowFile = exhibit.name + "-narrow.png";
    save(narrow, narrowFile);
    frame(std::string("<picture><source media=\"") + kNarrowWindow + "\" srcset=\"" + narrowFile +
              "\"" + sizeOf(narrow) + ">" + imageOf(wide, exhibit) + "</picture>",
          exhibit);
}

void Page::show(const Sheet &sheet, const Exhibit &exhibit) {
    const Picture wide = sheet.drawn();
    const Picture narrow = sheet.drawnWithin(kNarrow);
    if (narrow.width() < wide.width())
        show(wide, narrow, exhibit);
    else
        show(wide, exhibit);
}

void Page::frame(const std::string &picture, const Exhibit &exhibit) {
    body += "<figure><a href=\"" + exhibit.name + ".png\">" + picture + "</a>\n<figcaption>" +
            markup(exhibit.caption) + "</figcaption>\n";
    for (const std::string &name : exhibit.snippets)
        body += "<pre tabindex=\"0\"><code>" + markup(snippet(name)) + "</code></pre>\n";
    body += "</figure>\n";
}

void Page::link(const Picture &picture, const std::string &fileName) {
    save(picture, fileName);
    body += "<span class=\"file\"><a href=\"" + fileName + "\">" + fileName + "</a></span>\n";
}

void Page::save(const Picture &picture, const std::string &fileName) const {
    //! [write]
    const bool bmp = fileName.ends_with(".bmp");
    if (!ImageUtil_WriteImage(&picture.info(), (folder + fileName).c_str(),
                              bmp ? IMAGEUTIL_FORMAT_BMP : IMAGEUTIL_FORMAT_PNG))
        fail(folder + fileName + " cannot be written");
    //! [write]
}

void Page::finish() const {
    const std::string fileName = folder + "index.html";
    std::ofstream file(fileName);
    file << kHead << "<nav>\n" << contents << "</nav>\n" << body << "</main>\n</html>\n";
    if (!file.flush())
        fail(fileName + " cannot be written");
}

} // namespace gallery
