#include "page.h"

#include <fstream>
#include <regex>

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
         background: #fff; overflow-x: auto }
.wide::before { display: none; position: sticky; left: 0; margin-bottom: .5rem; color: var(--soft);
                font-size: .925rem; content: "Goes on to the right \2192" }
@media (max-width: 46rem) { .wide::before { display: block } }
figure a { display: block }
img { display: block; max-width: 100%; height: auto }
figcaption { position: sticky; left: 0; max-width: 46rem; margin-top: .9rem; color: var(--soft);
             font-size: .925rem }
code { font: .9em ui-monospace, Consolas, "DejaVu Sans Mono", monospace; color: var(--ink) }
.file { display: inline-block; margin: 0 1rem .25rem 0 }
</style>
<main>
<h1>libquillon: a gallery</h1>
<p>Every picture here was drawn by the library, the lettering in it too. A picture opens in its
true size at a click.</p>
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
        } else {
            html += c;
        }
    }
    return html;
}

// The first sentence of a caption, for those who do not see the picture.
std::string alternative(const std::string &caption) {
    std::string text;
    for (const char c : markup(caption.substr(0, caption.find(". "))))
        text += c == '"' ? '\'' : c;
    return std::regex_replace(text, std::regex("</?code>"), "");
}

} // namespace

void Page::room(const std::string &title, const std::string &text) {
    const std::string id = "room" + std::to_string(++rooms);
    contents += "<a href=\"#" + id + "\">" + markup(title) + "</a>\n";
    body += "<h2 id=\"" + id + "\">" + markup(title) + "</h2>\n<p>" + markup(text) + "</p>\n";
}

void Page::show(const Picture &picture, const std::string &name, const std::string &caption) {
    const std::string fileName = name + ".png";
    save(picture, fileName);
    // In a small window a picture shrinks until its labels would be too small to
    // read; then it can be scrolled.
    const std::string size = " width=\"" + std::to_string(picture.width()) + "\" height=\"" +
                             std::to_string(picture.height()) + "\" style=\"min-width: min(" +
                             std::to_string(picture.width()) + "px, 40rem)\"";
    const char *const figure = picture.width() > 480 ? "<figure class=\"wide\">" : "<figure>";
    body += std::string(figure) + "<a href=\"" + fileName + "\"><img src=\"" + fileName +
            "\" alt=\"" + alternative(caption) + "\"" + size + "></a>\n<figcaption>" +
            markup(caption) + "</figcaption></figure>\n";
}

void Page::link(const Picture &picture, const std::string &fileName) {
    save(picture, fileName);
    body += "<span class=\"file\"><a href=\"" + fileName + "\">" + fileName + "</a></span>\n";
}

void Page::save(const Picture &picture, const std::string &fileName) const {
    const bool bmp = fileName.ends_with(".bmp");
    if (!ImageUtil_WriteImage(&picture.info(), (folder + fileName).c_str(),
                              bmp ? IMAGEUTIL_FORMAT_BMP : IMAGEUTIL_FORMAT_PNG))
        fail(folder + fileName + " cannot be written");
}

void Page::finish() const {
    const std::string fileName = folder + "index.html";
    std::ofstream file(fileName);
    file << kHead << "<nav>\n" << contents << "</nav>\n" << body << "</main>\n</html>\n";
    if (!file.flush())
        fail(fileName + " cannot be written");
}

} // namespace gallery
